// Masks that are built up from shapes: what a shape is, and how shapes become one mask buffer of the library.
#pragma once

#include <ZR/mask_buffer.h>

#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "keyframes.h"
#include "owned_world.h"

namespace zr::tool {

inline constexpr i32 kFarthestPoint = 1000000;  // pixels, either way
inline constexpr i32 kWidestFeather = 1000;     // pixels
inline constexpr size_t kMostPoints = 1000;     // of a polygon
inline constexpr size_t kMostShapes = 1000;     // of a mask

// How a shape joins the mask of the shapes before it.
struct MaskMode {
  const char* name;
  i32 number;  // ZR_UnoMode
  bool cuts;   // takes away from what is there: as the first shape it finds a full mask
  const char* meaning;
};
std::span<const MaskMode> mask_modes();  // the first is the default
std::optional<MaskMode> find_mask_mode(std::string_view name);
// "is an unknown mask mode ...; the nearest is ..."
std::string unknown_mask_mode(const std::string& name);

struct MaskShape {
  enum class Kind { kRectangle, kEllipse, kPolygon };
  Kind kind = Kind::kRectangle;
  f64 x = 0, y = 0, width = 0, height = 0;  // of a rectangle, and of the box around an ellipse, in pixels
  std::vector<Point> points;                // of a polygon; filled where it winds around, however often
  f64 feather = 0;                          // radius of the blur
  f64 opacity = 1;
  MaskMode mode = mask_modes().front();
};
inline constexpr const char* kShapeNames[] = {"rectangle", "ellipse", "polygon"};  // by Kind
inline const char* name_of(MaskShape::Kind kind) { return kShapeNames[static_cast<size_t>(kind)]; }

// What the numbers of a shape must be, or nothing where they are right.
std::optional<std::string> wrong_with_box(f64 width, f64 height);

struct MaskFinish {
  bool invert = false;
  f64 fade = 1;  // what the values are multiplied by, after the inversion
};

struct DisposeMask {
  void operator()(ZR_UnoBuffer* mask) const { ZR_DisposeUnoBuffer(mask); }
};
using OwnedMask = std::unique_ptr<ZR_UnoBuffer, DisposeMask>;

// The mask of all shapes in their order; depth is 8 or 16, `where` begins messages. Lives while the host lives.
OwnedMask draw_mask(i32 width, i32 height, i32 depth, const std::vector<MaskShape>& shapes, const MaskFinish& finish,
                    const std::string& where);
// Bytes that drawing takes at most, the mask included.
u64 mask_bytes(i32 width, i32 height, i32 depth, const std::vector<MaskShape>& shapes);

// Depth of the mask that goes with pictures of a depth.
inline i32 mask_depth_for(i32 depth) { return depth == 8 ? 8 : 16; }
// Multiplies the alpha of a picture by a mask of its size.
void merge_mask(const ZR_UnoBuffer& mask, OwnedWorld& picture, const std::string& where);
// An opaque grey picture of a mask, at the mask's depth.
OwnedWorld picture_of_mask(const ZR_UnoBuffer& mask);

}  // namespace zr::tool
