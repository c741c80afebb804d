// Rows into linear light and back: integers on lanes where the processor has them.
#include "composite/linear_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "composite/linear_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T>
struct PixelMath : Primitive<T> {
  using Wide = Number<T>;
};

// Entries i and i + 1 of a table in one word. The last entry is followed by something in the tables' record.
HWY_INLINE Ints entry_pair(const u16* table, Ints i) {
  return hn::GatherOffset(Tag<i32>(), reinterpret_cast<const i32*>(table), shifted_left<1>(i).v);
}
HWY_INLINE Ints second_of(Ints pair) {
  const hn::Rebind<u32, Tag<i32>> unsigned_tag;
  return hn::BitCast(Tag<i32>(), hn::ShiftRight<16>(hn::BitCast(unsigned_tag, pair.v)));
}
HWY_INLINE Ints capped(Ints v) { return hn::Min(v.v, Ints(32768).v); }

HWY_INLINE Ints to_linear_16(Ints channel, const ZR_LinearBlendingTables& tables) {
  const Ints t = capped(channel) * 255, between = masked(t, 0x7fff);
  const Ints pair = entry_pair(tables.to_linear, shifted_right<15>(t)), low = masked(pair, 65535);
  return low + pick(between == 0, 0, shifted_right<15>(between * (second_of(pair) - low) + 16384));
}
HWY_INLINE Ints from_linear_16(Ints channel, const ZR_LinearBlendingTables& tables) {
  const Ints v = capped(channel), between = masked(v, 7);
  const Ints pair = entry_pair(tables.from_linear, shifted_right<3>(v)), low = masked(pair, 65535);
  return low + pick(between == 0, 0, shifted_right<3>(between * (second_of(pair) - low) + 4));
}
HWY_INLINE Ints widen_8_to_16(Ints v) {
  const hn::Rebind<u32, Tag<i32>> unsigned_tag;
  const Ints t = v * 0x808080 + 33200;
  return hn::BitCast(Tag<i32>(), hn::ShiftRight<16>(hn::BitCast(unsigned_tag, t.v)));
}
HWY_INLINE Ints narrow_16_to_8(Ints v) { return shifted_right<15>(v * 255 + 16384); }

// Runs block(src, dst) for each vector of pixels, and for the rest on copies.
template <class From, class To, class Block>
HWY_INLINE void in_vectors(i32 n, const From* src, To* dst, Block block) {
  constexpr i32 lanes = lane_count();
  i32 i = 0;
  for (; i + lanes <= n; i += lanes) block(src + i, dst + i);
  if (i >= n) return;
  From in[lanes] = {};
  To out[lanes];
  std::memcpy(in, src + i, static_cast<std::size_t>(n - i) * sizeof(From));
  block(in, out);
  std::memcpy(dst + i, out, static_cast<std::size_t>(n - i) * sizeof(To));
}

template <class T>
void to_row(i32 n, const T* src, ZR_Pixel16* dst, const ZR_LinearBlendingTables& tables) {
  using M = PixelMath<T>;
  using Out = PixelMath<ZR_Pixel16>;
  in_vectors(n, src, dst, [&](const T* from, ZR_Pixel16* to) HWY_ATTR {
    const Px<M> p = load<M>(from);
    if constexpr (std::is_same_v<T, ZR_Pixel8>) {
      const auto one = [&](Ints v) HWY_ATTR { return masked(entry_pair(tables.to_linear, v), 65535); };
      store<Out>(Px<Out>{widen_8_to_16(p.alpha), one(p.red), one(p.green), one(p.blue)}, to);
    } else {
      const auto one = [&](Ints v) HWY_ATTR { return to_linear_16(v, tables); };
      store<Out>(Px<Out>{p.alpha, one(p.red), one(p.green), one(p.blue)}, to);
    }
  });
}

template <class T>
void from_row(i32 n, const ZR_Pixel16* src, T* dst, const ZR_LinearBlendingTables& tables) {
  using M = PixelMath<ZR_Pixel16>;
  using Out = PixelMath<T>;
  in_vectors(n, src, dst, [&](const ZR_Pixel16* from, T* to) HWY_ATTR {
    const Px<M> p = load<M>(from);
    const auto at_depth = [](Ints v) HWY_ATTR {
      if constexpr (std::is_same_v<T, ZR_Pixel8>)
        return narrow_16_to_8(v);
      else
        return v;
    };
    const auto one = [&](Ints v) HWY_ATTR { return at_depth(from_linear_16(v, tables)); };
    store<Out>(Px<Out>{at_depth(p.alpha), one(p.red), one(p.green), one(p.blue)}, to);
  });
}

template void to_row(i32, const ZR_Pixel8*, ZR_Pixel16*, const ZR_LinearBlendingTables&);
template void to_row(i32, const ZR_Pixel16*, ZR_Pixel16*, const ZR_LinearBlendingTables&);
template void from_row(i32, const ZR_Pixel16*, ZR_Pixel8*, const ZR_LinearBlendingTables&);
template void from_row(i32, const ZR_Pixel16*, ZR_Pixel16*, const ZR_LinearBlendingTables&);

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class T>
void to_linear_row(i32 n, const T* src, Linear<T>* dst, const ZR_LinearBlendingTables& tables) {
  if constexpr (!std::is_same_v<T, ZR_PixelFloat>) {
    ZR_RETURN_BEST(to_row(n, src, dst, tables));
  }
  for (i32 i = 0; i < n; ++i) dst[i] = to_linear(src[i], tables);
}
template <class T>
void from_linear_row(i32 n, const Linear<T>* src, T* dst, const ZR_LinearBlendingTables& tables) {
  if constexpr (!std::is_same_v<T, ZR_PixelFloat>) {
    ZR_RETURN_BEST(from_row(n, src, dst, tables));
  }
  for (i32 i = 0; i < n; ++i) dst[i] = from_linear<T>(src[i], tables);
}
#define ZR_INSTANTIATE(T)                                                                    \
  template void to_linear_row<T>(i32, const T*, Linear<T>*, const ZR_LinearBlendingTables&); \
  template void from_linear_row<T>(i32, const Linear<T>*, T*, const ZR_LinearBlendingTables&);
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace zr
#endif
