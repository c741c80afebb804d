// The box blur's inner loop by single numbers.
#include "filter/box_rows.h"

#include <algorithm>
#include <array>

namespace zr {

namespace {

constexpr i32 alpha_place = 0;

// One pixel's arithmetic: four numerators in the order of the channels.
template <class T>
struct BoxMath;

template <>
struct BoxMath<ZR_Pixel8> {
  using Sum = i32;
  static i32 numerator(i32 sum, i32 edge, const BoxWeights<ZR_Pixel8>& w) { return (sum << 10) - edge * w.shortfall; }
  static u8 premultiplied(i32 numerator, const BoxWeights<ZR_Pixel8>& w) {
    return static_cast<u8>((numerator + w.divisor / 2) / w.divisor);
  }
  static i32 alpha_weight(i32 numerator) { return (numerator + 127) / 255; }
  static u8 straight(i32 numerator, i32 q) { return static_cast<u8>(std::min((numerator + q / 2) / q, 255)); }
};

template <>
struct BoxMath<ZR_Pixel16> {
  using Sum = f32;
  static f32 numerator(f32 sum, f32 edge, const BoxWeights<ZR_Pixel16>& w) { return sum - edge * w.shortfall; }
  static u16 stored(f32 v) { return static_cast<u16>(truncate_i32(v)); }
  static u16 premultiplied(f32 numerator, const BoxWeights<ZR_Pixel16>& w) {
    return stored((numerator + w.divisor / 2) / w.divisor);
  }
  static f32 alpha_weight(f32 numerator) { return numerator * 3.0517578e-5f; }
  static u16 straight(f32 numerator, f32 q) { return stored(std::min((numerator + q / 2) / q, 32768.0f)); }
};

template <class Float>
struct FloatBoxMath {
  using Sum = Float;
  static Float numerator(Float sum, Float edge, const BoxWeights<ZR_PixelFloat>& w) {
    return sum - edge * static_cast<Float>(w.shortfall);
  }
  static f32 premultiplied(Float numerator, const BoxWeights<ZR_PixelFloat>& w) {
    return static_cast<f32>(numerator / static_cast<Float>(w.divisor));
  }
  static Float alpha_weight(Float numerator) { return numerator; }
  static f32 straight(Float numerator, Float q) { return static_cast<f32>(numerator / q); }
};
template <>
struct BoxMath<ZR_PixelFloat> : FloatBoxMath<f32> {};

template <class T>
std::array<Channel<T>, 4> channels_of(const T& p) {
  return {p.alpha, p.red, p.green, p.blue};
}

template <class T, class M, i32 channels>
void add(i32 pixels, i64 count, const T* from, i64 step, void* sums) {
  auto* const all = static_cast<typename M::Sum*>(sums);
  for (i64 k = 0; k < count; ++k, from += step)
    for (i32 i = 0; i < pixels; ++i) {
      const auto in = channels_of(from[i]);
      for (i32 c = 0; c < channels; ++c) all[4 * i + c] += static_cast<typename M::Sum>(in[static_cast<u32>(c)]);
    }
}

template <class T, class M, i32 channels, bool straight>
void run_box(const BoxRun<T>& run) {
  using Sum = typename M::Sum;
  const BoxWeights<T>& w = run.weights;
  auto* const all = static_cast<Sum*>(run.sums);
  const T *leaving = run.leaving, *first = run.first, *entering = run.entering;
  T* out = run.out;
  for (i64 k = 0; k < run.count; ++k) {
    for (i32 i = 0; i < run.pixels; ++i) {
      const auto left = channels_of(leaving[i]), start = channels_of(first[i]), next = channels_of(entering[i]);
      std::array<Sum, 4> n{};
      for (u32 c = 0; c < channels; ++c) {
        Sum& sum = all[4 * static_cast<u32>(i) + c];
        sum = sum - static_cast<Sum>(left[c]) + static_cast<Sum>(next[c]);
        // Without shortfall there is no edge, not even one that is infinite.
        const Sum edge = w.shortfall != 0 ? static_cast<Sum>(start[c]) + static_cast<Sum>(next[c]) : Sum{0};
        n[c] = M::numerator(sum, edge, w);
      }
      std::array<Channel<T>, 4> made{};
      const Sum q = M::alpha_weight(n[alpha_place]);
      if (w.divisor != 0 && (!straight || q != 0))
        for (u32 c = 0; c < channels; ++c)
          made[c] = straight && c != alpha_place ? M::straight(n[c], q) : M::premultiplied(n[c], w);
      out[i] = {made[0], made[1], made[2], made[3]};
    }
    leaving += run.leaving_step;
    first += run.first_step;
    entering += run.entering_step;
    out += run.out_step;
  }
}

template <class T, class M, i32 channels>
constexpr BoxRows<T> rows_of() {
  return {&add<T, M, channels>, &run_box<T, M, channels, false>, &run_box<T, M, channels, true>};
}

}  // namespace

template <class T>
const BoxRows<T>& single_box_rows() {
  static constexpr BoxRows<T> rows = rows_of<T, BoxMath<T>, 4>();
  return rows;
}
template const BoxRows<ZR_Pixel8>& single_box_rows();
template const BoxRows<ZR_Pixel16>& single_box_rows();
template const BoxRows<ZR_PixelFloat>& single_box_rows();

const BoxRows<ZR_PixelFloat>& box_rows_of_float_alpha() {
  static constexpr BoxRows<ZR_PixelFloat> rows = rows_of<ZR_PixelFloat, FloatBoxMath<f64>, 1>();
  return rows;
}

}  // namespace zr
