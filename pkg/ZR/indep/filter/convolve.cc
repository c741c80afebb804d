// Convolution with whole-numbered kernels: the checks of a call, and rows one after the other.
#include <ZR/blur.h>
#include <ZR/errors.h>

#include <algorithm>
#include <cstdlib>
#include <limits>
#include <optional>
#include <type_traits>

#include "filter/convolve_rows.h"
#include "filter/float_bands.h"
#include "world/guard.h"

namespace zr {
namespace {

constexpr i32 largest_kernel = 65535;
constexpr i64 taps_before_poll = 2049;

template <class T>
constexpr u64 greatest_channel = std::is_same_v<T, ZR_Pixel8> ? 255 : 65535;

// One channel's result from its sum.
inline u8 narrowed(const Convolution<ZR_Pixel8>& c, i64 v) {
  return static_cast<u8>(std::clamp<i64>(c.wraps ? static_cast<i16>(static_cast<u16>(v)) : v, 0, 255));
}
inline u16 narrowed(const Convolution<ZR_Pixel16>&, i64 v) { return static_cast<u16>(std::clamp<i64>(v, 0, 32768)); }

template <class T>
Channel<T> convolved(const Convolution<T>& c, i32 channel, i64 left, KernelRows rows, i32 first, i32 end, i64 top,
                     const Channel<T> T::*member) {
  const i32* const kernel = c.kernels[channel];
  const i64 divisor = c.divisors[channel];
  std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, f64, i64> sum = 0;
  for (i32 v = rows.first; v < rows.end; ++v) {
    const T* const row = c.source_row(top + v) + left;
    const i32* const taps = kernel + static_cast<i64>(v) * c.width;
    for (i32 u = first; u < end; ++u) {
      if constexpr (std::is_same_v<T, ZR_PixelFloat>)
        sum += static_cast<f64>(row[u].*member * static_cast<f32>(taps[u]));
      else
        sum += static_cast<i64>(row[u].*member) * taps[u];
    }
  }
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return static_cast<f32>(sum) / static_cast<f32>(divisor);
  else
    return narrowed(c, sum / divisor);
}

// False, reported, where a sum of a kernel could leave 64 bits.
template <class T>
bool find_divisors(Convolution<T>* c, bool normalised) {
  const i64 taps = static_cast<i64>(c->width) * c->height;
  for (i32 k = 0; k < 4; ++k) {
    i64 sum = 0;
    u64 size = 0;
    for (i64 i = 0; i < taps; ++i) {
      const i64 tap = c->kernels[k][i];
      sum += tap;
      size += static_cast<u64>(tap < 0 ? -tap : tap);
    }
    if (size > static_cast<u64>(std::numeric_limits<i64>::max()) / greatest_channel<T>) return false;
    c->divisors[k] = normalised ? (sum != 0 ? sum : 1) : taps * 256;
    c->tap_sums[k] = size;
  }
  return true;
}

// A call's taps as lanes take them, made anew where other rows of the kernel meet the source.
template <class T>
class LaneTaps {
 public:
  // Lanes serve kernels whose numbers fit theirs, and not the largest ones.
  explicit LaneTaps(const Convolution<T>& c) : c_(c), row_(lane_convolve_row<T>()) {
    const i64 taps = static_cast<i64>(c.width) * c.height;
    if (row_ == nullptr || taps > most_taps || !fits(taps)) return;
    taps_ = static_cast<LaneTap<T>*>(HB_AllocatePtr(static_cast<u64>(taps) * sizeof(LaneTap<T>),
                                                    HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_BlurMemory, 0, 0),
                                                    ZR_ModuleCode | ZR_Site_Convolve));
    if (taps_ == nullptr) fail(ZR_Err_OutOfMemory);
  }
  ~LaneTaps() { HB_FreePtr(taps_); }
  LaneTaps(const LaneTaps&) = delete;
  LaneTaps& operator=(const LaneTaps&) = delete;

  void row(i32 y, i32 pixels, T* dst) {
    const i64 reach = c_.width / 2;
    const i32 first = static_cast<i32>(std::min<i64>(reach, pixels));
    const i32 end = static_cast<i32>(std::clamp<i64>(c_.src_width - reach, first, pixels));
    const KernelRows rows = kernel_rows_at(c_, y);
    i32 done = 0;
    if (taps_ != nullptr && end > first && rows.first < rows.end) {
      if (rows.first != rows_.first || rows.end != rows_.end) collect(rows);
      work_.src = c_.source_row(y) + first;
      work_.pixels = end - first;
      work_.dst = dst + first;
      done = row_(work_);
    }
    convolve_pixels(c_, y, 0, first, dst);
    convolve_pixels(c_, y, first + done, pixels, dst);
  }

 private:
  static constexpr i64 most_taps = 1 << 16;
  static constexpr bool whole = !std::is_same_v<T, ZR_PixelFloat>;

