// Reduced copies on lanes: sums of boxes are taken down the columns first, each pixel weighted by its alpha once and
// shared by the two boxes that it may lie in, and then across. Sums come out rounded otherwise than the sampler's;
// where that may tell, single pixels are left to it.
#include "sample/ZR_AreaSample_StraightT.h"
#include "sample/lane_copies.h"
#include "sample/sample_functions.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_box_copy.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "sample/lane_copies-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

HWY_INLINE Floats load_numbers(const f32* from) { return hn::LoadU(Tag<f32>(), from); }
HWY_INLINE Doubles load_numbers(const f64* from) {
  const Tag<f64> d;
  return {hn::LoadU(d, from), hn::LoadU(d, from + lane_count() / 2)};
}
HWY_INLINE void store_numbers(Floats v, f32* to) { hn::StoreU(v.v, Tag<f32>(), to); }
HWY_INLINE void store_numbers(Doubles v, f64* to) {
  const Tag<f64> d;
  hn::StoreU(v.low, d, to);
  hn::StoreU(v.high, d, to + lane_count() / 2);
}
// The first of four numbers in the place of all four.
HWY_INLINE Floats first_of_four(Floats v) { return hn::Broadcast<0>(v.v); }
HWY_INLINE Doubles first_of_four(Doubles v) {
  if constexpr (lane_count() == 4) {
    const auto first = hn::Broadcast<0>(v.low);
    return {first, first};
  } else {
    const Tag<f64> d;
    const hn::Rebind<i64, Tag<f64>> words;
    const auto indices = hn::IndicesFromVec(d, hn::And(hn::Iota(words, 0), hn::Set(words, ~i64{3})));
    return {hn::TableLookupLanes(v.low, indices), hn::TableLookupLanes(v.high, indices)};
  }
}

// As many channels as there are lanes, side by side as pixels hold them.
template <class T>
HWY_INLINE Ints load_channels(const T* from) {
  const hn::Rebind<Channel<T>, Tag<i32>> d;
  return hn::PromoteTo(Tag<i32>(), hn::LoadU(d, reinterpret_cast<const Channel<T>*>(from)));
}
// The same as the sums take them: alpha, and colours times alpha.
template <class T, bool weighted>
HWY_INLINE Ints load_weighted(const T* from) {
  const Ints v = load_channels(from);
  if constexpr (!weighted) return v;
  alignas(16) static constexpr i32 colours[4] = {0, -1, -1, -1}, one[4] = {1, 0, 0, 0};
  const Tag<i32> d;
  const Ints alpha = hn::Broadcast<0>(v.v);
  const Ints factor = (alpha & hn::LoadDup128(d, colours)) | hn::LoadDup128(d, one);
  if constexpr (std::is_same_v<T, ZR_Pixel8>) {  // fits 16 bits
    const hn::Repartition<u16, Tag<i32>> narrow;
    return hn::BitCast(d, hn::Mul(hn::BitCast(narrow, v.v), hn::BitCast(narrow, factor.v)));
  } else {
    return v * factor;
  }
}

// The rows of a box: at most two that it covers in part, and those in between.
struct BoxRows {
  i32 top = -1, bottom = -1, first = 0, end = 0;  // none: -1
  u32 top_height = 0, bottom_height = 0;
  i32 height = 0;

  BoxRows() = default;
  BoxRows(i32 y, i32 radius, i32 rows) {
    BoxAxis down(y, radius);
    down.clip(rows);
    if (down.empty()) return;
    height = down.length();
    const i32 above = down.from >> 16;
    const bool starts_inside = (down.from & 0xffff) != 0;
    down.walk(
        [&](i32 row, u32 extent) {
          if (starts_inside && row == above)
            top = row, top_height = extent;
          else
            bottom = row, bottom_height = extent;
        },
        [&](i32 begin, i32 behind) { first = begin, end = behind; });
  }
};

// Boxes up to so many pixels high and wide.
inline constexpr i32 most_box = 15, most_taps = most_box + 2;
// Columns of the source whose sums are held, pixels whose columns are, and how many those columns may be.
inline constexpr i32 box_columns = 256, box_pixels = 1024, most_located = 4096;

