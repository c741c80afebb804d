// Which instruction set the vector rows use: told by the processor record, so that birth and the "cpu"
// preference decide, and read again whenever a row function is asked for.
#pragma once

#include <ZR/platform.h>

namespace zr {

// Words of HB_G_CPU_DataP; each stands for all that vector code of its width takes for granted.
enum CpuWord { cpu_sse2 = 2, cpu_sse4 = 6, cpu_avx2 = 7, cpu_avx512 = 8 };

}  // namespace zr

// Returns a call of the best compiled namespace that the processor has. Stands in the part of a file that is
// compiled once (HWY_ONCE); the namespaces are Highway's. Falls through where there is none.
#if defined(__x86_64__) || defined(__i386__)
#define ZR_RETURN_BEST(...)                                            \
  if (HB_G_CPU_DataP[zr::cpu_avx512] != 0) return N_AVX3::__VA_ARGS__; \
  if (HB_G_CPU_DataP[zr::cpu_avx2] != 0) return N_AVX2::__VA_ARGS__;   \
  if (HB_G_CPU_DataP[zr::cpu_sse4] != 0) return N_SSE4::__VA_ARGS__
#elif defined(__aarch64__)
#define ZR_RETURN_BEST(...) return N_NEON::__VA_ARGS__
#else
#define ZR_RETURN_BEST(...) static_cast<void>(0)
#endif
