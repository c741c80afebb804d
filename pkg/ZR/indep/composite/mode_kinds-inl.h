// One pixel through one mode: the alpha handling of each kind around the formulas of an entry.
#if defined(ZR_COMPOSITE_MODE_KINDS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_MODE_KINDS_INL_H
#undef ZR_COMPOSITE_MODE_KINDS_INL_H
#else
#define ZR_COMPOSITE_MODE_KINDS_INL_H
#endif

#include "composite/transfer_modes-inl.h"
#include "simd/formulas.h"

ZR_BEGIN_FORMULAS

// A ground mode works on a destination that was faded to its ground by its own alpha, and takes the result
// back by the alpha of both layers. Rows fade and unfade whole rows with the same two functions.
template <class M, ModeKind ground>
ZR_PURE auto faded(typename M::Wide d, typename M::Wide D) {
  if constexpr (ground == ModeKind::black_ground)
    return M::stored(M::mul(d, D));
  else if constexpr (ground == ModeKind::white_ground)
    return M::stored(M::inv(M::mul(M::inv(d), D)));
  else
    return M::stored(pick(d < M::half, d + M::mul(M::inv(D), M::half - d), M::half + M::mul(d - M::half, D)));
}

// `over` divides by R.
template <class M, ModeKind ground>
ZR_PURE auto unfaded(typename M::Wide t, auto over) {
  if constexpr (ground == ModeKind::black_ground)
    return over(t);
  else if constexpr (ground == ModeKind::white_ground)
    return M::inv(over(M::inv(t)));
  else {
    const auto away = over(M::magnitude(t - M::half));  // the same on both sides of the ground
    return pick(t < M::half, M::floored(M::half - away), M::capped(M::half + away));
  }
}

template <class Mode, class M>
ZR_PURE Px<M> blend_ground(const Px<M>& s, typename M::Wide A, const Px<M>& d) {
  using Wide = typename M::Wide;
  const Wide D = d.alpha;
  const auto ground = [D](Wide dc) ZR_FORMULA { return pick(D == M::white, dc, faded<M, Mode::kind>(dc, D)); };
  return choose(
      A == M::white,
      [&]() ZR_FORMULA {
        const auto full = [&](Wide sc, Wide dc) ZR_FORMULA { return Mode::template full<M>(sc, ground(dc)); };
        return with_alpha<M>(each_colour<M>(s, d, full), M::white);
      },
      [&]() ZR_FORMULA {
        const Wide R = combined_alpha<M>(A, D);
        const auto mixed = [&](Wide sc, Wide dc) ZR_FORMULA {
          const Wide t = M::stored(Mode::template partial<M>(sc, A, ground(dc)));
          return pick(R == M::white, t, unfaded<M, Mode::kind>(t, divisor_of<M>(R)));
        };
        return with_alpha<M>(each_colour<M>(s, d, mixed), R);
      });
}

// The general mix (1 - D) A s + (1 - A) D d + A D f over R; the destination is not faded first.
template <class Mode, class M>
ZR_PURE Px<M> blend_weighted(const Px<M>& s, typename M::Wide A, const Px<M>& d) {
  using Wide = typename M::Wide;
  const Wide D = d.alpha;
  return choose(
      A == M::white,
      [&]() ZR_FORMULA {
        const auto full = [&](Wide sc, Wide dc) ZR_FORMULA { return M::toward(sc, Mode::template full<M>(sc, dc), D); };
        return with_alpha<M>(each_colour<M>(s, d, full), M::white);
      },
      [&]() ZR_FORMULA {
        const Wide R = combined_alpha<M>(A, D);
        const auto mixed = [&](Wide sc, Wide dc)
                               ZR_FORMULA { return M::weighted(sc, dc, Mode::template full<M>(sc, dc), A, D); };
        return with_alpha<M>(divided<M>(each_colour<M>(s, d, mixed), R), R);
      });
}

