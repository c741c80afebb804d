// A second, plain telling of the transfer modes for tests: one long formula list for each depth, with
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

// ------------------------------------------------------------------------------ three number systems

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

// ------------------------------------------------------------------------------ kinds

enum Kind {
  copy,
  behind,
  front,
  nothing,
  black,
  white,
  grey,
  weighted,
  colour,
  alpha,
  add_premul,
  alpha_add,
  blue,
  key
};
inline Kind kind_of(int mode) {
  static constexpr Kind kinds[] = {
      copy,      behind,   front,  nothing, black,    white,    black,    grey,     grey,     grey,     white,
      black,     black,    colour, colour,  colour,   colour,   alpha,    alpha,    alpha,    alpha,    add_premul,
      alpha_add, black,    white,  black,   weighted, weighted, weighted, weighted, weighted, weighted, weighted,
      weighted,  weighted, colour, colour,  weighted, weighted, blue,     key};
  return kinds[mode];
}

template <class N>
typename N::V fade(Kind ground, typename N::V c, typename N::V a) {
  if (ground == black) return N::mul(c, a);
  if (ground == white) return N::inv(N::mul(N::inv(c), a));
  return c < N::H ? c + N::mul(N::inv(a), N::H - c) : N::H + N::mul(c - N::H, a);
}

template <class N>
typename N::V unfade(Kind ground, typename N::V t, typename N::V r) {
  using V = typename N::V;
  if (ground == black) return N::div(t, r);
  if (ground == white) return N::inv(N::div(N::inv(t), r));
  if constexpr (std::is_same_v<N, NF>) {
    return t < N::H ? N::H - N::div(N::H - t, r) : N::H + N::div(t - N::H, r);
  } else {
    const V w = N::div(std::abs(t - N::H), r);
    if (t < N::H) return w > N::H ? 0 : N::H - w;
    if (std::is_same_v<N, N8>) return w < 128 ? 128 + w : 255;
    return N::H + min(w, N::H);
  }
}

template <class N>
struct Colour {
  typename N::V c[3];
  typename N::V luma() const { return N::luma(c[0], c[1], c[2]); }
  typename N::V least() const { return min({c[0], c[1], c[2]}); }
  typename N::V most() const { return max({c[0], c[1], c[2]}); }
};

template <class N>
Colour<N> with_saturation(Colour<N> in, typename N::V S) {
  using V = typename N::V;
  const V r = in.c[0], g = in.c[1], b = in.c[2];
  int top, middle, low;
  if (r > g) {
    if (g > b)
      top = 0, middle = 1, low = 2;
    else if (r > b)
      top = 0, middle = 2, low = 1;
    else
      top = 2, middle = 0, low = 1;
  } else {
    if (r > b)
      top = 1, middle = 0, low = 2;
    else if (g > b)
      top = 1, middle = 2, low = 0;
    else
      top = 2, middle = 1, low = 0;
  }
  const V w = in.c[top] - in.c[low];
  Colour<N> out{};
  if (w != 0) {
    out.c[middle] = (in.c[middle] - in.c[low]) * S / w;
    out.c[top] = S;
  }
  return out;
}

template <class N>
Colour<N> with_luma(Colour<N> in, typename N::V L) {
  using V = typename N::V;
  const V t = L - in.luma();
  for (V& c : in.c) c += t;
  const V m = in.least();
  if (m < 0 && L - m != 0)
    for (V& c : in.c) c = L + (c - L) * L / (L - m);
  const V x = in.most();
  if (x > N::W && x - L != 0)
    for (V& c : in.c) c = L + (c - L) * (N::W - L) / (x - L);
  return in;
}

// ------------------------------------------------------------------------------ one pixel

template <class N>
struct Worked {
  using V = typename N::V;
  V a;
  Colour<N> rgb;
  explicit Worked(const typename N::Pixel& p)
      : a(p.alpha), rgb{{static_cast<V>(p.red), static_cast<V>(p.green), static_cast<V>(p.blue)}} {}
  typename N::Pixel pixel() const {
    using C = typename N::Channel;
    return {static_cast<C>(a), static_cast<C>(rgb.c[0]), static_cast<C>(rgb.c[1]), static_cast<C>(rgb.c[2])};
  }
};

template <class N>
void mix_colour(int mode, const Worked<N>& s, typename N::V A, typename N::V source_luma, bool wanted, Worked<N>& d) {
  using V = typename N::V;
  const V L = d.rgb.luma();
  Colour<N> c = s.rgb;
  if (mode == 13) c = with_luma(with_saturation(s.rgb, d.rgb.most() - d.rgb.least()), L);
  if (mode == 14) c = with_luma(with_saturation(d.rgb, s.rgb.most() - s.rgb.least()), L);
  if (mode == 15) c = with_luma(s.rgb, L);
  if (mode == 16) c = with_luma(d.rgb, source_luma);
  if (!wanted) return;
  for (int i = 0; i < 3; ++i) d.rgb.c[i] = A == N::W ? c.c[i] : d.rgb.c[i] + N::smul(A, c.c[i] - d.rgb.c[i]);
}

