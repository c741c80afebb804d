// Formulas that are compiled once for single numbers and once for the lanes of each instruction set stand in
// files named -inl.h between ZR_BEGIN_FORMULAS and ZR_END_FORMULAS. Single numbers live in zr itself (an inline
// namespace), lanes in the namespace of their instruction set. A file of lanes includes "simd/lanes-inl.h" first,
// which says so; functions are ZR_PURE, and lambdas bear ZR_FORMULA, since compilers forget the instruction set there
// and leave long ones out of line, where vectors go by way of memory.
//
// Choices are written pick(condition, a, b), which works out both, or choose(condition, f, g), which calls one
// where the condition is the same in all lanes. Where g is right on either side, where_all(condition, f, g) never
// calls both.
#undef ZR_BEGIN_FORMULAS
#undef ZR_END_FORMULAS
#undef ZR_FORMULA
#undef ZR_PURE
#ifdef ZR_IN_LANES
#define ZR_BEGIN_FORMULAS \
  HWY_BEFORE_NAMESPACE(); \
  namespace zr {          \
  namespace HWY_NAMESPACE {
#define ZR_END_FORMULAS \
  }                     \
  }                     \
  HWY_AFTER_NAMESPACE();
#define ZR_FORMULA HWY_ATTR __attribute__((always_inline))
#define ZR_PURE HWY_INLINE
#else
#define ZR_BEGIN_FORMULAS \
  namespace zr {          \
  inline namespace single {
#define ZR_END_FORMULAS \
  }                     \
  }
#define ZR_FORMULA
#define ZR_PURE constexpr
#endif
