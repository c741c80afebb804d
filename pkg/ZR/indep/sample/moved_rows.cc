// Rows of a layer that moves: the sampler itself takes what is clear or opaque all over, as equal alphas are its fast
// way, and what lanes cannot vouch for.
#include "sample/moved_rows.h"

#include <bit>
#include <cmath>
#include <cstring>
#include <limits>

#include "sample/ZR_Samp.h"

namespace zr {
namespace {

constexpr i32 most_lanes = 16;
constexpr i32 most_mixed = 64;  // vectors at once
constexpr i32 no_row = std::numeric_limits<i32>::min();

}  // namespace

MovedPhase::MovedPhase(u32 fraction_x, u32 fraction_y)
    : weights(fraction_x, fraction_y),
      right(static_cast<f32>(fraction_x / (65536.0 - fraction_x))),
      below(static_cast<f32>(fraction_y / (65536.0 - fraction_y))) {
  const f64 first = 1 / ((1.0 + right) * (1.0 + below));
  scale = static_cast<f32>(first * 65536);
  // Each rounding is one of 2^-24 at most: nine of the sampler and less than eight here are 17 units of 1/65536 in a
  // channel. What the weights differ by counts the more the less alpha there is to divide by.
  const f64 difference = std::fabs(weights.w00 - first) + std::fabs(weights.w10 - first * right) +
                         std::fabs(weights.w01 - first * below) + std::fabs(weights.w11 - first * right * below);
  constexpr f64 units_left = 14, full = 255.0 * 255 * 65536;
  least_alpha = static_cast<f32>(std::fmax(1.0, difference * full / units_left));
}

// Whatever the last run left is of no use unless this one lies right below it.
void MovedRows::start(const SampleRun& run, const ZR_SampPB& params) {
  const auto upper = [&] { return pixel_at<ZR_Pixel8>(*params.src, run.x >> 16, run.y >> 16); };
  const bool same_columns = run.x == x_ && run.count == count_;
  if (!same_columns) {
    vectors_ = run.count / lanes_.pixels;
    const auto blocks = static_cast<std::size_t>((vectors_ + moved_block - 1) / moved_block);
    sums_.resize(static_cast<std::size_t>(vectors_ * lanes_.pixels) * 3);
    kept_.assign(blocks, no_row);
    upper_.resize(blocks);
    lower_.resize(blocks);
  }
  if (!same_columns || ((run.y ^ y_) & 0xffff) != 0)
    phase_ = MovedPhase(static_cast<u32>(run.x) & 0xffffu, static_cast<u32>(run.y) & 0xffffu);
  if (same_columns && run.y == wrap_add(y_, 0x10000))
    upper_.swap(lower_);
  else
    lanes_.kinds(vectors_, upper(), upper_.data());
  x_ = run.x, y_ = run.y, count_ = run.count;
}

// What no vector has reached, as the end of one.
void MovedRows::finish(const SampleRun& run, const ZR_SampPB& params, RowSum<ZR_Pixel8>* sum, ZR_Pixel8* dst) const {
  ZR_Pixel8 last[most_lanes];
  AlphaSum<ZR_Pixel8> all = 0;
  const i32 from = run.count - lanes_.pixels, done = vectors_ * lanes_.pixels;
  if (done == run.count) return;
  exact_({lanes_.pixels, run.x + from * 0x10000, run.y, 0x10000, 0}, params, &all, last);
  for (i32 i = done; i < run.count; ++i) {
    dst[i] = last[i - from];
    *sum += dst[i].alpha;
  }
}

void MovedRows::row(const SampleRun& run, const ZR_SampPB& params, RowSum<ZR_Pixel8>* sum, ZR_Pixel8* dst) {
  start(run, params);
  lanes_.kinds(vectors_, pixel_at<ZR_Pixel8>(*params.src, run.x >> 16, (run.y >> 16) + 1), lower_.data());
  const auto equal = [&](std::size_t k) { return upper_[k] == lower_[k] && upper_[k] != MovedKind::any; };
  for (std::size_t block = 0; block < kept_.size();) {
    const std::size_t first = block;
    const bool samples = equal(first);
    while (block < kept_.size() && equal(block) == samples) ++block;
    const i32 from = static_cast<i32>(first) * moved_block;
    const i32 end = std::min(static_cast<i32>(block) * moved_block, vectors_);
    if (samples)
      *sum += sample(from, end, run, params, dst);
    else
      mix(from, end, run, params, sum, dst);
  }
  finish(run, params, sum, dst);
}

// Vectors [first, end) by the sampler. Returns the sum of alphas.
AlphaSum<ZR_Pixel8> MovedRows::sample(i32 first, i32 end, const SampleRun& run, const ZR_SampPB& params,
                                      ZR_Pixel8* dst) const {
  const i32 from = first * lanes_.pixels;
  AlphaSum<ZR_Pixel8> total = 0;
  exact_({(end - first) * lanes_.pixels, run.x + from * 0x10000, run.y, 0x10000, 0}, params, &total, dst + from);
  return total;
}

// Vectors [first, end), which are whole blocks or the last ones.
void MovedRows::mix(i32 first, i32 end, const SampleRun& run, const ZR_SampPB& params, RowSum<ZR_Pixel8>* sum,
                    ZR_Pixel8* dst) {
  const i32 y = run.y >> 16;
  const ZR_Pixel8* const upper = pixel_at<ZR_Pixel8>(*params.src, run.x >> 16, y);
  const ZR_Pixel8* const lower = pixel_at<ZR_Pixel8>(*params.src, run.x >> 16, y + 1);
  const auto part = [&](const ZR_Pixel8* row, i32 from, i32 to) {
    const i32 pixel = from * lanes_.pixels;
    return MovedPart{to - from, run.count + 1 - pixel, row + pixel, sums_.data() + static_cast<std::size_t>(pixel) * 3};
  };
  for (i32 from = first; from < end; from += moved_block) {
    i32& kept = kept_[static_cast<std::size_t>(from / moved_block)];
    if (kept != y) lanes_.keep(part(upper, from, std::min(from + moved_block, end)), phase_);
    kept = y + 1;
  }
  for (i32 from = first; from < end; from += most_mixed) {
    const i32 pixel = from * lanes_.pixels;
    const MovedPart some = part(lower, from, std::min(from + most_mixed, end));
    for (u64 left = lanes_.mix(some, phase_, upper + pixel, sum, dst + pixel); left != 0;) {
      const i32 vector = std::countr_zero(left), behind = vector + std::countr_one(left >> vector);
      sample(from + vector, from + behind, run, params, dst);
      left = behind < most_mixed ? left >> behind << behind : 0;
    }
  }
}

}  // namespace zr
