// Worlds: named constructors, the operations that no depth changes, and the three instances of ZR_WorldX.
#include <ZR/world.h>

#include <HB/hb.h>

#include "world/guard.h"
#include "world/world_copy_impl.h"
#include "world/world_impl.h"

template class ZR_WorldX<ZR_Pixel8>;
template class ZR_WorldX<ZR_Pixel16>;
template class ZR_WorldX<ZR_PixelFloat>;

namespace {

using zr::fail;

bool is_depth(i32 depth) { return depth == 8 || depth == 16 || depth == 32; }

// The world that `body` makes for the depth; another depth throws without a message.
template <class Body>
ZR_World* world_of_depth(i32 depth, Body&& body) {
  if (!is_depth(depth)) fail(ZR_Err_Internal);
  ZR_World* made = nullptr;
  const auto run = [&]<class T> {
    made = body.template operator()<T>();
    return static_cast<i32>(ZR_Err_None);
  };
  zr::on_depth(depth, zr::unknown_depth_text, run);
  return made;
}

bool lies_inside(const GX_LRect& rect, const ZR_LayerDef& world) {
  return rect.left >= 0 && world.width >= rect.right && rect.top >= 0 && world.height >= rect.bottom;
}

void verify(bool holds, ZR_CallSite site, const char* text) {
  if (!holds) fail(zr::failed_verification(site, text));
}

}  // namespace

ZR_World* ZR_World::New(i32 width, i32 height, i16 depth, i32 flags) {
  return world_of_depth(depth, [&]<class T>() -> ZR_World* { return new ZR_WorldX<T>(width, height, flags); });
}

ZR_World* ZR_World::New(const GX_LRect& rect, i16 depth, i32 flags) {
  return New(zr::wrap_sub(rect.right, rect.left), zr::wrap_sub(rect.bottom, rect.top), depth, flags);
}

ZR_World* ZR_World::NewMatchingWorld(const ZR_World* like, i32 flags) {
  return New(like->width, like->height, like->GetBitDepth(), flags);
}

ZR_World* ZR_World::NewReference(ZR_World* parent, const GX_LRect& rect) {
  return world_of_depth(parent->GetBitDepth(), [&]<class T>() -> ZR_World* {
    return new ZR_WorldX<T>(static_cast<ZR_WorldX<T>*>(parent), rect);
  });
}

ZR_World* ZR_World::NewReference(ZR_World* parent, const GX_Rect& rect) {
  return NewReference(parent, GX_LRect{rect.left, rect.top, rect.right, rect.bottom});
}

ZR_World* ZR_World::NewReference(RS_World** raster) {
  return world_of_depth(ZR_DepthOfRSWorld(raster),
                        [&]<class T>() -> ZR_World* { return new ZR_WorldX<T>(raster, nullptr); });
}

ZR_World* ZR_World::NewReference(RS_World** raster, const GX_Rect& rect) {
  return world_of_depth(ZR_DepthOfRSWorld(raster),
                        [&]<class T>() -> ZR_World* { return new ZR_WorldX<T>(raster, &rect); });
}

ZR_World* ZR_World::NewReference(ZR_LayerDef* layer) {
  const i32 depth = ZRp_WorldDepth(layer);
  verify(is_depth(depth), ZR_Site_NewReference, "Unexpected bitdepth in ZR_World::NewReference(ZR_EffectWorld)");
  return world_of_depth(depth, [&]<class T>() -> ZR_World* { return new ZR_WorldX<T>(layer, false); });
}

ZR_World* ZR_World::NewReference(void* data, i32 width, i32 height, i16 depth, i32 row_bytes) {
  return world_of_depth(depth,
                        [&]<class T>() -> ZR_World* { return new ZR_WorldX<T>(data, width, height, row_bytes); });
}

RS_World** ZR_World::GetRSWorld() const {
  if (raster == nullptr) fail(ZR_Err_NoRasterWorld);
  return raster;
}

void ZR_World::CopyWorld(const ZR_World* src) { CopyRect(src, {0, 0, src->width, src->height}, 0, 0); }

void ZR_World::ShrinkToSubRect(const GX_LRect& rect) {
  verify(lies_inside(rect, *this), ZR_Site_ShrinkToSubRect, "bad sub rect in ShrinkToSubRect");
  verify(raster == nullptr, ZR_Site_ShrinkToSubRect, "Can't Shrink a ZR_World which is backed by a RS_World");
  zr::take_part(*this, rect, PixelSize(), this);
}

void ZR_World::ReReference(ZR_World* parent, const GX_LRect& rect) {
  verify(parent->GetBitDepth() == GetBitDepth(), ZR_Site_ReReference, "can't change bit depth in ReReference");
  verify(lies_inside(rect, *parent), ZR_Site_ReReference, "bad sub rect in ReReference");
  verify(parent != this, ZR_Site_ReReference, "can't ReReference self");
  static_cast<ZR_LayerDef&>(*this) = ZR_LayerDef{};
  zr::take_part(*parent, rect, PixelSize(), this);
  owner = this;
}

void ZR_World::FillOutEffectWorld(ZR_LayerDef* out) const {
  if (out == nullptr) return;
  *out = ZR_LayerDef{};
  out->data = data;
  out->row_bytes = row_bytes;
  out->width = width;
  out->height = height;
  out->extent = extent;
  const auto set_format = [&]<class T> {
    out->flags = zr::Depth<T>::layer_flags;
    return static_cast<i32>(ZR_Err_None);
  };
  if (const i32 error = zr::on_depth(GetBitDepth(), "Unknown pixel format", set_format); error != 0) fail(error);
  out->owner = const_cast<ZR_World*>(this);
  out->raster = raster;
}

bool ZR_World::RefersTo(const ZR_World* other) const {
  if (!IsReference() || GetBitDepth() != other->GetBitDepth() || row_bytes != other->row_bytes) return false;
  if (width > other->width || height > other->height) return false;
  const i64 delta = static_cast<i64>(reinterpret_cast<u64>(data) - reinterpret_cast<u64>(other->data));
  return delta >= 0 && row_bytes != 0 && delta / row_bytes < other->height;
}

i32 ZRp_WorldDepth(const ZR_LayerDef* layer) {
  if (layer->owner != nullptr) return layer->owner->GetBitDepth();
  switch (layer->flags >> 24) {
    case 0: return 8;
    case 1: return 16;
    case 2: return 32;
    default: zr::failed_verification(ZR_Site_UnknownDepth, "Unknown pixel format"); return 8;
  }
}
