// What is done to a layer's own pixels before it is placed: a list of filters, in order.
#include "effects.h"

#include <algorithm>

#include "file_values.h"
#include "interrupt_state.h"

namespace zr::tool {
namespace {

// `input` 0..1; beyond them the ends hold. NaN gives NaN.
f32 curve_at(const std::vector<f32>& curve, f32 input) {
  const f32 place = input * static_cast<f32>(curve.size() - 1);
  if (!(place < static_cast<f32>(curve.size() - 1))) return place == place ? curve.back() : place;
  if (!(place > 0)) return curve.front();
  const size_t at = static_cast<size_t>(place);
  return curve[at] + (curve[at + 1] - curve[at]) * (place - static_cast<f32>(at));
}

// Bytes go through the library's own tables.
void apply_tables(const LutEffect& lut, OwnedWorld& picture, const std::string& where) {
  std::array<std::array<u8, 256>, 4> tables;
  std::array<const u8*, 4> used{};
  for (size_t i = 0; i < tables.size(); ++i) {
    if (lut.curves[i].empty()) continue;
    for (size_t v = 0; v < 256; ++v)
      tables[i][v] = world_from_float<ZR_Pixel8>(curve_at(lut.curves[i], static_cast<f32>(v) / 255.0f));
    used[i] = tables[i].data();
  }
  check(ZR_IterateLUT(nullptr, 0, 0, nullptr, nullptr, used[0], used[1], used[2], used[3], picture.layer()), where);
}

template <class Pixel>
i32 curve_pixel(void* refcon, i32, i32, const void*, void* out) {
  constexpr f32 white = static_cast<f32>(Depth<Pixel>::white);
  const LutEffect& lut = *static_cast<const LutEffect*>(refcon);
  Pixel& pixel = *static_cast<Pixel*>(out);
  const auto change = [&](size_t curve, Channel<Pixel>& channel) {
    if (!lut.curves[curve].empty())
      channel = world_from_float<Pixel>(curve_at(lut.curves[curve], static_cast<f32>(channel) / white));
  };
  change(0, pixel.alpha);
  change(1, pixel.red);
  change(2, pixel.green);
  change(3, pixel.blue);
  return 0;
}

template <class Pixel>
i32 colour_pixel(void* refcon, i32, i32, const void*, void* out) {
  const Pixel& colour = *static_cast<const Pixel*>(refcon);
  Pixel& pixel = *static_cast<Pixel*>(out);
  pixel = {pixel.alpha, colour.red, colour.green, colour.blue};
  return 0;
}

OwnedWorld apply(const BlurEffect& effect, i32 frame, OwnedWorld picture, const std::string& where) {
  Blur blur = effect.blur;
  blur.radius = effect.radius.at(frame);
  return filtered(picture, blur, where);
}

OwnedWorld apply(const Convolution& effect, i32, OwnedWorld picture, const std::string& where) {
  return filtered(picture, effect, where);
}

OwnedWorld apply(const LutEffect& effect, i32, OwnedWorld picture, const std::string& where) {
  LutEffect lut = effect;
  if (picture.depth() == 8)
    apply_tables(lut, picture, where);
  else
    with_pixel_of(picture.depth(), [&]<class Pixel>() {
      check(ZR_Iterate(nullptr, 0, 0, nullptr, nullptr, &lut, &curve_pixel<Pixel>, picture.layer()), where);
    });
  return picture;
}

OwnedWorld apply(const FillEffect& effect, i32, OwnedWorld picture, const std::string& where) {
  if (!effect.keep_alpha) {
    check(ZR_FillFloat(nullptr, &effect.colour, nullptr, picture.layer()), where);
    return picture;
  }
  with_pixel_of(picture.depth(), [&]<class Pixel>() {
    Pixel colour = {Channel<Pixel>{}, world_from_float<Pixel>(effect.colour.red),
                    world_from_float<Pixel>(effect.colour.green), world_from_float<Pixel>(effect.colour.blue)};
    check(ZR_Iterate(nullptr, 0, 0, nullptr, nullptr, &colour, &colour_pixel<Pixel>, picture.layer()), where);
  });
  return picture;
}

OwnedWorld apply(const PremultiplyEffect& effect, i32, OwnedWorld picture, const std::string& where) {
  check(ZR_PremulColorFloat(&abort_on_interrupt(), picture.layer(), &effect.colour, effect.forward ? 1 : 0,
                            picture.layer()),
        where);
  return picture;
}

}  // namespace

bool stand_still(const std::vector<Effect>& effects) {
  return std::all_of(effects.begin(), effects.end(), [](const Effect& effect) {
    const BlurEffect* const blur = std::get_if<BlurEffect>(&effect.what);
    return blur == nullptr || blur->radius.keys().size() == 1;
  });
}

GX_LPoint largest_growth(const std::vector<Effect>& effects) {
  GX_LPoint growth = {0, 0};
  for (const Effect& effect : effects) {
    const BlurEffect* const blur_effect = std::get_if<BlurEffect>(&effect.what);
    if (blur_effect == nullptr) continue;
    Blur blur = blur_effect->blur;
    for (const auto& key : blur_effect->radius.keys()) blur.radius = std::max(blur.radius, key.value);
    growth.x += growth_across(blur);
    growth.y += growth_down(blur);
  }
  return growth;
}

Filtered with_effects(OwnedWorld& picture, const std::vector<Effect>& effects, i32 frame, const std::string& where) {
  OwnedWorld world = copied(picture, where);
  for (const Effect& effect : effects) {
    stop_if_interrupted();
    world =
        std::visit([&](const auto& what) { return apply(what, frame, std::move(world), effect.place); }, effect.what);
  }
  const GX_LPoint grown = {(world.width() - picture.width()) / 2, (world.height() - picture.height()) / 2};
  return {std::move(world), grown};
}

}  // namespace zr::tool
