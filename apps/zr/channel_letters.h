// Channels as people choose them: letters of "argb".
#pragma once

#include <ZR/blur.h>

#include <optional>
#include <string_view>

namespace zr::tool {

inline constexpr u32 kColourBits = ZR_BlurFlag_AllChannels & ~ZR_BlurFlag_Alpha;

// The library's bits (ZR_BlurFlag_...) of one to four of the letters, each once, in any order; empty for anything else.
constexpr std::optional<u32> parse_channels(std::string_view text) {
  constexpr std::string_view kLetters = "argb";
  u32 bits = 0;
  for (const char letter : text) {
    const size_t at = kLetters.find(letter);
    const u32 bit = at == std::string_view::npos ? 0 : 1u << at;
    if (bit == 0 || (bits & bit) != 0) return std::nullopt;
    bits |= bit;
  }
  if (bits == 0) return std::nullopt;
  return bits;
}

inline constexpr const char* kChannelsExpected = "one to four of the letters a, r, g and b, such as \"rgb\"";

}  // namespace zr::tool
