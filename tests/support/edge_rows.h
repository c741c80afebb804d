// Rows that end or begin at a page that cannot be read, and instruction sets one after the other.
#pragma once

#include <HB/hb.h>
#include <ZR/depth.h>
#include <gtest/gtest.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cmath>
#include <cstring>
#include <random>
#include <type_traits>

#include "simd/variant.h"

// n pixels between two pages that cannot be touched, at either of them.
class EdgeRow {
 public:
  explicit EdgeRow(std::size_t pages = 2) : page_(static_cast<std::size_t>(sysconf(_SC_PAGESIZE))), pages_(pages) {
    block_ = static_cast<char*>(mmap(nullptr, (pages_ + 2) * page_, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0));
    if (mprotect(block_ + page_, pages_ * page_, PROT_READ | PROT_WRITE) != 0) std::abort();
  }
  EdgeRow(const EdgeRow&) = delete;
  EdgeRow& operator=(const EdgeRow&) = delete;
  ~EdgeRow() { munmap(block_, (pages_ + 2) * page_); }
  template <class T>
  T* at(i32 n, bool at_end) {
    return reinterpret_cast<T*>(at_end ? block_ + (pages_ + 1) * page_ - static_cast<std::size_t>(n) * sizeof(T)
                                       : block_ + page_);
  }

 private:
  std::size_t page_, pages_;
  char* block_;
};

// Caps the processor record for the life of the object; the words are those of HB_G_CPU_DataP.
class Instructions {
 public:
  static constexpr const char* names[] = {"scalar", "sse4", "avx2", "avx512"};
  explicit Instructions(int level) : before_(HB_G_CPU_DataP) {
    std::memcpy(words_, before_, sizeof words_);
    constexpr int first_above[] = {zr::cpu_sse2, zr::cpu_avx2, zr::cpu_avx512, HB_CPU_WordCount};
    for (int i = first_above[level]; i < HB_CPU_WordCount; ++i) words_[i] = 0;
    HB_G_CPU_DataP = words_;
  }
  ~Instructions() { HB_G_CPU_DataP = before_; }
  static bool has(int level) {
    constexpr int needed[] = {0, zr::cpu_sse4, zr::cpu_avx2, zr::cpu_avx512};
    return level == 0 || HB_G_CPU_DataP[needed[level]] != 0;
  }

 private:
  const i32* before_;
  i32 words_[HB_CPU_WordCount];
};

// Every value where something changes, the illegal ones too, and any others; runs of opaque and clear pixels.
template <class T>
void fill_edgy(std::mt19937& random, i32 n, T* row) {
  const auto channel = [&]() -> zr::Channel<T> {
    const u32 word = static_cast<u32>(random());
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      constexpr f32 edges[] = {0,      1,     0.5f, -0.0f, 1e-40f,   -0.25f,    1.5f,
                               1e-17f, 1e30f, 2,    NAN,   INFINITY, -INFINITY, 0.99999994f};
      return (word & 3) == 0 ? edges[(word >> 2) % std::size(edges)] : static_cast<f32>(word >> 8) * 0x1p-24f;
    } else {
      constexpr u32 white = static_cast<u32>(zr::Depth<T>::white), half = static_cast<u32>(zr::Depth<T>::half);
      constexpr u32 edges[] = {0, 1, half - 1, half, half + 1, white - 1, white};
      if ((word & 0xfff000) == 0) return static_cast<zr::Channel<T>>(white + 1 + word % 100);
      return static_cast<zr::Channel<T>>((word & 3) == 0 ? edges[(word >> 2) % 7] : (word >> 2) % (white + 1));
    }
  };
  for (i32 i = 0; i < n;) {
    const u32 kind = static_cast<u32>(random()) % 6;
    for (i32 run = static_cast<i32>(random() % 40); run >= 0 && i < n; --run, ++i) {
      row[i] = {channel(), channel(), channel(), channel()};
      if (kind == 0) row[i].alpha = static_cast<zr::Channel<T>>(zr::Depth<T>::white);
      if (kind == 1) row[i].alpha = 0;
    }
  }
}

// The same bits, or NaN on both sides.
template <class T>
bool same_pixel(const T& a, const T& b) {
  const auto same = [](auto p, auto q) { return p == q ? std::memcmp(&p, &q, sizeof p) == 0 : p != p && q != q; };
  return same(a.alpha, b.alpha) && same(a.red, b.red) && same(a.green, b.green) && same(a.blue, b.blue);
}
