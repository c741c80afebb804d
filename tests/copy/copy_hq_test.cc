// Copies of high quality against the samplers, called at the positions that belong to each pixel; refusals and
// abort of all copies; frames.
#include <RS/rs.h>
#include <ZR/copy_bits.h>
#include <ZR/sample.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
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
  const i32 dw = static_cast<i16>(d.right - d.left), dh = static_cast<i16>(d.bottom - d.top);
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
    const auto misses = [](const GX_LRect& r, const TestWorld<T>& w) {
      return r.left == r.right || r.top == r.bottom || r.left >= w.width() || r.top >= w.height() || r.right < 1 ||
             r.bottom < 1;
    };
    const i64 dw = i64{s.right} - s.left - d.right + d.left, dh = i64{s.bottom} - s.top - d.bottom + d.top;
    const bool unscaled = dw % (i64{1} << 32) == 0 && dh % (i64{1} << 32) == 0;
    TestWorld<T> expected = dst;
    i32 code = 0;
    if (unscaled && !premul) {
      code = ZR_CopyBits_Draft(nullptr, src, expected, address(from), address(to));
    } else if (!misses(s, src) && !misses(d, dst)) {
      const GX_LRect all = {0, 0, dst.width(), dst.height()};
      const bool whole = std::memcmp(&s, &all, sizeof s) == 0 && std::memcmp(&d, &all, sizeof d) == 0 &&
                         src.width() == dst.width() && src.height() == dst.height();
      if (whole)
        ZR_CopyBits_Draft(nullptr, src, expected, nullptr, nullptr);
      else
        model(src, s, d, premul, expected);
    }
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

