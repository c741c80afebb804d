// Guessing alpha, and the matte families, against plain models of their steps.
#include <RS/rs.h>
#include <ZR/alpha_guess.h>

#include <algorithm>
#include <cstdlib>
#include <vector>

#include "support/born_library.h"
#include "support/edge_rows.h"
#include "support/worlds.h"

namespace {

class AlphaGuess : public BornLibrary {};

using Pixels = std::vector<ZR_Pixel8>;
struct Guess {
  i32 code = 0;
  ZR_Pixel8 matte{};
  bool operator==(const Guess& o) const { return code == o.code && std::memcmp(&matte, &o.matte, sizeof matte) == 0; }
};

// The stated scan and decision, pixel by pixel.
Guess model(const Pixels& pixels) {
  i32 counts[3][256] = {}, clear = 0, white = 0, black = 0;
  bool clear_vary = false, vary = false, exceed = false;
  const ZR_Pixel8 *last_clear = nullptr, *last = nullptr, *faintest = nullptr;
  for (const ZR_Pixel8& p : pixels) {
    const u8 c[3] = {p.red, p.green, p.blue};
    if (p.alpha == 0) {
      if (last_clear != nullptr)
        clear_vary |= std::abs(p.red - last_clear->red) > 2 || std::abs(p.green - last_clear->green) > 2 ||
                      std::abs(p.blue - last_clear->blue) > 2;
      ++clear;
      white += c[0] + c[1] + c[2] == 765;
      black += c[0] + c[1] + c[2] == 0;
      for (i32 k = 0; k < 3; ++k) ++counts[k][c[k]];
      last_clear = &p;
    } else {
      if (last != nullptr) vary |= p.red != last->red || p.green != last->green || p.blue != last->blue;
      if (faintest == nullptr || p.alpha < faintest->alpha) faintest = &p;
      exceed |= std::max({c[0], c[1], c[2]}) > p.alpha;
      last = &p;
    }
  }
  if (faintest == nullptr) return {2, {}};
  const i32 m = faintest->alpha, s[3] = {faintest->red, faintest->green, faintest->blue};
  if (clear > 0 && white == clear && 255 - *std::min_element(s, s + 3) <= m) return {1, {255, 255, 255, 255}};
  if (clear > 0 && black == clear && !exceed) return {1, {255, 0, 0, 0}};
  if (!clear_vary && vary) {
    u8 peak[3];
    bool near = true;
    for (i32 k = 0; k < 3; ++k) {
      peak[k] = static_cast<u8>(std::max_element(counts[k], counts[k] + 256) - counts[k]);
      near &= std::abs(peak[k] - s[k]) <= m + 1;
    }
    if (near) return {1, {255, peak[0], peak[1], peak[2]}};
  }
  return {0, {}};
}

Guess guess(Pixels& pixels, i32 width) {
  ZR_LayerDef world{};
  world.data = pixels.data();
  world.width = width;
  world.height = static_cast<i32>(pixels.size()) / width;
  world.row_bytes = width * 4;
  Guess found{99, {9, 9, 9, 9}};
  EXPECT_EQ(ZR_GuessAlpha(nullptr, &world, nullptr, &found.code, &found.matte), 0);
  return found;
}

TEST_F(AlphaGuess, RunsAndMixturesAsTheStepsSayOnEveryProcessor) {
  std::mt19937 random(5);
  i32 codes[3] = {};
  for (i32 round = 0; round < 600; ++round) {
    const i32 width = 1 + static_cast<i32>(random() % 150);
    Pixels pixels(static_cast<size_t>(width) * 3);
    const u32 grain = 1 + static_cast<u32>(random()) % 60, matte = static_cast<u32>(random()) % 3 * 120;
    ZR_Pixel8 p{};
    for (ZR_Pixel8& each : pixels) {
      if (random() % grain == 0) {
        const u32 kind = static_cast<u32>(random()) % 4;
        p.alpha = static_cast<u8>(kind == 0 ? 0 : kind == 1 ? 255 : random());
        const auto colour = [&] {
          const u32 over = p.alpha * (static_cast<u32>(random()) % 256) / 255;
          return static_cast<u8>(std::min(over + matte * (255u - p.alpha) / 255 + (random() % 200 == 0 ? 9 : 0), 255u));
        };
        p = {p.alpha, colour(), colour(), colour()};
      }
      each = p;
    }
    const Guess expected = model(pixels);
    ++codes[expected.code];
    for (int level = 0; level < 4 && Instructions::has(level); ++level) {
      const Instructions instructions(level);
      ASSERT_EQ(guess(pixels, width), expected) << Instructions::names[level] << ", round " << round;
    }
  }
  EXPECT_GT(*std::min_element(codes, codes + 3), 0) << "all codes come up";
}

// Large worlds are scanned in bands, which threads take in any order. What counts may be in one pixel of any of them,
// or only between two.
TEST_F(AlphaGuess, BandsInAnyOrderAreOneScan) {
  const SlotOverride order(ZR_Slot_iterate_generic, reinterpret_cast<void*>(&iterate_backwards));
  std::mt19937 random(6);
  i32 codes[3] = {};
  constexpr i32 width = 700, height = 800, band_rows = 200;
  for (i32 round = 0; round < 200; ++round) {
    const auto level = [&](u32 most) { return static_cast<u8>(random() % (most + 1)); };
    const u8 matte = round % 3 == 0 ? 0 : round % 3 == 1 ? 255 : 90;
    const ZR_Pixel8 clear = {0, matte, matte, matte};
    const u8 alpha = static_cast<u8>(round % 20 == 5 ? 0 : 1 + level(4)), least = std::min(alpha, matte);
    Pixels pixels(size_t{width} * height, clear);
    for (size_t i = 0; i < pixels.size(); ++i)
      if (i / 64 % 3 == 1) pixels[i] = {alpha, least, least, least};
    // From here on, or once, another colour or alpha; here is often where a band begins.
    for (i32 k = level(3); k > 0; --k) {
      const size_t first = random() % 3 == 0 ? random() % pixels.size() : size_t{width} * band_rows * (1 + level(2));
      const size_t end = random() % 2 == 0 ? first + 1 : pixels.size();
      const u8 more = level(6), fainter = level(1);
      for (size_t i = first; i < end; ++i) {
        ZR_Pixel8& p = pixels[i];
        p.red = static_cast<u8>(p.red > 128 ? p.red - more : p.red + more);
        if (p.alpha > 1) p.alpha = static_cast<u8>(p.alpha - fainter);
      }
    }
    const Guess expected = model(pixels);
    ++codes[expected.code];
    ASSERT_EQ(guess(pixels, width), expected) << "round " << round;
  }
  EXPECT_GT(*std::min_element(codes, codes + 3), 0) << "all codes come up";
}

TEST_F(AlphaGuess, RastersMessagesAndBadInput) {
  const GX_Rect bounds = {0, 0, 3, 5};
  RS_World** raster = nullptr;
  ASSERT_EQ(RS_NewWorld(&bounds, 0, 32, &raster), 0);
  i32 code = 7;
  ZR_Pixel8 matte;
  char message[256] = "before";
  EXPECT_EQ(ZR_GuessAlphaMessage(nullptr, nullptr, raster, &code, &matte, message), 0);
  EXPECT_EQ(code, 2);
  EXPECT_STREQ(message, "Unable to guess alpha channel.");
  EXPECT_EQ((*raster)->lock_count, 0u);
  static_cast<ZR_Pixel8*>((*raster)->base)[2] = {200, 1, 2, 3};
  EXPECT_EQ(ZR_GuessAlphaMessage(nullptr, nullptr, raster, &code, &matte, message), 0);
  EXPECT_EQ(code, 1);
  EXPECT_STREQ(message, "");
  RS_DisposeWorld(raster);
  EXPECT_EQ(ZR_GuessAlpha(nullptr, nullptr, nullptr, &code, &matte), 516) << "nothing to lock";
  TestWorld<ZR_Pixel16> deep(4, 4);
  EXPECT_EQ(ZR_GuessAlpha(nullptr, deep, nullptr, &code, &matte), 3);
  EXPECT_NE(caught.take_verification(), "");
  EXPECT_EQ(ZR_GuessAlpha(nullptr, deep, nullptr, nullptr, &matte), 3);
}

TEST_F(AlphaGuess, MatteColoursComeBackAndBadInputIsRefused) {
  TestWorld<ZR_Pixel8> world(61, 9);
  world.randomise(3);
  const TestWorld<ZR_Pixel8> before(world);
  const ZR_Pixel8 colour = {12, 200, 90, 255}, black = {255, 0, 0, 0};
  for (auto* const move : {ZR_MatteBlackToMatteColorARGB, ZR_MatteBlackToMatteColorBGRA}) {
    EXPECT_EQ(move(world, &colour, 1), 0);
    EXPECT_FALSE(world == before);
    EXPECT_EQ(move(world, &colour, 0), 0);
    EXPECT_TRUE(world == before);
    EXPECT_EQ(move(world, &black, 1), 0);
    EXPECT_TRUE(world == before && world.guards_intact());
  }
  TestWorld<ZR_PixelFloat> real(3, 3);
  EXPECT_EQ(ZR_MatteBlackToMatteColorARGB(real, &black, 1), 3);
  EXPECT_EQ(caught.take_verification(), "ZR_MatteBlackToMatteColorARGB only works on 8bpc ZR_EffectWorlds");
  EXPECT_EQ(ZR_MatteBlackToMatteColorARGB(nullptr, &colour, 1), 3);
  EXPECT_EQ(ZR_MatteBlackToMatteColorARGB(world, nullptr, 1), 3);
  ZR_Pixel8 pixel = colour;
  EXPECT_EQ(ZR_BlackMatte(nullptr, -1, &colour, &pixel), 0);
  EXPECT_EQ(ZR_BlackMatte(nullptr, 4, &colour, nullptr), 3);
}

}  // namespace
