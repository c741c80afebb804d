// zr list: what this build and this machine offer.
#include <CLI/CLI.hpp>
#include <ZR/platform.h>

#include <cstdio>
#include <cstdlib>
#include <memory>

#include "commands.h"
#include "colour_space.h"
#include "depths.h"
#include "image_files.h"
#include "mask_shapes.h"
#include "mode_names.h"
#include "scene_keys.h"
#include "tool_host.h"

namespace zr::tool {
namespace {

void list_modes() {
  std::puts("number  name                     how alpha enters");
  for (const ModeName& mode : all_modes())
    std::printf("%6d  %-24s %s\n", mode.number, mode.name.c_str(), mode.kind.c_str());
}

void list_mask_modes() {
  for (const MaskMode& mode : mask_modes()) std::printf("%-16s %s\n", mode.name, mode.meaning);
}

void list_formats() {
  std::puts("written   extensions   depths         alpha");
  for (const OutputFormat& format : output_formats()) {
    std::string extensions, depths;
    for (const std::string& one : format.extensions) extensions += one + ' ';
    for (const i32 depth : format.depths) depths += std::string(depth_name(depth)) + ' ';
    if (format.associated) depths += "half";
    std::printf("%-9s %-12s %-14s %s\n", format.name, extensions.c_str(), depths.c_str(), format.alpha);
  }
  std::string read;
  for (const std::string& name : readable_formats()) read += ' ' + name;
  std::printf("\nread:%s\n", read.c_str());
}

void list_spaces() {
  for (const SpaceName& space : all_spaces()) std::puts(space.name);
}

void list_commands() {
  for (const Command* command : all_commands()) std::printf("%-12s %s\n", command->name, command->summary);
}

void list_effects() {
  for (const EffectKind& kind : kEffectKinds) {
    std::string keys;
    for (const SceneKey& key : kind.keys) keys += (keys.empty() ? "" : ", ") + std::string(key.name);
    std::printf("%-12s %-27s %s\n", kind.name, kind.meaning, keys.c_str());
  }
}

void list_cpu() {
  struct Word {
    int index;
    const char* name;
  };
  constexpr Word kWords[] = {{2, "SSE2"}, {3, "SSE3"}, {4, "SSSE3"}, {6, "SSE4.1"}, {7, "AVX2"}, {8, "AVX-512"}};
  const ToolHost host(0);
  std::printf("threads  %d\n", host.threads());
  for (const Word& word : kWords)
    std::printf("%-8s %s\n", word.name, HB_G_CPU_DataP != nullptr && HB_G_CPU_DataP[word.index] != 0 ? "yes" : "no");
  const char* cap = std::getenv("ZR_CPU");
  std::printf("ZR_CPU   %s (scalar, sse4, avx2 or avx512 caps what is used)\n", cap != nullptr ? cap : "not set");
}

struct Subject {
  const char* name;
  void (*list)();
};
constexpr Subject kSubjects[] = {{"commands", &list_commands},
                                 {"modes", &list_modes},
                                 {"mask-modes", &list_mask_modes},
                                 {"effects", &list_effects},
                                 {"formats", &list_formats},
                                 {"spaces", &list_spaces},
                                 {"cpu", &list_cpu}};

Run declare(CLI::App& verb) {
  const auto what = std::make_shared<std::string>();
  std::vector<std::string> names;
  std::string all;
  for (const Subject& subject : kSubjects) {
    names.emplace_back(subject.name);
    all += (all.empty() ? "" : "|") + names.back();
  }
  verb.add_option("what", *what, "What to list")
      ->required()
      ->check(CLI::IsMember(names).description(""))
      ->type_name(all);
  verb.footer(
      "Examples:\n"
      "  zr list commands   what zr can do\n"
      "  zr list modes      transfer modes by number and name, as scenes use them\n"
      "  zr list mask-modes how the shapes of a mask are combined, in zr mask and in scenes\n"
      "  zr list effects    effects of a scene's layers and their keys; zr help effects tells more\n"
      "  zr list formats    picture files that are written and read\n"
      "  zr list spaces     colour spaces by name\n"
      "  zr list cpu        what the processor has and what the library sees");
  return [what] {
    for (const Subject& subject : kSubjects)
      if (*what == subject.name) subject.list();
  };
}

}  // namespace

const Command kListCommand = {
    "list", "List commands, transfer modes, mask modes, effects, file formats, colour spaces or processor features",
    &declare};

}  // namespace zr::tool