template <class T>
class BoxCopy {
  using Real = RealOf<T>;
  using Number = std::conditional_t<std::is_same_v<T, ZR_Pixel16>, f64, f32>;
  static constexpr i32 pixels = lane_count() / 4;  // of a vector
  static constexpr i32 together = 8;               // rows that are written before the pixels to the right

 public:
  HWY_INLINE BoxCopy(const CopyPart<T>& part, const ZR_SampPB& params)
      : part_(part), params_(params), taps_(((2 * params.x_radius) >> 16) + 2) {
    // 8 bits: with u = 2^-24 columns are off by 5u, sums by one more for each of them and one, and both sums and the
    // quotient by 4u; halves are added with less than 400u. 16 bits, in double precision, are off by less than 2^-24.
    doubt_ = static_cast<f32>((2 * (taps_ + 6) + 4) * 255 + 400) * 0x1p-24f;
  }

  static bool suits(const CopyPart<T>& part, const ZR_SampPB& params) {
    constexpr i32 most = most_box << 16;
    // Halves have rows of their own, which share nothing.
    const bool halves =
        part.step_x == 0x20000 && part.step_y == 0x20000 && ((part.x & part.y) & 0xffff) == half_a_pixel;
    return !halves && part.columns >= pixels && params.x_radius <= most / 2 && params.y_radius <= most / 2 &&
           part.step_x <= most && part.step_x > 0x10000;
  }
  // False where the source's channels are not legal, or where there are too few columns.
  HWY_INLINE bool write() {
    // Columns are located for many pixels; of those a few rows at a time are written, from left to right.
    const i32 located = std::min(most_located / taps_, box_pixels),
              stretch = ((box_columns - taps_ - lane_count()) << 16) / part_.step_x / pixels * pixels;
    for (i32 at = 0; at < part_.columns; at += located) {
      const i32 first = std::max(std::min(at, part_.columns - located), 0),
                end = std::min(first + located, part_.columns);
      locate(first, end);
      for (i32 j = 0; j < part_.rows; j += together)
        for (i32 i = 0; i < end - first; i += stretch) {
          // From a whole vector on; one that would be short overlaps the one before.
          const i32 begin = std::min(i, (end - first) / pixels * pixels - pixels);
          if (!write_block(first, begin, std::min(stretch, end - first - begin), j, std::min(j + together, part_.rows)))
            return false;
        }
    }
    return true;
  }

 private:
  // Where the boxes of pixels begin, and how much of each column they cover.
  void locate(i32 first, i32 end) {
    const i32 length = 2 * params_.x_radius;
    i32 x = part_.x + first * part_.step_x - params_.x_radius + half_a_pixel;
    for (i32 i = 0; i < end - first; ++i, x += part_.step_x) {
      const i32 column = x >> 16, last = (x + length) >> 16, behind = (x + length) & 0xffff;
      starts_[i] = column;
      for (i32 k = 0; k < taps_; ++k) {
        const i32 covered = k == 0               ? 0x10000 - (x & 0xffff)
                            : column + k < last  ? 0x10000
                            : column + k == last ? behind
                                                 : 0;
        std::fill_n(weights_ + place_of(i, k), weight_copies, static_cast<Number>(covered) * Number{0x1p-16f});
      }
    }
    for (i32 i = end - first; i % pixels != 0; ++i) {  // to a whole vector
      starts_[i] = starts_[i - 1];
      for (i32 k = 0; k < taps_; ++k) std::fill_n(weights_ + place_of(i, k), weight_copies, Number{0});
    }
  }
  // Weights for a vector of pixels lie side by side, one for each of their channels, where such a vector is one read.
  static constexpr bool vectors_across = std::is_same_v<Real, Floats>;
  static constexpr i32 weight_copies = vectors_across ? 4 : 1;
  i32 place_of(i32 i, i32 tap) const {
    return vectors_across ? ((i / pixels * taps_ + tap) * pixels + i % pixels) * 4 : i * taps_ + tap;
  }

