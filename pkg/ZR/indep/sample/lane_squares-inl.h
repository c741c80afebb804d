// Means of squares of four whole pixels, as copies at half the size take them: channels stay side by side as pixels
// hold them, and a pixel's sum of alphas is inverted once.
#if defined(ZR_SAMPLE_LANE_SQUARES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SAMPLE_LANE_SQUARES_INL_H
#undef ZR_SAMPLE_LANE_SQUARES_INL_H
#else
#define ZR_SAMPLE_LANE_SQUARES_INL_H
#endif

#include "sample/lane_copies-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

using Words = hn::Repartition<i16, Tag<i32>>;
using Bytes = hn::Repartition<u8, Tag<i32>>;

// Two rows of neighbouring pairs: each destination pixel is the mean of a square of four whole pixels.
template <class T>
class Pairs {
 public:
  static constexpr bool one_phase = true;

  // Whether the boxes of a run are such squares, and all rows lie inside.
  static bool fit(const SampleRun& run, const ZR_SampPB& params) {
    constexpr i32 two_pixels = 0x20000;
    const auto whole = [](i32 middle) { return (middle & 65535) == 32768; };
    const i32 top = run.y >> 16;
    return run.step_x == two_pixels && params.x_radius == two_pixels / 2 && params.y_radius == two_pixels / 2 &&
           whole(run.x) && whole(run.y) && top >= 0 && top + 1 < std::min(params.src->height, 32767);
  }
  HWY_INLINE Pairs(const SampleRun& run, const ZR_LayerDef& src)
      : at_(static_cast<const char*>(src.data) + static_cast<std::ptrdiff_t>(run.y >> 16) * src.row_bytes +
            static_cast<std::ptrdiff_t>(run.x >> 16) * i32{sizeof(T)}),
        row_bytes_(src.row_bytes) {}
  HWY_INLINE void next() { at_ += 2 * lane_count() * i32{sizeof(T)}; }

  HWY_INLINE const T* row(i32 y) const { return reinterpret_cast<const T*>(at_ + y * std::ptrdiff_t{row_bytes_}); }
  // A page of 4096 bytes ahead: processors that fetch by themselves stop at its end.
  HWY_INLINE void fetch_ahead() const {
    for (i32 i = 0; i < 2; ++i)
      HWY_NAMESPACE::fetch_ahead(reinterpret_cast<const char*>(row(i)) + 4096, 2 * lane_count() * i32{sizeof(T)});
  }
  HWY_INLINE Alphas alphas() const {
    const Channel<T> first = row(0)->alpha;
    if (first != 0 && first != Depth<T>::white) return Alphas::any;  // most often enough
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      alignas(16) static constexpr i32 alpha[4] = {-1, 0, 0, 0};
      const i32 bits = std::bit_cast<i32>(first);
      Ints differs(0);
      for (i32 i = 0; i < 16; ++i) {
        const auto* const from = reinterpret_cast<const i32*>(row(i / 8)) + i % 8 * lane_count();
        differs = differs | (Ints(hn::LoadU(Tag<i32>(), from)) ^ bits);
      }
      if (!all((differs & hn::LoadDup128(Tag<i32>(), alpha)) == 0)) return Alphas::any;
      return first == 0 ? Alphas::clear : Alphas::white;
    } else {
      const Alphas top = alphas_of(row(0), 2 * lane_count());
      return top == Alphas::any || alphas_of(row(1), 2 * lane_count()) == top ? top : Alphas::any;
    }
  }
  // The four pixels of each square in reading order.
  HWY_INLINE void load(Raw<T> (&square)[4]) const {
    load_row(at_, square[0], square[1]);
    load_row(at_ + row_bytes_, square[2], square[3]);
  }

 private:
  static HWY_INLINE void load_row(const char* from, Raw<T>& left, Raw<T>& right) {
    const Tag<i32> d;
    const Raw<T> low = load_pixels<T>(from), high = load_pixels<T>(from + lane_count() * i32{sizeof(T)});
    for (i32 i = 0; i < Raw<T>::words; ++i) {
      left.w[i] = hn::ConcatEven(d, high.w[i].v, low.w[i].v);
      right.w[i] = hn::ConcatOdd(d, high.w[i].v, low.w[i].v);
    }
  }
  const char* at_;
  i32 row_bytes_;
};

