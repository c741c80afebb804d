// What samplers of lanes share: neighbours of a vector of positions, double precision, and the walk along a row.
#if defined(ZR_SAMPLE_LANE_SAMPLES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SAMPLE_LANE_SAMPLES_INL_H
#undef ZR_SAMPLE_LANE_SAMPLES_INL_H
#else
#define ZR_SAMPLE_LANE_SAMPLES_INL_H
#endif

#include "sample/lane_rows.h"
#include "simd/lane_depth-inl.h"
#include "simd/lane_doubles-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// ---------------------------------------------------------------------------- double precision

template <class Real>
HWY_INLINE Real to_real(Ints v) {
  if constexpr (std::is_same_v<Real, Floats>)
    return to_float(v);
  else
    return to_double(v);
}
HWY_INLINE Floats pick_real(Bools<i32> c, Floats a, Floats b) {
  return pick(Bools<f32>{hn::RebindMask(Tag<f32>(), c.mask)}, a, b);
}
HWY_INLINE Doubles pick_real(Bools<i32> c, Doubles a, Doubles b) {
  const hn::Rebind<i64, Tag<f64>> d;
  const HalfInts half;
  const auto bits = hn::VecFromMask(Tag<i32>(), c.mask);
  const auto mask = [&](auto v) HWY_ATTR { return hn::RebindMask(Tag<f64>(), hn::MaskFromVec(hn::PromoteTo(d, v))); };
  return {hn::IfThenElse(mask(hn::LowerHalf(half, bits)), a.low, b.low),
          hn::IfThenElse(mask(hn::UpperHalf(half, bits)), a.high, b.high)};
}

// ---------------------------------------------------------------------------------- raw pixels

// A vector of pixels as the 32-bit words they are made of.
template <class T>
struct Raw {
  static constexpr i32 words = sizeof(T) / 4;
  Ints w[words];
};
HWY_INLINE Floats as_floats(Ints v) { return hn::BitCast(Tag<f32>(), v.v); }
HWY_INLINE Ints as_ints(Floats v) { return hn::BitCast(Tag<i32>(), v.v); }
HWY_INLINE Ints operator&(Ints a, Ints b) { return hn::And(a.v, b.v); }
HWY_INLINE Ints operator|(Ints a, Ints b) { return hn::Or(a.v, b.v); }
HWY_INLINE Ints operator^(Ints a, Ints b) { return hn::Xor(a.v, b.v); }

template <int bits>
HWY_INLINE Ints shifted_right_unsigned(Ints a) {
  const hn::Rebind<u32, Tag<i32>> d;
  return hn::BitCast(Tag<i32>(), hn::ShiftRight<bits>(hn::BitCast(d, a.v)));
}
// Channel k of integer pixels.
template <int k>
HWY_INLINE Ints channel_of(const Raw<ZR_Pixel8>& p) {
  if constexpr (k == 3)
    return shifted_right_unsigned<24>(p.w[0]);
  else if constexpr (k == 0)
    return masked(p.w[0], 255);
  else
    return masked(shifted_right<8 * k>(p.w[0]), 255);
}
template <int k>
HWY_INLINE Ints channel_of(const Raw<ZR_Pixel16>& p) {
  if constexpr ((k & 1) != 0)
    return shifted_right_unsigned<16>(p.w[k / 2]);
  else
    return masked(p.w[k / 2], 65535);
}
template <class Real, int k, class T>
HWY_INLINE Real real_channel_of(const Raw<T>& p) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return as_floats(p.w[k]);
  else
    return to_real<Real>(channel_of<k>(p));
}
// Channels within their range.
template <class T>
HWY_INLINE Raw<T> packed(Ints alpha, Ints red, Ints green, Ints blue) {
  if constexpr (std::is_same_v<T, ZR_Pixel8>)
    return {{(alpha | shifted_left<8>(red)) | (shifted_left<16>(green) | shifted_left<24>(blue))}};
  else
    return {{alpha | shifted_left<16>(red), green | shifted_left<16>(blue)}};
}
template <class T>
HWY_INLINE Raw<T> pick(Bools<i32> c, const Raw<T>& a, const Raw<T>& b) {
  Raw<T> r;
  for (i32 i = 0; i < Raw<T>::words; ++i) r.w[i] = pick(c, a.w[i], b.w[i]);
  return r;
}

