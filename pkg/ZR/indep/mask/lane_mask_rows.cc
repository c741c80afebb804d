// Rows of mask values on lanes as wide as the values, and of pixels under them.
#include "mask/mask_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "mask/lane_mask_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "mask/mask_modes-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class C>
using ValueTag = hn::ScalableTag<C>;
template <class C>
using Values = hn::Vec<ValueTag<C>>;

// What formulas and rows need of vectors of values.
template <class C>
struct CommonMath {
  using Value = Values<C>;
  static HWY_INLINE Value of(C c) { return hn::Set(ValueTag<C>(), c); }
  static HWY_INLINE Value inv(Value a) { return hn::Sub(of(static_cast<C>(MaskDepth<C>::white)), a); }
  static HWY_INLINE Value least(Value a, Value b) { return hn::Min(a, b); }
  static HWY_INLINE Value greatest(Value a, Value b) { return hn::Max(a, b); }
  static HWY_INLINE Value difference(Value a, Value b) { return hn::Sub(hn::Max(a, b), hn::Min(a, b)); }
};

template <class C>
struct LaneMath;

template <>
struct LaneMath<u16> : CommonMath<u16> {
  static constexpr ValueTag<u16> d{};
  // a * b has a high and a low half; rounding adds its carry to twice the high one. AverageRound(x, y) is
  // (x + y + 1) / 2 without overflow.
  static HWY_INLINE Value mul(Value a, Value b) {
    const Value high = hn::MulHigh(a, b), low = hn::Mul(a, b);
    return hn::Add(hn::Add(high, high), hn::ShiftRight<14>(hn::AverageRound(low, of(16382))));
  }
  static HWY_INLINE Value smul(Value a, Value b) {
    const Value high = hn::MulHigh(a, b), low = hn::Mul(a, b);
    return hn::Add(hn::Add(high, high), hn::ShiftRight<15>(low));
  }
  static HWY_INLINE Value noisy_mul(Value a, Value b, Value noise) {
    const Value high = hn::MulHigh(a, b), low = hn::Mul(a, b), sum = hn::Add(low, noise);
    const Value carry = hn::IfThenElseZero(hn::Lt(sum, low), of(2));
    return hn::Add(hn::Add(hn::Add(high, high), carry), hn::ShiftRight<15>(sum));
  }
  static HWY_INLINE Value added(Value a, Value b) { return hn::Min(hn::SaturatedAdd(a, b), of(32768)); }
};

// Products of bytes are worked out in words, of the even and of the odd bytes.
template <>
struct LaneMath<u8> : CommonMath<u8> {
  static constexpr ValueTag<u8> d{};
  static constexpr hn::Repartition<u16, ValueTag<u8>> words{};
  using Words = hn::Vec<hn::Repartition<u16, ValueTag<u8>>>;

  static HWY_INLINE Words even(Value a) { return hn::And(hn::BitCast(words, a), hn::Set(words, 255)); }
  static HWY_INLINE Words odd(Value a) { return hn::ShiftRight<8>(hn::BitCast(words, a)); }
  // The results stand in the upper bytes.
  static HWY_INLINE Value together(Words even_results, Words odd_results) {
    const Words upper = hn::Set(words, 0xff00);
    return hn::BitCast(d, hn::Or(hn::ShiftRight<8>(even_results), hn::And(odd_results, upper)));
  }
  static HWY_INLINE Words fold(Words t) {
    const Words h = hn::Add(t, hn::Set(words, 128));
    return hn::Add(h, hn::ShiftRight<8>(h));
  }
  static HWY_INLINE Value mul(Value a, Value b) {
    return together(fold(hn::Mul(even(a), even(b))), fold(hn::Mul(odd(a), odd(b))));
  }
  static HWY_INLINE Value smul(Value a, Value b) { return mul(a, b); }
  static HWY_INLINE Value noisy_mul(Value a, Value b, Value noise) {
    const auto part = [](Words x, Words y, Words r) HWY_ATTR {
      const Words t = hn::Add(hn::Mul(x, y), r);
      return hn::Add(t, hn::ShiftRight<8>(t));
    };
    return together(part(even(a), even(b), even(noise)), part(odd(a), odd(b), odd(noise)));
  }
  static HWY_INLINE Value added(Value a, Value b) { return hn::SaturatedAdd(a, b); }
};

