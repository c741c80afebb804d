// One convolution on all threads of the Hostkit, in bands of rows that are asked for by number.
#include <ZR/filter.h>
#include <ZR/hostkit.h>

#include "bands.h"
#include "divided_worlds.h"

namespace zr {
namespace {

constexpr i32 least_pixels = 8192;  // make waking a thread worth while

struct Convolving {
  const ZR_ProgressInfo* progress;
  ZR_LayerDef* src;
  u32 flags;
  i32 size;
  const i32* kernels[4];
  ZR_LayerDef* dst;

  i32 run() const {
    if (src == nullptr || dst == nullptr || !in_order(*src) || !in_order(*dst) || !owns_rows(*dst) ||
        share_memory(*src, *dst))
      return by_library();
    const Bands bands({0, 0, dst->width, dst->height}, threads_from_here(), least_pixels);
    if (bands.count() == 1) return by_library();
    if (const i32 refused = rows({0, 0}); refused != 0) return refused;
    const ZR_ProgressInfo asked = {progress != nullptr ? progress->refcon : nullptr, nullptr,
                                   progress != nullptr ? progress->progress : nullptr};
    return draw_bands(bands, &asked, const_cast<Convolving*>(this),
                      [](void* refcon, i32, Rows band) { return static_cast<Convolving*>(refcon)->rows(band); });
  }

 private:
  i32 by_library() const {
    return ZR_Convolve(progress, src, nullptr, flags, size, kernels[0], kernels[1], kernels[2], kernels[3], dst);
  }
  i32 rows(Rows band) const {
    return ZR_ConvolveRows(src, flags, size, kernels[0], kernels[1], kernels[2], kernels[3], dst, band.first, band.end);
  }
};

}  // namespace
}  // namespace zr

i32 ZRHost_Convolve(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const GX_LRect*, u32 flags, i32 size,
                    const i32* a_kernel, const i32* r_kernel, const i32* g_kernel, const i32* b_kernel,
                    ZR_LayerDef* dst) {
  return zr::run_divided(zr::Convolving{progress, src, flags, size, {a_kernel, r_kernel, g_kernel, b_kernel}, dst});
}