// A vector of pixels that lie side by side.
template <class T>
HWY_INLINE Raw<T> load_pixels(const void* from) {
  const Tag<i32> d;
  const i32* const words = static_cast<const i32*>(from);
  Raw<T> p;
  if constexpr (Raw<T>::words == 1)
    p.w[0] = hn::LoadU(d, words);
  else if constexpr (Raw<T>::words == 2)
    hn::LoadInterleaved2(d, words, p.w[0].v, p.w[1].v);
  else
    hn::LoadInterleaved4(d, words, p.w[0].v, p.w[1].v, p.w[2].v, p.w[3].v);
  return p;
}
HWY_INLINE void store(const Raw<ZR_Pixel8>& p, ZR_Pixel8* dst) {
  hn::StoreU(p.w[0].v, Tag<i32>(), reinterpret_cast<i32*>(dst));
}
HWY_INLINE void store(const Raw<ZR_Pixel16>& p, ZR_Pixel16* dst) {
  hn::StoreInterleaved2(p.w[0].v, p.w[1].v, Tag<i32>(), reinterpret_cast<i32*>(dst));
}
HWY_INLINE void store(const Raw<ZR_PixelFloat>& p, ZR_PixelFloat* dst) {
  hn::StoreInterleaved4(p.w[0].v, p.w[1].v, p.w[2].v, p.w[3].v, Tag<i32>(), reinterpret_cast<i32*>(dst));
}

// ---------------------------------------------------------------------------------- neighbours

// 16 bytes for each lane: block b of the result is that of lane 4 * b.
template <class D>
HWY_INLINE hn::Vec<D> load_blocks(D d, const char* base, const i64* offsets) {
  if constexpr (hn::MaxLanes(D()) == 4) {
    return hn::LoadU(d, reinterpret_cast<const i32*>(base + *offsets));
  } else {
    const hn::Half<D> half;
    return hn::Combine(d, load_blocks(half, base, offsets + hn::MaxLanes(half)), load_blocks(half, base, offsets));
  }
}
// Four vectors of such blocks, those of lanes 4 * b + k in vector k, into one vector for each word.
HWY_INLINE void transpose_blocks(const Ints (&v)[4], Ints (&words)[4]) {
  const Tag<i32> d;
  const auto even_low = hn::InterleaveLower(d, v[0].v, v[2].v), odd_low = hn::InterleaveLower(d, v[1].v, v[3].v);
  const auto even_high = hn::InterleaveUpper(d, v[0].v, v[2].v), odd_high = hn::InterleaveUpper(d, v[1].v, v[3].v);
  words[0] = hn::InterleaveLower(d, even_low, odd_low);
  words[1] = hn::InterleaveUpper(d, even_low, odd_low);
  words[2] = hn::InterleaveLower(d, even_high, odd_high);
  words[3] = hn::InterleaveUpper(d, even_high, odd_high);
}
// The four words of 16 bytes at base + offsets[i] for each lane i.
HWY_INLINE void gather_blocks(const char* base, const i64* offsets, Ints (&words)[4]) {
  Ints v[4];
  for (i32 k = 0; k < 4; ++k) v[k] = load_blocks(Tag<i32>(), base, offsets + k);
  transpose_blocks(v, words);
}
// 16 bytes at base + offsets[b] for each block b.
template <class D>
HWY_INLINE hn::Vec<D> load_pixels(D d, const char* base, const i64* offsets) {
  if constexpr (hn::MaxLanes(D()) == 4) {
    return hn::LoadU(d, reinterpret_cast<const i32*>(base + *offsets));
  } else {
    const hn::Half<D> half;
    return hn::Combine(d, load_pixels(half, base, offsets + hn::MaxLanes(half) / 4), load_pixels(half, base, offsets));
  }
}
// The alphas of four vectors of float pixels as they lie in memory, those of vector k in lane k of each four.
HWY_INLINE Ints alphas_together(const Ints (&v)[4]) {
  const Tag<i32> d;
  const hn::RepartitionToWide<Tag<i32>> pairs;
  const auto low = hn::BitCast(pairs, hn::InterleaveLower(d, v[0].v, v[1].v));
  const auto high = hn::BitCast(pairs, hn::InterleaveLower(d, v[2].v, v[3].v));
  return hn::BitCast(d, hn::InterleaveLower(pairs, low, high));
}

