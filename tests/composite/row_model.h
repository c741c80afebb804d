// A second, plain telling of one composited row for tests, on top of that of the pixel.
#pragma once

#include <ZR/composite.h>

#include <vector>

#include "composite/mode_model.h"

namespace model {

template <class Pixel>
struct RowCase {
  i32 mode, seed;
  typename Numbers<Pixel>::Channel opacity;
  bool keep_alpha;
};

inline u32 next_random(u32& x) {
  x = (x % 44488) * 48271 + (x / 44488) * 3399;
  if (x == 0) x = 0x7fffffff;
  return (x >> 7) & 0x7fff;
}

template <class N>
typename N::Pixel matte_mixed(const typename N::Pixel& s, typename N::V k, const typename N::Pixel& d) {
  using V = typename N::V;
  const V p = s.alpha * k, q = (N::W - k) * d.alpha, t = p + q;
  if (k == N::W) return s;
  if (k == 0 || t == 0) return d;
  Worked<N> sw(s), dw(d);
  for (int i = 0; i < 3; ++i) {
    const V mix = sw.rgb.c[i] * p + dw.rgb.c[i] * q;
    if constexpr (std::is_same_v<N, NF>)
      dw.rgb.c[i] = N::div(mix, t);
    else
      dw.rgb.c[i] = (mix + (t >> 1)) / t;
  }
  if constexpr (std::is_same_v<N, N8>) dw.a = (t + 128) / 255;
  if constexpr (std::is_same_v<N, N16>) dw.a = (t + 16384) / 32768;
  if constexpr (std::is_same_v<N, NF>) dw.a = t;
  return dw.pixel();
}

// The main function in stored values.
template <class N>
void main_row(const RowCase<typename N::Pixel>& c, const std::vector<typename N::Pixel>& src,
              const std::vector<typename N::Pixel>* mask, std::vector<typename N::Pixel>& dst) {
  using V = typename N::V;
  using C = typename N::Channel;
  u32 seed = static_cast<u32>(c.seed);
  for (size_t i = 0; i < dst.size(); ++i) {
    const auto& s = src[i];
    auto& d = dst[i];
    const auto covered = [&](V v) { return mask ? N::masked(v, c.opacity, (*mask)[i].alpha) : N::mul(v, c.opacity); };
    const V A = covered(s.alpha);
    const auto old = d;
    if (c.mode == -2) {
      d = matte_mixed<N>(s, mask ? V((*mask)[i].alpha) : N::W, d);
      continue;
    }
    if (c.mode == -3 || c.mode == 0) {
      d = s;
      d.alpha = c.keep_alpha ? old.alpha : static_cast<C>(A);
      continue;
    }
    if (c.mode == 3) {
      bool wins = A >= N::W;
      if (!wins && A != 0) {
        const u32 r = next_random(seed);
        if constexpr (std::is_same_v<N, N8>) wins = (r & 255) <= A;
        if constexpr (std::is_same_v<N, N16>) wins = r < A;
        if constexpr (std::is_same_v<N, NF>) wins = static_cast<f32>(r) / 32768 < A;
      }
      ++seed;
      if (wins) d = s, d.alpha = c.keep_alpha ? old.alpha : static_cast<C>(N::W);
      continue;
    }
    const Kind kind = kind_of(c.mode);
    if (kind == add_premul) {
      Worked<N> scaled(s);
      scaled.a = A;
      for (V& v : scaled.rgb.c) v = covered(v);
      d = kernel<N>(21, scaled.pixel(), A, d);
    } else if (kind == alpha) {
      d = kernel<N>(c.mode, s, A, d);
    } else if (A == 0) {
    } else if (kind == black || kind == white || kind == grey) {
      Worked<N> w(d);
      const Worked<N> sw(s);
      for (int k = 0; k < 3; ++k) {
        V& v = w.rgb.c[k];
        if (A != N::W)
          v = N::partial(c.mode, sw.rgb.c[k], A, v);
        else
          v = c.mode == 5 ? N::mul(sw.rgb.c[k], v) : N::full(c.mode, sw.rgb.c[k], v);
      }
      d = w.pixel();
    } else if (kind == colour) {
      Worked<N> w(d);
      const Worked<N> sw(s);
      mix_colour(c.mode, sw, A, sw.rgb.luma(), colour_wanted(c.mode, sw, w), w);
      d = w.pixel();
    } else {
      d = kernel<N>(c.mode, s, A, d);
      if (c.mode == 1 && c.keep_alpha) d.alpha = old.alpha;
    }
  }
}

// The main function, in linear light when there are tables.
template <class Pixel>
void any_main_row(const RowCase<Pixel>& c, const ZR_LinearBlendingTables* tables, const std::vector<Pixel>& src,
                  const std::vector<Pixel>* mask, std::vector<Pixel>& dst) {
  using N = Numbers<Pixel>;
  if (tables == nullptr) return main_row<N>(c, src, mask, dst);
  constexpr bool byte = std::is_same_v<Pixel, ZR_Pixel8>;
  using Deep = std::conditional_t<byte, N16, N>;
  using DeepPixel = typename Deep::Pixel;
  const auto all = [&](const std::vector<Pixel>& row) {
    std::vector<DeepPixel> deep;
    for (const Pixel& p : row) deep.push_back(into_linear(p, *tables));
    return deep;
  };
  RowCase<DeepPixel> deep{c.mode, c.seed, {}, c.keep_alpha};
  if constexpr (byte)
    deep.opacity = static_cast<u16>(widened(c.opacity));
  else
    deep.opacity = c.opacity;
  std::vector<DeepPixel> result = all(dst), deep_mask;
  if (mask) deep_mask = all(*mask);
  main_row<Deep>(deep, all(src), mask ? &deep_mask : nullptr, result);
  for (size_t i = 0; i < dst.size(); ++i) out_of_linear(result[i], *tables, dst[i]);
}

// The whole pipeline.
template <class Pixel>
void composite_row(const RowCase<Pixel>& c, const ZR_LinearBlendingTables* tables, const std::vector<Pixel>& src,
                   const std::vector<Pixel>* mask, std::vector<Pixel>& dst) {
  using N = Numbers<Pixel>;
  using V = typename N::V;
  using C = typename N::Channel;
  const Kind kind = c.mode < 0 ? nothing : kind_of(c.mode);
  const bool ground = kind == black || kind == white || kind == grey;
  const std::vector<Pixel> before = dst;
  const auto colours = [&](auto&& change) {
    for (Pixel& d : dst) {
      Worked<N> w(d);
      for (V& v : w.rgb.c) v = change(v, w.a);
      d = w.pixel();
    }
  };
  if (ground) colours([&](V v, V a) { return fade<N>(kind, v, a); });
  if (kind == colour) any_main_row<Pixel>({1, c.seed, c.opacity, c.keep_alpha}, tables, src, mask, dst);
  any_main_row(c, tables, src, mask, dst);
  if (ground) {
    for (size_t i = 0; i < dst.size(); ++i) {
      if (std::is_same_v<N, N8> && c.opacity == 0) break;
      V A = N::mul(src[i].alpha, c.opacity);
      if (mask) A = N::mul((*mask)[i].alpha, A);
      dst[i].alpha = static_cast<C>(N::inv(N::mul(N::inv(dst[i].alpha), N::inv(A))));
    }
    colours([&](V v, V a) { return unfade<N>(kind, v, a); });
  }
  const bool may_keep =
      ground || kind == colour || kind == front || kind == weighted || kind == add_premul || kind == alpha_add;
  if (may_keep && c.keep_alpha)
    for (size_t i = 0; i < dst.size(); ++i) dst[i].alpha = before[i].alpha;
}

}  // namespace model
