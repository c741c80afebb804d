// Summed-area tables: how they are built, and box means from them.
#include <ZR/summed_area.h>

#include <RS/rs.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <new>
#include <vector>

#include "sample/lanes.h"
#include "sample/sum_bands.h"
#include "world/guard.h"

namespace zr {
namespace {

// ------------------------------------------------------------------------------------- building

using SumRow = std::vector<Lanes<f64>, HB_Allocator<Lanes<f64>, SumRowLabel>>;

template <class T>
Lanes<f64> premultiplied(const T& p) {
  constexpr f64 white = Depth<T>::white;
  Lanes<f64> c = channels<f64>(p);
  const f64 alpha = c.alpha();
  if (alpha == 0.0) return Lanes<f64>::all(0.0);
  if (alpha == white) return c;
  c = (alpha / white) * c;
  c.set_alpha(alpha);
  return c;
}

inline void store(const Lanes<f64>& c, ZR_PixelDouble& out) { out = {c.low[0], c.low[1], c.high[0], c.high[1]}; }
inline void store(const Lanes<f64>& c, ZR_PixelFloat& out) {
  out = {static_cast<f32>(c.low[0]), static_cast<f32>(c.low[1]), static_cast<f32>(c.high[0]),
         static_cast<f32>(c.high[1])};
}

// Plain sums run in two rows with a guard cell on the left; the table gets each over its count of cells.
template <class T, class Entry>
void build(const ZR_World& world, Entry* table) {
  const size_t cells = static_cast<size_t>(world.width) + 1;
  if (SumBlockFunc<Entry>* const lanes = lane_block_sums<T, Entry>(); lanes != nullptr) {
    const size_t rows = static_cast<size_t>(world.height);
    SumRow sums(cells + (rows * carried_numbers + 3) / 4, Lanes<f64>::all(0.0));
    f64* const above = reinterpret_cast<f64*>(sums.data());
    if (const i32 error = SumBands<Entry>(world, lanes, above, above + 4 * cells, table).run(); error != 0) fail(error);
    return;
  }
  SumRow previous(cells, Lanes<f64>::all(0.0)), current(cells, Lanes<f64>::all(0.0));
  for (i32 y = 0; y < world.height; ++y) {
    const T* const src =
        reinterpret_cast<const T*>(static_cast<const char*>(world.data) + static_cast<ptrdiff_t>(y) * world.row_bytes);
    for (size_t x = 0; x + 1 < cells; ++x) {
      current[x + 1] = premultiplied(src[x]) + current[x] + previous[x + 1] + -1.0 * previous[x];
      store((1.0 / (static_cast<f64>(x + 1) * (y + 1.0))) * current[x + 1], *table++);
    }
    current.swap(previous);
  }
}

size_t table_bytes(i32 width, i32 height, size_t entry) {
  return static_cast<size_t>(width) * static_cast<size_t>(height) * entry;
}
// A frame from the pool: fresh pages would cost more than the sums.
template <class Entry>
Entry* allocate(i32 width, i32 height) {
  const size_t bytes = table_bytes(width, height, sizeof(Entry));
  void* const block = RS_AllocateFrameQuiet(bytes);
  if (block != nullptr) return static_cast<Entry*>(block);
  char text[256];
  std::snprintf(text, sizeof text, "Out of memory: %s (%zu bytes).",
                HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_BlurMemory, 0, 0), bytes);
  HBp_ReportErrString(ZR_ModuleCode | ZR_Site_Plain, ZR_ReportSeverity, text);
  fail(ZR_Err_OutOfMemory);
}

// ------------------------------------------------------------------------------------- sampling

inline Lanes<f64> entry(const ZR_PixelDouble& p) { return {f64x2{p.alpha, p.red}, f64x2{p.green, p.blue}}; }
inline Lanes<f64> entry(const ZR_PixelFloat& p) { return channels<f64>(p); }

// One channel of the result, from a value on the depth's scale.
template <class O>
auto limited(f64 v) {
  constexpr f64 white = Depth<O>::white;
  const f64 within = v > 0.0 ? std::min(v, white) : 0.0;
  if constexpr (std::is_same_v<O, ZR_PixelFloat>)
    return static_cast<f32>(within);
  else
    return static_cast<Channel<O>>(within + 0.5);
}

// Sums of the four corners to a straight pixel: alpha over the whole area, colour over the sum of alpha.
// unweighted(c, alpha) says in which order the latter is rounded.
template <class O, class Unweighted>
O straight_mean(const Lanes<f64>& sum, f64 area, Unweighted&& unweighted) {
  const f64 alpha = sum.alpha();
  if (!(alpha > 0.0)) return O{};
  return {limited<O>(alpha / area), limited<O>(unweighted(sum.low[1], alpha)),
          limited<O>(unweighted(sum.high[0], alpha)), limited<O>(unweighted(sum.high[1], alpha))};
}

// corner(u, v) is the sum of (0, 0) to there.
template <class Corner, class Edge>
Lanes<f64> sum_of_corners(Corner&& corner, Edge left, Edge top, Edge right, Edge bottom) {
  return corner(right, bottom) + corner(left, top) + -1.0 * corner(left, bottom) + -1.0 * corner(right, top);
}

}  // namespace
}  // namespace zr