// The two words of 8 bytes at base + offset for each lane; offsets of the lower and the upper half.
template <class Offsets>
HWY_INLINE void gather_pairs(const char* base, Offsets low_offsets, Offsets high_offsets, Ints* first, Ints* second) {
  const hn::Rebind<i64, Tag<f64>> d;
  const Tag<i32> words;
  const i64* const pairs = reinterpret_cast<const i64*>(base);
  const auto low = hn::BitCast(words, hn::GatherOffset(d, pairs, low_offsets));
  const auto high = hn::BitCast(words, hn::GatherOffset(d, pairs, high_offsets));
  *first = hn::ConcatEven(words, high, low);
  *second = hn::ConcatOdd(words, high, low);
}

// One pixel of a row for each lane, `column` and so many to the right.
template <class T>
class Columns {
 public:
  explicit HWY_INLINE Columns(Ints column) {
    const HalfInts half;
    const hn::Rebind<i64, Tag<f64>> d;
    index_ = column;
    if constexpr (sizeof(T) != 4) {
      constexpr int shift = sizeof(T) == 8 ? 3 : 4;
      low_ = hn::ShiftLeft<shift>(hn::PromoteTo(d, hn::LowerHalf(half, column.v)));
      high_ = hn::ShiftLeft<shift>(hn::PromoteTo(d, hn::UpperHalf(half, column.v)));
      hn::Store(low_, d, offsets_);
      hn::Store(high_, d, offsets_ + lane_count() / 2);
    }
  }
  HWY_INLINE Raw<T> at(const char* row, i32 k) const {
    const char* const base = row + static_cast<std::ptrdiff_t>(k) * i32{sizeof(T)};
    const Tag<i32> d;
    Raw<T> p;
    if constexpr (sizeof(T) == 4) {
      p.w[0] = hn::GatherIndex(d, reinterpret_cast<const i32*>(base), index_.v);
    } else if constexpr (sizeof(T) == 8) {
      gather_pairs(base, low_, high_, &p.w[0], &p.w[1]);
    } else {
      gather_blocks(base, offsets_, p.w);
    }
    return p;
  }

 private:
  Ints index_;
  hn::Vec<hn::Rebind<i64, Tag<f64>>> low_, high_;
  alignas(64) i64 offsets_[lane_count()];
};

// Positions of a vector of pixels anywhere in the source.
template <class T>
class Scattered {
 public:
  static constexpr bool one_phase = false;

  HWY_INLINE Scattered(const SampleRun& run, const ZR_LayerDef& src)
      : data_(static_cast<const char*>(src.data)), row_bytes_(src.row_bytes), step_x_(run.step_x), step_y_(run.step_y) {
    const Ints place = hn::Iota(Tag<i32>(), 0);
    x_ = Ints(run.x) + place * step_x_;
    y_ = Ints(run.y) + place * step_y_;
    locate();
  }
  // For move_to() alone.
  explicit HWY_INLINE Scattered(const ZR_LayerDef& src)
      : data_(static_cast<const char*>(src.data)), row_bytes_(src.row_bytes), step_x_(0), step_y_(0) {}
  HWY_INLINE void move_to(Ints x, Ints y) {
    x_ = x, y_ = y;
    locate();
  }
  HWY_INLINE void next() {
    x_ = x_ + Ints(wrap_mul(step_x_, lane_count()));
    y_ = y_ + Ints(wrap_mul(step_y_, lane_count()));
    locate();
  }
  HWY_INLINE Ints x() const { return x_; }
  HWY_INLINE Ints y() const { return y_; }
  HWY_INLINE Ints fraction_x() const { return masked(x_, 65535); }
  HWY_INLINE Ints fraction_y() const { return masked(y_, 65535); }
  HWY_INLINE Bools<i32> whole() const { return masked(x_ | y_, 65535) == 0; }