template <class N>
bool colour_wanted(int mode, const Worked<N>& s, const Worked<N>& d) {
  return mode == 35 ? s.rgb.luma() > d.rgb.luma() : mode == 36 ? s.rgb.luma() < d.rgb.luma() : true;
}

// The kernel under an effective alpha; of mode 21 the source is already scaled.
template <class N>
typename N::Pixel kernel(int mode, const typename N::Pixel& src, typename N::V A, const typename N::Pixel& dst) {
  using V = typename N::V;
  const Worked<N> s(src);
  Worked<N> d(dst);
  const V D = d.a, R = N::W - N::mul(N::inv(A), N::inv(D));
  const Kind kind = kind_of(mode);
  const auto each = [&](auto&& change) {
    for (int i = 0; i < 3; ++i) d.rgb.c[i] = change(s.rgb.c[i], d.rgb.c[i]);
  };
  switch (kind) {
    case copy: d = s, d.a = A; break;
    case nothing: break;
    case colour:
    case behind: {
      const bool wanted = colour_wanted(mode, s, d);
      if (D != N::W) {
        each([&](V sc, V dc) { return N::div(N::drawn(N::mul(sc, A), dc, D), R); });
        d.a = R;
      }
      if (kind == colour) mix_colour(mode, s, A, s.rgb.luma(), wanted, d);
      break;
    }
    case front:
      if (A == N::W) return src;
      if (D == 0) {
        d = s, d.a = A;
        break;
      }
      each([&](V sc, V dc) { return N::div(N::mul(dc, D) + N::smul(A, sc - N::mul(dc, D)), R); });
      d.a = R;
      break;
    case black:
    case white:
    case grey:
      each([&](V sc, V dc) {
        const V faded = D == N::W ? dc : fade<N>(kind, dc, D);
        if (A == N::W) return N::full(mode, sc, faded);
        const V t = N::partial(mode, sc, A, faded);
        return R == N::W ? t : unfade<N>(kind, t, R);
      });
      d.a = A == N::W ? N::W : R;
      break;
    case weighted:
      each([&](V sc, V dc) {
        const V f = N::full(mode, sc, dc);
        return A == N::W ? sc + N::smul(D, f - sc) : N::weighted(sc, dc, f, A, D, R);
      });
      d.a = A == N::W ? N::W : R;
      break;
    case alpha: {
      const V t = mode == 18 || mode == 20 ? N::mul(s.rgb.luma(), A) : A;
      d.a = N::mul(D, mode >= 19 ? N::inv(t) : t);
      if (std::is_same_v<N, NF> && (mode == 18 || mode == 20)) {
        if (d.a > 1) d.a = 1;
        if (static_cast<double>(d.a) < 1e-16) d.a = 0;
      }
      break;
    }
    case add_premul:
      each([&](V sc, V dc) {
        const V c = sc + N::mul(dc, N::mul(N::inv(A), D));
        return N::div(std::is_same_v<N, NF> ? c : min(c, N::W), R);
      });
      d.a = R;
      break;
    case alpha_add:
      if (A == N::W) {
        d = s, d.a = N::W;
      } else if (A + D >= N::W) {
        each([&](V sc, V dc) { return N::mul(sc, A) + N::mul(dc, N::inv(A)); });
        d.a = N::W;
      } else {
        each([&](V sc, V dc) { return N::div(N::mul(sc, A) + N::mul(dc, D), A + D); });
        d.a = A + D;
      }
      break;
    case blue:
      if (A >= N::H) d.rgb.c[2] = s.rgb.c[2], d.a = N::W;
      break;
    case key: {
      const bool marker = (d.rgb.c[0] == N::W && d.rgb.c[1] == 0 && d.rgb.c[2] == 0) ||
                          (d.rgb.c[0] == 0 && d.rgb.c[1] == N::W && d.rgb.c[2] == 0) ||
                          (d.rgb.c[0] == 0 && d.rgb.c[1] == 0 && N::marker_blue(dst.blue));
      if (!marker) return src;
      break;
    }
  }
  return d.pixel();
}

// ------------------------------------------------------------------------------ linear light

inline i64 widened(i64 a) { return (a * 0x808080 + 33200) >> 16; }

