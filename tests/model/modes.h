// One pixel under each transfer mode.
#pragma once

#include "model/depths.h"

namespace model {

enum class Kind { none, copy, over, row_only, black, white, grey, colour, alpha, special, weighted };
// clang-format off
enum Mode : i32 {
  copy_fast = -3, matte_mix = -2, copy = 0, behind, in_front, dissolve, add, multiply, screen, overlay, soft_light,
  hard_light, darken, lighten, difference, hue, saturation, color, luminosity, multiply_alpha, multiply_alpha_luma,
  multiply_not_alpha, multiply_not_alpha_luma, add_premul, alpha_add, color_dodge, color_burn, exclusion,
  difference_w, color_dodge_w, color_burn_w, linear_dodge, linear_burn, linear_light, vivid_light, pin_light,
  hard_mix, lighter_color, darker_color, subtract, divide, blue_threshold, key_protect
};
inline constexpr Kind kinds[] = {  // from -3 on
  Kind::copy, Kind::row_only, Kind::none, Kind::copy, Kind::over, Kind::over, Kind::row_only, Kind::black,
  Kind::white, Kind::black, Kind::grey, Kind::grey, Kind::grey, Kind::white, Kind::black, Kind::black,
  Kind::colour, Kind::colour, Kind::colour, Kind::colour, Kind::alpha, Kind::alpha, Kind::alpha, Kind::alpha,
  Kind::special, Kind::special, Kind::black, Kind::white, Kind::black, Kind::weighted, Kind::weighted,
  Kind::weighted, Kind::weighted, Kind::weighted, Kind::weighted, Kind::weighted, Kind::weighted, Kind::weighted,
  Kind::colour, Kind::colour, Kind::weighted, Kind::weighted, Kind::special, Kind::special};
// clang-format on
inline Kind kind_of(i32 mode) { return mode >= copy_fast && mode <= key_protect ? kinds[mode + 3] : Kind::none; }

// Equal values and NaN give the second.
template <class V>
V least(V a, V b) {
  return a < b ? a : b;
}
template <class V>
V most(V a, V b) {
  return a > b ? a : b;
}
template <class D>
typename D::V combined_alpha(typename D::V a, typename D::V d) {
  return D::white - D::mul(D::inv(a), D::inv(d));
}

// n / r that reaches white as soon as n reaches r.
template <class D>
typename D::V full_at(typename D::V n, typename D::V r) {
  return n >= r ? D::white : D::div(n, r);
}

// Twice s and twice s less white, as the lower and the upper half of the two-sided modes take them.
template <class D>
typename D::V twice(typename D::V s) {
  if constexpr (is_eight<D>)
    return (2 * s) & 255;
  else
    return 2 * s;
}
template <class D>
typename D::V twice_less_white(typename D::V s) {
  if constexpr (is_eight<D>)
    return (2 * s) & 254;
  else
    return 2 * s - D::white;
}

// A ground mode where the source is opaque. `in_row`: multiply is written another way in rows.
template <class D>
typename D::V opaque(i32 mode, typename D::V s, typename D::V d, bool in_row) {
  constexpr auto W = D::white, H = D::half;
  switch (mode) {
    case add: return is_float<D> ? s + d : least<typename D::V>(s + d, W);
    case multiply: return in_row ? D::mul(s, d) : d - D::mul(d, D::inv(s));
    case screen: return W - D::mul(D::inv(s), D::inv(d));
    case overlay: return d < H ? 2 * D::mul(s, d) : W - D::mul(D::inv(s), 2 * D::inv(d));
    case soft_light:
      if constexpr (is_float<D>)
        return d + (2 * s - 1) * D::soft(s >= H, d);
      else
        return s < H ? d - D::mul(W - 2 * s, D::soft(false, d)) : d + D::mul(2 * s - W, D::soft(true, d));
    case hard_light: return s < H ? d - D::mul(d, W - twice<D>(s)) : d + D::mul(D::inv(d), twice_less_white<D>(s));
    case darken: return least(s, d);
    case lighten: return most(s, d);
    case difference: return std::abs(s - d);
    case color_dodge: return full_at<D>(d, D::inv(s));
    case color_burn: return D::inv(d) >= s ? 0 : W - D::div(D::inv(d), s);
    default: return s + d - 2 * D::mul(s, d);  // exclusion
  }
}

// The same where the source has alpha A.
template <class D>
typename D::V partial(i32 mode, typename D::V s, typename D::V A, typename D::V d) {
  constexpr auto W = D::white, H = D::half;
  switch (mode) {
    case add: return is_float<D> ? D::mul(s, A) + d : least<typename D::V>(D::mul(s, A) + d, W);
    case multiply: return d - D::mul(D::mul(d, D::inv(s)), A);
    case screen: return W - D::mul(D::inv(D::mul(s, A)), D::inv(d));
    case overlay: return d + D::smul(A, opaque<D>(overlay, s, d, false) - d);
    case soft_light:
      if constexpr (is_float<D>)
        return d + (2 * s - 1) * (D::soft(s >= H, d) * A);
      else
        return s < H ? d - D::mul(A, D::mul(W - 2 * s, D::soft(false, d)))
                     : d + D::mul(A, D::mul(2 * s - W, D::soft(true, d)));
    case hard_light:
      return s < H ? d - D::mul(D::mul(d, W - twice<D>(s)), A)
                   : d + D::mul(D::mul(D::inv(d), twice_less_white<D>(s)), A);
    case darken: return s < d ? d - D::mul(A, d - s) : d;
    case lighten: return s > d ? d + D::mul(A, s - d) : d;
    case difference: return std::abs(D::mul(s, A) - d);
    case color_dodge: return full_at<D>(d, D::inv(D::mul(s, A)));
    case color_burn: return opaque<D>(color_burn, D::inv(D::mul(D::inv(s), A)), d, false);
    default: return d + D::smul(A, s - D::mul(s, d) - D::mul(s, d));  // exclusion
  }
}

// A weighted mode of stored values.
template <class D>
typename D::V weighted(i32 mode, typename D::V s, typename D::V d) {
  using V = typename D::V;
  constexpr V W = D::white, H = D::half;
  switch (mode) {
    case difference_w: return std::abs(s - d);
    case color_dodge_w: return d == 0 ? 0 : is_float<D> && D::inv(s) == 0 ? W : full_at<D>(d, D::inv(s));
    case color_burn_w: return s == 0 && d == W ? W : D::inv(d) >= s ? 0 : D::inv(D::div(D::inv(d), s));
    case linear_dodge: return is_float<D> ? s + d : least<V>(s + d, W);
    case linear_burn: return s + d - W < 0 ? 0 : s + d - W;
    case linear_light:
      if constexpr (is_float<D>)
        return 2 * s - 1 + d;
      else
        return most(least(2 * s - (is_eight<D> ? 256 : 32768) + d, W), 0);
    case vivid_light:
      if (s == H) return d;
      if constexpr (is_eight<D>) {
        return s < H ? 255 - D::div(255 - d, (s * 255 + 64) >> 7) : D::div(d, 255 - D::div(s - 128, 127));
      } else {
        if (s < H) return s == 0 || D::inv(d) >= 2 * s ? 0 : D::inv(D::div(D::inv(d), 2 * s));
        if (s == W) return W;
        if constexpr (is_float<D>)
          return full_at<D>(d, 1 - (s - 0.5f) * 2);
        else
          return full_at<D>(d, 65536 - 2 * s);
      }
    case pin_light:
      if (s == H) return d;
      if constexpr (is_eight<D>)
        return s < H ? least((s * 255 + 64) >> 7, d) : most(D::div(s - 128, 127), d);
      else
        return s < H ? least(2 * s, d) : most<V>(is_float<D> ? (s - H) * 2 : 2 * s - W, d);
    case hard_mix:
      if constexpr (is_float<D>) {
        const f32 w = (1 - s) * 0.99999f, t = d - w;
        return d <= w ? 0 : t >= 1.001358e-5f ? 1 : t / 1.001358e-5f;
      } else {
        const V w = is_eight<D> ? Eight::mul(254, D::inv(s)) : (D::inv(s) * 32767 + 16384) >> 15;
        return d > w ? W : 0;
      }
    case subtract: return is_float<D> ? d - s : d < s ? 0 : d - s;
    default:  // divide
      if constexpr (is_float<D>)
        return std::abs(s) > 1.8189894e-6f ? D::div(d, s) : d / 1.8189894e-6f;
      else
        return d == 0 ? 0 : D::div(d, s);
  }
}

// To the ground of a mode by the destination's alpha, and back by the combined alpha.
template <class D>
typename D::V fade(Kind kind, typename D::V d, typename D::V a) {
  constexpr auto H = D::half;
  if (kind == Kind::black) return D::mul(d, a);
  if (kind == Kind::white) return D::inv(D::mul(D::inv(d), a));
  return d < H ? d + D::mul(D::inv(a), H - d) : H + D::mul(d - H, a);
}
template <class D>
typename D::V unfade(Kind kind, typename D::V t, typename D::V a) {
  using V = typename D::V;
  constexpr V H = D::half, W = D::white;
  if (kind == Kind::black) return D::div(t, a);
  if (kind == Kind::white) return D::inv(D::div(D::inv(t), a));
  const V w = t < H ? D::div(H - t, a) : D::div(t - H, a);
  if constexpr (is_float<D>)
    return t < H ? H - w : H + w;
  else
    return t < H ? (w > H ? 0 : H - w) : least(H + w, W);
}

template <class D>
void composite_behind(const Px<D>& s, typename D::V A, Px<D>& d) {
  if (d.a == D::white) return;
  const auto R = combined_alpha<D>(A, d.a);
  for (int i = 0; i < 3; ++i) {
    const auto t = D::mul(s.c[i], A);
    auto c = t;
    if constexpr (is_eight<D>)
      c = d.c[i] >= t ? t + D::mul(d.c[i] - t, d.a) : t - D::mul(t - d.c[i], d.a);
    else
      c = t + D::smul(d.a, d.c[i] - t);
    if constexpr (!is_float<D>) c = static_cast<typename D::Channel>(c);
    d.c[i] = D::div(c, R);
  }
  d.a = R;
}

// ------------------------------------------------------------------------------ colour modes

template <class D>
typename D::V spread(const Px<D>& p) {
  return most(most(p.c[0], p.c[1]), p.c[2]) - least(least(p.c[0], p.c[1]), p.c[2]);
}
template <class D>
void set_saturation(Px<D>& p, typename D::V S) {
  auto &r = p.c[0], &g = p.c[1], &b = p.c[2];
  typename D::V *high, *mid, *low;
  const auto order = [&](auto& x, auto& y, auto& z) { high = &x, mid = &y, low = &z; };
  if (r > g) {
    if (g > b)
      order(r, g, b);
    else if (r > b)
      order(r, b, g);
    else
      order(b, r, g);
  } else if (r > b)
    order(g, r, b);
  else if (g > b)
    order(g, b, r);
  else
    order(b, g, r);
  const auto w = *high - *low;
  *mid = *mid - *low;
  *high = w;
  if (w != 0) {
    *mid = *mid * S / w;
    *high = S;
  }
  *low = 0;
}
template <class D>
void set_luma(Px<D>& p, typename D::V L) {
  const auto t = L - luma(p);
  for (auto& c : p.c) c += t;
  const auto m = least(least(p.c[0], p.c[1]), p.c[2]);
  if (m < 0 && L - m != 0)
    for (auto& c : p.c) c = L + (c - L) * L / (L - m);
  const auto x = most(most(p.c[0], p.c[1]), p.c[2]);
  if (x > D::white && x - L != 0)
    for (auto& c : p.c) c = L + (c - L) * (D::white - L) / (x - L);
}
// p is the destination with the source already behind it; `destination_luma` is what the two modes that
// choose the lighter or darker pixel compare with.
template <class D>
void mix_colour(i32 mode, const Px<D>& s, typename D::V A, typename D::V destination_luma, Px<D>& p) {
  Px<D> c = s;
  switch (mode) {
    case hue: set_saturation(c, spread(p)), set_luma(c, luma(p)); break;
    case saturation: c = p, set_saturation(c, spread(s)), set_luma(c, luma(p)); break;
    case color: set_luma(c, luma(p)); break;
    case luminosity: c = p, set_luma(c, luma(s)); break;
    case lighter_color:
      if (!(luma(s) > destination_luma)) return;
      break;
    default:
      if (!(luma(s) < destination_luma)) return;
      break;
  }
  for (int i = 0; i < 3; ++i) p.c[i] = A == D::white ? c.c[i] : p.c[i] + D::smul(A, c.c[i] - p.c[i]);
}

// ----------------------------------------------------------------------------- other kinds

template <class D>
bool reserved(const Px<D>& d) {
  constexpr auto W = D::white;
  const typename D::V high = is_eight<D> ? 191 : W * 3 / 4, low = is_eight<D> ? 64 : W / 4;
  using V = typename D::V;
  const auto is = [&d](V r, V g, V b) { return d.c[0] == r && d.c[1] == g && d.c[2] == b; };
  return is(W, 0, 0) || is(0, W, 0) || is(0, 0, high) || is(0, 0, low);
}
template <class D>
void add_premultiplied(const Px<D>& s, Px<D>& d) {
  const auto K = D::mul(D::inv(s.a), d.a), R = combined_alpha<D>(s.a, d.a);
  for (int i = 0; i < 3; ++i) {
    auto c = s.c[i] + D::mul(d.c[i], K);
    if (!is_float<D>) c = least<typename D::V>(c, D::white);
    d.c[i] = D::div(c, R);
  }
  d.a = R;
}
template <class D>
void alpha_only(i32 mode, const Px<D>& s, typename D::V A, Px<D>& d) {
  const bool by_luma = mode == multiply_alpha_luma || mode == multiply_not_alpha_luma;
  auto t = by_luma ? D::mul(luma(s), A) : A;
  if (mode == multiply_not_alpha || mode == multiply_not_alpha_luma) t = D::inv(t);
  d.a = D::mul(d.a, t);
  if (is_float<D> && by_luma) d.a = d.a > 1 ? 1 : d.a < static_cast<typename D::V>(1e-16f) ? 0 : d.a;
}
template <class D>
void weigh(i32 mode, const Px<D>& s, typename D::V A, Px<D>& d) {
  constexpr auto W = D::white;
  const auto a = d.a, R = combined_alpha<D>(A, a), AD = D::mul(A, a);
  for (int i = 0; i < 3; ++i) {
    const auto sc = s.c[i], dc = d.c[i], f = weighted<D>(mode, sc, dc);
    if (A == W) {
      d.c[i] = sc + D::smul(a, f - sc);
    } else if constexpr (is_float<D>) {
      d.c[i] = D::div(((f - sc - dc) * a + sc) * A + a * dc, R);
    } else {
      const auto n = D::mul(A, sc) + D::mul(a, dc) - D::mul(dc, AD) - (D::mul(sc, AD) - D::mul(AD, f));
      d.c[i] = D::div(static_cast<typename D::Channel>(n), R);
    }
  }
  d.a = A == W ? W : R;
}

// A pixel with alpha A that is not zero. Add-premultiplied wants s scaled by the caller.
template <class D>
void kernel(i32 mode, const Px<D>& s, typename D::V A, Px<D>& d) {
  constexpr auto W = D::white;
  const Kind kind = kind_of(mode);
  const auto R = combined_alpha<D>(A, d.a);
  switch (kind) {
    case Kind::copy: d = s, d.a = A; break;
    case Kind::over:
      if (mode == behind) {
        composite_behind(s, A, d);
      } else if (A == W || d.a == 0) {
        const auto alpha = A == W ? s.a : A;
        d = s, d.a = alpha;
      } else {
        for (int i = 0; i < 3; ++i) {
          const auto t = D::mul(d.c[i], d.a);
          d.c[i] = D::div(t + D::smul(A, s.c[i] - t), R);
        }
        d.a = R;
      }
      break;
    case Kind::black:
    case Kind::white:
    case Kind::grey:
      for (int i = 0; i < 3; ++i) {
        const auto ground = d.a == W ? d.c[i] : fade<D>(kind, d.c[i], d.a);
        if (A == W) {
          d.c[i] = opaque<D>(mode, s.c[i], ground, false);
        } else {
          const auto t = partial<D>(mode, s.c[i], A, ground);
          d.c[i] = R == W ? t : unfade<D>(kind, t, R);
        }
      }
      d.a = A == W ? W : R;
      break;
    case Kind::colour: {
      const auto before = luma(d);
      composite_behind(s, A, d);
      mix_colour(mode, s, A, before, d);
      break;
    }
    case Kind::alpha: alpha_only(mode, s, A, d); break;
    case Kind::weighted: weigh(mode, s, A, d); break;
    case Kind::special:
      if (mode == add_premul) {
        add_premultiplied(s, d);
      } else if (mode == blue_threshold) {
        if (A >= D::half) d.c[2] = s.c[2], d.a = W;
      } else if (mode == key_protect) {
        if (!reserved(d)) d = s;
      } else if (A == W) {
        d = s, d.a = W;
      } else if (const auto S = A + d.a; S >= W) {
        for (int i = 0; i < 3; ++i) d.c[i] = D::mul(s.c[i], A) + D::mul(d.c[i], D::inv(A));
        d.a = W;
      } else {
        for (int i = 0; i < 3; ++i) d.c[i] = D::div(D::mul(s.c[i], A) + D::mul(d.c[i], d.a), S);
        d.a = S;
      }
      break;
    default: break;
  }
  d = stored(d);
}

// The per-pixel function of a mode, with none, one or two opacities and with or without linear light.
template <class D>
void transfer_pixel(i32 mode, Px<D> s, const ZR_LinearBlendingTables* tables, const std::vector<typename D::V>& opacity,
                    Px<D>& d) {
  auto A = s.a;
  for (const auto o : opacity)
    if (o != D::white) A = D::mul(A, o);
  if (A == 0 && mode != add_premul) return;
  const auto run = [mode]<class E>(Px<E> source, typename E::V alpha, std::vector<typename E::V> factors,
                                   Px<E>& target) {
    if (mode == add_premul)
      for (const auto o : factors)
        if (o != E::white)
          source = {E::mul(source.a, o), {E::mul(source.c[0], o), E::mul(source.c[1], o), E::mul(source.c[2], o)}};
    kernel(mode, source, alpha, target);
  };
  if (tables == nullptr) {
    run(s, A, opacity, d);
    return;
  }
  using E = Linear<D>;
  std::vector<typename E::V> factors;
  for (const auto o : opacity) factors.push_back(alpha_into<D>(o));
  Px<E> target = into_linear(*tables, d);
  run(into_linear(*tables, s), alpha_into<D>(A), factors, target);
  d = stored(from_linear<D>(*tables, target));
}

}  // namespace model
