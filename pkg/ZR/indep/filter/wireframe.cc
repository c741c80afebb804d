// Wireframes as records: made, taken through a matrix, read and freed.
#include <GX/gx.h>
#include <SEQ/seq.h>
#include <ZR/drawing.h>

#include <cstring>
#include <initializer_list>

#include "world/guard.h"

namespace zr {
namespace {

constexpr i32 point_list = 0, loop_list = 1;  // kinds of the lists

// The records of a list, locked while this lives. A list without records gives null.
template <class Record>
class ListView {
 public:
  explicit ListView(SEQ_List* list) : list_(list), records_(static_cast<Record*>(SEQ_GetAddress(list, 0))) {}
  ~ListView() {
    if (records_ != nullptr) SEQ_Unlock(list_);
  }
  ListView(const ListView&) = delete;
  ListView& operator=(const ListView&) = delete;
  Record* records() const { return records_; }

 private:
  SEQ_List* list_;
  Record* records_;
};

i32 new_list(i32 kind, i32 record_bytes, i32 count, SEQ_List** out) {
  SEQ_List* list = nullptr;
  if (const i32 error = SEQ_New(kind, record_bytes, 0, 1, &list); error != 0) return error;
  if (const i32 error = SEQ_AppendClear(list, count); error != 0) {
    SEQ_Dispose(list);
    return error;
  }
  *out = list;
  return ZR_Err_None;
}

// The loops of `src` on a wireframe of as many points.
i32 copy_loops(const ZR_Wireframe& src, ZR_Wireframe* dst) {
  if (src.second == dst->second) return ZR_Err_None;
  SEQ_List* copy = nullptr;
  if (src.second != nullptr) {
    const i32 count = SEQ_GetCount(src.second);
    if (const i32 error = new_list(loop_list, sizeof(i32), count, &copy); error != 0) return error;
    const ListView<i32> from(src.second), to(copy);
    if (count > 0) std::memcpy(to.records(), from.records(), static_cast<size_t>(count) * sizeof(i32));
  }
  SEQ_Dispose(dst->second);
  dst->second = copy;
  return ZR_Err_None;
}

using TransformPoints = void (*)(const GX_Matrix3*, ZR_WireframePoint*, i32);

i32 transform(const ZR_Wireframe* src, const GX_Matrix3* matrix, ZR_Wireframe* dst, ZR_Wireframe* out,
              TransformPoints transform_points) {
  return guarded([&]() -> i32 {
    if (src == nullptr || src->points == nullptr || (dst == nullptr && out == nullptr))
      return ZR_ReportBadCallbackParam(ZR_Site_Wireframe);
    const i32 count = src->point_count;
    if (count != SEQ_GetCount(src->points) || (dst != nullptr && SEQ_GetCount(dst->points) != count))
      return ZR_ReportBadCallbackParam(ZR_Site_Wireframe);
    ZR_Wireframe* const target = dst != nullptr ? dst : out;
    if (dst == nullptr) {
      if (const i32 error = ZR_AllocWireframe(count, src->kind, out); error != 0) return error;
    }
    const i32 error = copy_loops(*src, target);
    if (error != 0) {
      if (dst == nullptr) ZR_DisposeWireframe(out);
      return error;
    }
    const ListView<ZR_WireframePoint> from(src->points), to(target->points);
    if (count == 0) return ZR_Err_None;
    std::memmove(to.records(), from.records(), static_cast<size_t>(count) * sizeof(ZR_WireframePoint));
    transform_points(matrix, to.records(), count);
    return ZR_Err_None;
  });
}

}  // namespace
}  // namespace zr

extern "C" {

i32 ZR_AllocWireframe(i32 point_count, i32 kind, ZR_Wireframe* wireframe) {
  if (wireframe == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Wireframe);
  *wireframe = {};
  SEQ_List* points = nullptr;
  const i32 error = zr::new_list(zr::point_list, sizeof(ZR_WireframePoint), point_count, &points);
  if (error != 0) return error;
  *wireframe = {kind, point_count, points, nullptr, nullptr, nullptr};
  return ZR_Err_None;
}

i32 ZR_DisposeWireframe(ZR_Wireframe* wireframe) {
  if (wireframe == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Wireframe);
  for (SEQ_List* const list : {wireframe->points, wireframe->second, wireframe->third, wireframe->fourth})
    SEQ_Dispose(list);  // cannot fail
  *wireframe = {};
  return ZR_Err_None;
}

i32 ZR_TransformWireframe3D(void*, const ZR_Wireframe* src, void*, const GX_Matrix3* matrix, ZR_Wireframe* dst,
                            ZR_Wireframe* out) {
  return zr::transform(src, matrix, dst, out, GX_3DTransform2DPoints);
}

i32 ZR_TransformWireframe2D(void*, const ZR_Wireframe* src, void*, const GX_Matrix3* matrix, ZR_Wireframe* dst,
                            ZR_Wireframe* out) {
  return zr::transform(src, matrix, dst, out, matrix != nullptr ? GX_TransformPoints : GX_3DTransform2DPoints);
}

const ZR_WireframePoint* ZR_GetWireframeLoop(const ZR_Wireframe* wireframe, i32 loop, i32* count) {
  i32 unused;
  i32& length = count != nullptr ? *count : unused;
  length = 0;
  if (wireframe == nullptr || loop < 0 || SEQ_GetCount(wireframe->points) == 0) return nullptr;
  i32 begin = 0, end = SEQ_GetCount(wireframe->points);
  if (wireframe->second != nullptr) {
    const i32 loops = SEQ_GetCount(wireframe->second);
    if (loop >= loops) return nullptr;
    const zr::ListView<const i32> starts(wireframe->second);
    begin = starts.records()[loop];
    if (loop + 1 < loops) end = starts.records()[loop + 1];
  } else if (loop > 0) {
    return nullptr;
  }
  const zr::ListView<const ZR_WireframePoint> points(wireframe->points);
  length = end - begin;
  return points.records() + begin;
}

}  // extern "C"
