// The command line: verbs, help, and one line for what is wrong with it.
#include <ZR/zr.h>

#include <CLI/CLI.hpp>
#include <cstdio>

#include "commands.h"
#include "nearest_name.h"
#include "scene.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

constexpr const Command* kCommands[] = {
    &kRenderCommand,    &kSheetCommand,   &kTransformCommand, &kResizeCommand,     &kBlurCommand,    &kConvolveCommand,
    &kConvertCommand,   &kDisplayCommand, &kInfoCommand,      &kGuessAlphaCommand, &kUnmatteCommand, &kViewCommand,
    &kWireframeCommand, &kMaskCommand,    &kGalleryCommand,   &kListCommand,       &kModulesCommand, &kVerifyCommand};
constexpr const char* kVersion = "zr " ZR_TOOL_VERSION;

std::string exit_code_help() {
  return "Exit codes:\n"
         "  0    done\n"
         "  1    the work failed\n"
         "  2    bad command line, or bad input such as a mistake in a scene\n"
         "  3    a file cannot be found, read or written, or stands in the way\n"
         "  4    out of memory, or more would be needed than --memory allows\n"
         "  5    zr verify found a difference\n"
         "  130  stopped by Ctrl-C; finished frames stay, unfinished files are removed\n";
}

constexpr HelpTopic kTopics[] = {
    {"scene", "the scene file", &scene_help},
    {"effects", "what is done to the layers of a scene", &effects_help},
    {"exit-codes", "what the exit code says", &exit_code_help},
};

class Parser {
 public:
  Parser() : app_("Composites pictures: layers, transfer modes, track mattes, keyframes.", "zr") {
    app_.set_version_flag("--version", kVersion);
    app_.require_subcommand(0, 1);
    for (const Command* command : all_commands()) {
      CLI::App* verb = app_.add_subcommand(command->name, command->summary);
      runs_.emplace_back(verb, command->declare(*verb));
      verb->footer(verb->get_footer() + "\n\n" + exit_code_help());
    }
    CLI::App* help = app_.add_subcommand("help", "Print the help of a command, or of: " + topic_list());
    help->add_option("topic", topic_, "Command or topic")->type_name("NAME");
    runs_.emplace_back(help, [this] { print_help(); });
    app_.footer(
        "Examples:\n"
        "  zr render examples/scenes/demo.json -o out/frame.####.png\n"
        "  zr sheet out/frame.*.png -o out/sheet.png\n"
        "  zr blur photo.jpg -o soft.png --radius 6 --keep-edges\n"
        "  zr help render\n"
        "  zr list modes\n\n" +
        exit_code_help());
  }

  void parse_and_run(int argc, const char* const* argv) {
    try {
      app_.parse(argc, argv);
    } catch (const CLI::CallForHelp&) {
      print_help_of(chosen());
      return;
    } catch (const CLI::CallForVersion&) {
      std::puts(kVersion);
      return;
    } catch (const CLI::Error& error) {
      fail(error);
    }
    for (const auto& [verb, run] : runs_)
      if (verb->parsed()) return run();
    print_help_of(app_);
  }

 private:
  static std::string topic_list() {
    std::string list;
    for (const HelpTopic& topic : help_topics()) list += (list.empty() ? "" : ", ") + std::string(topic.name);
    return list;
  }

  const CLI::App& chosen() const {
    const auto verbs = app_.get_subcommands();
    return verbs.empty() ? app_ : *verbs.front();
  }

  // One line, with the nearest verb or option for a mistyped one.
  [[noreturn]] void fail(const CLI::Error& error) const {
    const CLI::App& verb = chosen();
    const std::string name = &verb == &app_ ? "" : verb.get_name() + ": ";
    const std::vector<std::string> extras = verb.remaining();
    std::string text = error.what();
    if (!extras.empty() || error.get_name() == "ExtrasError") {
      const std::string extra = extras.empty() ? "" : extras.front();
      std::vector<std::string> known;
      if (extra.rfind("-", 0) == 0)
        for (const CLI::Option* option : verb.get_options()) known.push_back(option->get_name(false));
      else if (&verb == &app_)
        for (const Command* command : all_commands()) known.emplace_back(command->name);
      text = "unknown argument \"" + extra + '"';
      if (!known.empty()) text += "; the nearest is " + quoted_list(nearest_names(extra, known, 1));
    }
    throw bad_input(name + text + " (see zr help" + (&verb == &app_ ? "" : ' ' + verb.get_name()) + ')');
  }

  // Not App::help, which would turn to the verb that was parsed: to "help" itself.
  void print_help_of(const CLI::App& app) const {
    const std::string name = &app == &app_ ? "zr" : "zr " + app.get_name();
    std::fputs(app.get_formatter()->make_help(&app, name, CLI::AppFormatMode::Normal).c_str(), stdout);
  }

  void print_help() const {
    if (topic_.empty()) {
      print_help_of(app_);
      return;
    }
    std::vector<std::string> known;
    for (const auto& [verb, run] : runs_) {
      known.push_back(verb->get_name());
      if (topic_ != verb->get_name()) continue;
      print_help_of(*verb);
      return;
    }
    for (const HelpTopic& topic : help_topics()) {
      known.emplace_back(topic.name);
      if (topic_ != topic.name) continue;
      std::fputs(topic.text().c_str(), stdout);
      return;
    }
    throw bad_input("help: unknown command \"" + topic_ + "\"; the nearest is " +
                    quoted_list(nearest_names(topic_, known, 1)));
  }

  CLI::App app_;
  std::vector<std::pair<CLI::App*, Run>> runs_;
  std::string topic_;
};

}  // namespace

std::span<const Command* const> all_commands() { return kCommands; }
std::span<const HelpTopic> help_topics() { return kTopics; }

void run_command_line(int argc, const char* const* argv) { Parser().parse_and_run(argc, argv); }

}  // namespace zr::tool