ZR_SummedAreaTable::ZR_SummedAreaTable(const ZR_World* world, bool use_double)
    : width_(std::max(world->width, 0)),
      height_(std::max(world->height, 0)),
      uses_double_(use_double || world->GetBitDepth() == 32) {
  if (width_ == 0 || height_ == 0 || world->data == nullptr) {
    width_ = height_ = 0;
    return;
  }
  try {
    const auto fill = [&](auto* table) {
      switch (world->GetBitDepth()) {
        case 8: return zr::build<ZR_Pixel8>(*world, table);
        case 16: return zr::build<ZR_Pixel16>(*world, table);
        default: return zr::build<ZR_PixelFloat>(*world, table);
      }
    };
    if (uses_double_)
      fill(double_table_ = zr::allocate<ZR_PixelDouble>(width_, height_));
    else
      fill(float_table_ = zr::allocate<ZR_PixelFloat>(width_, height_));
  } catch (const std::bad_alloc&) {  // of the rows; reported
    free_tables();
    zr::fail(ZR_Err_OutOfMemory);
  } catch (...) {
    free_tables();
    throw;
  }
}

ZR_SummedAreaTable::~ZR_SummedAreaTable() { free_tables(); }

void ZR_SummedAreaTable::free_tables() {
  RS_FreeFrame(float_table_, zr::table_bytes(width_, height_, sizeof *float_table_));
  RS_FreeFrame(double_table_, zr::table_bytes(width_, height_, sizeof *double_table_));
}

template <class O, class T>
void ZR_SummedAreaTable_SampleDraft(i32 width, i32 height, const T* table, i32 left, i32 top, i32 right, i32 bottom,
                                    O* dst) {
  using namespace zr;
  *dst = {};
  const f64 area = (static_cast<f64>(right) - left) * (static_cast<f64>(bottom) - top);
  left = std::max(left, 0), top = std::max(top, 0);
  right = std::min(right, width), bottom = std::min(bottom, height);
  if (area <= 0.0 || left >= right || top >= bottom) return;
  const auto corner = [&](i32 u, i32 v) {
    if (u == 0 || v == 0) return Lanes<f64>::all(0.0);
    return (static_cast<f64>(u) * v) * entry(table[static_cast<ptrdiff_t>(v - 1) * width + (u - 1)]);
  };
  *dst = straight_mean<O>(sum_of_corners(corner, left, top, right, bottom), area,
                          [](f64 c, f64 alpha) { return c * (Depth<O>::white / alpha); });
}

template <class O, class T>
void ZR_SummedAreaTable_SampleAA(i32 width, i32 height, const T* table, f32 left, f32 top, f32 right, f32 bottom,
                                 O* dst) {
  using namespace zr;
  *dst = {};
  left += 0.5f, top += 0.5f, right += 0.5f, bottom += 0.5f;
  const f64 area = (static_cast<f64>(right) - left) * (static_cast<f64>(bottom) - top);
  if (!(area > 0.0)) return;
  const auto clip_end = [](f32 edge, i32 size) {
    return edge >= static_cast<f32>(size) ? static_cast<f32>(size) - 1e-5f : edge;
  };
  left = std::max(left, 0.0f), top = std::max(top, 0.0f);
  right = clip_end(right, width), bottom = clip_end(bottom, height);
  if (left >= right || top >= bottom) return;
  const auto corner = [&](f32 u, f32 v) {
    const i32 iu = static_cast<i32>(u), iv = static_cast<i32>(v);
    const f64 fu = static_cast<f64>(u) - iu, fv = static_cast<f64>(v) - iv;
    Lanes<f64> sum = Lanes<f64>::all(0.0);
    const auto add = [&](f64 weight, i32 columns, i32 rows) {
      const f64 cells = weight * columns * rows;
      if (cells != 0.0) sum = sum + cells * entry(table[static_cast<ptrdiff_t>(rows - 1) * width + (columns - 1)]);
    };
    add((1.0 - fv) * (1.0 - fu), iu, iv);
    add((1.0 - fv) * fu, iu + 1, iv);
    add(fv * (1.0 - fu), iu, iv + 1);
    add(fv * fu, iu + 1, iv + 1);
    return sum;
  };
  *dst = straight_mean<O>(sum_of_corners(corner, left, top, right, bottom), area,
                          [](f64 c, f64 alpha) { return c / alpha * Depth<O>::white; });
}

#define ZR_INSTANTIATE(O, T)                                                                       \
  template ZR_API void ZR_SummedAreaTable_SampleDraft(i32, i32, const T*, i32, i32, i32, i32, O*); \
  template ZR_API void ZR_SummedAreaTable_SampleAA(i32, i32, const T*, f32, f32, f32, f32, O*);
ZR_INSTANTIATE(ZR_Pixel8, ZR_PixelFloat)
ZR_INSTANTIATE(ZR_Pixel8, ZR_PixelDouble)
ZR_INSTANTIATE(ZR_Pixel16, ZR_PixelFloat)
ZR_INSTANTIATE(ZR_Pixel16, ZR_PixelDouble)
ZR_INSTANTIATE(ZR_PixelFloat, ZR_PixelFloat)
ZR_INSTANTIATE(ZR_PixelFloat, ZR_PixelDouble)
#undef ZR_INSTANTIATE