  HWY_INLINE bool write_block(i32 located, i32 i, i32 count, i32 j, i32 end) {
    first_ = located + i, count_ = count;
    starts_at_ = starts_ + i, weights_at_ = weights_ + i * taps_ * weight_copies;
    // Whole vectors of columns, further to the left where the source ends. Those behind are weighted by nothing, but
    // read.
    const i32 width = params_.src->width, last = starts_at_[count - 1];
    const i32 behind = std::min(last + taps_, width);
    columns_ = (behind - starts_at_[0] + lane_count() - 1) / lane_count() * lane_count();
    if (columns_ > width) return false;
    left_ = std::min(starts_at_[0], width - columns_);
    std::fill_n(sums_ + 4 * columns_, 4 * taps_, Number{0});
    carried_ = -1;
    const Alphas alphas = look_at(j, end);
    if (alphas == Alphas::illegal) return false;
    if (alphas == Alphas::clear)
      for (i32 k = j; k < end; ++k) std::fill_n(part_.row(k) + first_, count, T{});
    else
      alphas == Alphas::white ? write_rows<false>(j, end) : write_rows<true>(j, end);
    return true;
  }

  const T* row_at(i32 y) const { return pixel_at<T>(*params_.src, left_, y); }

  HWY_INLINE Alphas look_at(i32 j, i32 end) const {
    const i32 rows = params_.src->height;
    const BoxRows above(part_.y + j * part_.step_y, params_.y_radius, rows);
    const BoxRows below(part_.y + (end - 1) * part_.step_y, params_.y_radius, rows);
    const i32 first = above.top >= 0 ? above.top : above.first, last = below.bottom >= 0 ? below.bottom + 1 : below.end;
    if (std::is_same_v<T, ZR_Pixel16>)
      for (i32 y = first; y < last; ++y)
        if (!legal_channels(row_at(y))) return Alphas::illegal;
    if (first >= last) return Alphas::any;
    const Alphas all = alphas_of(row_at(first), columns_);
    for (i32 y = first + 1; y < last && all != Alphas::any; ++y)
      if (alphas_of(row_at(y), columns_) != all) return Alphas::any;
    return all;
  }
  HWY_INLINE bool legal_channels(const T* row) const {
    const Tag<u16> d;
    auto most = hn::Zero(d), other = most;
    for (i32 i = 0; i < columns_; i += lane_count()) {  // two vectors
      const auto* const from = reinterpret_cast<const u16*>(row + i);
      most = hn::Max(most, hn::LoadU(d, from)), other = hn::Max(other, hn::LoadU(d, from + 2 * lane_count()));
    }
    return hn::AllFalse(d, hn::Gt(hn::Max(most, other), hn::Set(d, u16{32768})));
  }

  template <bool weighted>
  HWY_INLINE void write_rows(i32 j, i32 end) {
    const auto box = [&](i32 k) { return BoxRows(part_.y + k * part_.step_y, params_.y_radius, params_.src->height); };
    BoxRows rows = box(j);
    for (; j < end; ++j) {
      const BoxRows next = j + 1 < end ? box(j + 1) : BoxRows();
      const bool leaves = rows.bottom >= 0 && rows.bottom == next.top;
      if (rows.top < 0 || carried_ != rows.top) take_top<weighted>(rows);
      carried_ = leaves ? rows.bottom : -1;
      const i32 whole = rows.end - rows.first;
      const u32 left = leaves ? next.top_height : 0;
      whole == 1   ? sum_columns<weighted, 1>(rows, left)
      : whole == 2 ? sum_columns<weighted, 2>(rows, left)
                   : sum_columns<weighted, 0>(rows, left);
      sum_boxes();
      write_means<weighted>(j, rows.height);
      rows = next;
    }
  }

  static HWY_INLINE Real height(u32 of_65536) { return Real(static_cast<Number>(of_65536) * Number{0x1p-16f}); }

