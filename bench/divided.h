// What a host does with ZR_BENCH_THREADS above 1: composites and transforms go in bands over the Hostkit's threads,
// work on single lines is dealt out by ZR_IterateGeneric. With one thread the calls are the library's own.
#pragma once

#include <ZR/hostkit.h>
#include <ZR/zr.h>

#include <cstdlib>

namespace bench {

inline int threads_wanted() {
  const char* const threads = std::getenv("ZR_BENCH_THREADS");
  return threads != nullptr ? std::atoi(threads) : 1;
}

inline const auto transfer_rect = threads_wanted() == 1 ? ZR_TransferRect : ZRHost_TransferRect;
inline const auto transform_world = threads_wanted() == 1 ? ZR_TransformWorld : ZRHost_TransformWorld;

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
