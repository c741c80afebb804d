// A shape of a mask as a command line tells it: "x y w h feather 8 mode subtract opacity 0.5".
#pragma once

#include "mask_shapes.h"

namespace zr::tool {

// `where` ("mask: --ellipse") begins messages. Throws ToolError.
MaskShape parse_shape(MaskShape::Kind kind, const std::string& text, const std::string& where);

}  // namespace zr::tool
