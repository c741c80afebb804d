// Lots of a row, a vector at a time: what next_seed and random_number give one after the other.
//
// With f the factor, m the modulus, s the step and h the high factor of seeds, m = s f - h, and next_seed(u) is
// congruent to f u and lies below 2 m. Where every lane draws, each lane's seed is f times the one before it plus 1, so
// that the residue u of all of them follows from the first. Whether a seed is u or u + m is left: to add m to a seed
// takes h from its remainder by s and adds f to its quotient, which leaves f * remainder + h * quotient as it is, save
// where the remainder is less than h and borrows s from the quotient, which adds m. So a seed comes to u + m where
// the step to it makes it so from a residue, or hands on that the seed before it was: the carries of a sum.
#if defined(ZR_COMPOSITE_LANE_LOTS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_LANE_LOTS_INL_H
#undef ZR_COMPOSITE_LANE_LOTS_INL_H
#else
#define ZR_COMPOSITE_LANE_LOTS_INL_H
#endif

#include "simd/lanes-inl.h"
#include "world/random.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// The residue of the seed that lane i meets is power * first + sum; of even and of odd lanes.
struct SeedPowers {
  u64 power[2][lane_count() / 2], sum[2][lane_count() / 2];
  u64 last_power, last_sum;  // of the lane behind the vector
};
inline constexpr SeedPowers seed_powers = [] {
  SeedPowers powers{};
  u64 power = 1, sum = 0;
  for (i32 i = 0; i < lane_count(); ++i) {
    powers.power[i % 2][i / 2] = power;
    powers.sum[i % 2][i / 2] = sum;
    power = power * seed_factor % seed_modulus;
    sum = (sum * seed_factor + 1) % seed_modulus;
  }
  powers.last_power = power;
  powers.last_sum = sum;
  return powers;
}();

class Lots {
 public:
  HWY_INLINE explicit Lots(i32 seed) : residue_(static_cast<u32>(seed)) {}

  // Steps over pixels that draw none.
  HWY_INLINE void skip(i32 count) { residue_ += static_cast<u32>(count); }
  // For those of `count` lanes whose bits are set.
  HWY_INLINE Ints drawn(u32 bits, i32 count) {
    return bits == every_lane && in_range() ? drawn_by_all() : drawn_by_some(bits, count);
  }

 private:
  using Seeds = Tag<u64>;
  using V = hn::Vec<Seeds>;
  using W = hn::Vec<Tag<u32>>;
  static constexpr u32 every_lane = (1u << lane_count()) - 1;

  // Whether the seed is 1 to 2 m - 1, with its residue apart. 0 is followed by another seed than its multiple.
  HWY_INLINE bool in_range() {
    if (residue_ >= seed_modulus) {
      residue_ -= seed_modulus;
      ++above_;
    }
    return residue_ < seed_modulus && above_ <= 1 && (residue_ | above_) != 0;
  }

  HWY_INLINE Ints drawn_by_some(u32 bits, i32 count) {
    HWY_ALIGN i32 lots[lane_count()] = {};
    u32 next = residue_ + above_ * seed_modulus;
    for (i32 i = 0; i < count; ++i, ++next)
      if ((bits >> i & 1) != 0) lots[i] = random_number(next = next_seed(next));
    residue_ = next;
    above_ = 0;
    return hn::Load(Tag<i32>(), lots);
  }

  HWY_INLINE Ints drawn_by_all() {
    const Tag<u32> d;
    const Step even = step_from(residue_in_lanes(0)), odd = step_from(residue_in_lanes(1));
    const W next = joined(even.next, odd.next), rest = joined(even.rest, odd.rest);
    const auto borrows = hn::Lt(rest, hn::Set(d, seed_high_factor));
    const u32 hands_on = bits_of(borrows), makes = bits_of(hn::Gt(next, hn::Set(d, seed_modulus - 2)));
    const u32 either = hands_on | makes, carries = (either + makes + above_) ^ either ^ makes;
    const W mended = hn::Add(next, hn::IfThenElseZero(mask_of(hands_on & carries), hn::Set(d, seed_modulus)));
    residue_ = static_cast<u32>((residue_ * seed_powers.last_power + seed_powers.last_sum) % seed_modulus);
    above_ = carries >> lane_count();
    return masked(hn::BitCast(Tag<i32>(), hn::ShiftRight<7>(mended)), 0x7fff);
  }

  static HWY_INLINE V product(V a, u32 k) { return hn::MulEven(hn::BitCast(Tag<u32>(), a), hn::Set(Tag<u32>(), k)); }
  static HWY_INLINE W joined(V even, V odd) {
    const Tag<u32> d;
    return hn::OddEven(hn::DupEven(hn::BitCast(d, odd)), hn::BitCast(d, even));
  }

  // Of less than 2^62. 2^62 / m is less than 1/32 above `magic`, so that the quotient is too small by less than
  // 1/2 + 1/32 + 1, for what both shifts and the magic cut off: what is left is below 2 m, which is less than 2^32.
  HWY_INLINE V residue_in_lanes(int odd) const {
    const Seeds d;
    constexpr u64 range = u64{1} << 62, magic = range / seed_modulus;
    static_assert(range % seed_modulus < seed_modulus / 32 && magic < u64{1} << 32);
    const W powers = hn::BitCast(Tag<u32>(), hn::LoadU(d, seed_powers.power[odd]));
    const V all = hn::Add(hn::MulEven(hn::Set(Tag<u32>(), residue_), powers), hn::LoadU(d, seed_powers.sum[odd]));
    const V quotient = hn::ShiftRight<32>(product(hn::ShiftRight<30>(all), static_cast<u32>(magic)));
    const W rest = hn::BitCast(Tag<u32>(), hn::Sub(all, product(quotient, seed_modulus)));  // in the lower halves
    return hn::BitCast(d, hn::Min(rest, hn::Sub(rest, hn::Set(Tag<u32>(), seed_modulus))));
  }

  struct Step {
    V next, rest;  // the seed that follows a residue, and the remainder of the residue by the step
  };
  // magic * step is above 2^47 by less than the step, which is less than 2^16: for residues below 2^31 that adds
  // less than 1 / step to a quotient.
  static HWY_INLINE Step step_from(V residue) {
    constexpr u64 magic = (u64{1} << 47) / seed_step + 1;
    static_assert(seed_modulus < 1u << 31 && seed_step < 1u << 16 && magic < u64{1} << 32);
    const V quotient = hn::ShiftRight<47>(product(residue, static_cast<u32>(magic)));
    const V rest = hn::Sub(residue, product(quotient, seed_step));
    return {hn::Add(product(rest, seed_factor), product(quotient, seed_high_factor)), rest};
  }

  static HWY_INLINE u32 bits_of(hn::Mask<Tag<u32>> mask) {
    u8 bytes[8] = {};
    hn::StoreMaskBits(Tag<u32>(), mask, bytes);
    return static_cast<u32>(bytes[0]) | static_cast<u32>(bytes[1]) << 8;
  }
  static HWY_INLINE hn::Mask<Tag<u32>> mask_of(u32 bits) {
    const u8 bytes[8] = {static_cast<u8>(bits), static_cast<u8>(bits >> 8)};
    return hn::LoadMaskBits(Tag<u32>(), bytes);
  }

  // The seed is residue_ + above_ * m.
  u32 residue_, above_ = 0;
};

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