  // The top row's part of a box, where the row before has not left it.
  template <bool weighted>
  HWY_INLINE void take_top(const BoxRows& rows) {
    if (rows.top < 0) return static_cast<void>(std::fill_n(carry_, 4 * columns_, Number{0}));
    const T* const top = row_at(rows.top);
    for (i32 at = 0; at < columns_; at += pixels)
      store_numbers(to_real<Real>(load_weighted<T, weighted>(top + at)) * height(rows.top_height), carry_ + 4 * at);
  }
  // Down the columns: whole rows as integers, `known` of them where that is not 0. What lies in carry_ is taken, and
  // what the bottom row is to the box below is left there.
  template <bool weighted, i32 known>
  HWY_INLINE void sum_columns(const BoxRows& rows, u32 left_height) {
    constexpr i32 vectors = 2, step = vectors * pixels;
    const i32 columns = columns_, whole_rows = known != 0 ? known : rows.end - rows.first;
    const T *const whole = row_at(rows.first), *const bottom = rows.bottom >= 0 ? row_at(rows.bottom) : row_at(0);
    const Real bottom_height = height(rows.bottom_height), next_height = height(left_height);
    Number *const carry = carry_, *const sums = sums_;
    const std::ptrdiff_t row_bytes = params_.src->row_bytes;
    // The same columns are wanted again when all the pixels to the right are done.
    const i32 next = (together * part_.step_y) >> 16;
    const std::ptrdiff_t ahead =
        std::max(rows.end, rows.bottom + 1) + next <= params_.src->height ? next * row_bytes : 0;
    for (i32 at = 0; at < columns; at += step) {
      const char* fetched = reinterpret_cast<const char*>(whole + at) + ahead;
      for (i32 y = 0; y <= whole_rows; ++y, fetched += row_bytes) __builtin_prefetch(fetched, 0, 2);
      for (i32 i = 0; i < vectors; ++i) {
        const i32 place = at + i * pixels;
        Real sum = load_numbers(carry + 4 * place);
        const char* row = reinterpret_cast<const char*>(whole + place);
        Ints integers(0);
        for (i32 y = 0; y < whole_rows; ++y, row += row_bytes) {
          const Ints v = load_weighted<T, weighted>(reinterpret_cast<const T*>(row));
          if constexpr (weighted && std::is_same_v<T, ZR_Pixel16>)  // more than one fits no integer
            sum = sum + to_real<Real>(v);
          else
            integers = y == 0 ? v : integers + v;
        }
        if constexpr (!weighted || std::is_same_v<T, ZR_Pixel8>) sum = sum + to_real<Real>(integers);
        const Real v = to_real<Real>(load_weighted<T, weighted>(bottom + place));
        store_numbers(mul_add(v, bottom_height, sum), sums + 4 * place);
        store_numbers(v * next_height, carry + 4 * place);
      }
    }
  }

  // Across, into totals_.
  HWY_INLINE void sum_boxes() {
    if (taps_ == 3) return sum_boxes_of<3>();
    if (taps_ == 4) return sum_boxes_of<4>();
    sum_boxes_of<0>();
  }
  template <i32 known>
  HWY_INLINE void sum_boxes_of() {
    const i32 taps = known != 0 ? known : taps_, count = count_, left = left_;
    const Number* w = weights_at_;
    const i32* const starts = starts_at_;
    const Number* const sums = sums_;
    Number* to = totals_;
    if constexpr (vectors_across) {
      const Tag<i32> d;
      for (i32 i = 0; i < count; i += pixels, w += 4 * pixels * taps, to += 4 * pixels) {
        i64 offsets[pixels];
        for (i32 k = 0; k < pixels; ++k) offsets[k] = i64{starts[i + k] - left} * 16;
        const auto column = [&](i32 k) HWY_ATTR {
          return as_floats(load_pixels(d, reinterpret_cast<const char*>(sums + 4 * k), offsets));
        };
        Floats sum = column(0) * load_numbers(w);
        for (i32 k = 1; k < taps; ++k) sum = mul_add(column(k), load_numbers(w + 4 * pixels * k), sum);
        store_numbers(sum, to);
      }
    } else {
      const hn::CappedTag<Number, 4> d;
      constexpr i32 lanes = static_cast<i32>(hn::MaxLanes(d));
      for (i32 i = 0; i < count; ++i, w += taps, to += 4)
        for (i32 c = 0; c < 4; c += lanes) {
          const Number* const from = sums + 4 * (starts[i] - left) + c;
          auto sum = hn::Mul(hn::LoadU(d, from), hn::Set(d, w[0]));
          for (i32 k = 1; k < taps; ++k) sum = hn::MulAdd(hn::LoadU(d, from + 4 * k), hn::Set(d, w[k]), sum);
          hn::StoreU(sum, d, to + c);
        }
    }
  }

