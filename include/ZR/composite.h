// Compositing rows: what the row loops of ZR_TransferRect and of layer transforms are made of.
//
// A transfer mode is resolved once into a ZR_BlendModeDescriptor, the plan of a row: which functions
// run over it and in which order. ZR_BlendPipeline then runs one row by that plan.
#pragma once

#include <ZR/depth.h>
#include <ZR/transfer_mode.h>
#include <ZR/world.h>
#include <ZR/zr.h>

template <class T>
struct ZR_API ZR_BlendingMode {
  i32 mode;                // -3..40
  i32 seed;                // XferDissolve only
  zr::Channel<T> opacity;  // 0..white, a factor on source alpha; not clamped
  u8 keep_alpha;           // non-zero: the destination's alpha comes out unchanged

  ZR_BlendingMode() = default;
  // trunc(255 * opacity + 0.5), trunc(32768 * opacity + 0.5), or the opacity itself.
  ZR_API explicit ZR_BlendingMode(const ZR_CompositeModePlus& mode);
};

// n pixels of src over dst, mask null or n pixels of which the alpha counts. Returns 0 or an error.
template <class T>
using ZR_InnerBlendingFunc = i32 (*)(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables,
                                     const T* src, const T* mask, T* dst);
// n pixels from src to dst; src null or equal to dst works in place. Returns 0.
template <class T>
using ZR_RowFunc = i32 (*)(i32 n, const T* src, T* dst);
// dst alpha = 1 - (1 - A)(1 - dst alpha), A the effective alpha of src, opacity and mask (or null).
template <class T>
using ZR_UnionAlphaFunc = i32 (*)(i32 n, const T* src, zr::Channel<T> opacity, const T* mask, T* dst);

// The function of a mode. masked: it reads the mask; linear: it blends in linear light. An unknown mode
// reports "unimplemented blending mode.", returns 5 and leaves *out alone.
template <class T, bool masked, bool linear>
ZR_API i32 ZR_GetInnerBlendingFunc(i32 mode, ZR_InnerBlendingFunc<T>* out);

// The plan of a row. Read-only once built; threads may share it.
template <class T>
struct ZR_API ZR_BlendModeDescriptor {
  // Asks the getter slots twice, for the mode and for XferBehind. An unknown mode is reported and leaves
  // `main` null. Throws what a getter replacement throws.
  ZR_BlendModeDescriptor(const ZR_BlendingMode<T>& mode, bool has_mask, const ZR_LinearBlendingTables* tables);

  ZR_BlendingMode<T> mode;
  ZR_InnerBlendingFunc<T> first_pass = nullptr;  // XferBehind
  ZR_RowFunc<T> fade = nullptr;                  // the destination to its ground colour
  ZR_RowFunc<T> unfade = nullptr;                // and back
  ZR_InnerBlendingFunc<T> main = nullptr;
  ZR_UnionAlphaFunc<T> union_alpha = nullptr;
  u8 use_fade = 0;
  u8 use_first_pass = 0;
  u8 may_keep_alpha = 0;
  u8 use_union_alpha = 0;
  const ZR_LinearBlendingTables* tables = nullptr;
};

// Runs one row. src and dst have n pixels, mask n or none; scratch holds n channel values. Returns 0 or
// the first error; 5 when the descriptor has no main function. No state of its own.
template <class T>
ZR_API i32 ZR_BlendPipeline(const ZR_ProgressInfo* progress, i32 n, const ZR_BlendModeDescriptor<T>* descriptor,
                            const T* src, const T* mask, zr::Channel<T>* scratch, T* dst);

namespace zr {

// The seed of a composite's rows is the record's seed + left at the top, and grows by y * row_seed_step behind
// row y.
inline constexpr u32 row_seed_step = 12281;
// The rand_seed with which a composite that starts at row `y` gives its rows the seeds that they have in one with
// `rand_seed` that starts at `top` (at most y), both in the same columns.
constexpr i32 seed_from_row(i32 rand_seed, i32 top, i32 y) {
  const i64 rows = i64{y} - top;
  const u32 sum = static_cast<u32>(rows * (i64{y} + top - 1) / 2);  // of top .. y - 1
  return static_cast<i32>(static_cast<u32>(rand_seed) + sum * row_seed_step);
}

}  // namespace zr

// Grows the shared scratch to `width` pixels (or, forced, to exactly that) and fills the ten pointers of
// `record`. channel_bytes is 1, 2 or 4. Returns 0, 3 or 4. Not for threads.
ZR_API i32 ZRp_ReallocScratch(i32 width, i32 channel_bytes, bool force, void* record[10]);
