/* Mask buffers: pictures of one channel that are built up from shapes, blurred, faded and combined, and at last
 * merged into the alpha of a world (<ZR/mask_alpha.h>).
 *
 * Values    8 bits 0..255, 16 bits ("deep") 0..32768, or float 0..1; rows follow each other without a gap.
 * Results   0, or ZR_Err_Internal with the report "damaged mask buffer" for a buffer that is null, has another magic
 *           or no memory, and with a report of its own for depths that do not go together. Nothing is written then.
 * Places    rectangles and points in pixels. A null rectangle is all of the source; a null point is the
 *           rectangle's own corner. What lies outside a buffer is cut off, except by the fills.
 * Aliasing  buffers of one call may be one buffer where a pixel is read at the place where it is written.
 * Threads   rows go through ZR_IterateGeneric where a function takes `progress`, small jobs on the calling thread. A
 *           buffer is in one call at a time.
 * Abort     progress->abort alone is asked, once, before the first row; an answer other than 0 is returned.
 *
 * Usable from C; the overloads are C++. */
#ifndef ZR_MASK_BUFFER_H
#define ZR_MASK_BUFFER_H

#include <ZR/types.h>

#define ZR_UnoMagic 0xfeedabbau /* a buffer that lives */

#if defined(__GNUC__)
#pragma GCC visibility push(default)
#endif
typedef struct ZR_UnoBuffer {
  u32 magic;
  i32 width, height; /* pixels */
  void** data;       /* handle: one dereference gives the pixels */
  i32 depth;         /* bits per value: 8, 16 or 32 */
#ifdef __cplusplus
  /* Zeroed values. depth 1 is 8 bits and depth 0 is 16, as in flags of old. Throws an i32: ZR_Err_OutOfMemory. */
  ZR_UnoBuffer(i32 width, i32 height, i32 depth);
  ~ZR_UnoBuffer(); /* another magic is reported, and nothing is freed */
  ZR_UnoBuffer(const ZR_UnoBuffer&) = delete;
  ZR_UnoBuffer& operator=(const ZR_UnoBuffer&) = delete;
  /* Counted memory, the same that ZR_NewUnoBuffer takes: either may be deleted or disposed of. */
  static void* operator new(size_t bytes) noexcept;
  static void operator delete(void* record) noexcept;
#endif
} ZR_UnoBuffer;
#if defined(__GNUC__)
#pragma GCC visibility pop
#endif
ZR_ASSERT_LAYOUT(offsetof(ZR_UnoBuffer, width) == 4 && offsetof(ZR_UnoBuffer, height) == 8);
ZR_ASSERT_LAYOUT(offsetof(ZR_UnoBuffer, data) == 16 && offsetof(ZR_UnoBuffer, depth) == 24);
ZR_ASSERT_LAYOUT(sizeof(ZR_UnoBuffer) == 32);

/* How a value s of a source joins the value d under it; W is white, mul and inv are the depth's (<ZR/depth.h>). Any
 * other number is a screen too. */
typedef enum ZR_UnoMode {
  ZR_UnoMode_DitheredScreen = -1, /* screen with noise in place of rounding; float without */
  ZR_UnoMode_Screen = 0,          /* inv(mul(inv(s), inv(d))) */
  ZR_UnoMode_Erase = 2,           /* mul(inv(s), d) */
  ZR_UnoMode_Intersect = 3,       /* mul(s, d); the target outside of the rectangle becomes 0 */
  ZR_UnoMode_Lighten = 4,         /* max(s, d) */
  ZR_UnoMode_Darken = 5,          /* min(s, d); the target outside of the rectangle becomes 0 */
  ZR_UnoMode_Difference = 6,      /* abs(s - d) */
  ZR_UnoMode_Add = 7              /* min(s + d, W) */
} ZR_UnoMode;