  // `count` pixels of each position's row `dy`, from its column `dx` on.
  template <i32 count>
  HWY_INLINE void row(i32 dx, i32 dy, Raw<T> (&p)[count]) const {
    constexpr i32 words = Raw<T>::words;
    const char* const base = neighbour(dx, dy);
    if constexpr (count * words == 2) {
      gather_pairs(base, low_, high_, &p[0].w[0], &p[1 / words].w[1 % words]);
    } else {
      for (i32 i = 0; i < count; i += 4 / words) {
        Ints block[4];
        gather_blocks(base + i * i32{sizeof(T)}, offsets_, block);
        for (i32 k = 0; k < 4; ++k) p[i + k / words].w[k % words] = block[k];
      }
    }
  }
  // One neighbour of a fourth of the positions, as pixels of 16 bytes lie in memory.
  HWY_INLINE Ints together(i32 part, i32 dx, i32 dy) const {
    return load_pixels(Tag<i32>(), neighbour(dx, dy), offsets_ + part * (lane_count() / 4));
  }

 private:
  HWY_INLINE const char* neighbour(i32 dx, i32 dy) const {
    return data_ + static_cast<std::ptrdiff_t>(dy) * row_bytes_ + static_cast<std::ptrdiff_t>(dx) * i32{sizeof(T)};
  }
  using Offsets = hn::Rebind<i64, Tag<f64>>;

  // Where each pixel lies from the first of the world, in bytes.
  HWY_INLINE void locate() {
    const HalfInts half;
    const Ints x = shifted_right<16>(x_), y = shifted_right<16>(y_);
    const auto offset = [&](auto column, auto row) HWY_ATTR {
      const Offsets d;
      const auto rows = hn::MulEven(hn::BitCast(Tag<i32>(), hn::PromoteTo(d, row)), Ints(row_bytes_).v);
      return hn::Add(rows, hn::ShiftLeft < sizeof(T) == 4 ? 2 : sizeof(T) == 8 ? 3 : 4 > (hn::PromoteTo(d, column)));
    };
    low_ = offset(hn::LowerHalf(half, x.v), hn::LowerHalf(half, y.v));
    high_ = offset(hn::UpperHalf(half, x.v), hn::UpperHalf(half, y.v));
    hn::Store(low_, Offsets(), offsets_);
    hn::Store(high_, Offsets(), offsets_ + lane_count() / 2);
  }

  Ints x_, y_;
  hn::Vec<Offsets> low_, high_;
  alignas(64) i64 offsets_[lane_count()];
  const char* data_;
  i32 row_bytes_, step_x_, step_y_;
};

// Positions along a row of the source, less than a pixel apart: a vector of pixels holds the neighbours of all lanes.
template <class T, i32 count>
class Windowed {
 public:
  static constexpr bool one_phase = false;

