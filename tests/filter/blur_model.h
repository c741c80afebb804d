// The blurs written down plainly: one line, one channel after the other, step by step.
#pragma once

#include <ZR/blur.h>
#include <ZR/depth.h>

#include <algorithm>
#include <cmath>
#include <type_traits>
#include <vector>

#include "support/worlds.h"

struct BlurCase {
  f32 radius;
  u32 iterations;  // 0 is the Gaussian
  u32 flags;
  bool src_vertical, src_premultiplied, dst_vertical, dst_premultiplied, copy;
};

// Pixels at positions low.. of a line.
template <class T>
struct ModelLine {
  i64 low = 0;
  std::vector<T> pixels;
  i64 high() const { return low + static_cast<i64>(pixels.size()); }
  bool has(i64 p) const { return p >= low && p < high(); }
  T at(i64 p) const { return has(p) ? pixels[static_cast<size_t>(p - low)] : T{}; }
};

template <class T>
zr::Channel<T> channel_of(const T& p, int c) {
  return c == 0 ? p.alpha : c == 1 ? p.red : c == 2 ? p.green : p.blue;
}
template <class T>
void set_channel(T& p, int c, zr::Channel<T> v) {
  (c == 0 ? p.alpha : c == 1 ? p.red : c == 2 ? p.green : p.blue) = v;
}

template <class T>
ModelLine<T> premultiplied_line(ModelLine<T> line, u32 flags) {
  for (T& p : line.pixels)
    for (int c = 1; c < 4; ++c) {
      if ((flags >> c & 1) == 0) continue;
      const auto v = channel_of(p, c);
      if constexpr (sizeof(T) == 4) {
        const int t = v * p.alpha;
        set_channel(p, c, static_cast<u8>((t + ((t + 128) >> 8) + 128) >> 8));
      } else if constexpr (sizeof(T) == 8) {
        set_channel(p, c, static_cast<u16>((v * p.alpha + 16383) >> 15));
      } else {
        set_channel(p, c, v * p.alpha);
      }
    }
  return line;
}

// One pass of the box over positions low..high-1. Number is what sums are made of; weights of the alpha of floats,
// which is summed in double precision, are single.
template <class T, class Number>
ModelLine<T> box_pass(const ModelLine<T>& in, f32 radius, bool renormalise, bool straight, i64 low, i64 high) {
  constexpr bool bytes = sizeof(T) == 4, words = sizeof(T) == 8;
  const i64 rc = static_cast<i64>(std::ceil(radius));
  const f32 f = static_cast<f32>(rc) - radius;
  using Weight = std::conditional_t<bytes, i64, f32>;
  const Weight one = bytes ? 1024 : 1,
               F = bytes ? static_cast<Weight>(static_cast<i32>(f * 1024)) : static_cast<Weight>(f);
  const Weight W = bytes ? static_cast<Weight>((rc << 11) - 2 * static_cast<i64>(F) + 1024)
                         : static_cast<Weight>(static_cast<f32>(2 * rc + 1) - 2 * f);
  Number sum[4] = {};
  Weight counter = 0;
  i64 trailing = low - rc - 1, leading = trailing + 2 * rc + 1;
  for (i64 p = std::max(trailing, in.low); p < std::min(leading, in.high()); ++p) {
    for (int c = 0; c < 4; ++c) sum[c] += static_cast<Number>(channel_of(in.at(p), c));
    counter += one;
  }
  ModelLine<T> out{low, {}};
  for (i64 p = low; p < high; ++p) {
    if (in.has(trailing)) {
      for (int c = 0; c < 4; ++c) sum[c] -= static_cast<Number>(channel_of(in.at(trailing), c));
      counter -= one;
    }
    ++trailing;
    Number edge[4] = {};
    Weight E = 0;
    if (in.has(trailing) && F != 0) {
      E = F;
      for (int c = 0; c < 4; ++c) edge[c] = static_cast<Number>(channel_of(in.at(trailing), c));
    }
    if (in.has(leading)) {
      counter += one;
      if (F != 0) E += F;
      for (int c = 0; c < 4; ++c) {
        const Number v = static_cast<Number>(channel_of(in.at(leading), c));
        sum[c] += v;
        if (F != 0) edge[c] += v;
      }
    }
    ++leading;
    const Weight divisor = renormalise ? counter - E : W;
    Number n[4];
    for (int c = 0; c < 4; ++c) n[c] = sum[c] * static_cast<Number>(one) - edge[c] * static_cast<Number>(F);
    Number q = n[0];
    if constexpr (bytes) q = (n[0] + 127) / 255;
    if constexpr (words) q = n[0] * 3.0517578e-5f;
    T pixel{};
    for (int c = 0; c < 4 && divisor != 0 && (!straight || q != 0); ++c) {
      const Number by = straight && c > 0 ? q : static_cast<Number>(divisor);
      Number v = sizeof(T) == 16 ? n[c] / by : (n[c] + by / 2) / by;
      if (straight && c > 0 && bytes) v = std::min<Number>(v, 255);
      if (straight && c > 0 && words) v = std::min<Number>(v, 32768);
      set_channel(pixel, c,
                  static_cast<zr::Channel<T>>(sizeof(T) == 16 ? v : static_cast<Number>(static_cast<i64>(v))));
    }
    out.pixels.push_back(pixel);
  }
  return out;
}

