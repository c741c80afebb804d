// Saturation and luma of colours, for the modes that work on a whole colour and not on its channels.
// M is ModeMath of the depth.
#pragma once

#include "composite/mode_arithmetic.h"

namespace zr {

template <class M>
struct Rgb {
  typename M::Wide red, green, blue;
};

template <class M, class T>
constexpr Rgb<M> colour_of(const T& pixel) {
  return {pixel.red, pixel.green, pixel.blue};
}

template <class M>
constexpr auto luma_of(const Rgb<M>& c) {
  return M::luma(c.red, c.green, c.blue);
}

// Saturation here is the distance from the least channel to the greatest.
template <class M>
constexpr auto saturation_of(const Rgb<M>& c) {
  const auto least = c.red < c.green ? (c.red < c.blue ? c.red : c.blue) : (c.green < c.blue ? c.green : c.blue);
  const auto most = c.red > c.green ? (c.red > c.blue ? c.red : c.blue) : (c.green > c.blue ? c.green : c.blue);
  return most - least;
}

template <class M>
constexpr Rgb<M> with_saturation(Rgb<M> c, typename M::Wide saturation) {
  using Wide = typename M::Wide;
  const auto stretch = [saturation](Wide& most, Wide& middle, Wide& least) {
    middle = middle - least;
    most = most - least;
    if (M::divides(most)) {
      middle = M::ratio(middle, saturation, most);
      most = saturation;
    }
    least = 0;
  };
  if (c.red > c.green) {
    if (c.green > c.blue)
      stretch(c.red, c.green, c.blue);
    else if (c.red > c.blue)
      stretch(c.red, c.blue, c.green);
    else
      stretch(c.blue, c.red, c.green);
  } else {
    if (c.red > c.blue)
      stretch(c.green, c.red, c.blue);
    else if (c.green > c.blue)
      stretch(c.green, c.blue, c.red);
    else
      stretch(c.blue, c.green, c.red);
  }
  return c;
}

// Shifts the colour to a luma, then draws what left black..white toward the grey of that luma; float
// colours too end up in that range.
template <class M>
constexpr Rgb<M> with_luma(Rgb<M> c, typename M::Wide luma) {
  using Wide = typename M::Wide;
  const auto each = [&c](auto&& change) { c = {change(c.red), change(c.green), change(c.blue)}; };
  const Wide shift = luma - luma_of(c);
  each([&](Wide v) { return v + shift; });
  const Wide least = c.red < c.green ? (c.red < c.blue ? c.red : c.blue) : (c.green < c.blue ? c.green : c.blue);
  if (least < 0 && M::divides(luma - least))
    each([&](Wide v) { return luma + M::ratio(v - luma, luma, luma - least); });
  const Wide most = c.red > c.green ? (c.red > c.blue ? c.red : c.blue) : (c.green > c.blue ? c.green : c.blue);
  if (most > M::white && M::divides(most - luma))
    each([&](Wide v) { return luma + M::ratio(v - luma, M::white - luma, most - luma); });
  return c;
}

}  // namespace zr
