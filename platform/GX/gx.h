// GX: rectangles, 3x3 matrices, and the shared multiply, divide and trigonometry tables.
#pragma once

#include <ZR/zr.h>

// Rectangles. An empty one has right <= left or bottom <= top.
bool GX_SectLRect(const GX_LRect* a, const GX_LRect* b, GX_LRect* out);  // intersection; false and (0,0,0,0) when empty
void GX_UnionLRect(const GX_LRect* a, const GX_LRect* b, GX_LRect* out);  // an empty one adds nothing
void GX_InsetLRect(GX_LRect* rect, i32 dx, i32 dy);                       // negative amounts grow it; saturates
bool GX_EmptyLRect(const GX_LRect* rect);

// Shared tables, counted: each prepare is paid back by one unprepare, and the last frees them.
// The first three arguments are (1, 0, 0). Either out may be null. 0, or ZR_Err_OutOfMemory.
i32 GX_PrepareFCMD(i32, i32, i32, const u8** multiply, const u8** divide);
i32 GX_UnprepareFCMD();
i32 GX_PrepareFTrig(i32, i32, i32, const void** table);
i32 GX_UnprepareFTrig();

f64 GX_fmod(f64 x, f64 y);
i32 GX_RoundDouble(f64 value);  // ties away from zero; what does not fit gives INT32_MIN

// Matrices, applied to column vectors (see GX_Matrix3).
struct GX_FloatRect {
  f64 left, top, right, bottom;
};
struct GX_FloatPoint {
  f64 x, y;
};
void GX_IdentityMatrix(GX_Matrix3* out);
void GX_ConcatMatrix(const GX_Matrix3* first, const GX_Matrix3* then, GX_Matrix3* out);  // out = then * first
i32 GX_InverseMatrixQuiet(const GX_Matrix3* matrix, GX_Matrix3* out);                    // non-zero when singular
bool GX_EqualMatrixWithinEpsilon(const GX_Matrix3* a, const GX_Matrix3* b, f64 epsilon);
i32 GX_GetMatrixType(const GX_Matrix3* matrix);  // 0 identity, 1 translation, 2 scale, 3 affine, 4 perspective
void GX_TransformFloatPoints(const GX_Matrix3* matrix, GX_FloatPoint* points, i32 count);
void GX_TransformFloatRect(const GX_Matrix3* matrix, const GX_FloatRect* rect, GX_FloatRect* out);  // bounding box
void GX_TransformVector3(const GX_Matrix3* matrix, const f64 in[3], f64 out[3]);
void GX_Matrix3_TransformPointAndDivide(const GX_Matrix3* matrix, const GX_FloatPoint* in, GX_FloatPoint* out);
