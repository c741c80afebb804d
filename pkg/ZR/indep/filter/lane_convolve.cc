// Convolution on lanes: blocks of pixels whose windows lie in the source.
#include "filter/convolve_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "filter/lane_convolve.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "filter/lane_pixels-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Whole numbers: two taps to a product of 16-bit numbers, sums of 32 bits.
template <class T>
struct ConvolveLanes {
  using Words = hn::Repartition<u32, Tag<i32>>;
  using ShortTag = hn::Repartition<i16, Tag<i32>>;
  using Shorts = hn::Vec<ShortTag>;
  static constexpr i32 pixels_of_vector = lane_count() / 2;

  const LaneConvolution<T>& work;
  Ints bias, divisor;
  hn::Vec<Words> even_factor, odd_factor, shift;

  HWY_INLINE explicit ConvolveLanes(const LaneConvolution<T>& w) : work(w) {
    alignas(16) u32 factors[4], shifts[4];
    for (i32 k = 0; k < 4; ++k) {
      const ExactReciprocal by = ExactReciprocal::of(w.divisors[k]);
      factors[k] = by.factor;
      shifts[k] = static_cast<u32>(by.bits > 1 ? by.bits - 1 : 1);
    }
    alignas(16) i32 biases[4], divisors[4];
    std::memcpy(biases, w.bias, sizeof biases);
    std::memcpy(divisors, w.divisors, sizeof divisors);
    bias = hn::LoadDup128(Tag<i32>(), biases);
    divisor = hn::LoadDup128(Tag<i32>(), divisors);
    const hn::Repartition<u64, Tag<i32>> d64;
    even_factor = hn::LoadDup128(Words(), factors);
    odd_factor = hn::BitCast(Words(), hn::ShiftRight<32>(hn::BitCast(d64, even_factor)));
    shift = hn::LoadDup128(Words(), shifts);
  }

  static HWY_INLINE Shorts samples_at(const char* p) {
    const ShortTag d;
    if constexpr (std::is_same_v<T, ZR_Pixel8>)
      return hn::PromoteTo(d, hn::LoadU(hn::Rebind<u8, ShortTag>(), reinterpret_cast<const u8*>(p)));
    else
      return hn::Xor(hn::LoadU(d, reinterpret_cast<const i16*>(p)), hn::Set(d, static_cast<i16>(-32768)));
  }
  template <i32 vectors>
  HWY_INLINE void make(i32 pixel) const {
    constexpr i64 vector_bytes = static_cast<i64>(sizeof(T)) * pixels_of_vector;
    const ShortTag d;
    const char* const middle = reinterpret_cast<const char*>(work.src + pixel);
    Ints low[vectors], high[vectors];
    for (i32 v = 0; v < vectors; ++v) low[v] = high[v] = bias;
    for (i64 t = 0; t < work.count; ++t) {
      const TapPair& tap = work.taps[t];
      const Ints weights = hn::BitCast(Tag<i32>(), hn::LoadDup128(d, tap.weights));
      for (i32 v = 0; v < vectors; ++v) {
        const Shorts a = samples_at(middle + tap.first + v * vector_bytes);
        const Shorts b = samples_at(middle + tap.second + v * vector_bytes);
        low[v] = low[v] + pair_products(hn::BitCast(Tag<i32>(), hn::InterleaveLower(d, a, b)), weights);
        high[v] = high[v] + pair_products(hn::BitCast(Tag<i32>(), hn::InterleaveUpper(d, a, b)), weights);
      }
    }
    for (i32 v = 0; v < vectors; ++v) store(quotient(low[v]), quotient(high[v]), pixel + v * pixels_of_vector);
  }

