// The transfer modes told a second time for tests: a whole pixel, also in linear light and under opacities.
#pragma once

#include "composite/formula_model.h"

namespace model {

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
