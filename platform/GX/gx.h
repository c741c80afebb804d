// GX: rectangles, 3x3 matrices, and the shared multiply, divide and trigonometry tables.
#pragma once

#include <ZR/zr.h>

// Rectangles. An empty one has right <= left or bottom <= top. Outputs may be the inputs. Cannot fail.
bool GX_SectLRect(const GX_LRect* a, const GX_LRect* b, GX_LRect* out);  // intersection; false and (0,0,0,0) when empty
void GX_UnionLRect(const GX_LRect* a, const GX_LRect* b, GX_LRect* out);  // an empty one adds nothing
void GX_InsetLRect(GX_LRect* rect, i32 dx, i32 dy);                       // negative amounts grow it; saturates
bool GX_EmptyLRect(const GX_LRect* rect);

// Shared tables, counted: each prepare is paid back by one unprepare, and the last frees them.
// An unprepare too many does nothing. The first three arguments are (1, 0, 0) and are not read. Any out may
// be null. Any thread. 0, or ZR_Err_OutOfMemory, which is reported and counts as no prepare.

// Two tables of 256 x 256 bytes, index row * 256 + column. Multiply: row * column / 255, rounded.
// Divide: 255 where column >= row, else (column * 255 + row / 2) / row; row 0 is 255 throughout.
i32 GX_PrepareFCMD(i32, i32, i32, const u8** multiply, const u8** divide);
i32 GX_UnprepareFCMD();  // 0

// f64[GX_FTrigSteps + 1]: entry i is the sine of i / GX_FTrigSteps of a full turn, first and last alike. The
// cosine of i stands at (i + GX_FTrigSteps / 4) modulo GX_FTrigSteps. Its symmetries hold exactly.
inline constexpr i32 GX_FTrigSteps = 4096;
i32 GX_PrepareFTrig(i32, i32, i32, const void** table);
i32 GX_UnprepareFTrig();  // 0

f64 GX_fmod(f64 x, f64 y);      // remainder with the sign of x; NaN for y = 0
i32 GX_RoundDouble(f64 value);  // ties away from zero; what does not fit, and NaN, gives INT32_MIN

// Matrices, applied to column vectors (see GX_Matrix3). Outputs may be the inputs. Where a point falls on
// the vanishing line the result is infinite or NaN; nothing here traps.
struct GX_FloatRect {
  f64 left, top, right, bottom;
};
struct GX_FloatPoint {
  f64 x, y;
};
void GX_IdentityMatrix(GX_Matrix3* out);
void GX_ConcatMatrix(const GX_Matrix3* first, const GX_Matrix3* then, GX_Matrix3* out);  // out = then * first
// By cofactors. ZR_Err_BadParam, with `out` untouched and nothing reported, exactly when the determinant is 0
// or not finite.
i32 GX_InverseMatrixQuiet(const GX_Matrix3* matrix, GX_Matrix3* out);
// No element differs by more than epsilon; a NaN is equal to nothing.
bool GX_EqualMatrixWithinEpsilon(const GX_Matrix3* a, const GX_Matrix3* b, f64 epsilon);
// The least kind that describes the matrix; each includes those before it. The last row of all but
// perspective is exactly (0, 0, 1).
enum {
  GX_MatrixType_Identity = 0,
  GX_MatrixType_Translation = 1,
  GX_MatrixType_Scale = 2,
  GX_MatrixType_Affine = 3,
  GX_MatrixType_Perspective = 4
};
i32 GX_GetMatrixType(const GX_Matrix3* matrix);
// In place; divided by the third component where the matrix has perspective.
void GX_TransformFloatPoints(const GX_Matrix3* matrix, GX_FloatPoint* points, i32 count);
// The bounding box of the four corners, divided in the same way.
void GX_TransformFloatRect(const GX_Matrix3* matrix, const GX_FloatRect* rect, GX_FloatRect* out);
// The plain product: a third component of 0 leaves the translation out.
void GX_TransformVector3(const GX_Matrix3* matrix, const f64 in[3], f64 out[3]);
// One point, always divided.
void GX_Matrix3_TransformPointAndDivide(const GX_Matrix3* matrix, const GX_FloatPoint* in, GX_FloatPoint* out);

// Runs of small points, in place; null leaves them as they are. Rounded to nearest, ties away from zero, and held to
// the range of 16 bits; NaN gives 0. The first divides as GX_TransformFloatPoints does, the second always: its matrix
// is that of a plane turned in space.
void GX_TransformPoints(const GX_Matrix3* matrix, ZR_WireframePoint* points, i32 count);
void GX_3DTransform2DPoints(const GX_Matrix3* matrix, ZR_WireframePoint* points, i32 count);
