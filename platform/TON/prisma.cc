// The classes of the public header, on top of the bound procedure tables.
#include <HB/allocator.h>
#include <HB/hb.h>
#include <TON/ton.h>

#include <boost/make_shared.hpp>

#include <cstdio>

#include "TON/prisma_state.h"

namespace {

using zr::prisma::with_memory_code;

struct ProfileLabel {
  static constexpr const char* text = "colour profile";
};

const PRISMA_ProfileProcs& profiles() {
  const PRISMA_ProfileProcs* const table = TON_PRISMA_ProfileTable();
  if (table == nullptr) TON_PRISMA_ETX(PRISMA_Err_General);
  return *table;
}
const PRISMA_TransformProcs& transforms() {
  const PRISMA_TransformProcs* const table = TON_PRISMA_TransformTable();
  if (table == nullptr) TON_PRISMA_ETX(PRISMA_Err_General);
  return *table;
}

PRISMAProfile* needed(const TON_PRISMA_Profile& profile) {
  if (profile.Get() == nullptr) TON_PRISMA_ETX(PRISMA_Err_BadProfile);
  return profile.Get();
}
PRISMATransform* needed(const TON_PRISMA_Transform& transform) {
  if (transform.Get() == nullptr) TON_PRISMA_ETX(PRISMA_Err_BadParam);
  return transform.Get();
}

// The object that a procedure with a last argument for it gives.
template <class Object, class Proc, class... Arguments>
TON_PRISMA_Ref<Object> made(Proc proc, Arguments... arguments) {
  Object* object = nullptr;
  TON_PRISMA_ETX(proc(arguments..., &object));
  return TON_PRISMA_Ref<Object>(object);
}

const char* text_of(i32 status) {
  switch (status) {
    case ZR_Err_OutOfMemory: return "Colour engine: out of memory.";
    case PRISMA_Err_BadProfile: return "Colour engine: the profile is damaged or of an unusable kind.";
    case PRISMA_Err_ColourSpace: return "Colour engine: the profile is of another colour space than is needed here.";
    case PRISMA_Err_NoGamma: return "Colour engine: the profile has no tone curves and primaries.";
    case PRISMA_Err_BadParam: return "Colour engine: unknown profile code, intent, option or pixel layout.";
    case PRISMA_Err_File: return "Colour engine: the profile's file cannot be read.";
    default: return "Colour engine: it is not there, or the call failed.";
  }
}

void retain(void* object) { static_cast<PRISMA_Object*>(object)->shares.fetch_add(1, std::memory_order_relaxed); }
void release(void* object) {
  auto* const counted = static_cast<PRISMA_Object*>(object);
  if (counted->shares.fetch_sub(1, std::memory_order_acq_rel) == 1) counted->destroy(counted);
}

}  // namespace

void TON_PRISMA_Retain(PRISMAProfile* object) { retain(object); }
void TON_PRISMA_Retain(PRISMATransform* object) { retain(object); }
void TON_PRISMA_Release(PRISMAProfile* object) { release(object); }
void TON_PRISMA_Release(PRISMATransform* object) { release(object); }

void TON_PRISMA_ETX(i32 status) {
  if (status == 0) return;
  char text[160];
  std::snprintf(text, sizeof text, "%s (status 0x%08x)", text_of(status), static_cast<u32>(status));
  HBp_ReportErrString(ZR_ModuleCode | ZR_Site_ColourEngine, ZR_ReportSeverity, text);
  throw status;
}

// ------------------------------------------------------------------------------------ options

namespace {
constexpr PRISMA_Options default_options = {2, {{PRISMA_Option_Optimise, 0}, {PRISMA_Option_Clip, 0}}};
constexpr PRISMA_Options fast_options = {2, {{PRISMA_Option_Optimise, 50}, {PRISMA_Option_Clip, 1}}};
constexpr PRISMA_Options optimise_options = {1, {{PRISMA_Option_Optimise, 100}}};
}  // namespace

const PRISMA_Options& TON_GetDefaultPRISMAOptions() { return default_options; }
const PRISMA_Options& TON_GetFastPRISMAOptions() { return fast_options; }
const PRISMA_Options& TON_GetOptimisePRISMAOptions() { return optimise_options; }

// ----------------------------------------------------------------------------------- profiles

