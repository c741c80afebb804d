// Summed-area tables on lanes: a pixel's four sums are one vector. Processors with shorter vectors keep to single
// pixels, whose sums are two.
#include "sample/lane_summed.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_summed.cc"
#include <hwy/foreach_target.h>

#include <hwy/cache_control.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES && HWY_TARGET <= HWY_AVX2 && (defined(__x86_64__) || defined(__i386__))
#define ZR_SUMS_ON_LANES 1
#else
#define ZR_SUMS_ON_LANES 0
#endif

#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

#if ZR_SUMS_ON_LANES
using Quad = hn::FixedTag<f64, 4>;
using QuadV = hn::Vec<Quad>;

// 1 for alpha, whose lane is the first.
HWY_INLINE QuadV weighted(QuadV channels, QuadV factor) {
  return hn::Mul(channels, hn::IfThenElse(hn::FirstN(Quad(), 1), hn::Set(Quad(), 1.0), factor));
}
HWY_INLINE QuadV premultiplied(const ZR_Pixel8* p, const f64* parts) {
  const hn::FixedTag<u8, 4> d;
  const auto whole = hn::PromoteTo(hn::FixedTag<i32, 4>(), hn::LoadU(d, reinterpret_cast<const u8*>(p)));
  return weighted(hn::PromoteTo(Quad(), whole), hn::Set(Quad(), parts[p->alpha]));
}
HWY_INLINE QuadV premultiplied(const ZR_Pixel16* p, const f64*) {
  const hn::FixedTag<u16, 4> d;
  const auto whole = hn::PromoteTo(hn::FixedTag<i32, 4>(), hn::LoadU(d, reinterpret_cast<const u16*>(p)));
  const QuadV channels = hn::PromoteTo(Quad(), whole);
  return weighted(channels, hn::Set(Quad(), hn::GetLane(channels) * 0x1p-15));
}
HWY_INLINE QuadV premultiplied(const ZR_PixelFloat* p, const f64*) {
  const hn::FixedTag<f32, 4> d;
  const QuadV channels = hn::PromoteTo(Quad(), hn::LoadU(d, reinterpret_cast<const f32*>(p)));
  const QuadV alpha = hn::Set(Quad(), hn::GetLane(channels));
  return hn::IfThenZeroElse(hn::Eq(alpha, hn::Zero(Quad())), weighted(channels, alpha));
}

HWY_INLINE void put(QuadV v, ZR_PixelDouble* out) { hn::StoreU(v, Quad(), reinterpret_cast<f64*>(out)); }
HWY_INLINE void put(QuadV v, ZR_PixelFloat* out) {
  const hn::FixedTag<f32, 4> d;
  hn::StoreU(hn::DemoteTo(d, v), d, reinterpret_cast<f32*>(out));
}

// `rows` rows at once: the sums of one wait for those of the row above, which the processor works on meanwhile.
template <i32 rows, class T, class Entry>
HWY_INLINE void sum_rows(const ZR_World& world, i32 y, const f64* parts, f64* above, Entry* table) {
  constexpr i32 block = 16;  // few, so that divisions run beside the sums of the block before
  alignas(64) f64 inverse[rows][block];
  const Quad d;
  const Quad wide;
  const i32 width = world.width;
  const T* src[rows];
  Entry* out[rows];
  QuadV left[rows], corner[rows];
  for (i32 r = 0; r < rows; ++r) {
    src[r] = reinterpret_cast<const T*>(static_cast<const char*>(world.data) +
                                        static_cast<std::ptrdiff_t>(y + r) * world.row_bytes);
    out[r] = table + static_cast<std::ptrdiff_t>(y + r) * width;
    left[r] = corner[r] = hn::Zero(d);
  }
  for (i32 first = 0; first < width; first += block) {
    const i32 end = std::min(first + block, width);
    for (i32 r = 0; r < rows; ++r) {
      auto columns = hn::Add(hn::Iota(wide, 1.0), hn::Set(wide, static_cast<f64>(first)));
      for (i32 k = 0; k < block; k += static_cast<i32>(hn::Lanes(wide))) {
        hn::Store(hn::Div(hn::Set(wide, 1.0), hn::Mul(columns, hn::Set(wide, y + r + 1.0))), wide, inverse[r] + k);
        columns = hn::Add(columns, hn::Set(wide, static_cast<f64>(hn::Lanes(wide))));
      }
    }
    for (i32 x = first; x < end; ++x) {
      f64* const cell = above + static_cast<std::size_t>(x) * 4;
      QuadV upper = hn::LoadU(d, cell);
      for (i32 r = 0; r < rows; ++r) {
        const QuadV sum = hn::Sub(hn::Add(hn::Add(premultiplied(src[r] + x, parts), left[r]), upper), corner[r]);
        corner[r] = upper;
        upper = left[r] = sum;
        put(hn::Mul(hn::Set(d, inverse[r][x - first]), sum), out[r] + x);
      }
      hn::StoreU(upper, d, cell);
    }
  }
}

template <class T, class Entry>
void sum_world(const ZR_World& world, f64* above, Entry* table) {
  f64 parts[256];
  if constexpr (sizeof(T) == 4)
    for (i32 a = 0; a < 256; ++a) parts[a] = a / 255.0;
  constexpr i32 rows = 4;
  i32 y = 0;
  for (; world.height - y >= rows; y += rows) sum_rows<rows, T>(world, y, parts, above, table);
  for (; y < world.height; ++y) sum_rows<1, T>(world, y, parts, above, table);
  hwy::FlushStream();
}
#endif

template <class T, class Entry>
SumWorldFunc<Entry>* world_sums() {
#if ZR_SUMS_ON_LANES
  return &sum_world<T, Entry>;
#else
  return nullptr;
#endif
}

#define ZR_INSTANTIATE(T)                                               \
  template SumWorldFunc<ZR_PixelFloat>* world_sums<T, ZR_PixelFloat>(); \
  template SumWorldFunc<ZR_PixelDouble>* world_sums<T, ZR_PixelDouble>();
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif
#undef ZR_SUMS_ON_LANES

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class T, class Entry>
SumWorldFunc<Entry>* lane_world_sums() {
  ZR_RETURN_BEST(world_sums<T, Entry>());
  return nullptr;
}

#define ZR_INSTANTIATE(T)                                                    \
  template SumWorldFunc<ZR_PixelFloat>* lane_world_sums<T, ZR_PixelFloat>(); \
  template SumWorldFunc<ZR_PixelDouble>* lane_world_sums<T, ZR_PixelDouble>();
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace zr
#endif
