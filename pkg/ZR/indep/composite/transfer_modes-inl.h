// The transfer modes: each is one entry with its number, its kind and its formulas, told once for all depths.
//
// From an entry come its per-pixel functions, its row functions with and without mask, the forms in linear
// light, its name in text and its class in the row pipeline. To add a mode, add its number to
// <ZR/transfer_mode.h>, an entry here and a place in AllModes.
//
// Formulas are over M = ModeMath<T>: s source, d destination (of ground modes: faded to its ground), A the
// effective alpha of the source. full(s, d) is the formula under a white A, partial(s, A, d) under a lesser
// one, and where it comes to the same under a white A the entry says partial_is_full. Row formulas that round another
// way than the pixel's have a row_full.
#if defined(ZR_COMPOSITE_TRANSFER_MODES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_TRANSFER_MODES_INL_H
#undef ZR_COMPOSITE_TRANSFER_MODES_INL_H
#else
#define ZR_COMPOSITE_TRANSFER_MODES_INL_H
#endif

#include <tuple>

#include "composite/colour_modes-inl.h"
#include "composite/mode_entry-inl.h"
#include "simd/formulas.h"

ZR_BEGIN_FORMULAS

// ------------------------------------------------------------------------------ whole pixels

// The colours of s and d through change(s, d), as they come back from channels; alpha stays that of d.
template <class M, class Change>
ZR_PURE Px<M> each_colour(const Px<M>& s, const Px<M>& d, Change&& change) {
  return {d.alpha, M::stored(change(s.red, d.red)), M::stored(change(s.green, d.green)),
          M::stored(change(s.blue, d.blue))};
}
template <class M>
ZR_PURE Px<M> with_alpha(const Px<M>& p, typename M::Wide alpha) {
  return {M::stored(alpha), p.red, p.green, p.blue};
}

// The alpha of two layers.
template <class M>
ZR_PURE auto combined_alpha(typename M::Wide A, typename M::Wide D) {
  return M::white - M::mul(M::inv(A), M::inv(D));
}

struct Copy : Mode<XferCopy, ModeKind::copy> {
  template <class M>
  static ZR_PURE Px<M> pixel(const Px<M>& s, typename M::Wide A, const Px<M>&) {
    return with_alpha<M>(s, A);
  }
};

struct CopyFast : Mode<XferCopyFast, ModeKind::row_only> {};
struct MatteMix : Mode<XferMatteMix, ModeKind::row_only> {};
struct Dissolve : Mode<XferDissolve, ModeKind::row_only> {
  template <class M>
  static ZR_PURE Px<M> pixel(const Px<M>&, typename M::Wide, const Px<M>& d) {
    return d;  // one pixel has no place in a row to draw lots for
  }
};

struct Behind : Mode<XferBehind, ModeKind::over> {
  template <class M>
  static ZR_PURE Px<M> pixel(const Px<M>& s, typename M::Wide A, const Px<M>& d) {
    using Wide = typename M::Wide;
    const Wide D = d.alpha;
    return choose(
        D == M::white, [&]() ZR_FORMULA { return d; },
        [&]() ZR_FORMULA {
          const Wide R = combined_alpha<M>(A, D);
          const auto mixed = [&](Wide sc, Wide dc) ZR_FORMULA { return M::drawn(M::mul(sc, A), dc, D); };
          return with_alpha<M>(divided<M>(each_colour<M>(s, d, mixed), R), R);
        });
  }
};

struct InFront : Mode<XferInFront, ModeKind::over, RowClass::self_contained> {
  template <class M>
  static ZR_PURE Px<M> pixel(const Px<M>& s, typename M::Wide A, const Px<M>& d) {
    using Wide = typename M::Wide;
    const Wide D = d.alpha;
    return choose(
        A == M::white, [&]() ZR_FORMULA { return s; },
        [&]() ZR_FORMULA {
          return choose(
              D == 0, [&]() ZR_FORMULA { return with_alpha<M>(s, A); },  // without a rounding
              [&]() ZR_FORMULA {
                const Wide R = combined_alpha<M>(A, D);
                const auto mixed = [&](Wide sc, Wide dc) ZR_FORMULA { return M::toward(M::mul(dc, D), sc, A); };
                return with_alpha<M>(divided<M>(each_colour<M>(s, d, mixed), R), R);
              });
        });
  }
};

// The source as premultiplied: opacities scale all its channels before it comes here, A is its alpha after
// that, and alpha 0 still adds the colour.
struct AddPremul : Mode<XferAddPremul, ModeKind::special, RowClass::self_contained> {
  static constexpr bool scales_source = true;
  template <class M>
  static ZR_PURE Px<M> pixel(const Px<M>& s, typename M::Wide A, const Px<M>& d) {
    using Wide = typename M::Wide;
    const Wide D = d.alpha, K = M::mul(M::inv(A), D);
    const Wide R = combined_alpha<M>(A, D);
    const auto sum = [&](Wide sc, Wide dc) ZR_FORMULA { return M::capped(sc + M::mul(dc, K)); };
    return with_alpha<M>(divided<M>(each_colour<M>(s, d, sum), R), R);
  }
};

