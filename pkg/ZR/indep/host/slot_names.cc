// Slot numbers as words, for reports.
#include <ZR/module.h>

#include <array>

namespace {

struct Named {
  int slot;
  const char* name;
};
#define N(name) \
  Named { ZR_Slot_##name, #name }
constexpr Named named[] = {N(module0),
                           N(module1),
                           N(nn_sample8),
                           N(bilinear_straight8),
                           N(bilinear_premul8),
                           N(area_straight8),
                           N(area_premul8),
                           N(composite_rect_draft_straight),
                           N(composite_rect_draft_premul),
                           N(composite_rect_best_straight),
                           N(composite_rect_best_premul),
                           N(transfer_rows8),
                           N(transfer_rows16),
                           N(transfer_rowsFloat),
                           N(transfer_rect_plus),
                           N(composite_behind_row_straight),
                           N(composite_behind_row_premul),
                           N(copy_bits_draft),
                           N(copy_bits_hq_straight),
                           N(copy_bits_hq_premul),
                           N(fast_blur_straight),
                           N(fast_blur_premul),
                           N(convolve),
                           N(transfer_rect),
                           N(transform_world),
                           N(premul_row8),
                           N(unmul_row8),
                           N(white_fade_row8),
                           N(white_unfade_row8),
                           N(grey_fade_row8),
                           N(grey_unfade_row8),
                           N(union_alpha_row8),
                           N(iterate),
                           N(iterate_origin),
                           N(iterate_lut),
                           N(open_destination),
                           N(close_destination),
                           N(module47),
                           N(module48),
                           N(iterate_origin_no_clip),
                           N(premul_rect),
                           N(iterate_generic),
                           N(box_blur_uno_scan),
                           N(uno_row55),
                           N(uno_row56),
                           N(sample_compute_weight),
                           N(bilinear_translate_no_clip8),
                           N(bilinear_plus8),
                           N(bilinear_no_clip8),
                           N(uno_row62),
                           N(nn_sample16),
                           N(bilinear_straight16),
                           N(area_straight16),
                           N(bilinear_translate_no_clip16),
                           N(bilinear_plus16),
                           N(bilinear_no_clip16),
                           N(premul_row16),
                           N(unmul_row16),
                           N(white_fade_row16),
                           N(white_unfade_row16),
                           N(grey_fade_row16),
                           N(grey_unfade_row16),
                           N(union_alpha_row16),
                           N(uno_row81),
                           N(uno_row82),
                           N(bilinear_no_clip8_x4),
                           N(bilinear_translate_no_clip8_x4),
                           N(uno_row85),
                           N(bilinear_span8),
                           N(bilinear_span16),
                           N(uno_row88),
                           N(uno_row89),
                           N(box_blur_deep_uno_scan),
                           N(uno_row93),
                           N(inner_blend8),
                           N(inner_blend16),
                           N(inner_blendFloat),
                           N(inner_blend_mask8),
                           N(inner_blend_mask16),
                           N(inner_blend_maskFloat),
                           N(inner_blend_linear8),
                           N(inner_blend_linear16),
                           N(inner_blend_linearFloat),
                           N(inner_blend_mask_linear8),
                           N(inner_blend_mask_linear16),
                           N(inner_blend_mask_linearFloat),
                           N(premul_rowFloat),
                           N(unmul_rowFloat),
                           N(white_fade_rowFloat),
                           N(white_unfade_rowFloat),
                           N(grey_fade_rowFloat),
                           N(grey_unfade_rowFloat),
                           N(union_alpha_rowFloat),
                           N(uno_row113),
                           N(uno_row114),
                           N(transform_row8),
                           N(transform_row16),
                           N(transform_rowFloat)};
#undef N

constexpr std::array<const char*, ZR_SlotCount> names = [] {
  std::array<const char*, ZR_SlotCount> all{};
  for (const Named& one : named) all[static_cast<size_t>(one.slot)] = one.name;
  return all;
}();

}  // namespace

extern "C" const char* ZR_GetSlotName(i32 slot) {
  return slot >= 0 && slot < ZR_SlotCount ? names[static_cast<size_t>(slot)] : nullptr;
}
