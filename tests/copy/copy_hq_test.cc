// Copies of high quality against the samplers, called at the positions that belong to each pixel; refusals and
// abort of all copies; frames.
#include <RS/rs.h>
#include <ZR/copy_bits.h>
#include <ZR/sample.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <limits>

#include "copy/copy_model.h"
#include "support/born_library.h"
#include "support/worlds.h"

namespace {

using copy_model::address;
using copy_model::wrapped;

template <class T>
using Sampler = i32 (*)(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, T*);

template <class T>
Sampler<T> sampler(bool area, bool premul) {
  if constexpr (std::is_same_v<T, ZR_Pixel8>) {
    if (premul) return area ? &ZR_AreaSample_Premul : &ZR_SubpixelSample_Premul;
    return area ? &ZR_AreaSample_Straight : &ZR_SubpixelSample_Straight;
  } else if constexpr (std::is_same_v<T, ZR_Pixel16>) {
    return area ? &ZR_AreaSample_Straight16 : &ZR_SubpixelSample_Straight16;
  } else {
    ZR_SampleFunctionSet set;
    ZR_GetSampleFunctionSetFloat(1, &set);
    return reinterpret_cast<Sampler<T>>(area ? set.area : set.clipping);
  }
}

// Samples every pixel of the destination rectangle by itself.
template <class T>
void model(TestWorld<T>& src, const GX_LRect& s, const GX_LRect& d, bool premul, TestWorld<T>& out) {
  const i32 dw = static_cast<i16>(i64{d.right} - d.left), dh = static_cast<i16>(i64{d.bottom} - d.top);
  if (dw == 0 || dh == 0) return;
  const i32 xs = wrapped((i64{s.right} - s.left) * 65536) / dw, ys = wrapped((i64{s.bottom} - s.top) * 65536) / dh;
  ZR_SampPB params = {};
  params.x_radius = static_cast<i32>(std::floor(xs / 2.0));
  params.y_radius = static_cast<i32>(std::floor(ys / 2.0));
  params.area = static_cast<i32>(std::clamp(std::trunc(xs / 65536.0 * ys), -2147483648.0, 2147483647.0));
  params.src = src;
  const Sampler<T> sample = sampler<T>(xs > 65536 || ys > 65536, premul);
  for (i32 y = std::max(d.top, 0); y < std::min(d.bottom, out.height()); ++y)
    for (i32 x = std::max(d.left, 0); x < std::min(d.right, out.width()); ++x)
      sample(nullptr, wrapped(s.left * i64{65536} + params.x_radius - 32768 + (x - i64{d.left}) * xs),
             wrapped(s.top * i64{65536} + params.y_radius - 32768 + (y - i64{d.top}) * ys), &params, &out.at(x, y));
}

template <class T>
bool touches(const GX_LRect& r, const TestWorld<T>& world) {
  return r.left != r.right && r.top != r.bottom && r.left < world.width() && r.top < world.height() && r.right >= 1 &&
         r.bottom >= 1;
}

template <class T>
class HighQualityCopy : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(HighQualityCopy, Depths);

TYPED_TEST(HighQualityCopy, RandomRectangles) {
  using T = TypeParam;
  copy_model::Rects rects(41);
  for (u32 round = 0; round < 1500; ++round) {
    const bool premul = std::is_same_v<T, ZR_Pixel8> && round % 3 == 0;
    TestWorld<T> src(rects.between(1, 9), rects.between(1, 9)), dst(rects.between(1, 9), rects.between(1, 9));
    src.randomise(round);
    dst.randomise(round + 1);
    auto from = rects.next({src.width(), src.height()}), to = rects.next({dst.width(), dst.height()});
    if (round % 10 == 0) to = from;
    const GX_LRect s = from.value_or(GX_LRect{0, 0, src.width(), src.height()});
    const GX_LRect d = to.value_or(GX_LRect{0, 0, dst.width(), dst.height()});
    const auto extents = [](const GX_LRect& r) {
      return std::pair(u32(r.right) - u32(r.left), u32(r.bottom) - u32(r.top));
    };
    const bool whole = src.width() == dst.width() && src.height() == dst.height() &&
                       std::memcmp(&s, &d, sizeof s) == 0 && s.left == 0 && s.top == 0 && s.right == dst.width() &&
                       s.bottom == dst.height();
    TestWorld<T> expected = dst;
    i32 code = 0;
    if (whole || (!premul && extents(s) == extents(d)))  // nothing to scale
      code = ZR_CopyBits_Draft(nullptr, src, expected, address(from), address(to));
    else if (touches(s, src) && touches(d, dst))
      model(src, s, d, premul, expected);
    const auto copy = premul ? &ZR_CopyBits_HQ_Premul : &ZR_CopyBits_HQ_Straight;
    ASSERT_EQ(copy(nullptr, src, dst, address(from), address(to)), code);
    ASSERT_TRUE(dst == expected && dst.guards_intact() && src.guards_intact())
        << "round " << round << " from " << s.left << "," << s.top << "," << s.right << "," << s.bottom << " to "
        << d.left << "," << d.top << "," << d.right << "," << d.bottom;
  }
}

// Extents count in 16 bits: as the divisor of the step, and premultiplied also as the number of pixels.
TEST_F(BornLibrary, HighQualityCopyOfLongRows) {
  const struct {
    i32 width, straight, premul;
  } rows[] = {{32767, 32767, 32767}, {32768, 32768, 0}, {65536, 0, 0}, {65539, 65539, 3}};
  TestWorld<ZR_Pixel8> src(4, 1);
  for (const auto& row : rows)
    for (const bool premul : {false, true}) {
      TestWorld<ZR_Pixel8> dst(row.width, 1);
      dst.fill({1, 2, 3, 4});  // sampling transparent black changes every pixel
      EXPECT_EQ((premul ? ZR_CopyBits_HQ_Premul : ZR_CopyBits_HQ_Straight)(nullptr, src, dst, nullptr, nullptr), 0);
      i32 written = 0;
      for (i32 x = 0; x < row.width; ++x) written += dst.at(x, 0).red == 0;
      EXPECT_EQ(written, premul ? row.premul : row.straight) << row.width;
      EXPECT_TRUE(dst.guards_intact());
    }
}

template <class T>
i32 blue_sampler(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, T* dst) {
  return *dst = {1, 0, 0, 1}, 0;
}

template <class T>
void takes_sampler(ZR_SlotIndex slot, decltype(&ZR_CopyBits_Draft) copy, i32 width, i32 height) {
  TestWorld<T> src(4, 4), dst(width, height), blue(width, height);
  blue.fill({1, 0, 0, 1});
  for (const auto routine : {&blue_sampler<T>, static_cast<decltype(&blue_sampler<T>)>(nullptr)}) {
    const SlotOverride here(slot, reinterpret_cast<void*>(routine));
    EXPECT_EQ(copy(nullptr, src, dst, nullptr, nullptr), routine != nullptr ? 0 : 3) << "slot " << slot;
    EXPECT_TRUE(dst == blue) << "slot " << slot;
  }
}

TEST_F(BornLibrary, HighQualityCopyTakesTheSamplersOfTheSlots) {
  takes_sampler<ZR_Pixel8>(ZR_Slot_bilinear_straight8, &ZR_CopyBits_HQ_Straight, 5, 5);
  takes_sampler<ZR_Pixel8>(ZR_Slot_area_straight8, &ZR_CopyBits_HQ_Straight, 5, 3);
  takes_sampler<ZR_Pixel16>(ZR_Slot_bilinear_straight16, &ZR_CopyBits_HQ_Straight, 4, 5);
  takes_sampler<ZR_Pixel16>(ZR_Slot_area_straight16, &ZR_CopyBits_HQ_Straight, 3, 9);
  takes_sampler<ZR_Pixel8>(ZR_Slot_bilinear_premul8, &ZR_CopyBits_HQ_Premul, 4, 5);
  takes_sampler<ZR_Pixel8>(ZR_Slot_area_premul8, &ZR_CopyBits_HQ_Premul, 3, 4);
}

TEST_F(BornLibrary, CopiesRefuseWithTheirTexts) {
  TestWorld<ZR_Pixel8> src(4, 4), small(3, 3);
  TestWorld<ZR_Pixel16> deep(4, 4), small_deep(3, 3);
  ZR_LayerDef bare = *src.layer(), bare_small = *small.layer();
  bare.data = bare_small.data = nullptr;
  ZR_Chunk chunk{}, wide{}, unlocked{};
  const i32 bytes = 'U' << 24 | 'B' << 16 | 'T' << 8 | '1';
  ASSERT_EQ(ZR_NewChunk(4, 4, 1, bytes, &chunk), 0);
  ASSERT_EQ(ZR_NewChunk(4, 4, 2, bytes, &wide), 0);
  unlocked = chunk, unlocked.data = nullptr;
  const GX_Matrix3 unit = {{{1, 0, 0}, {0, 1, 0}, {0, 0, 1}}};
  const auto draft = [](ZR_LayerDef* from, ZR_LayerDef* to) {
    return ZR_CopyBits_Draft(nullptr, from, to, nullptr, nullptr);
  };
  const auto straight = [](ZR_LayerDef* from, ZR_LayerDef* to) {
    return ZR_CopyBits_HQ_Straight(nullptr, from, to, nullptr, nullptr);
  };
  const auto premul = [](ZR_LayerDef* from, ZR_LayerDef* to) {
    return ZR_CopyBits_HQ_Premul(nullptr, from, to, nullptr, nullptr);
  };
  const auto channels = [](ZR_Chunk* from, ZR_Chunk* to) {
    return ZR_ChannelCopy(nullptr, from, to, nullptr, nullptr);
  };
  const auto matrix = [](ZR_LayerDef* from, const GX_Matrix3* by, ZR_LayerDef* to) {
    return ZR_CopyBits3_LO_Straight(nullptr, from, by, true, nullptr, to);
  };
  // The code, and the number of the place that reports a bad parameter; 0: the texts about depths.
  const auto refused = [&](i32 code, u32 site, int line = __builtin_LINE()) {
    const auto& reports = site != 0 ? caught.messages() : caught.verifications();
    const std::string text = site != 0
                                 ? "bad parameter passed to effect callback"
                                 : "ZR_CopyBits_HQ_Straight_Static requires src and dst worlds to have same bit depth";
    const bool as_told = code == 3 && reports.size() == 1 && reports[0].text == text &&
                         (site == 0 || reports[0].code == (0x250000 | site)) &&
                         caught.messages().size() + caught.verifications().size() == 1;
    EXPECT_TRUE(as_told) << "line " << line << " code " << code;
    caught.clear();
  };
  refused(draft(nullptr, small), 48);
  refused(draft(src, nullptr), 48);
  refused(draft(&bare, small), 48);
  refused(draft(src, &bare_small), 48);
  refused(ZR_WorldCopy(nullptr, nullptr, nullptr, nullptr, nullptr), 48);
  refused(straight(nullptr, small), 49);
  refused(straight(&bare, small), 49);
  refused(straight(deep, &bare), 49);  // sizes agree, so depths need not
  refused(straight(src, small_deep), 0);
  refused(straight(deep, &bare_small), 0);  // depths come before pixels
  refused(premul(src, nullptr), 50);
  refused(premul(&bare, small), 50);
  refused(channels(nullptr, &chunk), 72);
  refused(channels(&chunk, &unlocked), 72);
  refused(channels(&chunk, &wide), 72);
  refused(matrix(&bare, &unit, small), 101);
  refused(matrix(src, nullptr, small), 101);
  refused(matrix(src, &unit, nullptr), 101);
  EXPECT_EQ(straight(src, deep), 0);
  EXPECT_EQ(ZR_DisposeChunk(&chunk), 0);
  EXPECT_EQ(ZR_DisposeChunk(&wide), 0);
}

// Stops at the third poll. Copies of high quality ask the abort function alone.
TEST_F(BornLibrary, CopiesStopAtAPoll) {
  constexpr i32 height = 131;
  const GX_Matrix3 down = {{{1, 0, 0}, {0, height, 0}, {0, 0, 1}}};
  TestWorld<ZR_Pixel8> src(2, 1);
  src.fill({255, 1, 2, 3});
  static std::vector<i32> polls;
  const ZR_ProgressInfo info = {nullptr, [](void*) -> i32 { return polls.push_back(-1), polls.size() == 3 ? 99 : 0; },
                                [](void*, i32 done, i32 total) -> i32 {
                                  return polls.push_back(1000 * done + total), polls.size() == 3 ? 99 : 0;
                                }};
  for (const bool by_matrix : {false, true}) {
    TestWorld<ZR_Pixel8> dst(2, height);
    polls.clear();
    EXPECT_EQ(by_matrix ? ZR_CopyBits3_LO_Straight(&info, src, &down, true, nullptr, dst)
                        : ZR_CopyBits_HQ_Straight(&info, src, dst, nullptr, nullptr),
              99);
    EXPECT_EQ(polls, by_matrix ? (std::vector<i32>{height, 64000 + height, 128000 + height}) : std::vector<i32>(3, -1));
    EXPECT_TRUE(dst.at(1, 128).alpha != 0 && dst.at(1, 129).alpha == 0);
  }
}

class Frame {
 public:
  Frame(i16 width, i16 height, i32 bits) {
    const GX_Rect bounds = {0, 0, height, width};
    EXPECT_EQ(RS_NewWorld(&bounds, 0, bits, &handle_), 0);
    for (i32 i = 0; i < height * (*handle_)->row_bytes; ++i)
      static_cast<u8*>((*handle_)->base)[i] = static_cast<u8>(i * 7);
  }
  ~Frame() { RS_DisposeWorld(handle_); }
  Frame(const Frame&) = delete;
  Frame& operator=(const Frame&) = delete;
  operator RS_World**() { return handle_; }
  u32& at(i32 x, i32 y) {
    return *reinterpret_cast<u32*>(static_cast<u8*>((*handle_)->base) + y * (*handle_)->row_bytes + x * 4);
  }

