// Enlarged copies on lanes: each row of the source is interpolated along once for all the rows of the destination that
// show it. That is another order of roundings than the sampler's, so a bound of what both may be off tells where the
// rounded result is the same; the few other vectors are left to the sampler's own rows.
#include "sample/lane_copies.h"

#include <bit>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_bilinear_copy.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "sample/lane_copies-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// What the sampler's result and ours may be off together, in steps of a channel.
//
// 8 bits, with u = 2^-24: the sampler's four weights are off by 5.5u together and its products and sums by 3u; ours by
// 5u. With the sums of halves that is less than 4000u. A quotient is off by 5.5u * 255^2 / S for the weights under an
// alpha of S, and by 24u of itself for both; with the sums of halves less than 6500u and 0.022 / S.
// 16 bits, in double precision: sums of opaque pixels are exact, and quotients off by less than 2^-30.
template <class T>
struct Doubt {
  static constexpr f32 of_sums = 0x1p-12f, of_quotients = 0x1.cp-12f, over_alpha = 0.022f;
};
template <>
struct Doubt<ZR_Pixel16> {
  static constexpr f32 of_sums = 0x1p-24f;
};

// Vectors of the destination that are worked on together: two rows of numbers stay in the first cache.
inline constexpr i32 stretch = 16;

// A row of the source as it is between its pixels, at the columns of a stretch.
template <class T>
struct BetweenPixels {
  enum Holds { nothing, colours, weighted };  // plain colours; or alpha, and colours times alpha
  i32 y = -1;
  Alphas alphas;
  Holds holds;
  RealOf<T> channel[4][stretch];
};

template <class T, class Neighbours>
class BetweenRows {
  using Real = RealOf<T>;
  using Row = BetweenPixels<T>;

 public:
  HWY_INLINE BetweenRows(const CopyPart<T>& part, const ZR_SampPB& params, LaneRowFunc<T>* sampler)
      : part_(part), params_(params), sampler_(sampler) {
    const i32 positions = part.x | part.step_x | part.y | part.step_y;
    // With a few bits of fraction neither side rounds.
    if (std::is_same_v<T, ZR_Pixel8> && (positions & 255) == 0) doubt_of_sums_ = 0.0f;
  }

  // All rows of the vectors from column `first` on.
  HWY_INLINE void write(i32 first, i32 vectors) {
    rows_[0].y = rows_[1].y = -1;
    const Ints place = hn::Iota(Tag<i32>(), 0);
    for (i32 i = 0; i < vectors; ++i) {
      const Ints x = Ints(part_.x + (first + i * lane_count()) * part_.step_x) + place * part_.step_x;
      right_[i] = to_real<Real>(masked(x, 65535)) * Real(0x1p-16f);
    }
    for (i32 j = 0; j < part_.rows; ++j) {
      const i32 y = part_.y + j * part_.step_y, above = y >> 16;
      Row &upper = rows_[above & 1], &lower = rows_[(above + 1) & 1];
      look_at(first, vectors, above, &upper);
      look_at(first, vectors, above + 1, &lower);
      T* const dst = part_.row(j) + first;
      if (upper.alphas == Alphas::clear && lower.alphas == Alphas::clear) {
        write_clear(first, vectors, j, dst);
        continue;
      }
      u32 unsure = 0;
      const Real below(static_cast<f32>(y & 65535) * 0x1p-16f), beside = Real(1.0f) - below;
      if (upper.alphas == Alphas::white && lower.alphas == Alphas::white) {
        fill<Row::colours>(first, vectors, &upper);
        fill<Row::colours>(first, vectors, &lower);
        for (i32 i = 0; i < vectors; ++i)
          unsure |= u32{!write_opaque(i, upper, lower, beside, below, dst + i * lane_count())} << i;
      } else {
        fill<Row::weighted>(first, vectors, &upper);
        fill<Row::weighted>(first, vectors, &lower);
        for (i32 i = 0; i < vectors; ++i)
          unsure |= u32{!write_any(i, upper, lower, beside, below, dst + i * lane_count())} << i;
      }
      left_[left_rows_] = {j, unsure};
      left_rows_ += unsure != 0 ? 1 : 0;
      if (left_rows_ == most_left) sample_left(first);
    }
    sample_left(first);
  }
  // The columns before those whose rows all begin on a cache line, and go past the caches; 0 where none do.
  i32 columns_before_streams() {
    constexpr std::uintptr_t line = 64;
    const std::uintptr_t ahead = (0 - reinterpret_cast<std::uintptr_t>(part_.dst)) % line;
    streams_ = part_.past_caches && part_.dst_row_bytes % std::ptrdiff_t{line} == 0 && ahead % sizeof(T) == 0;
    return streams_ ? static_cast<i32>(ahead / sizeof(T)) : 0;
  }
  // A vector that shares columns with others.
  HWY_INLINE void write_at_end(i32 first) {
    streams_ = false;
    write(first, 1);
  }

