// How lcms reads and writes the pixels of worlds in place: 8 bits, 16 bits with white at 32768, floats.
//
// A pixel type of ours carries a mark in its top bits, which lcms passes through. Each transform runs
// wholly on floats or wholly on 16-bit words; every layout has a form for both.
#include <cstring>

#include "TON/lcms_engine.h"

namespace zr::prisma {
namespace {

constexpr cmsUInt32Number mark = 0x50000000u, mark_bits = 0xf0000000u, clip_bit = 0x01000000u;

template <class Channel>
constexpr u32 to_word(Channel v) {
  if constexpr (sizeof(Channel) == 1)
    return v * 257u;
  else if constexpr (sizeof(Channel) == 2)
    return ((v < 32768u ? v : 32768u) * 65535u + 16384u) >> 15;
  else
    return static_cast<u32>(clamp_unit(v) * 65535.0f + 0.5f);
}
template <class Channel>
constexpr Channel from_word(u32 w) {
  if constexpr (sizeof(Channel) == 1)
    return static_cast<u8>((w * 65281u + 8388608u) >> 24);  // w / 257, rounded
  else if constexpr (sizeof(Channel) == 2)
    return static_cast<u16>((w * 32768u + 32767u) / 65535u);
  else
    return static_cast<f32>(w) / 65535.0f;
}

// Channel c of a pixel at `at`; colour starts behind alpha, ink at once.
template <class Channel, bool cmyk>
constexpr size_t place(int c) {
  return static_cast<size_t>(c + (cmyk ? 0 : 1)) * sizeof(Channel);
}
template <class Channel>
Channel load(const u8* at) {
  Channel value;
  std::memcpy(&value, at, sizeof value);
  return value;
}
template <class Channel>
void store(u8* at, Channel value) {
  std::memcpy(at, &value, sizeof value);
}
template <bool cmyk>
constexpr int colours = cmyk ? 4 : 3;

template <class Channel, bool cmyk, bool clip>
u8* read_floats(_cmstransform_struct*, f32 values[], u8* at, u32) {
  for (int c = 0; c < colours<cmyk>; ++c) {
    const f32 v = unit(load<Channel>(at + place<Channel, cmyk>(c)));
    values[c] = clip ? clamp_unit(v) : v;
  }
  return at + 4 * sizeof(Channel);
}
template <class Channel, bool cmyk, bool clip>
u8* write_floats(_cmstransform_struct*, f32 values[], u8* at, u32) {
  for (int c = 0; c < colours<cmyk>; ++c) {
    const f32 v = values[c];
    store(at + place<Channel, cmyk>(c), from_unit<Channel>(clip ? clamp_unit(v) : v));
  }
  return at + 4 * sizeof(Channel);
}
template <class Channel, bool cmyk>
u8* read_words(_cmstransform_struct*, u16 values[], u8* at, u32) {
  for (int c = 0; c < colours<cmyk>; ++c)
    values[c] = static_cast<u16>(to_word(load<Channel>(at + place<Channel, cmyk>(c))));
  return at + 4 * sizeof(Channel);
}
template <class Channel, bool cmyk>
u8* write_words(_cmstransform_struct*, u16 values[], u8* at, u32) {
  for (int c = 0; c < colours<cmyk>; ++c) store(at + place<Channel, cmyk>(c), from_word<Channel>(values[c]));
  return at + 4 * sizeof(Channel);
}
// An optimised transform to 8 bits leaves the finished byte in the low half of the word.
template <bool cmyk>
u8* write_finished_bytes(_cmstransform_struct*, u16 values[], u8* at, u32) {
  for (int c = 0; c < colours<cmyk>; ++c) at[place<u8, cmyk>(c)] = static_cast<u8>(values[c]);
  return at + 4;
}

template <class Channel, bool cmyk>
cmsFormatter formatter(cmsFormatterDirection direction, bool as_float, bool clip, bool finished) {
  cmsFormatter out{};
  if (as_float) {
    if (direction == cmsFormatterInput)
      out.FmtFloat = clip ? read_floats<Channel, cmyk, true> : read_floats<Channel, cmyk, false>;
    else
      out.FmtFloat = clip ? write_floats<Channel, cmyk, true> : write_floats<Channel, cmyk, false>;
  } else if (direction == cmsFormatterInput) {
    out.Fmt16 = read_words<Channel, cmyk>;
  } else {
    out.Fmt16 = sizeof(Channel) == 1 && finished ? write_finished_bytes<cmyk> : write_words<Channel, cmyk>;
  }
  return out;
}

}  // namespace

cmsFormatter world_formatter(cmsUInt32Number type, cmsFormatterDirection direction, cmsUInt32Number flags) {
  cmsFormatter none{};
  const bool as_float = (flags & CMS_PACK_FLAGS_FLOAT) != 0;
  if ((type & mark_bits) != mark) return none;
  const bool clip = (type & clip_bit) != 0, finished = T_OPTIMIZED(type) != 0, cmyk = T_COLORSPACE(type) == PT_CMYK;
  switch (T_BYTES(type)) {
    case 1:
      return cmyk ? formatter<u8, true>(direction, as_float, clip, finished)
                  : formatter<u8, false>(direction, as_float, clip, finished);
    case 2:
      return cmyk ? formatter<u16, true>(direction, as_float, clip, finished)
                  : formatter<u16, false>(direction, as_float, clip, finished);
    case 4: return cmyk ? none : formatter<f32, false>(direction, as_float, clip, finished);
    default: return none;
  }
}

cmsUInt32Number lcms_format(Layout layout, bool as_float, bool clip) {
  const bool cmyk = info(layout).cmyk;
  return mark | (clip ? clip_bit : 0) | FLOAT_SH(as_float ? 1u : 0u) |
         COLORSPACE_SH(static_cast<u32>(cmyk ? PT_CMYK : PT_RGB)) | EXTRA_SH(cmyk ? 0u : 1u) |
         CHANNELS_SH(cmyk ? 4u : 3u) | BYTES_SH(info(layout).pixel_bytes / 4);
}

}  // namespace zr::prisma
