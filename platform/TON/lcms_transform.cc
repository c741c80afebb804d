// Transforms: legs between profiles, and the plan by which a pair of layouts is run.
#include <algorithm>
#include <cmath>

#include "TON/lcms_engine.h"

namespace zr::prisma {
namespace {

Layout layout_of(u32 code) {
  for (int i = 0; i < layout_count; ++i)
    if (layouts[i].code == code) return static_cast<Layout>(i);
  refuse(PRISMA_Err_BadParam);
}

void check_end(Layout layout, u32 space) {
  if (space != static_cast<u32>(info(layout).cmyk ? cmsSigCmykData : cmsSigRgbData)) refuse(PRISMA_Err_ColourSpace);
}

// Rows X, Y, Z; columns red, green, blue.
bool matrix_of(const PRISMAProfile& profile, f64 out[3][3]) {
  for (int c = 0; c < 3; ++c) {
    const auto* const colorant = static_cast<const cmsCIEXYZ*>(cmsReadTag(profile.handle.get(), colorant_tags[c]));
    if (colorant == nullptr) return false;
    out[0][c] = colorant->X;
    out[1][c] = colorant->Y;
    out[2][c] = colorant->Z;
  }
  return true;
}

bool invert(f64 m[3][3]) {
  cmsMAT3 in, out;
  for (int i = 0; i < 3; ++i) _cmsVEC3init(&in.v[i], m[i][0], m[i][1], m[i][2]);
  if (!_cmsMAT3inverse(&in, &out)) return false;
  for (int i = 0; i < 3; ++i)
    for (int c = 0; c < 3; ++c) m[i][c] = out.v[i].n[c];
  return true;
}

// The map between the linear light of two profiles, asked of lcms itself at black and the primaries.
LinearMap map_between(const ContextRef& context, const PRISMATransform::Leg& leg) {
  const TON_PRISMA_Ref<PRISMAProfile> from(linear_profile(*leg.from.get())), to(linear_profile(*leg.to.get()));
  const TransformPtr transform(obtained(
      cmsCreateTransformTHR(context.raw(), from.get()->handle.get(), TYPE_RGB_FLT, to.get()->handle.get(), TYPE_RGB_FLT,
                            static_cast<u32>(leg.intent), cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE)));
  constexpr f32 corners[4][3] = {{0, 0, 0}, {1, 0, 0}, {0, 1, 0}, {0, 0, 1}};
  f32 results[4][3];
  cmsDoTransform(transform.get(), corners, results, 4);
  LinearMap map = {};
  bool identity = true, no_offset = true;
  for (int i = 0; i < 3; ++i) {
    map.offset[i] = results[0][i];
    no_offset = no_offset && map.offset[i] == 0.0f;
    for (int c = 0; c < 3; ++c) {
      map.product[i][c] = map.columns[c][i] = results[c + 1][i] - results[0][i];
      identity = identity && map.columns[c][i] == (i == c ? 1.0f : 0.0f);
    }
  }
  map.exact = identity && no_offset;  // lcms drops a matrix that is next to nothing

  // Where that is nothing but the product of both matrices, lcms has taken the product at double precision.
  f64 forth[3][3], back[3][3], product[3][3];
  if (map.exact || !no_offset || !matrix_of(*from.get(), forth) || !matrix_of(*to.get(), back) || !invert(back))
    return map;
  for (int i = 0; i < 3; ++i)
    for (int c = 0; c < 3; ++c) {
      product[i][c] = back[i][0] * forth[0][c] + back[i][1] * forth[1][c] + back[i][2] * forth[2][c];
      if (!(std::fabs(product[i][c] - map.columns[c][i]) < 3e-6)) return map;
    }
  for (int i = 0; i < 3; ++i)
    for (int c = 0; c < 3; ++c) {
      map.product[i][c] = product[i][c];
      map.columns[c][i] = static_cast<f32>(product[i][c]);
    }
  map.exact = true;
  return map;
}

// False: this leg is not made of curves and a matrix that can be run here.
bool prepare_shaper(const ContextRef& context, const PRISMATransform::Leg& leg, MatrixShaper& shaper) {
  const bool colorimetric =
      leg.intent == PRISMA_Intent_RelativeColorimetric || leg.intent == PRISMA_Intent_AbsoluteColorimetric;
  if (!colorimetric || !leg.from.get()->is_plain_matrix_shaper() || !leg.to.get()->is_plain_matrix_shaper())
    return false;
  const cmsToneCurve* forward[3];
  CurvePtr inverse[3];
  for (int c = 0; c < 3; ++c) {
    forward[c] = static_cast<const cmsToneCurve*>(cmsReadTag(leg.from.get()->handle.get(), trc_tags[c]));
    const auto* const back = static_cast<const cmsToneCurve*>(cmsReadTag(leg.to.get()->handle.get(), trc_tags[c]));
    if (forward[c] == nullptr || back == nullptr) return false;
    inverse[c].reset(cmsReverseToneCurve(back));
    if (inverse[c] == nullptr) return false;
  }
  const LinearMap map = map_between(context, leg);
  cmsToneCurve* const taken[3] = {inverse[0].release(), inverse[1].release(), inverse[2].release()};
  return shaper.prepare(forward, taken, map);
}

// Pixels of a band: enough to hide the call, few enough to stay in a cache.
constexpr size_t band_pixels = 16384;

template <class Run>
i32 in_bands(size_t count, PRISMA_IterateFunc iterate, const Run& run) {
  if (iterate == nullptr || count < 2 * band_pixels) {
    run(0, count);
    return 0;
  }
  struct Work {
    const Run& run;
    size_t count, bands;
  } work{run, count, std::min<size_t>((count + band_pixels - 1) / band_pixels, 1u << 20)};
  return iterate(static_cast<i32>(work.bands), &work, [](void* self, i32, i32 i, i32) -> i32 {
    const Work& all = *static_cast<const Work*>(self);
    const size_t each = (all.count + all.bands - 1) / all.bands;
    const size_t begin = static_cast<size_t>(i) * each;
    if (begin < all.count) all.run(begin, std::min(each, all.count - begin));
    return 0;
  });
}

}  // namespace
}  // namespace zr::prisma