// ------------------------------------------------------------------------------------------- opaque

// opaque_means(): squares of opaque pixels.

// What the quotient of sums comes to: 255 * s / 1020, rounded by doubles, is s / 4 rounded half up for all sums of four
// bytes.
HWY_INLINE void opaque_means(const Pairs<ZR_Pixel8>& at, ZR_Pixel8* dst) {
  constexpr i32 pixels = lane_count() / 2;
  const Bytes bytes;
  const hn::Repartition<u16, Bytes> words;
  // A channel of both pixels of a pair together.
  alignas(16) static constexpr u8 channels[16] = {0, 4, 1, 5, 2, 6, 3, 7, 8, 12, 9, 13, 10, 14, 11, 15};
  const auto sums_of = [&](i32 row, i32 i) HWY_ATTR {
    const auto v = hn::LoadU(bytes, reinterpret_cast<const u8*>(at.row(row) + 2 * i));
    const auto pairs = hn::BitCast(words, hn::TableLookupBytes(v, hn::LoadDup128(bytes, channels)));
    return hn::Add(hn::And(pairs, hn::Set(words, u16{255})), hn::ShiftRight<8>(pairs));
  };
  for (i32 i = 0; i < lane_count(); i += pixels) {
    const auto sums = hn::Add(hn::Add(sums_of(0, i), sums_of(1, i)), hn::Set(words, u16{2}));
    const hn::Rebind<u8, decltype(words)> narrow;
    hn::StoreU(hn::TruncateTo(narrow, hn::ShiftRight<2>(sums)), narrow, reinterpret_cast<u8*>(dst + i));
  }
}

// With a white of 32768 both quotients are exact. Colours may be above it, and are limited.
HWY_INLINE void opaque_means(const Pairs<ZR_Pixel16>& at, ZR_Pixel16* dst) {
  Raw<ZR_Pixel16> square[4];
  at.load(square);
  const auto mean = [&](auto k) HWY_ATTR {
    constexpr int c = decltype(k)::value;
    const Ints rounded = shifted_right<2>((channel_of<c>(square[0]) + channel_of<c>(square[1])) +
                                          (channel_of<c>(square[2]) + channel_of<c>(square[3])) + 2);
    return Ints(hn::Min(rounded.v, Ints(32768).v));
  };
  store(packed<ZR_Pixel16>(32768, mean(std::integral_constant<int, 1>()), mean(std::integral_constant<int, 2>()),
                           mean(std::integral_constant<int, 3>())),
        dst);
}

// Float channels in the sampler's own double precision. The four pixels of as many squares as fit a vector.
struct DoubleSquares {
  static constexpr i32 pixels = std::max(lane_count() / 8, 1);
  hn::Vec<Tag<f64>> pixel[4];  // in reading order

  HWY_INLINE DoubleSquares(const Pairs<ZR_PixelFloat>& at, i32 first) {
    for (i32 row = 0; row < 2; ++row) {
      const Tag<f64> d;
      const HalfFloats half;
      const auto* const from = reinterpret_cast<const f32*>(at.row(row) + 2 * first);
      const auto low = hn::PromoteTo(d, hn::LoadU(half, from));
      const auto high = hn::PromoteTo(d, hn::LoadU(half, from + 4 * pixels));
      if constexpr (pixels == 1) {
        pixel[2 * row] = low, pixel[2 * row + 1] = high;
      } else {
        pixel[2 * row] = hn::ConcatLowerLower(d, high, low), pixel[2 * row + 1] = hn::ConcatUpperUpper(d, high, low);
      }
    }
  }
  static HWY_INLINE void store(hn::Vec<Tag<f64>> v, ZR_PixelFloat* dst) {
    const HalfFloats half;
    hn::StoreU(hn::DemoteTo(half, v), half, reinterpret_cast<f32*>(dst));
  }
};
HWY_INLINE void opaque_means(const Pairs<ZR_PixelFloat>& at, ZR_PixelFloat* dst) {
  const Tag<f64> d;
  for (i32 i = 0; i < lane_count(); i += DoubleSquares::pixels) {
    const DoubleSquares square(at, i);
    const auto* const p = square.pixel;
    const auto total = hn::Add(hn::Add(hn::Add(p[0], p[1]), p[2]), p[3]);
    DoubleSquares::store(hn::MulAdd(total, hn::Set(d, 0.25), hn::Zero(d)), dst + i);  // 0 for -0
  }
}

