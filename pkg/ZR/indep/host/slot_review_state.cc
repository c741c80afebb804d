// The host's check of rewritten slots, and the list of what was found.
#include "host/slot_review_state.h"

#include <ADDIN/addin.h>
#include <HB/allocator.h>
#include <JRN/jrn.h>
#include <OPT/opt.h>

#include <string>

#include "world/guard.h"

namespace zr {
namespace {

struct Label {
  static constexpr const char* text = "list of replaced slots";
};
// Written while the library is born or dies, which it does alone.
constinit ZR_SlotCheck G_check = nullptr;
constinit void* G_check_refcon = nullptr;
constinit std::vector<ZR_ModuleSlot, HB_Allocator<ZR_ModuleSlot, Label>> G_found;

enum class Policy { off, warn, strict };

Policy policy() {
  const std::string text = OPT_GetString("module.check", "strict");
  if (text == "off") return Policy::off;
  if (text == "warn") return Policy::warn;
  if (text != "strict")
    JRN_Log(30, "ZR", "Modules", ("module.check is '" + text + "', not off, warn or strict: strict is taken").c_str());
  return Policy::strict;
}

// As a ZR_SlotCheck answers.
i32 compare(i32 slot, ZR_SlotFunc before, ZR_SlotFunc now) {
  if (before == nullptr) return -1;  // nothing to compare with
  return now == nullptr ? 1 : G_check(G_check_refcon, slot, before, now);
}

}  // namespace

void review_slots(const char* routine, const ZR_SlotFunc (&before)[ZR_SlotCount]) {
  const Policy wanted = G_check != nullptr ? policy() : Policy::off;
  for (i32 slot = 0; slot < ZR_SlotCount; ++slot) {
    const ZR_SlotFunc now = ZRp_G_OverFuncs[slot];
    if (now == before[slot]) continue;
    const i32 answer = wanted != Policy::off ? compare(slot, before[slot], now) : -1;
    i32 verdict = answer == 0 ? ZR_SlotVerdict_Equal : ZR_SlotVerdict_Replaced;
    if (answer > 0) {
      verdict = wanted == Policy::strict ? ZR_SlotVerdict_PutBack : ZR_SlotVerdict_Kept;
      if (wanted == Policy::strict) ZRp_G_OverFuncs[slot] = before[slot];
      const char* const name = ZR_GetSlotName(slot);
      JRN_Log(30, "ZR", "Modules",
              (std::string("slot ") + std::to_string(slot) + " (" + (name != nullptr ? name : "without a name") +
               ") of " + routine +
               " does not do what the routine before it does: " + (wanted == Policy::strict ? "put back" : "kept"))
                  .c_str());
    }
    G_found.push_back({routine, slot, verdict});
  }
}

void forget_slot_review() { decltype(G_found)().swap(G_found); }

size_t slot_review_count() { return G_found.size(); }

void forget_slot_review_from(size_t count) {
  if (G_found.size() > count) G_found.resize(count);
}

}  // namespace zr

extern "C" {

void ZR_SetSlotCheck(ZR_SlotCheck check, void* refcon) {
  zr::G_check = check;
  zr::G_check_refcon = refcon;
}

i32 ZR_GetModuleFile(i32 index, ZR_ModuleFile* out) {
  const std::vector<ADDIN_ScanEntry>& report = ADDIN_GetScanReport();
  if (out == nullptr || index < 0 || static_cast<size_t>(index) >= report.size()) return ZR_Err_BadParam;
  const ADDIN_ScanEntry& entry = report[static_cast<size_t>(index)];
  *out = {entry.path.c_str(), entry.accepted ? 1 : 0, entry.reason.c_str()};
  return ZR_Err_None;
}

i32 ZR_GetModuleSlot(i32 index, ZR_ModuleSlot* out) {
  if (out == nullptr || index < 0 || static_cast<size_t>(index) >= zr::G_found.size()) return ZR_Err_BadParam;
  *out = zr::G_found[static_cast<size_t>(index)];
  return ZR_Err_None;
}

}  // extern "C"
