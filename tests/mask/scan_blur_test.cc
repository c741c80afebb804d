// Scan blurs of masks against blurs of worlds, which have a plain model of their own.
#include <ZR/blur.h>

#include "mask/masks.h"

namespace {

constexpr i32 radii[] = {0, 1, 20000, 65536, 100000, 177602, 177603, 3 << 16, 10 << 16, 1000001, 100 << 16, 400 << 16};
constexpr i32 lengths[] = {1, 2, 7, 64, 300, 1111};

template <class C>
using Scan = i32 (*)(i32, i32, i32, i32, i32, const C*, C*);

// Alpha of a world of one row after its blur.
template <class C>
std::vector<C> world_blur(bool bell, f32 radius, const std::vector<C>& line) {
  using T = std::conditional_t<sizeof(C) == 1, ZR_Pixel8, ZR_Pixel16>;
  std::vector<T> in(line.size()), out(line.size());
  for (size_t i = 0; i < line.size(); ++i) in[i].alpha = line[i];
  const i32 width = static_cast<i32>(line.size()), bytes = width * static_cast<i32>(sizeof(T));
  ZR_WorldX<T> src(in.data(), width, 1, bytes), dst(out.data(), width, 1, bytes);
  if (bell)
    ZR_GaussianBlur1D(nullptr, &src, radius, ZR_BlurFlag_Alpha, false, true, false, true, false, &dst);
  else
    ZR_BoxBlur1D(nullptr, &src, radius, 1, ZR_BlurFlag_Alpha, false, true, false, true, false, &dst);
  std::vector<C> made;
  for (const T& p : out) made.push_back(p.alpha);
  return made;
}

struct ScanBlurs : BornLibrary {
  template <class C>
  void agree(bool bell, Scan<C> scan) {
    for (const i32 length : lengths) {
      const Mask<C> mask(length, 1, static_cast<u32>(length));
      const std::vector<C> line = mask.all();
      for (const i32 radius : radii) {
        std::vector<C> made(line.size());
        ASSERT_EQ(scan(0, radius, 0, length - 1, length, line.data(), made.data()), 0);
        const std::vector<C> world = world_blur(bell, static_cast<f32>(radius) / 65536, line);
        for (i32 i = 0; i < length; ++i) {
          const auto at = static_cast<size_t>(i);
          // 8 bits agree exactly, deep worlds sum in single precision.
          ASSERT_LE(std::abs(made[at] - world[at]), sizeof(C) == 1 ? 0 : 1)
              << radius << " of " << length << " at " << i;
        }
      }
    }
  }
  void TearDown() override {
    const u8 one = 1;
    u8 out;
    EXPECT_EQ(ZR_GBlurUnoScan(0, 0, 0, 0, 1, &one, &out), 0);  // the taps of the last radius go
    BornLibrary::TearDown();
  }
};

TEST_F(ScanBlurs, AgreeWithBlursOfWorlds) {
  agree<u8>(false, ZR_BoxBlurUnoScan);
  agree<u16>(false, ZR_BoxBlurDeepUnoScan);
  agree<u8>(true, ZR_GBlurUnoScan);
  agree<u16>(true, ZR_GBlurDeepUnoScan);
}

TEST_F(ScanBlurs, MakeThePartAskedForAndCountWiderUnderTheFlag) {
  const Mask<u8> mask(90, 1, 4);
  const std::vector<u8> line = mask.all();
  for (const Scan<u8> scan : {&ZR_BoxBlurUnoScan, &ZR_GBlurUnoScan}) {
    std::vector<u8> whole(90), wide(90);
    ASSERT_EQ(scan(0, 7 << 16, -5, 400, 90, line.data(), whole.data()), 0);
    ASSERT_EQ(scan(ZR_UnoScan_Wide, 5 << 16, 0, 89, 90, line.data(), wide.data()), 0);
    EXPECT_EQ(wide, whole);
    std::vector<u8> part(90, 3), result(90, 3);
    std::copy(whole.begin() + 20, whole.begin() + 31, result.begin() + 20);
    ASSERT_EQ(scan(0, 7 << 16, 20, 30, 90, line.data(), part.data()), 0);
    EXPECT_EQ(part, result);
    for (const i32 length : {0, -4}) EXPECT_EQ(scan(0, 7 << 16, 0, 9, length, line.data(), part.data()), 0);
    EXPECT_EQ(scan(0, 7 << 16, 9, 8, 90, line.data(), part.data()), 0);
    EXPECT_EQ(part, result);
  }
}

TEST_F(ScanBlurs, KeepTheTapsOfOneRadius) {
  const u8 line[4] = {1, 2, 3, 4};
  u8 out[4];
  const auto attempts = [&](i32 radius) {
    HB_MemoryStats before, after;
    HB_GetMemoryStats(&before);
    EXPECT_EQ(ZR_GBlurUnoScan(0, radius, 0, 3, 4, line, out), 0);
    HB_GetMemoryStats(&after);
    return after.allocations - before.allocations;
  };
  EXPECT_EQ(attempts(9 << 16), 1u);
  EXPECT_EQ(attempts(9 << 16), 0u);
  EXPECT_EQ(attempts(8 << 16), 1u);
  EXPECT_EQ(attempts(2 << 16), 0u);
  EXPECT_EQ(attempts(8 << 16), 1u);
  HB_FailNthAllocation(1);
  EXPECT_EQ(ZR_GBlurUnoScan(0, 30 << 16, 0, 3, 4, line, out), 4);
  EXPECT_EQ(attempts(30 << 16), 1u);
}

}  // namespace