// Alphas add, for edges that must sum to full coverage.
struct AlphaAdd : Mode<XferAlphaAdd, ModeKind::special, RowClass::self_contained> {
  template <class M>
  static ZR_PURE Px<M> pixel(const Px<M>& s, typename M::Wide A, const Px<M>& d) {
    using Wide = typename M::Wide;
    const Wide D = d.alpha, sum = A + D;
    return choose(
        A == M::white, [&]() ZR_FORMULA { return with_alpha<M>(s, M::white); },
        [&]() ZR_FORMULA {
          return choose(
              sum >= M::white,
              [&]() ZR_FORMULA {
                const auto mixed = [&](Wide sc, Wide dc) ZR_FORMULA { return M::mul(sc, A) + M::mul(dc, M::inv(A)); };
                return with_alpha<M>(each_colour<M>(s, d, mixed), M::white);
              },
              [&]() ZR_FORMULA {
                const auto mixed = [&](Wide sc, Wide dc) ZR_FORMULA { return M::mul(sc, A) + M::mul(dc, D); };
                return with_alpha<M>(divided<M>(each_colour<M>(s, d, mixed), sum), sum);
              });
        });
  }
};

struct BlueThreshold : Mode<XferBlueThreshold, ModeKind::special> {
  template <class M>
  static ZR_PURE Px<M> pixel(const Px<M>& s, typename M::Wide A, const Px<M>& d) {
    return pick(A >= M::half, Px<M>{M::white, d.red, d.green, s.blue}, d);  // not NaN
  }
};

// Four marker colours of the destination are kept; all else takes the source as it is stored.
struct KeyProtect : Mode<XferKeyProtect, ModeKind::special> {
  template <class M>
  static ZR_PURE Px<M> pixel(const Px<M>& s, typename M::Wide, const Px<M>& d) {
    const auto no_red = d.red == 0, no_green = d.green == 0, no_blue = d.blue == 0;
    const auto marker = (d.red == M::white && no_green && no_blue) || (no_red && d.green == M::white && no_blue) ||
                        (no_red && no_green && (d.blue == M::marker_high || d.blue == M::marker_low));
    return pick(marker, d, s);
  }
};

// ------------------------------------------------------------------------------ on a black ground

struct Add : Mode<XferAdd, ModeKind::black_ground> {
  static constexpr bool partial_is_full = true;
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return M::capped(s + d);
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    return full<M>(M::mul(s, A), d);
  }
};

struct Screen : Mode<XferScreen, ModeKind::black_ground> {
  static constexpr bool partial_is_full = true;
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return M::white - M::mul(M::inv(s), M::inv(d));
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    return full<M>(M::mul(s, A), d);
  }
};

struct Lighten : Mode<XferLighten, ModeKind::black_ground> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return pick(s > d, s, d);
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    return pick(s > d, d + M::mul(A, s - d), d);
  }
};

struct Difference : Mode<XferDifference, ModeKind::black_ground> {
  static constexpr bool partial_is_full = true;
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return M::magnitude(s - d);
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    return full<M>(M::mul(s, A), d);
  }
};

struct ColorDodge : Mode<XferColorDodge, ModeKind::black_ground> {
  static constexpr bool partial_is_full = true;
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    const auto w = M::inv(s);
    return M::fraction(d, w);
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    return full<M>(M::mul(s, A), d);
  }
};

struct Exclusion : Mode<XferExclusion, ModeKind::black_ground> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return s + d - 2 * M::mul(s, d);
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    const auto product = M::mul(s, d);
    return d + M::smul(A, s - product - product);
  }
};

// ------------------------------------------------------------------------------ on a white ground

struct Multiply : Mode<XferMultiply, ModeKind::white_ground> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return d - M::mul(d, M::inv(s));
  }
  template <class M>
  static ZR_PURE auto row_full(auto s, auto d) {
    return M::mul(s, d);
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    return d - M::mul(M::mul(d, M::inv(s)), A);
  }
};

struct Darken : Mode<XferDarken, ModeKind::white_ground> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return pick(s < d, s, d);
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    return pick(s < d, d - M::mul(A, d - s), d);
  }
};

struct ColorBurn : Mode<XferColorBurn, ModeKind::white_ground> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    const auto w = M::inv(d);
    return M::white - M::fraction(w, s);
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    return full<M>(M::inv(M::mul(M::inv(s), A)), d);
  }
};

// ------------------------------------------------------------------------------ on a grey ground

