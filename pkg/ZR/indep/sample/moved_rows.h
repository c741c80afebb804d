// Bilinear 8-bit pixels of a layer that moves by parts of a pixel: every row of the source is the lower neighbour of
// one row and the upper neighbour of the next, and is multiplied by its alpha and added up sideways only once.
//
// Sums are formed in another order than the sampler's, and with single roundings where it has two. A bound on both
// errors tells which pixels come out the same; vectors with others are left to the sampler.
#pragma once

#include <HB/allocator.h>

#include <vector>

#include "sample/ZR_Samp.h"
#include "sample/lane_rows.h"

namespace zr {

// What all pixels of a layer that moves have in common.
struct MovedPhase {
  BilinearWeights<f32> weights;
  f32 right, below;  // weight of the right neighbours over that of the left, of the lower over that of the upper
  f32 scale;         // 65536 over the sum of such weights
  f32 least_alpha;   // from which on the bound holds

  MovedPhase(u32 fraction_x, u32 fraction_y);
};
// Colours times 65536 are off by less than this, together with the sampler's.
inline constexpr i32 moved_error = 32;

// Some vectors of a run.
struct MovedPart {
  i32 vectors;
  i32 readable;          // pixels of the row from here on: one more than the vectors have at least
  const ZR_Pixel8* row;  // of left neighbours
  f32* sums;             // three a pixel
};

// Of all alphas in a block and the pixel that follows it.
enum class MovedKind : u8 { any, clear, opaque };
inline constexpr i32 moved_block = 4;  // vectors

struct LaneMoved {
  i32 pixels;  // of a vector: 16 at most
  // The kind of every block; the last one may be shorter.
  void (*kinds)(i32 vectors, const ZR_Pixel8* row, MovedKind* kinds);
  void (*keep)(const MovedPart& row, const MovedPhase& phase);
  // At most 64 vectors. Takes the sums of the upper row, leaves those of the lower, and fills dst; the alphas are
  // added to *sum. Returns a bit for each vector that has to be sampled yet; its alphas are right.
  u64 (*mix)(const MovedPart& lower, const MovedPhase& phase, const ZR_Pixel8* upper, RowSum<ZR_Pixel8>* sum,
             ZR_Pixel8* dst);
};
// The fastest that this processor has, or null.
const LaneMoved* lane_moved();

class MovedRows {
 public:
  MovedRows(const LaneMoved& lanes, LaneSpanFunc<ZR_Pixel8>* exact) : lanes_(lanes), exact_(exact) {}
  // Fills dst as the span sampler does and adds the alphas to *sum. The source stays as it is from call to call.
  bool suits(i32 count) const { return count >= lanes_.pixels; }
  void row(const SampleRun& run, const ZR_SampPB& params, RowSum<ZR_Pixel8>* sum, ZR_Pixel8* dst);

 private:
  struct Label {
    static constexpr char text[] = "sums of a layer that moves";
  };
  template <class T>
  using List = std::vector<T, HB_Allocator<T, Label>>;

  void start(const SampleRun& run, const ZR_SampPB& params);
  AlphaSum<ZR_Pixel8> sample(i32 first, i32 end, const SampleRun& run, const ZR_SampPB& params, ZR_Pixel8* dst) const;
  void finish(const SampleRun& run, const ZR_SampPB& params, RowSum<ZR_Pixel8>* sum, ZR_Pixel8* dst) const;
  void mix(i32 first, i32 end, const SampleRun& run, const ZR_SampPB& params, RowSum<ZR_Pixel8>* sum, ZR_Pixel8* dst);

  const LaneMoved& lanes_;
  LaneSpanFunc<ZR_Pixel8>* exact_;
  MovedPhase phase_{0, 0};
  i32 x_ = 0, y_ = 0, count_ = 0;  // of the last run
  i32 vectors_ = 0;
  List<f32> sums_;
  List<i32> kept_;                 // of each block: the row whose sums those are
  List<MovedKind> upper_, lower_;  // of each block
};

}  // namespace zr
