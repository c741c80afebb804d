// Linear-light tables of a plain gamma.
#pragma once

#include <ZR/zr.h>

#include <cmath>

inline ZR_LinearBlendingTables gamma_tables(double gamma) {
  ZR_LinearBlendingTables t;
  for (int i = 0; i < 256; ++i) t.to_linear[i] = static_cast<u16>(std::lround(32768 * std::pow(i / 255.0, gamma)));
  for (int k = 0; k <= 4096; ++k)
    t.from_linear[k] = static_cast<u16>(std::lround(32768 * std::pow(k / 4096.0, 1 / gamma)));
  t.to_linear_gamma = static_cast<f32>(gamma);
  t.from_linear_gamma = static_cast<f32>(1 / gamma);
  return t;
}
