// The Gaussian blur's inner loop on lanes.
#include "filter/bell_rows.h"

namespace zr {

template <class T>
const BellRows<T>* lane_bell_rows() {
  return nullptr;
}
template const BellRows<ZR_Pixel8>* lane_bell_rows();
template const BellRows<ZR_Pixel16>* lane_bell_rows();
template const BellRows<ZR_PixelFloat>* lane_bell_rows();

}  // namespace zr
