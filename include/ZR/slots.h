/* Numbers of the 118 slots of replaceable routines. Exports of replaceable routines jump through
 * them; hosts (ZR_SetOverrideFunc) and acceleration modules may change them while nothing renders.
 * Slots that are not named stay null. Usable from C. */
#ifndef ZR_SLOTS_H
#define ZR_SLOTS_H

#include <ZR/zr.h>

typedef enum ZR_SlotIndex {
  ZR_Slot_module0 = 0, /* null by default; a module may supply them. Slot 0 cannot be overridden. */
  ZR_Slot_module1 = 1,
  ZR_Slot_nn_sample8 = 2,
  ZR_Slot_bilinear_straight8 = 3,
  ZR_Slot_bilinear_premul8 = 4,
  ZR_Slot_area_straight8 = 5,
  ZR_Slot_area_premul8 = 6,
  ZR_Slot_composite_rect_draft_straight = 7,
  ZR_Slot_composite_rect_draft_premul = 8,
  ZR_Slot_composite_rect_best_straight = 9,
  ZR_Slot_composite_rect_best_premul = 10,
  ZR_Slot_transfer_rows8 = 17, /* the three row drivers behind ZR_TransferRect */
  ZR_Slot_transfer_rows16 = 18,
  ZR_Slot_transfer_rowsFloat = 19,
  ZR_Slot_transfer_rect_plus = 20,
  ZR_Slot_composite_behind_row_straight = 21, /* the two rows behind ZR_CompositeRect... */
  ZR_Slot_composite_behind_row_premul = 22,
  ZR_Slot_copy_bits_draft = 23,
  ZR_Slot_copy_bits_hq_straight = 24,
  ZR_Slot_copy_bits_hq_premul = 25,
  ZR_Slot_fast_blur_straight = 26,
  ZR_Slot_fast_blur_premul = 27,
  ZR_Slot_convolve = 28,
  ZR_Slot_transfer_rect = 31,
  ZR_Slot_transform_world = 32,
  ZR_Slot_premul_row8 = 35, /* also the fade and unfade of black ground */
  ZR_Slot_unmul_row8 = 36,
  ZR_Slot_white_fade_row8 = 37,
  ZR_Slot_white_unfade_row8 = 38,
  ZR_Slot_grey_fade_row8 = 39,
  ZR_Slot_grey_unfade_row8 = 40,
  ZR_Slot_union_alpha_row8 = 41,
  ZR_Slot_iterate = 42,
  ZR_Slot_iterate_origin = 43,
  ZR_Slot_iterate_lut = 44,
  ZR_Slot_open_destination = 45,
  ZR_Slot_close_destination = 46,
  ZR_Slot_module47 = 47,
  ZR_Slot_module48 = 48,
  ZR_Slot_iterate_origin_no_clip = 51,
  ZR_Slot_premul_rect = 52,
  ZR_Slot_iterate_generic = 53,
  ZR_Slot_box_blur_uno_scan = 54,
  ZR_Slot_uno_row55 = 55, /* rows of mask buffers: ZR_GBlurUnoScan; */
  ZR_Slot_uno_row56 = 56, /* modes from 8 bits onto 8, */
  ZR_Slot_sample_compute_weight = 57,
  ZR_Slot_bilinear_translate_no_clip8 = 58,
  ZR_Slot_bilinear_plus8 = 60,
  ZR_Slot_bilinear_no_clip8 = 61,
  ZR_Slot_uno_row62 = 62, /* from 16 onto 8, */
  ZR_Slot_nn_sample16 = 63,
  ZR_Slot_bilinear_straight16 = 64,
  ZR_Slot_area_straight16 = 65,
  ZR_Slot_bilinear_translate_no_clip16 = 68,
  ZR_Slot_bilinear_plus16 = 70,
  ZR_Slot_bilinear_no_clip16 = 71,
  ZR_Slot_premul_row16 = 72,
  ZR_Slot_unmul_row16 = 73,
  ZR_Slot_white_fade_row16 = 74,
  ZR_Slot_white_unfade_row16 = 75,
  ZR_Slot_grey_fade_row16 = 76,
  ZR_Slot_grey_unfade_row16 = 77,
  ZR_Slot_union_alpha_row16 = 78,
  ZR_Slot_uno_row81 = 81, /* from 16 onto 16, */
  ZR_Slot_uno_row82 = 82, /* from 8 onto 16; */
  ZR_Slot_bilinear_no_clip8_x4 = 83,
  ZR_Slot_bilinear_translate_no_clip8_x4 = 84,
  ZR_Slot_uno_row85 = 85, /* invert and fade, 8 bits */
  ZR_Slot_bilinear_span8 = 86,
  ZR_Slot_bilinear_span16 = 87,
  ZR_Slot_uno_row88 = 88, /* and 16; */
  ZR_Slot_uno_row89 = 89, /* fade, 8 bits */
  ZR_Slot_box_blur_deep_uno_scan = 92,
  ZR_Slot_uno_row93 = 93,    /* ZR_GBlurDeepUnoScan; */
  ZR_Slot_inner_blend8 = 94, /* getters of inner blending functions: plain, */
  ZR_Slot_inner_blend16 = 95,
  ZR_Slot_inner_blendFloat = 96,
  ZR_Slot_inner_blend_mask8 = 97, /* with mask, */
  ZR_Slot_inner_blend_mask16 = 98,
  ZR_Slot_inner_blend_maskFloat = 99,
  ZR_Slot_inner_blend_linear8 = 100, /* in linear light, */
  ZR_Slot_inner_blend_linear16 = 101,
  ZR_Slot_inner_blend_linearFloat = 102,
  ZR_Slot_inner_blend_mask_linear8 = 103, /* both */
  ZR_Slot_inner_blend_mask_linear16 = 104,
  ZR_Slot_inner_blend_mask_linearFloat = 105,
  ZR_Slot_premul_rowFloat = 106,
  ZR_Slot_unmul_rowFloat = 107,
  ZR_Slot_white_fade_rowFloat = 108,
  ZR_Slot_white_unfade_rowFloat = 109,
  ZR_Slot_grey_fade_rowFloat = 110,
  ZR_Slot_grey_unfade_rowFloat = 111,
  ZR_Slot_union_alpha_rowFloat = 112,
  ZR_Slot_uno_row113 = 113, /* fade, 16 bits; */
  ZR_Slot_uno_row114 = 114, /* deep values over a divisor, to 8 bits */
  ZR_Slot_transform_row8 = 115,
  ZR_Slot_transform_row16 = 116,
  ZR_Slot_transform_rowFloat = 117
} ZR_SlotIndex;

enum { ZR_SlotCount = 118 };

typedef void (*ZR_SlotFunc)(void);

#ifdef __cplusplus
extern "C" {
#endif
/* The table itself: all null before birth, contiguous, saved and restored as one image. */
ZR_API extern ZR_SlotFunc ZRp_G_OverFuncs[ZR_SlotCount];
#ifdef __cplusplus
}
#endif

#endif
