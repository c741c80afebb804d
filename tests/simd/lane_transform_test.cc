// Layers through matrices, scaled copies and tables of sums: single numbers against every instruction set, from worlds
// between pages that cannot be read.
#include <ZR/copy_bits.h>
#include <ZR/summed_area.h>
#include <ZR/transfer_mode.h>
#include <ZR/transform_world.h>

#include <cmath>
#include <span>
#include <vector>

#include "support/born_library.h"
#include "support/edge_rows.h"
#include "support/table_numbers.h"

namespace {

template <class T>
class LaneWorlds : public BornLibrary {
 protected:
  static constexpr i32 most_pixels = 500, most_columns = 90;

  i32 below(i32 end) { return static_cast<i32>(random_() % static_cast<u32>(end)); }
  f64 between(f64 low, f64 high) { return low + (high - low) * (below(4096) / 4095.0); }

  // A packed world that ends or begins at an edge, top down or bottom up.
  ZR_LayerDef world(EdgeRow& memory, i32 width, i32 height, bool at_end, bool upward) {
    T* const pixels = memory.at<T>(width * height, at_end);
    fill_edgy(random_, width * height, pixels);
    ZR_LayerDef layer{};
    layer.flags = zr::Depth<T>::layer_flags;
    layer.width = width, layer.height = height;
    layer.row_bytes = width * static_cast<i32>(sizeof(T)) * (upward ? -1 : 1);
    layer.data = upward ? pixels + width * (height - 1) : pixels;
    return layer;
  }
  ZR_LayerDef any_world(EdgeRow& memory) {
    const i32 width = 1 + below(most_columns), height = 1 + below(std::min(most_pixels / width, 24));
    return world(memory, width, height, below(2) != 0, below(2) != 0);
  }
  static std::span<T> pixels_in(const ZR_LayerDef& layer) {
    T* const first = static_cast<T*>(layer.data) + (layer.row_bytes < 0 ? layer.width * (1 - layer.height) : 0);
    return {first, static_cast<std::size_t>(layer.width * layer.height)};
  }
  static std::vector<T> pixels_of(const ZR_LayerDef& layer) {
    const std::span<T> pixels = pixels_in(layer);
    return {pixels.begin(), pixels.end()};
  }
  static void put_back(const ZR_LayerDef& layer, const std::vector<T>& pixels) {
    std::copy(pixels.begin(), pixels.end(), pixels_in(layer).begin());
  }

  static zr::Channel<T> part_of_white(f32 part) {
    return static_cast<zr::Channel<T>>(part * static_cast<f32>(zr::Depth<T>::white));
  }

  // Runs body() on all sets, with `dst` as it is now; it returns an error.
  template <class Body>
  void compare(const std::string& what, const ZR_LayerDef& dst, Body&& body) {
    const std::vector<T> before = pixels_of(dst);
    std::vector<T> expected;
    for (int level = 0; level < 4 && Instructions::has(level); ++level) {
      put_back(dst, before);
      {
        const Instructions instructions(level);
        ASSERT_EQ(body(), 0) << what;
      }
      const std::vector<T> got = pixels_of(dst);
      if (level == 0) expected = got;
      for (std::size_t i = 0; i < got.size(); ++i)
        ASSERT_TRUE(same_pixel(got[i], expected[i])) << what << " by " << Instructions::names[level] << ", pixel " << i;
    }
  }

