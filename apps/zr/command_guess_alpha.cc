// zr guess-alpha: whether a file's colours are straight or premultiplied, and on which colour.
#include <CLI/CLI.hpp>

#include <cstdio>
#include <memory>
#include <nlohmann/json.hpp>

#include "commands.h"
#include "common_options.h"
#include "image_files.h"
#include "matte.h"
#include "tool_error.h"
#include "tool_host.h"

namespace zr::tool {
namespace {

struct GuessOptions {
  std::vector<std::string> files;
  bool json = false;
};

const char* kind_name(AlphaGuess::Kind kind) {
  return kind == AlphaGuess::Kind::kStraight        ? "straight"
         : kind == AlphaGuess::Kind::kPremultiplied ? "premultiplied"
                                                    : "unknown";
}

void guess(const GuessOptions& options) {
  const ToolHost host(0);
  nlohmann::ordered_json list = nlohmann::ordered_json::array();
  std::string text;
  for (const std::string& file : options.files) {
    const ImageInfo info = probe_image(file, "guess-alpha");
    const u64 pixels = static_cast<u64>(info.width) * static_cast<u64>(info.height);
    if (info.decoded_bytes + pixels * sizeof(ZR_Pixel8) > machine_memory() / 4 * 3)
      throw ToolError(kExitMemory, "guess-alpha: " + file + " is too large for this machine's memory");
    Picture picture = load_stored(file, 8, "guess-alpha");
    const AlphaGuess guess = guess_alpha(picture.world, "guess-alpha: " + file);
    const bool on_matte = guess.kind == AlphaGuess::Kind::kPremultiplied;
    const std::string marked = read_facts(file, "guess-alpha").alpha;
    text += file + ": " + kind_name(guess.kind);
    if (on_matte) text += " on " + colour_name(guess.matte);
    if (guess.kind == AlphaGuess::Kind::kUnknown) text += " (every pixel is transparent)";
    if (guess.opaque) text += " (no pixel is transparent, so it makes no difference)";
    text += '\n';
    list.push_back({{"file", file},
                    {"alpha", kind_name(guess.kind)},
                    {"matte", on_matte ? nlohmann::ordered_json(colour_name(guess.matte)) : nlohmann::ordered_json()},
                    {"opaque", guess.opaque},
                    {"file_says", marked}});
  }
  if (options.json) text = list.dump(2, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + '\n';
  std::fputs(text.c_str(), stdout);
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<GuessOptions>();
  verb.add_option("files", options->files, "Pictures to look at")->required()->type_name("FILE");
  verb.add_flag("--json", options->json,
                "Print a list of objects; \"matte\" is null unless premultiplied, \"file_says\" as zr info tells it");
  verb.footer(
      "Examples:\n"
      "  zr guess-alpha logo.png\n"
      "  zr guess-alpha renders/*.tif --json\n"
      "\n"
      "Says one of:\n"
      "  straight                  colours do not depend on alpha\n"
      "  premultiplied on #rrggbb  colours are mixed with that colour where alpha is below white\n"
      "  unknown                   every pixel is transparent\n"
      "The pixels themselves are looked at, at 8 bits, as the file holds them; what the file says of its alpha does\n"
      "not count. zr unmatte takes the colour away.");
  return [options] { guess(*options); };
}

}  // namespace

const Command kGuessAlphaCommand = {"guess-alpha", "Tell whether pictures are premultiplied, and on which colour",
                                    &declare};

}  // namespace zr::tool
