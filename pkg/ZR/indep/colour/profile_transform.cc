// Transforms applied to worlds: in one piece, or row by row around alpha.
#include <HB/allocator.h>
#include <ZR/colour_transform.h>

#include <algorithm>
#include <bit>

#include "colour/interleave.h"
#include "world/guard.h"

namespace zr {
namespace {

u32 rgb_layout(i32 depth) {
  return depth == 8 ? PRISMA_Layout_RGB8 : depth == 16 ? PRISMA_Layout_RGB16 : PRISMA_Layout_RGBFloat;
}
u32 cmyk_layout(i32 depth) { return depth == 8 ? PRISMA_Layout_CMYK8 : PRISMA_Layout_CMYK16; }

[[noreturn]] void refuse(const char* text) { fail(failed_verification(ZR_Site_ColourTransform, text)); }

struct Work {
  PRISMATransform* transform;
  u32 src_layout, dst_layout;
  const ZR_World* src;
  ZR_World* dst;
  i32 depth;      // of alpha, when it is copied
  u8* alpha;      // a row of alpha for each row between two polls; null: alpha is not copied
  i32 first_row;  // of the rows that are under way
};

void* row_of(const ZR_World* world, i32 y) {
  return static_cast<char*>(world->data) + static_cast<ptrdiff_t>(y) * world->row_bytes;
}

// The engine leaves alpha alone, but another one may not: it is kept aside while colours change.
i32 transform_row(void* refcon, i32, i32 i, i32) {
  const Work& work = *static_cast<const Work*>(refcon);
  const i32 width = work.src->width;
  const void* const src = row_of(work.src, work.first_row + i);
  void* const dst = row_of(work.dst, work.first_row + i);
  const auto with_alpha = [&](auto&& body) {
    if (work.alpha == nullptr) return i32{ZR_Err_None};
    return on_depth(work.depth, unknown_depth_text, [&]<class T>() {
      body.template operator()<T>(reinterpret_cast<Channel<T>*>(work.alpha) +
                                  static_cast<size_t>(i) * static_cast<size_t>(width));
      return i32{ZR_Err_None};
    });
  };
  i32 error =
      with_alpha([&]<class T>(Channel<T>* alpha) { ZR_Deinterleave1(width, static_cast<const T*>(src), alpha); });
  if (error != ZR_Err_None) return error;
  error =
      TON_PRISMA_Apply(work.transform, work.src_layout, src, work.dst_layout, dst, static_cast<size_t>(width), nullptr);
  if (error != ZR_Err_None) return error;
  return with_alpha([&]<class T>(Channel<T>* alpha) { ZR_Interleave1to4(width, alpha, static_cast<T*>(dst)); });
}

// An abort function is handed the row as well here; one that does not expect it does not see it.
i32 poll_row(const ZR_ProgressInfo* progress, i32 row, i32 height) {
  using RowAbort = i32 (*)(void*, i32);
  if (progress == nullptr) return 0;
  if (progress->progress != nullptr) return progress->progress(progress->refcon, row, height);
  if (progress->abort != nullptr) return std::bit_cast<RowAbort>(progress->abort)(progress->refcon, row);
  return 0;
}

constexpr i32 rows_between_polls = 64;

void apply(PRISMATransform* transform, bool cmyk, const ZR_World* src, ZR_World* dst, bool copy_alpha,
           const ZR_ProgressInfo* progress) {
  const i32 width = src->width, height = src->height, depth_s = src->GetBitDepth(), depth_d = dst->GetBitDepth();
  for (const i32 depth : {depth_s, depth_d})
    if (depth != 8 && depth != 16 && depth != 32) refuse(unknown_depth_text);
  if (cmyk && depth_s == 32) refuse("ZRp_PRISMAApplyTransform only works on 8 and 16 bit CMYK data");
  if (dst->width < width || dst->height < height)
    refuse("The destination of a colour transform is smaller than its source.");
  if (width <= 0 || height <= 0) return;
  Work work{
      transform, cmyk ? cmyk_layout(depth_s) : rgb_layout(depth_s), rgb_layout(depth_d), src, dst, depth_s, nullptr, 0};

  const bool src_packed = depth_s / 8 * width * 4 == src->row_bytes;
  const bool dst_packed = depth_d / 8 * width * 4 == dst->row_bytes;
  if (!copy_alpha && src_packed && dst_packed) {
    TON_PRISMA_ETX(TON_PRISMA_Apply(transform, work.src_layout, src->data, work.dst_layout, dst->data,
                                    static_cast<size_t>(width) * static_cast<size_t>(height), ZR_IterateGeneric));
    return;
  }

  if (copy_alpha && depth_s != depth_d) refuse("Can't copy alpha if src and dst have different depth.");
  struct AlphaRows {
    u8* block = nullptr;
    ~AlphaRows() { HB_FreePtr(block); }
  } rows;
  if (copy_alpha) {
    const size_t bytes = static_cast<size_t>(std::min(height, rows_between_polls)) * static_cast<size_t>(width) *
                         static_cast<size_t>(depth_s / 8);
    rows.block =
        static_cast<u8*>(HB_AllocatePtr(bytes, "alpha of a colour transform", ZR_ModuleCode | ZR_Site_ColourTransform));
    if (rows.block == nullptr) fail(ZR_Err_OutOfMemory);
    work.alpha = rows.block;
  }
  for (i32 y = 0; y < height; y += rows_between_polls) {
    const i32 count = std::min(rows_between_polls, height - y);
    work.first_row = y;
    const i32 error = ZR_IterateGeneric(count, &work, transform_row);
    if (error == ZR_Err_Internal) fail(error);  // has been reported
    TON_PRISMA_ETX(error);
    if (count < rows_between_polls) break;
    if (const i32 stop = poll_row(progress, y + rows_between_polls - 1, height)) fail(stop);
  }
}

}  // namespace
}  // namespace zr

void ZR_PRISMAApplyTransform(PRISMATransform* transform, const ZR_World* src, ZR_World* dst, bool copy_alpha,
                             const ZR_ProgressInfo* progress) {
  zr::apply(transform, false, src, dst, copy_alpha, progress);
}

void ZR_PRISMAApplyTransformSrcCMYK(PRISMATransform* transform, const ZR_World* src, ZR_World* dst, bool copy_alpha,
                                    const ZR_ProgressInfo* progress) {
  zr::apply(transform, true, src, dst, copy_alpha, progress);
}

void ZR_ConvertProfileToProfile(PRISMA_ProfileCode from, PRISMA_ProfileCode to, const ZR_World* src, ZR_World* dst,
                                bool copy_alpha, const ZR_ProgressInfo* progress) {
  const TON_PRISMA_Transform transform(TON_PRISMA_Profile(from), TON_PRISMA_Profile(to),
                                       PRISMA_Intent_RelativeColorimetric, TON_GetDefaultPRISMAOptions());
  zr::apply(transform.Get(), false, src, dst, copy_alpha, progress);
}

TON_PRISMA_Transform ZR_GetLinearizeTransform(boost::shared_ptr<TON_PRISMA_Profile> a,
                                              boost::shared_ptr<TON_PRISMA_Profile> b, bool to_linear) {
  if (!a) a = TON_PRISMA_GetDefaultProfile();
  if (!b) b = TON_PRISMA_GetDefaultProfile();
  if (to_linear)
    b = TON_PRISMA_GetLinearRGBProfile(b);
  else
    a = TON_PRISMA_GetLinearRGBProfile(a);
  return TON_PRISMA_Transform(*a, *b, PRISMA_Intent_RelativeColorimetric, TON_GetDefaultPRISMAOptions());
}
