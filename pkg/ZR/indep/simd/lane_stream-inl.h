// Stores past the caches, for the lanes of one instruction set. Included once for each.
#if defined(ZR_SIMD_LANE_STREAM_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SIMD_LANE_STREAM_INL_H
#undef ZR_SIMD_LANE_STREAM_INL_H
#else
#define ZR_SIMD_LANE_STREAM_INL_H
#endif

#include <hwy/cache_control.h>

#include <cstddef>
#include <cstring>

#include "simd/lanes-inl.h"

#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Copies bytes that nobody reads soon. After the last ones hwy::FlushStream() shows them to other threads in order.
HWY_INLINE void stream_bytes(std::size_t bytes, const void* src, void* dst) {
  const Tag<u8> d;
  constexpr std::size_t size = hn::MaxLanes(Tag<u8>());
  const u8* const from = static_cast<const u8*>(src);
  u8* const to = static_cast<u8*>(dst);
  const std::size_t ahead = (0 - reinterpret_cast<std::size_t>(dst)) % size;
  std::size_t i = bytes < ahead ? bytes : ahead;
  std::memcpy(to, from, i);
  for (; bytes - i >= size; i += size) hn::Stream(hn::LoadU(d, from + i), d, to + i);
  std::memcpy(to + i, from + i, bytes - i);
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#endif