using namespace zr::prisma;

struct PRISMATransform::Plan {
  bool by_shapers = false;
  TransformPtr lcms;
};

PRISMATransform::PRISMATransform(const ContextRef& from, Counted<Leg> parts, u32 precision)
    : PRISMA_Object(destroy_object<PRISMATransform>), context(from), legs(std::move(parts)), level(precision) {}

PRISMATransform::~PRISMATransform() {
  for (auto& row : plans_)
    for (auto& entry : row)
      if (Plan* const plan = entry.load()) {
        plan->~Plan();
        HB_FreePtr(plan);
      }
}

void PRISMATransform::prepare_shapers() {
  if (shapers_tried_) return;
  decltype(shapers_) made;
  for (const Leg& leg : legs)
    if (!prepare_shaper(context, leg, made.emplace_back())) {
      made.clear();
      break;
    }
  if (memory_has_failed()) throw i32{ZR_Err_OutOfMemory};
  shapers_.swap(made);
  shapers_tried_ = true;
}

// Between two legs colours are floats of any size.
void PRISMATransform::run_shapers(Layout src, const u8* from, Layout dst, u8* to, size_t count) const {
  const bool clip_src = legs.front().clip, clip_dst = legs.back().clip;
  if (shapers_.size() == 1) return shapers_[0].run(src, clip_src, from, dst, clip_dst, to, count);
  ZR_PixelFloat between[512];
  for (size_t done = 0; done < count; done += std::size(between)) {
    const size_t block = std::min(count - done, std::size(between));
    shapers_.front().run(src, clip_src, from + done * info(src).pixel_bytes, Layout::rgb_float, false, between, block);
    for (size_t i = 1; i + 1 < shapers_.size(); ++i)
      shapers_[i].run(Layout::rgb_float, false, between, Layout::rgb_float, false, between, block);
    shapers_.back().run(Layout::rgb_float, false, between, dst, clip_dst, to + done * info(dst).pixel_bytes, block);
  }
}