template <class T, class Number>
ModelLine<T> box_line(const ModelLine<T>& source, const BlurCase& blur, i64 d0, i64 d1) {
  const i64 rc = static_cast<i64>(std::ceil(blur.radius)), n = blur.iterations, o = 0, e = source.high();
  const bool premultiply = !blur.src_premultiplied && (blur.flags & 14) != 0;
  ModelLine<T> line = source;
  if (premultiply || blur.copy) {
    const i64 low = std::max(d0 - n * rc, o), high = std::max(low, std::min(d1 + n * rc, e));
    if (premultiply) line = premultiplied_line(line, blur.flags);
    ModelLine<T> copy{low, {}};
    for (i64 p = low; p < high; ++p) copy.pixels.push_back(line.at(p));
    line = copy;
  }
  i64 low = line.low, high = line.high();
  if (low == high) low = std::max(d0 - n * rc, o), high = std::min(d1 + n * rc, e);
  for (i64 k = 1; k <= n; ++k) {
    low = k == n ? d0 : std::max(d0 - (n - k) * rc, low - rc);
    high = k == n ? d1 : std::min(high + rc, d1 + (n - k) * rc);
    line = box_pass<T, Number>(line, blur.radius, (blur.flags & 16) != 0, k == n && !blur.dst_premultiplied, low, high);
  }
  return line;
}

