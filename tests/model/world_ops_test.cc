// Fill, mix and premultiplication of worlds against the model.
#include "composite/premultiply.h"
#include "model/compare.h"
#include "model/whole_worlds.h"

namespace model {
namespace {

GX_LRect any_rect(Random& random) {
  if (random.one_in(16)) return {INT32_MIN, random.in(-10, 20), INT32_MAX, random.one_in(2) ? INT32_MIN : INT32_MAX};
  return {random.in(-10, 40), random.in(-10, 20), random.in(-10, 40), random.in(-10, 20)};
}

template <class D>
void fills(u32 seed) {
  Random random(seed);
  Complaints complaints;
  for (i32 i = 0; i < 1500; ++i) {
    World<D> world(random, random.in(1, 33), random.in(1, 12)), expected = world;
    const World<D> before = world;
    const GX_LRect rect = any_rect(random);
    const GX_LRect* given = random.one_in(4) ? nullptr : &rect;
    const bool null_colour = random.one_in(10);
    const i32 form = random.in(0, 2);
    const auto run = [&](const auto& colour, auto* call) {
      const auto* c = null_colour ? nullptr : &colour;
      EXPECT_EQ(call(nullptr, c, given, world.layer()), fill<D>(c, given, expected));
    };
    ZR_PixelFloat f = random.pixel<Float>(Range::wild);
    if (random.one_in(3)) f.alpha = random.one_in(2) ? 1.5f : NAN, f.green = INFINITY, f.blue = NAN;
    if (form == 0) run(random.pixel<Eight>(), &ZR_Fill);
    if (form == 1) run(random.pixel<Sixteen>(), &ZR_Fill16);
    if (form == 2) run(f, &ZR_FillFloat);
    const std::string difference = world.difference(expected, before);
    if (!difference.empty())
      complaints.add(std::string(D::name) + " form " + text(form),
                     text(rect) + "\n" + difference + (form == 2 ? "\n  colour " + text<Float>(f) : ""));
  }
}
TEST(ModelFill, AllDepthsAndColours) { fills<Eight>(61), fills<Sixteen>(62), fills<Float>(63); }

TEST(ModelFill, EveryColourValue) {
  Random random(64);
  World<Eight> w8(random, 1, 1), e8 = w8;
  World<Sixteen> w16(random, 1, 1), e16 = w16;
  World<Float> wf(random, 1, 1), ef = wf;
  const auto check = [&](const auto& colour, auto* call) {
    call(nullptr, &colour, nullptr, w8.layer()), fill<Eight>(&colour, nullptr, e8);
    call(nullptr, &colour, nullptr, w16.layer()), fill<Sixteen>(&colour, nullptr, e16);
    call(nullptr, &colour, nullptr, wf.layer()), fill<Float>(&colour, nullptr, ef);
    ASSERT_EQ(w8.difference(e8, e8), "");
    ASSERT_EQ(w16.difference(e16, e16), "");
    ASSERT_EQ(wf.difference(ef, ef), "");
  };
  for (i32 i = 0; i <= 32768; ++i) {
    const u16 v = static_cast<u16>(i);
    check(ZR_Pixel16{v, v, v, v}, &ZR_Fill16);
    const f32 f = static_cast<f32>(i) / 32768, h = (static_cast<f32>(i) + 0.5f) / 32768, e = static_cast<f32>(i) / 510;
    check(ZR_PixelFloat{f, std::nextafter(h, 0.0f), h, std::nextafter(h, 2.0f)}, &ZR_FillFloat);
    check(ZR_PixelFloat{e, std::nextafter(e, 0.0f), e, std::nextafter(e, 2.0f)}, &ZR_FillFloat);
    const u8 b = static_cast<u8>(i);
    if (i < 256) check(ZR_Pixel8{b, b, b, b}, &ZR_Fill);
    if (HasFatalFailure()) return;
  }
}

template <class D>
void blends(u32 seed, Range range) {
  Random random(seed);
  Complaints complaints;
  for (i32 i = 0; i < 1500; ++i) {
    const i32 width = random.in(1, 33), height = random.in(1, 6);
    const World<D> first_before(random, width, height, range), second_before(random, width, height, range);
    World<D> first = first_before, second = second_before, other(random, width, height);
    World<D>& dst = random.one_in(3) ? first : random.one_in(2) ? second : other;  // in place too
    const World<D> before = dst;
    World<D> expected = dst;
    static constexpr i32 edges[] = {0, 1, 0x7fff, 0x8000, 0xffff, 0x10000, 0x10001, -1, INT32_MIN, INT32_MAX};
    const i32 ratio = random.one_in(3) ? edges[random.word() % std::size(edges)] : random.in(0, 0x10000);
    const bool premul = random.one_in(2);
    const auto call = premul ? &ZR_Blend_Premul : random.one_in(2) ? &ZR_Blend : &ZR_Blend_Straight;
    EXPECT_EQ(call(nullptr, first.layer(), second.layer(), ratio, dst.layer()),
              blend<D>(premul, first_before, second_before, ratio, expected));
    const std::string difference = dst.difference(expected, before);
    i32 x = 0, y = 0;
    if (std::sscanf(difference.c_str(), "at (%d, %d)", &x, &y) == 2)
      complaints.add(std::string(D::name) + (premul ? " premultiplied" : " straight"),
                     "ratio " + text(ratio) + ", first " + text<D>(at<D>(first_before, x, y)) + ", second " +
                         text<D>(at<D>(second_before, x, y)) + "\n" + difference);
    else
      EXPECT_EQ(difference, "");
  }
}
TEST(ModelBlend, AllDepths) {
  blends<Eight>(71, Range::legal), blends<Sixteen>(72, Range::legal), blends<Float>(73, Range::legal),
      blends<Float>(75, Range::wild), blends<Float>(76, Range::broken);
}

i32 premul_colour(ZR_LayerDef* src, const ZR_Pixel8& colour, i32 forward, const GX_LRect* rect, ZR_LayerDef* dst) {
  return rect == nullptr ? ZR_PremulColor(nullptr, src, &colour, forward, dst)
                         : ZR_PremulColorRect(nullptr, src, &colour, forward, rect, dst);
}
i32 premul_colour(ZR_LayerDef* src, const ZR_Pixel16& colour, i32 forward, const GX_LRect* rect, ZR_LayerDef* dst) {
  return rect == nullptr ? ZR_PremulColor16(nullptr, src, &colour, forward, dst)
                         : zr::premul_color_rect16(nullptr, src, &colour, forward, rect, dst);
}
i32 premul_colour(ZR_LayerDef* src, const ZR_PixelFloat& colour, i32 forward, const GX_LRect* rect, ZR_LayerDef* dst) {
  return rect == nullptr ? ZR_PremulColorFloat(nullptr, src, &colour, forward, dst)
                         : ZR_PremulColorRectFloat(nullptr, src, &colour, forward, rect, dst);
}

template <class D>
void premultiplications(u32 seed, Range range) {
  Random random(seed);
  Complaints complaints;
  for (i32 i = 0; i < 2500; ++i) {
    const i32 width = random.in(1, 33), height = random.in(1, 8), forward = random.in(0, 1);
    World<D> src(random, width, height, range), dst(random, width, height, range);
    ZR_Pixel8 c8 = random.pixel<Eight>();
    ZR_Pixel16 c16 = random.pixel<Sixteen>();
    ZR_PixelFloat cf = random.pixel<Float>(range);
    if (random.one_in(4)) c8 = {}, c16 = {}, cf = {};
    const i32 form = random.in(0, 2);  // a colour of any depth
    const auto colour = form == 0 ? fill_pixel<D>(c8) : form == 1 ? fill_pixel<D>(c16) : fill_pixel<D>(cf);
    const GX_LRect rect = any_rect(random);
    const GX_LRect* given = random.one_in(2) ? &rect : nullptr;
    const bool plain = random.one_in(3), in_place = plain || random.one_in(2);
    World<D>& target = in_place ? src : dst;
    World<D> expected = target;
    const World<D> before = target, source_before = src;
    premultiply<D>(in_place ? expected : src, plain ? nullptr : &colour, forward != 0, given, expected);
    const auto matte = [&](const auto& c) { return premul_colour(src.layer(), c, forward, given, target.layer()); };
    const i32 got = !plain             ? (form == 0   ? matte(c8)
                                          : form == 1 ? matte(c16)
                                                      : matte(cf))
                    : given != nullptr ? ZR_PremulRect(nullptr, forward, given, target.layer())
                                       : ZR_Premul(nullptr, forward, target.layer());
    EXPECT_EQ(got, 0);
    const std::string difference = target.difference(expected, before);
    i32 x = 0, y = 0;
    const bool at_pixel = std::sscanf(difference.c_str(), "at (%d, %d)", &x, &y) == 2;
    if (!difference.empty())
      complaints.add(std::string(D::name) + (plain ? " plain" : " matte") +
                         (forward != 0 ? " premultiply" : " unmultiply") + (in_place ? " in place" : " into another"),
                     (given != nullptr ? text(rect) : "all") + ", matte " + text<D>(colour) +
                         (at_pixel ? ", source " + text<D>(at<D>(source_before, x, y)) : "") + "\n" + difference);
  }
}
TEST(ModelPremultiply, Eight) { premultiplications<Eight>(81, Range::legal); }
TEST(ModelPremultiply, Sixteen) { premultiplications<Sixteen>(82, Range::legal); }
TEST(ModelPremultiply, Float) {
  premultiplications<Float>(83, Range::legal), premultiplications<Float>(84, Range::wild),
      premultiplications<Float>(86, Range::broken);
}

}  // namespace
}  // namespace model
