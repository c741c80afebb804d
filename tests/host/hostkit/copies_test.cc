// Copies and blends divided over threads beside the undivided ones: any rectangles, depths and worlds give the same
// bytes and codes.
#include <ZR/copy_bits.h>
#include <ZR/hostkit.h>
#include <ZR/slots.h>

#include <limits>
#include <string>
#include <vector>

#include "support/born_library.h"
#include "support/worlds.h"

namespace {

using Random = std::mt19937;
i32 pick(Random& random, i32 low, i32 high) {
  return low + static_cast<i32>(random() % static_cast<u32>(high - low + 1));
}

using CopyFunc = decltype(ZR_CopyBits_Draft);
struct Copies {
  const char* name;
  CopyFunc *whole, *divided;
  ZR_SlotIndex slot;
};
constexpr Copies draft = {"draft", &ZR_CopyBits_Draft, &ZRHost_CopyBits_Draft, ZR_Slot_copy_bits_draft},
                 straight = {"straight", &ZR_CopyBits_HQ_Straight, &ZRHost_CopyBits_HQ_Straight,
                             ZR_Slot_copy_bits_hq_straight},
                 premul = {"premul", &ZR_CopyBits_HQ_Premul, &ZRHost_CopyBits_HQ_Premul, ZR_Slot_copy_bits_hq_premul};

class DividedCopies : public testing::TestWithParam<int> {
 protected:
  zr::Hostkit host{{.threads = GetParam(), .verification_sink = [](u32, i32, const std::string&) {}}};
};
INSTANTIATE_TEST_SUITE_P(Threads, DividedCopies, testing::Values(1, 2, 3, 7));

struct Rect {
  bool all = false;
  GX_LRect rect{};
  const GX_LRect* get() const { return all ? nullptr : &rect; }
};

// All of it, a part, one that reaches out, and now and then one that no arithmetic can hold, or an inverted one.
Rect random_rect(Random& random, i32 width, i32 height) {
  constexpr i32 far = std::numeric_limits<i32>::max();
  switch (pick(random, 0, 11)) {
    case 0:
    case 1:
    case 2: return {true, {}};
    case 3: return {false, {0, 0, width, height}};
    case 4: return {false, {-width, -far - 1, 2 * width, far}};
    case 5: return {false, {0, -far - 1, width, pick(random, -9, height)}};
    case 6: return {false, {pick(random, -9, 9), height - 7, width, pick(random, -9, 9)}};
    case 7:
    case 8:
      return {
          false,
          {pick(random, -60, 9), pick(random, -90, 9), width + pick(random, -9, 99), height + pick(random, -9, 300)}};
    default:
      return {false,
              {pick(random, 0, 30), pick(random, 0, 30), width - pick(random, 0, 30), height - pick(random, 0, 30)}};
  }
}

template <class To, class From>
void expect_same(const Copies& copies, Random& random) {
  const i32 width = pick(random, 60, 500), height = pick(random, 40, 90000 / width);
  const bool one_size = pick(random, 0, 3) == 0;
  TestWorld<From> src(one_size ? width : pick(random, 40, 420), one_size ? height : pick(random, 40, 420));
  TestWorld<To> dst(width, height, pick(random, 0, 2));
  src.randomise(static_cast<u32>(random())), dst.randomise(static_cast<u32>(random()));
  const Rect in = random_rect(random, src.width(), src.height()), out = random_rect(random, width, height);
  TestWorld<To> whole = dst, divided = dst;
  if (pick(random, 0, 2) == 0) whole.turn_over(), divided.turn_over();
  if (pick(random, 0, 7) == 0) src.turn_over();
  const bool within_itself = std::is_same_v<To, From> && pick(random, 0, 7) == 0;
  const auto copy = [&](CopyFunc* routine, TestWorld<To>& to) {
    return routine(nullptr, within_itself ? to.layer() : src.layer(), to, in.get(), out.get());
  };
  const std::string what = std::string(copies.name) + " " + std::to_string(zr::Depth<From>::bits) + " to " +
                           std::to_string(zr::Depth<To>::bits) + ", " + std::to_string(src.width()) + "x" +
                           std::to_string(src.height()) + testing::PrintToString(in.rect.top) + " to " +
                           std::to_string(width) + "x" + std::to_string(height) + " at " +
                           std::to_string(out.rect.top) + ".." + std::to_string(out.rect.bottom);
  EXPECT_EQ(copy(copies.divided, divided), copy(copies.whole, whole)) << what;
  EXPECT_TRUE(divided == whole) << what;
}

TEST_P(DividedCopies, AreThoseOfOneCall) {
  Random random(21);
  const auto each_depth = []<class Body>(Body&& body) {
    body.template operator()<ZR_Pixel8>();
    body.template operator()<ZR_Pixel16>();
    body.template operator()<ZR_PixelFloat>();
  };
  for (int round = 0; round < 15; ++round)
    each_depth([&]<class To>() {
      each_depth([&]<class From>() {
        expect_same<To, From>(draft, random);
        if (std::is_same_v<To, From> || round % 5 == 0) expect_same<To, From>(straight, random);
        if (std::is_same_v<From, ZR_Pixel8> && std::is_same_v<To, From>) expect_same<To, From>(premul, random);
      });
    });
}

template <class T>
void expect_same_blend(decltype(ZR_Blend)* whole_routine, decltype(ZR_Blend)* divided_routine, Random& random) {
  // 0 and 1: onto that world. 2: onto the second's rows but the first, and long enough for its bands to meet.
  const int same = pick(random, 0, 4);
  const i32 width = pick(random, 60, 500), height = same == 2 ? 320000 / width : pick(random, 40, 180000 / width);
  const i32 ratio = pick(random, 0, 3) == 0 ? 0x10000 * pick(random, -1, 1) : pick(random, 1, 0xffff);
  TestWorld<T> one(width, height), other(width, height), dst(width, height, pick(random, 0, 2));
  one.randomise(static_cast<u32>(random())), other.randomise(static_cast<u32>(random()));
  const auto blend = [&](decltype(ZR_Blend)* routine) {
    TestWorld<T> sources[] = {one, other};
    TestWorld<T> out = dst;
    std::vector<ZR_LayerDef> layers = {*sources[0].layer(), *sources[1].layer(), *out.layer()};
    if (same < 2) layers[2] = layers[static_cast<size_t>(same)];
    if (same == 2) {
      for (ZR_LayerDef& layer : layers) --layer.height;
      layers[2].data = static_cast<char*>(layers[1].data) + layers[1].row_bytes;
      layers[2].row_bytes = layers[1].row_bytes;
    }
    const i32 code = routine(nullptr, &layers[0], &layers[1], ratio, &layers[2]);
    EXPECT_EQ(code, 0);
    return same < 2 ? sources[same] : same == 2 ? sources[1] : out;
  };
  EXPECT_TRUE(blend(divided_routine) == blend(whole_routine)) << width << "x" << height << " ratio " << ratio << same;
}

TEST_P(DividedCopies, BlendsAreThoseOfOneCall) {
  Random random(22);
  for (int round = 0; round < 8; ++round) {
    expect_same_blend<ZR_Pixel8>(&ZR_Blend, &ZRHost_Blend, random);
    expect_same_blend<ZR_Pixel16>(&ZR_Blend, &ZRHost_Blend, random);
    expect_same_blend<ZR_PixelFloat>(&ZR_Blend, &ZRHost_Blend, random);
    expect_same_blend<ZR_Pixel8>(&ZR_Blend_Premul, &ZRHost_Blend_Premul, random);
    expect_same_blend<ZR_Pixel16>(&ZR_Blend_Premul, &ZRHost_Blend_Premul, random);
    expect_same_blend<ZR_PixelFloat>(&ZR_Blend_Premul, &ZRHost_Blend_Premul, random);
  }
}

// Worlds and rectangles that the library refuses, or passes over, without a band being begun.
TEST_P(DividedCopies, WhatIsRefusedIsTheLibrarys) {
  TestWorld<ZR_Pixel8> src(300, 300), dst(400, 400), small(7, 400);
  TestWorld<ZR_Pixel16> deep(400, 400);
  ZR_LayerDef lost = *dst.layer();
  lost.data = nullptr;
  const GX_LRect empty = {5, 5, 5, 90}, beyond = {400, 0, 500, 400};
  struct Case {
    ZR_LayerDef *src, *dst;
    const GX_LRect *in, *out;
  };
  for (const Case& c :
       {Case{nullptr, dst, nullptr, nullptr}, Case{src, &lost, nullptr, nullptr}, Case{src, deep, nullptr, nullptr},
        Case{src, dst, &empty, nullptr}, Case{src, dst, nullptr, &beyond}})
    for (const Copies& copies : {draft, straight})
      EXPECT_EQ(copies.divided(nullptr, c.src, c.dst, c.in, c.out), copies.whole(nullptr, c.src, c.dst, c.in, c.out))
          << copies.name;
  for (ZR_LayerDef* const second : {static_cast<ZR_LayerDef*>(nullptr), &lost, small.layer(), deep.layer()}) {
    EXPECT_EQ(ZRHost_Blend(nullptr, dst, second, 99, dst), 3);
    EXPECT_EQ(ZR_Blend(nullptr, dst, second, 99, dst), 3);
  }
}

TEST_P(DividedCopies, OnlyTheAbortOfSampledCopiesIsAsked) {
  struct Asked {
    i32 polls = 0, refuse = 0;
  } asked;
  const ZR_ProgressInfo info = {&asked,
                                [](void* self) -> i32 {
                                  auto& here = *static_cast<Asked*>(self);
                                  return ++here.polls == here.refuse ? 517 : 0;
                                },
                                [](void*, i32, i32) -> i32 { return 518; }};
  TestWorld<ZR_Pixel8> src(200, 300), before(200, 1400, 0);
  src.randomise(1), before.randomise(2);
  TestWorld<ZR_Pixel8> whole = before;
  for (const Copies& copies : {straight, premul}) {
    ASSERT_EQ(copies.whole(nullptr, src, whole, nullptr, nullptr), 0);
    for (i32 n = 1;; ++n) {
      TestWorld<ZR_Pixel8> drawn = before;
      asked = {0, n};
      const i32 code = copies.divided(&info, src, drawn, nullptr, nullptr);
      if (asked.polls < n) {
        EXPECT_TRUE(code == 0 && drawn == whole && n > 1) << copies.name;
        break;
      }
      EXPECT_EQ(code, 517) << n;
      EXPECT_EQ(asked.polls, n) << "nobody asks again";
      for (i32 y = 0; y < drawn.height(); ++y)
        EXPECT_TRUE(std::memcmp(&drawn.at(0, y), &whole.at(0, y), 800) == 0 ||
                    std::memcmp(&drawn.at(0, y), &before.at(0, y), 800) == 0)
            << "row " << y << " at poll " << n;
    }
  }
  asked = {0, 1};
  EXPECT_EQ(ZRHost_CopyBits_Draft(&info, src, whole, nullptr, nullptr), 0);
  EXPECT_EQ(ZRHost_Blend(&info, before, whole, 77, whole), 0);
  EXPECT_EQ(asked.polls, 0);
}

TEST_P(DividedCopies, AReplacementCopiesTheWhole) {
  static i32 calls;
  CopyFunc* const counts = [](const ZR_ProgressInfo*, ZR_LayerDef*, ZR_LayerDef*, const GX_LRect*,
                              const GX_LRect*) -> i32 { return 40 + ++calls; };
  TestWorld<ZR_Pixel8> src(300, 300), dst(500, 500);
  for (const Copies& copies : {draft, straight, premul}) {
    const SlotOverride replaced(copies.slot, reinterpret_cast<void*>(counts));
    calls = 0;
    EXPECT_EQ(copies.divided(nullptr, src, dst, nullptr, nullptr), 41) << copies.name;
  }
}

}  // namespace
