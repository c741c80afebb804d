// Rows of a layer that moves, on lanes.
#include "sample/moved_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_moved.cc"
#include <hwy/foreach_target.h>

#include "simd/lane_depth-inl.h"

// Where products are added with one rounding and reciprocals are known to 11 bits.
#undef ZR_MOVES_ON_LANES
#define ZR_MOVES_ON_LANES (ZR_HAS_LANES && (HWY_TARGET == HWY_AVX2 || HWY_TARGET == HWY_AVX3))

#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

#if ZR_MOVES_ON_LANES
HWY_INLINE Floats multiply_add(Floats a, Floats b, Floats c) { return hn::MulAdd(a.v, b.v, c.v); }

// Colours times alpha: whole numbers, or sums of them.
struct Planes {
  Floats v[3];

  HWY_INLINE void store(f32* to) const {
    for (i32 k = 0; k < 3; ++k) hn::StoreU(v[k].v, Tag<f32>(), to + k * lane_count());
  }
};
struct Pixels : Planes {
  Floats alpha;

  Pixels() = default;
  explicit HWY_INLINE Pixels(const ZR_Pixel8* p) {
    const Tag<i32> d;
    const Ints words = hn::LoadU(d, reinterpret_cast<const i32*>(p));
    const hn::Repartition<u8, Tag<i32>> bytes;
    const auto moved_down = [&](i32 place) HWY_ATTR {  // a byte of each word, and zeros
      const Ints of_word = shifted_left<2>(masked(hn::Iota(d, 0), 3)) + (place - 0x7f7f8000);
      return Ints(hn::BitCast(d, hn::TableLookupBytesOr0(hn::BitCast(bytes, words.v), hn::BitCast(bytes, of_word.v))));
    };
    const hn::Rebind<u32, Tag<i32>> unsigned_words;
    alpha = to_float(masked(words, 255));
    v[0] = to_float(moved_down(1)) * alpha;
    v[1] = to_float(moved_down(2)) * alpha;
    v[2] = to_float(Ints(hn::BitCast(d, hn::ShiftRight<24>(hn::BitCast(unsigned_words, words.v))))) * alpha;
  }
};
// Lane i holds what lane i + 1 did; the last one is the first of `next`.
HWY_INLINE Floats one_on(Floats here, Floats next) {
  using V = Floats::V;
#if HWY_TARGET == HWY_AVX3
  return V{
      _mm512_castsi512_ps(_mm512_alignr_epi32(_mm512_castps_si512(next.v.raw), _mm512_castps_si512(here.v.raw), 1))};
#else
  const __m256i low = _mm256_castps_si256(here.v.raw);
  const __m256i middle = _mm256_permute2x128_si256(low, _mm256_castps_si256(next.v.raw), 0x21);
  return V{_mm256_castsi256_ps(_mm256_alignr_epi8(middle, low, 4))};
#endif
}

// Calls use(k, left alphas, right alphas, sums sideways) for each vector of a part.
template <class Use>
HWY_INLINE void each_sum(const MovedPart& part, f32 right, Use use) {
  constexpr i32 lanes = lane_count();
  const Floats weight(right);
  Pixels here(part.row);
  for (i32 k = 0; k < part.vectors; ++k) {
    const ZR_Pixel8* const at = part.row + k * lanes;
    Pixels next;
    Planes sums;
    Floats right_alpha;
    if (part.readable - k * lanes >= 2 * lanes) {
      next = Pixels(at + lanes);
      right_alpha = one_on(here.alpha, next.alpha);
      for (i32 i = 0; i < 3; ++i) sums.v[i] = multiply_add(one_on(here.v[i], next.v[i]), weight, here.v[i]);
    } else {
      next = Pixels(at + 1);
      right_alpha = next.alpha;
      for (i32 i = 0; i < 3; ++i) sums.v[i] = multiply_add(next.v[i], weight, here.v[i]);
    }
    use(k, here.alpha, right_alpha, sums);
    here = next;
  }
}

void keep_sums(const MovedPart& part, const MovedPhase& phase) {
  each_sum(part, phase.right,
           [&](i32 k, Floats, Floats, const Planes& sums) HWY_ATTR { sums.store(part.sums + k * 3 * lane_count()); });
}

// Alphas alone.
HWY_INLINE Floats alphas_of(const ZR_Pixel8* p) {
  return to_float(masked(hn::LoadU(Tag<i32>(), reinterpret_cast<const i32*>(p)), 255));
}

