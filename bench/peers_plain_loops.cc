// The plain loops; see peers_plain.h.
#include "peers_plain.h"

#include <cmath>
#include <cstring>
#include <type_traits>

namespace plain {
namespace {

template <class C>
constexpr float white = sizeof(C) == 1   ? 255.0f
                        : sizeof(C) == 2 ? 32768.0f
                                         : 1.0f;

template <class C>
inline float unit(C v) {
  return static_cast<float>(v) * (1.0f / white<C>);
}
// Values are not below 0 here.
template <class C>
inline C stored(float v) {
  if constexpr (std::is_same_v<C, float>)
    return v;
  else
    return static_cast<C>(static_cast<int32_t>((v < 1.0f ? v : 1.0f) * white<C> + 0.5f));
}

template <class C>
inline C product(C c, C a) {
  return static_cast<C>((uint32_t{c} * a + 16383) >> 15);
}
template <>
inline float product(float c, float a) {
  return c * a;
}

// Most modes weigh their result by both alphas; `weighs_source` ones take what the source adds under its alpha.
struct Weighted {
  static constexpr bool weighs_source = false;
};
struct Faded {
  static constexpr bool weighs_source = true;
};
struct InFront : Weighted {
  static float mix(float s, float) { return s; }
};
struct Multiply : Weighted {
  static float mix(float s, float d) { return s * d; }
};
struct Screen : Weighted {
  static float mix(float s, float d) { return s + d - s * d; }
};
struct HardLight : Weighted {
  static float mix(float s, float d) { return s < 0.5f ? 2 * s * d : 1 - 2 * (1 - s) * (1 - d); }
};
struct Overlay : Weighted {
  static float mix(float s, float d) { return HardLight::mix(d, s); }
};
struct SoftLight : Weighted {
  static float mix(float s, float d) {
    const float g = d < 0.25f ? ((16 * d - 12) * d + 4) * d : std::sqrt(d);
    const float more = 2 * s - 1;
    return s < 0.5f ? d + more * (d - d * d) : d + more * (g - d);
  }
};
struct Difference : Faded {
  static float mix(float s, float d) { return std::fabs(s - d); }
};
struct ColorDodge : Faded {
  static float mix(float s, float d) {
    const float q = d / (1 - s);
    return d + s < 1 ? q : 1;
  }
};

template <class F, bool masked, class C>
void blend_by(size_t n, const Pixel<C>* __restrict src, const Pixel<C>* __restrict mask, Pixel<C>* __restrict dst) {
  for (size_t i = 0; i < n; ++i) {
    const Pixel<C> s = src[i], d = dst[i];
    float a = unit(s.a);
    if constexpr (masked) a *= unit(mask[i].a);
    const float ground = unit(d.a), alpha = a + ground - a * ground, per = alpha > 0 ? 1 / alpha : 0;
    const float ws = a * (1 - ground) * per, wd = ground * (1 - a) * per, wf = a * ground * per;
    const auto channel = [=](C from, C to) {
      const float x = unit(from), y = unit(to);
      if constexpr (F::weighs_source) return stored<C>(F::mix(a * x, ground * y) * per);
      return stored<C>(ws * x + wd * y + wf * F::mix(x, y));
    };
    dst[i] = {stored<C>(alpha), channel(s.r, d.r), channel(s.g, d.g), channel(s.b, d.b)};
  }
}
template <class F, class C>
void blend_with(size_t n, const Pixel<C>* src, const Pixel<C>* mask, Pixel<C>* dst) {
  mask != nullptr ? blend_by<F, true>(n, src, mask, dst) : blend_by<F, false>(n, src, mask, dst);
}

}  // namespace

template <class C>
void premultiply(size_t n, Pixel<C>* pixels) {
  for (size_t i = 0; i < n; ++i) {
    const Pixel<C> p = pixels[i];
    pixels[i] = {p.a, product(p.r, p.a), product(p.g, p.a), product(p.b, p.a)};
  }
}

// At 8 bits whole pixels in words are the faster loop.
template <>
void premultiply(size_t n, Pixel<uint8_t>* pixels) {
  for (size_t i = 0; i < n; ++i) {
    uint32_t p;
    std::memcpy(&p, pixels + i, 4);
    const uint32_t a = p & 255;
    const auto channel = [a](uint32_t c) {
      const uint32_t t = c * a + 128;
      return (t + (t >> 8)) >> 8;
    };
    p = a | channel(p >> 8 & 255) << 8 | channel(p >> 16 & 255) << 16 | channel(p >> 24) << 24;
    std::memcpy(pixels + i, &p, 4);
  }
}

template <class C>
void unmultiply(size_t n, Pixel<C>* pixels) {
  for (size_t i = 0; i < n; ++i) {
    const Pixel<C> p = pixels[i];
    const float by = p.a > 0 ? 1.0f / static_cast<float>(p.a) : white<C>;
    const auto channel = [=](C c) {
      const float v = static_cast<float>(c) * by;
      return stored<C>(p.a > 0 ? v : 1.0f);
    };
    pixels[i] = {p.a, channel(p.r), channel(p.g), channel(p.b)};
  }
}

template <class C>
void blend(Mode mode, size_t n, const Pixel<C>* src, const Pixel<C>* mask, Pixel<C>* dst) {
  switch (mode) {
    case Mode::in_front: return blend_with<InFront>(n, src, mask, dst);
    case Mode::multiply: return blend_with<Multiply>(n, src, mask, dst);
    case Mode::screen: return blend_with<Screen>(n, src, mask, dst);
    case Mode::overlay: return blend_with<Overlay>(n, src, mask, dst);
    case Mode::soft_light: return blend_with<SoftLight>(n, src, mask, dst);
    case Mode::hard_light: return blend_with<HardLight>(n, src, mask, dst);
    case Mode::difference: return blend_with<Difference>(n, src, mask, dst);
    case Mode::color_dodge: return blend_with<ColorDodge>(n, src, mask, dst);
  }
}

template <class From, class To>
void convert(size_t n, const Pixel<From>* src, Pixel<To>* dst) {
  const From* __restrict const from = &src->a;
  To* __restrict const to = &dst->a;
  for (size_t i = 0; i < n * 4; ++i) {
    if constexpr (std::is_same_v<From, float>)
      to[i] = stored<To>(from[i] > 0 ? from[i] : 0.0f);
    else
      to[i] = stored<To>(unit(from[i]));
  }
}

void look_up(size_t n, const Pixel<uint8_t>* __restrict src, const uint8_t (&tables)[4][256],
             Pixel<uint8_t>* __restrict dst) {
  for (size_t i = 0; i < n; ++i)
    dst[i] = {tables[0][src[i].a], tables[1][src[i].r], tables[2][src[i].g], tables[3][src[i].b]};
}

#define ZR_PLAIN_DEPTH(C)                       \
  template void premultiply(size_t, Pixel<C>*); \
  template void unmultiply(size_t, Pixel<C>*);  \
  template void blend(Mode, size_t, const Pixel<C>*, const Pixel<C>*, Pixel<C>*)
ZR_PLAIN_DEPTH(uint8_t);
ZR_PLAIN_DEPTH(uint16_t);
ZR_PLAIN_DEPTH(float);
#define ZR_PLAIN_PAIR(A, B)                                  \
  template void convert(size_t, const Pixel<A>*, Pixel<B>*); \
  template void convert(size_t, const Pixel<B>*, Pixel<A>*)
ZR_PLAIN_PAIR(uint8_t, uint16_t);
ZR_PLAIN_PAIR(uint8_t, float);
ZR_PLAIN_PAIR(uint16_t, float);

}  // namespace plain