TON_PRISMA_Profile::TON_PRISMA_Profile(const void* data, size_t size)
    : handle_(made<PRISMAProfile>(profiles().from_memory, data, size)) {}
TON_PRISMA_Profile::TON_PRISMA_Profile(const char* path) : handle_(made<PRISMAProfile>(profiles().from_file, path)) {}
TON_PRISMA_Profile::TON_PRISMA_Profile(PRISMA_ProfileCode code)
    : handle_(made<PRISMAProfile>(profiles().standard, static_cast<u32>(code))) {}

_t_PRISMA_ID TON_PRISMA_Profile::GetID() const {
  _t_PRISMA_ID id = PRISMA_EmptyProfile_ID;
  TON_PRISMA_ETX(profiles().id(needed(*this), &id));
  return id;
}

const void* TON_PRISMA_Profile::GetData(size_t* size) const {
  const void* data = nullptr;
  TON_PRISMA_ETX(profiles().data(needed(*this), &data, size));
  return data;
}

u32 TON_PRISMA_Profile::GetColourSpace() const {
  u32 space = 0;
  TON_PRISMA_ETX(profiles().colour_space(needed(*this), &space));
  return space;
}

bool TON_PRISMA_Profile_IsOverRange(const TON_PRISMA_Profile& profile) {
  bool over = false;
  TON_PRISMA_ETX(profiles().is_over_range(needed(profile), &over));
  return over;
}

std::u16string TON_PRISMA_Profile_GetName(const TON_PRISMA_Profile& profile) {
  char16_t text[256];
  size_t length = 0;
  TON_PRISMA_ETX(profiles().name(needed(profile), text, std::size(text), &length));
  return with_memory_code([&] { return std::u16string(text, length); });
}

boost::shared_ptr<TON_PRISMA_Profile> TON_PRISMA_GetLinearRGBProfile(
    const boost::shared_ptr<TON_PRISMA_Profile>& profile) {
  if (!profile) TON_PRISMA_ETX(PRISMA_Err_BadProfile);
  TON_PRISMA_Ref<PRISMAProfile> linear = made<PRISMAProfile>(profiles().linear, needed(*profile));
  if (linear.get() == profile->Get()) return profile;
  return with_memory_code([&] {
    return boost::allocate_shared<TON_PRISMA_Profile>(HB_Allocator<TON_PRISMA_Profile, ProfileLabel>(),
                                                      std::move(linear));
  });
}

PRISMA_CalRGB TON_PRISMA_GetCalRGB(const TON_PRISMA_Profile& profile) {
  PRISMA_CalRGB record{};
  TON_PRISMA_ETX(profiles().cal_rgb(needed(profile), &record));
  return record;
}

TON_PRISMA_Profile TON_PRISMA_GetDisplayProfile(const void* window) {
  return TON_PRISMA_Profile(made<PRISMAProfile>(profiles().display, window));
}

// --------------------------------------------------------------------------------- transforms

TON_PRISMA_Transform::TON_PRISMA_Transform(const TON_PRISMA_Profile& from, const TON_PRISMA_Profile& to, i32 intent,
                                           const PRISMA_Options& options)
    : handle_(made<PRISMATransform>(transforms().create, needed(from), needed(to), intent, &options)) {}

TON_PRISMA_Transform TON_PRISMA_Transform::Concatenate(const TON_PRISMA_Transform& next) const {
  return TON_PRISMA_Transform(made<PRISMATransform>(transforms().concatenate, needed(*this), needed(next)));
}
TON_PRISMA_Transform TON_PRISMA_Transform::Duplicate() const {
  return TON_PRISMA_Transform(made<PRISMATransform>(transforms().duplicate, needed(*this)));
}
TON_PRISMA_Transform TON_PRISMA_Transform::Optimise(const PRISMA_Options& options) const {
  return TON_PRISMA_Transform(made<PRISMATransform>(transforms().optimise, needed(*this), &options));
}

i32 TON_PRISMA_Apply(PRISMATransform* transform, u32 src_layout, const void* src, u32 dst_layout, void* dst,
                     size_t count, PRISMA_IterateFunc iterate) {
  const PRISMA_TransformProcs* const table = TON_PRISMA_TransformTable();
  if (table == nullptr) return PRISMA_Err_General;
  if (transform == nullptr) return PRISMA_Err_BadParam;
  return table->apply(transform, src_layout, src, dst_layout, dst, count, iterate);
}