  template <bool weighted>
  HWY_INLINE void write_means(i32 j, i32 height) {
    T* const dst = part_.row(j) + first_;
    const f64 width = params_.x_radius * 0x1p-15, area = width * (params_.y_radius * 0x1p-15);
    const f64 covered = width * (height * 0x1p-16);
    Number first[lane_count()], others[lane_count()];
    for (i32 i = 0; i < lane_count(); ++i) {
      const bool is_alpha = i % 4 == 0;
      // What sums are divided by is linear in the sum of alphas; opaque ones are known.
      first[i] = static_cast<Number>(weighted ? (is_alpha ? area : 0) : 1 / (is_alpha || height == 0 ? area : covered));
      others[i] = is_alpha ? Number{0} : Number{1};
    }
    const Real known = load_numbers(first), of_alpha = load_numbers(others);
    for (i32 at = 0;; at = std::min(at + pixels, count_ - pixels)) {
      const Real sums = load_numbers(totals_ + 4 * at);
      Real inverse = known;
      if constexpr (weighted)
        inverse = inverse_of(at_least(mul_add(first_of_four(sums), of_alpha, known), Number{0x1p-40f}));
      Rounding<T> rounding;
      store_channels(rounding.nearest(sums, inverse, doubt_), dst + at);
      if (!rounding.all_sure()) sample(rounding.unsure(), at, j);
      if (at + pixels == count_) break;
    }
  }
  void sample(Bools<i32> unsure, i32 at, i32 j) const {
    i32 channels[lane_count()];
    hn::StoreU(hn::VecFromMask(Tag<i32>(), unsure.mask), Tag<i32>(), channels);
    for (i32 i = 0; i < lane_count(); i += 4)
      if ((channels[i] | channels[i + 1] | channels[i + 2] | channels[i + 3]) != 0) {
        const i32 column = first_ + at + i / 4;
        area_sample<T, 1>(nullptr, part_.x + column * part_.step_x, part_.y + j * part_.step_y, &params_,
                          part_.row(j) + column);
      }
  }

  const CopyPart<T>& part_;
  const ZR_SampPB& params_;
  const i32 taps_;
  f32 doubt_;
  // The pixels that are worked on, and the columns of the source whose sums they take.
  i32 first_ = 0, count_ = 0, left_ = 0, columns_ = 0;
  const i32* starts_at_ = nullptr;
  const Number* weights_at_ = nullptr;
  i32 carried_ = -1;  // what carry_ holds is of this row of the source
  i32 starts_[box_pixels + pixels];
  alignas(64) Number weights_[(most_located + pixels * most_taps) * weight_copies];
  alignas(64) Number carry_[4 * box_columns], sums_[4 * (box_columns + most_taps)], totals_[4 * (box_columns + pixels)];
};

template <class T>
bool box_copy(const CopyPart<T>& part, const ZR_SampPB& params) {
  if (!BoxCopy<T>::suits(part, params)) return false;
  BoxCopy<T> copy(part, params);
  return copy.write();
}

template <class T>
LaneCopyFunc<T>* box_copier() {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return nullptr;
  else
    return &box_copy<T>;
}
ZR_ROWS_OF_DEPTHS(LaneCopyFunc, box_copier)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(LaneCopyFunc, box_copier)
#endif