  // Whether `count` neighbours of each lane lie within as many pixels as there are lanes.
  static bool suits(const SampleRun& run) {
    constexpr i32 lanes = lane_count();
    return run.step_y == 0 && run.step_x > 0 && run.step_x < 0x10000 &&
           (run.step_x * (lanes - 1) + 0xffff) >> 16 <= lanes - count;
  }
  HWY_INLINE Windowed(const SampleRun& run, const ZR_LayerDef& src)
      : row_(static_cast<const char*>(src.data) + static_cast<std::ptrdiff_t>(run.y >> 16) * src.row_bytes),
        row_bytes_(src.row_bytes),
        width_(src.width),
        step_(run.step_x),
        first_x_(run.x),
        y_(run.y) {
    x_ = Ints(run.x) + Ints(hn::Iota(Tag<i32>(), 0)) * step_;
  }
  HWY_INLINE void next() {
    first_x_ += step_ * lane_count();
    x_ = x_ + Ints(step_ * lane_count());
  }
  HWY_INLINE Ints fraction_x() const { return masked(x_, 65535); }
  HWY_INLINE Ints fraction_y() const { return y_ & 0xffff; }
  HWY_INLINE Bools<i32> whole() const { return masked(x_ | Ints(y_), 65535) == 0; }

  HWY_INLINE void row(i32 dx, i32 dy, Raw<T> (&p)[count]) const {
    const Tag<i32> d;
    const i32 first = (first_x_ >> 16) + dx;
    const char* const line = row_ + static_cast<std::ptrdiff_t>(dy) * row_bytes_;
    const Ints place = shifted_right<16>(x_) + dx;
    if (width_ - first < lane_count()) {
      const Columns<T> columns(place);
      for (i32 i = 0; i < count; ++i) p[i] = columns.at(line, i);
      return;
    }
    const i32* const words = reinterpret_cast<const i32*>(line + static_cast<std::ptrdiff_t>(first) * i32{sizeof(T)});
    Ints window[Raw<T>::words];
    if constexpr (Raw<T>::words == 1)
      window[0] = hn::LoadU(d, words);
    else if constexpr (Raw<T>::words == 2)
      hn::LoadInterleaved2(d, words, window[0].v, window[1].v);
    else
      hn::LoadInterleaved4(d, words, window[0].v, window[1].v, window[2].v, window[3].v);
    for (i32 i = 0; i < count; ++i) {
      const auto indices = hn::IndicesFromVec(d, (place - Ints(first - i)).v);
      for (i32 k = 0; k < Raw<T>::words; ++k) p[i].w[k] = hn::TableLookupLanes(window[k].v, indices);
    }
  }

 private:
  const char* row_;
  i32 row_bytes_, width_, step_, first_x_, y_;
  Ints x_;
};

// Positions one pixel apart in a row: neighbours lie side by side.
template <class T>
class Adjacent {
 public:
  static constexpr bool one_phase = true;

  HWY_INLINE Adjacent(const SampleRun& run, const ZR_LayerDef& src)
      : at_(static_cast<const char*>(src.data) + static_cast<std::ptrdiff_t>(run.y >> 16) * src.row_bytes +
            static_cast<std::ptrdiff_t>(run.x >> 16) * i32{sizeof(T)}),
        row_bytes_(src.row_bytes),
        x_(run.x),
        y_(run.y) {}
  HWY_INLINE void next() { at_ += lane_count() * i32{sizeof(T)}; }
  HWY_INLINE Ints fraction_x() const { return x_ & 0xffff; }
  HWY_INLINE Ints fraction_y() const { return y_ & 0xffff; }
  HWY_INLINE Bools<i32> whole() const { return Ints((x_ | y_) & 0xffff) == 0; }

  template <i32 count>
  HWY_INLINE void row(i32 dx, i32 dy, Raw<T> (&p)[count]) const {
    const char* const first =
        at_ + static_cast<std::ptrdiff_t>(dy) * row_bytes_ + static_cast<std::ptrdiff_t>(dx) * i32{sizeof(T)};
    for (i32 i = 0; i < count; ++i) p[i] = load_pixels<T>(first + i * i32{sizeof(T)});
  }

 private:
  const char* at_;
  i32 row_bytes_, x_, y_;
};

// ---------------------------------------------------------------------------------------- rows