u64 mix_rows(const MovedPart& part, const MovedPhase& phase, const ZR_Pixel8* upper, RowSum<ZR_Pixel8>* sum,
             ZR_Pixel8* dst) {
  constexpr i32 lanes = lane_count();
  const Tag<i32> d;
  const hn::Repartition<u16, Tag<i32>> halves;
  const Floats below(phase.below), least(phase.least_alpha), scale(phase.scale);
  const Floats w[4] = {phase.weights.w00, phase.weights.w10, phase.weights.w01, phase.weights.w11};
  // Half a step for rounding, and the error: what is then two errors or more above a step is above it for certain, and
  // below the next.
  const Floats rounding(32768.0f + moved_error);
  Ints alphas = 0;
  u64 left = 0;
  each_sum(part, phase.right, [&](i32 k, Floats left_alpha, Floats right_alpha, const Planes& lower) HWY_ATTR {
    f32* const kept = part.sums + k * 3 * lanes;
    Floats mixed[3];
    for (i32 i = 0; i < 3; ++i)
      mixed[i] = multiply_add(lower.v[i], below, Floats(hn::LoadU(Tag<f32>(), kept + i * lanes)));
    lower.store(kept);
    const Floats total = (w[0] * alphas_of(upper + k * lanes) + w[1] * alphas_of(upper + k * lanes + 1)) +
                         (w[2] * left_alpha + w[3] * right_alpha);  // as the sampler adds them
    const Floats estimate = hn::ApproximateReciprocal(total.v);
    const Floats rest = hn::NegMulAdd(total.v, estimate.v, Floats(1.0f).v);
    const Floats inverse = multiply_add(estimate, rest, estimate) * scale;
    const Ints red = fitting_int(multiply_add(mixed[0], inverse, rounding));
    const Ints green = fitting_int(multiply_add(mixed[1], inverse, rounding));
    const Ints blue = fitting_int(multiply_add(mixed[2], inverse, rounding));
    const auto half = [&](Ints v) HWY_ATTR { return hn::BitCast(halves, v.v); };
    const auto nearest = hn::Min(half(red), hn::Min(half(green), half(blue)));
    constexpr i32 certain = 65536 - 2 * moved_error;
    const Ints fractions = masked(Ints(hn::BitCast(d, nearest)), certain);
    left |= u64{!all(of_ints(total >= least) && fractions != 0)} << k;
    const Ints alpha = fitting_int(total + 0.5f);
    const auto outer = hn::OddEven(half(green), half(alpha));
    const auto inner = hn::OddEven(half(blue), half(shifted_right<16>(red)));
    hn::StoreU(hn::BitCast(d, hn::Or(outer, hn::ShiftLeft<8>(inner))), d, reinterpret_cast<i32*>(dst + k * lanes));
    alphas = alphas + alpha;
  });
  *sum += static_cast<u32>(hn::GetLane(hn::SumOfLanes(d, alphas.v)));
  return left;
}

void kinds_of(i32 vectors, const ZR_Pixel8* row, MovedKind* kinds) {
  constexpr i32 lanes = lane_count();
  const Tag<i32> d;
  const auto words = [&](i32 pixel) HWY_ATTR { return Ints(hn::LoadU(d, reinterpret_cast<const i32*>(row + pixel))); };
  const auto kind = [](Ints any, Ints every) HWY_ATTR {
    return all(masked(any, 255) == 0)       ? MovedKind::clear
           : all(masked(every, 255) == 255) ? MovedKind::opaque
                                            : MovedKind::any;
  };
  for (i32 first = 0; first < vectors; first += moved_block, ++kinds) {
    const i32 end = std::min(first + moved_block, vectors);
    Ints any = words(first * lanes), every = any;
    *kinds = kind(any, any);
    if (*kinds == MovedKind::any) continue;
    for (i32 k = first + 1; k <= end; ++k) {
      const Ints more = words(k * lanes - (k == end ? lanes - 1 : 0));
      any = hn::Or(any.v, more.v), every = hn::And(every.v, more.v);
    }
    *kinds = kind(any, every);
  }
}

const LaneMoved* moved() {
  static constexpr LaneMoved rows = {lane_count(), &kinds_of, &keep_sums, &mix_rows};
  return &rows;
}
#else
const LaneMoved* moved() { return nullptr; }
#endif

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_CHOICE(const LaneMoved*, moved)
#endif
