// Rectangles against the model: transfer with masks, fields and seeds, cleared alpha, the old 8-bit composite.
#include <ZR/platform.h>

#include <algorithm>

#include "model/compare.h"

namespace model {
namespace {

GX_LRect random_rect(Random& random, i32 width, i32 height) {
  if (random.one_in(3)) return {0, 0, width, height};
  const i32 left = random.in(-6, width + 2), top = random.in(-6, height + 2);
  return {left, top, left + random.in(-1, width + 8), top + random.in(-1, height + 8)};
}

// Opacity is not clamped anywhere. Beyond 1 it makes illegal channels at 16 bits, wraps at 8.
template <class D>
f32 random_opacity(Random& random) {
  static constexpr f32 beyond[] = {1.5f, 2, -0.5f, 1.002f};
  if (!std::is_same_v<D, Sixteen> && random.one_in(10)) return beyond[random.word() % std::size(beyond)];
  return random.one_in(3) ? 1.0f : random.channel<Float>();
}

// One call of the transfer, with everything that goes into it.
template <class D>
struct Transfer {
  using Channel = typename D::Channel;
  Random& random;
  Range range;
  World<D> src{random, random.in(1, 33), random.in(1, 9), range}, dst{random, random.in(1, 33), random.in(1, 9), range};
  World<D> mask{random, random.in(1, 33), random.in(1, 9)};
  bool masked = random.one_in(2);
  ZR_MaskWorld record{mask, random.in(-8, 12), random.in(-4, 5), static_cast<u32>(random.in(0, 3))};
  GX_LRect rect = random_rect(random, src.width(), src.height());
  i32 dest_x = random.in(-8, 12), dest_y = random.in(-4, 5), field = random.one_in(2) ? 0 : random.in(-1, 3);
  const ZR_LinearBlendingTables* tables = random.one_in(3) ? test_tables(random.word()) : nullptr;
  ZR_CompositeModePlus mode{0, random_opacity<D>(random), nullptr, random.one_in(3), static_cast<i32>(random.word())};

