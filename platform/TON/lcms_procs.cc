// The built-in engine's procedure tables.
#include <algorithm>
#include <cstring>

#include "TON/lcms_engine.h"

namespace zr::prisma {

bool is_over_range(const PRISMAProfile& profile);
void name_of(const PRISMAProfile& profile, char16_t* out, size_t limit, size_t* length);
PRISMA_CalRGB cal_rgb(const PRISMAProfile& profile);

namespace {

u32 option(const PRISMA_Options* options, u32 tag, u32 otherwise) {
  if (options == nullptr || options->count > std::size(options->pairs)) refuse(PRISMA_Err_BadParam);
  for (u32 i = 0; i < options->count; ++i)
    if (options->pairs[i].tag == tag) return options->pairs[i].value;
  return otherwise;
}

bool is_device(u32 space) { return space == cmsSigRgbData || space == cmsSigCmykData; }

PRISMATransform* create(PRISMAProfile& from, PRISMAProfile& to, i32 intent, const PRISMA_Options* options) {
  if (intent < PRISMA_Intent_Perceptual || intent > PRISMA_Intent_AbsoluteColorimetric) refuse(PRISMA_Err_BadParam);
  if (!is_device(from.space) || !is_device(to.space)) refuse(PRISMA_Err_ColourSpace);
  const u32 level = option(options, PRISMA_Option_Optimise, 0);
  if (level > 100) refuse(PRISMA_Err_BadParam);
  TON_PRISMA_Retain(&from);
  TON_PRISMA_Ref<PRISMAProfile> first(&from);
  TON_PRISMA_Retain(&to);
  TON_PRISMA_Ref<PRISMAProfile> second(&to);
  Counted<PRISMATransform::Leg> legs;
  legs.push_back({std::move(first), std::move(second), intent, level, option(options, PRISMA_Option_Clip, 0) != 0});
  return make_object<PRISMATransform>(from.context, std::move(legs), level);
}

PRISMATransform* concatenate(const PRISMATransform& first, const PRISMATransform& then) {
  if (first.legs.back().to.get()->space != then.legs.front().from.get()->space) refuse(PRISMA_Err_ColourSpace);
  Counted<PRISMATransform::Leg> legs(first.legs);
  legs.insert(legs.end(), then.legs.begin(), then.legs.end());
  if (legs.size() > 100) refuse(PRISMA_Err_BadParam);  // lcms takes 255 profiles
  return make_object<PRISMATransform>(first.context, std::move(legs), std::min(first.level, then.level));
}

PRISMATransform* with_level(const PRISMATransform& transform, u32 level) {
  if (level > 100) refuse(PRISMA_Err_BadParam);
  return make_object<PRISMATransform>(transform.context, transform.legs, level);
}

template <class Object, class Body>
i32 giving(Object** out, Body&& body) {
  return with_status([&] {
    Object* const made = body();
    if (memory_has_failed())
      TON_PRISMA_Release(made);
    else
      *out = made;
  });
}

constexpr PRISMA_ProfileProcs profile_procs = {
    .version = PRISMA_TablesVersion,
    .from_memory = [](const void* data, size_t size, PRISMAProfile** out) -> i32 {
      return giving(out, [&] { return profile_from_memory(data, size); });
    },
    .from_file = [](const char* path, PRISMAProfile** out) -> i32 {
      return giving(out, [&] { return profile_from_file(path); });
    },
    .standard = [](u32 code, PRISMAProfile** out) -> i32 {
      return giving(out, [&] { return standard_profile(code); });
    },
    .linear = [](PRISMAProfile* profile, PRISMAProfile** out) -> i32 {
      return giving(out, [&] { return linear_profile(*profile); });
    },
    .display = [](const void* window, PRISMAProfile** out) -> i32 {
      return giving(out, [&] { return display_profile(window); });
    },
    .id = [](PRISMAProfile* profile, _t_PRISMA_ID* out) -> i32 {
      *out = profile->id;
      return 0;
    },
    .data = [](PRISMAProfile* profile, const void** data, size_t* size) -> i32 {
      *data = profile->data.data();
      *size = profile->data.size();
      return 0;
    },
    .colour_space = [](PRISMAProfile* profile, u32* out) -> i32 {
      *out = profile->space;
      return 0;
    },
    .name = [](PRISMAProfile* profile, char16_t* text, size_t limit, size_t* length) -> i32 {
      return with_status([&] { name_of(*profile, text, limit, length); });
    },
    .is_over_range = [](PRISMAProfile* profile, bool* out) -> i32 {
      return with_status([&] { *out = is_over_range(*profile); });
    },
    .cal_rgb = [](PRISMAProfile* profile, PRISMA_CalRGB* out) -> i32 {
      return with_status([&] { *out = cal_rgb(*profile); });
    },
};

constexpr PRISMA_TransformProcs transform_procs = {
    .version = PRISMA_TablesVersion,
    .create = [](PRISMAProfile* from, PRISMAProfile* to, i32 intent, const PRISMA_Options* options,
                 PRISMATransform** out) -> i32 {
      return giving(out, [&] { return create(*from, *to, intent, options); });
    },
    .concatenate = [](PRISMATransform* first, PRISMATransform* then, PRISMATransform** out) -> i32 {
      return giving(out, [&] { return concatenate(*first, *then); });
    },
    .duplicate = [](PRISMATransform* transform, PRISMATransform** out) -> i32 {
      return giving(out, [&] { return with_level(*transform, transform->level); });
    },
    .optimise = [](PRISMATransform* transform, const PRISMA_Options* options, PRISMATransform** out) -> i32 {
      return giving(out,
                    [&] { return with_level(*transform, option(options, PRISMA_Option_Optimise, transform->level)); });
    },
    .apply = [](PRISMATransform* transform, u32 src_layout, const void* src, u32 dst_layout, void* dst, size_t count,
                PRISMA_IterateFunc iterate) -> i32 {
      return with_status([&] { transform->apply(src_layout, src, dst_layout, dst, count, iterate); });
    },
    .shut_down = let_current_context_go,
};

}  // namespace
}  // namespace zr::prisma

const void* TON_LcmsAddressProc(const char* table) {
  if (std::strcmp(table, "PRISMA Profiles") == 0) return &zr::prisma::profile_procs;
  if (std::strcmp(table, "PRISMA Transforms") == 0) return &zr::prisma::transform_procs;
  return nullptr;
}
