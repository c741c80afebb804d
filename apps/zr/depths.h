// Depths and sizes of pictures as people write them.
#pragma once

#include <ZR/zr.h>

#include <string>

namespace zr::tool {

inline constexpr i32 kLargestSide = 30000;  // pixels

// Bits of a channel, 8, 16 or 32, from "8", "16" or "float"; `where` begins the message otherwise.
i32 parse_depth(const std::string& text, const std::string& where);
const char* depth_name(i32 depth);
// "1920x1080"; `where` begins the message for other texts.
void parse_size(const std::string& text, const std::string& where, i32& width, i32& height);
// "1.5 GiB"
std::string bytes_text(u64 bytes);

}  // namespace zr::tool