template <class T>
ModelLine<T> bell_line(const ModelLine<T>& source, const BlurCase& blur, i64 d0, i64 d1) {
  using Number = std::conditional_t<sizeof(T) == 4, i64, f32>;
  constexpr bool bytes = sizeof(T) == 4, words = sizeof(T) == 8;
  const i64 rc = static_cast<i64>(std::ceil(blur.radius));
  std::vector<i32> w{255};
  i32 D = 255;
  for (i64 i = 1; i <= rc; ++i) {
    const f64 r = static_cast<f64>(i) / (1.0 + static_cast<f64>(blur.radius));
    w.push_back(static_cast<i32>((1 - (1 - std::exp(-2.378 * r * r)) * 1.102) * 255));
    D += 2 * w.back();
  }
  const bool premultiply = !blur.src_premultiplied && (blur.flags & 14) != 0;
  const ModelLine<T> line = premultiply ? premultiplied_line(source, blur.flags) : source;
  ModelLine<T> out{d0, {}};
  for (i64 p = d0; p < d1; ++p) {
    Number sum[4] = {};
    i32 inside = 0;
    const auto tap = [&](i64 at, i64 i) {
      if (!line.has(at)) return;
      const i32 weight = w[static_cast<size_t>(i)];
      inside += weight;
      for (int c = 0; c < 4; ++c) {
        const auto v = channel_of(line.at(at), c);
        if constexpr (sizeof(T) == 16)
          sum[c] = i == 0 ? static_cast<f32>(weight) * v : sum[c] + static_cast<f32>(weight) * v;
        else
          sum[c] += static_cast<Number>(weight * v);
      }
    };
    tap(p, 0);
    for (i64 i = 1; i <= rc; ++i) tap(p + i, i), tap(p - i, i);
    const Number divisor = static_cast<Number>((blur.flags & 16) != 0 ? inside : D);
    const Number A = (blur.flags & 1) != 0 ? sum[0] : static_cast<Number>(line.at(p).alpha) * divisor;
    T pixel{};
    for (int c = 0; c < 4 && divisor != 0 && (blur.dst_premultiplied || A != 0); ++c) {
      Number v;
      if (c > 0 && !blur.dst_premultiplied) {
        if constexpr (bytes) v = std::min<i64>((sum[c] * 255 + A / 2) / A, 255);
        if constexpr (words) v = std::min((sum[c] * 32768 + static_cast<f32>(static_cast<i64>(A / 2))) / A, 32768.0f);
        if constexpr (sizeof(T) == 16) v = sum[c] / A;
      } else {
        v = sizeof(T) == 16 ? sum[c] / divisor : (sum[c] + divisor / 2) / divisor;
      }
      set_channel(pixel, c,
                  static_cast<zr::Channel<T>>(sizeof(T) == 16 ? v : static_cast<Number>(static_cast<i64>(v))));
    }
    out.pixels.push_back(pixel);
  }
  return out;
}

template <class T>
void model_blur(const TestWorld<T>& src, GX_LPoint src_origin, const BlurCase& blur, GX_LPoint dst_origin,
                TestWorld<T>& dst) {
  const auto along = [](bool down, GX_LPoint p) -> i64 { return down ? p.y : p.x; };
  const i64 d0 = along(blur.dst_vertical, dst_origin) - along(blur.src_vertical, src_origin);
  const i64 shift = along(!blur.dst_vertical, dst_origin) - along(!blur.src_vertical, src_origin);
  const i64 length = blur.dst_vertical ? dst.height() : dst.width(),
            lines = blur.dst_vertical ? dst.width() : dst.height();
  const i64 src_length = blur.src_vertical ? src.height() : src.width();
  const i64 src_lines = blur.src_vertical ? src.width() : src.height();
  for (i64 n = 0; n < lines; ++n) {
    const auto out = [&](i64 i) -> T& {
      return blur.dst_vertical ? dst.at(static_cast<i32>(n), static_cast<i32>(i))
                               : dst.at(static_cast<i32>(i), static_cast<i32>(n));
    };
    const i64 from = n + shift;
    if (from < 0 || from >= src_lines) {
      for (i64 i = 0; i < length; ++i) out(i) = T{};
      continue;
    }
    ModelLine<T> source;
    for (i64 p = 0; p < src_length; ++p)
      source.pixels.push_back(blur.src_vertical ? src.at(static_cast<i32>(from), static_cast<i32>(p))
                                                : src.at(static_cast<i32>(p), static_cast<i32>(from)));
    ModelLine<T> made;
    if (blur.iterations == 0)
      made = bell_line(source, blur, d0, d0 + length);
    else if constexpr (sizeof(T) == 16)
      made = (blur.flags & 15) == 1 ? box_line<T, f64>(source, blur, d0, d0 + length)
                                    : box_line<T, f32>(source, blur, d0, d0 + length);
    else
      made = box_line<T, std::conditional_t<sizeof(T) == 4, i64, f32>>(source, blur, d0, d0 + length);
    for (i64 i = 0; i < length; ++i) {
      T pixel = made.at(d0 + i);
      for (int c = 0; c < 4; ++c)
        if ((blur.flags >> c & 1) == 0) set_channel(pixel, c, channel_of(source.at(d0 + i), c));
      out(i) = pixel;
    }
  }
}
