// Fill, mix of two worlds, and premultiplication.
#pragma once

#include "model/rects.h"

namespace model {

// ------------------------------------------------------------------------------------- fill

// A channel 0..white of a float colour; alpha is not clamped and wraps.
template <class D>
typename D::Channel narrow_float(f32 c, bool alpha) {
  const f32 s = c * static_cast<f32>(D::white);
  if (!alpha && 0 > s) return 0;
  if (!alpha && s > static_cast<f32>(D::white)) return static_cast<typename D::Channel>(D::white);
  return static_cast<typename D::Channel>(truncate(s + 0.5f));
}
template <class D, class From>
typename D::Pixel fill_pixel(const From& colour) {
  const auto channel = [](auto c, bool alpha) -> typename D::Channel {
    (void)alpha;
    if constexpr (std::is_same_v<decltype(c), typename D::Channel>)
      return c;
    else if constexpr (std::is_same_v<From, ZR_PixelFloat>)
      return narrow_float<D>(c, alpha);
    else if constexpr (std::is_same_v<From, ZR_Pixel16>) {
      if constexpr (is_float<D>)
        return static_cast<f32>(c) / 32768.0f;
      else
        return static_cast<u8>(narrow(c));
    } else {
      if constexpr (is_float<D>)
        return static_cast<f32>(static_cast<f64>(c) * 0.00392156862745098);
      else
        return static_cast<u16>(((c << 15) | 128) / 255);
    }
  };
  return {channel(colour.alpha, true), channel(colour.red, false), channel(colour.green, false),
          channel(colour.blue, false)};
}
template <class D, class From>
i32 fill(const From* colour, const GX_LRect* rect, const ZR_LayerDef& world) {
  if (world.data == nullptr) return ZR_Err_Internal;
  const typename D::Pixel pixel = colour != nullptr ? fill_pixel<D>(*colour) : typename D::Pixel{};
  GX_LRect r = bounds(world);
  if (rect != nullptr)
    r = {least(rect->left, rect->right), least(rect->top, rect->bottom), most(rect->left, rect->right),
         most(rect->top, rect->bottom)};
  const auto clamp = [](i32 v, i32 limit) { return v < 0 ? 0 : v > limit ? limit : v; };
  r = {clamp(r.left, world.width), clamp(r.top, world.height), clamp(r.right, world.width),
       clamp(r.bottom, world.height)};
  for (i32 y = r.top; y < r.bottom; ++y)
    for (i32 x = r.left; x < r.right; ++x) at<D>(world, x, y) = pixel;
  return 0;
}

// -------------------------------------------------------------------------------------- mix

template <class D>
Px<D> mix_straight(const Px<D>& p, const Px<D>& q, i32 ratio) {
  Px<D> out{};
  if constexpr (is_float<D>) {
    const i32 i1 = truncate(p.a * static_cast<f32>(0x10000 - ratio)), i2 = truncate(q.a * static_cast<f32>(ratio));
    const f32 t = static_cast<f32>(static_cast<i32>(static_cast<u32>(i1) + static_cast<u32>(i2)));
    for (int c = 0; c < 3; ++c)
      out.c[c] = i1 == 0   ? q.c[c]
                 : i2 == 0 ? p.c[c]
                           : (p.c[c] * static_cast<f32>(i1) + q.c[c] * static_cast<f32>(i2)) / t;
    out.a = 1.5258789e-5f * t;
  } else {
    const i64 a1 = i64{p.a} * (0x10000 - ratio), a2 = i64{q.a} * ratio, t = a1 + a2;
    for (int c = 0; c < 3; ++c)
      out.c[c] = a1 == 0 ? q.c[c] : a2 == 0 ? p.c[c] : static_cast<i32>((p.c[c] * a1 + q.c[c] * a2 + (t >> 1)) / t);
    out.a = static_cast<i32>((t + 32768) >> 16);
  }
  return out;
}
template <class D>
Px<D> mix_premultiplied(const Px<D>& p, const Px<D>& q, i32 ratio) {
  const auto channel = [ratio](typename D::V x, typename D::V y) -> typename D::V {
    if constexpr (is_float<D>)
      return (x * static_cast<f32>(0x10000 - ratio) + y * static_cast<f32>(ratio)) * 1.5258789e-5f;
    else
      return static_cast<i32>((i64{x} * (0x10000 - ratio) + i64{y} * ratio + 32768) >> 16);
  };
  return {channel(p.a, q.a), {channel(p.c[0], q.c[0]), channel(p.c[1], q.c[1]), channel(p.c[2], q.c[2])}};
}
template <class D>
i32 blend(bool premultiplied, const ZR_LayerDef& first, const ZR_LayerDef& second, i32 ratio, const ZR_LayerDef& dst) {
  if (first.width != second.width || first.height != second.height || dst.width != first.width ||
      dst.height != first.height)
    return ZR_Err_Internal;
  const i32 r = ratio < 0 ? 0 : ratio > 0x10000 ? 0x10000 : ratio;
  for (i32 y = 0; y < dst.height; ++y)
    for (i32 x = 0; x < dst.width; ++x) {
      const Px<D> p = load<D>(at<D>(first, x, y)), q = load<D>(at<D>(second, x, y));
      at<D>(dst, x, y) = store(r == 0          ? p
                               : r == 0x10000  ? q
                               : premultiplied ? mix_premultiplied(p, q, r)
                                               : mix_straight(p, q, r));
    }
  return 0;
}

// ----------------------------------------------------------------------------------- premul

template <class D>
Px<D> premultiplied(Px<D> p, bool forward) {
  for (auto& c : p.c) c = forward ? D::mul(c, p.a) : D::div(c, p.a);
  return p;
}
template <class D>
Px<D> premultiplied_by(const Px<D>& m, Px<D> p, bool forward) {
  const auto a = p.a;
  if (a == D::white) return p;
  if (!forward && m.c[0] == 0 && m.c[1] == 0 && m.c[2] == 0) return premultiplied(p, false);
  if (!forward && a == 0) return p;
  for (int i = 0; i < 3; ++i) {
    auto& c = p.c[i];
    if (forward) {
      c = m.c[i] + D::smul(a, c - m.c[i]);
    } else if constexpr (is_float<D>) {
      c = (c - m.c[i] * (1 - a)) / a;
    } else {
      const auto t = c - D::mul(D::inv(a), m.c[i]);
      c = D::div(t < 0 ? 0 : t, a);
    }
  }
  return p;
}

// Null colour: the plain rule, in place.
template <class D>
void premultiply(const ZR_LayerDef& src, const typename D::Pixel* colour, bool forward, const GX_LRect* rect,
                 const ZR_LayerDef& dst) {
  const GX_LRect r = rect != nullptr ? common(*rect, bounds(dst)) : bounds(dst);
  const bool black =
      colour == nullptr || (src.data == dst.data && colour->red == 0 && colour->green == 0 && colour->blue == 0);
  for (i32 y = r.top; y < r.bottom; ++y)
    for (i32 x = r.left; x < r.right; ++x) {
      const Px<D> p = load<D>(at<D>(src, x, y));
      at<D>(dst, x, y) = store(black ? premultiplied(p, forward) : premultiplied_by(load<D>(*colour), p, forward));
    }
}

}  // namespace model
