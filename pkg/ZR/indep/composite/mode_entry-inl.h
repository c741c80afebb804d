// What every entry of the list of transfer modes is made of.
#if defined(ZR_COMPOSITE_MODE_ENTRY_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_MODE_ENTRY_INL_H
#undef ZR_COMPOSITE_MODE_ENTRY_INL_H
#else
#define ZR_COMPOSITE_MODE_ENTRY_INL_H
#endif

#include <ZR/transfer_mode.h>

#include "composite/mode_arithmetic-inl.h"
#include "composite/mode_row.h"
#include "simd/formulas.h"

ZR_BEGIN_FORMULAS

template <ZR_TransferMode Number, ModeKind Kind, RowClass Class = usual_row_class(Kind)>
struct Mode {
  static constexpr ZR_TransferMode number = Number;
  static constexpr ModeKind kind = Kind;
  static constexpr RowClass row_class = Class;
};

ZR_END_FORMULAS

#endif
