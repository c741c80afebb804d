/* What an alpha channel of unknown meaning is, and taking 8-bit pixels on and off a matte colour.
 *
 * All pixels are 8-bit. `ref` is not read. Null arguments, where not allowed below, are reported and give
 * ZR_Err_Internal. Threads: any; calls that write one row or world may not run together. */
#ifndef ZR_ALPHA_GUESS_H
#define ZR_ALPHA_GUESS_H

#include <ZR/types.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum ZR_AlphaGuess {
  ZR_AlphaGuess_Straight = 0,
  ZR_AlphaGuess_Premultiplied = 1, /* against the matte colour, whose alpha is 255 */
  ZR_AlphaGuess_Unknown = 2        /* no pixel has an alpha above 0 */
} ZR_AlphaGuess;

/* Reads every pixel of an 8-bit world once and stores one of the codes above, and the matte (zero unless the code is
 * 1). With a null world the raster frame is read, alpha first, locked meanwhile; its lock error is returned. An image
 * without transparent pixels whose colours vary counts as premultiplied against black. A world of another depth is a
 * failed verification: ZR_Err_Internal, code and matte untouched. */
ZR_API i32 ZR_GuessAlpha(void* ref, ZR_LayerDef* world, RS_World** raster, i32* code, ZR_Pixel8* matte);
/* The same; message (which may be null) gets a text to show with code 2, and the empty string with the others. */
ZR_API i32 ZR_GuessAlphaMessage(void* ref, ZR_LayerDef* world, RS_World** raster, i32* code, ZR_Pixel8* matte,
                                char message[256]);

/* A row of n pixels, alpha first, onto black (colour times alpha) and off it (colour over alpha, white where the
 * colour is not below alpha, so everywhere under alpha 0). src null or equal to dst works in place; other overlap is
 * not allowed. n below 1 does nothing. Alpha stays. */
ZR_API i32 ZR_BlackMatte(void* ref, i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst);
ZR_API i32 ZR_DeBlackMatte(void* ref, i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst);
/* The same in place; off black, pixels of alpha 0 become zero. BGRA rows have blue in their first byte and alpha in
 * the last: only then do the names of the fields not say what they hold. */
ZR_API i32 ZR_BlackMatteARGB(void* ref, i32 n, ZR_Pixel8* row);
ZR_API i32 ZR_DeBlackMatteARGB(void* ref, i32 n, ZR_Pixel8* row);
ZR_API i32 ZR_BlackMatteBGRA(void* ref, i32 n, ZR_Pixel8* row);
ZR_API i32 ZR_DeBlackMatteBGRA(void* ref, i32 n, ZR_Pixel8* row);

/* Moves a world from a black matte to `colour` (direction non-zero) or from it to black. Sums wrap at 8 bits, so that
 * there and back gives the world again exactly. colour is alpha first in both; in the BGRA form the world is blue
 * first. A world of another depth is a failed verification and ZR_Err_Internal. */
ZR_API i32 ZR_MatteBlackToMatteColorARGB(ZR_LayerDef* world, const ZR_Pixel8* colour, i32 direction);
ZR_API i32 ZR_MatteBlackToMatteColorBGRA(ZR_LayerDef* world, const ZR_Pixel8* colour, i32 direction);

#ifdef __cplusplus
}
#endif

#endif