// Comparisons in the order of the single values, so that NaN goes the same way.
template <>
struct LaneMath<f32> : CommonMath<f32> {
  static HWY_INLINE Value mul(Value a, Value b) { return hn::Mul(a, b); }
  static HWY_INLINE Value least(Value a, Value b) { return hn::IfThenElse(hn::Lt(b, a), b, a); }
  static HWY_INLINE Value greatest(Value a, Value b) { return hn::IfThenElse(hn::Lt(a, b), b, a); }
  static HWY_INLINE Value difference(Value a, Value b) { return hn::Abs(hn::Sub(a, b)); }
  static HWY_INLINE Value added(Value a, Value b) {
    const Value sum = hn::Add(a, b);
    return hn::IfThenElse(hn::Lt(of(1.0f), sum), of(1.0f), sum);
  }
};

// dst[i] = make(src, under) a vector at a time; the rest of the row on copies with room for a vector.
template <class C, class Make>
HWY_INLINE void each_vector(i32 n, const C* src, const C* under, C* dst, Make make) {
  constexpr ValueTag<C> d;
  constexpr i32 lanes = static_cast<i32>(hn::MaxLanes(d));
  i32 i = 0;
  for (; i <= n - lanes; i += lanes) hn::StoreU(make(hn::LoadU(d, src + i), hn::LoadU(d, under + i)), d, dst + i);
  if (i == n) return;
  const std::size_t bytes = static_cast<std::size_t>(n - i) * sizeof(C);
  C rest[2][lanes] = {};
  std::memcpy(rest[0], src + i, bytes);
  std::memcpy(rest[1], under + i, bytes);
  hn::StoreU(make(hn::LoadU(d, rest[0]), hn::LoadU(d, rest[1])), d, rest[0]);
  std::memcpy(dst + i, rest[0], bytes);
}

template <class C>
void mode_lanes(i32 n, i32 mode, const C* src, const C* under, C* dst) {
  on_mask_mode(mode, [&]<i32 m>() HWY_ATTR {
    each_vector(n, src, under, dst, [](Values<C> s, Values<C> d) HWY_ATTR { return combined<m, LaneMath<C>>(s, d); });
  });
}

template <class C>
void dithered_lanes(i32 n, const u16* noise, const C* src, const C* under, C* dst) {
  if constexpr (!std::is_same_v<C, f32>) {
    C values[mask_block] = {};  // n is no more
    for (i32 i = 0; i < n; ++i) values[i] = static_cast<C>(noise[i]);
    const C* next = values;
    constexpr i32 lanes = static_cast<i32>(hn::MaxLanes(ValueTag<C>()));
    static_assert(mask_block % lanes == 0);
    each_vector(n, src, under, dst, [&](Values<C> s, Values<C> d) HWY_ATTR {
      const Values<C> r = hn::LoadU(ValueTag<C>(), next);
      next += lanes;
      return dithered<LaneMath<C>>(s, d, r);
    });
  }
}

template <class C>
void rise_lanes(i32 n, Factor<C> ceiling, const C* src, const C* under, C* dst) {
  using M = LaneMath<C>;
  const Values<C> c = M::of(static_cast<C>(ceiling));
  each_vector(n, src, under, dst, [&](Values<C> s, Values<C> d) HWY_ATTR {
    if constexpr (std::is_same_v<C, f32>)
      return hn::IfThenElse(hn::Lt(d, c), hn::Add(d, hn::Mul(s, hn::Sub(c, d))), d);
    else
      return hn::Add(d, M::smul(s, hn::SaturatedSub(c, d)));
  });
}

