// Division by a whole number as a product.
#pragma once

#include <ZR/types.h>

#include <bit>

namespace zr {

// n / divisor is n * factor >> 31 >> bits for all n below 2^31 and divisors from 2 on: `bits` hold divisor - 1, so
// that factor = ceil(2^(31 + bits) / divisor) fits 32 bits, and what it has too much times n stays below one part
// in divisor.
struct ExactReciprocal {
  u32 factor;
  i32 bits;

  static constexpr ExactReciprocal of(i32 divisor) {
    const u32 d = divisor < 2 ? 2 : static_cast<u32>(divisor);
    const i32 bits = std::bit_width(d - 1);
    return {static_cast<u32>(((u64{1} << (31 + bits)) + d - 1) / d), bits};
  }
};

}  // namespace zr