  std::string describe() const {
    return std::string("  src ") + text(src.width()) + "x" + text(src.height()) + ", dst " + text(dst.width()) + "x" +
           text(dst.height()) + ", rect " + text(rect) + " to (" + text(dest_x) + ", " + text(dest_y) + "), field " +
           text(field) + ", opacity " + text(mode.opacity) + (mode.keep_alpha ? ", keep alpha" : "") + ", seed " +
           text(mode.rand_seed) +
           (masked ? ", mask kind " + text(static_cast<i32>(record.kind)) + " " + text(mask.width()) + "x" +
                         text(mask.height()) + " at (" + text(record.offset_x) + ", " + text(record.offset_y) + ")"
                   : "");
  }
  void run(i32 xfer, Complaints& complaints) {
    mode.xfer = xfer;
    const ZR_MaskWorld* given = masked ? &record : nullptr;
    const World<D> before = dst, source_before = src;
    World<D> expected = dst;
    ToldProgress told, model_told;
    told.stop_at = model_told.stop_at = random.one_in(10) ? 0 : -1;
    told.code = model_told.code = 99;
    const ZR_ProgressInfo info = told.info();
    const i32 code =
        transfer_rect<D>(model_told.function(), field, rect, src, mode, tables, given, dest_x, dest_y, expected);
    // A caller's own scratch gives the same picture.
    std::vector<Channel> alpha(33), cells(33 * 4);
    void* scratch[10] = {alpha.data(), cells.data()};
    const i32 got = random.one_in(4) ? ZR_TransferRectPlus(&info, 1, 0, field, &rect, src.layer(), &mode, tables, given,
                                                           scratch, dest_x, dest_y, dst.layer())
                                     : ZR_TransferRect(&info, 1, 0, field, &rect, src.layer(), &mode, tables, given,
                                                       dest_x, dest_y, dst.layer());
    const std::string kind = std::string(D::name) + " mode " + mode_name(xfer) +
                             (tables != nullptr ? ", linear light" : "") + (masked ? ", masked" : "") +
                             (range == Range::wild     ? ", wild"
                              : range == Range::broken ? ", broken"
                                                       : "");
    if (got != code) complaints.add(kind, describe() + "\n  result " + text(code) + " expected, got " + text(got));
    if (told.calls != model_told.calls) complaints.add(kind + ", progress", describe());
    const std::string difference = dst.difference(expected, before);
    if (!difference.empty()) complaints.add(kind, describe() + "\n" + difference + source_text(difference));
    EXPECT_EQ(src.difference(source_before, source_before), "");
  }
  // The source and mask pixel of the pixel that a difference names.
  std::string source_text(const std::string& difference) const {
    i32 x = 0, y = 0;
    if (std::sscanf(difference.c_str(), "at (%d, %d)", &x, &y) != 2) return "";
    const i32 sx = static_cast<i32>(i64{x} - dest_x + rect.left), sy = static_cast<i32>(i64{y} - dest_y + rect.top),
              mx = x - record.offset_x, my = y - record.offset_y;
    std::string out;
    if (inside(bounds(src), sx, sy)) out += "\n  source   " + text<D>(at<D>(src, sx, sy));
    if (masked && inside(bounds(mask), mx, my)) out += "\n  mask     " + text<D>(at<D>(mask, mx, my));
    return out;
  }
  explicit Transfer(Random& r, Range range_ = Range::legal) : random(r), range(range_) {
    switch (random.in(0, 24)) {  // corners at the ends of the number line
      case 0:
        rect = {INT32_MIN, INT32_MIN, INT32_MAX, INT32_MAX};
        dest_x += INT32_MIN + 12, dest_y += INT32_MIN + 12;
        break;
      case 1: rect.right = rect.bottom = INT32_MAX; break;
      case 2: dest_x = INT32_MAX; break;
      case 3: rect.top = INT32_MIN; break;
      default: break;
    }
  }
};

template <class D>
void random_transfers(i32 count, u32 seed) {
  Random random(seed);
  Complaints complaints;
  const CaughtMessages caught;
  for (const i32 mode : {-1, -4, 41, 44, INT32_MIN, INT32_MAX}) Transfer<D>(random).run(mode, complaints);
  for (i32 mode = copy_fast; mode <= key_protect; ++mode)
    for (i32 i = 0; i < count; ++i) {
      // What a negative alpha does to the seeds of a dissolve is nobody's business.
      const Range range = mode == dissolve || !is_float<D> ? Range::legal : static_cast<Range>(random.in(0, 2));
      Transfer<D>(random, range).run(mode, complaints);
    }
}
TEST(ModelTransferRect, Eight) { random_transfers<Eight>(300, 11); }
TEST(ModelTransferRect, Sixteen) { random_transfers<Sixteen>(300, 12); }
TEST(ModelTransferRect, Float) { random_transfers<Float>(300, 13); }

// The plain record's opacity: the finer field counts while both agree within one step.
TEST(ModelTransferRect, AdapterChoosesAnOpacity) {
  Random random(22);
  Complaints complaints;
  for (i32 i = 0; i < 20000; ++i) {
    const u8 opacity = static_cast<u8>(random.in(0, 255));
    const i32 near = opacity * 32768 / 255 + random.in(-140, 140);
    const u16 opacity16 = static_cast<u16>(random.one_in(8) ? random.in(0, 32768) : std::clamp(near, 0, 32768));
    World<Float> src(random, 1, 1), dst(random, 1, 1), expected = dst;
    src.row(0)->alpha = 1;
    const World<Float> before = dst;
    const GX_LRect rect{0, 0, 1, 1};
    const ZR_CompositeMode plain{copy, 5, opacity, 0, opacity16};
    const ZR_CompositeModePlus mode(copy, plain_opacity(opacity, opacity16), nullptr, false, 5);
    const auto silent = [](i32, i32) { return 0; };
    transfer_rect<Float>(silent, 0, rect, src, mode, nullptr, nullptr, 0, 0, expected);
    EXPECT_EQ(transfer_rect_adapter(nullptr, 0, 0, 0, &rect, src.layer(), &plain, nullptr, 0, 0, dst.layer()), 0);
    const std::string difference = dst.difference(expected, before);
    if (!difference.empty()) complaints.add("opacity", text(opacity) + ", " + text(opacity16) + "\n" + difference);
  }
}

// ---------------------------------------------------------------- cleared alpha, old composite

template <class D>
void cleared_alpha(u32 seed) {
  Random random(seed);
  for (i32 i = 0; i < 400; ++i) {
    World<D> world(random, random.in(1, 33), random.in(1, 12)), expected = world;
    const World<D> before = world;
    GX_LRect rect = random_rect(random, world.width(), world.height());
    if (random.one_in(8)) rect.left = rect.top = INT32_MIN, rect.right = INT32_MAX;
    clear_alpha_except<D>(rect, expected);
    EXPECT_EQ(ZR_ClearAlphaExceptRect(nullptr, &rect, world.layer()), 0);
    EXPECT_EQ(world.difference(expected, before), "") << D::name << " " << text(rect);
  }
}
TEST(ModelClearAlpha, AllDepths) { cleared_alpha<Eight>(41), cleared_alpha<Sixteen>(42), cleared_alpha<Float>(43); }

TEST(ModelCompositeRect, AllFour) {
  Random random(51);
  const struct {
    decltype(&ZR_CompositeRectDraft_Straight) call;
    bool premultiplied;
  } forms[] = {{ZR_CompositeRectDraft_Straight, false},
               {ZR_CompositeRectBest_Straight, false},
               {ZR_CompositeRectDraft_Premul, true},
               {ZR_CompositeRectBest_Premul, true}};
  for (const auto& form : forms)
    for (i32 i = 0; i < 500; ++i) {
      World<Eight> src(random, random.in(1, 33), random.in(1, 40)), dst(random, random.in(33, 40), random.in(40, 80)),
          expected = dst;
      const World<Eight> before = dst;
      GX_LRect rect{random.in(0, src.width() - 1), random.in(0, src.height() - 1), src.width(), src.height()};
      const bool all = random.one_in(3);
      if (all) rect = bounds(src);
      const i32 x = random.in(0, dst.width() - (rect.right - rect.left)),
                y = random.in(0, dst.height() - (rect.bottom - rect.top));
      const u8 opacity = random.channel<Eight>();
      const i32 field = random.in(0, 2);
      ToldProgress told, model_told;
      told.stop_at = model_told.stop_at = random.in(-1, 2);
      told.code = model_told.code = 517;
      const ZR_ProgressInfo info = told.info();
      const i32 code =
          composite_rect(form.premultiplied, model_told.function(), rect, opacity, src, x, y, field, expected);
      const i32 got = form.call(&info, all ? nullptr : &rect, opacity, src.layer(), x, y, field, 0, dst.layer());
      const std::string difference = dst.difference(expected, before);
      ASSERT_EQ(difference, "") << (form.premultiplied ? "premultiplied " : "straight ") << text(rect) << " to " << x
                                << ", " << y << " opacity " << text(opacity) << " field " << field;
      ASSERT_EQ(got, code);
      ASSERT_EQ(told.calls, model_told.calls);
    }
}

}  // namespace
}  // namespace model
