// Typed access to the slot table: a slot number gives the type of its routine, so that a wrong routine
// does not compile, and the casts stand here alone. Default bodies are installed on the host floor.
#pragma once

#include <ZR/composite.h>
#include <ZR/slots.h>
#include <ZR/zr.h>

#include <type_traits>

namespace zr {

using CompositeRectFunc = i32(const ZR_ProgressInfo*, const GX_LRect*, u8 opacity, ZR_LayerDef* src, i32 dest_x,
                              i32 dest_y, i32 field, u32 flags, ZR_LayerDef* dst);
using TransferRectFunc = i32(const ZR_ProgressInfo*, i32 quality, u32 flags, i32 field, const GX_LRect*, ZR_LayerDef*,
                             const ZR_CompositeModePlus*, const ZR_LinearBlendingTables*, const ZR_MaskWorld*, i32, i32,
                             ZR_LayerDef*);
using TransferRectPlusFunc = i32(const ZR_ProgressInfo*, i32 quality, u32 flags, i32 field, const GX_LRect*,
                                 ZR_LayerDef*, const ZR_CompositeModePlus*, const ZR_LinearBlendingTables*,
                                 const ZR_MaskWorld*, void* scratch[10], i32, i32, ZR_LayerDef*);
using TransformWorldFunc = i32(const ZR_ProgressInfo*, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                               const ZR_CompositeModePlus*, const ZR_LinearBlendingTables*, const ZR_MaskWorld*,
                               const GX_Matrix3*, i32 count, bool src2dst, const GX_LRect*, ZR_LayerDef* dst);
// Clips, prepares mask rows and runs the pipeline over the rows of typed worlds, with the caller's scratch.
template <class T>
using TransferRowsFunc = i32(const ZR_ProgressInfo*, i32 quality, i32 field, const GX_LRect*, const ZR_WorldX<T>* src,
                             const ZR_BlendingMode<T>*, const ZR_LinearBlendingTables*, const ZR_MaskWorld*,
                             void* const scratch[10], i32 dest_x, i32 dest_y, ZR_WorldX<T>* dst);
// Walks the rows of a layer placed by matrices; the worlds have one depth.
template <class T>
using TransformRowsFunc = i32(const ZR_ProgressInfo*, i32 quality, i32 field, const ZR_WorldX<T>* src,
                              const ZR_BlendingMode<T>*, const ZR_LinearBlendingTables*, const ZR_MaskWorld*,
                              const GX_Matrix3*, i32 count, bool src2dst, void* const scratch[10], const GX_LRect*,
                              ZR_WorldX<T>* dst);
template <class T>
using SampleFunc = i32(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB*, T* dst);
template <class T>
using SamplePlusFunc = i32(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB*, u8* all_in, T* dst);
template <class T>
using SampleTranslateFunc = i32(const ZR_ProgressInfo*, i32 x, i32 y, const f64* w, const ZR_SampPB*, T* dst);
template <class T>
using AlphaSum = std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, f32, u32>;
template <class T>
using SampleSpanFunc = i32(const ZR_ProgressInfo*, i32 count, i32 x, i32 y, const ZR_SampPB*, AlphaSum<T>* sum_alpha,
                           T* dst);
using SampleFourFunc = i32(const ZR_ProgressInfo*, const i32* xy, const ZR_SampPB*, ZR_Pixel8* dst);
using SampleFourTranslateFunc = i32(const ZR_ProgressInfo*, const i32* xy, const f64* w, const ZR_SampPB*,
                                    ZR_Pixel8* dst);
using SampleWeightFunc = i32(u16 fx, u16 fy, f64* w);
using CopyBitsFunc = i32(const ZR_ProgressInfo*, ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect,
                         const GX_LRect* dst_rect);
using ConvolveFunc = i32(const ZR_ProgressInfo*, ZR_LayerDef* src, const GX_LRect*, u32 flags, i32 size,
                         const i32* a_kernel, const i32* r_kernel, const i32* g_kernel, const i32* b_kernel,
                         ZR_LayerDef* dst);
using FastBlurFunc = i32(const ZR_ProgressInfo*, ZR_LayerDef* src, f64 radius, ZR_LayerDef* dst);
using CompositeBehindRowFunc = void(i32 n, u8 opacity, const ZR_Pixel8* src, ZR_Pixel8* dst);
using IterateFunc = i32(ZR_InData*, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect*,
                        void* refcon, ZR_PixelFunc, ZR_LayerDef* dst);
using IterateOriginFunc = i32(ZR_InData*, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect*,
                              const GX_LPoint*, void* refcon, ZR_PixelFunc, ZR_LayerDef* dst);
using IterateLutFunc = i32(ZR_InData*, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect*,
                           const u8*, const u8*, const u8*, const u8*, ZR_LayerDef* dst);
using IterateGenericFunc = i32(i32 iterations, void* refcon, ZR_GenericFunc);
using PremulRectFunc = i32(const ZR_ProgressInfo*, i32 forward, const GX_LRect*, ZR_LayerDef*);
using OpenDestinationFunc = i32(void* first, void* record);  // a record of 32 bytes
using ModuleOwnFunc = i32(void*, void*);                     // called by nobody here
// Combines n values of a mask with those under it; dst may be `under`.
template <class S, class D>
using UnoModeRowFunc = i32(i32 n, i32 mode, const S* src, const D* under, D* dst);
using UnoModeRow8 = UnoModeRowFunc<u8, u8>;
using UnoModeRow16To8 = UnoModeRowFunc<u16, u8>;
using UnoModeRow16 = UnoModeRowFunc<u16, u16>;
using UnoModeRow8To16 = UnoModeRowFunc<u8, u16>;
template <class C>
using UnoFadeRowFunc = i32(i32 n, i32 factor, C* row);
using UnoConvertRowFunc = i32(i32 n, i32 divisor, const u16* src, u8* dst);
template <class C>
using UnoScanFunc = i32(i32 flags, i32 radius, i32 first, i32 last, i32 length, const C* src, C* dst);
template <class T>
using RowFunc = i32(i32 n, const T* src, T* dst);
template <class T>
using UnionAlphaFunc = i32(i32 n, const T* src, Channel<T> opacity, const T* mask, T* dst);
template <class T>
using InnerBlendGetter = i32(i32 mode, ZR_InnerBlendingFunc<T>* out);

template <ZR_SlotIndex>
struct Slot;  // slot number -> type of its routine; a slot without one belongs to no code of ours

#define ZR_SLOT(name, Function) \
  template <>                   \
  struct Slot<ZR_Slot_##name> { \
    using type = Function;      \
  };
