// Saturation and luma of colours, for the modes that work on a whole colour and not on its channels.
// M is ModeMath of the depth.
#if defined(ZR_COMPOSITE_MODE_COLOUR_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_MODE_COLOUR_INL_H
#undef ZR_COMPOSITE_MODE_COLOUR_INL_H
#else
#define ZR_COMPOSITE_MODE_COLOUR_INL_H
#endif

#include "composite/mode_arithmetic-inl.h"
#include "simd/formulas.h"

ZR_BEGIN_FORMULAS

template <class M>
ZR_PURE auto luma_of(const Px<M>& c) {
  return M::luma(c.red, c.green, c.blue);
}

template <class M>
ZR_PURE auto least_of(const Px<M>& c) {
  return pick(c.red < c.green, pick(c.red < c.blue, c.red, c.blue), pick(c.green < c.blue, c.green, c.blue));
}
template <class M>
ZR_PURE auto most_of(const Px<M>& c) {
  return pick(c.red > c.green, pick(c.red > c.blue, c.red, c.blue), pick(c.green > c.blue, c.green, c.blue));
}
// Saturation here is the distance from the least channel to the greatest.
template <class M>
ZR_PURE auto saturation_of(const Px<M>& c) {
  return most_of(c) - least_of(c);
}

// The least channel becomes 0, the greatest the saturation, and the middle one keeps its place between them. Equal
// channels count as greater in the order blue, green, red.
template <class M>
ZR_PURE Px<M> with_saturation(const Px<M>& c, typename M::Wide saturation) {
  using Wide = typename M::Wide;
  const auto red_green = c.red > c.green, green_blue = c.green > c.blue, red_blue = c.red > c.blue;
  const auto red_most = red_green && (green_blue || red_blue), green_most = !red_green && (red_blue || green_blue);
  const auto red_least = !red_green && !red_blue, green_least = red_green && !green_blue;
  const Wide most = pick(red_most, c.red, pick(green_most, c.green, c.blue));
  const Wide least = pick(red_least, c.red, pick(green_least, c.green, c.blue));
  const auto red_middle = !red_most && !red_least, green_middle = !green_most && !green_least;
  const Wide middle = pick(red_middle, c.red, pick(green_middle, c.green, c.blue)) - least, reach = most - least;
  const auto divides = M::divides(reach);
  const Wide new_middle = pick(divides, M::ratio(middle, saturation, reach), middle);
  const Wide new_most = pick(divides, saturation, reach);
  const auto placed = [&](auto is_most, auto is_middle)
                          ZR_FORMULA { return pick(is_most, new_most, pick(is_middle, new_middle, Wide{0})); };
  return {c.alpha, placed(red_most, red_middle), placed(green_most, green_middle),
          placed(!red_most && !green_most, !red_middle && !green_middle)};
}

// Shifts the colour to a luma, then draws what left black..white toward the grey of that luma; float
// colours too end up in that range.
template <class M>
ZR_PURE Px<M> with_luma(const Px<M>& given, typename M::Wide luma) {
  using Wide = typename M::Wide;
  const Wide shift = luma - luma_of(given);
  const Px<M> c = {given.alpha, given.red + shift, given.green + shift, given.blue + shift};
  // Toward the grey by `amount / reach`.
  const auto drawn = [luma](const Px<M>& p, Wide amount, Wide reach) ZR_FORMULA {
    const auto one = [&](Wide v) ZR_FORMULA { return luma + M::ratio(v - luma, amount, reach); };
    return Px<M>{p.alpha, one(p.red), one(p.green), one(p.blue)};
  };
  const Wide least = least_of(c);
  const Px<M> lit = choose(
      least < 0 && M::divides(luma - least), [&]() ZR_FORMULA { return drawn(c, luma, luma - least); },
      [&]() ZR_FORMULA { return c; });
  const Wide most = most_of(lit);
  return choose(
      most > M::white && M::divides(most - luma), [&]() ZR_FORMULA { return drawn(lit, M::white - luma, most - luma); },
      [&]() ZR_FORMULA { return lit; });
}

ZR_END_FORMULAS

#endif
