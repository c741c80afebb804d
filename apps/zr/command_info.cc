// zr info: what picture files say about themselves.
#include <CLI/CLI.hpp>

#include <cstdio>
#include <memory>
#include <nlohmann/json.hpp>

#include "commands.h"
#include "image_files.h"
#include "tool_error.h"
#include "tool_host.h"

namespace zr::tool {
namespace {

struct InfoOptions {
  std::vector<std::string> files;
  bool json = false;
};

// A damaged profile is worth telling, not failing for.
std::string profile_text(const PictureColour& colour) {
  if (colour.icc.empty()) return "none";
  try {
    return space_name(TON_PRISMA_Profile(colour.icc.data(), colour.icc.size()));
  } catch (const i32) {
    return "damaged";
  }
}

void tell(const InfoOptions& options) {
  const ToolHost host(1);
  nlohmann::ordered_json list = nlohmann::ordered_json::array();
  std::string text;
  for (const std::string& file : options.files) {
    const FileFacts facts = read_facts(file, "info");
    const std::string profile = profile_text(facts.colour);
    text += file + ": " + facts.format + ", " + std::to_string(facts.width) + " x " + std::to_string(facts.height) +
            ", " + std::to_string(facts.channel_count) + " channels (" + facts.channels + "), depth " + facts.depth +
            ", alpha " + facts.alpha + ", profile " + profile + '\n';
    list.push_back({{"file", file},
                    {"format", facts.format},
                    {"width", facts.width},
                    {"height", facts.height},
                    {"channels", facts.channel_count},
                    {"channel_names", facts.channels},
                    {"depth", facts.depth},
                    {"alpha", facts.alpha},
                    {"profile", facts.colour.icc.empty() ? nlohmann::ordered_json() : nlohmann::ordered_json(profile)},
                    {"profile_bytes", facts.colour.icc.size()}});
  }
  if (options.json) text = list.dump(2, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + '\n';
  std::fputs(text.c_str(), stdout);
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<InfoOptions>();
  verb.add_option("files", options->files, "Pictures to look at")->required()->type_name("FILE");
  verb.add_flag("--json", options->json, "Print a list of objects; \"profile\" is null where there is none");
  verb.footer(
      "Examples:\n"
      "  zr info photo.jpg\n"
      "  zr info *.tif --json");
  return [options] { tell(*options); };
}

}  // namespace

const Command kInfoCommand = {"info", "Tell size, channels, depth, alpha and profile of pictures", &declare};

}  // namespace zr::tool
