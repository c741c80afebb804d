// The default profile that all callers share.
#pragma once

#include <ZR/prisma.h>

namespace zr::prisma {

void free_default_profile();

// Runs what may run out of memory; that is told by a thrown code, as all failures are.
template <class Body>
auto with_memory_code(Body&& body) {
  try {
    return body();
  } catch (const std::bad_alloc&) {
    throw i32{ZR_Err_OutOfMemory};  // reported by the allocator
  }
}

}  // namespace zr::prisma
