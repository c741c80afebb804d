/* Kernels of whole numbers: the library's bell curve as a table, and convolution with any table. Usable from C.
 * The blurs themselves are in <ZR/blur.h>, for C++.
 */
#ifndef ZR_FILTER_H
#define ZR_FILTER_H

#include <ZR/types.h>

#ifdef __cplusplus
extern "C" {
#endif

/* The bell curve of radius 1: 1 at 0, falling to almost 0 at 1, and 0 beyond. Cannot fail. */
ZR_API f64 ZRp_GaussianValue(f64 r);

enum {
  ZR_KernelFlag_OneRow = 1,    /* the middle row alone; else as many rows as columns */
  ZR_KernelFlag_Normalised = 2 /* scaled so that the entries sum to about 255 times their number */
};
/* Fills a table of the curve around its middle: 2 * ceil(radius) + 1 columns, written to *diameter, by 1 or as many
 * rows, row after row. Entries are 255 * multiplier in the middle, kept to 0..255 unless normalised. The caller
 * owns the table and makes room for all of it; `unused` is not read. 3, reported, for a null pointer and for a
 * radius that is negative, NaN or above 32767: then nothing is written. Any thread. */
ZR_API i32 ZR_GaussianKernel(void* unused, f64 radius, u8 kernel_flags, f64 multiplier, u32* diameter, i32* kernel);

enum {
  ZR_ConvolveFlag_1D = 1,         /* the kernels are one row or column of `size` taps; else size by size */
  ZR_ConvolveFlag_Normalised = 2, /* divides by the sum of each kernel (by 1 if that is 0); else by taps * 256 */
  ZR_ConvolveFlag_NoClamp = 4,    /* 8 bits: results are taken modulo 65536, as a signed number, before 0..255 */
  ZR_ConvolveFlag_Vertical = 32   /* a one-dimensional kernel is a column */
};
/* Each channel of dst is the sum of channel times tap over the window that is centred on its pixel, divided, toward
 * zero. The kernels are laid over the window as they are, not mirrored; pixels outside of src count as 0 and the
 * divisor stays. Channels are filtered as they are: premultiplied pixels for what bears alpha. Results are kept to
 * 0..255 and 0..32768; float results to nothing.
 *
 * size      odd; a kernel has size * size taps, or size, row after row. At most 65535.
 * kernels   any i32, each may be the same array; read only during the call. Integer sums are exact, in 64 bits, and
 *           3 is returned for kernels of which a sum could leave them: taps whose absolute values sum to more than
 *           2^63 / 65535 (2^63 / 255 for 8 bits). Float products are single precision, summed in double precision row
 *           by row, and the quotient of sum and divisor is single.
 * rect      not read: all of dst is filled, src lies at its top left corner. One depth; not one world.
 * Polls     progress->progress alone, with (rows done, rows), after a row when more than 2048 taps were worked on
 *           since the last; its answer other than 0 ends the call and is returned. Rows done stay.
 * Failure   3 for depths that differ, null worlds, pixels or kernels, and for sizes out of range, all reported;
 *           4 when there is no memory for scratch. */
ZR_API i32 ZR_Convolve(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const GX_LRect* rect, u32 flags, i32 size,
                       const i32* a_kernel, const i32* r_kernel, const i32* g_kernel, const i32* b_kernel,
                       ZR_LayerDef* dst);
/* Of ZR_Convolve the destination rows first_row..end_row-1, with the bytes that the whole call gives them; asks nobody,
 * and judges its arguments even where there are no such rows. Calls for different rows may run together. */
ZR_API i32 ZR_ConvolveRows(ZR_LayerDef* src, u32 flags, i32 size, const i32* a_kernel, const i32* r_kernel,
                           const i32* g_kernel, const i32* b_kernel, ZR_LayerDef* dst, i32 first_row, i32 end_row);

/* Names kept for holders of old tables: nothing is read or done, the result is 5. */
ZR_API i32 ZR_FastBlur_Straight(const ZR_ProgressInfo* progress, ZR_LayerDef* src, f64 radius, ZR_LayerDef* dst);
ZR_API i32 ZR_FastBlur_Premul(const ZR_ProgressInfo* progress, ZR_LayerDef* src, f64 radius, ZR_LayerDef* dst);

#ifdef __cplusplus
}
#endif

#endif
