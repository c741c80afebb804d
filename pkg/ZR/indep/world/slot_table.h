// Typed access to the slot table: a slot number gives the type of its routine, so that a wrong routine
// does not compile, and the casts stand here alone. Default bodies are installed on the host floor.
#pragma once

#include <ZR/composite.h>
#include <ZR/slots.h>
#include <ZR/zr.h>

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
template <class T>
using RowFunc = i32(i32 n, const T* src, T* dst);
template <class T>
using UnionAlphaFunc = i32(i32 n, const T* src, Channel<T> opacity, const T* mask, T* dst);
template <class T>
using InnerBlendGetter = i32(i32 mode, ZR_InnerBlendingFunc<T>* out);

template <ZR_SlotIndex>
struct Slot;  // slot number -> type of its routine; a slot without one belongs to no code of ours

template <>
struct Slot<ZR_Slot_composite_rect_draft_straight> {
  using type = CompositeRectFunc;
};
template <>
struct Slot<ZR_Slot_composite_rect_draft_premul> {
  using type = CompositeRectFunc;
};
template <>
struct Slot<ZR_Slot_composite_rect_best_straight> {
  using type = CompositeRectFunc;
};
template <>
struct Slot<ZR_Slot_composite_rect_best_premul> {
  using type = CompositeRectFunc;
};
template <>
struct Slot<ZR_Slot_transfer_rows8> {
  using type = TransferRowsFunc<ZR_Pixel8>;
};
template <>
struct Slot<ZR_Slot_transfer_rows16> {
  using type = TransferRowsFunc<ZR_Pixel16>;
};
template <>
struct Slot<ZR_Slot_transfer_rowsFloat> {
  using type = TransferRowsFunc<ZR_PixelFloat>;
};
template <>
struct Slot<ZR_Slot_transfer_rect_plus> {
  using type = TransferRectPlusFunc;
};
template <>
struct Slot<ZR_Slot_composite_behind_row_straight> {
  using type = CompositeBehindRowFunc;
};
template <>
struct Slot<ZR_Slot_composite_behind_row_premul> {
  using type = CompositeBehindRowFunc;
};
template <>
struct Slot<ZR_Slot_transfer_rect> {
  using type = TransferRectFunc;
};
template <>
struct Slot<ZR_Slot_transform_world> {
  using type = TransformWorldFunc;
};
template <>
struct Slot<ZR_Slot_iterate> {
  using type = IterateFunc;
};
template <>
struct Slot<ZR_Slot_iterate_origin> {
  using type = IterateOriginFunc;
};
template <>
struct Slot<ZR_Slot_iterate_origin_no_clip> {
  using type = IterateOriginFunc;
};
template <>
struct Slot<ZR_Slot_iterate_lut> {
  using type = IterateLutFunc;
};
template <>
struct Slot<ZR_Slot_iterate_generic> {
  using type = IterateGenericFunc;
};
template <>
struct Slot<ZR_Slot_premul_rect> {
  using type = PremulRectFunc;
};
template <>
struct Slot<ZR_Slot_open_destination> {
  using type = OpenDestinationFunc;
};
template <>
struct Slot<ZR_Slot_close_destination> {
  using type = OpenDestinationFunc;
};
template <>
struct Slot<ZR_Slot_module47> {
  using type = ModuleOwnFunc;
};
template <>
struct Slot<ZR_Slot_module48> {
  using type = ModuleOwnFunc;
};

// The slots of rows that exist once for each depth.
template <class T>
struct DepthSlots;
#define ZR_DEPTH_SLOTS(Pixel, suffix)                                                                                 \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_premul_row##suffix> {                                                                           \
    using type = RowFunc<Pixel>;                                                                                      \
  };                                                                                                                  \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_unmul_row##suffix> {                                                                            \
    using type = RowFunc<Pixel>;                                                                                      \
  };                                                                                                                  \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_white_fade_row##suffix> {                                                                       \
    using type = RowFunc<Pixel>;                                                                                      \
  };                                                                                                                  \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_white_unfade_row##suffix> {                                                                     \
    using type = RowFunc<Pixel>;                                                                                      \
  };                                                                                                                  \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_grey_fade_row##suffix> {                                                                        \
    using type = RowFunc<Pixel>;                                                                                      \
  };                                                                                                                  \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_grey_unfade_row##suffix> {                                                                      \
    using type = RowFunc<Pixel>;                                                                                      \
  };                                                                                                                  \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_union_alpha_row##suffix> {                                                                      \
    using type = UnionAlphaFunc<Pixel>;                                                                               \
  };                                                                                                                  \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_inner_blend##suffix> {                                                                          \
    using type = InnerBlendGetter<Pixel>;                                                                             \
  };                                                                                                                  \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_inner_blend_mask##suffix> {                                                                     \
    using type = InnerBlendGetter<Pixel>;                                                                             \
  };                                                                                                                  \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_inner_blend_linear##suffix> {                                                                   \
    using type = InnerBlendGetter<Pixel>;                                                                             \
  };                                                                                                                  \
  template <>                                                                                                         \
  struct Slot<ZR_Slot_inner_blend_mask_linear##suffix> {                                                              \
    using type = InnerBlendGetter<Pixel>;                                                                             \
  };                                                                                                                  \
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
                                  transfer_rows = ZR_Slot_transfer_rows##suffix;                                      \
  };
ZR_DEPTH_SLOTS(ZR_Pixel8, 8)
ZR_DEPTH_SLOTS(ZR_Pixel16, 16)
ZR_DEPTH_SLOTS(ZR_PixelFloat, Float)
#undef ZR_DEPTH_SLOTS

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
