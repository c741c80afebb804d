// The table of C library functions: plug-ins and the library compute with the same ones.
#include "host/ansi_functions.h"

#include <GX/gx.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <iterator>

namespace zr {
namespace {

using Unary = f64(f64);
using Binary = f64(f64, f64);

void* unary(Unary* function) { return reinterpret_cast<void*>(function); }
void* binary(Binary* function) { return reinterpret_cast<void*>(function); }

}  // namespace

void fill_ansi_functions(void* out[ansi_function_count]) {
  void* const functions[] = {unary(&std::atan),
                             binary(&std::atan2),
                             unary(&std::ceil),
                             unary(&std::cos),
                             unary(&std::exp),
                             unary(&std::fabs),
                             unary(&std::floor),
                             binary(&GX_fmod),  // not the C library's: both sides use one remainder
                             binary(&ZR_Hypot),
                             unary(&std::log),
                             unary(&std::log10),
                             binary(&std::pow),
                             unary(&std::sin),
                             unary(&std::sqrt),
                             unary(&std::tan),
                             reinterpret_cast<void*>(&std::sprintf),
                             reinterpret_cast<void*>(static_cast<char* (*)(char*, const char*)>(&std::strcpy)),
                             unary(&std::asin),
                             unary(&std::acos)};
  static_assert(std::size(functions) == ansi_function_count);
  std::copy(std::begin(functions), std::end(functions), out);
}

}  // namespace zr
