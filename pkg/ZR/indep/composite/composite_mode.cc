// The composite records: from the plain form to the extended one, and on to what a row is blended with.
#include <ZR/composite.h>

#include <cmath>

ZR_CompositeModePlus::ZR_CompositeModePlus(const ZR_CompositeMode& plain)
    : xfer(plain.xfer), rand_seed(plain.rand_seed), keep_alpha(plain.keep_alpha != 0) {
  const f32 coarse = static_cast<f32>(plain.opacity) / 255.0f;
  const f32 exact = zr::widen_16_to_float(plain.opacity16);
  // The exact field counts only while it agrees with the other to within one 8-bit step: a caller that
  // knows nothing of it leaves anything in there.
  const bool they_differ = static_cast<f64>(std::abs(coarse - exact)) >= 0.00392156862745098;
  opacity = they_differ ? coarse : exact;
}

namespace {

template <class T>
zr::Channel<T> channel_of_opacity(f32 opacity) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return opacity;
  else
    return zr::narrow_float_alpha<T>(opacity);  // rounded and, as alpha there, not clamped
}

}  // namespace

template <class T>
ZR_BlendingMode<T>::ZR_BlendingMode(const ZR_CompositeModePlus& plus)
    : mode(plus.xfer),
      seed(plus.rand_seed),
      opacity(channel_of_opacity<T>(plus.opacity)),
      keep_alpha(plus.keep_alpha ? 1 : 0) {}

template struct ZR_BlendingMode<ZR_Pixel8>;
template struct ZR_BlendingMode<ZR_Pixel16>;
template struct ZR_BlendingMode<ZR_PixelFloat>;
