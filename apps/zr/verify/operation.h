// What `zr verify` repeats: operations by name and depth, each with fixed inputs.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "verify/digest.h"
#include "verify/canvas.h"

namespace zr::tool {

struct Operation {
  std::string name;  // "transfer/screen"; what stands before the '/' names the group
  i32 depth;         // 8, 16 or 32, of what the operation reads
  // Puts the results into the digest. Any thread count, any instruction set; nothing is left behind.
  std::function<void(Digest&)> run;
  // The rule itself asks for a processor with vectors: without them the result is another, and not compared.
  bool vector_rule = false;
};
using Operations = std::vector<Operation>;

// Adds `body.template operator()<Pixel>(Digest&)` for each of the pixels.
template <class... Pixels, class Body>
void add_for(Operations& list, const std::string& name, Body body) {
  (list.push_back({name, static_cast<i32>(Depth<Pixels>::bits),
                   [body](Digest& digest) { body.template operator()<Pixels>(digest); }}),
   ...);
}
template <class Body>
void add_all(Operations& list, const std::string& name, Body body) {
  add_for<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>(list, name, body);
}
// Adds `body.template operator()<Pixel>(Digest&, Content)`: with mixed pixels under its name and, for the depths that
// have such, with illegal ones as "hostile/NAME".
template <class... Pixels, class Body>
void add_with_hostile(Operations& list, const std::string& name, Body body) {
  const auto add = [&]<class Pixel>(const std::string& full_name, Content content) {
    add_for<Pixel>(list, full_name,
                   [body, content]<class T>(Digest& digest) { body.template operator()<T>(digest, content); });
  };
  (add.template operator()<Pixels>(name, Content::mixed), ...);
  ((std::is_same_v<Pixels, ZR_Pixel8> ? void() : add.template operator()<Pixels>("hostile/" + name, Content::hostile)),
   ...);
}
template <class Body>
void add_all_with_hostile(Operations& list, const std::string& name, Body body) {
  add_with_hostile<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>(list, name, body);
}

// The entries of one file each.
void add_world_operations(Operations& list);
void add_row_operations(Operations& list);
void add_transfer_operations(Operations& list);
void add_sample_operations(Operations& list);
void add_copy_operations(Operations& list);
void add_drawing_operations(Operations& list);
void add_transform_operations(Operations& list);
void add_filter_operations(Operations& list);
void add_mask_operations(Operations& list);

// All of them, by name, then depth.
const Operations& all_operations();

}  // namespace zr::tool
