// Copies between raster frames.
#include <HB/hb.h>
#include <RS/rs.h>
#include <ZR/copy_bits.h>
#include <ZR/errors.h>

#include <algorithm>

#include "world/guard.h"
#include "world/slot_table.h"

namespace zr {
namespace {

bool is_frame(RS_World** frame) { return frame != nullptr && *frame != nullptr; }

// Runs a copy on views of two frames. A null handle is a null world to the copy, which reports it.
i32 on_frames(RS_World** src, RS_World** dst, const GX_LRect* src_rect, const GX_LRect* dst_rect, CopyBitsFunc* copy) {
  ZR_LayerDef views[2];
  ZR_LayerDef* given[2] = {nullptr, nullptr};
  RS_World** const frames[2] = {src, dst};
  for (int i = 0; i < 2; ++i) {
    if (!is_frame(frames[i])) continue;
    if (const i32 error = ZR_EffectWorldFromRSWorld(frames[i], &views[i]); error != ZR_Err_None) return error;
    given[i] = &views[i];
  }
  return copy(nullptr, given[0], given[1], src_rect, dst_rect);
}

bool orders_differ(RS_World** a, RS_World** b) {
  const auto order = [](RS_World** frame) {  // deeper frames have but one
    return (*frame)->bits_per_pixel == 32 ? RS_GetChannelOrder(frame) : 0;
  };
  return is_frame(a) && is_frame(b) && order(a) != order(b);
}

// Turns the bytes of every 32-bit pixel of a rectangle around.
void flip_pixels(const RS_World& frame, const GX_LRect* rect) {
  GX_LRect part = {0, 0, frame.width, frame.height};
  if (rect != nullptr)
    part = {std::max(rect->left, part.left), std::max(rect->top, part.top), std::min(rect->right, part.right),
            std::min(rect->bottom, part.bottom)};
  for (i32 y = part.top; y < part.bottom; ++y) {
    u32* const row = reinterpret_cast<u32*>(static_cast<char*>(frame.base) + std::ptrdiff_t{y} * frame.row_bytes);
    for (i32 x = part.left; x < part.right; ++x) row[x] = HB_LongSwap(row[x]);
  }
}

}  // namespace
}  // namespace zr

extern "C" {

i32 ZR_WorldCopy(void* /*unused*/, RS_World** src, RS_World** dst, const GX_LRect* src_rect, const GX_LRect* dst_rect) {
  const i32 error = zr::on_frames(src, dst, src_rect, dst_rect, &ZR_CopyBits_Draft);
  if (error != ZR_Err_None || !zr::orders_differ(src, dst)) return error;
  if ((*dst)->bits_per_pixel != 32) {
    HBp_ReportErrString(ZR_ModuleCode | ZR_Site_ChannelOrder, ZR_ReportSeverity,
                        "Flipping 32/16-bit worlds is not implemented. Source data 8-bit BGRA.");
    return ZR_Err_UnimplementedMode;
  }
  zr::flip_pixels(**dst, dst_rect);
  return ZR_Err_None;
}

i32 ZR_WorldCopy_Static(void* /*unused*/, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                        const GX_LRect* dst_rect) {
  return zr::on_frames(src, dst, src_rect, dst_rect, &ZR_CopyBits_Draft_Static);
}

i32 ZR_WorldCopy_HQ(void* /*unused*/, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                    const GX_LRect* dst_rect) {
  return zr::on_frames(src, dst, src_rect, dst_rect, &ZR_CopyBits_HQ_Straight);
}

i32 ZR_WorldCopy_HQ_Straight(void* /*unused*/, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                             const GX_LRect* dst_rect) {
  return zr::on_frames(src, dst, src_rect, dst_rect, &ZR_CopyBits_HQ_Straight);
}

i32 ZR_WorldCopy_HQ_Static(void* /*unused*/, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                           const GX_LRect* dst_rect) {
  return zr::on_frames(src, dst, src_rect, dst_rect, &ZR_CopyBits_HQ_Straight_Static);
}

i32 ZR_WorldCopy_HQ_Straight_Static(void* /*unused*/, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                                    const GX_LRect* dst_rect) {
  return zr::on_frames(src, dst, src_rect, dst_rect, &ZR_CopyBits_HQ_Straight_Static);
}

i32 ZR_WorldCopy_HQ_Premul(void* /*unused*/, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                           const GX_LRect* dst_rect) {
  return zr::on_frames(src, dst, src_rect, dst_rect, &ZR_CopyBits_HQ_Premul);
}

}  // extern "C"