inline ZR_Pixel16 into_linear(const ZR_Pixel8& p, const ZR_LinearBlendingTables& t) {
  return {static_cast<u16>(widened(p.alpha)), t.to_linear[p.red], t.to_linear[p.green], t.to_linear[p.blue]};
}
inline ZR_Pixel16 into_linear(const ZR_Pixel16& p, const ZR_LinearBlendingTables& tables) {
  const auto one = [&](i64 v) {
    const i64 t = v * 255, i = t >> 15, f = t & 0x7fff;
    i64 u = tables.to_linear[i];
    if (f != 0) u += (f * (tables.to_linear[i + 1] - u) + 16384) >> 15;
    return static_cast<u16>(u);
  };
  return {p.alpha, one(p.red), one(p.green), one(p.blue)};
}
inline f32 power(f32 c, f32 e) { return c >= 0 ? std::pow(c, e) : -std::pow(-c, e); }
inline ZR_PixelFloat into_linear(const ZR_PixelFloat& p, const ZR_LinearBlendingTables& t) {
  const f32 e = t.to_linear_gamma;
  return {p.alpha, power(p.red, e), power(p.green, e), power(p.blue, e)};
}
inline u16 back(i64 v, const ZR_LinearBlendingTables& t) {
  i64 u = t.from_linear[v >> 3];
  if ((v & 7) != 0) u += ((v & 7) * (t.from_linear[(v >> 3) + 1] - u) + 4) >> 3;
  return static_cast<u16>(u);
}
inline void out_of_linear(const ZR_Pixel16& p, const ZR_LinearBlendingTables& t, ZR_Pixel16& out) {
  out = {p.alpha, back(p.red, t), back(p.green, t), back(p.blue, t)};
}
inline void out_of_linear(const ZR_Pixel16& p, const ZR_LinearBlendingTables& t, ZR_Pixel8& out) {
  const auto narrow = [](i64 u) { return static_cast<u8>((u * 255 + 16384) >> 15); };
  out = {narrow(p.alpha), narrow(back(p.red, t)), narrow(back(p.green, t)), narrow(back(p.blue, t))};
}
inline void out_of_linear(const ZR_PixelFloat& p, const ZR_LinearBlendingTables& t, ZR_PixelFloat& out) {
  const f32 e = t.from_linear_gamma;
  out = {p.alpha, power(p.red, e), power(p.green, e), power(p.blue, e)};
}

// Tables of a plain gamma.
inline ZR_LinearBlendingTables gamma_tables(double gamma) {
  ZR_LinearBlendingTables t;
  for (int i = 0; i < 256; ++i) t.to_linear[i] = static_cast<u16>(std::lround(32768 * std::pow(i / 255.0, gamma)));
  for (int k = 0; k <= 4096; ++k)
    t.from_linear[k] = static_cast<u16>(std::lround(32768 * std::pow(k / 4096.0, 1 / gamma)));
  t.to_linear_gamma = static_cast<f32>(gamma);
  t.from_linear_gamma = static_cast<f32>(1 / gamma);
  return t;
}

// ------------------------------------------------------------------------------ the per-pixel function

// Under `count` opacities.
template <class Pixel>
Pixel transfer(int mode, const Pixel& src, const ZR_LinearBlendingTables* tables,
               const typename Numbers<Pixel>::Channel* opacities, int count, const Pixel& dst) {
  using N = Numbers<Pixel>;
  using V = typename N::V;
  constexpr bool byte = std::is_same_v<Pixel, ZR_Pixel8>;
  using Deep = std::conditional_t<byte, N16, N>;
  const auto deep = [](V v) -> typename Deep::V {
    if constexpr (byte)
      return widened(v);
    else
      return v;
  };
  V A = src.alpha;
  for (int i = 0; i < count; ++i)
    if (opacities[i] != N::W) A = N::mul(A, opacities[i]);
  if (A == 0 && mode != 21) return dst;
  const auto scaled = [&]<class M>(M, typename M::Pixel p, auto&& amount) {
    Worked<M> s(p);
    for (int i = 0; i < count; ++i) {
      s.a = M::mul(s.a, amount(opacities[i]));
      for (auto& c : s.rgb.c) c = M::mul(c, amount(opacities[i]));
    }
    return s.pixel();
  };
  if (tables == nullptr) {
    if (mode != 21) return kernel<N>(mode, src, A, dst);
    const Pixel s = scaled(N{}, src, [](V v) { return v; });
    return kernel<N>(mode, s, s.alpha, dst);
  }
  const auto ls = into_linear(src, *tables), ld = into_linear(dst, *tables);
  Pixel out;
  if (mode != 21) {
    out_of_linear(kernel<Deep>(mode, ls, deep(A), ld), *tables, out);
  } else {
    const auto s = scaled(Deep{}, ls, deep);
    out_of_linear(kernel<Deep>(mode, s, s.alpha, ld), *tables, out);
  }
  return out;
}

}  // namespace model
