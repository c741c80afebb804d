// Convolution kernels as people write them: "1 2 1; 2 4 2; 1 2 1".
#pragma once

#include <ZR/zr.h>

#include <stdexcept>
#include <string>
#include <vector>

namespace zr::tool {

inline constexpr i32 kLargestKernel = 99;  // taps on a side
inline constexpr i32 kLargestTap = 65535;  // either way; with a 16-bit channel the product fits 32 bits

struct Kernel {
  enum class Shape { kRow, kColumn, kSquare };
  Shape shape = Shape::kSquare;
  i32 size = 1;                 // taps on a side, odd
  std::vector<i32> taps = {1};  // row by row
  i64 sum() const;
};

// A text or rows that make no kernel: "is 2 x 2; it must be ...".
class KernelError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// Rows of whole numbers, ';' between rows, blanks or commas between numbers: one row, one column or a square,
// odd on each side. A single number is a square. Throws KernelError.
Kernel parse_kernel(const std::string& text);
// The same from rows of numbers.
Kernel kernel_of_rows(const std::vector<std::vector<i32>>& rows);

}  // namespace zr::tool