// Mixes the mode's colour into a destination behind which the source has been composited. Alpha stays.
template <class Mode, class M>
ZR_PURE Px<M> recolour(const Px<M>& s, typename M::Wide A, const Px<M>& d) {
  using Wide = typename M::Wide;
  const Px<M> c = Mode::template recoloured<M>(s, d);
  const auto mixed = [A](Wide to, Wide from) ZR_FORMULA { return pick(A == M::white, to, M::toward(from, to, A)); };
  return each_colour<M>(c, d, mixed);
}

// `to` where the mode recolours at all, by the lumas of source and destination; else d.
template <class Mode, class M>
ZR_PURE Px<M> where_wanted(const Px<M>& s, const Px<M>& d, const Px<M>& to, const Px<M>& otherwise) {
  if constexpr (requires { Mode::wanted(typename M::Wide{}, typename M::Wide{}); })
    return pick(Mode::wanted(luma_of(s), luma_of(d)), to, otherwise);
  else
    return to;
}

// The source under the effective alpha A (not 0, save for AddPremul) onto d.
template <class Mode, class M>
ZR_PURE Px<M> blend(const Px<M>& s, typename M::Wide A, const Px<M>& d) {
  constexpr ModeKind kind = Mode::kind;
  if constexpr (kind == ModeKind::black_ground || kind == ModeKind::white_ground || kind == ModeKind::grey_ground) {
    return blend_ground<Mode>(s, A, d);
  } else if constexpr (kind == ModeKind::weighted) {
    return blend_weighted<Mode>(s, A, d);
  } else if constexpr (kind == ModeKind::colour) {
    const Px<M> over = Behind::pixel<M>(s, A, d);
    return where_wanted<Mode>(s, d, recolour<Mode>(s, A, over), over);  // by the lumas as they came in
  } else if constexpr (kind == ModeKind::alpha_only) {
    return with_alpha<M>(d, Mode::template alpha<M>(s, A, d.alpha));
  } else {
    return Mode::template pixel<M>(s, A, d);
  }
}

template <class M, class Mode>
ZR_PURE auto row_full(auto s, auto d) {
  if constexpr (requires { Mode::template row_full<M>(s, d); })
    return Mode::template row_full<M>(s, d);
  else
    return Mode::template full<M>(s, d);
}

// The same of a pixel in a row, where other passes see to fading, alpha unions and compositing behind.
template <class Mode, class M>
ZR_PURE Px<M> blend_in_row(const Px<M>& s, typename M::Wide A, const Px<M>& d) {
  using Wide = typename M::Wide;
  constexpr RowClass row_class = Mode::row_class;
  if constexpr (row_class == RowClass::black_ground || row_class == RowClass::white_ground ||
                row_class == RowClass::grey_ground) {
    const auto full = [&]() ZR_FORMULA {
      return each_colour<M>(s, d, [](Wide sc, Wide dc) ZR_FORMULA { return row_full<M, Mode>(sc, dc); });
    };
    const auto partial = [&]() ZR_FORMULA {
      return each_colour<M>(s, d, [A](Wide sc, Wide dc) ZR_FORMULA { return Mode::template partial<M>(sc, A, dc); });
    };
    if constexpr (requires { Mode::partial_is_full; })
      return where_all(A == M::white, full, partial);
    else
      return choose(A == M::white, full, partial);
  } else if constexpr (Mode::kind == ModeKind::colour) {
    return where_wanted<Mode>(s, d, recolour<Mode>(s, A, d), d);  // lumas are compared after the first pass
  } else {
    return blend<Mode>(s, A, d);
  }
}

// Whether opacities scale all channels of the source instead of its alpha.
template <class Mode>
inline constexpr bool scales_source = requires {
  Mode::scales_source;
};
// Whether a source that is clear changes nothing.
template <class Mode>
inline constexpr bool passes_clear =
    Mode::kind != ModeKind::alpha_only&& Mode::kind != ModeKind::copy && !scales_source<Mode>;

template <class M, class Scale>
ZR_PURE Px<M> scaled(const Px<M>& s, Scale&& scale) {
  return {M::stored(scale(s.alpha)), M::stored(scale(s.red)), M::stored(scale(s.green)), M::stored(scale(s.blue))};
}

ZR_END_FORMULAS

#endif
