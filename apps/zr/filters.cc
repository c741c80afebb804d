// Blurs and convolutions of whole pictures through the library's rows and columns.
#include "filters.h"

#include <ZR/blur.h>
#include <ZR/hostkit.h>
#include <ZR/world.h>

#include <atomic>
#include <cmath>

#include "colour_space.h"
#include "interrupt_state.h"

namespace zr::tool {
namespace {

u64 world_bytes(i32 width, i32 height, i32 depth) {
  return static_cast<u64>(width) * static_cast<u64>(height) * static_cast<u64>(depth / 2);
}

// A picture with the place of its left top pixel, by which blurs put source and destination together.
struct Placed {
  OwnedWorld& world;
  GX_LPoint origin;
};

enum class Run { kRows, kColumns };

void blur_lines(const Blur& blur, Run run, Placed from, bool from_premultiplied, Placed to, bool to_premultiplied) {
  with_pixel_of(from.world.depth(), [&]<class Pixel>() {
    ZR_WorldX<Pixel> source(from.world.layer(), true), target(to.world.layer(), true);
    source.origin = from.origin;
    target.origin = to.origin;
    const bool vertical = run == Run::kColumns;
    const u32 flags = blur.channels | (blur.keep_edges ? ZR_BlurFlag_Renormalise : 0u);
    if (blur.box)
      ZR_BoxBlur1D(&abort_on_interrupt(), &source, static_cast<f32>(blur.radius), static_cast<u32>(blur.iterations),
                   flags, vertical, from_premultiplied, vertical, to_premultiplied, false, &target);
    else
      ZR_GaussianBlur1D(&abort_on_interrupt(), &source, static_cast<f32>(blur.radius), flags, vertical,
                        from_premultiplied, vertical, to_premultiplied, false, &target);
  });
}

template <class Pixel>
void take_channels(const OwnedWorld& from, u32 channels, OwnedWorld& to) {
  for_each_row(to.height(), [&](i32 y) {
    const Pixel* source = from.row<Pixel>(y);
    Pixel* target = to.row<Pixel>(y);
    for (i32 x = 0; x < to.width(); ++x) {
      if ((channels & ZR_BlurFlag_Alpha) != 0) target[x].alpha = source[x].alpha;
      if ((channels & ZR_BlurFlag_Red) != 0) target[x].red = source[x].red;
      if ((channels & ZR_BlurFlag_Green) != 0) target[x].green = source[x].green;
      if ((channels & ZR_BlurFlag_Blue) != 0) target[x].blue = source[x].blue;
    }
  });
}

void take_channels(const OwnedWorld& from, u32 channels, OwnedWorld& to) {
  if (channels != 0) with_pixel_of(to.depth(), [&]<class Pixel>() { take_channels<Pixel>(from, channels, to); });
}

// A convolution asks its progress function alone.
const ZR_ProgressInfo kStopOnInterrupt{
    nullptr, nullptr, [](void*, i32, i32) -> i32 { return interrupted() ? ZR_Err_UserAbort : ZR_Err_None; }};

OwnedWorld convolved(OwnedWorld& picture, const Convolution& convolution, const std::string& where) {
  const Kernel& kernel = convolution.kernel;
  u32 flags = 0;
  if (kernel.shape != Kernel::Shape::kSquare) flags |= ZR_ConvolveFlag_1D;
  if (kernel.shape == Kernel::Shape::kColumn) flags |= ZR_ConvolveFlag_Vertical;
  if (convolution.normalise) flags |= ZR_ConvolveFlag_Normalised;
  if (!convolution.clamp) flags |= ZR_ConvolveFlag_NoClamp;
  const i32* const taps = kernel.taps.data();
  OwnedWorld result(picture.width(), picture.height(), picture.depth());
  check(ZRHost_Convolve(&kStopOnInterrupt, picture.layer(), nullptr, flags, kernel.size, taps, taps, taps, taps,
                        result.layer()),
        where);
  return result;
}

u32 channels_of(const Convolution& convolution, const OwnedWorld& picture) {
  if (convolution.channels) return *convolution.channels;
  return convolution.kernel.sum() == 0 || is_opaque(picture) ? kColourBits : ZR_BlurFlag_AllChannels;
}

}  // namespace

OwnedWorld copied(OwnedWorld& picture, const std::string& where) {
  OwnedWorld copy(picture.width(), picture.height(), picture.depth());
  with_pixel_of(picture.depth(), [&]<class Pixel>() {
    const ZR_WorldX<Pixel> source(picture.layer(), true);
    ZR_WorldX<Pixel> target(copy.layer(), true);
    with_engine(where, [&] { target.CopyRect(&source, picture.bounds(), 0, 0); });
  });
  return copy;
}

i32 growth_across(const Blur& blur) {
  const i32 passes = blur.box ? blur.iterations : 1;
  return blur.grow && blur.rows ? static_cast<i32>(std::ceil(blur.radius)) * passes : 0;
}
i32 growth_down(const Blur& blur) {
  const i32 passes = blur.box ? blur.iterations : 1;
  return blur.grow && blur.columns ? static_cast<i32>(std::ceil(blur.radius)) * passes : 0;
}

u64 extra_bytes(const Blur& blur, i32 width, i32 height, i32 depth) {
  return 2 * world_bytes(width + 2 * growth_across(blur), height + 2 * growth_down(blur), depth);
}
u64 extra_bytes(const Convolution&, i32 width, i32 height, i32 depth) { return 2 * world_bytes(width, height, depth); }

bool is_opaque(const OwnedWorld& picture) {
  return with_pixel_of(picture.depth(), [&]<class Pixel>() {
    std::atomic<bool> opaque = true;
    for_each_row(picture.height(), [&](i32 y) {
      const Pixel* row = picture.row<Pixel>(y);
      for (i32 x = 0; x < picture.width(); ++x)
        if (!(row[x].alpha >= Depth<Pixel>::white)) {
          opaque = false;
          return;
        }
    });
    return opaque.load();
  });
}

void clear_hidden_colours(OwnedWorld& picture) {
  with_pixel_of(picture.depth(), [&]<class Pixel>() {
    for_each_row(picture.height(), [&](i32 y) {
      Pixel* row = picture.row<Pixel>(y);
      for (i32 x = 0; x < picture.width(); ++x)
        if (row[x].alpha == 0) row[x] = Pixel{};
    });
  });
}

OwnedWorld filtered(OwnedWorld& picture, const Blur& blur, const std::string& where) {
  const i32 across = growth_across(blur), down = growth_down(blur), depth = picture.depth();
  if (blur.radius == 0) return copied(picture, where);
  // Colours alone need weighing; and what is weighed for the rows stays so for the columns.
  const bool premultiplied = blur.premultiplied || (blur.channels & kColourBits) == 0;
  return with_engine(where, [&] {
    OwnedWorld result(picture.width() + 2 * across, picture.height() + 2 * down, depth);
    const Placed from{picture, {0, 0}}, to{result, {-across, -down}};
    if (!blur.rows || !blur.columns) {
      blur_lines(blur, blur.rows ? Run::kRows : Run::kColumns, from, premultiplied, to, premultiplied);
      return result;
    }
    OwnedWorld between(result.width(), picture.height(), depth);
    const Placed middle{between, {-across, 0}};
    blur_lines(blur, Run::kRows, from, premultiplied, middle, true);
    blur_lines(blur, Run::kColumns, middle, true, to, premultiplied);
    return result;
  });
}

OwnedWorld filtered(OwnedWorld& picture, const Convolution& convolution, const std::string& where) {
  const u32 channels = channels_of(convolution, picture), kept = ZR_BlurFlag_AllChannels & ~channels;
  const bool weighted = !convolution.straight && (channels & kColourBits) != 0 && !is_opaque(picture);
  if (!weighted) {
    OwnedWorld result = convolved(picture, convolution, where);
    take_channels(picture, kept, result);
    return result;
  }
  std::optional<OwnedWorld> original;
  if ((kept & kColourBits) != 0) original.emplace(copied(picture, where));
  check(ZR_Premul(&abort_on_interrupt(), 1, picture.layer()), where);
  OwnedWorld result = convolved(picture, convolution, where);
  take_channels(picture, kept & ZR_BlurFlag_Alpha, result);
  check(ZR_Premul(&abort_on_interrupt(), 0, result.layer()), where);
  if (original) take_channels(*original, kept & kColourBits, result);
  clear_hidden_colours(result);
  return result;
}

}  // namespace zr::tool