ZR_SLOT(composite_rect_draft_straight, CompositeRectFunc)
ZR_SLOT(composite_rect_draft_premul, CompositeRectFunc)
ZR_SLOT(composite_rect_best_straight, CompositeRectFunc)
ZR_SLOT(composite_rect_best_premul, CompositeRectFunc)
ZR_SLOT(transfer_rows8, TransferRowsFunc<ZR_Pixel8>)
ZR_SLOT(transfer_rows16, TransferRowsFunc<ZR_Pixel16>)
ZR_SLOT(transfer_rowsFloat, TransferRowsFunc<ZR_PixelFloat>)
ZR_SLOT(transfer_rect_plus, TransferRectPlusFunc)
ZR_SLOT(composite_behind_row_straight, CompositeBehindRowFunc)
ZR_SLOT(composite_behind_row_premul, CompositeBehindRowFunc)
ZR_SLOT(transfer_rect, TransferRectFunc)
ZR_SLOT(transform_world, TransformWorldFunc)
ZR_SLOT(iterate, IterateFunc)
ZR_SLOT(iterate_origin, IterateOriginFunc)
ZR_SLOT(iterate_origin_no_clip, IterateOriginFunc)
ZR_SLOT(iterate_lut, IterateLutFunc)
ZR_SLOT(iterate_generic, IterateGenericFunc)
ZR_SLOT(premul_rect, PremulRectFunc)
ZR_SLOT(open_destination, OpenDestinationFunc)
ZR_SLOT(close_destination, OpenDestinationFunc)
ZR_SLOT(module47, ModuleOwnFunc)
ZR_SLOT(module48, ModuleOwnFunc)
ZR_SLOT(copy_bits_draft, CopyBitsFunc)
ZR_SLOT(copy_bits_hq_straight, CopyBitsFunc)
ZR_SLOT(copy_bits_hq_premul, CopyBitsFunc)
ZR_SLOT(fast_blur_straight, FastBlurFunc)
ZR_SLOT(fast_blur_premul, FastBlurFunc)
ZR_SLOT(convolve, ConvolveFunc)
ZR_SLOT(nn_sample8, SampleFunc<ZR_Pixel8>)
ZR_SLOT(nn_sample16, SampleFunc<ZR_Pixel16>)
ZR_SLOT(bilinear_straight8, SampleFunc<ZR_Pixel8>)
ZR_SLOT(bilinear_straight16, SampleFunc<ZR_Pixel16>)
ZR_SLOT(bilinear_premul8, SampleFunc<ZR_Pixel8>)
ZR_SLOT(area_straight8, SampleFunc<ZR_Pixel8>)
ZR_SLOT(area_straight16, SampleFunc<ZR_Pixel16>)
ZR_SLOT(area_premul8, SampleFunc<ZR_Pixel8>)
ZR_SLOT(bilinear_plus8, SamplePlusFunc<ZR_Pixel8>)
ZR_SLOT(bilinear_plus16, SamplePlusFunc<ZR_Pixel16>)
ZR_SLOT(bilinear_no_clip8, SampleFunc<ZR_Pixel8>)
ZR_SLOT(bilinear_no_clip16, SampleFunc<ZR_Pixel16>)
ZR_SLOT(bilinear_translate_no_clip8, SampleTranslateFunc<ZR_Pixel8>)
ZR_SLOT(bilinear_translate_no_clip16, SampleTranslateFunc<ZR_Pixel16>)
ZR_SLOT(bilinear_span8, SampleSpanFunc<ZR_Pixel8>)
ZR_SLOT(bilinear_span16, SampleSpanFunc<ZR_Pixel16>)
ZR_SLOT(bilinear_no_clip8_x4, SampleFourFunc)
ZR_SLOT(bilinear_translate_no_clip8_x4, SampleFourTranslateFunc)
ZR_SLOT(sample_compute_weight, SampleWeightFunc)
ZR_SLOT(box_blur_uno_scan, UnoScanFunc<u8>)
ZR_SLOT(box_blur_deep_uno_scan, UnoScanFunc<u16>)
ZR_SLOT(uno_row55, UnoScanFunc<u8>)
ZR_SLOT(uno_row93, UnoScanFunc<u16>)
ZR_SLOT(uno_row56, UnoModeRow8)
ZR_SLOT(uno_row62, UnoModeRow16To8)
ZR_SLOT(uno_row81, UnoModeRow16)
ZR_SLOT(uno_row82, UnoModeRow8To16)
ZR_SLOT(uno_row85, UnoFadeRowFunc<u8>)
ZR_SLOT(uno_row88, UnoFadeRowFunc<u16>)
ZR_SLOT(uno_row89, UnoFadeRowFunc<u8>)
ZR_SLOT(uno_row113, UnoFadeRowFunc<u16>)
ZR_SLOT(uno_row114, UnoConvertRowFunc)
ZR_SLOT(transform_row8, TransformRowsFunc<ZR_Pixel8>)
ZR_SLOT(transform_row16, TransformRowsFunc<ZR_Pixel16>)
ZR_SLOT(transform_rowFloat, TransformRowsFunc<ZR_PixelFloat>)

