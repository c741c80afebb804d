// HB: counted memory for standard containers.
#pragma once

#include <HB/hb.h>
#include <ZR/errors.h>

#include <limits>
#include <new>

// Label::text names the memory in the message that is shown before std::bad_alloc is thrown.
template <class T, class Label>
struct HB_Allocator {
  using value_type = T;
  template <class Other>
  struct rebind {
    using other = HB_Allocator<Other, Label>;
  };
  constexpr HB_Allocator() = default;
  template <class Other>
  constexpr HB_Allocator(const HB_Allocator<Other, Label>&) {}

  T* allocate(std::size_t count) {
    static_assert(alignof(T) <= 16);
    const bool fits = count <= std::numeric_limits<std::size_t>::max() / sizeof(T);
    void* const block = HB_AllocatePtr(fits ? count * sizeof(T) : std::numeric_limits<std::size_t>::max(), Label::text,
                                       ZR_ModuleCode | ZR_Site_Plain);
    if (block == nullptr) throw std::bad_alloc();
    return static_cast<T*>(block);
  }
  void deallocate(T* block, std::size_t) { HB_FreePtr(block); }
  template <class Other>
  constexpr bool operator==(const HB_Allocator<Other, Label>&) const {
    return true;
  }
};