 private:
  HWY_INLINE void write_pixels(const Raw<T>& p, T* dst) const {
    if (!streams_) return store(p, dst);
    const Tag<i32> d;
    alignas(64) T pixels[lane_count()];
    store(p, pixels);
    for (i32 i = 0; i < Raw<T>::words * lane_count(); i += lane_count())
      hn::Stream(hn::Load(d, reinterpret_cast<const i32*>(pixels) + i), d, reinterpret_cast<i32*>(dst) + i);
  }
  // Vectors that are left to the sampler wait for each other: a branch at each of them is foretold wrongly.
  HWY_INLINE void sample_left(i32 first) {
    for (i32 k = 0; k < left_rows_; ++k)
      for (u32 vectors = left_[k].vectors; vectors != 0; vectors &= vectors - 1)
        sample(first + std::countr_zero(vectors) * lane_count(), left_[k].row);
    left_rows_ = 0;
  }
  HWY_INLINE SampleRun run_at(i32 first, i32 vectors, i32 y) const {
    return {vectors * lane_count(), part_.x + first * part_.step_x, y << 16, part_.step_x, 0};
  }
  HWY_INLINE void look_at(i32 first, i32 vectors, i32 y, Row* row) const {
    if (row->y == y) return;
    const SampleRun run = run_at(first, vectors, y);
    const i32 left = run.x >> 16, pixels = ((run.x + (run.count - 1) * run.step_x) >> 16) + 2 - left;
    const ZR_LayerDef& src = *params_.src;
    const T* const line =
        reinterpret_cast<const T*>(static_cast<const char*>(src.data) + static_cast<std::ptrdiff_t>(y) * src.row_bytes);
    row->y = y;
    row->holds = Row::nothing;
    row->alphas = pixels < lane_count() ? Alphas::any : alphas_of(line + left, pixels);
    const std::ptrdiff_t two_rows = 2 * static_cast<std::ptrdiff_t>(src.row_bytes);
    if (y + 2 < src.height) fetch_ahead(reinterpret_cast<const char*>(line + left) + two_rows, pixels * i32{sizeof(T)});
  }
  template <typename Row::Holds wanted>
  HWY_INLINE void fill(i32 first, i32 vectors, Row* row) const {
    if (row->holds == wanted) return;
    row->holds = wanted;
    Neighbours at(run_at(first, vectors, row->y), *params_.src);
    for (i32 i = 0; i < vectors; ++i) {
      if (i != 0) at.next();
      Raw<T> p[2];
      at.row(0, 0, p);
      Real right = right_[i], left = Real(1.0f) - right;
      if constexpr (wanted == Row::weighted) {
        left = left * real_channel_of<Real, 0>(p[0]);
        right = right * real_channel_of<Real, 0>(p[1]);
        row->channel[0][i] = left + right;
      }
      const auto colour = [&](auto k) HWY_ATTR {
        constexpr int c = decltype(k)::value;
        row->channel[c][i] = mul_add(left, real_channel_of<Real, c>(p[0]), right * real_channel_of<Real, c>(p[1]));
      };
      colour(std::integral_constant<int, 1>());
      colour(std::integral_constant<int, 2>());
      colour(std::integral_constant<int, 3>());
    }
  }
  // A vector by the sampler's own row.
  HWY_INLINE void sample(i32 first, i32 j) const {
    RowSum<T> alphas{};
    sampler_(part_.run(first, lane_count(), j), params_, &alphas, part_.row(j) + first);
  }

