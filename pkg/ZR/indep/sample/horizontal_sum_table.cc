// Running sums of the rows of a world.
#include <GX/gx.h>
#include <HB/hb.h>
#include <ZR/colour_settings.h>
#include <ZR/summed_area.h>

#include <algorithm>
#include <cmath>
#include <numbers>

#include "composite/linear_light.h"
#include "world/guard.h"

namespace zr {
namespace {

i32 size_up(f64 size) {
  constexpr f64 largest = 30000.0;
  const f64 whole = std::ceil(size);
  if (!(whole >= 0.0 && whole <= largest)) fail(ZR_Err_Internal);
  return static_cast<i32>(whole);
}

GX_FloatRect turned(const GX_FloatRect& box, f64 scale_x, f64 scale_y, f64 degrees) {
  const f64 angle = degrees * std::numbers::pi / 180.0;
  const GX_Matrix3 scale = {{{scale_x, 0, 0}, {0, scale_y, 0}, {0, 0, 1}}};
  const GX_Matrix3 turn = {{{std::cos(angle), -std::sin(angle), 0}, {std::sin(angle), std::cos(angle), 0}, {0, 0, 1}}};
  GX_Matrix3 both;
  GX_ConcatMatrix(&scale, &turn, &both);
  GX_FloatRect bounds;
  GX_TransformFloatRect(&both, &box, &bounds);
  return bounds;
}

inline ZR_PixelFloat to_float(const ZR_PixelFloat& p) { return p; }
template <class T>
ZR_PixelFloat to_float(const T& p) {
  return convert_colour<ZR_PixelFloat>(p);
}

template <class T>
void sum_row(const T* src, i32 width, const ZR_LinearBlendingTables* tables, i32 padding, ZR_PixelFloat* out) {
  ZR_PixelDouble sum{};
  out = std::fill_n(out, padding + 1, ZR_PixelFloat{});
  for (i32 x = 0; x < width; ++x) {
    const ZR_PixelFloat p = tables != nullptr ? to_float(to_linear(src[x], *tables)) : to_float(src[x]);
    const f64 alpha = p.alpha;
    sum = {sum.alpha + alpha, sum.red + alpha * p.red, sum.green + alpha * p.green, sum.blue + alpha * p.blue};
    *out++ = {static_cast<f32>(sum.alpha), static_cast<f32>(sum.red), static_cast<f32>(sum.green),
              static_cast<f32>(sum.blue)};
  }
  std::fill_n(out, padding, out[-1]);
}

}  // namespace
}  // namespace zr

template <class T>
ZR_HorizontalSumTable<T>::ZR_HorizontalSumTable(const ZR_WorldX<T>* world, i32 output_width, i32 output_height,
                                                f64 scale, f64 radius_x, f64 radius_y, f64 radius_scale_x,
                                                f64 radius_scale_y, f64 degrees, bool transform_radius,
                                                const ZR_ColorSettings* settings, const ZR_ColorSettings* fallback)
    : output_width_(zr::size_up(scale * output_width)), output_height_(zr::size_up(scale * output_height)) {
  GX_FloatRect box = {-radius_x, -radius_y, radius_x, radius_y};
  if (transform_radius) box = zr::turned(box, radius_scale_x, radius_scale_y, degrees);
  padding_x_ = zr::size_up(box.right - box.left);
  padding_y_ = zr::size_up(box.bottom - box.top);

  boost::shared_ptr<ZR_LinearBlendingTables> tables;
  if (settings == nullptr) settings = fallback;
  if (settings != nullptr) tables = ZR_ColorSettings(*settings).GetLinearBlendingTables(false);  // asking fills a cache

  const i32 width = std::max(world->width, 0), height = world->data != nullptr ? std::max(world->height, 0) : 0;
  entries_ = width + 2 * padding_x_ + 1;
  const size_t bytes = static_cast<size_t>(entries_) * static_cast<size_t>(height) * sizeof(ZR_PixelFloat);
  sums_ = static_cast<ZR_PixelFloat*>(
      HB_AllocatePtr(bytes, HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_BlurMemory, 0, 0), ZR_ModuleCode | ZR_Site_Plain));
  if (sums_ == nullptr) zr::fail(ZR_Err_OutOfMemory);
  for (i32 y = 0; y < height; ++y)
    zr::sum_row(world->Row(y), width, tables.get(), padding_x_, const_cast<ZR_PixelFloat*>(Row(y)));
}

template <class T>
ZR_HorizontalSumTable<T>::~ZR_HorizontalSumTable() {
  HB_FreePtr(sums_);
}

template class ZR_HorizontalSumTable<ZR_Pixel8>;
template class ZR_HorizontalSumTable<ZR_Pixel16>;
template class ZR_HorizontalSumTable<ZR_PixelFloat>;
