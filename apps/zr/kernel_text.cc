// Convolution kernels as people write them: "1 2 1; 2 4 2; 1 2 1".
#include "kernel_text.h"

#include <algorithm>
#include <charconv>
#include <numeric>
#include <string_view>

namespace zr::tool {
namespace {

std::string shortened(std::string_view text) {
  return '"' + std::string(text.substr(0, 40)) + (text.size() > 40 ? "..." : "") + '"';
}

i32 parse_tap(std::string_view text) {
  i32 tap = 0;
  // A sign that people write and from_chars does not read.
  const std::string_view digits = text.size() > 1 && text[0] == '+' ? text.substr(1) : text;
  const auto [stop, error] = std::from_chars(digits.data(), digits.data() + digits.size(), tap);
  const bool whole = error == std::errc() && stop == digits.data() + digits.size() && digits[0] != '+';
  if (!whole || tap < -kLargestTap || tap > kLargestTap)
    throw KernelError("has " + shortened(text) + " among its taps; a tap is a whole number -" +
                      std::to_string(kLargestTap) + " to " + std::to_string(kLargestTap));
  return tap;
}

std::vector<i32> parse_row(std::string_view text) {
  static constexpr std::string_view kGaps = " \t,";
  std::vector<i32> row;
  for (;;) {
    const size_t begin = text.find_first_not_of(kGaps);
    if (begin == std::string_view::npos) return row;
    const size_t end = std::min(text.find_first_of(kGaps, begin), text.size());
    row.push_back(parse_tap(text.substr(begin, end - begin)));
    text.remove_prefix(end);
  }
}

}  // namespace

i64 Kernel::sum() const { return std::accumulate(taps.begin(), taps.end(), i64{0}); }

Kernel kernel_of_rows(const std::vector<std::vector<i32>>& rows) {
  const size_t height = rows.size(), width = rows.empty() ? 0 : rows.front().size();
  if (width == 0) throw KernelError("is empty; it must be rows of numbers, such as \"1 2 1; 2 4 2; 1 2 1\"");
  for (size_t y = 0; y < height; ++y)
    if (rows[y].size() != width)
      throw KernelError("has " + std::to_string(rows[y].size()) + " numbers in row " + std::to_string(y + 1) +
                        ", but " + std::to_string(width) + " in the first");
  const std::string measures = std::to_string(width) + " x " + std::to_string(height);
  const std::string expected = "; it must be one row, one column or a square, each side an odd number of taps, 1 to " +
                               std::to_string(kLargestKernel);
  const size_t most = static_cast<size_t>(kLargestKernel);
  const bool shaped = width == height || width == 1 || height == 1;
  if (!shaped || width % 2 == 0 || height % 2 == 0 || width > most || height > most)
    throw KernelError("is " + measures + expected);
  Kernel kernel;
  kernel.shape = width == height ? Kernel::Shape::kSquare : height == 1 ? Kernel::Shape::kRow : Kernel::Shape::kColumn;
  kernel.size = static_cast<i32>(std::max(width, height));
  kernel.taps.clear();
  for (const std::vector<i32>& row : rows) kernel.taps.insert(kernel.taps.end(), row.begin(), row.end());
  return kernel;
}

Kernel parse_kernel(const std::string& text) {
  std::vector<std::vector<i32>> rows;
  std::string_view rest = text;
  // A ';' behind the last row opens no further one.
  while (!rest.empty() && rest.find_first_not_of(" \t,;") != std::string_view::npos) {
    const size_t end = std::min(rest.find(';'), rest.size());
    rows.push_back(parse_row(rest.substr(0, end)));
    rest.remove_prefix(std::min(end + 1, rest.size()));
  }
  return kernel_of_rows(rows);
}

}  // namespace zr::tool
