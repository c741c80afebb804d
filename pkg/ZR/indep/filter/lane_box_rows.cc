// The box blur's inner loop on lanes.
#include "filter/box_rows.h"

namespace zr {

template <class T>
const BoxRows<T>* lane_box_rows() {
  return nullptr;
}
template const BoxRows<ZR_Pixel8>* lane_box_rows();
template const BoxRows<ZR_Pixel16>* lane_box_rows();
template const BoxRows<ZR_PixelFloat>* lane_box_rows();

}  // namespace zr
