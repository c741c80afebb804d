// Premultiply and unmultiply rows on lanes.
#include "world/lane_premul_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "world/lane_premul_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "simd/lane_bytes-inl.h"
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T>
struct PixelMath : Primitive<T> {
  using Wide = Number<T>;
};

template <class T, bool back>
i32 row(i32 n, const T* src, T* dst) {
  using M = PixelMath<T>;
  using Wide = Number<T>;
  const PremulRows<T>& rows = single_premul_rows<T>();
  const auto idle = [](const Px<M>& p) HWY_ATTR { return all(p.alpha == M::white); };
  return change_row<AlikePack<T>, T, M>(
      n, src, dst, back ? rows.unmul : rows.premul, idle, [](const Px<M>& p) HWY_ATTR {
        const auto one = [&](Wide c) HWY_ATTR { return back ? M::div(c, p.alpha) : M::mul(c, p.alpha); };
        return Px<M>{p.alpha, one(p.red), one(p.green), one(p.blue)};
      });
}

// Products of 8-bit channels need no pixels taken apart: alpha and green lie in the 16-bit lanes of one vector of
// words, red and blue in those of another. Alpha is multiplied by white. No channel is illegal.
struct Words {
  static constexpr i32 vectors = 2, pixels = vectors * lane_count();
};
template <>
i32 row<ZR_Pixel8, false>(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  using M = Primitive<NarrowPixel8>;
  const ZR_Pixel8* const in = src != nullptr ? src : dst;
  if (runs_into(in, dst, n)) return single_premul_rows<ZR_Pixel8>().premul(n, src, dst);
  each_block<Words, ZR_Pixel8>(
      n, in, nullptr, dst, [&](const ZR_Pixel8* s, const ZR_Pixel8*, ZR_Pixel8* d, i32) HWY_ATTR {
        const PairTag tag;
        const auto shorts = [](Pairs v) HWY_ATTR { return Shorts(hn::BitCast(Tag<i16>(), v)); };
        for (i32 i = 0; i < Words::vectors; ++i, s += lane_count(), d += lane_count()) {
          const Pairs words = hn::LoadU(tag, reinterpret_cast<const u32*>(s)),
                      alpha = hn::And(words, hn::Set(tag, 255));
          if (in == dst && hn::AllTrue(tag, hn::Eq(alpha, hn::Set(tag, 255)))) continue;
          const Pairs above = hn::ShiftLeft<16>(alpha), low = hn::Set(tag, 0x00ff00ff);
          const Shorts ag = M::mul(shorts(hn::And(words, low)), shorts(hn::Or(above, hn::Set(tag, 255))));
          const Shorts rb = M::mul(shorts(hn::And(hn::ShiftRight<8>(words), low)), shorts(hn::Or(above, alpha)));
          hn::StoreU(hn::Or(pairs_of(ag.v), hn::ShiftLeft<8>(pairs_of(rb.v))), tag, reinterpret_cast<u32*>(d));
        }
      });
  return 0;
}

template <class T>
const PremulRows<T>* premul_rows() {
  static constexpr PremulRows<T> rows = {&row<T, false>, &row<T, true>};
  return &rows;
}
ZR_ROWS_OF_DEPTHS(const PremulRows, premul_rows)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(const PremulRows, premul_rows)
#endif