  // Four equal neighbours are copied whatever they hold.
  HWY_INLINE void write_clear(i32 first, i32 vectors, i32 j, T* dst) const {
    Neighbours at(part_.run(first, vectors * lane_count(), j), *params_.src);
    for (i32 i = 0; i < vectors; ++i) {
      if (i != 0) at.next();
      Raw<T> upper[2], lower[2];
      at.row(0, 0, upper);
      at.row(0, 1, lower);
      Ints differences(0);
      for (i32 k = 0; k < Raw<T>::words; ++k) {
        const Ints w = upper[0].w[k];
        differences = differences | ((w ^ upper[1].w[k]) | (w ^ lower[0].w[k]) | (w ^ lower[1].w[k]));
      }
      write_pixels(pick(differences == 0, upper[0], Raw<T>{}), dst + i * lane_count());
    }
  }
  HWY_INLINE bool write_opaque(i32 i, const Row& upper, const Row& lower, Real beside, Real below, T* dst) const {
    Rounding<T> rounding;
    const auto colour = [&](i32 c) HWY_ATTR {
      const Real v = mul_add(upper.channel[c][i], beside, lower.channel[c][i] * below);
      if constexpr (std::is_same_v<T, ZR_Pixel16>)
        return rounding.half_up(v);
      else
        return rounding.nearest(v, 1.0f, doubt_of_sums_);
    };
    write_pixels(packed<T>(i32{Depth<T>::white}, colour(1), colour(2), colour(3)), dst);
    return none(rounding.unsure());
  }
  HWY_INLINE bool write_any(i32 i, const Row& upper, const Row& lower, Real beside, Real below, T* dst) const {
    const auto between = [&](i32 c)
                             HWY_ATTR { return mul_add(upper.channel[c][i], beside, lower.channel[c][i] * below); };
    const Real alpha = between(0), inverse = inverse_of(alpha);
    // Nothing is known of colours where there is next to no alpha.
    if constexpr (std::is_same_v<T, ZR_Pixel8>) {
      const FixedRounding rounding(mul_add(inverse, Doubt<T>::over_alpha, Doubt<T>::of_quotients));
      const Floats by = inverse * 65536.0f;
      const FixedPixels p = {rounding.nearest(alpha, 65536.0f), rounding.nearest(between(1), by),
                             rounding.nearest(between(2), by), rounding.nearest(between(3), by)};
      write_pixels(p.whole(), dst);
      return none(rounding.unsure(p) || p.alpha < 65536);
    } else {
      DoubleRounding rounding;
      const auto colour = [&](i32 c) HWY_ATTR { return rounding.nearest(between(c), inverse, 0.0); };
      const Ints whole = rounding.nearest(alpha, 1.0, 0.0);
      write_pixels(packed<T>(whole, colour(1), colour(2), colour(3)), dst);
      return none(rounding.unsure() || whole == 0);
    }
  }

  const CopyPart<T>& part_;
  const ZR_SampPB& params_;
  LaneRowFunc<T>* sampler_;
  bool streams_ = false;
  f32 doubt_of_sums_ = Doubt<T>::of_sums;
  struct Left {
    i32 row;
    u32 vectors;  // a bit for each of them
  };
  static constexpr i32 most_left = 64;
  static_assert(stretch <= 32);
  Left left_[most_left];
  i32 left_rows_ = 0;
  Real right_[stretch];  // the right neighbour's weight
  Row rows_[2];
};

template <class T, class Neighbours>
bool copy_between(const CopyPart<T>& part, const ZR_SampPB& params, LaneRowFunc<T>* sampler) {
  constexpr i32 lanes = lane_count();
  BetweenRows<T, Neighbours> rows(part, params, sampler);
  const i32 before = rows.columns_before_streams(), vectors = (part.columns - before) / lanes;
  for (i32 i = 0; i < vectors; i += stretch) rows.write(before + i * lanes, std::min(stretch, vectors - i));
  hwy::FlushStream();
  for (i32 i = 0; i < before; i += lanes) rows.write_at_end(std::min(i, part.columns - lanes));
  if (before + vectors * lanes != part.columns) rows.write_at_end(part.columns - lanes);
  return true;
}

template <class T>
bool bilinear_copy(const CopyPart<T>& part, const ZR_SampPB& params) {
  const LaneRows<T>* const rows = lane_bilinear_rows<T>();
  const i32 last_row = std::max(part.y, part.y + (part.rows - 1) * part.step_y) >> 16;
  if (part.columns < lane_count() || last_row >= 32767 || rows == nullptr || rows->no_clip == nullptr) return false;
  if (Windowed<T, 2>::suits(part.run(0, part.columns, 0)))
    return copy_between<T, Windowed<T, 2>>(part, params, rows->no_clip);
  return copy_between<T, Scattered<T>>(part, params, rows->no_clip);
}

template <class T>
LaneCopyFunc<T>* bilinear_copier() {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return nullptr;
  else
    return &bilinear_copy<T>;
}
ZR_ROWS_OF_DEPTHS(LaneCopyFunc, bilinear_copier)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(LaneCopyFunc, bilinear_copier)
#endif