 private:
  RS_World** handle_ = nullptr;
};

TEST_F(BornLibrary, FramesOfDifferingChannelOrder) {
  const GX_LRect part = {1, 1, 3, 9}, from = {0, 0, 2, 8};
  for (const bool flips : {true, false}) {
    const auto copy = flips ? &ZR_WorldCopy : &ZR_WorldCopy_Static;
    Frame src(4, 4, 32), dst(4, 4, 32), plain(4, 4, 32);
    (*dst)->channel_order = 1;
    EXPECT_EQ(copy(nullptr, src, dst, &from, &part), 0);
    EXPECT_EQ(copy(nullptr, src, plain, &from, &part), 0);
    for (i32 y = 0; y < 4; ++y)
      for (i32 x = 0; x < 4; ++x) {
        const bool flipped = flips && x >= 1 && x < 3 && y >= 1;
        EXPECT_EQ(dst.at(x, y), flipped ? __builtin_bswap32(plain.at(x, y)) : plain.at(x, y));
      }
  }
  Frame src(4, 4, 32), deep(4, 4, 64);
  (*src)->channel_order = 1;
  EXPECT_EQ(ZR_WorldCopy(nullptr, src, deep, nullptr, nullptr), 5);
  EXPECT_EQ(caught.take_message(), "Flipping 32/16-bit worlds is not implemented. Source data 8-bit BGRA.");
  (*deep)->channel_order = 1, (*src)->channel_order = 0;  // a deep frame's order is not looked at
  EXPECT_EQ(ZR_WorldCopy(nullptr, src, deep, nullptr, nullptr), 0);
}

// Every copy of frames reaches its slot, or passes it by.
TEST_F(BornLibrary, CopiesOfFramesAndTheSlots) {
  static i32 reached;
  const auto replaced = [](const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect*,
                           const GX_LRect*) -> i32 {
    return ++reached, progress == nullptr && src->width == 4 && dst->width == 3 ? 77 : 78;
  };
  const struct {
    decltype(&ZR_WorldCopy) copy;
    ZR_SlotIndex slot;
    i32 result;
  } rows[] = {{&ZR_WorldCopy, ZR_Slot_copy_bits_draft, 77},
              {&ZR_WorldCopy_Static, ZR_Slot_copy_bits_draft, 0},
              {&ZR_WorldCopy_HQ, ZR_Slot_copy_bits_hq_straight, 77},
              {&ZR_WorldCopy_HQ_Straight, ZR_Slot_copy_bits_hq_straight, 77},
              {&ZR_WorldCopy_HQ_Static, ZR_Slot_copy_bits_hq_straight, 0},
              {&ZR_WorldCopy_HQ_Straight_Static, ZR_Slot_copy_bits_hq_straight, 0},
              {&ZR_WorldCopy_HQ_Premul, ZR_Slot_copy_bits_hq_premul, 77}};
  Frame src(4, 4, 32), dst(3, 3, 32);
  for (const auto& row : rows) {
    const SlotOverride here(row.slot, reinterpret_cast<void*>(+replaced));
    reached = 0;
    EXPECT_EQ(row.copy(nullptr, src, dst, nullptr, nullptr), row.result) << "slot " << row.slot;
    EXPECT_EQ(reached, row.result != 0);
  }
  (*src)->bits_per_pixel = 24;
  EXPECT_EQ(ZR_WorldCopy_HQ_Static(nullptr, src, dst, nullptr, nullptr), 3);
  EXPECT_EQ(caught.take_verification(), "ZR_Worlds can only be 128, 64 or 32 bits per pixel");
}

}  // namespace
