// swscale on pictures of the same sizes, one thread: four packed channels, or four planes that are scaled alike
// (its planar formats with alpha and full chroma, of which nothing is converted).
extern "C" {
#include <libavutil/pixfmt.h>
#include <libswscale/swscale.h>
}

#include "peer_check.h"

namespace bench {
namespace {

// A picture in the peer's layout.
template <class C>
struct Planes {
  Size size;
  int count;   // 1: packed pixels
  int stride;  // channels from row to row, a multiple of 64
  std::vector<C> channels;
  u8* data[4] = {};
  int strides[4] = {};

  Planes(Size s, bool planar)
      : size(s),
        count(planar ? 4 : 1),
        stride((s.width * (planar ? 1 : 4) + 63) & ~63),
        channels(static_cast<size_t>(stride) * static_cast<size_t>(s.height * count + 1)) {
    for (int i = 0; i < count; ++i) {
      data[i] = reinterpret_cast<u8*>(At(i, 0));
      strides[i] = stride * static_cast<int>(sizeof(C));
    }
  }
  C* At(int plane, i32 y) { return channels.data() + ptrdiff_t{stride} * (ptrdiff_t{plane} * size.height + y); }
  // Channel c of pixel (x, y).
  C& At(i32 x, i32 y, i32 c) { return count == 1 ? At(0, y)[x * 4 + c] : At(c, y)[x]; }
};

template <class T, class Body>
void each_channel(ZR_WorldX<T>& world, Body body) {
  for (i32 y = 0; y < world.height; ++y)
    for (i32 x = 0; x < world.width; ++x)
      for (i32 c = 0; c < 4; ++c) body(x, y, c, reinterpret_cast<zr::Channel<T>*>(world.At(x, y))[c]);
}

template <class T>
void scale(benchmark::State& state, Size from, const Resize& work, AVPixelFormat format, bool planar, int flags) {
  using C = zr::Channel<T>;
  const Size to = work.to(from);
  const auto squares = make_squares<T>(from), ours = make_world<T>(to, Layer::opaque),
             theirs = make_world<T>(to, Layer::opaque);
  work.routine(nullptr, squares.get(), ours.get(), nullptr, nullptr);
  Planes<C> src(from, planar), dst(to, planar);
  each_channel(*squares, [&](i32 x, i32 y, i32 c, C& v) { src.At(x, y, c) = v; });
  SwsContext* const context =
      sws_getContext(from.width, from.height, format, to.width, to.height, format, flags, nullptr, nullptr, nullptr);
  if (context == nullptr) return state.SkipWithError("no such scaling");
  const auto run = [&] { sws_scale(context, src.data, src.strides, 0, from.height, dst.data, dst.strides); };
  run();
  each_channel(*theirs, [&](i32 x, i32 y, i32 c, C& v) { v = dst.At(x, y, c); });
  if (resembles(*ours, *theirs)) {
    const auto noise = make_world<T>(from, Layer::opaque);
    each_channel(*noise, [&](i32 x, i32 y, i32 c, C& v) { src.At(x, y, c) = v; });
    for (auto _ : state) run();
  } else {
    state.SkipWithError("the peer's picture is not ours");
  }
  sws_freeContext(context);
}

template <class T>
void add_scale(const Resize& work, Size size, const char* peer, AVPixelFormat format, bool planar, int flags) {
  add(std::string(work.name) + "/" + depth_name<T>() + "/opaque/" + peer, size,
      [=, &work](benchmark::State& state, Size s) { scale<T>(state, s, work, format, planar, flags); });
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  const struct {
    const Resize& work;
    int flags;
  } works[] = {{nearest_half, SWS_POINT},
               {nearest_double, SWS_POINT},
               {area_third, SWS_AREA},
               {area_half, SWS_AREA},
               {bilinear_larger, SWS_BILINEAR}};
  for (const Size size : sizes)
    for (const auto& one : works) {
      add_scale<ZR_Pixel8>(one.work, size, "swscale-packed", AV_PIX_FMT_ARGB, false, one.flags);
      add_scale<ZR_Pixel8>(one.work, size, "swscale-planar", AV_PIX_FMT_YUVA444P, true, one.flags);
      add_scale<ZR_Pixel16>(one.work, size, "swscale-planar", AV_PIX_FMT_YUVA444P16, true, one.flags);
    }
  return true;
}();

}  // namespace
}  // namespace bench
