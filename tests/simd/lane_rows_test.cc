// Vector rows against rows of single numbers, for every instruction set that this processor has: all lengths from
// 1 to 130, at pages that cannot be read, in place and onto themselves.
#include <ZR/composite.h>

#include <vector>

#include "composite/blend_rows.h"
#include "composite/composite_rect.h"
#include "composite/depth_convert_rows.h"
#include "composite/ground_rows.h"
#include "composite/linear_rows.h"
#include "composite/matte_rows.h"
#include "copy/track_matte.h"
#include "iterate/lane_lut_rows.h"
#include "copy/viewer_rows.h"
#include "filter/matte_rows.h"
#include "filter/plane_rows.h"
#include "support/born_library.h"
#include "support/edge_rows.h"
#include "support/gamma_tables.h"
#include "world/alpha_rows.h"
#include "world/depth_rows.h"
#include "world/premul_rows.h"
#include "world/random.h"

namespace {

constexpr i32 longest = 130;

template <class T>
class LaneRows : public BornLibrary {
 protected:
  // Runs body(src, mask, dst) on single numbers and on each instruction set, for all lengths and both edges, and
  // compares what comes out at dst, pixels of type Out.
  template <class Out = T, class Body>
  void compare(const char* what, Body&& body) {
    for (i32 n = 1; n <= longest; ++n) {
      const bool at_end = n % 2 == 0;
      T *const src = src_.at<T>(n, at_end), *const mask = mask_.at<T>(n, !at_end);
      Out* const dst = dst_.at<Out>(n, at_end);
      fill_edgy(random_, n, src);
      fill_edgy(random_, n, mask);
      std::vector<Out> before(static_cast<std::size_t>(n)), expected;
      fill_edgy(random_, n, before.data());
      for (int level = 0; level < 4 && Instructions::has(level); ++level) {
        std::memcpy(dst, before.data(), before.size() * sizeof(Out));
        {
          const Instructions instructions(level);
          body(n, src, mask, dst);
        }
        if (level == 0) expected.assign(dst, dst + n);
        for (i32 i = 0; level > 0 && i < n; ++i)
          ASSERT_TRUE(same_pixel(dst[i], expected[static_cast<std::size_t>(i)]))
              << what << " by " << Instructions::names[level] << ", pixel " << i << " of " << n;
      }
    }
  }
  EdgeRow src_, mask_, dst_;
  std::mt19937 random_{77};
};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(LaneRows, Depths);

template <class T>
zr::Channel<T> part_of_white(f32 part) {
  return static_cast<zr::Channel<T>>(part * static_cast<f32>(zr::Depth<T>::white));
}

TYPED_TEST(LaneRows, InnerBlends) {
  using T = TypeParam;
  const ZR_LinearBlendingTables gamma = gamma_tables(2.2);
  for (i32 mode = -3; mode <= 40; ++mode) {
    if (mode == -1) continue;
    for (const f32 opacity : {1.0f, 0.37f}) {
      ZR_BlendingMode<T> record{};
      record.mode = mode;
      record.seed = 5;
      record.opacity = part_of_white<T>(opacity);
      record.keep_alpha = opacity < 1.0f;
      const std::string name = "mode " + std::to_string(mode);
      const auto run = [&]<bool masked, bool linear>(i32 n, const T* src, const T* mask, T* dst) {
        ZR_InnerBlendingFunc<T> row = nullptr;
        ASSERT_EQ((ZR_GetInnerBlendingFunc<T, masked, linear>(mode, &row)), 0);
        ASSERT_EQ(row(n, &record, linear ? &gamma : nullptr, src, masked ? mask : nullptr, dst), 0);
      };
      this->compare(name.c_str(), [&](i32 n, T* s, T*, T* d) { run.template operator()<false, false>(n, s, s, d); });
      this->compare((name + " masked").c_str(),
                    [&](i32 n, T* s, T* m, T* d) { run.template operator()<true, false>(n, s, m, d); });
      this->compare((name + " in place").c_str(),
                    [&](i32 n, T*, T* m, T* d) { run.template operator()<true, false>(n, d, m, d); });
      this->compare((name + " onto what it reads next").c_str(), [&](i32 n, T*, T*, T* d) {
        if (n > 3) run.template operator()<false, false>(n - 3, d, d, d + 3);
      });
      this->compare((name + " in linear light").c_str(),
                    [&](i32 n, T* s, T* m, T* d) { run.template operator()<true, true>(n, s, m, d); });
      if (this->HasFatalFailure()) return;
    }
  }
}

// Modes on a ground run their four passes in one on lanes.
TYPED_TEST(LaneRows, WholeRows) {
  using T = TypeParam;
  for (i32 mode = -3; mode <= 40; ++mode) {
    if (mode == -1) continue;
    for (const f32 opacity : {1.0f, 0.37f, 0.0f}) {
      ZR_BlendingMode<T> record{};
      record.mode = mode;
      record.opacity = part_of_white<T>(opacity);
      const auto run = [&](i32 n, const T* src, const T* mask, T* dst) {
        const ZR_BlendModeDescriptor<T> plan(record, mask != nullptr, nullptr);
        ASSERT_EQ(ZR_BlendPipeline<T>(nullptr, n, &plan, src, mask, nullptr, dst), 0);
      };
      const std::string name = "whole row of mode " + std::to_string(mode);
      this->compare(name.c_str(), [&](i32 n, T* s, T*, T* d) { run(n, s, nullptr, d); });
      this->compare((name + " masked").c_str(), [&](i32 n, T* s, T* m, T* d) { run(n, s, m, d); });
      this->compare((name + " in place").c_str(), [&](i32 n, T*, T* m, T* d) { run(n, d, m, d); });
      if (this->HasFatalFailure()) return;
    }
  }
}

// Lots drawn by whole vectors, from seeds around the modulus of their generator and where 32 bits end.
TYPED_TEST(LaneRows, LotsFromAnySeed) {
  using T = TypeParam;
  constexpr i32 n = 2000;
  std::vector<T> src(n), dst, expected;
  for (T& pixel : src) {
    const f32 alpha = static_cast<f32>(this->random_() % 1000) / 1000.0f;
    pixel = {part_of_white<T>(0.01f + 0.98f * alpha), 1, 0, 0};
  }
  src[n / 2].alpha = 0;
  ZR_BlendingMode<T> record{};
  record.mode = XferDissolve;
  record.opacity = part_of_white<T>(1);
  for (const u32 around : {0u, zr::seed_modulus, 2 * zr::seed_modulus, zr::seed_step * 100 + zr::seed_high_factor})
    for (u32 seed = around - 20; seed != around + 20; ++seed) {
      record.seed = static_cast<i32>(seed);
      for (int level = 0; level < 4 && Instructions::has(level); ++level) {
        const Instructions instructions(level);
        ZR_InnerBlendingFunc<T> row = nullptr;
        ASSERT_EQ((ZR_GetInnerBlendingFunc<T, false, false>(XferDissolve, &row)), 0);
        dst.assign(n, T{});
        ASSERT_EQ(row(n, &record, nullptr, src.data(), nullptr, dst.data()), 0);
        if (level == 0) expected = dst;
        for (std::size_t i = 0; i < n; ++i)
          ASSERT_TRUE(same_pixel(dst[i], expected[i]))
              << "seed " << seed << " by " << Instructions::names[level] << ", pixel " << i;
      }
    }
}

// Quotients of all bytes, and of many deeper channels, where vectors estimate them.
TYPED_TEST(LaneRows, Quotients) {
  using T = TypeParam;
  constexpr u32 white = static_cast<u32>(zr::Depth<T>::white);
  constexpr i32 n = 1 << 16;
  std::vector<T> src(n), dst(n), expected;
  for (u32 i = 0; i < n; ++i) {
    // Above 8 bits by a divisor and what lies around its halves, where roundings part.
    const u32 below = white == 255 ? i >> 8 : static_cast<u32>(this->random_()) % (white + 1);
    const u32 above = white == 255 ? i & 255 : (i % 2 * below + i % 7) / 2 % (white + 1);
    const u32 any = static_cast<u32>(this->random_()) % (white + 1);
    const auto channel = [](u32 v) { return static_cast<zr::Channel<T>>(v); };
    src[i] = {channel(white), channel(white - below), channel(any), channel(white - i % (white + 1))};
    dst[i] = {channel(white), channel(above), channel(white - below), channel(any)};
  }
  ZR_BlendingMode<T> record{};
  record.mode = XferColorDodge;
  record.opacity = part_of_white<T>(1);
  for (int level = 0; level < 4 && Instructions::has(level); ++level) {
    const Instructions instructions(level);
    ZR_InnerBlendingFunc<T> row = nullptr;
    ASSERT_EQ((ZR_GetInnerBlendingFunc<T, false, false>(record.mode, &row)), 0);
    std::vector<T> out = dst;
    ASSERT_EQ(row(n, &record, nullptr, src.data(), nullptr, out.data()), 0);
    if (level == 0) expected = out;
    for (u32 i = 0; i < n; ++i)
      ASSERT_TRUE(same_pixel(out[i], expected[i])) << Instructions::names[level] << ", pixel " << i;
  }
}

TYPED_TEST(LaneRows, GroundsAndAlphas) {
  using T = TypeParam;
  struct Row {
    const char* name;
    i32 (*row)(i32, const T*, T*);
  };
  for (const Row& one : {Row{"premultiply", zr::premul_row<T>},
                         {"unmultiply", zr::unmul_row<T>},
                         {"white fade", zr::white_fade_row<T>},
                         {"white unfade", zr::white_unfade_row<T>},
                         {"grey fade", zr::grey_fade_row<T>},
                         {"grey unfade", zr::grey_unfade_row<T>}}) {
    this->compare(one.name, [&](i32 n, T* s, T*, T* d) { one.row(n, s, d); });
    this->compare(one.name, [&](i32 n, T*, T*, T* d) { one.row(n, nullptr, d); });
    this->compare(one.name, [&](i32 n, T*, T*, T* d) { one.row(n - 1, d, d + 1); });
  }
  for (const f32 opacity : {1.0f, 0.6f, 0.0f}) {
    const auto factor = part_of_white<T>(opacity);
    this->compare("union", [&](i32 n, T* s, T*, T* d) { zr::union_alpha_row<T>(n, s, factor, nullptr, d); });
    this->compare("masked union", [&](i32 n, T* s, T* m, T* d) { zr::union_alpha_row<T>(n, s, factor, m, d); });
  }
}

TYPED_TEST(LaneRows, MattesAndMixes) {
  using T = TypeParam;
  for (const f32 white_part : {0.0f, 0.4f, 1.0f}) {
    const auto part = part_of_white<T>(white_part);
    const T matte{0, part, static_cast<zr::Channel<T>>(zr::Depth<T>::inv(part)), part};
    this->compare("onto a matte", [&](i32 n, T* s, T*, T* d) { zr::matte_row<T, true>(n, matte, s, d); });
    this->compare("off a matte", [&](i32 n, T* s, T*, T* d) { zr::matte_row<T, false>(n, matte, s, d); });
    this->compare("off a matte in place", [&](i32 n, T*, T*, T* d) { zr::matte_row<T, false>(n, matte, d, d); });
  }
  for (const i32 part : {1, 0x5555, 0x8000, 0xffff}) {
    this->compare("straight mix", [&](i32 n, T* s, T* m, T* d) { zr::blend_row<T, false>(n, s, m, part, d); });
    this->compare("straight mix of one alpha",
                  [&](i32 n, T* s, T*, T* d) { zr::blend_row<T, false>(n, s, s, part, d); });
    this->compare("straight mix in place", [&](i32 n, T*, T* m, T* d) { zr::blend_row<T, false>(n, d, m, part, d); });
    this->compare("premultiplied mix", [&](i32 n, T* s, T* m, T* d) { zr::blend_row<T, true>(n, s, m, part, d); });
    this->compare("mix onto what it reads next",
                  [&](i32 n, T* s, T*, T* d) { zr::blend_row<T, true>(n - 1, s, d, part, d + 1); });
  }
}

TYPED_TEST(LaneRows, AlphasOnly) {
  using T = TypeParam;
  this->compare("fill", [](i32 n, T*, T*, T* d) { zr::fill_alpha_row<T>(d, n, part_of_white<T>(0.3f)); });
  this->compare("invert", [](i32 n, T*, T*, T* d) { zr::invert_alpha_row<T>(d, n); });
  for (u32 kind = 0; kind < 4; ++kind) {
    this->compare("mask cells", [&](i32 n, T* s, T*, T* d) {
      zr::prepare_mask_row<T>(static_cast<u32>(n), s, n / 3 - 20, n, kind, d);
    });
    this->compare("mask cells onto what they read next", [&](i32 n, T*, T*, T* d) {
      zr::prepare_mask_row<T>(static_cast<u32>(n - 1), d, 0, n - 1, kind, d + 1);
    });
  }
}

TYPED_TEST(LaneRows, Depths) {
  using T = TypeParam;
  constexpr bool of_floats = std::is_same_v<T, ZR_PixelFloat>;
  const ZR_LinearBlendingTables gamma = gamma_tables(1.8);
  const auto to = [&]<class Out>() {
    if constexpr (!std::is_same_v<T, Out>) {
      // Rows of floats to 8 bits have another rule where there are vectors, unless they begin between two pixels.
      constexpr bool between = of_floats && std::is_same_v<Out, ZR_Pixel8>;
      for (const bool dither : {false, true})
        this->template compare<Out>(dither ? "dithered" : "conversion", [dither](i32 n, T* s, T*, Out* d) {
          ZR_ResetDitherRandomIndex();
          const T* const from = between ? reinterpret_cast<const T*>(reinterpret_cast<const f32*>(s) + 1) : s;
          zr::convert_row(between ? n - 1 : n, from, d, dither);
        });
      this->template compare<Out>("past the caches", [](i32 n, T* s, T*, Out* d) {
        const T* const from = between ? reinterpret_cast<const T*>(reinterpret_cast<const f32*>(s) + 1) : s;
        zr::stream_row(between ? n - 1 : n, from, d);
      });
      if constexpr (of_floats)
        this->template compare<Out>("clamped", [](i32 n, T* s, T*, Out* d) { zr::narrow_row(n, s, d); });
      this->template compare<Out>("linear floats",
                                  [&](i32 n, T* s, T*, Out* d) { zr::depth_convert_row(n, s, d, gamma); });
    }
  };
  to.template operator()<ZR_Pixel8>();
  to.template operator()<ZR_Pixel16>();
  to.template operator()<ZR_PixelFloat>();
}

using ByteRows = LaneRows<ZR_Pixel8>;
TEST_F(ByteRows, Tables) {
  u8 entries[3][256];
  for (auto& table : entries)
    for (u8& entry : table) entry = static_cast<u8>(random_());
  const zr::ByteTables all(entries[0], entries[1], entries[2], entries[0]),
      some(nullptr, entries[1], nullptr, entries[2]);
  for (const zr::ByteTables* tables : {&all, &some}) {
    compare("tables", [&](i32 n, ZR_Pixel8* s, ZR_Pixel8*, ZR_Pixel8* d) { tables->row(n, s, d); });
    compare("tables in place", [&](i32 n, ZR_Pixel8*, ZR_Pixel8*, ZR_Pixel8* d) { tables->row(n, d, d); });
    compare("tables onto what they read next",
            [&](i32 n, ZR_Pixel8*, ZR_Pixel8*, ZR_Pixel8* d) { tables->row(n - 1, d, d + 1); });
  }
}

TYPED_TEST(LaneRows, Viewers) {
  using T = TypeParam;
  const zr::ViewerGround ground = {{200, 250, 0, 128}, {30, 1, 255, 77}, 0xfffffffd, 4};
  for (i32 style = 0; style < static_cast<i32>(zr::ViewerStyle::count); ++style)
    for (const bool reverse : {false, true})
      this->template compare<ZR_Pixel8>("viewer row", [&](i32 n, T* s, T*, ZR_Pixel8* d) {
        zr::viewer_row<T>(static_cast<zr::ViewerStyle>(style), reverse)(n, ground, s, d);
      });
}

using LaneRows8 = LaneRows<ZR_Pixel8>;

TEST_F(LaneRows8, Mattes) {
  using P = ZR_Pixel8;
  const P matte = {255, 1, 130, 254};
  for (const zr::AlphaPlace place : {zr::AlphaPlace::first, zr::AlphaPlace::last}) {
    compare("onto black", [&](i32 n, P* s, P*, P* d) { zr::matte_rows(place).onto_black(n, s, d); });
    compare("onto black", [&](i32 n, P*, P*, P* d) { zr::matte_rows(place).onto_black(n, nullptr, d); });
    compare("off black", [&](i32 n, P* s, P*, P* d) { zr::matte_rows(place).off_black(n, s, d); });
    compare("off black", [&](i32 n, P*, P*, P* d) { zr::matte_rows(place).off_black(n, nullptr, d); });
    compare("matte added", [&](i32 n, P*, P*, P* d) { zr::matte_rows(place).add_matte(n, matte, d); });
    compare("matte taken", [&](i32 n, P*, P*, P* d) { zr::matte_rows(place).take_matte(n, matte, d); });
  }
}

TEST_F(LaneRows8, Behind) {
  using P = ZR_Pixel8;
  for (const u8 opacity : {u8{255}, u8{101}, u8{1}})
    for (zr::CompositeBehindRowFunc* const row : {zr::composite_behind_row_straight, zr::composite_behind_row_premul}) {
      compare("behind", [&](i32 n, P* s, P*, P* d) { row(n, opacity, s, d); });
      compare("behind itself", [&](i32 n, P*, P*, P* d) { row(n, opacity, d, d); });
      compare("behind what it reads next", [&](i32 n, P*, P*, P* d) { row(n - 1, opacity, d, d + 1); });
    }
}

TEST_F(LaneRows8, Planes) {
  using P = ZR_Pixel8;
  for (u32 planes = 0; planes < 16; ++planes) {
    // The packed rows end, or begin, at the edge too: whole pixels of them are looked at.
    compare("planes out", [&](i32 n, P* s, P*, P* d) {
      zr::plane_rows().extract(planes, n, s, reinterpret_cast<u8*>(d) + (4 - zr::plane_count(planes)) * n);
    });
    compare("planes in", [&](i32 n, P* s, P*, P* d) {
      zr::plane_rows().insert(planes, n, reinterpret_cast<u8*>(s) + (4 - zr::plane_count(planes)) * n, d);
    });
  }
}

}  // namespace