 private:
  // Toward zero, then kept to the depth.
  HWY_INLINE Ints quotient(Ints sum) const {
    constexpr i32 white = std::is_same_v<T, ZR_Pixel8> ? 255 : 32768;
    const Ints size = hn::Abs(sum.v);
    const hn::Repartition<u64, Tag<i32>> d64;
    const Words d32;
    const auto odd = hn::BitCast(d32, hn::ShiftRight<32>(hn::BitCast(d64, size.v)));
    const auto lower = hn::BitCast(d32, hn::ShiftRight<32>(hn::MulEven(hn::BitCast(d32, size.v), even_factor)));
    const auto upper = hn::BitCast(d32, hn::MulEven(odd, odd_factor));
    const Ints divided = hn::BitCast(Tag<i32>(), hn::Shr(hn::OddEven(upper, lower), shift));
    // Divisors 1 and 2 would shift by nothing, which not every processor's lanes do one by one.
    Ints whole = pick(divisor > 2, divided, pick(divisor == 1, size, shifted_right<1>(size)));
    whole = pick(sum < 0, Ints(0) - whole, whole);
    if (work.wraps) whole = shifted_right<16>(shifted_left<16>(whole));
    return hn::Min(hn::Max(whole.v, Ints(0).v), Ints(white).v);
  }
  HWY_INLINE void store(Ints low, Ints high, i32 pixel) const {
    const ShortTag d;
    if constexpr (std::is_same_v<T, ZR_Pixel8>) {
      const hn::Rebind<u8, ShortTag> bytes;
      hn::StoreU(hn::DemoteTo(bytes, hn::ReorderDemote2To(d, low.v, high.v)), bytes,
                 reinterpret_cast<u8*>(work.dst + pixel));
    } else {
      // Signed numbers again, so that 32768 survives the narrowing.
      const auto narrow = hn::ReorderDemote2To(d, (low - 32768).v, (high - 32768).v);
      hn::StoreU(hn::Xor(narrow, hn::Set(d, static_cast<i16>(-32768))), d, reinterpret_cast<i16*>(work.dst + pixel));
    }
  }
};

// Floats: products of single precision, sums of double.
template <>
struct ConvolveLanes<ZR_PixelFloat> {
  static constexpr i32 pixels_of_vector = lane_count() / 4;
  using Half = hn::Half<Tag<f32>>;
  using Doubles = hn::Rebind<f64, Half>;

  const LaneConvolution<ZR_PixelFloat>& work;
  Floats divisor;

  HWY_INLINE explicit ConvolveLanes(const LaneConvolution<ZR_PixelFloat>& w) : work(w) {
    alignas(16) f32 divisors[4];
    std::memcpy(divisors, w.float_divisors, sizeof divisors);
    divisor = hn::LoadDup128(Tag<f32>(), divisors);
  }
  template <i32 vectors>
  HWY_INLINE void make(i32 pixel) const {
    constexpr i64 vector_bytes = static_cast<i64>(sizeof(ZR_PixelFloat)) * pixels_of_vector;
    const Doubles d;
    const char* const middle = reinterpret_cast<const char*>(work.src + pixel);
    hn::Vec<Doubles> low[vectors], high[vectors];
    for (i32 v = 0; v < vectors; ++v) low[v] = high[v] = hn::Zero(d);
    for (i64 t = 0; t < work.count; ++t) {
      const FloatTap& tap = work.taps[t];
      const Floats weights = hn::LoadDup128(Tag<f32>(), tap.weights);
      for (i32 v = 0; v < vectors; ++v) {
        const auto samples = hn::LoadU(Tag<f32>(), reinterpret_cast<const f32*>(middle + tap.place + v * vector_bytes));
        const auto products = hn::Mul(samples, weights.v);
        low[v] = hn::Add(low[v], hn::PromoteTo(d, hn::LowerHalf(Half(), products)));
        high[v] = hn::Add(high[v], hn::PromoteTo(d, hn::UpperHalf(Half(), products)));
      }
    }
    for (i32 v = 0; v < vectors; ++v) {
      const auto sum = hn::Combine(Tag<f32>(), hn::DemoteTo(Half(), high[v]), hn::DemoteTo(Half(), low[v]));
      hn::StoreU(hn::Div(sum, divisor.v), Tag<f32>(), reinterpret_cast<f32*>(work.dst + pixel + v * pixels_of_vector));
    }
  }
};

template <class T>
i32 convolve_span(const LaneConvolution<T>& work) {
  const ConvolveLanes<T> lanes(work);
  constexpr i32 vectors = 4, one = lanes.pixels_of_vector, block = vectors * one;
  if (work.pixels < one) return 0;
  i32 x = 0;
  for (; x + block <= work.pixels; x += block) lanes.template make<vectors>(x);
  for (; x + one <= work.pixels; x += one) lanes.template make<1>(x);
  if (x < work.pixels) lanes.template make<1>(work.pixels - one);  // some once more
  return work.pixels;
}

template <class T>
LaneConvolveFunc<T>* convolve_row() {
  return &convolve_span<T>;
}
ZR_ROWS_OF_DEPTHS(LaneConvolveFunc, convolve_row)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(LaneConvolveFunc, convolve_row)
#endif
