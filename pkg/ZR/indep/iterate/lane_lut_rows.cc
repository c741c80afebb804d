// Byte tables over rows, on lanes where the processor has them.
#include "iterate/lane_lut_rows.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <functional>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "iterate/lane_lut_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

using Bytes = hn::Vec<Tag<u8>>;

// A step is 16 entries for the low bits of a byte; it answers 0 where the high bits lie before it.
HWY_INLINE Bytes looked_up(Bytes v, const u8 (&steps)[2][8][16]) {
  const Tag<u8> d;
  Bytes place = hn::And(v, hn::Set(d, 127));
  const auto entries = [&](int half, int k)
                           HWY_ATTR { return hn::TableLookupBytesOr0(hn::LoadDup128(d, steps[half][k]), place); };
  Bytes lower = entries(0, 0), upper = entries(1, 0);
  for (int k = 1; k < 8; ++k) {
    place = hn::Sub(place, hn::Set(d, 16));
    lower = hn::Xor(lower, entries(0, k));
    upper = hn::Xor(upper, entries(1, k));
  }
  const Tag<int8_t> signed_tag;
  const auto is_upper = hn::Lt(hn::BitCast(signed_tag, v), hn::Zero(signed_tag));
  return hn::IfThenElse(hn::RebindMask(d, is_upper), upper, lower);
}

// Four vectors of pixels to four vectors of channels and back, in the order alpha, red, green, blue.
HWY_INLINE void turn(Bytes (&v)[4]) {
  const hn::Repartition<u32, Tag<u8>> d32;
  const hn::Repartition<u64, Tag<u8>> d64;
  const auto low32 = [&](Bytes a, Bytes b) HWY_ATTR {
    return hn::BitCast(d64, hn::InterleaveLower(d32, hn::BitCast(d32, a), hn::BitCast(d32, b)));
  };
  const auto high32 = [&](Bytes a, Bytes b) HWY_ATTR {
    return hn::BitCast(d64, hn::InterleaveUpper(d32, hn::BitCast(d32, a), hn::BitCast(d32, b)));
  };
  const auto p = low32(v[0], v[1]), q = high32(v[0], v[1]), r = low32(v[2], v[3]), s = high32(v[2], v[3]);
  v[0] = hn::BitCast(Tag<u8>(), hn::InterleaveLower(d64, p, r));
  v[1] = hn::BitCast(Tag<u8>(), hn::InterleaveUpper(d64, p, r));
  v[2] = hn::BitCast(Tag<u8>(), hn::InterleaveLower(d64, q, s));
  v[3] = hn::BitCast(Tag<u8>(), hn::InterleaveUpper(d64, q, s));
}

inline bool lut_row(i64 n, const ByteTables::Steps* steps, const ZR_Pixel8* in, ZR_Pixel8* out) {
  const Tag<u8> d;
  alignas(16) static constexpr u8 by_channel[16] = {0, 4, 8, 12, 1, 5, 9, 13, 2, 6, 10, 14, 3, 7, 11, 15};
  const Bytes order = hn::LoadDup128(d, by_channel);
  constexpr i64 block = 4 * lane_count();
  const auto one = [&](const ZR_Pixel8* src, ZR_Pixel8* dst) HWY_ATTR {
    Bytes v[4];
    for (int k = 0; k < 4; ++k)
      v[k] = hn::TableLookupBytes(hn::LoadU(d, reinterpret_cast<const u8*>(src + k * lane_count())), order);
    turn(v);
    for (int channel = 0; channel < 4; ++channel)
      if (steps[channel].changes) v[channel] = looked_up(v[channel], steps[channel].steps);
    turn(v);
    for (int k = 0; k < 4; ++k)
      hn::StoreU(hn::TableLookupBytes(v[k], order), d, reinterpret_cast<u8*>(dst + k * lane_count()));
  };
  i64 i = 0;
  for (; i <= n - block; i += block) one(in + i, out + i);
  if (i < n) {
    ZR_Pixel8 rest[block] = {};
    const auto bytes = static_cast<std::size_t>(n - i) * sizeof(ZR_Pixel8);
    std::memcpy(rest, in + i, bytes);
    one(rest, rest);
    std::memcpy(out + i, rest, bytes);
  }
  return true;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {
namespace {

constexpr std::array<u8, 256> identity = [] {
  std::array<u8, 256> table{};
  for (u32 i = 0; i < table.size(); ++i) table[i] = static_cast<u8>(i);
  return table;
}();

bool lane_row(i64 n, const ByteTables::Steps* steps, const ZR_Pixel8* in, ZR_Pixel8* out) {
  ZR_RETURN_BEST(lut_row(n, steps, in, out));
  return false;
}

// Written before it is read: then the order of pixels is part of the result.
bool runs_into(const ZR_Pixel8* read, const ZR_Pixel8* written, i64 n) {
  return std::less<>()(read, written) && std::less<>()(written, read + n);
}

}  // namespace

ByteTables::ByteTables(const u8* alpha, const u8* red, const u8* green, const u8* blue)
    : tables_{alpha, red, green, blue} {
  for (u32 channel = 0; channel < 4; ++channel) {
    const u8*& table = tables_[channel];
    if (table == nullptr) table = identity.data();
    Steps& made = steps_[channel];
    made.changes = !std::equal(identity.begin(), identity.end(), table);
    u8* step = made.steps[0][0];
    for (u32 i = 0; i < 256; ++i) step[i] = static_cast<u8>(i % 128 < 16 ? table[i] : table[i] ^ table[i - 16]);
  }
}

void ByteTables::row(i64 n, const ZR_Pixel8* in, ZR_Pixel8* out) const {
  if (!runs_into(in, out, n) && lane_row(n, steps_, in, out)) return;
  const u8 *const a = tables_[0], *const r = tables_[1], *const g = tables_[2], *const b = tables_[3];
  for (i64 i = 0; i < n; ++i) {
    const ZR_Pixel8 p = in[i];
    out[i] = {a[p.alpha], r[p.red], g[p.green], b[p.blue]};
  }
}

}  // namespace zr
#endif
