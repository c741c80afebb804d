// A 128-bit fingerprint of results.
#include "verify/digest.h"

#define XXH_INLINE_ALL
#include <xxhash.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <limits>

namespace zr::tool {
namespace {

template <class Float>
void add_floats(Digest& digest, std::span<const Float> values) {
  Float block[256];
  while (!values.empty()) {
    const size_t count = std::min(values.size(), std::size(block));
    for (size_t i = 0; i < count; ++i)
      block[i] = std::isnan(values[i]) ? std::numeric_limits<Float>::quiet_NaN() : values[i];
    digest.bytes(block, count * sizeof(Float));
    values = values.subspan(count);
  }
}

}  // namespace

struct Digest::State {
  XXH3_state_t hash;
};

Digest::Digest() : state_(std::make_unique<State>()) { XXH3_128bits_reset(&state_->hash); }
Digest::~Digest() = default;

void Digest::bytes(const void* data, size_t size) { XXH3_128bits_update(&state_->hash, data, size); }
void Digest::floats(std::span<const f32> values) { add_floats(*this, values); }
void Digest::doubles(std::span<const f64> values) { add_floats(*this, values); }

std::string Digest::text() const {
  const XXH128_hash_t hash = XXH3_128bits_digest(&state_->hash);
  char text[33];
  std::snprintf(text, sizeof text, "%016llx%016llx", static_cast<unsigned long long>(hash.high64),
                static_cast<unsigned long long>(hash.low64));
  return text;
}

}  // namespace zr::tool
