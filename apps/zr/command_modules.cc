// zr modules: the acceleration modules of the folders, and what became of the slots that they rewrote.
#include <CLI/CLI.hpp>
#include <ZR/module.h>
#include <ZR/platform.h>

#include <cstdio>
#include <memory>
#include <nlohmann/json.hpp>

#include "commands.h"
#include "tool_host.h"

namespace zr::tool {
namespace {

struct ModulesOptions {
  std::vector<std::string> folders;
  bool json = false;
};

const char* verdict_text(i32 verdict) {
  switch (verdict) {
    case ZR_SlotVerdict_Replaced: return "not checked";
    case ZR_SlotVerdict_Equal: return "checked, the same";
    case ZR_SlotVerdict_Kept: return "differs, kept";
    default: return "differs, put back";
  }
}

std::string slot_text(i32 slot) {
  const char* const name = ZR_GetSlotName(slot);
  return name != nullptr ? name : "without a name";
}

void tell(const ModulesOptions& options) {
  if (!options.folders.empty()) {
    std::vector<const char*> folders;
    for (const std::string& folder : options.folders) folders.push_back(folder.c_str());
    ADDIN_SetModuleFolders(folders.data(), static_cast<i32>(folders.size()));
  }
  const ToolHost host(1);
  nlohmann::ordered_json files = nlohmann::ordered_json::array(), slots = nlohmann::ordered_json::array();
  std::string text;
  ZR_ModuleFile file{};
  for (i32 i = 0; ZR_GetModuleFile(i, &file) == ZR_Err_None; ++i) {
    text += std::string(file.path) + ": " + (file.accepted != 0 ? "accepted" : std::string("refused: ") + file.reason) +
            '\n';
    files.push_back({{"path", file.path}, {"accepted", file.accepted != 0}, {"reason", file.reason}});
  }
  if (files.empty()) text = "no modules found\n";
  ZR_ModuleSlot slot{};
  for (i32 i = 0; ZR_GetModuleSlot(i, &slot) == ZR_Err_None; ++i) {
    const std::string name = slot_text(slot.slot);
    text += "  " + std::string(slot.routine) + ": slot " + std::to_string(slot.slot) + " (" + name +
            "): " + verdict_text(slot.verdict) + '\n';
    slots.push_back(
        {{"routine", slot.routine}, {"slot", slot.slot}, {"name", name}, {"verdict", verdict_text(slot.verdict)}});
  }
  const nlohmann::ordered_json all = {{"files", files}, {"slots", slots}};
  if (options.json) text = all.dump(2, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + '\n';
  std::fputs(text.c_str(), stdout);
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<ModulesOptions>();
  verb.add_option("folders", options->folders, "Folders to look into; none: those of the preference modules.folders")
      ->type_name("FOLDER");
  verb.add_flag("--json", options->json, "Print an object with \"files\" and \"slots\"");
  verb.footer(
      "Each .ZNX file is loaded, and what it puts into slots is tried against the routine before it. A slot that "
      "differs\n"
      "is put back (ZR_MODULE_CHECK=strict, the default), kept (warn), or not tried (off).\n\n"
      "Examples:\n"
      "  zr modules /usr/local/lib/zr/modules\n"
      "  ZR_MODULE_CHECK=warn zr modules build/modules --json");
  return [options] { tell(*options); };
}

}  // namespace

const Command kModulesCommand = {"modules", "List acceleration modules, and the slots that they rewrite", &declare};

}  // namespace zr::tool
