// Layers drawn through matrices: placements, qualities, motion, masks and fields.
#include <ZR/transfer_mode.h>

#include "verify/operation.h"

namespace zr::tool {
namespace {

constexpr i32 kHeight = 39;

struct Affine {
  f64 xx, xy, yx, yy, dx, dy;
};
// Around the middle of the picture, then moved.
constexpr GX_Matrix3 around(const Affine& a) {
  constexpr f64 x = odd_width / 2.0, y = kHeight / 2.0;
  return {{{a.xx, a.xy, x - a.xx * x - a.xy * y + a.dx}, {a.yx, a.yy, y - a.yx * x - a.yy * y + a.dy}, {0, 0, 1}}};
}

struct Placement {
  const char* name;
  std::vector<GX_Matrix3> matrices;
};

// From one placement to another in equal steps.
std::vector<GX_Matrix3> motion(const Affine& from, const Affine& to, i32 count) {
  std::vector<GX_Matrix3> list;
  for (i32 i = 0; i < count; ++i) {
    const f64 t = i / (count - 1.0);
    const auto mix = [&](f64 a, f64 b) { return a + (b - a) * t; };
    list.push_back(around({mix(from.xx, to.xx), mix(from.xy, to.xy), mix(from.yx, to.yx), mix(from.yy, to.yy),
                           mix(from.dx, to.dx), mix(from.dy, to.dy)}));
  }
  return list;
}

constexpr Affine kStill = {1, 0, 0, 1, 0, 0};
constexpr Affine kTurned = {1.1258330249197703, -0.65, 0.65, 1.1258330249197703, 0, 0};  // 30 degrees, 1.3 times
constexpr Affine kSheared = {0.9, 0.3, -0.2, 1.2, 4.25, -3.5};

const std::vector<Placement>& placements() {
  static const std::vector<Placement> list = {
      {"still", {around(kStill)}},
      {"moved", {around({1, 0, 0, 1, 7, -5})}},
      {"moved-half", {around({1, 0, 0, 1, 7.5, 2.5})}},
      {"moved-third", {around({1, 0, 0, 1, -3.3125, 0})}},
      {"turned", {around(kTurned)}},
      {"sheared", {around(kSheared)}},
      {"mirrored", {around({-1, 0, 0, 1, 1, 0})}},
      {"enlarged", {around({1.5, 0, 0, 2.25, 0.25, 0})}},
      {"reduced", {around({0.37, 0, 0, 0.37, 0, 0})}},
      {"reduced-turned", {around({0.4, -0.2, 0.2, 0.4, 1.75, 0})}},
      {"squeezed", {around({0.2, 0, 0, 1.5, 0, 0})}},
      {"perspective", {{{{0.9, 0.1, 5}, {-0.05, 1.1, 2}, {0.001, 0.004, 1}}}}},
      {"motion-2", motion(kStill, {1, 0, 0, 1, 12.25, 5}, 2)},
      {"motion-2-turned", motion(kStill, kTurned, 2)},
      {"motion-2-whole", motion(kStill, {1, 0, 0, 1, 18, -6}, 2)},
      {"motion-2-doubled", motion({2, 0, 0, 2, 0.5, 0.5}, {2, 0, 0, 2, -11.5, 5.5}, 2)},
      {"motion-2-reduced", motion({0.4, -0.2, 0.2, 0.4, 1.75, 0}, {0.5, 0, 0, 0.5, 3, 2}, 2)},
      {"motion-2-reduced-moved", motion({0.4, 0, 0, 0.4, 1.75, 0}, {0.4, 0, 0, 0.4, 9.5, 3.25}, 2)},
      {"motion-3", motion(kSheared, kTurned, 3)},
      {"motion-9", motion(kStill, {0.5, 0.1, -0.1, 0.6, 9, 3}, 9)},
  };
  return list;
}

struct Drawing {
  i32 quality = 1;
  i32 field = 0;
  const ZR_MaskWorld* mask = nullptr;
  const ZR_LinearBlendingTables* tables = nullptr;
  ZR_CompositeModePlus mode = {XferInFront, 1.0f, nullptr, false, 0};
  GX_LRect area = {0, 0, odd_width, kHeight};
};

template <class T>
void draw(Digest& digest, const Drawing& how, const std::vector<GX_Matrix3>& matrices, Content content) {
  Canvas<T> src(odd_width, kHeight, content, 60),
      dst(odd_width, kHeight, content == Content::opaque ? Content::mixed : content, 61);
  digest.number(ZR_TransformWorld(nullptr, how.quality, 0, how.field, &src, &how.mode, how.tables, how.mask,
                                  matrices.data(), static_cast<i32>(matrices.size()), true, &how.area, &dst));
  dst.digest(digest);
}

template <class T>
void in_every_quality(Digest& digest, const std::vector<GX_Matrix3>& matrices, Content content) {
  for (const i32 quality : {0, 1, 2, 3}) draw<T>(digest, {quality}, matrices, content);
  draw<T>(digest, {1}, matrices, Content::opaque);
}

template <class T>
void with_masks(Digest& digest, const std::vector<GX_Matrix3>& matrices, Content content) {
  Canvas<T> picture(odd_width, kHeight, content, 62);
  for (u32 kind = 0; kind < 4; ++kind) {
    ZR_MaskWorld mask{};
    picture->FillOutEffectWorld(&mask.world);
    mask.offset_x = 3 - static_cast<i32>(kind);
    mask.offset_y = static_cast<i32>(kind);
    mask.kind = kind;
    const ZR_CompositeModePlus mode(kind == 3 ? XferScreen : XferInFront, kind == 2 ? 0.4f : 1.0f, nullptr, false, 0);
    draw<T>(digest, {.mask = &mask, .mode = mode}, matrices, content);
  }
}

}  // namespace

void add_transform_operations(Operations& list) {
  for (const Placement& place : placements())
    add_all_with_hostile(
        list, std::string("transform/") + place.name,
        [&place]<class T>(Digest& digest, Content content) { in_every_quality<T>(digest, place.matrices, content); });
  add_all_with_hostile(list, "transform-mask", []<class T>(Digest& digest, Content content) {
    with_masks<T>(digest, {around(kTurned)}, content);
    with_masks<T>(digest, motion(kStill, kSheared, 3), content);
  });
  add_all_with_hostile(list, "transform-fields", []<class T>(Digest& digest, Content content) {
    for (const i32 field : {1, 2})
      for (const Affine& place : {kTurned, Affine{1, 0, 0, 1, 7.5, 2.5}, Affine{0.37, 0, 0, 0.37, 0, 0}})
        draw<T>(digest, {.field = field, .area = {9, 3, 100, 31}}, {around(place)}, content);
  });
  add_all_with_hostile(list, "transform-linear", []<class T>(Digest& digest, Content content) {
    draw<T>(digest, {.tables = &square_tables()}, {around(kTurned)}, content);
    draw<T>(digest, {.tables = &square_tables()}, motion(kStill, kSheared, 3), content);
  });
  add_all_with_hostile(list, "transform-modes", []<class T>(Digest& digest, Content content) {
    for (const i32 mode : {+XferCopy, +XferBehind, +XferDissolve, +XferMultiply, +XferHue, +XferAlphaAdd}) {
      const ZR_CompositeModePlus how(mode, 0.75f, nullptr, mode == XferMultiply, 77);
      draw<T>(digest, {.mode = how}, {around(kSheared)}, content);
    }
  });
}

}  // namespace zr::tool
