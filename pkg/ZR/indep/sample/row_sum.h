// What the alphas of a row come to: whether all of it is clear, or all of it opaque.
#pragma once

#include <ZR/depth.h>

#include <algorithm>
#include <bit>
#include <type_traits>

namespace zr {

// Of floats, whose sum in double precision depends on its order. Additions wait for each other, so lanes tell the least
// and the most of their alphas instead: as long as all lie in 0..1 that says the same. Any partial sum of k of them is
// k at most, and once one of them has been below 1 it is k - 2^-24 at most, which needs no rounding below 2^28; and no
// sum of numbers above 0 is 0.
class FloatAlphas {
 public:
  // One more, or several as one number where lanes add nothing.
  void operator+=(f32 alpha) {
    sum_ += f64{alpha};
    note(std::bit_cast<u32>(alpha), std::bit_cast<u32>(alpha), 1);
  }
  // The bits of numbers from 0 on, unsigned, are in the order of the numbers; whatever is not in 0..1 lies above.
  void add_lanes(u32 least_bits, u32 most_bits, i32 pixels) {
    note(least_bits, most_bits, pixels);
    by_lanes_ = true;
  }
  // The order counts after all: every alpha has to be added again, in order, to a new sum.
  bool unsettled() const { return by_lanes_ && most_ > one; }
  // Of `count` pixels, those that have not been added being clear.
  bool clear() const { return by_lanes_ ? most_ == 0 : sum_ == 0; }
  bool opaque(i32 count) const {
    return by_lanes_ ? least_ == one && pixels_ == count : sum_ == static_cast<f64>(count);
  }

 private:
  static constexpr u32 one = std::bit_cast<u32>(1.0f);
  void note(u32 least, u32 most, i32 pixels) {
    least_ = std::min(least_, least), most_ = std::max(most_, most);
    pixels_ += pixels;
  }
  f64 sum_ = 0;
  u32 least_ = one, most_ = 0;
  i32 pixels_ = 0;
  bool by_lanes_ = false;
};

// Wide enough for any row of integers.
template <class T>
using RowSum = std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, FloatAlphas, u64>;

template <class T>
bool all_clear(const RowSum<T>& sum) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return sum.clear();
  else
    return sum == 0;
}
template <class T>
bool all_opaque(const RowSum<T>& sum, i32 count) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return sum.opaque(count);
  else
    return sum == static_cast<u64>(count) * Depth<T>::white;
}

}  // namespace zr