// ----------------------------------------------------------------------------------------- weighted

// weighted_means(): squares of any pixels, and their alphas as sums take them. False, with anything written, where
// what is rounded otherwise than single numbers are may tell.

// The sums of products of both halves of each lane.
HWY_INLINE Ints pair_products(hn::Vec<Words> a, hn::Vec<Words> b) {
  const Tag<i32> d;
#if HWY_ARCH_X86
  auto others = hn::Zero(d);
  return hn::ReorderWidenMulAccumulate(d, a, b, hn::Zero(d), others);
#else
  const Ints m = hn::BitCast(d, a), n = hn::BitCast(d, b);
  const auto lower = [](Ints v) HWY_ATTR { return shifted_right<16>(shifted_left<16>(v)); };
  return lower(m) * lower(n) + shifted_right<16>(m) * shifted_right<16>(n);
#endif
}

// 8 bits. Sums are exact; quotients n / d with d up to 1020 are halves or at least 1/2040 away from them, and off by
// less than 4u * 255 + 2^-16 < 2^-13. They are held above 256, where 15 bits of fraction lie below their eight.
class Quotients8 {
 public:
  HWY_INLINE Quotients8() : least_(hn::Set(Tag<u16>(), u16{0xffff})) {}
  // sums * by, rounded half up, in bits 16 to 23 of each lane.
  HWY_INLINE Ints rounded(Floats sums, Floats by, Floats half) {
    const Ints bits = as_ints(mul_add(sums, by, half)), doubled = bits + bits;
    least_ = hn::Min(least_, hn::BitCast(Tag<u16>(), doubled.v));
    return doubled;
  }
  HWY_INLINE bool unsure() const {
    return !hn::AllFalse(Tag<u16>(), hn::Lt(least_, hn::Set(Tag<u16>(), static_cast<u16>(doubt * 0x1p17f))));
  }
  static constexpr f32 doubt = 0x1p-13f, colour_half = 256.5f + doubt, alpha_half = 256.5f + 0.125f;  // never unsure

