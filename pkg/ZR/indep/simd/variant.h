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

// The end of a file of lane rows. The first, inside the namespace of an instruction set, compiles NAME<T>() there for
// the three depths; the second, compiled once, defines lane_NAME<T>(), which returns what the best compiled set's
// NAME<T>() does, null where there is none.
#define ZR_ROWS_OF_DEPTHS(RESULT, NAME)            \
  template RESULT<ZR_Pixel8>* NAME<ZR_Pixel8>();   \
  template RESULT<ZR_Pixel16>* NAME<ZR_Pixel16>(); \
  template RESULT<ZR_PixelFloat>* NAME<ZR_PixelFloat>();
#define ZR_LANE_ROWS(RESULT, NAME)       \
  namespace zr {                         \
  template <class T>                     \
  RESULT<T>* lane_##NAME() {             \
    ZR_RETURN_BEST(NAME<T>());           \
    return nullptr;                      \
  }                                      \
  ZR_ROWS_OF_DEPTHS(RESULT, lane_##NAME) \
  }
// The same for a function that is no template and returns a pointer.
#define ZR_LANE_CHOICE(RESULT, NAME) \
  namespace zr {                     \
  RESULT lane_##NAME() {             \
    ZR_RETURN_BEST(NAME());          \
    return nullptr;                  \
  }                                  \
  }
