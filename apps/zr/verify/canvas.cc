// The fixed inputs of `zr verify`.
#include "verify/canvas.h"

#include <limits>

namespace zr::tool {

u32 Random::next() {
  u64 word = state_ += 0x9e3779b97f4a7c15u;
  word = (word ^ (word >> 30)) * 0xbf58476d1ce4e5b9u;
  word = (word ^ (word >> 27)) * 0x94d049bb133111ebu;
  return static_cast<u32>((word ^ (word >> 31)) >> 32);
}

namespace {

template <class T>
inline constexpr Channel<T> edge_values[] = {0};
template <>
inline constexpr u8 edge_values<ZR_Pixel8>[] = {0, 1, 2, 63, 64, 127, 128, 129, 191, 192, 254, 255};
template <>
inline constexpr u16 edge_values<ZR_Pixel16>[] = {0,     1,     2,     128,   8192,  16383, 16384,
                                                  16385, 24576, 32639, 32766, 32767, 32768};
// Whole and denormal, beside the corners of the depth, and beyond them on both sides.
template <>
inline constexpr f32 edge_values<ZR_PixelFloat>[] = {0.0f,          1.0f,     0.5f,   0.25f,  0x1.fffffep-1f, 0x1p-140f,
                                                     0x1p-24f,      0.75f,    0.001f, 1.25f,  -0.25f,         3.5f,
                                                     0x1.000002p0f, 1.0e-30f, 0.125f, 0.9375f};

// What no picture should hold.
template <class T>
inline constexpr Channel<T> hostile_values[] = {0};
template <>
inline constexpr u16 hostile_values<ZR_Pixel16>[] = {32769, 32770, 33000, 40960, 49151, 49152, 65280, 65534, 65535};
using Reals = std::numeric_limits<f32>;
template <>
inline constexpr f32 hostile_values<ZR_PixelFloat>[] = {Reals::quiet_NaN(), Reals::infinity(), -Reals::infinity(),
                                                        Reals::max(),       -Reals::max(),     Reals::denorm_min(),
                                                        -0x1p-140f,         Reals::min(),      -0.0f,
                                                        2147483648.0f,      -1.0e20f,          65536.0f,
                                                        -32769.0f,          -0x1p-24f,         2.0f,
                                                        0x1.fffffcp+127f,   1.0e18f,           -1.0f};

template <class T>
Channel<T> any_channel(Random& random) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return static_cast<f32>(random.next() >> 8) * 0x1p-24f;
  else
    return static_cast<Channel<T>>(random.below(static_cast<u32>(Depth<T>::white) + 1));
}
template <class T>
Channel<T> edge_channel(Random& random) {
  return edge_values<T>[random.below(static_cast<u32>(std::size(edge_values<T>)))];
}
template <class T>
Channel<T> hostile_channel(Random& random) {
  return hostile_values<T>[random.below(static_cast<u32>(std::size(hostile_values<T>)))];
}
// Anything that fits 16 bits, or floats on both sides of what is legal.
template <class T>
Channel<T> wide_channel(Random& random) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return any_channel<T>(random) * 4 - 1.5f;
  else
    return static_cast<Channel<T>>(random.next());
}
template <class T>
T coloured(Channel<T> alpha, Random& random) {
  const Channel<T> red = any_channel<T>(random), green = any_channel<T>(random), blue = any_channel<T>(random);
  return {alpha, red, green, blue};
}

enum Kind { kOpaque, kNoise, kEdges, kClear, kHidden, kGrey, kCorners, kKinds };

template <class T>
T pixel_of(Kind kind, Random& random) {
  constexpr Channel<T> white = static_cast<Channel<T>>(Depth<T>::white);
  switch (kind) {
    case kOpaque: return coloured<T>(white, random);
    case kNoise: return coloured<T>(any_channel<T>(random), random);
    case kClear: return T{};
    case kHidden: return coloured<T>(0, random);  // colour under alpha 0
    case kGrey: {
      const Channel<T> grey = any_channel<T>(random);
      return {any_channel<T>(random), grey, grey, grey};
    }
    case kCorners: {
      const u32 bits = random.next();
      const auto corner = [&](int bit) { return (bits >> bit & 1) != 0 ? white : Channel<T>{0}; };
      return {corner(0), corner(1), corner(2), corner(3)};
    }
    default: {
      const Channel<T> a = edge_channel<T>(random), r = edge_channel<T>(random), g = edge_channel<T>(random);
      return {a, r, g, edge_channel<T>(random)};
    }
  }
}

