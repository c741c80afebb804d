// Rows of the 8-bit composite behind, on lanes where the processor has them.
#include <ZR/depth.h>

#include "composite/composite_rect.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "composite/behind_rows.cc"
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

// The colour d + (s - d) * w / t, toward zero. The estimate is off by less than 1/1000; made that much smaller it is
// the quotient or one less. Products wrap, what is left of them does not.
class BehindQuotient {
 public:
  HWY_INLINE BehindQuotient(Ints w, Ints t) : w_(w), t_(t), part_(to_float(w) / to_float(t)) {}
  HWY_INLINE Ints operator()(Ints s, Ints d) const {
    const Ints way = s - d;
    const Ints least = fitting_int(to_float(d) + to_float(way) * part_ - 0.001f);
    return pick(way * w_ - (least - d) * t_ >= t_, least + 1, least);
  }

 private:
  Ints w_, t_;
  Floats part_;
};

bool behind_straight(i32 n, u8 opacity, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  using M = PixelMath<ZR_Pixel8>;
  constexpr i32 full = M::white * M::white;
  if (runs_into(src, dst, n)) return false;
  each_block<Apart, ZR_Pixel8>(n, src, nullptr, dst,
                               [&](const ZR_Pixel8* from, const ZR_Pixel8*, ZR_Pixel8* to, i32) HWY_ATTR {
                                 const Px<M> d = Apart::load<M>(to);
                                 const Bools<i32> none_below = d.alpha == 0, hidden = d.alpha == M::white;
                                 if (all(hidden)) return;
                                 const Px<M> s = Apart::load<M>(from);
                                 const Px<M> alone = {M::mul(Ints(opacity), s.alpha), s.red, s.green, s.blue};
                                 if (all(none_below)) {
                                   Apart::store<M>(alone, to);
                                   return;
                                 }
                                 const Ints w = M::inv(d.alpha) * opacity * s.alpha, t = w + d.alpha * full;
                                 const BehindQuotient mix(w, t);
                                 // No quotient of t below 2^24 rounds up to an integer.
                                 const Px<M> both = {fitting_int(to_float(t) / static_cast<f32>(full)),
                                                     mix(s.red, d.red), mix(s.green, d.green), mix(s.blue, d.blue)};
                                 Apart::store<M>(pick(hidden, d, pick(none_below, alone, both)), to);
                               });
  return true;
}

bool behind_premul(i32 n, u8 opacity, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  using M = PixelMath<NarrowPixel8>;
  if (runs_into(src, dst, n)) return false;
  const Shorts factor = static_cast<i16>(opacity);
  each_block<Narrow, ZR_Pixel8>(
      n, src, nullptr, dst, [&](const ZR_Pixel8* from, const ZR_Pixel8*, ZR_Pixel8* to, i32) HWY_ATTR {
        const Px<M> d = Narrow::load<M>(to);
        const Shorts room = M::inv(d.alpha);
        if (all(room == 0)) return;
        const Px<M> s = Narrow::load<M>(from);
        const auto none_below = d.alpha == 0;
        const auto add = [&](Shorts below, Shorts source) HWY_ATTR {
          return M::stored(pick(none_below, 0, below) + M::mul(room, M::mul(factor, source)));
        };
        Narrow::store<M>({add(d.alpha, s.alpha), add(d.red, s.red), add(d.green, s.green), add(d.blue, s.blue)}, to);
      });
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

using D = Depth<ZR_Pixel8>;

u8 multiply(i32 a, i32 b) { return static_cast<u8>(D::mul(a, b)); }

bool lane_straight(i32 n, u8 opacity, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  ZR_RETURN_BEST(behind_straight(n, opacity, src, dst));
  return false;
}
bool lane_premul(i32 n, u8 opacity, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  ZR_RETURN_BEST(behind_premul(n, opacity, src, dst));
  return false;
}

}  // namespace

void composite_behind_row_straight(i32 n, u8 opacity, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  if (n < 1 || lane_straight(n, opacity, src, dst)) return;
  // Weights are in 1/65025 of a pixel; their sum times a channel stays below 2^32.
  constexpr u32 full = static_cast<u32>(D::white * D::white);
  const u32 o = opacity;
  for (i32 i = 0; i < n; ++i) {
    const ZR_Pixel8 s = src[i], d = dst[i];
    if (d.alpha == D::white) continue;
    if (d.alpha == 0) {
      dst[i] = {multiply(opacity, s.alpha), s.red, s.green, s.blue};
      continue;
    }
    const u32 w = (static_cast<u32>(D::white) * o - o * d.alpha) * s.alpha;
    const u32 k = d.alpha * full;
    const auto mix = [&](u32 source, u32 below) { return static_cast<u8>((source * w + below * k) / (k + w)); };
    dst[i] = {static_cast<u8>((k + w) / full), mix(s.red, d.red), mix(s.green, d.green), mix(s.blue, d.blue)};
  }
}

void composite_behind_row_premul(i32 n, u8 opacity, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  if (n < 1 || lane_premul(n, opacity, src, dst)) return;
  for (i32 i = 0; i < n; ++i) {
    const ZR_Pixel8 s = src[i], d = dst[i];
    const i32 room = D::inv(d.alpha);
    // Under a clear pixel the source replaces whatever colour stood. Colours above their alpha may wrap.
    const i32 kept = d.alpha == 0 ? 0 : 1;
    const auto add = [&](i32 below, i32 source) {
      return static_cast<u8>(below * kept + multiply(room, multiply(opacity, source)));
    };
    dst[i] = {add(d.alpha, s.alpha), add(d.red, s.red), add(d.green, s.green), add(d.blue, s.blue)};
  }
}

}  // namespace zr
#endif
