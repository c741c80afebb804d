// Builds the soft-light tables of the deep depths.
#include "composite/soft_light_state.h"

#include <cmath>

namespace zr {

constinit i32 soft_light_16[2 * soft_light_reach]{};
constinit f32 soft_light_float[2 * soft_light_reach]{};

namespace {

f64 low(f64 x) { return x * (1.0 - x); }
f64 high(f64 x) { return (x <= 0.25 ? ((16.0 * x - 12.0) * x + 4.0) * x : std::sqrt(x)) - x; }
// Both curves lie in 0..0.25, so that nothing needs a clamp.
i32 rounded_16(f64 v) { return static_cast<i32>(32768.0 * v + 0.5); }
i32 entry_16(i32 here, i32 next) { return here * 65536 + ((next - here) & 65535); }

}  // namespace

void build_soft_light_tables() {
  for (int i = 0; i < 4096; ++i) {
    const f64 x = i / 4096.0;
    const i32 above = i + soft_light_reach;
    const f64 next = (i + 1) / 4096.0;  // of 1 both curves are 0
    soft_light_16[i] = entry_16(rounded_16(low(x)), rounded_16(low(next)));
    soft_light_16[above] = entry_16(rounded_16(high(x)), rounded_16(high(next)));
    soft_light_float[i] = static_cast<f32>(low(x));
    soft_light_float[above] = static_cast<f32>(high(x));
  }
}

}  // namespace zr