template <class C, bool inverted>
void faded_lanes(i32 n, Factor<C> factor, C* row) {
  using M = LaneMath<C>;
  const Values<C> k = M::of(static_cast<C>(factor));
  if (inverted && factor == MaskDepth<C>::white) {
    each_vector(n, row, row, row, [](Values<C> v, Values<C>) HWY_ATTR { return M::inv(v); });
    return;
  }
  each_vector(n, row, row, row, [&](Values<C> v, Values<C>) HWY_ATTR { return M::mul(inverted ? M::inv(v) : v, k); });
}

// One value for each pixel, as wide as the pixel.
HWY_INLINE auto spread(const u8* values) {
  constexpr hn::ScalableTag<u32> d;
  return hn::PromoteTo(d, hn::LoadU(hn::Rebind<u8, decltype(d)>(), values));
}
HWY_INLINE auto spread(const u16* values) {
  constexpr hn::ScalableTag<u64> d;
  constexpr hn::Rebind<u32, decltype(d)> half;
  return hn::PromoteTo(d, hn::PromoteTo(half, hn::LoadU(hn::Rebind<u16, decltype(d)>(), values)));
}

// A product with white is the value itself: pixels are multiplied whole, by white except at alpha.
template <class C>
void merge_lanes(i32 n, const C* mask, MaskPixel<C>* pixels) {
  if constexpr (std::is_same_v<C, f32>) {
    single_mask_rows<f32>().merge(n, mask, pixels);
  } else {
    using M = LaneMath<C>;
    using Word = std::conditional_t<std::is_same_v<C, u8>, u32, u64>;  // a pixel
    constexpr hn::ScalableTag<Word> d;
    constexpr i32 lanes = static_cast<i32>(hn::MaxLanes(d));
    const auto white =
        hn::Set(d, std::is_same_v<C, u8> ? static_cast<Word>(0xffffff00u) : static_cast<Word>(0x8000800080000000u));
    const auto merge = [&](const C* m, MaskPixel<C>* p) HWY_ATTR {
      const auto factor = hn::Or(spread(m), white);
      const auto in = hn::LoadU(d, reinterpret_cast<const Word*>(p));
      constexpr ValueTag<C> values;
      hn::StoreU(hn::BitCast(d, M::mul(hn::BitCast(values, in), hn::BitCast(values, factor))), d,
                 reinterpret_cast<Word*>(p));
    };
    i32 i = 0;
    for (; i <= n - lanes; i += lanes) merge(mask + i, pixels + i);
    if (i == n) return;
    const std::size_t rest = static_cast<std::size_t>(n - i);
    C m[lanes] = {};
    MaskPixel<C> p[lanes] = {};
    std::memcpy(m, mask + i, rest * sizeof(C));
    std::memcpy(p, pixels + i, rest * sizeof(MaskPixel<C>));
    merge(m, p);
    std::memcpy(pixels + i, p, rest * sizeof(MaskPixel<C>));
  }
}

template <class C>
const MaskRows<C>* mask_rows() {
  static constexpr MaskRows<C> rows = {&mode_lanes<C>,         &dithered_lanes<C>,    &rise_lanes<C>,
                                       &faded_lanes<C, false>, &faded_lanes<C, true>, &merge_lanes<C>};
  return &rows;
}
template const MaskRows<u8>* mask_rows<u8>();
template const MaskRows<u16>* mask_rows<u16>();
template const MaskRows<f32>* mask_rows<f32>();

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class C>
const MaskRows<C>* lane_mask_rows() {
  ZR_RETURN_BEST(mask_rows<C>());
  return nullptr;
}
template const MaskRows<u8>* lane_mask_rows<u8>();
template const MaskRows<u16>* lane_mask_rows<u16>();
template const MaskRows<f32>* lane_mask_rows<f32>();

}  // namespace zr
#endif
