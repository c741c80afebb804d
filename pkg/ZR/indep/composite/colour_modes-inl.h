// The transfer modes that work on a whole colour or on alpha alone: see transfer_modes-inl.h.
#if defined(ZR_COMPOSITE_COLOUR_MODES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_COLOUR_MODES_INL_H
#undef ZR_COMPOSITE_COLOUR_MODES_INL_H
#else
#define ZR_COMPOSITE_COLOUR_MODES_INL_H
#endif

#include "composite/mode_colour-inl.h"
#include "composite/mode_entry-inl.h"
#include "simd/formulas.h"

ZR_BEGIN_FORMULAS

// ------------------------------------------------------------------------------ whole colours

// recoloured: the new colour from the source's and that of the destination behind which the source has
// been composited.

struct Hue : Mode<XferHue, ModeKind::colour> {
  template <class M>
  static ZR_PURE Px<M> recoloured(const Px<M>& s, const Px<M>& d) {
    return with_luma(with_saturation(s, saturation_of(d)), luma_of(d));
  }
};

struct Saturation : Mode<XferSaturation, ModeKind::colour> {
  template <class M>
  static ZR_PURE Px<M> recoloured(const Px<M>& s, const Px<M>& d) {
    return with_luma(with_saturation(d, saturation_of(s)), luma_of(d));
  }
};

struct Color : Mode<XferColor, ModeKind::colour> {
  template <class M>
  static ZR_PURE Px<M> recoloured(const Px<M>& s, const Px<M>& d) {
    return with_luma(s, luma_of(d));
  }
};

struct Luminosity : Mode<XferLuminosity, ModeKind::colour> {
  template <class M>
  static ZR_PURE Px<M> recoloured(const Px<M>& s, const Px<M>& d) {
    return with_luma(d, luma_of(s));
  }
};

// wanted: whether the pixel is recoloured at all, by the lumas of source and destination.

struct LighterColor : Mode<XferLighterColor, ModeKind::colour> {
  static ZR_PURE auto wanted(auto source_luma, auto luma) { return source_luma > luma; }
  template <class M>
  static ZR_PURE Px<M> recoloured(const Px<M>& s, const Px<M>&) {
    return s;
  }
};

struct DarkerColor : Mode<XferDarkerColor, ModeKind::colour> {
  static ZR_PURE auto wanted(auto source_luma, auto luma) { return source_luma < luma; }
  template <class M>
  static ZR_PURE Px<M> recoloured(const Px<M>& s, const Px<M>&) {
    return s;
  }
};

// ------------------------------------------------------------------------------ alpha only

// alpha: the new alpha of the destination from its own (D), the source's colour and A.

struct MultiplyAlpha : Mode<XferMultiplyAlpha, ModeKind::alpha_only> {
  template <class M>
  static ZR_PURE auto alpha(const Px<M>&, auto A, auto D) {
    return M::mul(D, A);
  }
};

struct MultiplyAlphaLuma : Mode<XferMultiplyAlphaLuma, ModeKind::alpha_only> {
  template <class M>
  static ZR_PURE auto alpha(const Px<M>& s, auto A, auto D) {
    return M::luma_alpha(M::mul(D, M::mul(luma_of(s), A)));
  }
};

struct MultiplyNotAlpha : Mode<XferMultiplyNotAlpha, ModeKind::alpha_only> {
  template <class M>
  static ZR_PURE auto alpha(const Px<M>&, auto A, auto D) {
    return M::mul(D, M::inv(A));
  }
};

struct MultiplyNotAlphaLuma : Mode<XferMultiplyNotAlphaLuma, ModeKind::alpha_only> {
  template <class M>
  static ZR_PURE auto alpha(const Px<M>& s, auto A, auto D) {
    return M::luma_alpha(M::mul(D, M::inv(M::mul(luma_of(s), A))));
  }
};

ZR_END_FORMULAS

#endif
