// Drives a peer on the same pictures as ours, after a look at what it made: a peer that does nothing, or something
// else, is an error in the report and no time.
#pragma once

#include <ZR/transfer_mode.h>

#include <vector>

#include "placements.h"

namespace bench {

// Squares of one colour, so that nearest neighbours and kernels that differ by a pixel still resemble each other.
template <class T>
std::unique_ptr<ZR_WorldX<T>> make_squares(Size size) {
  auto world = make_world<T>(size, Layer::opaque, 4);
  for (i32 y = 0; y < size.height; ++y)
    for (i32 x = 0; x < size.width; ++x) *world->At(x, y) = *world->At(x & ~15, y & ~15);
  return world;
}

// Whether the colours in the middle of two pictures go together: another place, or no work, leaves no correlation.
template <class T>
bool resembles(const ZR_WorldX<T>& ours, const ZR_WorldX<T>& theirs) {
  f64 n = 0, sum_a = 0, sum_b = 0, sum_aa = 0, sum_bb = 0, sum_ab = 0;
  for (i32 y = ours.height / 3; y < ours.height * 2 / 3; y += 3)
    for (i32 x = ours.width / 3; x < ours.width * 2 / 3; x += 3) {
      const auto* const p = reinterpret_cast<const zr::Channel<T>*>(ours.At(x, y));
      const auto* const q = reinterpret_cast<const zr::Channel<T>*>(theirs.At(x, y));
      for (i32 c = 1; c < 4; ++c) {
        const f64 a = p[c] / f64{zr::Depth<T>::white}, b = q[c] / f64{zr::Depth<T>::white};
        n += 1, sum_a += a, sum_b += b, sum_aa += a * a, sum_bb += b * b, sum_ab += a * b;
      }
    }
  const f64 var_a = sum_aa - sum_a * sum_a / n, var_b = sum_bb - sum_b * sum_b / n;
  return std::fabs(sum_a - sum_b) < 0.05 * n && sum_ab - sum_a * sum_b / n > 0.8 * std::sqrt(var_a * var_b);
}

// Whether two pictures are the same but for rounding.
template <class T>
bool agrees(const ZR_WorldX<T>& ours, const ZR_WorldX<T>& theirs) {
  f64 sum = 0;
  for (i32 y = 0; y < ours.height; ++y)
    for (i32 x = 0; x < ours.width; ++x) {
      if (ours.At(x, y)->alpha == 0) continue;  // its colour shows nowhere
      const auto* const p = reinterpret_cast<const zr::Channel<T>*>(ours.At(x, y));
      const auto* const q = reinterpret_cast<const zr::Channel<T>*>(theirs.At(x, y));
      for (i32 c = 0; c < 4; ++c) sum += std::fabs(static_cast<f64>(p[c]) - static_cast<f64>(q[c]));
    }
  return sum < 0.005 * 4 * ours.width * ours.height * f64{zr::Depth<T>::white};
}

// For peers that take our channels in our order.
struct OurOrder {
  template <class T>
  void operator()(ZR_WorldX<T>&, bool) const {}
};

// Both routines are called with (src, dst); only `theirs` is timed. `reorder(world, back)` brings a world into the
// peer's order of channels, or back.
template <class T, class Ours, class Theirs, class Reorder = OurOrder>
void time_peer(benchmark::State& state, Size from, Size to, Ours ours, Theirs theirs, Reorder reorder = {}) {
  // Some peers take no row padding.
  std::vector<T> pixels(static_cast<size_t>(to.width) * static_cast<size_t>(to.height));
  ZR_WorldX<T> dst(pixels.data(), to.width, to.height, to.width * static_cast<i32>(sizeof(T)));
  {
    const auto squares = make_squares<T>(from);
    const auto expected = make_world<T>(to, Layer::opaque, 2);
    ours(*squares, *expected);
    reorder(*squares, false);
    reorder(dst, false);
    theirs(*squares, dst);
    reorder(dst, true);
    if (!resembles(*expected, dst)) return state.SkipWithError("the peer's picture is not ours");
  }
  const auto src = make_world<T>(from, Layer::opaque, 1);
  reorder(*src, false);
  reorder(dst, false);
  for (auto _ : state) theirs(*src, dst);
  state.SetBytesProcessed(static_cast<i64>(state.iterations()) *
                          (i64{from.width} * from.height + i64{to.width} * to.height) * static_cast<i64>(sizeof(T)));
}

// Registers `body(src, dst)` as the peer of a placement, for opaque layers: peers do not look at alpha.
template <class T, class Body, class Reorder = OurOrder>
void add_placed_peer(const Placement& work, const char* peer, Size size, Body body, Reorder reorder = {}) {
  add(std::string(work.name) + "/" + depth_name<T>() + "/opaque/" + peer, size,
      [=, &work](benchmark::State& state, Size s) {
        const GX_Matrix3 matrix = work.matrix(s);
        const auto ours = [&](ZR_WorldX<T>& src, ZR_WorldX<T>& dst) {
          const GX_LRect all{0, 0, s.width, s.height};
          const ZR_CompositeModePlus mode(XferInFront, 1.0f, nullptr, false, 0);
          ZR_TransformWorld(nullptr, work.quality, 0, 0, &src, &mode, nullptr, nullptr, &matrix, 1, true, &all, &dst);
        };
        time_peer<T>(
            state, s, s, ours, [&](ZR_WorldX<T>& src, ZR_WorldX<T>& dst) { body(src, dst, matrix); }, reorder);
      });
}

// The same for a resize.
template <class T, class Body>
void add_resize_peer(const Resize& work, const char* peer, Size size, Body body) {
  add(std::string(work.name) + "/" + depth_name<T>() + "/opaque/" + peer, size,
      [=, &work](benchmark::State& state, Size s) {
        const auto ours = [&](ZR_WorldX<T>& src, ZR_WorldX<T>& dst) {
          work.routine(nullptr, &src, &dst, nullptr, nullptr);
        };
        time_peer<T>(state, s, work.to(s), ours, body);
      });
}

}  // namespace bench