  EdgeRow src_, dst_;
  std::mt19937 random_{5};
};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(LaneWorlds, Depths);

// Source to destination, the origin moved.
GX_Matrix3 turned(f64 scale, f64 degrees, f64 dx, f64 dy) {
  const f64 angle = degrees * 3.14159265358979323846 / 180, c = scale * std::cos(angle), s = scale * std::sin(angle);
  return {{{c, -s, dx}, {s, c, dy}, {0, 0, 1}}};
}

TYPED_TEST(LaneWorlds, Transforms) {
  for (i32 trial = 0; trial < 400; ++trial) {
    ZR_LayerDef src = this->any_world(this->src_), dst = this->any_world(this->dst_);
    constexpr f64 scales[] = {1, 1, 2, 1.3, 0.5, 0.4, 3.1};
    constexpr f64 shifts[] = {0, 0.5, 3, -7.25, 1.0 / 3, -0.001};
    const auto shift = [&] { return shifts[this->below(6)]; };
    f64 scale = scales[this->below(7)], degrees = this->below(2) != 0 ? 0 : this->between(-30, 30);
    if (trial % 4 == 0) {  // boxes in rows that are turned
      src = this->world(this->src_, 22, 22, trial % 8 == 0, trial % 16 == 0);
      dst = this->world(this->dst_, 22, 20, trial % 8 != 0, false);
      scale = this->between(0.6, 0.95), degrees = this->between(-30, 30);
    }
    if (const i32 kind = this->below(6); kind < 3)  // rows without an alpha out of range: opaque, nearly so, mixed
      for (TypeParam& p : this->pixels_in(src))
        p.alpha = this->part_of_white(kind == 0                ? 1.0f
                                      : this->below(40) == 0   ? 1.0f - 0x1p-24f
                                      : this->below(kind) == 0 ? 1.0f
                                                               : static_cast<f32>(this->below(3)) * 0.5f);
    constexpr i32 counts[] = {1, 2, 2, 3, 6};
    const i32 count = counts[this->below(5)];
    const bool turns = this->below(2) != 0;
    std::vector<GX_Matrix3> matrices;
    for (i32 i = 0; i < count; ++i)
      matrices.push_back(turned(scale, degrees + (turns ? 4.0 * i : 0.0), shift() + 5 * i, shift()));
    const i32 quality = this->below(3);
    const GX_LRect all = {0, 0, dst.width, dst.height};
    const ZR_CompositeModePlus mode(this->below(2) != 0 ? XferCopyFast : XferInFront, 1.0f, nullptr, false, 0);
    this->compare("trial " + std::to_string(trial), dst, [&] {
      return ZR_TransformWorld(nullptr, quality, 0, 0, &src, &mode, nullptr, nullptr, matrices.data(), count, true,
                               &all, &dst);
    });
    if (this->HasFatalFailure()) return;
  }
}

// Any phase, and those whose results lie close to halves; rows long enough for several parts, with clear, opaque and
// other runs and with few different values.
TYPED_TEST(LaneWorlds, Moves) {
  using T = TypeParam;
  constexpr f64 shifts[] = {0, 0.5, 0.25, 0.3, 0.1, 1.0 / 3, 0.0625, 1.0 / 65536, 65535.0 / 65536};
  for (i32 trial = 0; trial < 300; ++trial) {
    const auto shift = [&] { return this->below(3) == 0 ? this->below(65536) / 65536.0 : shifts[this->below(9)]; };
    const i32 height = 2 + this->below(6);
    const i32 width = 2 + this->below(8000 / static_cast<i32>(sizeof(T)) / height - 2);
    ZR_LayerDef src = this->world(this->src_, width, height, this->below(2) != 0, this->below(2) != 0);
    ZR_LayerDef dst = this->world(this->dst_, width, height, this->below(2) != 0, false);
    const i32 kind = this->below(3);
    std::vector<T> pixels = this->pixels_of(src);
    for (T& p : pixels) {
      const auto few = [&] { return this->part_of_white(static_cast<f32>(this->below(6)) * 0.2f); };
      const auto any = [&] { return this->part_of_white(static_cast<f32>(this->below(256)) / 255.0f); };
      if (kind == 1) p = {few(), few(), few(), few()};
      if (kind == 2) p = {any(), any(), any(), any()};
    }
    this->put_back(src, pixels);
    const GX_Matrix3 matrix = turned(1, 0, this->below(3) - 1 + shift(), this->below(3) - 1 + shift());
    const GX_LRect all = {0, 0, width, height};
    const ZR_CompositeModePlus mode(XferCopyFast, 1.0f, nullptr, false, 0);
    // Onto another world, and onto itself.
    for (ZR_LayerDef* onto : {&dst, &src})
      this->compare("trial " + std::to_string(trial), *onto, [&] {
        return ZR_TransformWorld(nullptr, 1, 0, 0, &src, &mode, nullptr, nullptr, &matrix, 1, true, &all, onto);
      });
    if (this->HasFatalFailure()) return;
  }
}

TYPED_TEST(LaneWorlds, ScaledCopies) {
  for (i32 trial = 0; trial < 400; ++trial) {
    ZR_LayerDef src = this->any_world(this->src_);
    ZR_LayerDef dst = this->any_world(this->dst_);
    if (trial % 3 == 0) {  // halves
      const i32 width = 2 * (1 + this->below(45)), height = 2;
      src = this->world(this->src_, width, height, trial % 2 == 0, false);
      auto* const pixels = static_cast<TypeParam*>(src.data);
      if (trial % 4 != 0)  // opaque in front, clear behind
        for (i32 i = 0; i < width * height; ++i)
          pixels[i].alpha = this->part_of_white(i % width < trial % 160 ? 1.0f : 0.0f);
      dst = this->world(this->dst_, width / 2, height / 2, trial % 2 != 0, false);
    }
    if (trial % 3 == 1) {  // doubles, where halves are common
      const i32 width = 1 + this->below(50), height = 1 + this->below(2);
      src = this->world(this->src_, width, height, trial % 2 == 0, false);
      dst = this->world(this->dst_, 2 * width, 2 * height, trial % 2 != 0, false);
    }
    std::vector copies = {&ZR_CopyBits_Draft, &ZR_CopyBits_HQ_Straight};
    if (std::is_same_v<TypeParam, ZR_Pixel8>) copies.push_back(&ZR_CopyBits_HQ_Premul);
    for (const auto copy : copies)
      this->compare("trial " + std::to_string(trial), dst, [&] { return copy(nullptr, &src, &dst, nullptr, nullptr); });
    if (this->HasFatalFailure()) return;
  }
}

// Rows of a large destination are kept beside it, and those between two rows of the source for many rows; where all
// begin on cache lines, they go past the caches.
TYPED_TEST(LaneWorlds, LargeScaledCopies) {
  using T = TypeParam;
  ZR_LayerDef src = this->world(this->src_, 90, 5, true, false);
  auto* const top = static_cast<T*>(src.data);
  for (i32 i = 0; i < 2 * src.width; ++i) top[i].alpha = this->part_of_white(i % src.width < 50 ? 1.0f : 0.0f);
  for (const i32 width : {1201, 1216}) {
    constexpr i32 height = 901;
    std::vector<T> pixels(static_cast<std::size_t>(width * height));
    ZR_LayerDef dst{};
    dst.flags = zr::Depth<T>::layer_flags;
    dst.width = width, dst.height = height, dst.row_bytes = width * static_cast<i32>(sizeof(T));
    dst.data = pixels.data();
    for (const auto copy : {&ZR_CopyBits_Draft, &ZR_CopyBits_HQ_Straight})
      this->compare("large", dst, [&] { return copy(nullptr, &src, &dst, nullptr, nullptr); });
  }
}

TYPED_TEST(LaneWorlds, SummedAreas) {
  using T = TypeParam;
  for (i32 trial = 0; trial < 60; ++trial) {
    ZR_LayerDef layer = this->any_world(this->src_);
    const i32 opaque = layer.height * (trial % 4) / 3;  // rows
    for (i32 i = 0; i < opaque * layer.width; ++i) {
      char* const row = static_cast<char*>(layer.data) + std::ptrdiff_t{i / layer.width} * layer.row_bytes;
      reinterpret_cast<T*>(row)[i % layer.width].alpha = this->part_of_white(1.0f);
    }
    const ZR_WorldX<T> world(&layer, true);
    for (const bool use_double : {false, true}) {
      std::vector<f64> expected;
      for (int level = 0; level < 4 && Instructions::has(level); ++level) {
        const Instructions instructions(level);
        const std::vector<f64> got = numbers_of(ZR_SummedAreaTable(&world, use_double), layer.width * layer.height);
        if (level == 0) expected = got;
        for (std::size_t i = 0; i < got.size(); ++i)
          ASSERT_TRUE(std::memcmp(&got[i], &expected[i], sizeof(f64)) == 0 ||
                      (got[i] != got[i] && expected[i] != expected[i]))
              << "trial " << trial << " by " << Instructions::names[level] << ", sum " << i;
      }
    }
  }
}

}  // namespace