 private:
  hn::Vec<Tag<u16>> least_;  // fraction, and what is above it, which is never small
};
// Where there are halves: by the sampler's own division. Sums of alpha and green, those of red and blue, and those of
// alphas, of both vectors in turn.
HWY_INLINE void divide_by_doubles(const Floats (&even)[2], const Floats (&odd)[2], Floats totals, ZR_Pixel8* dst) {
  const Tag<f64> d;
  const Doubles inverse = Doubles(1.0) / to_double(totals);
  const Doubles by[2] = {
      {hn::InterleaveLower(d, inverse.low, inverse.low), hn::InterleaveLower(d, inverse.high, inverse.high)},
      {hn::InterleaveUpper(d, inverse.low, inverse.low), hn::InterleaveUpper(d, inverse.high, inverse.high)}};
  for (i32 k = 0; k < 2; ++k) {
    const auto quotient = [&](Floats v) HWY_ATTR { return fitting_int(to_double(v) * by[k] + 0.5); };
    const Ints alpha = fitting_int(even[k] * 0.25f + 0.5f);
    const Ints front = hn::OddEven(quotient(even[k]).v, alpha.v), both = front | shifted_left<8>(quotient(odd[k]));
    const hn::Rebind<u16, Tag<i32>> narrow;
    hn::StoreU(hn::TruncateTo(narrow, hn::BitCast(hn::Rebind<u32, Tag<i32>>(), both.v)), narrow,
               reinterpret_cast<u16*>(dst + k * (lane_count() / 2)));
  }
}
HWY_INLINE bool weighted_means(const Pairs<ZR_Pixel8>& at, ZR_Pixel8* dst, Ints* alphas) {
  constexpr i32 pixels = lane_count() / 2;
  const Words words;
  const Bytes bytes;
  const Tag<i32> ints;
  const Tag<f32> numbers;
  // A channel of both pixels of a pair together, alpha and green in even bytes and red and blue in odd ones.
  alignas(16) static constexpr u8 channels[16] = {0, 1, 4, 5, 2, 3, 6, 7, 8, 9, 12, 13, 10, 11, 14, 15};
  alignas(16) static constexpr u8 weights[16] = {0, 128, 4, 128, 0, 128, 4, 128, 8, 128, 12, 128, 8, 128, 12, 128};
  alignas(16) static constexpr f32 halves[4] = {Quotients8::alpha_half, Quotients8::colour_half, Quotients8::alpha_half,
                                                Quotients8::colour_half};
  const auto add = [&](i32 row, i32 i, Ints& even, Ints& odd) HWY_ATTR {
    const auto v = hn::LoadU(bytes, reinterpret_cast<const u8*>(at.row(row) + 2 * i));
    const Ints weight = hn::BitCast(ints, hn::TableLookupBytesOr0(v, hn::LoadDup128(bytes, weights)));
    const auto channel = hn::BitCast(words, hn::TableLookupBytes(v, hn::LoadDup128(bytes, channels)));
    const hn::Rebind<u16, Words> unsigned_words;
    const Ints even_weight = hn::OddEven(weight.v, hn::Set(ints, 0x10001));
    even = even + pair_products(hn::And(channel, hn::Set(words, i16{255})), hn::BitCast(words, even_weight.v));
    odd = odd + pair_products(hn::BitCast(words, hn::ShiftRight<8>(hn::BitCast(unsigned_words, channel))),
                              hn::BitCast(words, weight.v));
  };
  Floats even[2], odd[2];
  for (i32 k = 0; k < 2; ++k) {
    Ints e(0), o(0);
    add(0, k * pixels, e, o);
    add(1, k * pixels, e, o);
    even[k] = to_float(e), odd[k] = to_float(o);
  }
  const Floats totals = at_least(hn::OddEven(hn::DupEven(even[1].v), even[0].v), 0.5f), inverse = inverse_of(totals);
  const Floats by[2] = {hn::DupEven(inverse.v), hn::DupOdd(inverse.v)};
  Quotients8 quotients;
  Ints total(0);
  for (i32 k = 0; k < 2; ++k) {
    const Floats even_by = hn::OddEven(by[k].v, hn::Set(numbers, 0.25f));
    const Ints front = quotients.rounded(even[k], even_by, hn::LoadDup128(numbers, halves));
    const Ints back = quotients.rounded(odd[k], by[k], Quotients8::colour_half);
    const Tag<u16> d;
    const auto both = hn::OddEven(hn::BitCast(d, back.v), hn::BitCast(d, shifted_right_unsigned<16>(front).v));
    const hn::Rebind<u8, Tag<u16>> narrow;
    hn::StoreU(hn::TruncateTo(narrow, both), narrow, reinterpret_cast<u8*>(dst + k * pixels));
    alignas(16) static constexpr i32 alpha[4] = {255, 0, 255, 0};
    total = total + (Ints(hn::BitCast(ints, both)) & hn::LoadDup128(ints, alpha));
  }
  *alphas = total;
  if (quotients.unsure()) divide_by_doubles(even, odd, totals, dst);
  return true;
}