  bool fits(i64 taps) const {
    if (!whole) return true;
    for (i32 k = 0; k < 4; ++k) {
      if (c_.tap_sums[k] > std::numeric_limits<i32>::max() / greatest_channel<T>) return false;
      for (i64 i = 0; i < taps; ++i)
        if (c_.kernels[k][i] > 32767 || c_.kernels[k][i] < -32767) return false;
    }
    return true;
  }
  i32 weight(u32 channel, i64 tap) const {
    const i32 value = c_.kernels[channel][tap];
    return whole && c_.divisors[channel] < 0 ? -value : value;
  }
  i64 place(i64 tap) const {
    const i64 v = tap / c_.width - c_.height / 2, u = tap % c_.width - c_.width / 2;
    return v * c_.src_row_bytes + u * static_cast<i64>(sizeof(T));
  }
  void collect(KernelRows rows) {
    rows_ = rows;
    work_ = {};
    const i64 first = static_cast<i64>(rows.first) * c_.width, end = static_cast<i64>(rows.end) * c_.width;
    for (u32 k = 0; k < 4; ++k) {
      i64 sum = 0;
      for (i64 i = first; i < end; ++i) sum += weight(k, i);
      if (std::is_same_v<T, ZR_Pixel16>) work_.bias[k] = static_cast<i32>(sum * 32768);
      if (whole) work_.divisors[k] = static_cast<i32>(std::abs(c_.divisors[k]));
      work_.float_divisors[k] = static_cast<f32>(c_.divisors[k]);
    }
    work_.wraps = c_.wraps;
    work_.taps = taps_;
    constexpr i64 at_once = whole ? 2 : 1;
    for (i64 i = first; i < end; i += at_once) {
      LaneTap<T>& tap = taps_[work_.count++];
      if constexpr (whole) {
        const bool both = i + 1 < end;
        tap.first = tap.second = place(i);
        if (both) tap.second = place(i + 1);
        for (u32 k = 0; k < 4; ++k) {
          tap.weights[2 * k] = static_cast<i16>(weight(k, i));
          tap.weights[2 * k + 1] = static_cast<i16>(both ? weight(k, i + 1) : 0);
        }
      } else {
        tap.place = place(i);
        for (u32 k = 0; k < 4; ++k) tap.weights[k] = static_cast<f32>(weight(k, i));
      }
    }
  }

  const Convolution<T>& c_;
  LaneConvolveFunc<T>* row_;
  LaneTap<T>* taps_ = nullptr;
  KernelRows rows_ = {0, 0};
  LaneConvolution<T> work_ = {};
};

struct RowRange {
  i32 first = 0, end = std::numeric_limits<i32>::max();
};

// Rows of a destination one after the other: where the host is asked after each, those that follow stay as they were.
template <class T>
class RowsInTurn {
 public:
  RowsInTurn(const Convolution<T>& c, const ZR_LayerDef& dst, const RowRange& rows, bool one_by_one)
      : dst_(dst), range_(rows), one_by_one_(one_by_one) {
    if constexpr (banded) bands_.emplace(c, dst, one_by_one);
    if (!banded || !*bands_) rows_.emplace(c);
  }
  void make(i32 y) {
    if (rows_) {
      char* const row = static_cast<char*>(dst_.data) + i64{y} * dst_.row_bytes;
      return rows_->row(y, dst_.width, reinterpret_cast<T*>(row));
    }
    if constexpr (banded) {
      if (one_by_one_)
        bands_->make_next(y);
      else if (y == range_.first)
        bands_->make_rows(range_.first, range_.end);
    }
  }

 private:
  static constexpr bool banded = std::is_same_v<T, ZR_PixelFloat>;
  const ZR_LayerDef& dst_;
  RowRange range_;
  bool one_by_one_;
  std::optional<FloatBands> bands_;
  std::optional<LaneTaps<T>> rows_;
};

template <class T>
i32 convolve(const ZR_ProgressInfo* progress, const ZR_LayerDef* src, u32 flags, i32 size, const i32* a, const i32* r,
             const i32* g, const i32* b, ZR_LayerDef* dst, RowRange range) {
  if (src->data == nullptr || dst->data == nullptr || a == nullptr || r == nullptr || g == nullptr || b == nullptr ||
      size < 1 || size % 2 == 0)
    return ZR_ReportBadCallbackParam(ZR_Site_Convolve);
  if (size > largest_kernel) return failed_verification(ZR_Site_Convolve, "a kernel of ZR_Convolve is too large");
  Convolution<T> c{};
  const bool one_row = (flags & ZR_ConvolveFlag_1D) != 0, upright = (flags & ZR_ConvolveFlag_Vertical) != 0;
  c.width = one_row && upright ? 1 : size;
  c.height = one_row && !upright ? 1 : size;
  const i32* const kernels[] = {a, r, g, b};
  std::copy(kernels, kernels + 4, c.kernels);
  c.wraps = std::is_same_v<T, ZR_Pixel8> && (flags & ZR_ConvolveFlag_NoClamp) != 0;
  c.src = static_cast<const char*>(src->data);
  c.src_row_bytes = src->row_bytes;
  c.src_width = src->width;
  c.src_height = src->height;
  if (!find_divisors(&c, (flags & ZR_ConvolveFlag_Normalised) != 0))
    return failed_verification(ZR_Site_Convolve, "sums of a kernel of ZR_Convolve do not fit 64 bits");

  const bool polled = progress != nullptr && progress->progress != nullptr;
  range = {std::max(range.first, 0), std::min(range.end, dst->height)};
  if (range.first >= range.end) return ZR_Err_None;
  RowsInTurn<T> rows(c, *dst, range, polled);
  i64 work = 0;
  for (i32 y = range.first; y < range.end; ++y) {
    rows.make(y);
    work += static_cast<i64>(c.width) * c.height * dst->width;
    if (!polled || work < taps_before_poll) continue;
    if (const i32 stop = progress->progress(progress->refcon, y + 1, dst->height); stop != 0) return stop;
    work = 0;
  }
  return ZR_Err_None;
}

}  // namespace

