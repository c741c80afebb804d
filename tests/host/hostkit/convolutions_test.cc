// Convolutions divided over threads beside the undivided ones.
#include <ZR/filter.h>
#include <ZR/hostkit.h>

#include <random>
#include <string>
#include <vector>

#include "support/born_library.h"
#include "support/worlds.h"

namespace {

class DividedConvolutions : public testing::TestWithParam<int> {
 protected:
  zr::Hostkit host{{.threads = GetParam(), .verification_sink = [](u32, i32, const std::string&) {}}};
};
INSTANTIATE_TEST_SUITE_P(Threads, DividedConvolutions, testing::Values(1, 2, 7));

// Kernels for every channel, of whole, small, long and uneven numbers; worlds of unlike sizes.
template <class T>
void expect_same(std::mt19937& random) {
  const i32 sizes[] = {1, 3, 5, 9, 71}, size = sizes[random() % 5];
  const i32 width = 60 + static_cast<i32>(random() % 200), height = 25000 / width + static_cast<i32>(random() % 300);
  const bool one_row = size > 9 || random() % 4 == 0;
  const u32 flags = (random() % 2 == 0 ? u32{ZR_ConvolveFlag_Normalised} : 0) +
                    (random() % 2 == 0 ? u32{ZR_ConvolveFlag_Vertical} : 0) + (one_row ? u32{ZR_ConvolveFlag_1D} : 0);
  std::vector<i32> kernels[4];
  for (auto& kernel : kernels)
    for (i32 i = 0; i < (one_row ? size : size * size); ++i) kernel.push_back(static_cast<i32>(random() % 300) - 20);
  TestWorld<T> src(width - 7 + static_cast<i32>(random() % 14), height - 9 + static_cast<i32>(random() % 18));
  src.randomise(static_cast<u32>(random()));
  if constexpr (sizeof(T) == 16)  // sums in every form
    if (random() % 2 == 0)
      for (i32 y = 0; y < src.height(); ++y)
        for (i32 x = 0; x < src.width(); ++x) {
          const auto channel = [&] { return static_cast<f32>(random() % 4096) / (y < 40 ? 4096.0f : 4095.0f); };
          src.at(x, y) = {channel(), channel(), channel(), channel()};
        }
  TestWorld<T> whole(width, height, static_cast<i32>(random() % 3)), divided = whole;
  const auto convolve = [&](decltype(ZR_Convolve)* routine, TestWorld<T>& to) {
    return routine(nullptr, src, nullptr, flags, size, kernels[0].data(), kernels[1].data(), kernels[2].data(),
                   kernels[3].data(), to);
  };
  ASSERT_EQ(convolve(&ZR_Convolve, whole), 0);
  ASSERT_EQ(convolve(&ZRHost_Convolve, divided), 0);
  EXPECT_TRUE(divided == whole) << width << "x" << height << " size " << size << " flags " << flags;
  EXPECT_TRUE(divided.guards_intact());
}

TEST_P(DividedConvolutions, AreThoseOfOneCall) {
  std::mt19937 random(31);
  for (int round = 0; round < 12; ++round) {
    expect_same<ZR_Pixel8>(random);
    expect_same<ZR_Pixel16>(random);
    expect_same<ZR_PixelFloat>(random);
  }
}

// Asked at each poll, a refusal ends the call; rows are old or new. What is not in order is refused once, unasked.
TEST_P(DividedConvolutions, StopAndRefuse) {
  struct Asked {
    i32 polls = 0, refuse = 0;
  } asked;
  const ZR_ProgressInfo info = {&asked, [](void*) -> i32 { return 518; },
                                [](void* self, i32, i32) -> i32 {
                                  auto& here = *static_cast<Asked*>(self);
                                  return ++here.polls == here.refuse ? 517 : 0;
                                }};
  const std::vector<i32> kernel(9, 1);
  const i32* const k = kernel.data();
  TestWorld<ZR_PixelFloat> src(200, 400), before(200, 400), whole(200, 400);
  src.randomise(1), before.randomise(2);
  ASSERT_EQ(ZR_Convolve(nullptr, src, nullptr, 2, 3, k, k, k, k, whole), 0);
  for (i32 n = 1;; ++n) {
    TestWorld<ZR_PixelFloat> made = before;
    asked = {0, n};
    const i32 code = ZRHost_Convolve(&info, src, nullptr, 2, 3, k, k, k, k, made);
    if (asked.polls < n) {
      EXPECT_TRUE(code == 0 && made == whole && n > 1);
      break;
    }
    EXPECT_EQ(code, 517) << n;
    for (i32 y = 0; y < 400; ++y)
      EXPECT_TRUE(std::memcmp(&made.at(0, y), &whole.at(0, y), 3200) == 0 ||
                  std::memcmp(&made.at(0, y), &before.at(0, y), 3200) == 0)
          << "row " << y << " at poll " << n;
  }
  TestWorld<ZR_Pixel8> shallow(200, 400);
  asked = {};
  EXPECT_EQ(ZRHost_Convolve(&info, src, nullptr, 2, 3, k, k, k, k, shallow), 3);
  EXPECT_EQ(ZRHost_Convolve(&info, src, nullptr, 2, 2, k, k, k, k, whole), 3);
  EXPECT_EQ(ZRHost_Convolve(&info, src, nullptr, 2, 3, k, k, nullptr, k, whole), 3);
  EXPECT_EQ(ZRHost_Convolve(&info, nullptr, nullptr, 2, 3, k, k, k, k, whole), 3);
  EXPECT_EQ(asked.polls, 0);
}

}  // namespace
