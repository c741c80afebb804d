// Where an entry of the callback block, or a selector, finds its routine.
#pragma once

#include <ZR/slots.h>

#include "host/callback_private_state.h"

namespace zr {

struct Source {
  enum Kind : u8 { none, from_slot, from_private } kind = none;
  u8 index = 0;
  friend constexpr bool operator==(const Source&, const Source&) = default;
};

constexpr Source in_slot(ZR_SlotIndex slot) { return {Source::from_slot, static_cast<u8>(slot)}; }
constexpr Source in_private(PrivateRoutine routine) { return {Source::from_private, static_cast<u8>(routine)}; }
inline constexpr Source no_routine{};

// The routine that stands there now, or null.
inline void* routine_at(Source source) {
  switch (source.kind) {
    case Source::from_slot: return reinterpret_cast<void*>(ZRp_G_OverFuncs[source.index]);
    case Source::from_private: return private_routine(static_cast<PrivateRoutine>(source.index));
    default: return nullptr;
  }
}

// One source for each quality and alpha mode.
struct Choice {
  Source draft_straight, draft_premul, best_straight, best_premul;

  // quality 0 is draft, any other best; bit 0 of flags is straight alpha.
  constexpr Source of(i32 quality, i32 flags) const {
    if (quality == 0) return (flags & 1) != 0 ? draft_straight : draft_premul;
    return (flags & 1) != 0 ? best_straight : best_premul;
  }
  constexpr bool varies() const {
    return draft_straight != draft_premul || draft_straight != best_straight || draft_straight != best_premul;
  }
};

constexpr Choice always(Source one) { return {one, one, one, one}; }
constexpr Choice always(ZR_SlotIndex slot) { return always(in_slot(slot)); }
constexpr Choice always(PrivateRoutine routine) { return always(in_private(routine)); }
constexpr Choice by_alpha(Source straight, Source premul) { return {straight, premul, straight, premul}; }
constexpr Choice by_alpha(PrivateRoutine straight, PrivateRoutine premul) {
  return by_alpha(in_private(straight), in_private(premul));
}
constexpr Choice draft_or(ZR_SlotIndex draft, Source straight, Source premul) {
  return {in_slot(draft), in_slot(draft), straight, premul};
}

// Told once for the block and the selectors.
inline constexpr Choice sample_choice =
    draft_or(ZR_Slot_nn_sample8, in_slot(ZR_Slot_bilinear_straight8), in_slot(ZR_Slot_bilinear_premul8));
inline constexpr Choice area_sample_choice =
    draft_or(ZR_Slot_nn_sample8, in_slot(ZR_Slot_area_straight8), in_slot(ZR_Slot_area_premul8));
inline constexpr Choice copy_bits_choice =
    draft_or(ZR_Slot_copy_bits_draft, in_slot(ZR_Slot_copy_bits_hq_straight), in_slot(ZR_Slot_copy_bits_hq_premul));
inline constexpr Choice composite_rect_choice = {
    in_slot(ZR_Slot_composite_rect_draft_straight), in_slot(ZR_Slot_composite_rect_draft_premul),
    in_slot(ZR_Slot_composite_rect_best_straight), in_slot(ZR_Slot_composite_rect_best_premul)};
inline constexpr Choice blend_choice = by_alpha(PrivateRoutine::blend_straight, PrivateRoutine::blend_premul);

// `index` counts the eight colour functions, from RGB to HLS on.
constexpr Choice colour_choice(int index) {
  const auto nth = [index](PrivateRoutine first) {
    return in_private(static_cast<PrivateRoutine>(static_cast<int>(first) + index));
  };
  return by_alpha(nth(PrivateRoutine::colour_straight_first), nth(PrivateRoutine::colour_premul_first));
}

}  // namespace zr
