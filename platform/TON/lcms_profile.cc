// Opening profiles, and what can be asked of one.
#include <cmath>
#include <cstdio>
#include <cstring>

#include "TON/lcms_engine.h"

namespace zr::prisma {
namespace {

constexpr size_t largest_profile = 64u << 20;
constexpr size_t header_bytes = 128;

_t_PRISMA_ID digest(const ContextRef& context, const Counted<u8>& data) {
  cmsHANDLE const sum = obtained(cmsMD5alloc(context.raw()));
  cmsMD5add(sum, data.data(), static_cast<u32>(data.size()));
  cmsProfileID out;
  cmsMD5finish(&out, sum);
  _t_PRISMA_ID id;
  std::memcpy(id.bytes, out.ID8, sizeof id.bytes);
  return id;
}

u32 word_at(const Counted<u8>& data, size_t at) {
  return static_cast<u32>(data[at]) << 24 | static_cast<u32>(data[at + 1]) << 16 | static_cast<u32>(data[at + 2]) << 8 |
         data[at + 3];
}

// Whether a profile has one of the tables that take the place of matrix and curves, or of unbounded floats.
bool has_any(cmsHPROFILE profile, std::initializer_list<cmsTagSignature> tags) {
  for (const cmsTagSignature tag : tags)
    if (cmsIsTag(profile, tag)) return true;
  return false;
}

}  // namespace

PRISMAProfile* open_profile(const ContextRef& context, Counted<u8> data) {
  return make_object<PRISMAProfile>(context, std::move(data));
}

PRISMAProfile* profile_from_memory(const void* data, size_t size) {
  if (data == nullptr || size < header_bytes || size > largest_profile) refuse(PRISMA_Err_BadProfile);
  const u8* const bytes = static_cast<const u8*>(data);
  return open_profile(current_context(), Counted<u8>(bytes, bytes + size));
}

PRISMAProfile* profile_from_file(const char* path) {
  std::FILE* const file = path != nullptr ? std::fopen(path, "rb") : nullptr;
  if (file == nullptr) refuse(PRISMA_Err_File);
  struct Close {
    std::FILE* file;
    ~Close() { std::fclose(file); }
  } const close{file};
  Counted<u8> data;
  u8 block[16384];
  for (size_t got; (got = std::fread(block, 1, sizeof block, file)) != 0;) {
    if (data.size() + got > largest_profile) refuse(PRISMA_Err_BadProfile);
    data.insert(data.end(), block, block + got);
  }
  if (std::ferror(file) != 0) refuse(PRISMA_Err_File);
  if (data.size() < header_bytes) refuse(PRISMA_Err_BadProfile);
  return open_profile(current_context(), std::move(data));
}

Counted<u8> saved(cmsHPROFILE profile) {
  u32 size = 0;
  if (!cmsSaveProfileToMem(profile, nullptr, &size)) refuse(PRISMA_Err_General);
  Counted<u8> data(size);
  if (!cmsSaveProfileToMem(profile, data.data(), &size)) refuse(PRISMA_Err_General);
  // Year, month, day, hour, minute, second, two bytes each: 2020-01-01.
  constexpr u8 date[12] = {0x07, 0xe4, 0, 1, 0, 1};
  std::memcpy(data.data() + 24, date, sizeof date);
  return data;
}

}  // namespace zr::prisma

using namespace zr::prisma;

PRISMAProfile::PRISMAProfile(const ContextRef& from, Counted<u8> bytes)
    : PRISMA_Object(destroy_object<PRISMAProfile>), context(from), data(std::move(bytes)), id(digest(context, data)) {
  handle.reset(cmsOpenProfileFromMemTHR(context.raw(), data.data(), static_cast<u32>(data.size())));
  obtained(handle.get());
  kind = word_at(data, 12);
  space = word_at(data, 16);
  connection_space = word_at(data, 20);
  // Links and named colours describe no device.
  if (kind == cmsSigLinkClass || kind == cmsSigNamedColorClass) refuse(PRISMA_Err_BadProfile);
}

bool PRISMAProfile::is_plain_matrix_shaper() const {
  return space == cmsSigRgbData && connection_space == cmsSigXYZData && cmsIsMatrixShaper(handle.get()) &&
         !has_any(handle.get(), {cmsSigAToB0Tag, cmsSigAToB1Tag, cmsSigAToB2Tag, cmsSigBToA0Tag, cmsSigBToA1Tag,
                                 cmsSigBToA2Tag, cmsSigDToB0Tag, cmsSigDToB1Tag, cmsSigDToB2Tag, cmsSigDToB3Tag,
                                 cmsSigBToD0Tag, cmsSigBToD1Tag, cmsSigBToD2Tag, cmsSigBToD3Tag});
}

bool PRISMAProfile::is_linear() const {
  if (space != cmsSigRgbData) return false;
  for (const cmsTagSignature tag : trc_tags) {
    const auto* const curve = static_cast<const cmsToneCurve*>(cmsReadTag(handle.get(), tag));
    if (curve == nullptr) return false;
    for (int i = 0; i <= 16; ++i) {
      const f32 x = static_cast<f32>(i) / 16.0f;
      if (!(std::fabs(cmsEvalToneCurveFloat(curve, x) - x) < 1e-4f)) return false;
    }
  }
  return true;
}

