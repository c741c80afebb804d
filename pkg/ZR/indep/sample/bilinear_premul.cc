// Bilinear samples of premultiplied 8-bit pixels, in integers.
#include "sample/ZR_Samp.h"

namespace {

// Which neighbours of an axis are read: the one at the pixel, and the one behind it.
struct Axis {
  bool near = true, far = true, outside = false;

  Axis(i32 position, i32 size) {
    const i64 last = (static_cast<i64>(size) - 1) * 65536;
    if (position > 0) {
      outside = last <= static_cast<i64>(position) - 65536;
      far = position < last;
    } else {
      outside = position <= -65536;
      far = (position & 0xffff) != 0;
      near = !far;
    }
  }
};

}  // namespace

extern "C" i32 ZR_SubpixelSample_Premul(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel8* dst) {
  const zr::Position at(x, y);
  const ZR_LayerDef& src = *params->src;
  *dst = {};
  if (at.whole()) {
    if (zr::inside(src, at.x, at.y)) *dst = *zr::pixel_at<ZR_Pixel8>(src, at.x, at.y);
    return ZR_Err_None;
  }
  const Axis across(x, src.width), down(y, src.height);
  if (across.outside || down.outside || src.width <= 0 || src.height <= 0 || src.data == nullptr) return ZR_Err_None;

  ZR_Pixel8 p[4] = {};
  const bool read[4] = {across.near && down.near, across.far && down.near, across.near && down.far,
                        across.far && down.far};
  u32 words[4];
  for (i32 i = 0; i < 4; ++i) {
    if (read[i]) p[i] = *zr::pixel_at<ZR_Pixel8>(src, at.x + (i & 1), at.y + (i >> 1));
    words[i] = std::bit_cast<u32>(p[i]);
  }
  if (words[0] == words[1] && words[0] == words[2] && words[0] == words[3]) {
    *dst = p[0];
    return ZR_Err_None;
  }
  constexpr u32 one = 65536;
  const u32 fx = at.fraction_x, fy = at.fraction_y;
  const u32 w10 = ((one - fy) * fx) >> 16, w01 = (fy * (one - fx)) >> 16, w11 = (fy * fx) >> 16;
  const u32 w00 = one - w10 - (w01 + w11);
  const auto mix = [&](u8 ZR_Pixel8::*c) {
    return static_cast<u8>((w00 * p[0].*c + w10 * p[1].*c + w01 * p[2].*c + w11 * p[3].*c + one / 2) >> 16);
  };
  *dst = {mix(&ZR_Pixel8::alpha), mix(&ZR_Pixel8::red), mix(&ZR_Pixel8::green), mix(&ZR_Pixel8::blue)};
  return ZR_Err_None;
}
