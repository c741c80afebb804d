// A value that may change from frame to frame: straight lines between keys, held before and after.
#pragma once

#include <ZR/zr.h>

#include <vector>

namespace zr::tool {

struct Point {
  f64 x = 0, y = 0;
};
constexpr Point mix(const Point& a, const Point& b, f64 t) { return {a.x + (b.x - a.x) * t, a.y + (b.y - a.y) * t}; }
constexpr f64 mix(f64 a, f64 b, f64 t) { return a + (b - a) * t; }

template <class Value>
class Keyed {
 public:
  struct Key {
    i32 frame;
    Value value;
  };
  explicit Keyed(Value constant) : keys_{{0, constant}} {}
  // At least one key; frames rise.
  explicit Keyed(std::vector<Key> keys) : keys_(std::move(keys)) {}

  Value at(i32 frame) const {
    if (frame <= keys_.front().frame) return keys_.front().value;
    for (size_t i = 1; i < keys_.size(); ++i) {
      const Key &from = keys_[i - 1], &to = keys_[i];
      if (frame < to.frame)
        return mix(from.value, to.value,
                   static_cast<f64>(frame - from.frame) / static_cast<f64>(to.frame - from.frame));
    }
    return keys_.back().value;
  }

 private:
  std::vector<Key> keys_;
};

}  // namespace zr::tool