struct Overlay : Mode<XferOverlay, ModeKind::grey_ground> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return pick(d < M::half, 2 * M::mul(s, d), M::white - M::mul(M::inv(s), 2 * M::inv(d)));
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    return M::toward(d, full<M>(s, d), A);
  }
};

struct SoftLight : Mode<XferSoftLight, ModeKind::grey_ground> {
  static constexpr bool partial_is_full = true;
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    const auto dark = s < M::half;
    const auto reach = M::soft(dark, d);
    return M::moved(dark, d, 2 * s, [&](auto k) ZR_FORMULA { return M::mul(k, reach); });
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    const auto dark = s < M::half;
    const auto reach = M::soft(dark, d);
    return M::moved(dark, d, 2 * s, [&](auto k) ZR_FORMULA { return M::soft_weight(k, reach, A); });
  }
};

struct HardLight : Mode<XferHardLight, ModeKind::grey_ground> {
  static constexpr bool partial_is_full = true;
  // Twice the half is 256 at 8 bits: a white source counts as 254 there, not 255.
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return pick(s < M::half, d - M::mul(d, M::inv(2 * s)), d + M::mul(M::inv(d), 2 * s - 2 * M::half));
  }
  template <class M>
  static ZR_PURE auto partial(auto s, auto A, auto d) {
    return pick(s < M::half, d - M::mul(M::mul(d, M::inv(2 * s)), A),
                d + M::mul(M::mul(M::inv(d), 2 * s - 2 * M::half), A));
  }
};
#ifndef ZR_IN_LANES
static_assert(HardLight::full<ModeMath<ZR_Pixel8>>(255, 0) == 254, "8-bit doubling drops the low bit");
#endif

// ------------------------------------------------------------------------------ weighted by both alphas

struct DifferenceW : Mode<XferDifferenceW, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return M::magnitude(s - d);
  }
};

// Black stays black, also under white.
struct ColorDodgeW : Mode<XferColorDodgeW, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return pick(d == 0, 0, ColorDodge::full<M>(s, d));
  }
};

// White stays white, also under black.
struct ColorBurnW : Mode<XferColorBurnW, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return pick(s == 0 && d == M::white, M::white, ColorBurn::full<M>(s, d));
  }
};

struct LinearDodge : Mode<XferLinearDodge, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return M::capped(s + d);
  }
};

struct LinearBurn : Mode<XferLinearBurn, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    const auto sum = s + d - M::white;
    return pick(sum < 0, 0, sum);  // float is clamped too
  }
};

struct LinearLight : Mode<XferLinearLight, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return M::capped(M::floored(2 * s - 2 * M::half + d));
  }
};

struct VividLight : Mode<XferVividLight, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return pick(s < M::half, low<M>(s, d), pick(s > M::half, high<M>(s, d), d));
  }

 private:
  template <class M>
  static ZR_PURE auto low(auto s, auto d) {
    return pick(s == 0, 0, ColorBurn::full<M>(M::stretched_low(s), d));
  }
  template <class M>
  static ZR_PURE auto high(auto s, auto d) {
    return pick(s == M::white, M::white, ColorDodge::full<M>(M::stretched_high(s), d));
  }
};

struct PinLight : Mode<XferPinLight, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return pick(s < M::half, Darken::full<M>(M::stretched_low(s), d),
                pick(s > M::half, Lighten::full<M>(M::stretched_high(s), d), d));
  }
};

struct HardMix : Mode<XferHardMix, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return M::hard_mix(s, d);
  }
};

struct Subtract : Mode<XferSubtract, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return M::floored(d - s);
  }
};

struct Divide : Mode<XferDivide, ModeKind::weighted> {
  template <class M>
  static ZR_PURE auto full(auto s, auto d) {
    return M::quotient(d, s);
  }
};

// ------------------------------------------------------------------------------ the list

using AllModes =
    std::tuple<CopyFast, MatteMix, Copy, Behind, InFront, Dissolve, Add, Multiply, Screen, Overlay, SoftLight,
               HardLight, Darken, Lighten, Difference, Hue, Saturation, Color, Luminosity, MultiplyAlpha,
               MultiplyAlphaLuma, MultiplyNotAlpha, MultiplyNotAlphaLuma, AddPremul, AlphaAdd, ColorDodge, ColorBurn,
               Exclusion, DifferenceW, ColorDodgeW, ColorBurnW, LinearDodge, LinearBurn, LinearLight, VividLight,
               PinLight, HardMix, LighterColor, DarkerColor, Subtract, Divide, BlueThreshold, KeyProtect>;

// Calls visit.template operator()<Mode>() for every mode, in the order of their numbers.
template <class Visit>
constexpr void for_each_mode(Visit&& visit) {
  [&]<class... Modes>(std::tuple<Modes...>*) {
    (visit.template operator()<Modes>(), ...);
  }(static_cast<AllModes*>(nullptr));
}

ZR_END_FORMULAS

#endif
