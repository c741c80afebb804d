// Blurs along one direction: a running box of any radius, and the library's bell curve. A blur in two directions is
// two calls; one call may read columns and write rows, or the reverse.
//
// Lines      a destination line takes the source line at its place, where the origins of both worlds
//            (ZR_World::origin, along and across the lines) say where that is. Lines without one are cleared.
// Channels   those of `flags` are blurred; the others are copied from the source (0 outside of it).
// Ends       what lies outside a line counts as transparent black, and edges fade; under ZR_BlurFlag_Renormalise it
//            is left out, and edges keep their level.
// Alpha      straight sources are premultiplied on the fly where colour is blurred, and straight destinations
//            divided by the blurred alpha; a premultiplied end is taken and left as it is.
// Worlds     of one depth. One world may be both with force_copy, the same direction on both sides and whole lines.
// Threads    bands of lines go through ZR_IterateGeneric; scratch is per thread index, for as many as
//            HB_GetNumThreads tells (1 if nobody set it). Calls on distinct destinations may run together.
// Abort      progress->abort alone is asked, by thread 0, once for each of its lines; an answer other than 0 is
//            thrown, and lines done by then stay.
// Failure    throws an i32: ZR_Err_OutOfMemory; ZR_Err_Internal, reported, for depths that differ or are unknown, a
//            radius that is negative or NaN or beyond the range below, and 0 iterations.
// Exactness  8-bit sums are exact. They have 32 bits: for a box, 261120 times the pixels of a line (in a later
//            iteration, of the part that it passes on) that the box holds at once, plus 1024 times the radius, must
//            stay below 2^31, which any radius up to 4000 does; beyond, ZR_Err_Internal. A bell reaches 32000.
//            16-bit and float sums are single precision in the order of the line, the same bits on every processor
//            and number of threads; the alpha of floats, blurred alone by boxes, is summed in double precision.
#pragma once

#include <ZR/filter.h>
#include <ZR/world.h>

enum : u32 {
  ZR_BlurFlag_Alpha = 1,
  ZR_BlurFlag_Red = 2,
  ZR_BlurFlag_Green = 4,
  ZR_BlurFlag_Blue = 8,
  ZR_BlurFlag_AllChannels = 15,
  ZR_BlurFlag_Renormalise = 16,
};

// A box of 2 * radius + 1 pixels, the outermost of which weigh less where the radius is not whole; applied
// `iterations` times (1 or more), each time widening what is read by ceil(radius). Time does not depend on the
// radius. `vertical` runs along columns. Radii up to 1048575.
ZR_API void ZR_BoxBlur1D(const ZR_ProgressInfo* progress, const ZR_World* src, f32 radius, u32 iterations, u32 flags,
                         bool src_vertical, bool src_premultiplied, bool dst_vertical, bool dst_premultiplied,
                         bool force_copy, ZR_World* dst);

// A bell that ends at 1 + radius, of 2 * ceil(radius) + 1 whole-numbered taps. Radii up to 32000 at 8 bits, 32767
// otherwise.
ZR_API void ZR_GaussianBlur1D(const ZR_ProgressInfo* progress, const ZR_World* src, f32 radius, u32 flags,
                              bool src_vertical, bool src_premultiplied, bool dst_vertical, bool dst_premultiplied,
                              bool force_copy, ZR_World* dst);

// ZR_Convolve for worlds that are known to be of this depth; the three pixel types.
template <class Pixel>
ZR_API i32 ZRp_Convolve(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const GX_LRect* rect, u32 flags, i32 size,
                        const i32* a_kernel, const i32* r_kernel, const i32* g_kernel, const i32* b_kernel,
                        ZR_LayerDef* dst);
