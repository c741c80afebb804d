// The channel formulas of the transfer modes told a second time for tests: one plain list for each depth, with
// numbers written out and without the library's arithmetic. Slow, and obviously what it says.
#pragma once

#include <ZR/zr.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <type_traits>

namespace model {

using std::max;
using std::min;

struct N8 {
  using Pixel = ZR_Pixel8;
  using Channel = u8;
  using V = i64;
  static constexpr V W = 255, H = 128;
  static V fold(V t) { return (t + ((t + 128) >> 8) + 128) >> 8; }
  static V mul(V a, V b) { return fold(a * b); }
  static V smul(V k, V x) { return fold(k * x); }
  static V inv(V a) { return 255 - a; }
  static V div(V n, V r) { return n >= r ? 255 : (n * 255 + (r >> 1)) / r; }
  static V luma(V r, V g, V b) { return (9798 * r + 19235 * g + 3735 * b + 16384) >> 15; }
  static V soft(bool high, V d) {
    const double x = static_cast<double>(d) / 255;
    const double g = x <= 0.25 ? ((16 * x - 12) * x + 4) * x : std::sqrt(x);
    return std::lround(255 * (high ? g - x : x * (1 - x)));
  }
  static V full(int mode, V s, V d) {
    switch (mode) {
      case 4:
      case 29: return min<V>(s + d, 255);
      case 5: return d - mul(d, 255 - s);
      case 6: return 255 - mul(255 - s, 255 - d);
      case 7: {
        const V t = s * d;
        return d < 128 ? ((t + ((t + 128) >> 8) + 128) >> 7) & 254 : 255 - mul(255 - s, 2 * (255 - d));
      }
      case 8: return s < 128 ? d - mul(255 - 2 * s, soft(false, d)) : d + mul(2 * s - 255, soft(true, d));
      case 9: return s < 128 ? d - mul(d, (~(2 * s)) & 255) : d + mul(255 - d, (2 * s) & 254);
      case 10: return min(s, d);
      case 11: return max(s, d);
      case 12:
      case 26: return std::abs(s - d);
      case 23: return d >= 255 - s ? 255 : div(d, 255 - s);
      case 24: return 255 - d >= s ? 0 : 255 - div(255 - d, s);
      case 25: return s + d - 2 * mul(s, d);
      case 27: return d == 0 ? 0 : d >= 255 - s ? 255 : div(d, 255 - s);
      case 28: return s == 0 && d == 255 ? 255 : 255 - d >= s ? 0 : 255 - div(255 - d, s);
      case 30: return max<V>(s + d - 255, 0);
      case 31: return std::clamp<V>(2 * s - 256 + d, 0, 255);
      case 32:
        if (s < 128) return 255 - div(255 - d, (s * 255 + 64) >> 7);
        return div(d, 255 - div(s - 128, 127));
      case 33: return s < 128 ? min((s * 255 + 64) >> 7, d) : s > 128 ? max(div(s - 128, 127), d) : d;
      case 34: return d > mul(254, 255 - s) ? div(d - mul(254, 255 - s), 1) : 0;
      case 37: return d < s ? 0 : d - s;
      case 38: return d == 0 ? 0 : div(d, s);
    }
    return -1;
  }
  static V partial(int mode, V s, V A, V d) {
    switch (mode) {
      case 4:
      case 6:
      case 12:
      case 23: return full(mode, mul(s, A), d);
      case 5: return d - mul(mul(d, 255 - s), A);
      case 7: return d + smul(A, full(7, s, d) - d);
      case 8:
        return s < 128 ? d - mul(A, mul(255 - 2 * s, soft(false, d))) : d + mul(A, mul(2 * s - 255, soft(true, d)));
      case 9: return s < 128 ? d - mul(mul(d, (~(2 * s)) & 255), A) : d + mul(mul(255 - d, (2 * s) & 254), A);
      case 10: return s < d ? d - mul(A, d - s) : d;
      case 11: return s > d ? d + mul(A, s - d) : d;
      case 24: return full(24, 255 - mul(255 - s, A), d);
      case 25: return d + smul(A, s - mul(s, d) - mul(s, d));
    }
    return -1;
  }
  static V drawn(V t, V d, V k) { return d < t ? t - mul(t - d, k) : t + mul(d - t, k); }
  static V weighted(V s, V d, V f, V A, V D, V R) {
    const V n = mul(A, s) + mul(D, d) - mul(d, mul(A, D)) - (mul(s, mul(A, D)) - mul(mul(A, D), f));
    return div(n & 255, R);
  }
  static V masked(V c, V opacity, V mask) { return mul(mul(mask, c), opacity); }
  static bool marker_blue(Channel b) { return b == 191 || b == 64; }
};

struct N16 {
  using Pixel = ZR_Pixel16;
  using Channel = u16;
  using V = i64;
  static constexpr V W = 32768, H = 16384;
  static V mul(V a, V b) { return (a * b + 16383) >> 15; }
  static V smul(V k, V x) { return (k * x) >> 15; }
  static V inv(V a) { return 32768 - a; }
  static V div(V n, V r) { return n >= r ? 32768 : (n * 32768 + (r >> 1)) / r; }
  static V luma(V r, V g, V b) { return (9798 * r + 19235 * g + 3735 * b + 16384) >> 15; }
  static V soft_entry(bool high, V i) {
    if (i == 4096) return 0;
    const double x = static_cast<double>(i) / 4096;
    const double g = x <= 0.25 ? ((16 * x - 12) * x + 4) * x : std::sqrt(x);
    return static_cast<V>(32768 * (high ? g - x : x * (1 - x)) + 0.5);
  }
  static V soft(bool high, V d) {
    const V here = soft_entry(high, d >> 3);
    return (d & 7) == 0 ? here : here + (((d & 7) * (soft_entry(high, (d >> 3) + 1) - here) + 4) >> 3);
  }
  static V full(int mode, V s, V d) {
    const V is = 32768 - s, id = 32768 - d;
    switch (mode) {
      case 4:
      case 29: return min<V>(s + d, 32768);
      case 5: return d - mul(d, is);
      case 6: return 32768 - mul(is, id);
      case 7: return d < 16384 ? ((s * d + 16383) >> 14) & ~V{1} : 32768 - mul(is, 2 * id);
      case 8: return s < 16384 ? d - mul(32768 - 2 * s, soft(false, d)) : d + mul(2 * s - 32768, soft(true, d));
      case 9: return s < 16384 ? d - mul(d, 32768 - 2 * s) : d + mul(id, 2 * s - 32768);
      case 10: return min(s, d);
      case 11: return max(s, d);
      case 12:
      case 26: return std::abs(s - d);
      case 23: return d >= is ? 32768 : (d * 32768 + (is >> 1)) / is;
      case 24: return id >= s ? 0 : 32768 - (id * 32768 + (s >> 1)) / s;
      case 25: return s + d - (((s * d + 16383) >> 14) & ~V{1});
      case 27: return d == 0 ? 0 : d >= is ? 32768 : (d * 32768 + (is >> 1)) / is;
      case 28: return s == 0 && d == 32768 ? 32768 : id >= s ? 0 : 32768 - (id * 32768 + (s >> 1)) / s;
      case 30: return max<V>(s + d - 32768, 0);
      case 31: return std::clamp<V>(2 * s - 32768 + d, 0, 32768);
      case 32: {
        if (s == 16384) return d;
        if (s == 0) return 0;
        if (s == 32768) return 32768;
        const V w = s < 16384 ? 2 * s : 65536 - 2 * s;
        if (s < 16384) return id >= w ? 0 : 32768 - (id * 32768 + (w >> 1)) / w;
        return d >= w ? 32768 : (d * 32768 + (w >> 1)) / w;
      }
      case 33: return s < 16384 ? min(2 * s, d) : s > 16384 ? max(2 * s - 32768, d) : d;
      case 34: return d > (is * 32767 + 16384) >> 15 ? 32768 : 0;
      case 37: return d < s ? 0 : d - s;
      case 38: return d == 0 ? 0 : d >= s ? 32768 : (d * 32768 + (s >> 1)) / s;
    }
    return -1;
  }
  static V partial(int mode, V s, V A, V d) {
    switch (mode) {
      case 4:
      case 6:
      case 12:
      case 23: return full(mode, mul(s, A), d);
      case 5: return d - mul(mul(d, 32768 - s), A);
      case 7: return d + smul(A, full(7, s, d) - d);
      case 8:
        return s < 16384 ? d - mul(A, mul(32768 - 2 * s, soft(false, d)))
                         : d + mul(A, mul(2 * s - 32768, soft(true, d)));
      case 9: return s < 16384 ? d - mul(mul(d, 32768 - 2 * s), A) : d + mul(mul(32768 - d, 2 * s - 32768), A);
      case 10: return s < d ? d - mul(A, d - s) : d;
      case 11: return s > d ? d + mul(A, s - d) : d;
      case 24: return full(24, 32768 - mul(32768 - s, A), d);
      case 25: return d + smul(A, s - mul(s, d) - mul(s, d));
    }
    return -1;
  }
  static V drawn(V t, V d, V k) { return t + smul(k, d - t); }
  static V weighted(V s, V d, V f, V A, V D, V R) {
    const V n = mul(A, s) + mul(D, d) - mul(d, mul(A, D)) - (mul(s, mul(A, D)) - mul(mul(A, D), f));
    return div(n & 0xffff, R);
  }
  static V masked(V c, V opacity, V mask) { return mul(mask, mul(c, opacity)); }
  static bool marker_blue(Channel b) { return b == 24576 || b == 8192; }
};

struct NF {
  using Pixel = ZR_PixelFloat;
  using Channel = f32;
  using V = f32;
  static constexpr V W = 1, H = 0.5f;
  static V mul(V a, V b) { return a * b; }
  static V smul(V k, V x) { return k * x; }
  static V inv(V a) { return 1 - a; }
  static V div(V n, V r) { return r == 0 || std::fpclassify(r) == FP_SUBNORMAL ? 1 : n / r; }
  static V luma(V r, V g, V b) { return 0.299f * r + 0.587f * g + 0.114f * b; }
  static V soft_entry(bool high, int i) {
    if (i >= 4096) return 0;
    const double x = i / 4096.0;
    const double g = x <= 0.25 ? ((16 * x - 12) * x + 4) * x : std::sqrt(x);
    return static_cast<f32>(high ? g - x : x * (1 - x));
  }
  static V soft(bool high, V d) {
    const V t = 4096 * d;
    const int i = t <= 0 ? 0 : t >= 4096 ? 4096 : static_cast<int>(t);
    const V v = soft_entry(high, i), rest = t - static_cast<f32>(i);
    return rest == 0 ? v : v + (soft_entry(high, i + 1) - v) * rest;
  }
  static V full(int mode, V s, V d) {
    switch (mode) {
      case 4:
      case 29: return s + d;
      case 5: return d - d * (1 - s);
      case 6: return 1 - (1 - s) * (1 - d);
      case 7: return d < 0.5f ? 2 * (s * d) : 1 - (1 - s) * (2 * (1 - d));
      case 8: return d + (2 * s - 1) * soft(s >= 0.5f, d);
      case 9: return s < 0.5f ? d - d * (1 - 2 * s) : d + (1 - d) * (2 * s - 1);
      case 10: return min(s, d);
      case 11: return max(s, d);
      case 12:
      case 26: return std::fabs(s - d);
      case 23: return d >= 1 - s ? 1 : div(d, 1 - s);
      case 24: return 1 - d >= s ? 0 : 1 - div(1 - d, s);
      case 25: return s + d - 2 * (s * d);
      case 27: return d == 0 ? 0 : d >= 1 - s ? 1 : div(d, 1 - s);
      case 28: return s == 0 && d == 1 ? 1 : 1 - d >= s ? 0 : 1 - div(1 - d, s);
      case 30: return max(s + d - 1, 0.0f);
      case 31: return 2 * s - 1 + d;
      case 32: {
        if (s == 0.5f) return d;
        if (s == 0) return 0;
        if (s == 1) return 1;
        if (s < 0.5f) return 1 - d >= 2 * s ? 0 : 1 - div(1 - d, 2 * s);
        const V w = 1 - (s - 0.5f) * 2;
        return d >= w ? 1 : div(d, w);
      }
      case 33: return s < 0.5f ? min(2 * s, d) : s > 0.5f ? max((s - 0.5f) * 2, d) : d;
      case 34: {
        const V w = (1 - s) * 0.99999f;
        return d <= w ? 0 : d - w >= 1.001358e-5f ? 1 : (d - w) / 1.001358e-5f;
      }
      case 37: return d - s;
      case 38: return std::fabs(s) > 1.8189894e-6f ? d / s : d / 1.8189894e-6f;
    }
    return -1;
  }
  static V partial(int mode, V s, V A, V d) {
    switch (mode) {
      case 4: return s * A + d;
      case 6: return 1 - (1 - s * A) * (1 - d);
      case 12: return std::fabs(s * A - d);
      case 23: return full(23, s * A, d);
      case 5: return d - d * (1 - s) * A;
      case 7: return d + A * (full(7, s, d) - d);
      case 8: return d + (2 * s - 1) * (soft(s >= 0.5f, d) * A);
      case 9: return s < 0.5f ? d - d * (1 - 2 * s) * A : d + (1 - d) * (2 * s - 1) * A;
      case 10: return s < d ? d - A * (d - s) : d;
      case 11: return s > d ? d + A * (s - d) : d;
      case 24: return full(24, 1 - (1 - s) * A, d);
      case 25: return d + A * (s - s * d - s * d);
    }
    return -1;
  }
  static V drawn(V t, V d, V k) { return t + k * (d - t); }
  static V weighted(V s, V d, V f, V A, V D, V R) { return div(((f - s - d) * D + s) * A + D * d, R); }
  static V masked(V c, V opacity, V mask) { return mask * (c * opacity); }
  static bool marker_blue(Channel b) { return b == 0.75f || b == 0.25f; }
};

template <class Pixel>
using Numbers = std::conditional_t<std::is_same_v<Pixel, ZR_Pixel8>, N8,
                                   std::conditional_t<std::is_same_v<Pixel, ZR_Pixel16>, N16, NF>>;

}  // namespace model
