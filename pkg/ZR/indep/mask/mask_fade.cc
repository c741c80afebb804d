// Inverting and fading mask buffers.
#include "world/row_bands.h"
#include "mask/mask_rows.h"
#include "world/slot_table.h"

namespace zr {
namespace {

template <class C>
using FadeRow = i32(i32 n, Factor<C> factor, C* row);

i32 empty_slot() { return failed_verification(ZR_Site_EmptySlot, "no routine for the rows of a mask buffer"); }

template <class C>
FadeRow<C>* invert_row() {
  if constexpr (std::is_same_v<C, u8>) return slot<ZR_Slot_uno_row85>();
  if constexpr (std::is_same_v<C, u16>) return slot<ZR_Slot_uno_row88>();
  if constexpr (std::is_same_v<C, f32>) return &mask_invert_row<f32>;
}
template <class C>
FadeRow<C>* fade_row() {
  if constexpr (std::is_same_v<C, u8>) return slot<ZR_Slot_uno_row89>();
  if constexpr (std::is_same_v<C, u16>) return slot<ZR_Slot_uno_row113>();
  if constexpr (std::is_same_v<C, f32>) return &mask_fade_row<f32>;
}

// factor_of(white) gives the factor of a depth.
template <class FactorOf>
i32 invert(const ZR_ProgressInfo* progress, ZR_UnoBuffer* buffer, FactorOf factor_of) {
  return guarded([&] {
    if (!is_alive(buffer)) return damaged_mask(ZR_Site_MaskFade);
    return on_mask_depth(*buffer, ZR_Site_MaskFade, [&]<class C>() -> i32 {
      const MaskView<C> view(*buffer);
      if (view.count() == 0) return ZR_Err_None;
      FadeRow<C>* const row = invert_row<C>();
      if (row == nullptr) return empty_slot();
      const Factor<C> factor = factor_of.template operator()<C>();
      return for_rows(progress, view.height, i64{view.width} * static_cast<i64>(sizeof(C)),
                      [&](i32 y) { row(view.width, factor, view.at(0, y)); });
    });
  });
}

}  // namespace
}  // namespace zr

i32 ZR_InvertUnoBuffer(const ZR_ProgressInfo* progress, ZR_UnoBuffer* buffer) {
  return zr::invert(progress, buffer, []<class C>() { return zr::MaskDepth<C>::white; });
}

i32 ZR_InvertAndFadeUnoBuffer(const ZR_ProgressInfo* progress, i32 fade, ZR_UnoBuffer* buffer) {
  return zr::invert(progress, buffer, [fade]<class C>() -> zr::Factor<C> {
    const f64 part = fade * 1.52587890625e-5;
    if constexpr (std::is_same_v<C, f32>)
      return static_cast<f32>(part);
    else
      return zr::truncate_i32(part * zr::MaskDepth<C>::white + 0.5);
  });
}

i32 ZR_FadeUnoBuffer(f32 fade, ZR_UnoBuffer* buffer) {
  return zr::guarded([&] {
    if (!zr::is_alive(buffer)) return zr::damaged_mask(ZR_Site_MaskFade);
    return zr::on_mask_depth(*buffer, ZR_Site_MaskFade, [&]<class C>() -> i32 {
      zr::Factor<C> factor;
      if constexpr (std::is_same_v<C, f32>)
        factor = fade;
      else if constexpr (std::is_same_v<C, u8>)
        factor = zr::truncate_i32(255.0 * fade + 0.5);
      else
        factor = zr::truncate_i32(32768.0f * fade + 0.5f);
      zr::FadeRow<C>* const row = zr::fade_row<C>();
      if (row == nullptr) return zr::empty_slot();
      const zr::MaskView<C> view(*buffer);
      constexpr i64 most = 1 << 30;  // values that a row's count holds
      for (i64 done = 0; done < view.count(); done += most)
        row(static_cast<i32>(std::min(most, view.count() - done)), factor, view.values + done);
      return ZR_Err_None;
    });
  });
}