template <class T>
void convolve_pixels(const Convolution<T>& c, i32 y, i32 first, i32 end, T* dst_row) {
  const KernelRows rows = kernel_rows_at(c, y);
  const i64 top = static_cast<i64>(y) - c.height / 2;
  for (i32 x = first; x < end; ++x) {
    const i64 left = static_cast<i64>(x) - c.width / 2;
    const i32 from = static_cast<i32>(std::clamp<i64>(-left, 0, c.width));
    const i32 to = static_cast<i32>(std::clamp<i64>(c.src_width - left, from, c.width));
    const auto one = [&](i32 channel, const Channel<T> T::*member) {
      return convolved<T>(c, channel, left, rows, from, to, top, member);
    };
    dst_row[x] = {one(0, &T::alpha), one(1, &T::red), one(2, &T::green), one(3, &T::blue)};
  }
}
template void convolve_pixels(const Convolution<ZR_Pixel8>&, i32, i32, i32, ZR_Pixel8*);
template void convolve_pixels(const Convolution<ZR_Pixel16>&, i32, i32, i32, ZR_Pixel16*);
template void convolve_pixels(const Convolution<ZR_PixelFloat>&, i32, i32, i32, ZR_PixelFloat*);

}  // namespace zr

template <class T>
i32 ZRp_Convolve(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const GX_LRect*, u32 flags, i32 size, const i32* a,
                 const i32* r, const i32* g, const i32* b, ZR_LayerDef* dst) {
  return zr::guarded([&]() -> i32 {
    if (src == nullptr || dst == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Convolve);
    return zr::convolve<T>(progress, src, flags, size, a, r, g, b, dst, {});
  });
}
template ZR_API i32 ZRp_Convolve<ZR_Pixel8>(const ZR_ProgressInfo*, ZR_LayerDef*, const GX_LRect*, u32, i32, const i32*,
                                            const i32*, const i32*, const i32*, ZR_LayerDef*);
template ZR_API i32 ZRp_Convolve<ZR_Pixel16>(const ZR_ProgressInfo*, ZR_LayerDef*, const GX_LRect*, u32, i32,
                                             const i32*, const i32*, const i32*, const i32*, ZR_LayerDef*);
template ZR_API i32 ZRp_Convolve<ZR_PixelFloat>(const ZR_ProgressInfo*, ZR_LayerDef*, const GX_LRect*, u32, i32,
                                                const i32*, const i32*, const i32*, const i32*, ZR_LayerDef*);

namespace zr {
namespace {

i32 convolve_any_depth(const ZR_ProgressInfo* progress, ZR_LayerDef* src, u32 flags, i32 size, const i32* a,
                       const i32* r, const i32* g, const i32* b, ZR_LayerDef* dst, RowRange rows) {
  return guarded([&]() -> i32 {
    if (src == nullptr || dst == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Convolve);
    const i32 depth = ZRp_WorldDepth(src);
    if (depth != ZRp_WorldDepth(dst))
      return failed_verification(ZR_Site_Convolve, "ZR_Convolve requires source and dst worlds to be same depth");
    return on_depth(depth, unknown_depth_text,
                    [&]<class T>() { return convolve<T>(progress, src, flags, size, a, r, g, b, dst, rows); });
  });
}

}  // namespace
}  // namespace zr

i32 ZR_Convolve(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const GX_LRect*, u32 flags, i32 size,
                const i32* a_kernel, const i32* r_kernel, const i32* g_kernel, const i32* b_kernel, ZR_LayerDef* dst) {
  return zr::convolve_any_depth(progress, src, flags, size, a_kernel, r_kernel, g_kernel, b_kernel, dst, {});
}

i32 ZR_ConvolveRows(ZR_LayerDef* src, u32 flags, i32 size, const i32* a_kernel, const i32* r_kernel,
                    const i32* g_kernel, const i32* b_kernel, ZR_LayerDef* dst, i32 first_row, i32 end_row) {
  return zr::convolve_any_depth(nullptr, src, flags, size, a_kernel, r_kernel, g_kernel, b_kernel, dst,
                                {first_row, end_row});
}
