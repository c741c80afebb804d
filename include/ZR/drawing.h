/* Small drawing: single pixels, lines, spots, outlines of a layer's alpha ("wireframes"), and planes of channels.
 *
 * Where not told otherwise null arguments are reported and give ZR_Err_Internal. Worlds belong to the caller; one call
 * at a time may write a world. `ref` is not read. */
#ifndef ZR_DRAWING_H
#define ZR_DRAWING_H

#include <ZR/types.h>

#ifdef __cplusplus
extern "C" {
#endif

/* Stores a pixel and returns 1; 0 outside of the world, for a null pixel, and for a world that is null or has no
 * pixels. The depth of the world is the caller's word: it is not looked at. */
ZR_API i32 ZR_SetPixel8(i32 x, i32 y, const ZR_Pixel8* pixel, ZR_LayerDef* world);
ZR_API i32 ZR_SetPixel16(i32 x, i32 y, const ZR_Pixel16* pixel, ZR_LayerDef* world);
ZR_API i32 ZR_SetPixelFloat(i32 x, i32 y, const ZR_PixelFloat* pixel, ZR_LayerDef* world);

/* A line of single pixels, without antialiasing, from one (x, y) to another, both ends drawn; pixel centres are at
 * whole numbers. The world has any depth; channels of the colour above 1 wrap at the integer depths. Pixels outside
 * of the world are left out, and a line takes no longer than its pixels inside. A start coordinate that 16.16 cannot
 * hold counts as -32768, as does an end beyond 32 bits as the lowest integer; one that is not finite draws nothing.
 * Returns 0. */
ZR_API i32 ZR_DrawLine(const f64 from[2], const f64 to[2], const ZR_PixelFloat* colour, ZR_LayerDef* world);

/* Mixes `colour` into an 8-bit world around (x, y), all four channels, by the weights of a spot: 0 to 255, one for each
 * pixel, row after row. `diameter` is odd; the spot has diameter x diameter weights, or with ZR_Spot_Line one row of
 * them, or with ZR_Spot_Column too one column. What lies outside of the world is left out. A world of another depth,
 * or without pixels, and an even or negative diameter are bad parameters: ZR_Err_Internal. */
enum { ZR_Spot_Line = 1, ZR_Spot_Column = 32 };
ZR_API i32 ZR_PaintSpot(void* ref, i32 x, i32 y, u32 flags, i32 diameter, const u32* spot, ZR_Pixel8 colour,
                        ZR_LayerDef* world);

/* ------------------------------------------------------------------------------ wireframes */

struct SEQ_List;

/* Pixel corners: a layer of width 10 reaches from x 0 to x 10. */
typedef struct ZR_WireframePoint {
  i16 x, y;
} ZR_WireframePoint;

/* Outlines as closed loops of points. Owned by whoever made it, until ZR_DisposeWireframe. */
typedef struct ZR_Wireframe {
  i32 kind;                /* the caller's tag */
  i32 point_count;         /* points */
  struct SEQ_List* points; /* ZR_WireframePoint each */
  struct SEQ_List* second; /* i32 each: where the loops begin among the points; null: all points are one loop */
  struct SEQ_List* third;  /* not used; freed with the rest */
  struct SEQ_List* fourth;
} ZR_Wireframe;
ZR_ASSERT_LAYOUT(sizeof(ZR_WireframePoint) == 4 && sizeof(ZR_Wireframe) == 40 && offsetof(ZR_Wireframe, points) == 8);

/* Makes a wireframe of zero points; the record's contents before are overwritten. ZR_Err_BadParam for a negative
 * count, ZR_Err_OutOfMemory; the record is then cleared. */
ZR_API i32 ZR_AllocWireframe(i32 point_count, i32 kind, ZR_Wireframe* wireframe);
/* Frees what a wireframe owns and clears the record; a cleared one is nothing. */
ZR_API i32 ZR_DisposeWireframe(ZR_Wireframe* wireframe);

/* Takes the points of src through a matrix (null: copies them), with their loops, into dst, whose number of points must
 * be that of src (else ZR_Err_Internal, reported), or where dst is null into `out`, made as by ZR_AllocWireframe with
 * the kind of src. dst may be src. Points are rounded to nearest, ties away from zero, and held to -32768..32767; NaN
 * gives 0. The 3D form always divides by the third component; the 2D form does where the matrix has perspective.
 * `reserved` is not read. On failure an `out` that was made is disposed of. */
ZR_API i32 ZR_TransformWireframe3D(void* ref, const ZR_Wireframe* src, void* reserved, const GX_Matrix3* matrix,
                                   ZR_Wireframe* dst, ZR_Wireframe* out);
ZR_API i32 ZR_TransformWireframe2D(void* ref, const ZR_Wireframe* src, void* reserved, const GX_Matrix3* matrix,
                                   ZR_Wireframe* dst, ZR_Wireframe* out);

/* Traces the outlines of a world's alpha, of any depth, inside `rect` (null: all), holes too, into a new wireframe:
 * every row `step` rows apart (below 1 counts as 1), and the last, is cut into spans of pixels whose alpha is half of
 * white or more, and the ends of spans that touch are joined from row to row. With step 1 the outline follows the
 * edges of pixels exactly; a greater step makes fewer points and straighter lines, and overlooks what is lower than
 * it. Points on a straight line are left out. An image without such pixels gives a wireframe of no points. Takes time
 * in proportion to the rows looked at. ZR_Err_OutOfMemory; the record is then cleared. */
enum { ZR_Wireframe_AnyAlpha = 16 }; /* flag: every alpha above 0 counts as inside, soft edges and shadows too */
ZR_API i32 ZR_GenerateWireframe(void* ref, ZR_LayerDef* world, const GX_LRect* rect, i32 step, u32 flags, i32 kind,
                                ZR_Wireframe* out);

/* The points of loop 0, 1, 2, ..., and their number; the last is joined to the first. Null and 0 beyond the last loop.
 * Valid until the wireframe changes or is disposed of. */
ZR_API const ZR_WireframePoint* ZR_GetWireframeLoop(const ZR_Wireframe* wireframe, i32 loop, i32* count);

/* ---------------------------------------------------------------------------------- planes */

enum { ZR_Plane_Alpha = 1, ZR_Plane_Red = 2, ZR_Plane_Green = 4, ZR_Plane_Blue = 8 };

/* Packs the chosen channels of an 8-bit world, alpha, red, green, blue, pixel beside pixel, into a new block behind a
 * handle that the caller frees with the handle functions of the callback block. Rows are
 * ((width + 8) * channels + 3) & ~1 bytes; what follows their pixels is zero. planes of 16 or more, a world of another
 * depth or without pixels: ZR_Err_Internal, reported; ZR_Err_OutOfMemory. Outputs are stored only on success. */
ZR_API i32 ZR_ExtractPlanes(void* ref, ZR_LayerDef* world, u32 planes, void*** handle_out, i32* row_bytes_out);
/* Stores packed channels (the block itself, not its handle) back; other channels stay. Bad arguments as above, and null
 * data, do nothing. Returns 0. */
ZR_API i32 ZR_InsertPlanes(void* ref, const void* data, i32 row_bytes, u32 planes, ZR_LayerDef* world);

#ifdef __cplusplus
}
#endif

#endif
