// Draft copies of worlds and chunks against a plain walk.
#include <ZR/copy_bits.h>
#include <gtest/gtest.h>

#include <limits>
#include <tuple>

#include "copy/copy_model.h"
#include "support/born_library.h"
#include "support/worlds.h"

namespace {

using copy_model::address;

std::string shown(const std::optional<GX_LRect>& r) {
  if (!r) return "null";
  return std::to_string(r->left) + "," + std::to_string(r->top) + "," + std::to_string(r->right) + "," +
         std::to_string(r->bottom);
}

template <class Pair>
class DraftCopy : public BornLibrary {};
template <class From, class To>
using Pair = std::tuple<From, To>;
using Pairs =
    testing::Types<Pair<ZR_Pixel8, ZR_Pixel8>, Pair<ZR_Pixel8, ZR_Pixel16>, Pair<ZR_Pixel8, ZR_PixelFloat>,
                   Pair<ZR_Pixel16, ZR_Pixel8>, Pair<ZR_Pixel16, ZR_Pixel16>, Pair<ZR_Pixel16, ZR_PixelFloat>,
                   Pair<ZR_PixelFloat, ZR_Pixel8>, Pair<ZR_PixelFloat, ZR_Pixel16>, Pair<ZR_PixelFloat, ZR_PixelFloat>>;
TYPED_TEST_SUITE(DraftCopy, Pairs);

TYPED_TEST(DraftCopy, RandomRectangles) {
  using From = std::tuple_element_t<0, TypeParam>;
  using To = std::tuple_element_t<1, TypeParam>;
  copy_model::Rects rects(77);
  i32 failures = 0, changes = 0;
  for (u32 round = 0; round < 6000; ++round) {
    const i32 most_columns = round % 64 == 0 ? 700 : 12;  // several batches of a row now and then
    TestWorld<From> src(rects.between(1, most_columns), rects.between(1, 12), rects.between(0, 2));
    TestWorld<To> dst(rects.between(1, most_columns), rects.between(1, 12), rects.between(0, 2));
    src.randomise(round);
    dst.randomise(round + 1);
    if constexpr (std::is_same_v<From, ZR_PixelFloat>) {
      constexpr f32 inf = std::numeric_limits<f32>::infinity(), nan = std::numeric_limits<f32>::quiet_NaN();
      src.at(0, 0) = {-0.25f, 1.5f, inf, nan};
      src.at(src.width() - 1, 0) = {nan, -inf, 1e30f, 0.5f / 255};
    }
    if (round % 3 == 1) src.turn_over();
    if (round % 5 == 1) dst.turn_over();
    const TestWorld<To> before = dst;
    TestWorld<To> expected = dst;
    const auto from = rects.next({src.width(), src.height()});
    const auto to = round % 8 == 0 ? from : rects.next({dst.width(), dst.height()});
    const copy_model::Answer answer = copy_model::draft(
        {src.width(), src.height()}, {dst.width(), dst.height()}, address(from), address(to), true,
        {"ZRp_CopyBitsUniversal x overflow detected", "ZRp_CopyBitsUniversal y overflow detected"},
        [&](i32 x, i32 y, i32 sx, i32 sy) { expected.at(x, y) = copy_model::convert<To>(src.at(sx, sy)); });
    const i32 code = ZR_CopyBits_Draft(nullptr, src, dst, address(from), address(to));
    ASSERT_TRUE(dst.guards_intact() && src.guards_intact()) << shown(from) << " to " << shown(to);
    const std::string failed = this->caught.take_verification();
    if (!answer.walked) continue;
    ASSERT_TRUE(dst == expected) << shown(from) << " to " << shown(to) << " worlds " << src.width() << "x"
                                 << src.height() << " " << dst.width() << "x" << dst.height();
    ASSERT_EQ(code, answer.code) << shown(from) << " to " << shown(to);
    ASSERT_EQ(failed, answer.failed);
    failures += code != 0;
    changes += !(dst == before);
  }
  EXPECT_GT(failures, 50);
  EXPECT_GT(changes, 1000);
}

// Worlds and ratios that would take hours if every step of the walk were taken.
TEST_F(BornLibrary, DraftCopyOfAbsurdRatios) {
  constexpr i32 huge = std::numeric_limits<i32>::max();
  TestWorld<ZR_Pixel8> src(1, 1), dst(3, 2);
  src.randomise(1);
  ZR_LayerDef endless = *src.layer();  // every row is the same one
  endless.height = huge, endless.row_bytes = 0;
  const GX_LRect wide = {-huge, -huge, huge, huge}, far_right = {0, 0, huge, huge};
  for (ZR_LayerDef* from : {src.layer(), &endless})
    for (const GX_LRect* in : {static_cast<const GX_LRect*>(nullptr), &wide, &far_right})
      for (const GX_LRect* out : {static_cast<const GX_LRect*>(nullptr), &wide, &far_right}) {
        const i32 code = ZR_CopyBits_Draft(nullptr, from, dst, in, out);
        EXPECT_TRUE(code == 0 || code == 3);
        EXPECT_TRUE(dst.guards_intact());
      }
  dst.clear();
  EXPECT_EQ(ZR_CopyBits_Draft(nullptr, &endless, dst, nullptr, nullptr), 0);
  EXPECT_EQ(std::memcmp(&dst.at(2, 1), &src.at(0, 0), 4), 0);
}

TEST_F(BornLibrary, ChannelCopyOfRandomRectangles) {
  const auto four = [](const char* t) { return t[0] << 24 | t[1] << 16 | t[2] << 8 | t[3]; };
  copy_model::Rects rects(5);
  const struct {
    const char* type;
    i32 channels;
  } kinds[] = {{"UBT1", 1}, {"SHT2", 1}, {"UBT1", 4}, {"DBL8", 1}, {"FLT4", 4}, {"RBG ", 2}};
  for (const auto& kind : kinds) {
    const i32 type = four(kind.type);
    u16 element = 0;
    ZR_ChunkDataSize(type, &element);
    const i32 bytes = element * kind.channels;
    for (i32 round = 0; round < 600; ++round) {
      ZR_Chunk src{}, dst{};
      ASSERT_EQ(ZR_NewChunk(rects.between(1, 9), rects.between(1, 9), kind.channels, type, &src), 0);
      const bool alike = round % 9 == 0;
      ASSERT_EQ(ZR_NewChunk(alike ? src.width : rects.between(1, 9), alike ? src.height : rects.between(1, 9),
                            kind.channels, type, &dst),
                0);
      const auto at = [bytes](ZR_Chunk& chunk, i32 x, i32 y) {
        return static_cast<u8*>(chunk.data) + y * chunk.row_bytes + x * bytes;
      };
      for (i32 i = 0; i < src.height * src.row_bytes; ++i) at(src, 0, 0)[i] = static_cast<u8>(rects.between(1, 255));
      std::vector<u8> expected(static_cast<size_t>(dst.height * dst.row_bytes));
      const auto from = rects.next({src.width, src.height});
      const auto to = alike ? from : rects.next({dst.width, dst.height});
      const copy_model::Answer answer = copy_model::draft(
          {src.width, src.height}, {dst.width, dst.height}, address(from), address(to), false,
          {"ZR_ChannelCopy x overflow detected", "ZRp_CopyBitsUniversal y underflow detected"},
          [&](i32 x, i32 y, i32 sx, i32 sy) {
            std::memcpy(expected.data() + y * dst.row_bytes + x * bytes, at(src, sx, sy), static_cast<size_t>(bytes));
          });
      const i32 code = ZR_ChannelCopy(nullptr, &src, &dst, address(from), address(to));
      const std::string failed = caught.take_verification();
      const bool same = std::memcmp(dst.data, expected.data(), expected.size()) == 0;
      EXPECT_EQ(ZR_DisposeChunk(&src), 0);
      EXPECT_EQ(ZR_DisposeChunk(&dst), 0);
      if (!answer.walked) continue;
      ASSERT_TRUE(same) << kind.type << " " << shown(from) << " to " << shown(to);
      ASSERT_EQ(code, answer.code) << kind.type;
      ASSERT_EQ(failed, answer.failed) << kind.type;
    }
  }
}

}  // namespace