TEST_F(BornLibrary, HighQualityCopyTakesTheSamplersOfTheSlots) {
  static i32 calls;
  const auto counting = [](const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, void*) -> i32 { return ++calls, 0; };
  const auto routine = reinterpret_cast<void*>(+counting);
  const struct {
    ZR_SlotIndex slot;
    decltype(&ZR_CopyBits_Draft) copy;
    i32 depth, dst_width, dst_height;  // from 4 x 4 pixels
  } rows[] = {{ZR_Slot_bilinear_straight8, &ZR_CopyBits_HQ_Straight, 8, 5, 5},
              {ZR_Slot_area_straight8, &ZR_CopyBits_HQ_Straight, 8, 5, 3},
              {ZR_Slot_bilinear_straight16, &ZR_CopyBits_HQ_Straight, 16, 4, 5},
              {ZR_Slot_area_straight16, &ZR_CopyBits_HQ_Straight, 16, 3, 9},
              {ZR_Slot_bilinear_premul8, &ZR_CopyBits_HQ_Premul, 8, 4, 5},
              {ZR_Slot_area_premul8, &ZR_CopyBits_HQ_Premul, 8, 3, 4}};
  for (const auto& row : rows) {
    TestWorld<ZR_Pixel8> src8(4, 4), dst8(row.dst_width, row.dst_height);
    TestWorld<ZR_Pixel16> src16(4, 4), dst16(row.dst_width, row.dst_height);
    ZR_LayerDef* const src = row.depth == 8 ? src8.layer() : src16.layer();
    ZR_LayerDef* const dst = row.depth == 8 ? dst8.layer() : dst16.layer();
    calls = 0;
    {
      const SlotOverride here(row.slot, routine);
      EXPECT_EQ(row.copy(nullptr, src, dst, nullptr, nullptr), 0);
    }
    EXPECT_EQ(calls, row.dst_width * row.dst_height) << "slot " << row.slot;
    const SlotOverride empty(row.slot, nullptr);
    EXPECT_EQ(row.copy(nullptr, src, dst, nullptr, nullptr), 3) << "slot " << row.slot;
  }
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
  const auto bits = [](decltype(&ZR_CopyBits_Draft) copy, ZR_LayerDef* from, ZR_LayerDef* to) {
    return [=] { return copy(nullptr, from, to, nullptr, nullptr); };
  };
  const auto channels = [](ZR_Chunk* from, ZR_Chunk* to) {
    return [=] { return ZR_ChannelCopy(nullptr, from, to, nullptr, nullptr); };
  };
  const auto matrix = [](ZR_LayerDef* from, const GX_Matrix3* by, ZR_LayerDef* to) {
    return [=] { return ZR_CopyBits3_LO_Straight(nullptr, from, by, true, nullptr, to); };
  };
  constexpr u32 verification = 0;
  constexpr const char* depths = "ZR_CopyBits_HQ_Straight_Static requires src and dst worlds to have same bit depth";
  const struct {
    const char* name;
    u32 site;  // of the message about a bad parameter; verification: another text
    const char* text;
    std::function<i32()> call;
  } rows[] = {
      {"draft, no source", 48, "", bits(&ZR_CopyBits_Draft, nullptr, small)},
      {"draft, no destination", 48, "", bits(&ZR_CopyBits_Draft_Static, src, nullptr)},
      {"draft, bare source", 48, "", bits(&ZR_CopyBits_Draft, &bare, small)},
      {"draft, bare destination", 48, "", bits(&ZR_CopyBits_Draft, src, &bare_small)},
      {"straight, no source", 49, "", bits(&ZR_CopyBits_HQ_Straight, nullptr, small)},
      {"straight, bare source, scaled", 49, "", bits(&ZR_CopyBits_HQ_Straight, &bare, small)},
      {"straight, bare destination, unscaled", 49, "", bits(&ZR_CopyBits_HQ_Straight_Static, deep, &bare)},
      {"straight, depths", verification, depths, bits(&ZR_CopyBits_HQ_Straight, src, small_deep)},
      {"straight, depths before pixels", verification, depths, bits(&ZR_CopyBits_HQ_Straight, deep, &bare_small)},
      {"premul, no destination", 50, "", bits(&ZR_CopyBits_HQ_Premul, src, nullptr)},
      {"premul, bare source", 50, "", bits(&ZR_CopyBits_HQ_Premul_Static, &bare, small)},
      {"chunks, none", 72, "", channels(nullptr, &chunk)},
      {"chunks, unlocked", 72, "", channels(&chunk, &unlocked)},
      {"chunks, pixel sizes", 72, "", channels(&chunk, &wide)},
      {"matrix, bare source", 101, "", matrix(&bare, &unit, small)},
      {"matrix, no matrix", 101, "", matrix(src, nullptr, small)},
      {"matrix, no destination", 101, "", matrix(src, &unit, nullptr)},
      {"frames, none", 48, "", [] { return ZR_WorldCopy(nullptr, nullptr, nullptr, nullptr, nullptr); }},
  };
  for (const auto& row : rows) {
    caught.clear();
    EXPECT_EQ(row.call(), 3) << row.name;
    const bool by_message = row.site != verification;
    const auto& reports = by_message ? caught.messages() : caught.verifications();
    ASSERT_EQ(reports.size(), 1u) << row.name;
    EXPECT_EQ(caught.messages().size() + caught.verifications().size(), 1u) << row.name;
    if (by_message) {
      EXPECT_EQ(reports[0].code, 0x250000 | row.site) << row.name;
    }
    EXPECT_EQ(reports[0].text, by_message ? "bad parameter passed to effect callback" : row.text) << row.name;
  }
  EXPECT_EQ(bits(&ZR_CopyBits_HQ_Straight, src, deep)(), 0) << "one size needs no one depth";
  EXPECT_EQ(ZR_DisposeChunk(&chunk), 0);
  EXPECT_EQ(ZR_DisposeChunk(&wide), 0);
}

// Stops at the n-th poll.
struct Polls {
  std::vector<i32> done;
  size_t stop_at;
  i32 total = 0;
  static i32 abort(void* self) { return progress(self, -1, 0); }
  static i32 progress(void* self, i32 done, i32 total) {
    Polls& polls = *static_cast<Polls*>(self);
    polls.done.push_back(done), polls.total = total;
    return polls.done.size() == polls.stop_at ? 99 : 0;
  }
};

