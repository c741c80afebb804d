/* The C interface of libzr: records, codes and exported functions. Usable from C11 and from C++20.
 *
 * Life      ZR_Birth once before anything else, ZR_Death once at the end, both alone on one thread.
 * Results   every failing function returns an i32: ZR_Err_None (0), one of the codes below, or the
 *           non-zero code that a progress or abort function returned. No exception leaves an export.
 * Pixels    alpha, red, green, blue in memory; straight alpha unless a name says Premul;
 *           white is 255, 32768 (not 65535) or 1.0f.
 * Records   what is passed in belongs to the caller; nothing is kept after a call returns.
 * Threads   calls on distinct worlds, or on distinct rows of one world, may run together unless a
 *           function says otherwise. Rows of parallel operations go out through ZR_IterateGeneric.
 */
#ifndef ZR_ZR_H
#define ZR_ZR_H

#include <ZR/types.h>

#ifdef __cplusplus
extern "C" {
#endif

/* ------------------------------------------------------------------------------------- life */

/* Builds the shared tables, loads acceleration modules, fills the slot table. Not counted: a second
 * call starts over and loses overrides. On failure the slot table stays empty. Alone, main thread. */
ZR_API i32 ZR_Birth(void);
/* Calls every acceleration module a last time and frees what birth made. The first error, else 0. */
ZR_API i32 ZR_Death(void);
/* Shrinks the shared scratch rows back to their size after birth. Not while a composite runs. */
ZR_API i32 ZR_FreeUpSomeMemory(void);
/* Obsolete: reports "Obsolete routine" and returns ZR_Err_BadSelector. */
ZR_API i32 ZR_OverrideStdFuncs(void);
/* Selectors 2 and 3 store the address of the 65,536-byte multiply or divide table through the out
 * pointer that follows, 4 and 5 that of the trigonometry table; 6, 7 and 8, 9 give them back.
 * Any other selector does nothing. Returns 0 or the table's error. */
ZR_API i32 ZR_AppCallback(void* ref, i32 selector, ...);
/* sqrt(x * x + y * y), with no scaling: overflows where the squares do. Cannot fail. */
ZR_API f64 ZR_Hypot(f64 x, f64 y);
/* One step of the system's own multiplicative generator: updates *seed, returns 0..32767. */
ZR_API i32 ZR_Rand(u32* seed);
/* Puts the dither cursor back to the table's start, so that a dithered conversion repeats exactly. */
ZR_API void ZR_ResetDitherRandomIndex(void);
/* Reports "bad parameter passed to effect callback" under 0x250000 | site; returns ZR_Err_Internal. */
ZR_API i32 ZR_ReportBadCallbackParam(i32 site);

/* Fills a rectangle (null: all) with a colour (null: transparent black), converted to the world's
 * depth. Rectangle corners may come in any order and are clamped to the world. `ref` is not read. */
ZR_API i32 ZR_Fill(void* ref, const ZR_Pixel8* colour, const GX_LRect* rect, ZR_LayerDef* world);
ZR_API i32 ZR_Fill16(void* ref, const ZR_Pixel16* colour, const GX_LRect* rect, ZR_LayerDef* world);
ZR_API i32 ZR_FillFloat(void* ref, const ZR_PixelFloat* colour, const GX_LRect* rect, ZR_LayerDef* world);

/* ------------------------------------------------------------------ effect worlds and chunks */

/* Allocates width x height pixels (each 1..30000) of depth 8, 16 or 32 bits a channel and fills
 * *out; `clear` zeroes them, `raster` backs them with an RS_World. Null out: nothing, 0. */
ZR_API i32 ZR_NewEffectWorld(void* ref, i32 width, i32 height, i32 depth, bool clear, bool raster, ZR_LayerDef* out);
/* Frees a record that ZR_NewEffectWorld filled, and zeroes it; any other is refused (516). */
ZR_API i32 ZR_DisposeEffectWorld(void* ref, ZR_LayerDef* world);
/* *depth = 8, 16 or 32. */
ZR_API i32 ZR_GetEffectWorldDepth(void* ref, const ZR_LayerDef* world, i32* depth);
/* Fills *out with a view of a raster frame; its extent stays zero. Nothing is owned. */
ZR_API i32 ZR_EffectWorldFromRSWorld(RS_World** raster, ZR_LayerDef* out);
/* Bits per channel of a raster frame: its bits per pixel / 4. Cannot fail. */
ZR_API i16 ZR_DepthOfRSWorld(RS_World** raster);
/* *out = `pixels`, or the world's data if that is null; null when the world has another depth. */
ZR_API i32 ZR_GetPixelData8(ZR_LayerDef* world, void* pixels, void** out);
ZR_API i32 ZR_GetPixelData16(ZR_LayerDef* world, void* pixels, void** out);
ZR_API i32 ZR_GetPixelDataFloat(ZR_LayerDef* world, void* pixels, void** out);

/* Clears a record of 32 bytes; Open also stores `first` at its start. Null record: nothing. Returns 0. */
ZR_API i32 ZR_OpenDestination(void* first, void* record);
ZR_API i32 ZR_CloseDestination(void* first, void* record);

/* Bytes of one element of a chunk type; 1 for a type that is not known. */
ZR_API i32 ZR_ChunkDataSize(i32 type, u16* size);
/* width * channels elements a row, height rows, zeroed; born locked. */
ZR_API i32 ZR_NewChunk(i32 width, i32 height, i32 channels, i32 type, ZR_Chunk* out);
ZR_API i32 ZR_LockChunk(ZR_Chunk* chunk);
ZR_API i32 ZR_UnlockChunk(ZR_Chunk* chunk);
ZR_API i32 ZR_DisposeChunk(ZR_Chunk* chunk);

/* -------------------------------------------------------------------------------- iteration */

/* in and out point to pixels of the world's depth; non-zero stops the walk and is returned. */
typedef i32 (*ZR_PixelFunc)(void* refcon, i32 x, i32 y, const void* in, void* out);
/* i is 0..iterations-1; thread_index is stable on a thread and chooses per-thread scratch. */
typedef i32 (*ZR_GenericFunc)(void* refcon, i32 thread_index, i32 i, i32 iterations);

/* Calls fn for every pixel of `area` (null: all of dst), row by row on the calling thread. src may
 * be null: then in and out are the same pixel. With progress_final non-zero, in_data's progress is
 * told after each row. */
ZR_API i32 ZR_Iterate(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect* area,
                      void* refcon, ZR_PixelFunc fn, ZR_LayerDef* dst);
/* The same with src placed so that its pixel (0, 0) lies at `origin` of dst, and clipped to it. */
ZR_API i32 ZR_IterateOrigin(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src,
                            const GX_LRect* area, const GX_LPoint* origin, void* refcon, ZR_PixelFunc fn,
                            ZR_LayerDef* dst);
/* Takes each channel of 8-bit pixels through a 256-byte table; a null table changes nothing. */
ZR_API i32 ZR_IterateLUT(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src,
                         const GX_LRect* area, const u8* a_lut, const u8* r_lut, const u8* g_lut, const u8* b_lut,
                         ZR_LayerDef* dst);
/* Calls fn for i in 0..iterations-1, or once per thread when iterations is -1; goes through slot 53,
 * which a host may fill with a threaded body. Returns one non-zero result of fn, or 0. */
ZR_API i32 ZR_IterateGeneric(i32 iterations, void* refcon, ZR_GenericFunc fn);
/* The serial default body of slot 53. */
ZR_API i32 ZR_IterateGeneric_Static(i32 iterations, void* refcon, ZR_GenericFunc fn);

/* ------------------------------------------------------------------------------ compositing */

/* One mask row for the blending code: one cell of pixel size per output pixel, alpha only. `offset`
 * is where the source row starts among the output pixels (negative: left of them), row_length its
 * pixels; flags 0..3 as ZR_MaskWorld.kind; deep selects 16-bit cells. Returns 0. */
ZR_API i32 ZR_PrepTrackMatteUniv(u32 count, const void* src_row, i32 offset, i32 row_length, u32 flags, bool deep,
                                 void* out_row);

/* Per-pixel transfer functions: composite `src` (by value) onto *dst; tables non-null blends in
 * linear light. The getters return null for 41..43 and do not check the mode. Cannot fail. */
typedef void (*ZR_Xfer1Func8)(ZR_Pixel8 src, const ZR_LinearBlendingTables*, ZR_Pixel8* dst);
typedef void (*ZR_Xfer1Func16)(ZR_Pixel16 src, const ZR_LinearBlendingTables*, ZR_Pixel16* dst);
typedef void (*ZR_Xfer1FuncF)(ZR_PixelFloat src, const ZR_LinearBlendingTables*, ZR_PixelFloat* dst);
typedef void (*ZR_Xfer1OpacityFunc8)(ZR_Pixel8 src, const ZR_LinearBlendingTables*, u8 opacity, ZR_Pixel8* dst);
typedef void (*ZR_Xfer1OpacityFunc16)(ZR_Pixel16 src, const ZR_LinearBlendingTables*, u16 opacity, ZR_Pixel16* dst);
typedef void (*ZR_Xfer1OpacityFuncF)(ZR_PixelFloat src, const ZR_LinearBlendingTables*, f32 opacity,
                                     ZR_PixelFloat* dst);
typedef void (*ZR_Xfer1Opacity2Func8)(ZR_Pixel8 src, const ZR_LinearBlendingTables*, u8 opacity, u8 opacity2,
                                      ZR_Pixel8* dst);
typedef void (*ZR_Xfer1Opacity2Func16)(ZR_Pixel16 src, const ZR_LinearBlendingTables*, u16 opacity, u16 opacity2,
                                       ZR_Pixel16* dst);
typedef void (*ZR_Xfer1Opacity2FuncF)(ZR_PixelFloat src, const ZR_LinearBlendingTables*, f32 opacity, f32 opacity2,
                                      ZR_PixelFloat* dst);
ZR_API ZR_Xfer1Func8 ZR_Get_Xfer1_table8(i32 mode);
ZR_API ZR_Xfer1Func16 ZR_Get_Xfer1_table16(i32 mode);
ZR_API ZR_Xfer1FuncF ZR_Get_Xfer1_tableF(i32 mode);
ZR_API ZR_Xfer1OpacityFunc8 ZR_Get_Xfer1_Opacity_table8(i32 mode);
ZR_API ZR_Xfer1OpacityFunc16 ZR_Get_Xfer1_Opacity_table16(i32 mode);
ZR_API ZR_Xfer1OpacityFuncF ZR_Get_Xfer1_Opacity_tableF(i32 mode);
ZR_API ZR_Xfer1Opacity2Func8 ZR_Get_Xfer1_Opacity2_table8(i32 mode);
ZR_API ZR_Xfer1Opacity2Func16 ZR_Get_Xfer1_Opacity2_table16(i32 mode);
ZR_API ZR_Xfer1Opacity2FuncF ZR_Get_Xfer1_Opacity2_tableF(i32 mode);
ZR_API extern const ZR_Xfer1Func8 ZRp_G_Xfer1_table8[44];
ZR_API extern const ZR_Xfer1Func16 ZRp_G_Xfer1_table16[44];
ZR_API extern const ZR_Xfer1FuncF ZRp_G_Xfer1_tableF[44];
ZR_API extern const ZR_Xfer1OpacityFunc8 ZRp_G_Xfer1_Opacity_table8[44];
ZR_API extern const ZR_Xfer1OpacityFunc16 ZRp_G_Xfer1_Opacity_table16[44];
ZR_API extern const ZR_Xfer1OpacityFuncF ZRp_G_Xfer1_Opacity_tableF[44];
ZR_API extern const ZR_Xfer1Opacity2Func8 ZRp_G_Xfer1_Opacity2_table8[44];
ZR_API extern const ZR_Xfer1Opacity2Func16 ZRp_G_Xfer1_Opacity2_table16[44];
ZR_API extern const ZR_Xfer1Opacity2FuncF ZRp_G_Xfer1_Opacity2_tableF[44];
/* A host's classification of a mode: 1 or 0. */
ZR_API i32 ZR_GetTransferFlags(i32 mode);

/* Composites `rect` of src (source coordinates) onto dst with its corner at (dest_x, dest_y), clipped
 * to both worlds; any coordinates do. Worlds and mask have one depth: else ZR_Err_Internal and nothing
 * is drawn, nor by an unknown mode, which gives ZR_Err_UnimplementedMode. field: 0 all rows, 1 even,
 * 2 odd destination rows. quality and flags are not read. `tables`, not mode->tables, selects linear
 * light. Polls on every 128th destination row with (rows done before it, rows). src and dst may be one
 * world: rows go top to bottom. Uses the shared scratch, grown to the rectangle's width or the source's,
 * whichever is less: one call at a time; the Plus form takes the caller's ten scratch pointers. */
ZR_API i32 ZR_TransferRect(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                           ZR_LayerDef* src, const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                           const ZR_MaskWorld* mask, i32 dest_x, i32 dest_y, ZR_LayerDef* dst);
ZR_API i32 ZR_TransferRect_S(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                             ZR_LayerDef* src, const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                             const ZR_MaskWorld* mask, i32 dest_x, i32 dest_y, ZR_LayerDef* dst);
/* scratch: [0] width * 4 bytes, [1] and [2] width * 16 bytes, width that of `rect`; [3..9] from
 * ZR_AllocateMotionBlurScratch. Null takes the shared scratch. */
ZR_API i32 ZR_TransferRectPlus(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                               ZR_LayerDef* src, const ZR_CompositeModePlus* mode,
                               const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask, void* scratch[10],
                               i32 dest_x, i32 dest_y, ZR_LayerDef* dst);
/* The pixels of dst that a composite blends: `rect` clipped to both worlds and, for even kinds, to the mask (which may
 * be null); (0, 0, 0, 0) when none are left. Nothing is drawn. Any thread. Hosts cut bands of rows from it: a band is
 * the Plus form on those rows of `rect`, with rand_seed by zr::seed_from_row (<ZR/composite.h>), and with
 * XferMultiplyAlpha and XferMultiplyAlphaLuma on a record of those rows alone, as all else in dst is cleared. */
ZR_API i32 ZR_GetTransferBounds(const GX_LRect* rect, const ZR_LayerDef* src, const ZR_MaskWorld* mask, i32 dest_x,
                                i32 dest_y, const ZR_LayerDef* dst, GX_LRect* bounds);
/* Zeroes the alpha of every pixel outside `rect`, of all when it misses the world; colours stay.
 * progress is not read. */
ZR_API i32 ZR_ClearAlphaExceptRect(const ZR_ProgressInfo* progress, const GX_LRect* rect, ZR_LayerDef* world);
/* 8-bit only: composites a source rectangle (null: all of src) behind the destination. No clipping:
 * the rectangle lies inside both worlds. field as for ZR_TransferRect. Polls before every 32nd row.
 * Draft and Best are one operation. */
ZR_API i32 ZR_CompositeRectDraft_Straight(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity,
                                          ZR_LayerDef* src, i32 dest_x, i32 dest_y, i32 field, u32 flags,
                                          ZR_LayerDef* dst);
ZR_API i32 ZR_CompositeRectBest_Straight(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity,
                                         ZR_LayerDef* src, i32 dest_x, i32 dest_y, i32 field, u32 flags,
                                         ZR_LayerDef* dst);
ZR_API i32 ZR_CompositeRectDraft_Premul(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity,
                                        ZR_LayerDef* src, i32 dest_x, i32 dest_y, i32 field, u32 flags,
                                        ZR_LayerDef* dst);
ZR_API i32 ZR_CompositeRectBest_Premul(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity,
                                       ZR_LayerDef* src, i32 dest_x, i32 dest_y, i32 field, u32 flags,
                                       ZR_LayerDef* dst);

/* Seven fixed blocks of 2048 x 3, 4096 x 2, 18432 and 26624 bytes. Returns 4 on the first failure
 * and leaves what was made in `out`, for the disposer, which nulls what it frees. */
ZR_API i32 ZR_AllocateMotionBlurScratch(void* out[7]);
ZR_API void ZR_DisposeMotionBlurScratch(void* scratch[7]);

/* dst = src1 * (1 - ratio) + src2 * ratio; ratio is 16.16, clamped to 0..0x10000. Three worlds of
 * one depth and one size; dst may be one of the others. _Straight is ZR_Blend; _Premul mixes
 * premultiplied worlds. progress is not read. */
ZR_API i32 ZR_Blend(const ZR_ProgressInfo* progress, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio, ZR_LayerDef* dst);
ZR_API i32 ZR_Blend_Straight(const ZR_ProgressInfo* progress, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio,
                             ZR_LayerDef* dst);
ZR_API i32 ZR_Blend_Premul(const ZR_ProgressInfo* progress, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio,
                           ZR_LayerDef* dst);
/* Premultiplies (forward non-zero) or unmultiplies a world, or a rectangle clipped to it, in place;
 * colours under alpha 0 become white when unmultiplied. Bands of rows go through ZR_IterateGeneric;
 * progress->abort alone is asked, once, before the first row. */
ZR_API i32 ZR_Premul(const ZR_ProgressInfo* progress, i32 forward, ZR_LayerDef* dst);
ZR_API i32 ZR_PremulRect(const ZR_ProgressInfo* progress, i32 forward, const GX_LRect* rect, ZR_LayerDef* dst);
ZR_API i32 ZR_PremulRect_S(const ZR_ProgressInfo* progress, i32 forward, const GX_LRect* rect, ZR_LayerDef* dst);
/* The same against a matte colour, from src into dst (which may be src); only rows and columns that
 * both have are touched. Except against black, colours under alpha 0 are not changed by unmultiplying. */
ZR_API i32 ZR_PremulColor(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_Pixel8* colour, i32 forward,
                          ZR_LayerDef* dst);
ZR_API i32 ZR_PremulColor16(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_Pixel16* colour, i32 forward,
                            ZR_LayerDef* dst);
ZR_API i32 ZR_PremulColorFloat(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_PixelFloat* colour,
                               i32 forward, ZR_LayerDef* dst);
ZR_API i32 ZR_PremulColorRect(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_Pixel8* colour, i32 forward,
                              const GX_LRect* rect, ZR_LayerDef* dst);
ZR_API i32 ZR_PremulColorRectFloat(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_PixelFloat* colour,
                                   i32 forward, const GX_LRect* rect, ZR_LayerDef* dst);

/* ------------------------------------------------------------------------- host call surface */

/* The flat record of 69 functions that plug-ins hold; entries are named in <ZR/callback_block.h>.
 * quality 0 is draft, else best; flags bit 0 set is straight alpha, clear premultiplied. The first
 * call ever also fills the private table that selectors read, so it comes from one thread. */
ZR_API i32 ZR_GetCallbackBlock(i32 quality, i32 flags, void* block[69]);
/* Rewrites the entries of a block that depend on quality and alpha mode. */
ZR_API i32 ZR_SetCallbackBlockQuality(i32 quality, i32 flags, void* block[69]);
/* *out = the routine of a selector (-13..37), null and 515 for an unlisted one. */
ZR_API i32 ZR_GetCallbackAddr(void* ref, i32 quality, i32 flags, i32 selector, void** out);
/* Puts a routine into a slot, 1..117 (else 3). Only while nothing renders. */
ZR_API i32 ZR_SetOverrideFunc(i32 slot, void* fn);
/* ZR_TransferRect and ZR_TransformWorld for holders of the plain record; no linear-light tables. */
ZR_API i32 transfer_rect_adapter(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field,
                                 const GX_LRect* rect, ZR_LayerDef* src, const ZR_CompositeMode* mode,
                                 const ZR_MaskWorld* mask, i32 dest_x, i32 dest_y, ZR_LayerDef* dst);
ZR_API i32 transform_world_adapter(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                                   const ZR_CompositeMode* mode, const ZR_MaskWorld* mask, const GX_Matrix3* matrices,
                                   i32 count, bool src2dst, const GX_LRect* dst_rect, ZR_LayerDef* dst);

#ifdef __cplusplus
}
#endif

#include <ZR/alpha_guess.h>
#include <ZR/copy_bits.h>
#include <ZR/drawing.h>
#include <ZR/filter.h>
#include <ZR/mask_buffer.h>
#include <ZR/pixel_measures.h>
#include <ZR/sample.h>
#include <ZR/transform_world.h>

#endif
