// Rows of chosen channels, on vectors of bytes.
#include "filter/plane_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "filter/lane_plane_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

using Bytes = hn::ScalableTag<u8>;
using ByteVector = hn::Vec<Bytes>;
constexpr i32 pixels = HWY_LANES(u8);

// The first `count` of the four vectors side by side, and apart again.
template <i32 count>
HWY_INLINE void store_packed(ByteVector a, ByteVector b, ByteVector c, u8* p) {
  const Bytes d;
  if constexpr (count == 1)
    hn::StoreU(a, d, p);
  else if constexpr (count == 2)
    hn::StoreInterleaved2(a, b, d, p);
  else
    hn::StoreInterleaved3(a, b, c, d, p);
}
template <i32 count>
HWY_INLINE void load_packed(const u8* p, ByteVector& a, ByteVector& b, ByteVector& c) {
  const Bytes d;
  if constexpr (count == 1)
    a = hn::LoadU(d, p);
  else if constexpr (count == 2)
    hn::LoadInterleaved2(d, p, a, b);
  else
    hn::LoadInterleaved3(d, p, a, b, c);
}

template <u32 planes>
struct Chosen {
  static constexpr i32 count = std::popcount(planes);
  // The channel that stands at `place` among the packed ones.
  static constexpr i32 channel(i32 place) {
    for (i32 c = 0; c < 4; ++c)
      if ((planes >> c & 1) != 0 && place-- == 0) return c;
    return 0;
  }
};

template <u32 planes>
void extract(i32 n, const ZR_Pixel8* row, u8* packed) {
  using C = Chosen<planes>;
  i32 i = 0;
  for (; i <= n - pixels; i += pixels) {
    ByteVector v[4];
    hn::LoadInterleaved4(Bytes(), reinterpret_cast<const u8*>(row + i), v[0], v[1], v[2], v[3]);
    store_packed<C::count>(v[C::channel(0)], v[C::channel(1)], v[C::channel(2)], packed + std::ptrdiff_t{i} * C::count);
  }
  single_plane_rows().extract(planes, n - i, row + i, packed + std::ptrdiff_t{i} * C::count);
}

template <u32 planes>
void insert(i32 n, const u8* packed, ZR_Pixel8* row) {
  using C = Chosen<planes>;
  i32 i = 0;
  for (; i <= n - pixels; i += pixels) {
    ByteVector v[4], w[3];
    u8* const p = reinterpret_cast<u8*>(row + i);
    hn::LoadInterleaved4(Bytes(), p, v[0], v[1], v[2], v[3]);
    load_packed<C::count>(packed + std::ptrdiff_t{i} * C::count, w[0], w[1], w[2]);
    v[C::channel(0)] = w[0];
    if constexpr (C::count > 1) v[C::channel(1)] = w[1];
    if constexpr (C::count > 2) v[C::channel(2)] = w[2];
    hn::StoreInterleaved4(v[0], v[1], v[2], v[3], Bytes(), p);
  }
  single_plane_rows().insert(planes, n - i, packed + std::ptrdiff_t{i} * C::count, row + i);
}

// Calls body<planes>() for one to three planes; none and all four are what single bytes do as well.
template <u32 planes = 1, class Body>
HWY_INLINE bool with_planes(u32 wanted, Body body) {
  if constexpr (planes < all_planes) {
    if (wanted != planes) return with_planes<planes + 1>(wanted, body);
    body.template operator()<planes>();
    return true;
  } else {
    return false;
  }
}

void extract_any(u32 planes, i32 n, const ZR_Pixel8* row, u8* packed) {
  if (!with_planes(planes, [&]<u32 chosen>() { extract<chosen>(n, row, packed); }))
    single_plane_rows().extract(planes, n, row, packed);
}
void insert_any(u32 planes, i32 n, const u8* packed, ZR_Pixel8* row) {
  if (!with_planes(planes, [&]<u32 chosen>() { insert<chosen>(n, packed, row); }))
    single_plane_rows().insert(planes, n, packed, row);
}

const PlaneRows* plane_rows() {
  static constexpr PlaneRows rows = {&extract_any, &insert_any};
  return &rows;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_CHOICE(const PlaneRows*, plane_rows)
#endif