const PRISMATransform::Plan& PRISMATransform::plan(Layout src, Layout dst) {
  std::atomic<Plan*>& entry = plans_[static_cast<int>(src)][static_cast<int>(dst)];
  if (const Plan* const made = entry.load(std::memory_order_acquire)) return *made;
  const std::lock_guard hold(lock_);
  if (const Plan* const made = entry.load(std::memory_order_acquire)) return *made;

  Plan next;
  if (!info(src).cmyk && !info(dst).cmyk) prepare_shapers();
  const auto shapers_reach = [&] {
    return shapers_.size() == 1 ? shapers_[0].reaches(dst) : !shapers_.empty() && !shapers_.back().by_steps(dst);
  };
  if (!info(src).cmyk && !info(dst).cmyk && shapers_reach()) {
    next.by_shapers = true;
    if (shapers_.size() == 1) {
      shapers_[0].prepare_pair(src, dst);
    } else {
      shapers_.front().prepare_pair(src, Layout::rgb_float);
      shapers_.back().prepare_pair(Layout::rgb_float, dst);
    }
  } else {
    Counted<cmsHPROFILE> profiles;
    Counted<u32> intents;
    for (const Leg& leg : legs) {
      profiles.insert(profiles.end(), {leg.from.get()->handle.get(), leg.to.get()->handle.get()});
      intents.insert(intents.end(), 2, static_cast<u32>(leg.intent));
    }
    const u32 count = static_cast<u32>(profiles.size());
    Counted<cmsBool> compensation(count, FALSE);
    Counted<f64> adaptation(count, 1.0);
    const bool clip_src = legs.front().clip, clip_dst = legs.back().clip;
    // Tables hold 0..1 only, so floats that may leave that range are never sent through them.
    const bool bounded = (src != Layout::rgb_float || clip_src) && (dst != Layout::rgb_float || clip_dst);
    const bool as_float = level == 0 || !bounded;
    u32 flags = cmsFLAGS_NOCACHE;
    if (as_float)
      flags |= cmsFLAGS_NOOPTIMIZE;
    else if (level < 100)
      flags |= cmsFLAGS_HIGHRESPRECALC;
    next.lcms.reset(cmsCreateExtendedTransform(
        context.raw(), count, profiles.data(), compensation.data(), intents.data(), adaptation.data(), nullptr, 0,
        lcms_format(src, as_float, clip_src), lcms_format(dst, as_float, clip_dst), flags));
    obtained(next.lcms.get());
  }
  if (memory_has_failed()) throw i32{ZR_Err_OutOfMemory};
  void* const place = HB_AllocatePtr(sizeof(Plan), EngineLabel::text, ZR_ModuleCode | ZR_Site_ColourEngine);
  if (place == nullptr) throw i32{ZR_Err_OutOfMemory};
  Plan* const made = new (place) Plan(std::move(next));
  entry.store(made, std::memory_order_release);
  return *made;
}

void PRISMATransform::apply(u32 src_layout, const void* src, u32 dst_layout, void* dst, size_t count,
                            PRISMA_IterateFunc iterate) {
  const Layout from = layout_of(src_layout), to = layout_of(dst_layout);
  check_end(from, legs.front().from.get()->space);
  check_end(to, legs.back().to.get()->space);
  const Plan& way = plan(from, to);
  const u8* const in = static_cast<const u8*>(src);
  u8* const out = static_cast<u8*>(dst);
  const i32 error = in_bands(count, iterate, [&](size_t begin, size_t length) {
    const u8* const band_in = in + begin * info(from).pixel_bytes;
    u8* const band_out = out + begin * info(to).pixel_bytes;
    if (way.by_shapers) {
      run_shapers(from, band_in, to, band_out, length);
    } else {
      for (size_t done = 0; done < length; done += 1u << 24)  // lcms counts pixels in 32 bits
        cmsDoTransform(way.lcms.get(), band_in + done * info(from).pixel_bytes, band_out + done * info(to).pixel_bytes,
                       static_cast<u32>(std::min<size_t>(length - done, 1u << 24)));
    }
  });
  if (error != 0) throw error;
}