// The slots of rows that exist once for each depth.
template <class T>
struct DepthSlots;
#define ZR_DEPTH_SLOTS(Pixel, suffix)                                                                                 \
  ZR_SLOT(premul_row##suffix, RowFunc<Pixel>)                                                                         \
  ZR_SLOT(unmul_row##suffix, RowFunc<Pixel>)                                                                          \
  ZR_SLOT(white_fade_row##suffix, RowFunc<Pixel>)                                                                     \
  ZR_SLOT(white_unfade_row##suffix, RowFunc<Pixel>)                                                                   \
  ZR_SLOT(grey_fade_row##suffix, RowFunc<Pixel>)                                                                      \
  ZR_SLOT(grey_unfade_row##suffix, RowFunc<Pixel>)                                                                    \
  ZR_SLOT(union_alpha_row##suffix, UnionAlphaFunc<Pixel>)                                                             \
  ZR_SLOT(inner_blend##suffix, InnerBlendGetter<Pixel>)                                                               \
  ZR_SLOT(inner_blend_mask##suffix, InnerBlendGetter<Pixel>)                                                          \
  ZR_SLOT(inner_blend_linear##suffix, InnerBlendGetter<Pixel>)                                                        \
  ZR_SLOT(inner_blend_mask_linear##suffix, InnerBlendGetter<Pixel>)                                                   \
  template <>                                                                                                         \
  struct DepthSlots<Pixel> {                                                                                          \
    static constexpr ZR_SlotIndex premul = ZR_Slot_premul_row##suffix, unmul = ZR_Slot_unmul_row##suffix,             \
                                  white_fade = ZR_Slot_white_fade_row##suffix,                                        \
                                  white_unfade = ZR_Slot_white_unfade_row##suffix,                                    \
                                  grey_fade = ZR_Slot_grey_fade_row##suffix,                                          \
                                  grey_unfade = ZR_Slot_grey_unfade_row##suffix,                                      \
                                  union_alpha = ZR_Slot_union_alpha_row##suffix, inner = ZR_Slot_inner_blend##suffix, \
                                  inner_mask = ZR_Slot_inner_blend_mask##suffix,                                      \
                                  inner_linear = ZR_Slot_inner_blend_linear##suffix,                                  \
                                  inner_mask_linear = ZR_Slot_inner_blend_mask_linear##suffix,                        \
                                  transfer_rows = ZR_Slot_transfer_rows##suffix,                                      \
                                  transform_rows = ZR_Slot_transform_row##suffix;                                     \
  };
ZR_DEPTH_SLOTS(ZR_Pixel8, 8)
ZR_DEPTH_SLOTS(ZR_Pixel16, 16)
ZR_DEPTH_SLOTS(ZR_PixelFloat, Float)
#undef ZR_DEPTH_SLOTS
#undef ZR_SLOT

template <ZR_SlotIndex S>
void set_slot(typename Slot<S>::type* routine) {
  ZRp_G_OverFuncs[S] = reinterpret_cast<ZR_SlotFunc>(routine);
}

// The routine in a slot now; null before birth.
template <ZR_SlotIndex S>
typename Slot<S>::type* slot() {
  return reinterpret_cast<typename Slot<S>::type*>(ZRp_G_OverFuncs[S]);
}

// What an export of a replaceable routine does: jump through its slot. An empty slot (before birth, or a
// routine that a module took away) is a failure and not a jump to nowhere.
template <ZR_SlotIndex S, class... Arguments>
i32 call_slot(Arguments... arguments) {
  auto* const routine = slot<S>();
  return routine != nullptr ? routine(arguments...) : static_cast<i32>(ZR_Err_Internal);
}

}  // namespace zr
