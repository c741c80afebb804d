// One pixel through one mode: the alpha handling of each kind around the formulas of an entry.
#pragma once

#include "composite/transfer_modes.h"

namespace zr {

// A ground mode works on a destination that was faded to its ground by its own alpha, and takes the result
// back by the alpha of both layers. Rows fade and unfade whole rows with the same two functions.
template <class M, ModeKind ground>
[[gnu::always_inline]] inline auto faded(typename M::Wide d, typename M::Wide D) {
  if constexpr (ground == ModeKind::black_ground)
    return M::stored(M::mul(d, D));
  else if constexpr (ground == ModeKind::white_ground)
    return M::stored(M::inv(M::mul(M::inv(d), D)));
  else
    return M::stored(d < M::half ? d + M::mul(M::inv(D), M::half - d) : M::half + M::mul(d - M::half, D));
}

template <class M, ModeKind ground>
[[gnu::always_inline]] inline auto unfaded(typename M::Wide t, typename M::Wide R) {
  if constexpr (ground == ModeKind::black_ground)
    return M::div(t, R);
  else if constexpr (ground == ModeKind::white_ground)
    return M::inv(M::div(M::inv(t), R));
  else
    return t < M::half ? M::floored(M::half - M::div(M::half - t, R)) : M::capped(M::half + M::div(t - M::half, R));
}

template <class T, class Mode>
[[gnu::always_inline]] inline void blend_ground(const T& s, Wide<T> A, T& d) {
  using M = ModeMath<T>;
  const Wide<T> D = d.alpha;
  const auto ground = [D](Wide<T> dc) { return D == M::white ? dc : faded<M, Mode::kind>(dc, D); };
  if (A == M::white) {
    each_colour(s, d, [&](Wide<T> sc, Wide<T> dc) { return Mode::template full<M>(sc, ground(dc)); });
    d.alpha = store<T>(M::white);
  } else {
    const Wide<T> R = combined_alpha<M>(A, D);
    each_colour(s, d, [&](Wide<T> sc, Wide<T> dc) {
      const Wide<T> t = M::stored(Mode::template partial<M>(sc, A, ground(dc)));
      return R == M::white ? t : unfaded<M, Mode::kind>(t, R);
    });
    d.alpha = store<T>(R);
  }
}

// The general mix (1 - D) A s + (1 - A) D d + A D f over R; the destination is not faded first.
template <class T, class Mode>
[[gnu::always_inline]] inline void blend_weighted(const T& s, Wide<T> A, T& d) {
  using M = ModeMath<T>;
  const Wide<T> D = d.alpha;
  if (A == M::white) {
    each_colour(s, d, [&](Wide<T> sc, Wide<T> dc) { return sc + M::smul(D, Mode::template full<M>(sc, dc) - sc); });
    d.alpha = store<T>(M::white);
  } else {
    const Wide<T> R = combined_alpha<M>(A, D);
    each_colour(s, d,
                [&](Wide<T> sc, Wide<T> dc) { return M::weighted(sc, dc, Mode::template full<M>(sc, dc), A, D, R); });
    d.alpha = store<T>(R);
  }
}

template <class T, class Mode>
bool recolours(const T& s, const T& d) {
  using M = ModeMath<T>;
  if constexpr (requires { Mode::wanted(Wide<T>{}, Wide<T>{}); })
    return Mode::wanted(luma_of(colour_of<M>(s)), luma_of(colour_of<M>(d)));
  else
    return true;
}

// Mixes the mode's colour into a destination behind which the source has been composited. Alpha stays.
template <class T, class Mode>
void recolour(const T& s, Wide<T> A, T& d) {
  using M = ModeMath<T>;
  const Rgb<M> c = Mode::recoloured(colour_of<M>(s), colour_of<M>(d));
  const auto mixed = [A](Wide<T> to, Wide<T> from) {
    return store<T>(A == M::white ? to : from + M::smul(A, to - from));
  };
  d.red = mixed(c.red, d.red);
  d.green = mixed(c.green, d.green);
  d.blue = mixed(c.blue, d.blue);
}

// The source under the effective alpha A (not 0, save for AddPremul) onto d.
template <class T, class Mode>
[[gnu::always_inline]] inline void blend(const T& s, Wide<T> A, T& d) {
  constexpr ModeKind kind = Mode::kind;
  if constexpr (kind == ModeKind::black_ground || kind == ModeKind::white_ground || kind == ModeKind::grey_ground) {
    blend_ground<T, Mode>(s, A, d);
  } else if constexpr (kind == ModeKind::weighted) {
    blend_weighted<T, Mode>(s, A, d);
  } else if constexpr (kind == ModeKind::colour) {
    const bool wanted = recolours<T, Mode>(s, d);  // by the lumas as they came in
    Behind::pixel(s, A, d);
    if (wanted) recolour<T, Mode>(s, A, d);
  } else if constexpr (kind == ModeKind::alpha_only) {
    d.alpha = store<T>(Mode::alpha(colour_of<ModeMath<T>>(s), A, Wide<T>{d.alpha}));
  } else {
    Mode::pixel(s, A, d);
  }
}

// Whether opacities scale all channels of the source instead of its alpha.
template <class Mode>
inline constexpr bool scales_source = requires {
  Mode::scales_source;
};

template <class T, class Scale>
[[gnu::always_inline]] inline T scaled(const T& s, Scale&& scale) {
  return {store<T>(scale(s.alpha)), store<T>(scale(s.red)), store<T>(scale(s.green)), store<T>(scale(s.blue))};
}

}  // namespace zr
