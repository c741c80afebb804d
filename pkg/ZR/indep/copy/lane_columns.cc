// Pixels by their columns: one or two vectors of neighbours are loaded and shuffled.
#include "copy/lane_columns.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "copy/lane_columns.cc"
#include <hwy/foreach_target.h>

#include "simd/lane_stream-inl.h"
#include "simd/lanes-inl.h"

#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Word is as wide as a pixel.
template <class Word>
i32 pick_columns(i32 n, const i32* columns, i32 width, const char* src, char* dst) {
  using D = Tag<Word>;
  using Signed = hn::RebindToSigned<D>;
  const D d;
  const Signed s;
  constexpr i32 lanes = static_cast<i32>(hn::MaxLanes(D()));
  const Word* const pixels = reinterpret_cast<const Word*>(src);
  Word* const out = reinterpret_cast<Word*>(dst);
  const auto load = [&](i32 k) HWY_ATTR {
    if constexpr (sizeof(Word) == 4)
      return hn::LoadU(s, columns + k);
    else
      return hn::PromoteTo(s, hn::LoadU(hn::Rebind<i32, Signed>(), columns + k));
  };
  i32 k = 0;
  for (; n - k >= lanes; k += lanes) {
    const i32 first = columns[k], span = columns[k + lanes - 1] - first;
    const i32 read = span < lanes ? lanes : 2 * lanes;
    if (span >= 2 * lanes || width - first < read) {
      for (i32 i = k; i < k + lanes; ++i) out[i] = pixels[columns[i]];
      continue;
    }
    const auto place = hn::Sub(load(k), hn::Set(s, first));
    const auto indices = hn::IndicesFromVec(d, hn::And(place, hn::Set(s, lanes - 1)));
    auto v = hn::TableLookupLanes(hn::LoadU(d, pixels + first), indices);
    if (span >= lanes) {
      const auto upper = hn::TableLookupLanes(hn::LoadU(d, pixels + first + lanes), indices);
      v = hn::IfThenElse(hn::RebindMask(d, hn::Gt(place, hn::Set(s, lanes - 1))), upper, v);
    }
    hn::StoreU(v, d, out + k);
  }
  return k;
}

void stream(std::size_t bytes, const char* src, char* dst) { stream_bytes(bytes, src, dst); }
void finish_streams() { hwy::FlushStream(); }

const LaneColumns* columns() {
  static constexpr LaneColumns all = {&pick_columns<u32>, &pick_columns<u64>, &stream, &finish_streams};
  return &all;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_CHOICE(const LaneColumns*, columns)
#endif
