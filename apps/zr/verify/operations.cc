// All operations of `zr verify`.
#include <algorithm>
#include <tuple>

#include "verify/operation.h"

namespace zr::tool {

const Operations& all_operations() {
  static const Operations list = [] {
    Operations all;
    add_world_operations(all);
    add_row_operations(all);
    add_transfer_operations(all);
    add_sample_operations(all);
    add_copy_operations(all);
    add_drawing_operations(all);
    add_transform_operations(all);
    add_filter_operations(all);
    add_mask_operations(all);
    std::sort(all.begin(), all.end(), [](const Operation& a, const Operation& b) {
      return std::tie(a.name, a.depth) < std::tie(b.name, b.depth);
    });
    return all;
  }();
  return list;
}

}  // namespace zr::tool