TEST_F(BornLibrary, CopiesStopAtAPoll) {
  constexpr i32 height = 131;
  const GX_Matrix3 down = {{{1, 0, 0}, {0, height, 0}, {0, 0, 1}}};
  TestWorld<ZR_Pixel8> src(2, 1);
  src.fill({255, 1, 2, 3});
  const auto straight = [&](const ZR_ProgressInfo* info, ZR_LayerDef* dst) {
    return ZR_CopyBits_HQ_Straight(info, src, dst, nullptr, nullptr);
  };
  const auto premul = [&](const ZR_ProgressInfo* info, ZR_LayerDef* dst) {
    return ZR_CopyBits_HQ_Premul(info, src, dst, nullptr, nullptr);
  };
  const auto matrix = [&](const ZR_ProgressInfo* info, ZR_LayerDef* dst) {
    return ZR_CopyBits3_LO_Straight(info, src, &down, true, nullptr, dst);
  };
  const struct {
    const char* name;
    std::function<i32(const ZR_ProgressInfo*, ZR_LayerDef*)> copy;
    bool tells;  // by the progress function, where there is one
  } rows[] = {{"straight", straight, false}, {"premul", premul, false}, {"matrix", matrix, true}};
  for (const auto& row : rows)
    for (size_t stop_at = 1; stop_at <= 4; ++stop_at)
      for (const bool with_progress : {false, true}) {
        TestWorld<ZR_Pixel8> dst(2, height);
        Polls polls{{}, stop_at};
        const ZR_ProgressInfo info = {&polls, &Polls::abort, with_progress ? &Polls::progress : nullptr};
        EXPECT_EQ(row.copy(&info, dst), stop_at <= 3 ? 99 : 0) << row.name;
        EXPECT_EQ(polls.done.size(), std::min<size_t>(stop_at, 3)) << row.name;
        if (row.tells && with_progress) {
          EXPECT_EQ(polls.done.back(), static_cast<i32>(polls.done.size() - 1) * 64);
          EXPECT_EQ(polls.total, height);
        } else {
          EXPECT_EQ(polls.done.back(), -1) << row.name;
        }
        i32 written = 0;
        for (i32 y = 0; y < height; ++y) written += dst.at(1, y).alpha != 0;
        EXPECT_EQ(written, stop_at <= 3 ? static_cast<i32>(stop_at - 1) * 64 + 1 : height) << row.name;
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
  const struct {
    const char* name;
    decltype(&ZR_WorldCopy) copy;
    const GX_LRect *from, *to;
    bool flips;
  } rows[] = {{"whole", &ZR_WorldCopy, nullptr, nullptr, true},
              {"part", &ZR_WorldCopy, &from, &part, true},
              {"static", &ZR_WorldCopy_Static, nullptr, nullptr, false},
              {"high quality", &ZR_WorldCopy_HQ, nullptr, nullptr, false}};
  for (const auto& row : rows) {
    Frame src(4, 4, 32), dst(4, 4, 32);
    (*dst)->channel_order = 1;
    Frame plain(4, 4, 32);  // the same copy between frames of one order
    for (i32 y = 0; y < 4; ++y)
      for (i32 x = 0; x < 4; ++x) plain.at(x, y) = dst.at(x, y) = 0x01020304u * static_cast<u32>(y + 1);
    EXPECT_EQ(row.copy(nullptr, src, dst, row.from, row.to), 0) << row.name;
    EXPECT_EQ(row.copy(nullptr, src, plain, row.from, row.to), 0) << row.name;
    const GX_LRect in = row.to != nullptr ? *row.to : GX_LRect{0, 0, 4, 4};
    for (i32 y = 0; y < 4; ++y)
      for (i32 x = 0; x < 4; ++x) {
        const bool flipped = row.flips && x >= in.left && x < in.right && y >= in.top && y < in.bottom;
        EXPECT_EQ(dst.at(x, y), flipped ? __builtin_bswap32(plain.at(x, y)) : plain.at(x, y)) << row.name;
      }
  }
  Frame src(4, 4, 32), deep(4, 4, 64);
  (*src)->channel_order = 1;
  caught.clear();
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
