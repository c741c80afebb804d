// 3x3 matrices on column vectors. Sums run from left to right, so that results are the same everywhere.
#include <GX/gx.h>
#include <ZR/errors.h>

#include <algorithm>
#include <cmath>
#include <limits>

namespace {

bool is_affine(const GX_Matrix3& a) { return a.m[2][0] == 0 && a.m[2][1] == 0 && a.m[2][2] == 1; }

GX_FloatPoint transform(const GX_Matrix3& a, const GX_FloatPoint& p, bool divide) {
  const f64 x = a.m[0][0] * p.x + a.m[0][1] * p.y + a.m[0][2];
  const f64 y = a.m[1][0] * p.x + a.m[1][1] * p.y + a.m[1][2];
  if (!divide) return {x, y};
  const f64 w = a.m[2][0] * p.x + a.m[2][1] * p.y + a.m[2][2];
  return {x / w, y / w};
}

i16 small_coordinate(f64 v) {
  constexpr f64 lowest = std::numeric_limits<i16>::min(), highest = std::numeric_limits<i16>::max();
  return std::isnan(v) ? i16{0} : static_cast<i16>(std::clamp(std::round(v), lowest, highest));
}

void transform_small(const GX_Matrix3& a, ZR_WireframePoint* points, i32 count, bool divide) {
  for (i32 i = 0; i < count; ++i) {
    const GX_FloatPoint p = transform(a, {static_cast<f64>(points[i].x), static_cast<f64>(points[i].y)}, divide);
    points[i] = {small_coordinate(p.x), small_coordinate(p.y)};
  }
}

}  // namespace

void GX_IdentityMatrix(GX_Matrix3* out) { *out = {{{1, 0, 0}, {0, 1, 0}, {0, 0, 1}}}; }

void GX_ConcatMatrix(const GX_Matrix3* first, const GX_Matrix3* then, GX_Matrix3* out) {
  GX_Matrix3 product;
  for (i32 row = 0; row < 3; ++row)
    for (i32 column = 0; column < 3; ++column)
      product.m[row][column] = then->m[row][0] * first->m[0][column] + then->m[row][1] * first->m[1][column] +
                               then->m[row][2] * first->m[2][column];
  *out = product;
}

i32 GX_InverseMatrixQuiet(const GX_Matrix3* matrix, GX_Matrix3* out) {
  const auto& m = matrix->m;
  // Of the row and column after next and next, cyclically: the sign is then always right.
  const auto cofactor = [&](i32 row, i32 column) {
    const i32 r1 = (row + 1) % 3, r2 = (row + 2) % 3, c1 = (column + 1) % 3, c2 = (column + 2) % 3;
    return m[r1][c1] * m[r2][c2] - m[r1][c2] * m[r2][c1];
  };
  const f64 determinant = m[0][0] * cofactor(0, 0) + m[0][1] * cofactor(0, 1) + m[0][2] * cofactor(0, 2);
  if (determinant == 0 || !std::isfinite(determinant)) return ZR_Err_BadParam;
  GX_Matrix3 inverse;
  for (i32 row = 0; row < 3; ++row)
    for (i32 column = 0; column < 3; ++column) inverse.m[row][column] = cofactor(column, row) / determinant;
  *out = inverse;
  return ZR_Err_None;
}

bool GX_EqualMatrixWithinEpsilon(const GX_Matrix3* a, const GX_Matrix3* b, f64 epsilon) {
  for (i32 row = 0; row < 3; ++row)
    for (i32 column = 0; column < 3; ++column)
      if (!(std::fabs(a->m[row][column] - b->m[row][column]) <= epsilon)) return false;
  return true;
}

i32 GX_GetMatrixType(const GX_Matrix3* matrix) {
  const auto& m = matrix->m;
  if (!is_affine(*matrix)) return GX_MatrixType_Perspective;
  if (m[0][1] != 0 || m[1][0] != 0) return GX_MatrixType_Affine;
  if (m[0][0] != 1 || m[1][1] != 1) return GX_MatrixType_Scale;
  return m[0][2] != 0 || m[1][2] != 0 ? GX_MatrixType_Translation : GX_MatrixType_Identity;
}

void GX_TransformFloatPoints(const GX_Matrix3* matrix, GX_FloatPoint* points, i32 count) {
  const bool divide = !is_affine(*matrix);
  for (i32 i = 0; i < count; ++i) points[i] = transform(*matrix, points[i], divide);
}

void GX_TransformFloatRect(const GX_Matrix3* matrix, const GX_FloatRect* rect, GX_FloatRect* out) {
  GX_FloatPoint corners[] = {
      {rect->left, rect->top}, {rect->right, rect->top}, {rect->left, rect->bottom}, {rect->right, rect->bottom}};
  GX_TransformFloatPoints(matrix, corners, 4);
  GX_FloatRect box{corners[0].x, corners[0].y, corners[0].x, corners[0].y};
  for (const GX_FloatPoint& corner : corners)
    box = {std::min(box.left, corner.x), std::min(box.top, corner.y), std::max(box.right, corner.x),
           std::max(box.bottom, corner.y)};
  *out = box;
}

void GX_TransformVector3(const GX_Matrix3* matrix, const f64 in[3], f64 out[3]) {
  const f64 x = in[0], y = in[1], z = in[2];
  for (i32 row = 0; row < 3; ++row) out[row] = matrix->m[row][0] * x + matrix->m[row][1] * y + matrix->m[row][2] * z;
}

void GX_Matrix3_TransformPointAndDivide(const GX_Matrix3* matrix, const GX_FloatPoint* in, GX_FloatPoint* out) {
  *out = transform(*matrix, *in, true);
}

void GX_TransformPoints(const GX_Matrix3* matrix, ZR_WireframePoint* points, i32 count) {
  if (matrix != nullptr) transform_small(*matrix, points, count, !is_affine(*matrix));
}

void GX_3DTransform2DPoints(const GX_Matrix3* matrix, ZR_WireframePoint* points, i32 count) {
  if (matrix != nullptr) transform_small(*matrix, points, count, true);
}
