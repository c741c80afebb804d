// Rows of chosen channels, packed side by side.
#pragma once

#include <ZR/zr.h>

#include <bit>

namespace zr {

inline constexpr u32 all_planes = 15;
inline i32 plane_count(u32 planes) { return std::popcount(planes & all_planes); }

struct PlaneRows {
  // The channels of `planes` of n pixels, in the order alpha, red, green, blue, into n * plane_count(planes) bytes.
  void (*extract)(u32 planes, i32 n, const ZR_Pixel8* row, u8* packed);
  // And back; other channels stay.
  void (*insert)(u32 planes, i32 n, const u8* packed, ZR_Pixel8* row);
};
// The fastest that this processor has. The memories may not overlap.
const PlaneRows& plane_rows();

// The bodies of single bytes, and of lanes (null where there are none).
const PlaneRows& single_plane_rows();
const PlaneRows* lane_plane_rows();

}  // namespace zr
