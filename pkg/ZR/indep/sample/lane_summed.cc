// Summed-area tables on lanes: a pixel's four sums are one vector. Processors with shorter vectors keep to single
// pixels, whose sums are two.
#include "sample/lane_summed.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_summed.cc"
#include <hwy/foreach_target.h>

#include <hwy/cache_control.h>

#include <algorithm>
#include <cstdint>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES && HWY_TARGET <= HWY_AVX2 && (defined(__x86_64__) || defined(__i386__))
#define ZR_SUMS_ON_LANES 1
#else
#define ZR_SUMS_ON_LANES 0
#endif

#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

#if ZR_SUMS_ON_LANES
using Quad = hn::FixedTag<f64, 4>;
using QuadV = hn::Vec<Quad>;
constexpr i32 opaque_rows = 4;

// 1 for alpha, whose lane is the first.
HWY_INLINE QuadV weighted(QuadV channels, QuadV factor) {
  return hn::Mul(channels, hn::IfThenElse(hn::FirstN(Quad(), 1), hn::Set(Quad(), 1.0), factor));
}
// Of each alpha 1 and three times alpha / 255.
using Parts = f64[256][4];
const Parts& parts_of_alphas() {
  struct Table {
    alignas(32) Parts parts;
  };
  static const Table table = [] {
    Table made;
    for (i32 a = 0; a < 256; ++a) {
      made.parts[a][0] = 1.0;
      std::fill_n(made.parts[a] + 1, 3, a / 255.0);
    }
    return made;
  }();
  return table.parts;
}
HWY_INLINE QuadV premultiplied(const ZR_Pixel8* p, const Parts& parts) {
  const hn::FixedTag<u8, 4> d;
  const auto whole = hn::PromoteTo(hn::FixedTag<i32, 4>(), hn::LoadU(d, reinterpret_cast<const u8*>(p)));
  return hn::Mul(hn::PromoteTo(Quad(), whole), hn::Load(Quad(), parts[p->alpha]));
}
HWY_INLINE QuadV premultiplied(const ZR_Pixel16* p, const Parts&) {
  const hn::FixedTag<u16, 4> d;
  const auto whole = hn::PromoteTo(hn::FixedTag<i32, 4>(), hn::LoadU(d, reinterpret_cast<const u16*>(p)));
  const QuadV channels = hn::PromoteTo(Quad(), whole);
  return weighted(channels, hn::Set(Quad(), hn::GetLane(channels) * 0x1p-15));
}
HWY_INLINE QuadV premultiplied(const ZR_PixelFloat* p, const Parts&) {
  const hn::FixedTag<f32, 4> d;
  const QuadV channels = hn::PromoteTo(Quad(), hn::LoadU(d, reinterpret_cast<const f32*>(p)));
  const QuadV alpha = hn::Set(Quad(), hn::GetLane(channels));
  return hn::IfThenZeroElse(hn::Eq(alpha, hn::Zero(Quad())), weighted(channels, alpha));
}

HWY_INLINE void put(QuadV v, ZR_PixelDouble* out) { hn::StoreU(v, Quad(), reinterpret_cast<f64*>(out)); }
HWY_INLINE void put(QuadV v, ZR_PixelFloat* out) {
  const hn::FixedTag<f32, 4> d;
  hn::StoreU(hn::DemoteTo(d, v), d, reinterpret_cast<f32*>(out));
}

// Sums of whole numbers are the same in any order. The bits of 2^52 and a sum, as a double, are those of 2^52 plus
// the bits of the sum, as a whole number; one rounding takes 2^52 away again and multiplies.
constexpr f64 whole_base = 0x1p52;

// What sums of a few columns of four rows are multiplied by, in a ring: those of four columns are divided while columns
// before them are summed, as divisions take long but keep little else from running.
class Inverses {
 public:
  static constexpr i32 together = 4;

  HWY_INLINE Inverses(i32 y, i32 first_column)
      : below_(hn::Add(hn::Iota(Quad(), 1.0), hn::Set(Quad(), static_cast<f64>(y)))),
        column_(hn::Set(Quad(), first_column + 1.0)) {
    for (i32 x = 0; x < ahead; x += together) divide(x);
  }
  // Those of column x of these, a multiple of four, to x + 3: four numbers a column, and behind `bases` whole_base
  // times them.
  HWY_INLINE const f64* next(i32 x) {
    divide((x + ahead) % size);
    return numbers_ + x % size * 4;
  }
  static constexpr i32 bases = 64;

 private:
  static constexpr i32 ahead = 8, size = 2 * ahead;