// Alphas of vectors of pixels. A sum of floats is added one by one, as the order is part of it.
template <class T, class Sum>
class AlphaSums {
 public:
  explicit HWY_INLINE AlphaSums(Sum* total) : total_(total), lanes_(0) {}
  HWY_INLINE void add(Ints alphas, const T* stored) {
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      Sum total = *total_;
      // Ones can be added together where all their sums are exact: a few bits of room and a short fraction.
      constexpr Sum grid = 0x1.8p15f;
      if (all(as_floats(alphas) == 1.0f) && (total + grid) - grid == total && total < grid / 4) {
        total += static_cast<Sum>(lane_count());
      } else {
        for (i32 i = 0; i < lane_count(); ++i) total += stored[i].alpha;
      }
      *total_ = total;
    } else {
      lanes_ = lanes_ + alphas;
      if (++vectors_ == 32768) flush();  // more would not fit
    }
  }
  HWY_INLINE void flush() {
    if constexpr (!std::is_same_v<T, ZR_PixelFloat>) {
      *total_ += static_cast<Sum>(static_cast<u64>(hn::GetLane(hn::SumOfLanes(Tag<i64>(), pairs()))));
      lanes_ = 0, vectors_ = 0;
    }
  }

 private:
  HWY_INLINE hn::Vec<Tag<i64>> pairs() const {
    const HalfInts half;
    const Tag<i64> d;
    return hn::Add(hn::PromoteTo(d, hn::LowerHalf(half, lanes_.v)), hn::PromoteTo(d, hn::UpperHalf(half, lanes_.v)));
  }
  Sum* total_;
  Ints lanes_;
  i32 vectors_ = 0;
};
template <>
class AlphaSums<ZR_PixelFloat, FloatAlphas> {
  using Words = hn::Rebind<u32, Tag<i32>>;

 public:
  explicit HWY_INLINE AlphaSums(FloatAlphas* total)
      : total_(total), least_(hn::Set(Words(), ~u32{0})), most_(hn::Zero(Words())) {}
  // In any order.
  HWY_INLINE void add(Ints alphas, const ZR_PixelFloat*) {
    const auto bits = hn::BitCast(Words(), alphas.v);
    least_ = hn::Min(least_, bits), most_ = hn::Max(most_, bits);
    pixels_ += lane_count();
  }
  HWY_INLINE void flush() {
    if (pixels_ == 0) return;
    total_->add_lanes(hn::GetLane(hn::MinOfLanes(Words(), least_)), hn::GetLane(hn::MaxOfLanes(Words(), most_)),
                      pixels_);
    pixels_ = 0;
  }

 private:
  FloatAlphas* total_;
  hn::Vec<Words> least_, most_;
  i32 pixels_ = 0;
};

// Scattered pixels of four floats fill a vector of four lanes each by itself: there single pixels are as fast or
// faster.
template <class T>
inline constexpr bool gains_from_lanes = !std::is_same_v<T, ZR_PixelFloat> || lane_count() > 4;

// Stores pixels and gives their alphas back.
template <class T>
HWY_INLINE Ints put(const Raw<T>& p, T* dst) {
  store(p, dst);
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return p.w[0];
  else
    return channel_of<0>(p);
}

// The whole vectors of a run: write(neighbours, dst) stores the pixels of one and returns their alphas. Returns how
// many pixels that are.
template <class T, class Neighbours, class Sum, class Write>
HWY_INLINE i32 write_vectors(i32 count, Neighbours at, Sum* sum, T* dst, Write write) {
  constexpr i32 lanes = lane_count();
  AlphaSums<T, Sum> sums(sum);
  i32 i = 0;
  for (;;) {
    sums.add(write(at, dst + i), dst + i);
    i += lanes;
    if (count - i < lanes) break;
    at.next();
  }
  sums.flush();
  return i;
}
template <class T, class Neighbours, class Sum, class Write>
HWY_INLINE i32 sample_vectors(const SampleRun& run, const ZR_LayerDef& src, Sum* sum, T* dst, Write write) {
  return run.count < lane_count() ? 0 : write_vectors(run.count, Neighbours(run, src), sum, dst, write);
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
