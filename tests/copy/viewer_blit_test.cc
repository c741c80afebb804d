// The viewer's blit against a plain model of its steps: styles, orders, depths, clipping, slices, odd alphas.
#include <ZR/viewer_blit.h>

#include <algorithm>
#include <cmath>

#include "support/born_library.h"
#include "support/edge_rows.h"
#include "support/worlds.h"

namespace {

struct Call {
  i32 style;
  bool reverse;
  GX_LPoint position, check;
  ZR_PixelFloat first, second;
  GX_LRect rect;
};

u8 quantised(f32 c) { return static_cast<u8>(static_cast<i32>(c * 255 + 0.5f)); }

// One channel: background and strength as bytes, the rest on the scale of the source.
u8 flattened(const Call& call, bool black, u8 c, u8 a, i32 b, i32 strength) {
  const auto mix = [](i32 t) { return (t + ((t + 128) >> 8) + 128) >> 8; };
  if (call.style == 2) return static_cast<u8>(c + mix(mix(strength * (255 - a)) * (b - c)));
  return static_cast<u8>(black ? mix(c * a) : b + mix(a * (c - b)));
}
u8 flattened(const Call& call, bool black, u16 c, u16 a, i32 b8, i32 strength8) {
  const auto wide = [](i32 v) { return static_cast<i32>((static_cast<u32>(v) * 0x808080u + 33200u) >> 16); };
  const i32 b = wide(b8), through = (wide(strength8) * (32768 - a) + 16383) >> 15;
  const i32 v = call.style == 2 ? c + ((through * (b - c)) >> 15)
                : black         ? (c * a + 16383) >> 15
                                : b + ((a * (c - b)) >> 15);
  return static_cast<u8>((v * 255 + 16384) >> 15);
}
u8 shown(f32 v) {
  const f32 scaled = v * 255.0f + 0.5f;
  return std::isnan(scaled) || scaled >= 2147483648.0f ? u8{0} : static_cast<u8>(std::clamp(scaled, 0.0f, 255.0f));
}
u8 flattened(const Call& call, bool black, f32 c, f32 a, i32 b8, i32 strength8) {
  const f32 b = static_cast<f32>(b8) * 0.003921569f, strength = static_cast<f32>(strength8) * 0.003921569f;
  if (call.style == 2) return shown(c + strength * (1.0f - a) * (b - c));
  return shown(black ? c * a : b + a * (c - b));
}
u8 opaque(u8 c) { return c; }
u8 opaque(u16 c) { return static_cast<u8>((c * 255 + 16384) >> 15); }
u8 opaque(f32 c) { return shown(c); }

template <class T>
void model(const Call& call, const TestWorld<T>& src, TestWorld<ZR_Pixel8>& dst) {
  using D = zr::Depth<T>;
  const auto words = [](const ZR_PixelFloat& c) {
    return ZR_Pixel8{quantised(c.alpha), quantised(c.red), quantised(c.green), quantised(c.blue)};
  };
  const ZR_Pixel8 first = words(call.first), second = words(call.second);
  const bool black = call.style != 1 && call.style != 2 && first.red + first.green + first.blue == 0;
  for (i32 y = 0; y < call.rect.bottom - call.rect.top; ++y)
    for (i32 x = 0; x < call.rect.right - call.rect.left; ++x) {
      const i32 sx = call.position.x + x, sy = call.position.y + y, dx = call.rect.left + x, dy = call.rect.top + y;
      if (sx >= src.width() || sy >= src.height() || dx < 0 || dy < 0 || dx >= dst.width() || dy >= dst.height())
        continue;
      const T p = src.at(sx, sy);
      u8 out[4];
      std::memcpy(out, &dst.at(dx, dy), 4);
      const bool is_first = call.style != 1 || (((call.check.x + x) ^ (call.check.y + y)) & 8) != 0;
      const ZR_Pixel8 b = is_first ? first : second;
      const auto put = [&](u8 red, u8 green, u8 blue) {
        out[call.reverse ? 2 : 1] = red;
        out[call.reverse ? 1 : 2] = green;
        out[call.reverse ? 0 : 3] = blue;
      };
      u8& alpha = out[call.reverse ? 3 : 0];
      if (p.alpha >= D::white) {
        put(opaque(p.red), opaque(p.green), opaque(p.blue));
        if (!call.reverse) alpha = 255;
      } else if (p.alpha == 0 && call.style != 2) {
        put(b.red, b.green, b.blue);
        alpha = b.alpha;
      } else {
        const auto one = [&](auto c, i32 g) { return flattened(call, black, c, p.alpha, g, first.alpha); };
        put(one(p.red, b.red), one(p.green, b.green), one(p.blue, b.blue));
      }
      std::memcpy(&dst.at(dx, dy), out, 4);
    }
}

template <class T>
class ViewerBlit : public BornLibrary {
 protected:
  void run(const Call& call, TestWorld<T>& src, TestWorld<ZR_Pixel8>& dst) {
    const ZR_WorldX<T> from(src, false);
    ZR_WorldX<ZR_Pixel8> to(dst, false);
    ZR_SpecialCasePixelBlit(&from, call.position, static_cast<ZR_SpecialCaseBlitStyle>(call.style), call.reverse,
                            call.check, call.first, call.second, call.rect, &to);
  }
};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(ViewerBlit, Depths);

i32 G_slices;
i32 five_slices(i32 iterations, void* refcon, ZR_GenericFunc fn) {
  EXPECT_EQ(iterations, -1);
  for (i32 i = 4; i >= 0; --i, ++G_slices) EXPECT_EQ(fn(refcon, i, i, 5), 0);
  return 0;
}

TYPED_TEST(ViewerBlit, AllStylesOrdersAndPlaces) {
  using T = TypeParam;
  TestWorld<T> src(75, 21);
  src.randomise(6);
  for (i32 x = 0; x < 70; ++x) src.at(x, 3).alpha = src.at(x, 4).alpha = 0;
  for (i32 x = 0; x < 70; ++x) src.at(x, 5).alpha = static_cast<zr::Channel<T>>(zr::Depth<T>::white);
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    constexpr f32 odd[] = {NAN, -0.25f, 1.5f, 1e30f, -1e30f, INFINITY, -0.0f, 1e-40f};
    for (i32 x = 0; x < 64; ++x) src.at(x, 6) = {odd[x % 8], odd[x / 8], 0.5f, odd[(x + 3) % 8]};
  }
  const ZR_PixelFloat grey = {0.6f, 0.5f, 0.5f, 0.5f}, orange = {0.25f, 1, 0.6f, 0.1f}, black = {0.75f, 0, 0, 0.001f},
                      above = {1.5f, 1.25f, 0, 0};
  const GX_LRect all = {0, 0, 75, 21}, inner = {3, 2, 60, 15}, over = {-9, -4, 200, 100},
                 wild = {INT32_MIN, 1, 40, INT32_MAX};
  i32 drawn = 0;
  G_slices = 0;
  for (const i32 style : {0, 1, 2, 77, -1})
    for (const bool reverse : {false, true})
      for (const auto& [one, other] : {std::pair{grey, orange}, {orange, grey}, {black, above}, {above, black}})
        for (const GX_LRect& rect : {all, inner, over}) {
          const Call call = {style, reverse, {drawn % 3, drawn % 5}, {drawn - 70, 5 - drawn}, one, other, rect};
          TestWorld<ZR_Pixel8> dst(75, 21), expected(75, 21);
          dst.randomise(7);
          expected.randomise(7);
          const SlotOverride threads(ZR_Slot_iterate_generic, reinterpret_cast<void*>(&five_slices));
          this->run(call, src, dst);
          model(call, src, expected);
          ASSERT_TRUE(dst == expected) << "style " << style << ", reverse " << reverse << ", call " << drawn;
          ASSERT_TRUE(dst.guards_intact());
          ++drawn;
        }
  EXPECT_EQ(G_slices, 5 * drawn);
  TestWorld<ZR_Pixel8> dst(75, 21);
  const TestWorld<ZR_Pixel8> untouched(dst);
  this->run({1, false, {-1, 0}, {0, 0}, grey, orange, all}, src, dst);
  this->run({1, false, {0, INT32_MAX}, {0, 0}, grey, orange, all}, src, dst);
  this->run({1, false, {0, 0}, {0, 0}, grey, orange, {5, 5, 5, 9}}, src, dst);
  this->run({1, false, {0, 0}, {0, 0}, grey, orange, {9, 5, 5, 9}}, src, dst);
  this->run({1, false, {0, 0}, {0, 0}, grey, orange, wild}, src, dst);
  EXPECT_TRUE(dst == untouched);
  ZR_SpecialCasePixelBlit(nullptr, {0, 0}, ZR_BlitStyle_Flat, false, {0, 0}, grey, orange, all, nullptr);
}

}  // namespace