  HWY_INLINE void divide(i32 place) {
    const Quad d;
    for (i32 k = 0; k < together; ++k, column_ = hn::Add(column_, hn::Set(d, 1.0))) {
      const QuadV inverse = hn::Div(hn::Set(d, 1.0), hn::Mul(below_, column_));
      f64* const at = numbers_ + (place + k) * 4;
      hn::Store(inverse, d, at);
      hn::Store(hn::Mul(inverse, hn::Set(d, whole_base)), d, at + bases);
    }
  }
  static_assert(bases == size * 4);
  alignas(64) f64 numbers_[2 * bases];
  QuadV below_, column_;
};

// Calls sum(x, inverses, whether x is a multiple of four) for every column of a block's row.
template <class Sum>
HWY_INLINE void each_column(const SumBlock& block, i32 y, Sum sum) {
  constexpr i32 together = Inverses::together;
  const i32 first = block.first_column, columns = block.end_column - first;
  Inverses inverses(y, first);
  i32 x = 0;
  for (; columns - x >= together; x += together) {
    const f64* const of = inverses.next(x);
    for (i32 k = 0; k < together; ++k) sum(first + x + k, of + 4 * k, k == 0);
  }
  const f64* of = inverses.next(x);
  for (; x < columns; ++x, of += 4) sum(first + x, of, false);
}

template <class T>
HWY_INLINE const T* row_at(const ZR_World& world, i32 y) {
  return reinterpret_cast<const T*>(static_cast<const char*>(world.data) +
                                    static_cast<std::ptrdiff_t>(y) * world.row_bytes);
}

// `rows` rows at once: the sums of one wait for those of the row above, which the processor works on meanwhile.
template <i32 rows, class T, class Entry>
HWY_INLINE void sum_rows(const ZR_World& world, const SumBlock& block, i32 y, const Parts& parts, f64* above,
                         f64* carried, Entry* table) {
  const Quad d;
  const T* src[rows];
  Entry* out[rows];
  QuadV left[rows], corner[rows];
  for (i32 r = 0; r < rows; ++r) {
    src[r] = row_at<T>(world, y + r);
    out[r] = table + static_cast<std::ptrdiff_t>(y + r) * world.width;
    left[r] = hn::LoadU(d, carried + r * carried_numbers);
    corner[r] = hn::LoadU(d, carried + r * carried_numbers + 4);
  }
  each_column(block, y, [&](i32 x, const f64* inverses, bool) HWY_ATTR {
    f64* const cell = above + static_cast<std::size_t>(x) * 4;
    QuadV upper = hn::LoadU(d, cell);
    for (i32 r = 0; r < rows; ++r) {
      const QuadV sum = hn::Sub(hn::Add(hn::Add(premultiplied(src[r] + x, parts), left[r]), upper), corner[r]);
      corner[r] = upper;
      upper = left[r] = sum;
      put(hn::Mul(hn::Set(d, inverses[r]), sum), out[r] + x);
    }
    hn::StoreU(upper, d, cell);
  });
  for (i32 r = 0; r < rows; ++r) {
    hn::StoreU(left[r], d, carried + r * carried_numbers);
    hn::StoreU(corner[r], d, carried + r * carried_numbers + 4);
  }
}

// Asks for what is written a little later: four streams are more than processors follow. Nothing is touched.
HWY_INLINE void write_ahead(const void* at) {
  hwy::Prefetch(reinterpret_cast<const char*>(reinterpret_cast<std::uintptr_t>(at) + 2048));
}

// Whole numbers below 2^52, to bits of their own and back.
using Whole = hn::Vec<hn::FixedTag<u64, 4>>;
HWY_INLINE Whole whole_of(QuadV v) {
  const hn::FixedTag<u64, 4> d;
  const QuadV base = hn::Set(Quad(), whole_base);
  return hn::Sub(hn::BitCast(d, hn::Add(v, base)), hn::BitCast(d, base));
}
HWY_INLINE QuadV double_of(Whole v) {
  const QuadV base = hn::Set(Quad(), whole_base);
  return hn::Sub(hn::BitCast(Quad(), hn::Add(v, hn::BitCast(hn::FixedTag<u64, 4>(), base))), base);
}

