// Tables of sums as plain numbers.
#pragma once

#include <ZR/summed_area.h>

#include <vector>

inline std::vector<f64> numbers_of(const ZR_SummedAreaTable& table, i32 entries) {
  std::vector<f64> numbers;
  const auto take = [&](const auto* entry) {
    for (i32 i = 0; i < entries; ++i)
      numbers.insert(numbers.end(), {entry[i].alpha, entry[i].red, entry[i].green, entry[i].blue});
  };
  table.UsesDouble() ? take(table.DoubleTable()) : take(table.FloatTable());
  return numbers;
}