// 16 bits. Sums of alpha * (colour - 16384) lie within 2^31, and all is exact modulo 2^32. What single precision makes
// of a quotient is off by 7 * 2^-10 of a unit at most; made a little great, it is the rounded one or one more, and the
// remainder tells which of them. Channels above white give anything, and are looked for.
class Quotients16 {
 public:
  static constexpr f32 doubt = 0x1p-7f;
  HWY_INLINE Quotients16() : least_(hn::Set(Unsigned(), ~u32{0})), most_(hn::Zero(Tag<u16>())) {}
  HWY_INLINE void look_at(hn::Vec<Words> channels) { most_ = hn::Max(most_, hn::BitCast(Tag<u16>(), channels)); }
  // Colours; what lies in the first lane of four is left alone.
  HWY_INLINE Ints mended(Ints estimate, Ints sums) {
    const Unsigned u;
    alignas(16) static constexpr i32 colours[4] = {0, -1, -1, -1};
    const Ints total = hn::Broadcast<0>(sums.v);
    // Negative where the estimate is one more; 0 at a tie, where it never is, and in clear squares.
    const Ints remainder = sums + shifted_right<1>(total) - (estimate - 16384) * total;
    least_ = hn::Min(least_, hn::BitCast(u, remainder.v));
    return estimate + (shifted_right<31>(remainder) & hn::LoadDup128(Tag<i32>(), colours));
  }
  HWY_INLINE bool unsure() const {
    return !hn::AllTrue(Unsigned(), hn::Gt(least_, hn::Zero(Unsigned()))) ||
           !hn::AllFalse(Tag<u16>(), hn::Gt(most_, hn::Set(Tag<u16>(), u16{32768})));
  }

 private:
  using Unsigned = hn::Rebind<u32, Tag<i32>>;
  hn::Vec<Unsigned> least_;
  hn::Vec<Tag<u16>> most_;
};
HWY_INLINE bool weighted_means(const Pairs<ZR_Pixel16>& at, ZR_Pixel16* dst, Ints* alphas) {
  constexpr i32 pixels = lane_count() / 4;
  const Words words;
  const Bytes bytes;
  const Tag<i32> ints;
  const Tag<f32> numbers;
  alignas(16) static constexpr i16 middle[8] = {0, 16384, 16384, 16384, 0, 16384, 16384, 16384};
  // A channel of both pixels of a pair together, and their alphas to each; -1 to alpha itself, as all is negative.
  alignas(16) static constexpr u8 channels[16] = {0, 1, 8, 9, 2, 3, 10, 11, 4, 5, 12, 13, 6, 7, 14, 15};
  alignas(16) static constexpr u8 weights[16] = {128, 128, 128, 128, 0, 1, 8, 9, 0, 1, 8, 9, 0, 1, 8, 9};
  alignas(16) static constexpr i16 minus_one[8] = {-1, -1, 0, 0, 0, 0, 0, 0};
  constexpr f32 colour_half = 16384.5f + Quotients16::doubt;
  alignas(16) static constexpr f32 quarter[4] = {0.25f, 0, 0, 0};
  alignas(16) static constexpr f32 halves[4] = {0.5f, colour_half, colour_half, colour_half};
  Quotients16 quotients;
  const auto sums_of = [&](i32 row, i32 i) HWY_ATTR {
    const auto v = hn::LoadU(words, reinterpret_cast<const i16*>(at.row(row) + 2 * i));
    quotients.look_at(v);
    const auto turned = hn::BitCast(bytes, hn::Sub(hn::LoadDup128(words, middle), v));
    const auto channel = hn::BitCast(words, hn::TableLookupBytes(turned, hn::LoadDup128(bytes, channels)));
    const auto weight = hn::BitCast(words, hn::TableLookupBytesOr0(turned, hn::LoadDup128(bytes, weights)));
    return pair_products(channel, hn::Or(weight, hn::LoadDup128(words, minus_one)));
  };
  Ints sums[4];
  Floats real[4];
  for (i32 k = 0; k < 4; ++k) {
    sums[k] = sums_of(0, k * pixels) + sums_of(1, k * pixels);
    real[k] = to_float(sums[k]);
  }
  const hn::Repartition<u64, Tag<f32>> both;
  const auto totals_of = [&](Floats a, Floats b)
                             HWY_ATTR { return hn::BitCast(both, hn::InterleaveLower(numbers, a.v, b.v)); };
  const Floats totals =
      hn::BitCast(numbers, hn::InterleaveLower(both, totals_of(real[0], real[1]), totals_of(real[2], real[3])));
  // Squares of white fit no sum, and those of any opaque pixels have ties enough.
  if (!none(totals >= 4 * 32768.0f)) return false;
  const Floats inverse = inverse_of(at_least(totals, 0.5f));
  const Floats by[4] = {hn::Broadcast<0>(inverse.v), hn::Broadcast<1>(inverse.v), hn::Broadcast<2>(inverse.v),
                        hn::Broadcast<3>(inverse.v)};
  const auto is_alpha = hn::Gt(hn::LoadDup128(numbers, quarter), hn::Zero(numbers));
  for (i32 k = 0; k < 4; ++k) {
    const Floats factor = hn::IfThenElse(is_alpha, hn::LoadDup128(numbers, quarter), by[k].v);
    const Ints estimate = fitting_int(mul_add(real[k], factor, hn::LoadDup128(numbers, halves)));
    store_channels(quotients.mended(estimate, sums[k]), dst + k * pixels);
  }
  *alphas = channel_of<0>(load_pixels<ZR_Pixel16>(dst));
  return !quotients.unsure();
}

