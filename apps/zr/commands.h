// The verbs of the tool. Each describes itself; main knows no verb by name.
#pragma once

#include <functional>
#include <span>
#include <string>

namespace CLI {
class App;
}

namespace zr::tool {

using Run = std::function<void()>;  // throws ToolError

struct Command {
  const char* name;
  const char* summary;
  Run (*declare)(CLI::App& verb);  // adds options and help; the result runs after the line is parsed
};

extern const Command kRenderCommand, kListCommand, kGalleryCommand, kConvertCommand, kDisplayCommand, kInfoCommand,
    kSheetCommand, kTransformCommand, kResizeCommand, kVerifyCommand, kBlurCommand, kConvolveCommand,
    kGuessAlphaCommand, kUnmatteCommand, kViewCommand, kWireframeCommand, kMaskCommand, kModulesCommand;

std::span<const Command* const> all_commands();
// Help that belongs to no verb: {name, text}.
struct HelpTopic {
  const char* name;
  const char* summary;
  std::string (*text)();
};
std::span<const HelpTopic> help_topics();

// Parses the line and runs the verb. Throws ToolError.
void run_command_line(int argc, const char* const* argv);

}  // namespace zr::tool
