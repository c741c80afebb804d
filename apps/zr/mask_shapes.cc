// Masks that are built up from shapes, through the mask buffers of the library.
#include "mask_shapes.h"

#include <ZR/mask_alpha.h>
#include <ZR/world.h>

#include <algorithm>
#include <atomic>
#include <cmath>

#include "colour_space.h"
#include "interrupt_state.h"
#include "mask_coverage.h"
#include "nearest_name.h"

namespace zr::tool {
namespace {

constexpr MaskMode kMaskModes[] = {
    {"screen", ZR_UnoMode_Screen, false, "joins both; soft edges that overlap add up without reaching beyond white"},
    {"add", ZR_UnoMode_Add, false, "the sum, held to white; shapes that share an edge leave no seam"},
    {"subtract", ZR_UnoMode_Erase, true, "cuts the shape out"},
    {"intersect", ZR_UnoMode_Intersect, true, "keeps what both have: the product"},
    {"lighten", ZR_UnoMode_Lighten, false, "the larger value"},
    {"darken", ZR_UnoMode_Darken, true, "the smaller value"},
    {"difference", ZR_UnoMode_Difference, false, "what one of them has and the other has not"},
    {"dithered-screen", ZR_UnoMode_DitheredScreen, false, "screen, with noise in place of rounding"},
};

OwnedMask new_mask(i32 width, i32 height, i32 depth, const std::string& where) {
  ZR_UnoBuffer* made = nullptr;
  check(depth == 8 ? ZR_NewUnoBuffer(width, height, &made) : ZR_NewDeepUnoBuffer(width, height, &made), where);
  return OwnedMask(made);
}

template <class Value>
Value* values_of(const ZR_UnoBuffer& mask) {
  return static_cast<Value*>(*mask.data);
}

i32 blur_line(i32 radius, i32 length, const u8* from, u8* to) {
  return ZR_GBlurUnoScan(ZR_UnoScan_Plain, radius, 0, length - 1, length, from, to);
}
i32 blur_line(i32 radius, i32 length, const u16* from, u16* to) {
  return ZR_GBlurDeepUnoScan(ZR_UnoScan_Plain, radius, 0, length - 1, length, from, to);
}

// Rows of `from`, blurred, stand as columns in `to`, whose width is the other's height. `between` is as `from`.
template <class Value>
void blur_and_turn(i32 radius, const Value* from, i32 width, i32 height, Value* between, Value* to,
                   const std::string& where) {
  std::atomic<i32> failed = 0;
  for_each_row(height, [&](i32 y) {
    if (interrupted() || failed != 0) return;
    const ptrdiff_t row = static_cast<ptrdiff_t>(y) * width;
    if (const i32 error = blur_line(radius, width, from + row, between + row)) failed = error;
  });
  stop_if_interrupted();
  check(failed, where);
  for_each_row(width, [&](i32 x) {
    for (i32 y = 0; y < height; ++y)
      to[static_cast<ptrdiff_t>(x) * height + y] = between[static_cast<ptrdiff_t>(y) * width + x];
  });
}

template <class Value>
void blur(f64 radius, ZR_UnoBuffer& mask, const std::string& where) {
  const i32 fixed = static_cast<i32>(radius * 65536.0 + 0.5), width = mask.width, height = mask.height;
  const OwnedMask between = new_mask(width, height, mask.depth, where),
                  turned = new_mask(height, width, mask.depth, where);
  Value *const own = values_of<Value>(mask), *const lines = values_of<Value>(*between),
               *const columns = values_of<Value>(*turned);
  blur_and_turn(fixed, own, width, height, lines, columns, where);
  blur_and_turn(fixed, columns, height, width, lines, own, where);
}

GX_LRect grown(const GX_LRect& rect, i32 by) {
  return {rect.left - by, rect.top - by, rect.right + by, rect.bottom + by};
}
GX_LRect common(const GX_LRect& a, const GX_LRect& b) {
  return {std::max(a.left, b.left), std::max(a.top, b.top), std::min(a.right, b.right), std::min(a.bottom, b.bottom)};
}
bool is_empty(const GX_LRect& rect) { return rect.left >= rect.right || rect.top >= rect.bottom; }

// The pixels that a shape can reach, and those beyond the mask's edge that its feather reads.
GX_LRect drawn_area(const MaskShape& shape, i32 width, i32 height) {
  const i32 reach = static_cast<i32>(std::ceil(shape.feather));
  return common(grown(bounds_of(shape), reach), grown({0, 0, width, height}, reach));
}

void accumulate(const MaskShape& shape, ZR_UnoBuffer& mask, const std::string& where) {
  GX_LRect area = drawn_area(shape, mask.width, mask.height);
  const GX_LRect seen = common(area, {0, 0, mask.width, mask.height});
  // A shape out of sight is one clear pixel: modes that clear what lies around a shape still do.
  if (is_empty(seen)) area = {0, 0, 1, 1};
  const OwnedMask drawn = new_mask(area.right - area.left, area.bottom - area.top, mask.depth, where);
  GX_LPoint point = {0, 0};
  GX_LRect part = {0, 0, 1, 1};
  if (!is_empty(seen)) {
    draw_shape(shape, {area.left, area.top}, *drawn);
    if (shape.feather > 0)
      mask.depth == 8 ? blur<u8>(shape.feather, *drawn, where) : blur<u16>(shape.feather, *drawn, where);
    point = {seen.left, seen.top};
    part = {seen.left - area.left, seen.top - area.top, seen.right - area.left, seen.bottom - area.top};
  }
  check(ZR_AccumulateUnoBuffers(&abort_on_interrupt(), drawn.get(), shape.mode.number, static_cast<f32>(shape.opacity),
                                1.0f, &part, &point, &mask),
        where);
}

}  // namespace

std::span<const MaskMode> mask_modes() { return kMaskModes; }

std::optional<MaskMode> find_mask_mode(std::string_view name) {
  const std::string plain = plain_name(name);
  for (const MaskMode& mode : kMaskModes)
    if (plain == mode.name) return mode;
  return std::nullopt;
}

std::string unknown_mask_mode(const std::string& name) {
  std::vector<std::string> names;
  for (const MaskMode& mode : kMaskModes) names.emplace_back(mode.name);
  return "is an unknown mask mode " + quoted_list({name.substr(0, 60)}) + "; the nearest is " +
         quoted_list(nearest_names(name, names, 1)) + " (zr list mask-modes shows all)";
}

std::optional<std::string> wrong_with_box(f64 width, f64 height) {
  if (width > 0 && height > 0) return std::nullopt;
  return "has no area; its width and height must be above 0";
}

OwnedMask draw_mask(i32 width, i32 height, i32 depth, const std::vector<MaskShape>& shapes, const MaskFinish& finish,
                    const std::string& where) {
  OwnedMask mask = new_mask(width, height, depth, where);
  if (!shapes.empty() && shapes.front().mode.cuts)
    check(depth == 8 ? ZR_FillUnoBuffer(255, mask.get()) : ZR_FillDeepUnoBuffer(32768, mask.get()), where);
  for (const MaskShape& shape : shapes) {
    stop_if_interrupted();
    accumulate(shape, *mask, where);
  }
  if (finish.invert) check(ZR_InvertUnoBuffer(&abort_on_interrupt(), mask.get()), where);
  if (finish.fade != 1) check(ZR_FadeUnoBuffer(static_cast<f32>(finish.fade), mask.get()), where);
  return mask;
}

u64 mask_bytes(i32 width, i32 height, i32 depth, const std::vector<MaskShape>& shapes) {
  const u64 value = static_cast<u64>(depth / 8);
  u64 largest = 0;
  for (const MaskShape& shape : shapes) {
    const GX_LRect area = drawn_area(shape, width, height);
    if (is_empty(area)) continue;
    const u64 pixels = static_cast<u64>(area.right - area.left) * static_cast<u64>(area.bottom - area.top);
    largest = std::max(largest, pixels * (shape.feather > 0 ? 3 : 1));
  }
  return (static_cast<u64>(width) * static_cast<u64>(height) + largest) * value;
}

void merge_mask(const ZR_UnoBuffer& mask, OwnedWorld& picture, const std::string& where) {
  with_pixel_of(picture.depth(), [&]<class Pixel>() {
    ZR_WorldX<Pixel> world(picture.layer(), true);
    with_engine(where, [&] { ZR_MergeMaskAlpha(&abort_on_interrupt(), 0, 0, nullptr, &mask, nullptr, &world); });
  });
}

OwnedWorld picture_of_mask(const ZR_UnoBuffer& mask) {
  OwnedWorld picture(mask.width, mask.height, mask.depth);
  const auto paint = [&]<class Pixel>() {
    for_each_row(mask.height, [&](i32 y) {
      const Channel<Pixel>* const values = values_of<Channel<Pixel>>(mask) + static_cast<ptrdiff_t>(y) * mask.width;
      Pixel* const row = picture.row<Pixel>(y);
      for (i32 x = 0; x < mask.width; ++x) row[x] = {Depth<Pixel>::white, values[x], values[x], values[x]};
    });
  };
  if (mask.depth == 8)
    paint.template operator()<ZR_Pixel8>();
  else
    paint.template operator()<ZR_Pixel16>();
  return picture;
}

}  // namespace zr::tool
