// What a host does with ZR_BENCH_THREADS above 1: composites, transforms, copies, blends and
// convolutions go in bands over the
// Hostkit's threads, work on single lines is dealt out by ZR_IterateGeneric. With one thread the calls are the
// library's own.
#pragma once

#include <ZR/copy_bits.h>
#include <ZR/filter.h>
#include <ZR/hostkit.h>
#include <ZR/zr.h>

#include <cstdlib>

namespace bench {

inline int threads_wanted() {
  const char* const threads = std::getenv("ZR_BENCH_THREADS");
  return threads != nullptr ? std::atoi(threads) : 1;
}

inline const auto transfer_rect = threads_wanted() == 1 ? ZR_TransferRect : ZRHost_TransferRect;
inline const auto convolve = threads_wanted() == 1 ? ZR_Convolve : ZRHost_Convolve;
inline const auto transform_world = threads_wanted() == 1 ? ZR_TransformWorld : ZRHost_TransformWorld;

// The divided form of a copy or a blend.
inline auto divided(decltype(&ZR_CopyBits_Draft) copy) {
  if (threads_wanted() == 1) return copy;
  return copy == &ZR_CopyBits_Draft         ? ZRHost_CopyBits_Draft
         : copy == &ZR_CopyBits_HQ_Straight ? ZRHost_CopyBits_HQ_Straight
                                            : ZRHost_CopyBits_HQ_Premul;
}
inline auto divided(decltype(&ZR_Blend) blend) {
  if (threads_wanted() == 1) return blend;
  return blend == &ZR_Blend_Premul ? ZRHost_Blend_Premul : ZRHost_Blend;
}

// Runs body(line) for lines 0 to count-1.
template <class Body>
void each_line(i32 count, const Body& body) {
  const auto one = [](void* refcon, i32, i32 line, i32) -> i32 {
    (*static_cast<const Body*>(refcon))(line);
    return 0;
  };
  ZR_IterateGeneric(count, const_cast<Body*>(&body), one);
}

}  // namespace bench