// Legal pixels, those with one channel that is not, and those with nothing legal.
template <class T>
T hostile_pixel(Kind kind, Random& random) {
  const auto all = [&](auto channel) {
    const Channel<T> a = channel(), r = channel(), g = channel();
    return T{a, r, g, channel()};
  };
  const auto wide = [&] { return wide_channel<T>(random); };
  const auto hostile = [&] { return hostile_channel<T>(random); };
  switch (kind) {
    case kOpaque:
    case kNoise:
    case kEdges: return pixel_of<T>(kind, random);
    case kClear: return all(wide);
    case kHidden: {  // illegal colour under alpha 0
      T pixel = all(wide);
      pixel.alpha = 0;
      return pixel;
    }
    case kGrey: return all(hostile);
    default: {
      T pixel = pixel_of<T>(kNoise, random);
      Channel<T>* const channels[] = {&pixel.alpha, &pixel.red, &pixel.green, &pixel.blue};
      *channels[random.below(4)] = hostile();
      return pixel;
    }
  }
}

template <class T>
T premultiplied(const T& p) {
  const auto times = [&](Channel<T> c) { return static_cast<Channel<T>>(Depth<T>::mul(c, p.alpha)); };
  return {p.alpha, times(p.red), times(p.green), times(p.blue)};
}

// Runs of one kind, 1 to 40 pixels long: vectors that are all of a kind, and vectors that are not.
template <class T>
class Source {
 public:
  Source(Content content, u64 seed) : content_(content), random_(seed) {}
  T next() {
    switch (content_) {
      case Content::opaque: return pixel_of<T>(kOpaque, random_);
      case Content::noise: return pixel_of<T>(kNoise, random_);
      case Content::premul: return premultiplied(pixel_of<T>(run_kind(), random_));
      case Content::mixed: return pixel_of<T>(run_kind(), random_);
      case Content::hostile: return hostile_pixel<T>(run_kind(), random_);
      case Content::untouched: break;
    }
    return T{1, 2, 3, 4};
  }

 private:
  Kind run_kind() {
    if (left_-- == 0) {
      left_ = random_.below(3) == 0 ? random_.below(3) : random_.below(40);
      kind_ = static_cast<Kind>(random_.below(kKinds));
    }
    return kind_;
  }
  Content content_;
  Random random_;
  u32 left_ = 0;
  Kind kind_ = kOpaque;
};

template <class T>
constexpr i32 guard_pixels = sizeof(T) < 16 ? 2 : 1;

template <class T>
i32 stride_of(i32 width) {
  const i32 padded = width + guard_pixels<T>;
  return padded + (padded % 2 == 0 && sizeof(T) < 16 ? 1 : 0);
}

template <class T>
T* aligned(std::vector<T>& memory) {
  const auto address = reinterpret_cast<uintptr_t>(memory.data());
  return memory.data() + ((64 - address % 64) % 64) / sizeof(T);
}

}  // namespace

template <class T>
Canvas<T>::Canvas(i32 width, i32 height, Content content, u64 seed)
    : memory_(static_cast<size_t>(stride_of<T>(width)) * static_cast<size_t>(height) + 2 * 64 / sizeof(T),
              T{5, 6, 7, 8}),
      first_(aligned(memory_)),
      count_(static_cast<size_t>(stride_of<T>(width)) * static_cast<size_t>(height)),
      world_(first_, width, height, stride_of<T>(width) * static_cast<i32>(sizeof(T))) {
  Source<T> source(content, seed);
  for (i32 y = 0; y < height; ++y)
    for (i32 x = 0; x < width; ++x) *world_.At(x, y) = source.next();
}

template class Canvas<ZR_Pixel8>;
template class Canvas<ZR_Pixel16>;
template class Canvas<ZR_PixelFloat>;

const ZR_LinearBlendingTables& square_tables() {
  static const ZR_LinearBlendingTables tables = [] {
    ZR_LinearBlendingTables t{};
    for (u32 i = 0; i < 256; ++i) t.to_linear[i] = static_cast<u16>((i * i * 32768 + 32512) / 65025);
    u32 root = 0;  // of 262144 k, rounded down
    for (u32 k = 0; k <= 4096; ++k) {
      while ((root + 1) * (root + 1) <= k * 262144u) ++root;
      t.from_linear[k] = static_cast<u16>(root);
    }
    t.to_linear_gamma = 2.0f;
    t.from_linear_gamma = 0.5f;
    return t;
  }();
  return tables;
}

}  // namespace zr::tool
