// The transfer modes by the names that scenes and listings use.
#include "mode_names.h"

#include <ZR/transfer_mode.h>

#include "nearest_name.h"

namespace zr::tool {
namespace {

// What people call the ordinary modes elsewhere.
struct OtherName {
  const char* other;
  const char* name;
};
constexpr OtherName kOtherNames[] = {
    {"normal", "in-front"},
    {"over", "in-front"},
    {"source-over", "in-front"},
    {"alpha-over", "in-front"},
    {"under", "behind"},
    {"replace", "copy"},
    {"plus", "add"},
    {"lighter", "add"},
    {"min", "darken"},
    {"max", "lighten"},
    {"linear-add", "linear-dodge"},
    {"minus", "subtract"},
    {"luminance", "luminosity"},
    {"silhouette", "multiply-not-alpha"},
    {"stencil", "multiply-alpha"},
};

}  // namespace

const std::vector<ModeName>& all_modes() {
  static const std::vector<ModeName> modes = {
      {XferCopyFast, "copy-fast", "replace, as copy"},
      {XferMatteMix, "matte-mix", "mix by the matte's alpha"},
      {XferCopy, "copy", "replace"},
      {XferBehind, "behind", "composite under what is there"},
      {XferInFront, "in-front", "the ordinary composite"},
      {XferDissolve, "dissolve", "random pixels, as many as alpha says"},
      {XferAdd, "add", "sum, over black"},
      {XferMultiply, "multiply", "product, over white"},
      {XferScreen, "screen", "inverse product of inverses"},
      {XferOverlay, "overlay", "multiply darks, screen lights of what is there"},
      {XferSoftLight, "soft-light", "gentle overlay"},
      {XferHardLight, "hard-light", "multiply darks, screen lights of the layer"},
      {XferDarken, "darken", "lesser of each channel"},
      {XferLighten, "lighten", "greater of each channel"},
      {XferDifference, "difference", "absolute difference, over black"},
      {XferHue, "hue", "hue of the layer"},
      {XferSaturation, "saturation", "saturation of the layer"},
      {XferColor, "color", "hue and saturation of the layer"},
      {XferLuminosity, "luminosity", "luma of the layer"},
      {XferMultiplyAlpha, "multiply-alpha", "keep what is there inside the layer's alpha"},
      {XferMultiplyAlphaLuma, "multiply-alpha-luma", "keep what is there by the layer's luma"},
      {XferMultiplyNotAlpha, "multiply-not-alpha", "cut the layer's alpha out"},
      {XferMultiplyNotAlphaLuma, "multiply-not-alpha-luma", "cut the layer's luma out"},
      {XferAddPremul, "add-premul", "add a layer that is premultiplied"},
      {XferAlphaAdd, "alpha-add", "alphas add, for edges that meet"},
      {XferColorDodge, "color-dodge", "brighten by the layer"},
      {XferColorBurn, "color-burn", "darken by the layer"},
      {XferExclusion, "exclusion", "softer difference"},
      {XferDifferenceW, "difference-w", "absolute difference, weighted by alpha"},
      {XferColorDodgeW, "color-dodge-w", "dodge, weighted by alpha"},
      {XferColorBurnW, "color-burn-w", "burn, weighted by alpha"},
      {XferLinearDodge, "linear-dodge", "sum, weighted by alpha"},
      {XferLinearBurn, "linear-burn", "sum less white"},
      {XferLinearLight, "linear-light", "linear burn darks, dodge lights"},
      {XferVividLight, "vivid-light", "color burn darks, dodge lights"},
      {XferPinLight, "pin-light", "darken by darks, lighten by lights"},
      {XferHardMix, "hard-mix", "each channel all or nothing"},
      {XferLighterColor, "lighter-color", "the pixel of greater luma"},
      {XferDarkerColor, "darker-color", "the pixel of lesser luma"},
      {XferSubtract, "subtract", "what is there less the layer"},
      {XferDivide, "divide", "what is there over the layer"},
      {XferBlueThreshold, "blue-threshold", "blue channel where alpha reaches half"},
      {XferKeyProtect, "key-protect", "replace, but not four key colours"},
  };
  return modes;
}

std::optional<i32> find_mode(std::string_view name) {
  const std::string plain = plain_name(name);
  for (const ModeName& mode : all_modes())
    if (mode.name == plain) return mode.number;
  return std::nullopt;
}

std::vector<std::string> suggest_modes(std::string_view unknown) {
  const std::string plain = plain_name(unknown);
  for (const OtherName& known : kOtherNames)
    if (plain == known.other) return {known.name};
  std::vector<std::string> names;
  for (const ModeName& mode : all_modes()) names.push_back(mode.name);
  return nearest_names(unknown, names);
}

}  // namespace zr::tool
