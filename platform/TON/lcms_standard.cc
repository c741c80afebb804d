// Profiles that the engine makes by itself.
#include "TON/lcms_engine.h"

namespace zr::prisma {
namespace {

struct Curve {
  i32 form;  // as the profile format numbers them
  f64 numbers[5];
};
constexpr Curve straight = {1, {1.0}};
constexpr Curve srgb = {4, {2.4, 1 / 1.055, 0.055 / 1.055, 1 / 12.92, 0.04045}};
// Of cameras and television, with the constants at full precision so that both pieces meet.
constexpr Curve television = {
    4, {1 / 0.45, 1 / 1.09929682680944, 0.09929682680944 / 1.09929682680944, 1 / 4.5, 4.5 * 0.018053968510807}};
constexpr Curve adobe = {1, {563.0 / 256.0}};
constexpr Curve prophoto = {4, {1.8, 1.0, 0.0, 1 / 16.0, 16.0 / 512.0}};

struct Primaries {
  cmsCIExyY white;
  cmsCIExyYTRIPLE colours;
};
constexpr cmsCIExyY d65 = {0.3127, 0.3290, 1.0}, d50 = {0.3457, 0.3585, 1.0}, aces_white = {0.32168, 0.33767, 1.0};
constexpr Primaries rec709 = {d65, {{0.64, 0.33, 1}, {0.30, 0.60, 1}, {0.15, 0.06, 1}}};
constexpr Primaries p3 = {d65, {{0.68, 0.32, 1}, {0.265, 0.69, 1}, {0.15, 0.06, 1}}};
constexpr Primaries rec2020 = {d65, {{0.708, 0.292, 1}, {0.17, 0.797, 1}, {0.131, 0.046, 1}}};
constexpr Primaries adobe_rgb = {d65, {{0.64, 0.33, 1}, {0.21, 0.71, 1}, {0.15, 0.06, 1}}};
constexpr Primaries romm = {d50, {{0.734699, 0.265301, 1}, {0.159597, 0.840403, 1}, {0.036598, 0.000105, 1}}};
constexpr Primaries ap1 = {aces_white, {{0.713, 0.293, 1}, {0.165, 0.830, 1}, {0.128, 0.044, 1}}};

struct Standard {
  PRISMA_ProfileCode code;
  const wchar_t* name;
  const Primaries& primaries;
  const Curve& curve;
};
constexpr Standard standards[] = {
    {PRISMA_Profile_sRGB, L"sRGB", rec709, srgb},
    {PRISMA_Profile_LinearSRGB, L"sRGB (linear)", rec709, straight},
    {PRISMA_Profile_DisplayP3, L"Display P3", p3, srgb},
    {PRISMA_Profile_LinearDisplayP3, L"Display P3 (linear)", p3, straight},
    {PRISMA_Profile_Rec709, L"Rec. 709", rec709, television},
    {PRISMA_Profile_Rec2020, L"Rec. 2020", rec2020, television},
    {PRISMA_Profile_LinearRec2020, L"Rec. 2020 (linear)", rec2020, straight},
    {PRISMA_Profile_AdobeRGB, L"Compatible with Adobe RGB (1998)", adobe_rgb, adobe},
    {PRISMA_Profile_LinearAdobeRGB, L"Compatible with Adobe RGB (1998) (linear)", adobe_rgb, straight},
    {PRISMA_Profile_ProPhoto, L"ProPhoto RGB", romm, prophoto},
    {PRISMA_Profile_LinearProPhoto, L"ProPhoto RGB (linear)", romm, straight},
    {PRISMA_Profile_ACEScg, L"ACEScg", ap1, straight},
};

}  // namespace

PRISMAProfile* standard_profile(u32 code) {
  const Standard* standard = nullptr;
  for (const Standard& one : standards)
    if (one.code == code) standard = &one;
  if (standard == nullptr) refuse(PRISMA_Err_BadParam);

  const ContextRef context = current_context();
  const CurvePtr curve(
      obtained(cmsBuildParametricToneCurve(context.raw(), standard->curve.form, standard->curve.numbers)));
  cmsToneCurve* const curves[3] = {curve.get(), curve.get(), curve.get()};
  const ProfilePtr profile(obtained(
      cmsCreateRGBProfileTHR(context.raw(), &standard->primaries.white, &standard->primaries.colours, curves)));
  struct TextFree {
    void operator()(cmsMLU* text) const { cmsMLUfree(text); }
  };
  const std::unique_ptr<cmsMLU, TextFree> name(obtained(cmsMLUalloc(context.raw(), 1)));
  const std::unique_ptr<cmsMLU, TextFree> rights(obtained(cmsMLUalloc(context.raw(), 1)));
  if (!cmsMLUsetWide(name.get(), "en", "US", standard->name) ||
      !cmsWriteTag(profile.get(), cmsSigProfileDescriptionTag, name.get()) ||
      !cmsMLUsetWide(rights.get(), "en", "US", L"Free of rights") ||
      !cmsWriteTag(profile.get(), cmsSigCopyrightTag, rights.get()))
    refuse(PRISMA_Err_General);
  return open_profile(context, saved(profile.get()));
}

}  // namespace zr::prisma