template <class Entry>
HWY_INLINE void sum_opaque_rows(const ZR_World& world, const SumBlock& block, i32 y, f64* above, f64* carried,
                                Entry* table) {
  constexpr i32 rows = opaque_rows;
  const Quad d;
  const hn::FixedTag<u64, 4> whole;
  const QuadV base = hn::Set(d, whole_base);
  const ZR_Pixel8* src[rows];
  Entry* out[rows];
  Whole row[rows];
  for (i32 r = 0; r < rows; ++r) {
    src[r] = row_at<ZR_Pixel8>(world, y + r);
    out[r] = table + static_cast<std::ptrdiff_t>(y + r) * world.width;
    const f64* const of = carried + r * carried_numbers;
    row[r] = whole_of(hn::Sub(hn::LoadU(d, of), hn::LoadU(d, of + 4)));
  }
  each_column(block, y, [&](i32 x, const f64* inverses, bool begins_line) HWY_ATTR {
    f64* const cell = above + static_cast<std::size_t>(x) * 4;
    auto sum = hn::BitCast(whole, hn::Add(hn::LoadU(d, cell), base));
    for (i32 r = 0; r < rows; ++r) {
      i32 word;
      std::memcpy(&word, src[r] + x, sizeof word);
      row[r] = hn::Add(row[r], Whole{_mm256_cvtepu8_epi64(_mm_cvtsi32_si128(word))});
      sum = hn::Add(sum, row[r]);
      put(hn::MulSub(hn::BitCast(d, sum), hn::Set(d, inverses[r]), hn::Set(d, inverses[r + Inverses::bases])),
          out[r] + x);
      if (begins_line) write_ahead(out[r] + x);
    }
    hn::StoreU(hn::Sub(hn::BitCast(d, sum), base), d, cell);
  });
  QuadV left = hn::LoadU(d, above + static_cast<std::size_t>(block.end_column - 1) * 4);
  for (i32 r = rows; r-- > 0;) {
    f64* const of = carried + r * carried_numbers;
    hn::StoreU(left, d, of);
    left = hn::Sub(left, double_of(row[r]));
    hn::StoreU(left, d, of + 4);
  }
}

HWY_INLINE bool is_opaque(const ZR_Pixel8* row, i32 n) {
  constexpr i32 lanes = lane_count();
  const Tag<i32> d;
  const i32* const words = reinterpret_cast<const i32*>(row);
  i32 every = -1, i = 0;
  if (n >= lanes) {
    Ints all_of = -1;
    for (; n - i >= lanes; i += lanes) all_of = hn::And(all_of.v, hn::LoadU(d, words + i));
    if (!all(masked(all_of, 255) == 255)) return false;
  }
  for (; i < n; ++i) every &= row[i].alpha;
  return (every & 255) == 255;
}

template <class T, class Entry>
void sum_block(const ZR_World& world, const SumBlock& block, f64* above, f64* carried, Entry* table) {
  constexpr i32 rows = opaque_rows;
  const Parts& parts = parts_of_alphas();
  carried += block.first_row * carried_numbers;
  i32 y = block.first_row;
  for (; block.end_row - y >= rows; y += rows, carried += rows * carried_numbers) {
    if constexpr (sizeof(T) == 4) {
      // Sums are whole numbers as far as all above and to the left are opaque.
      f64& left_has_fractions = carried[carried_numbers - 1];
      bool is_whole = !*block.has_fractions && left_has_fractions == 0;
      for (i32 r = 0; r < rows && is_whole; ++r)
        is_whole = is_opaque(row_at<T>(world, y + r) + block.first_column, block.end_column - block.first_column);
      if (is_whole) {
        sum_opaque_rows(world, block, y, above, carried, table);
        continue;
      }
      *block.has_fractions = true;
      left_has_fractions = 1;
    }
    sum_rows<rows, T>(world, block, y, parts, above, carried, table);
  }
  for (; y < block.end_row; ++y, carried += carried_numbers)
    sum_rows<1, T>(world, block, y, parts, above, carried, table);
}
#endif

template <class T, class Entry>
SumBlockFunc<Entry>* block_sums() {
#if ZR_SUMS_ON_LANES
  return &sum_block<T, Entry>;
#else
  return nullptr;
#endif
}

#define ZR_INSTANTIATE(T)                                               \
  template SumBlockFunc<ZR_PixelFloat>* block_sums<T, ZR_PixelFloat>(); \
  template SumBlockFunc<ZR_PixelDouble>* block_sums<T, ZR_PixelDouble>();
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif
#undef ZR_SUMS_ON_LANES

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class T, class Entry>
SumBlockFunc<Entry>* lane_block_sums() {
  ZR_RETURN_BEST(block_sums<T, Entry>());
  return nullptr;
}

#define ZR_INSTANTIATE(T)                                                    \
  template SumBlockFunc<ZR_PixelFloat>* lane_block_sums<T, ZR_PixelFloat>(); \
  template SumBlockFunc<ZR_PixelDouble>* lane_block_sums<T, ZR_PixelDouble>();
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace zr
#endif
