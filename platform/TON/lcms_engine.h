// The built-in engine, on Little CMS: what its files share.
#pragma once

#include <HB/allocator.h>
#include <TON/ton.h>
#include <lcms2.h>
#include <lcms2_plugin.h>

#include <deque>
#include <mutex>
#include <vector>

#include "TON/matrix_shaper.h"
#include "TON/pixel_layout.h"

namespace zr::prisma {

struct EngineLabel {
  static constexpr const char* text = "colour engine";
};
template <class T>
using Counted = std::vector<T, HB_Allocator<T, EngineLabel>>;

// Runs the body of a procedure; what it throws becomes the status. So does memory that lcms did not get:
// what was made meanwhile is not to be used.
void forget_memory_failure();
bool memory_has_failed();
template <class Body>
i32 with_status(Body&& body) noexcept {
  forget_memory_failure();
  try {
    body();
    return memory_has_failed() ? i32{ZR_Err_OutOfMemory} : 0;
  } catch (const i32 status) {
    return memory_has_failed() ? i32{ZR_Err_OutOfMemory} : status;
  } catch (const std::bad_alloc&) {
    return ZR_Err_OutOfMemory;
  } catch (...) {
    return PRISMA_Err_General;
  }
}
[[noreturn]] inline void refuse(PRISMA_Status status) { throw i32{status}; }
// The argument, refused when it is null.
template <class Pointer>
Pointer obtained(Pointer pointer, PRISMA_Status status = PRISMA_Err_BadProfile) {
  if (pointer == nullptr) refuse(status);
  return pointer;
}

// An lcms context with counted memory and our formatters; shared by all objects of one life of the engine.
struct Context : PRISMA_Object {
  cmsContext raw = nullptr;
  Context();
  ~Context();
};
class ContextRef {
 public:
  explicit ContextRef(Context* taken) : context_(taken) {}
  ContextRef(const ContextRef& other) : context_(other.context_) { context_->shares.fetch_add(1); }
  ContextRef& operator=(const ContextRef&) = delete;
  ~ContextRef() {
    if (context_->shares.fetch_sub(1) == 1) context_->destroy(context_);
  }
  cmsContext raw() const { return context_->raw; }

 private:
  Context* context_;
};
ContextRef current_context();   // made on first use
void let_current_context_go();  // what objects hold stays until they go

// Makes a counted object; its destroy function gives the memory back.
template <class Object, class... Arguments>
Object* make_object(Arguments&&... arguments) {
  void* const place = HB_AllocatePtr(sizeof(Object), EngineLabel::text, ZR_ModuleCode | ZR_Site_ColourEngine);
  if (place == nullptr) throw i32{ZR_Err_OutOfMemory};
  try {
    return new (place) Object(std::forward<Arguments>(arguments)...);
  } catch (...) {
    HB_FreePtr(place);
    throw;
  }
}
template <class Object>
void destroy_object(PRISMA_Object* object) {
  static_cast<Object*>(object)->~Object();
  HB_FreePtr(object);
}

struct CurveFree {
  void operator()(cmsToneCurve* curve) const { cmsFreeToneCurve(curve); }
};
using CurvePtr = std::unique_ptr<cmsToneCurve, CurveFree>;
struct ProfileClose {
  using pointer = cmsHPROFILE;
  void operator()(cmsHPROFILE profile) const { cmsCloseProfile(profile); }
};
using ProfilePtr = std::unique_ptr<void, ProfileClose>;
struct TransformDelete {
  using pointer = cmsHTRANSFORM;
  void operator()(cmsHTRANSFORM transform) const { cmsDeleteTransform(transform); }
};
using TransformPtr = std::unique_ptr<void, TransformDelete>;

inline constexpr cmsTagSignature trc_tags[3] = {cmsSigRedTRCTag, cmsSigGreenTRCTag, cmsSigBlueTRCTag};
inline constexpr cmsTagSignature colorant_tags[3] = {cmsSigRedColorantTag, cmsSigGreenColorantTag,
                                                     cmsSigBlueColorantTag};

// lcms_profile.cc, lcms_standard.cc
PRISMAProfile* open_profile(const ContextRef& context, Counted<u8> data);
PRISMAProfile* profile_from_memory(const void* data, size_t size);
PRISMAProfile* profile_from_file(const char* path);
PRISMAProfile* standard_profile(u32 code);
PRISMAProfile* linear_profile(PRISMAProfile& profile);
// An lcms profile as data: its date is set to a constant, so that equal profiles are equal bytes.
Counted<u8> saved(cmsHPROFILE profile);
// display_profile.cc
PRISMAProfile* display_profile(const void* window);
// lcms_formatters.cc
cmsFormatter world_formatter(cmsUInt32Number type, cmsFormatterDirection direction, cmsUInt32Number flags);
// The pixel type that makes lcms read or write a layout. as_float: the whole transform runs on floats.
cmsUInt32Number lcms_format(Layout layout, bool as_float, bool clip);

}  // namespace zr::prisma

struct PRISMAProfile : PRISMA_Object {
  PRISMAProfile(const zr::prisma::ContextRef& context, zr::prisma::Counted<u8> data);

  // The matrix and the curves are all that this profile says about a colour.
  bool is_plain_matrix_shaper() const;
  bool is_linear() const;  // has tone curves, all straight

  zr::prisma::ContextRef context;
  zr::prisma::Counted<u8> data;
  zr::prisma::ProfilePtr handle;
  _t_PRISMA_ID id;
  // Four-character words of the header. A damaged one may hold anything, so they are no enumerators.
  u32 kind, space, connection_space;
};

struct PRISMATransform : PRISMA_Object {
  struct Leg {
    TON_PRISMA_Ref<PRISMAProfile> from, to;
    i32 intent;
    u32 level;
    bool clip;
  };
  PRISMATransform(const zr::prisma::ContextRef& context, zr::prisma::Counted<Leg> legs, u32 level);
  ~PRISMATransform();

  void apply(u32 src_layout, const void* src, u32 dst_layout, void* dst, size_t count, PRISMA_IterateFunc iterate);

  zr::prisma::ContextRef context;
  zr::prisma::Counted<Leg> legs;
  u32 level;  // of optimisation, see PRISMA_Option_Optimise

 private:
  struct Plan;
  void prepare_shapers();
  void run_shapers(zr::prisma::Layout src, const u8* from, zr::prisma::Layout dst, u8* to, size_t count) const;
  const Plan& plan(zr::prisma::Layout src, zr::prisma::Layout dst);

  // Made on first use under the lock, then only read.
  std::mutex lock_;
  std::atomic<Plan*> plans_[zr::prisma::layout_count][zr::prisma::layout_count] = {};
  // One for each leg, or none when a leg is more than curves and a matrix.
  std::deque<zr::prisma::MatrixShaper, HB_Allocator<zr::prisma::MatrixShaper, zr::prisma::EngineLabel>> shapers_;
  bool shapers_tried_ = false;
};
