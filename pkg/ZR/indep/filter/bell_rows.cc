// The Gaussian blur's inner loop by single numbers.
#include "filter/bell_rows.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <type_traits>

namespace zr {
namespace {

template <class T>
struct BellMath;

template <>
struct BellMath<ZR_Pixel8> {
  using Sum = i32;
  static i32 product(i32 weight, u8 v) { return weight * v; }
  static u8 premultiplied(i32 sum, i32 divisor) { return static_cast<u8>((sum + divisor / 2) / divisor); }
  static u8 straight(i32 sum, i32 alpha) {  // in 64 bits: from a radius of 126 on the product needs them
    return static_cast<u8>(std::min<i64>((i64{sum} * 255 + alpha / 2) / alpha, 255));
  }
};
template <>
struct BellMath<ZR_Pixel16> {
  using Sum = f32;
  static f32 product(i32 weight, u16 v) { return static_cast<f32>(weight * v); }
  static u16 stored(f32 v) { return static_cast<u16>(truncate_i32(v)); }
  static u16 premultiplied(f32 sum, f32 divisor) { return stored((sum + divisor / 2) / divisor); }
  static u16 straight(f32 sum, f32 alpha) {
    return stored(std::min((sum * 32768 + std::trunc(alpha / 2)) / alpha, 32768.0f));
  }
};
template <>
struct BellMath<ZR_PixelFloat> {
  using Sum = f32;
  static f32 product(i32 weight, f32 v) { return static_cast<f32>(weight) * v; }
  static f32 premultiplied(f32 sum, f32 divisor) { return sum / divisor; }
  static f32 straight(f32 sum, f32 alpha) { return sum / alpha; }
};

template <class T>
std::array<Channel<T>, 4> channels_of(const T& p) {
  return {p.alpha, p.red, p.green, p.blue};
}

template <class T, bool straight>
void run_bell(const BellRun<T>& run) {
  using M = BellMath<T>;
  using Sum = typename M::Sum;
  const Sum divisor = static_cast<Sum>(run.divisor);
  const T* position = run.middle;
  T* out = run.out;
  for (i64 k = 0; k < run.count; ++k, position += run.step, out += run.out_step) {
    for (i32 i = 0; i < run.pixels; ++i) {
      std::array<Sum, 4> sum{};
      const auto add = [&](i32 weight, const T& p) {
        const auto in = channels_of(p);
        for (u32 c = 0; c < 4; ++c) sum[c] += M::product(weight, in[c]);
      };
      Sum middle_alpha = 0;
      if (run.has_middle) {
        const auto in = channels_of(position[i]);
        for (u32 c = 0; c < 4; ++c) sum[c] = M::product(run.weights[0], in[c]);
        middle_alpha = static_cast<Sum>(in[0]);
      }
      for (i32 tap = 1; tap <= run.reach; ++tap) {
        if (run.ahead.first <= tap && tap < run.ahead.end) add(run.weights[tap], position[i + tap * run.step]);
        if (run.behind.first <= tap && tap < run.behind.end) add(run.weights[tap], position[i - tap * run.step]);
      }
      std::array<Channel<T>, 4> made{};
      const Sum alpha = run.alpha_is_filtered ? sum[0] : middle_alpha * divisor;
      if (divisor != 0 && (!straight || alpha != 0)) {
        made[0] = M::premultiplied(sum[0], divisor);
        for (u32 c = 1; c < 4; ++c) made[c] = straight ? M::straight(sum[c], alpha) : M::premultiplied(sum[c], divisor);
      }
      out[i] = {made[0], made[1], made[2], made[3]};
    }
  }
}

}  // namespace

template <class T>
const BellRows<T>& single_bell_rows() {
  static constexpr BellRows<T> rows = {&run_bell<T, false>, &run_bell<T, true>};
  return rows;
}
template const BellRows<ZR_Pixel8>& single_bell_rows();
template const BellRows<ZR_Pixel16>& single_bell_rows();
template const BellRows<ZR_PixelFloat>& single_bell_rows();

}  // namespace zr