// Floats: as the sampler does it, so that all is sure. Products of floats need no rounding.
HWY_INLINE bool weighted_means(const Pairs<ZR_PixelFloat>& at, ZR_PixelFloat* dst, Ints* alphas) {
  constexpr i32 pixels = DoubleSquares::pixels;
  const Tag<f64> d;
  const hn::Rebind<i64, Tag<f64>> whole;
  const auto place = hn::Iota(whole, 0), first = hn::And(place, hn::Set(whole, ~i64{3}));
  const auto is_alpha = hn::RebindMask(d, hn::Eq(place, first));
  // Number k of each four in the place of all.
  const auto spread = [&](auto v, i64 k) HWY_ATTR {
    return hn::TableLookupLanes(v, hn::IndicesFromVec(d, hn::Add(first, hn::Set(whole, k))));
  };
  const auto zero = hn::Zero(d), one = hn::Set(d, 1.0), quarter = hn::Set(d, 0.25);
  const auto limited = [&](auto v) HWY_ATTR { return hn::IfThenElse(hn::Gt(v, one), one, v); };  // NaN stays
  Doubles means;
  for (i32 i = 0; i < lane_count(); i += 4 * pixels) {
    hn::Vec<Tag<f64>> sums[4];
    for (i32 v = 0; v < 4; ++v) {
      const DoubleSquares square(at, i + v * pixels);
      sums[v] = zero;
      for (const auto& p : square.pixel) sums[v] = hn::MulAdd(p, hn::IfThenElse(is_alpha, one, spread(p, 0)), sums[v]);
    }
    // Alphas of four vectors in one.
    const auto front = hn::InterleaveLower(d, sums[0], sums[1]), back = hn::InterleaveLower(d, sums[2], sums[3]);
    const auto totals = hn::OddEvenBlocks(hn::SwapAdjacentBlocks(back), front), inverse = hn::Div(one, totals);
    const auto alpha = hn::Mul(totals, quarter);
    (i == 0 ? means.low : means.high) = limited(alpha);
    const bool plain = hn::AllFalse(d, hn::Or(hn::Eq(totals, zero), hn::Gt(alpha, one)));
    for (i32 v = 0; v < 4; ++v) {
      auto mean = hn::Mul(sums[v], hn::IfThenElse(is_alpha, quarter, spread(inverse, v)));
      if (!plain) {
        mean = hn::IfThenElse(is_alpha, limited(mean), mean);
        mean = hn::IfThenZeroElse(hn::Eq(spread(sums[v], 0), zero), mean);
      }
      DoubleSquares::store(mean, dst + i + v * pixels);
    }
  }
  *alphas = as_ints(narrowed(means));
  return true;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
