// The draft copy as a plain walk with error terms, pixel by pixel, and the conversions in exact terms.
#pragma once

#include <ZR/depth.h>
#include <ZR/types.h>

#include <cmath>
#include <optional>
#include <random>
#include <string>
#include <type_traits>

namespace copy_model {

// What a call should answer. `walked` is false where the walk would have been too long to be done here.
struct Answer {
  i32 code = 0;
  std::string failed;
  bool walked = true;
};
struct Size {
  i32 width, height;
};
struct Texts {
  const char *x, *y;
};

// 32-bit arithmetic that wraps, by way of 64 bits.
inline i32 wrapped(i64 v) { return static_cast<i32>(static_cast<u32>(static_cast<u64>(v))); }
inline i32 share(i32 cut, i32 other, i32 extent) { return wrapped(i64{wrapped(i64{cut} * other)} / extent); }

// put(dst x, dst y, src x, src y) for every pixel inside both worlds. `moves_equal`: equal rectangles anywhere
// are moved, not only those of whole worlds.
template <class Put>
Answer draft(Size src, Size dst, const GX_LRect* src_rect, const GX_LRect* dst_rect, bool moves_equal,
             const Texts& texts, Put put) {
  GX_LRect r[2];
  bool full[2];
  const Size size[2] = {src, dst};
  const GX_LRect* given[2] = {src_rect, dst_rect};
  const auto same = [](const GX_LRect& a, const GX_LRect& b) {
    return a.left == b.left && a.top == b.top && a.right == b.right && a.bottom == b.bottom;
  };
  for (int i = 0; i < 2; ++i) {
    const GX_LRect all = {0, 0, size[i].width, size[i].height};
    r[i] = given[i] != nullptr ? *given[i] : all;
    full[i] = same(r[i], all);
    if (full[i]) continue;
    if (r[i].left == r[i].right || r[i].top == r[i].bottom || r[i].left >= all.right || r[i].top >= all.bottom ||
        r[i].right < 1 || r[i].bottom < 1)
      return {};
  }
  const auto inside = [](i64 x, i64 y, Size s) { return x >= 0 && y >= 0 && x < s.width && y < s.height; };
  if (same(r[0], r[1]) && ((full[0] && full[1]) || (moves_equal && r[0].left >= 0 && r[0].top >= 0))) {
    for (i32 y = r[0].top; y < r[0].bottom && y < src.height; ++y)
      for (i32 x = r[0].left; x < r[0].right && x < src.width; ++x)
        if (inside(x, y, dst)) put(x, y, x, y);
    return {};
  }
  GX_LRect &s = r[0], &d = r[1];
  const i32 sw = wrapped(i64{s.right} - s.left), sh = wrapped(i64{s.bottom} - s.top);
  const i32 dw = wrapped(i64{d.right} - d.left), dh = wrapped(i64{d.bottom} - d.top);
  if (!full[0]) {
    if (s.left < 0) d.left = wrapped(i64{d.left} + share(wrapped(-i64{s.left}), dw, sw)), s.left = 0;
    if (s.right > src.width) d.right = wrapped(i64{d.right} - share(s.right - src.width, dw, sw)), s.right = src.width;
    if (s.top < 0) d.top = wrapped(i64{d.top} + share(wrapped(-i64{s.top}), dh, sh)), s.top = 0;
    if (s.bottom > src.height)
      d.bottom = wrapped(i64{d.bottom} - share(s.bottom - src.height, dh, sh)), s.bottom = src.height;
  }
  if (!full[1]) {
    if (d.left < 0) s.left = wrapped(i64{s.left} + share(wrapped(-i64{d.left}), sw, dw)), d.left = 0;
    if (d.right > dst.width) s.right = wrapped(i64{s.right} - share(d.right - dst.width, sw, dw)), d.right = dst.width;
    if (d.top < 0) s.top = wrapped(i64{s.top} + share(wrapped(-i64{d.top}), sh, dh)), d.top = 0;
    if (d.bottom > dst.height)
      s.bottom = wrapped(i64{s.bottom} - share(d.bottom - dst.height, sh, dh)), d.bottom = dst.height;
  }
  const i64 cw = wrapped(i64{s.right} - s.left), ch = wrapped(i64{s.bottom} - s.top);
  const i64 ow = wrapped(i64{d.right} - d.left), oh = wrapped(i64{d.bottom} - d.top);
  constexpr i64 longest = 3000;
  if (std::abs(cw) > longest || std::abs(ch) > longest || std::abs(ow) > longest || std::abs(oh) > longest)
    return {0, "", false};
  Answer answer;
  i64 e = 0, row = d.top;
  for (i64 i = 0; i < ch; ++i) {
    e += oh;
    const i64 n = e / ch;
    if (n < 0) return {3, texts.y, true};
    for (i64 copy = 0; copy < n; ++copy, ++row, e -= ch) {
      i64 f = 0, column = d.left;
      for (i64 j = 0; j < cw; ++j) {
        f += ow;
        const i64 m = f / cw;
        if (m < 0) {
          answer = {3, texts.x, true};
          break;
        }
        for (i64 k = 0; k < m; ++k, ++column)
          if (inside(s.left + j, s.top + i, src) && inside(column, row, dst))
            put(static_cast<i32>(column), static_cast<i32>(row), static_cast<i32>(s.left + j),
                static_cast<i32>(s.top + i));
        f -= m * cw;
      }
    }
    if (answer.code != 0) return answer;
  }
  return answer;
}

template <class To, class From>
To convert(const From& p) {
  const auto one = [](auto c) -> zr::Channel<To> {
    constexpr bool from8 = std::is_same_v<From, ZR_Pixel8>, to8 = std::is_same_v<To, ZR_Pixel8>;
    if constexpr (std::is_same_v<From, To>) {
      return c;
    } else if constexpr (std::is_same_v<From, ZR_PixelFloat>) {
      const f32 white = to8 ? 255.0f : 32768.0f, v = c * white;
      return static_cast<zr::Channel<To>>(std::isnan(v) || v < 0 ? 0.0f : v > white ? white : v + 0.5f);
    } else if constexpr (std::is_same_v<To, ZR_PixelFloat>) {
      return static_cast<f32>(c) * (from8 ? 1.0f / 255 : 1.0f / 32768);
    } else {
      return static_cast<zr::Channel<To>>(from8 ? (c * 32768 + 128) / 255 : (c * 255 + 16384) / 32768);
    }
  };
  return {one(p.alpha), one(p.red), one(p.green), one(p.blue)};
}

// Rectangles around a world: null, whole, clipped, outside, empty, inverted, far.
class Rects {
 public:
  explicit Rects(u32 seed) : random_(seed) {}
  i32 between(i32 low, i32 high) { return std::uniform_int_distribution<i32>(low, high)(random_); }
  std::optional<GX_LRect> next(Size size) {
    switch (between(0, 15)) {
      case 0: return std::nullopt;
      case 1: return GX_LRect{0, 0, size.width, size.height};
      case 2: return GX_LRect{far(), far(), far(), far()};
      case 3: return GX_LRect{-between(0, 70000), -between(0, 70000), between(1, 70000), between(1, 70000)};
      default: break;
    }
    GX_LRect r = {between(-5, size.width), between(-5, size.height), 0, 0};
    r.right = r.left + between(-3, 15), r.bottom = r.top + between(-3, 15);
    return r;
  }

 private:
  i32 far() {
    constexpr i32 places[] = {-2147483647 - 1, -2147483647, -65537, -1, 0, 1, 3, 65536, 2147483646, 2147483647};
    return places[between(0, 9)];
  }
  std::mt19937 random_;
};

inline const GX_LRect* address(const std::optional<GX_LRect>& rect) { return rect ? &*rect : nullptr; }

}  // namespace copy_model