namespace zr::prisma {

bool is_over_range(const PRISMAProfile& profile) {
  return profile.is_linear() ||
         has_any(profile.handle.get(), {cmsSigDToB0Tag, cmsSigDToB1Tag, cmsSigDToB2Tag, cmsSigDToB3Tag, cmsSigBToD0Tag,
                                        cmsSigBToD1Tag, cmsSigBToD2Tag, cmsSigBToD3Tag});
}

PRISMAProfile* linear_profile(PRISMAProfile& profile) {
  if (profile.space != cmsSigRgbData) refuse(PRISMA_Err_ColourSpace);
  if (!cmsIsMatrixShaper(profile.handle.get()) || profile.connection_space != cmsSigXYZData) refuse(PRISMA_Err_NoGamma);
  if (profile.is_linear() && profile.is_plain_matrix_shaper()) {
    TON_PRISMA_Retain(&profile);
    return &profile;
  }
  cmsHPROFILE const from = profile.handle.get();
  const ContextRef& context = profile.context;
  const ProfilePtr made(obtained(cmsCreateRGBProfileTHR(context.raw(), nullptr, nullptr, nullptr)));
  cmsHPROFILE const to = made.get();
  cmsSetProfileVersion(to, cmsGetProfileVersion(from));
  cmsSetDeviceClass(to, cmsGetDeviceClass(from));
  cmsSetColorSpace(to, cmsSigRgbData);
  cmsSetPCS(to, cmsSigXYZData);
  cmsSetHeaderRenderingIntent(to, cmsGetHeaderRenderingIntent(from));
  const auto write = [&](cmsTagSignature tag, const void* value) {
    if (value == nullptr || !cmsWriteTag(to, tag, value)) refuse(PRISMA_Err_BadProfile);
  };
  for (const cmsTagSignature tag : colorant_tags) write(tag, cmsReadTag(from, tag));
  for (const cmsTagSignature tag : {cmsSigMediaWhitePointTag, cmsSigChromaticAdaptationTag, cmsSigCopyrightTag})
    if (cmsIsTag(from, tag)) write(tag, cmsReadTag(from, tag));
  const CurvePtr straight(obtained(cmsBuildGamma(context.raw(), 1.0)));
  for (const cmsTagSignature tag : trc_tags) write(tag, straight.get());

  wchar_t name[240] = L"";
  cmsGetProfileInfo(from, cmsInfoDescription, "en", "US", name, 200);
  name[199] = L'\0';
  std::wcsncat(name, L" (linear)", 20);
  struct TextFree {
    void operator()(cmsMLU* text) const { cmsMLUfree(text); }
  };
  const std::unique_ptr<cmsMLU, TextFree> text(obtained(cmsMLUalloc(context.raw(), 1)));
  if (!cmsMLUsetWide(text.get(), "en", "US", name)) refuse(PRISMA_Err_General);
  write(cmsSigProfileDescriptionTag, text.get());
  return open_profile(context, saved(to));
}

void name_of(const PRISMAProfile& profile, char16_t* out, size_t limit, size_t* length) {
  wchar_t name[256] = L"";
  cmsGetProfileInfo(profile.handle.get(), cmsInfoDescription, "en", "US", name, sizeof name);
  name[255] = L'\0';
  size_t count = 0;
  for (const wchar_t* at = name; *at != L'\0'; ++at) {
    const u32 point = static_cast<u32>(*at);
    const bool pair = point >= 0x10000 && point < 0x110000;
    if (count + (pair ? 2 : 1) > limit) break;
    if (pair) {
      out[count++] = static_cast<char16_t>(0xd800 + ((point - 0x10000) >> 10));
      out[count++] = static_cast<char16_t>(0xdc00 + ((point - 0x10000) & 0x3ff));
    } else {
      out[count++] = static_cast<char16_t>(point < 0x10000 ? point : 0xfffd);
    }
  }
  *length = count;
}

namespace {

// The exponent g for which x^g is nearest to the curve over 0..1 in the sum of squares.
f64 fitted_gamma(const cmsToneCurve* curve) {
  const i32 form = cmsGetToneCurveParametricType(curve);
  if (form == 1) return cmsGetToneCurveParams(curve)[0];
  const f64 middle = cmsEvalToneCurveFloat(curve, 0.5f);
  if (!(middle > 1e-6 && middle < 1.0)) refuse(PRISMA_Err_NoGamma);
  f64 gamma = std::log(middle) / std::log(0.5);
  constexpr int steps = 1024;
  for (int round = 0; round < 32; ++round) {  // Gauss and Newton; a few rounds do for every real curve
    f64 down = 0, curvature = 0;
    for (int i = 1; i < steps; ++i) {
      const f64 x = static_cast<f64>(i) / steps, power = std::pow(x, gamma), slope = power * std::log(x);
      down += slope * (power - cmsEvalToneCurveFloat(curve, static_cast<f32>(x)));
      curvature += slope * slope;
    }
    const f64 step = down / curvature;
    gamma -= step;
    if (!(gamma > 0.01 && gamma < 100.0)) refuse(PRISMA_Err_NoGamma);
    if (std::fabs(step) < 1e-9) break;
  }
  return gamma;
}

}  // namespace

PRISMA_CalRGB cal_rgb(const PRISMAProfile& profile) {
  if (profile.space != cmsSigRgbData) refuse(PRISMA_Err_ColourSpace);
  PRISMA_CalRGB out;
  for (int c = 0; c < 3; ++c) {
    const auto* const curve = static_cast<const cmsToneCurve*>(cmsReadTag(profile.handle.get(), trc_tags[c]));
    out.gamma[c] = fitted_gamma(obtained(curve, PRISMA_Err_NoGamma));
    if (!(out.gamma[c] > 0.01 && out.gamma[c] < 100.0)) refuse(PRISMA_Err_NoGamma);
  }
  return out;
}

}  // namespace zr::prisma
