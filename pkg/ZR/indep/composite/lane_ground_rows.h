// Ground rows of lanes: the fastest that this processor has, or null.
#pragma once

#include "world/slot_table.h"

namespace zr {

template <class T>
struct GroundRows {
  RowFunc<T>*white_fade, *white_unfade, *grey_fade, *grey_unfade;
  UnionAlphaFunc<T>* union_alpha;
};
template <class T>
const GroundRows<T>* lane_ground_rows();

// The bodies of single numbers.
template <class T>
const GroundRows<T>& single_ground_rows();

}  // namespace zr