#ifdef __cplusplus
extern "C" {
#endif

/* A zeroed buffer of 8 or 16 bits. Null out: ZR_Err_Internal. ZR_Err_OutOfMemory, also for negative sides, leaves
 * *out null. */
ZR_API i32 ZR_NewUnoBuffer(i32 width, i32 height, ZR_UnoBuffer** out);
ZR_API i32 ZR_NewDeepUnoBuffer(i32 width, i32 height, ZR_UnoBuffer** out);
/* Null is nothing. A record with another magic is reported and freed without its memory. */
ZR_API i32 ZR_DisposeUnoBuffer(ZR_UnoBuffer* buffer);

/* All values; by the first all bytes, of a buffer of any depth. */
ZR_API i32 ZR_FillUnoBuffer(u8 value, ZR_UnoBuffer* buffer);
ZR_API i32 ZR_FillDeepUnoBuffer(u16 value, ZR_UnoBuffer* buffer);
ZR_API i32 ZR_FillFloatUnoBuffer(f32 value, ZR_UnoBuffer* buffer);

/* W - v. */
ZR_API i32 ZR_InvertUnoBuffer(const ZR_ProgressInfo* progress, ZR_UnoBuffer* buffer);
/* mul(W - v, k), k being fade (16.16) times W, rounded; not held to 0..W. */
ZR_API i32 ZR_InvertAndFadeUnoBuffer(const ZR_ProgressInfo* progress, i32 fade, ZR_UnoBuffer* buffer);
/* mul(v, k), k being fade times W, rounded; on the calling thread. */
ZR_API i32 ZR_FadeUnoBuffer(f32 fade, ZR_UnoBuffer* buffer);

/* Combines `rect` of src into dst at the same place. 8-bit and deep buffers mix: values of src are brought to the
 * depth of dst (widen_8_to_16, narrow_16_to_8) and combined there. Floats go with floats. */
ZR_API i32 ZR_AccumulateUnoBuffers(const ZR_ProgressInfo* progress, const ZR_UnoBuffer* src, i32 mode,
                                   const GX_LRect* rect, ZR_UnoBuffer* dst);
/* The same of src1 with src2, which is read at the place in dst; three buffers of one depth. */
ZR_API i32 ZR_TransferUnoBuffers(const ZR_ProgressInfo* progress, const ZR_UnoBuffer* src1, const ZR_UnoBuffer* src2,
                                 i32 mode, const GX_LRect* rect, const GX_LPoint* point, ZR_UnoBuffer* dst);
/* Values of a deep buffer over `divisor`, rounded, at the same place; 8-bit targets take the low byte. A source of
 * another depth is nothing, 0. Divisor 0: ZR_Err_Internal. */
ZR_API i32 ZR_ConvertDeepUnoBuffer(const ZR_ProgressInfo* progress, const ZR_UnoBuffer* src, const GX_LRect* rect,
                                   i32 divisor, ZR_UnoBuffer* dst);

/* One line of a blur of masks: `length` values from src to dst, which do not overlap, of which first..last (both
 * included, cut to the line) are made. Gathering columns into lines is the caller's. radius is 16.16 and counts 1.4
 * times under ZR_UnoScan_Wide (the low byte of flags is the caller's own, such as a direction); results are those of
 * ZR_BoxBlur1D and ZR_GaussianBlur1D on alpha, within rounding, and what lies outside a line counts as 0. A box costs
 * the same for every radius. Returns 0; ZR_Err_Internal for null lines and a negative radius; ZR_Err_OutOfMemory. Any
 * number of threads. The taps of the latest bell are kept until another radius comes; small ones (to 2.71) keep none.
 */
enum { ZR_UnoScan_Plain = 0, ZR_UnoScan_Wide = 0x100 };
ZR_API i32 ZR_BoxBlurUnoScan(i32 flags, i32 radius, i32 first, i32 last, i32 length, const u8* src, u8* dst);
ZR_API i32 ZR_BoxBlurDeepUnoScan(i32 flags, i32 radius, i32 first, i32 last, i32 length, const u16* src, u16* dst);
ZR_API i32 ZR_GBlurUnoScan(i32 flags, i32 radius, i32 first, i32 last, i32 length, const u8* src, u8* dst);
ZR_API i32 ZR_GBlurDeepUnoScan(i32 flags, i32 radius, i32 first, i32 last, i32 length, const u16* src, u16* dst);

#ifdef __cplusplus
}

/* Only `rect`, which lies inside the buffer and is of the function's depth: else ZR_Err_Internal, nothing filled. */
ZR_API i32 ZR_FillUnoBuffer(u8 value, const GX_LRect* rect, ZR_UnoBuffer* buffer);
ZR_API i32 ZR_FillDeepUnoBuffer(u16 value, const GX_LRect* rect, ZR_UnoBuffer* buffer);

/* The rectangle's corner lands at `point` of dst. */
ZR_API i32 ZR_AccumulateUnoBuffers(const ZR_ProgressInfo* progress, const ZR_UnoBuffer* src, i32 mode,
                                   const GX_LRect* rect, const GX_LPoint* point, ZR_UnoBuffer* dst);
/* With mul(s, opacity) in place of s. Mode -1 then raises d toward the ceiling, d + smul(s, ceiling - d), and leaves
 * what is above it. Both are 0..1, not held there; 1 and 1 is the form above. */
ZR_API i32 ZR_AccumulateUnoBuffers(const ZR_ProgressInfo* progress, const ZR_UnoBuffer* src, i32 mode, f32 opacity,
                                   f32 ceiling, const GX_LRect* rect, const GX_LPoint* point, ZR_UnoBuffer* dst);
#endif

#endif
