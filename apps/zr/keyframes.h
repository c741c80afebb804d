// A value that may change from frame to frame: straight lines between keys, held before and after.
#pragma once

#include <ZR/zr.h>

#include <vector>

namespace zr::tool {

struct Point {
  f64 x = 0, y = 0;
};
constexpr f64 mix(f64 a, f64 b, f64 t) { return a + (b - a) * t; }
constexpr Point mix(const Point& a, const Point& b, f64 t) { return {mix(a.x, b.x, t), mix(a.y, b.y, t)}; }
constexpr GX_Matrix3 mix(const GX_Matrix3& a, const GX_Matrix3& b, f64 t) {
  GX_Matrix3 mixed{};
  for (int row = 0; row < 3; ++row)
    for (int column = 0; column < 3; ++column) mixed.m[row][column] = mix(a.m[row][column], b.m[row][column], t);
  return mixed;
}

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

  // `time` in frames; the moments between two frames count too.
  Value at(f64 time) const {
    if (time <= keys_.front().frame) return keys_.front().value;
    for (size_t i = 1; i < keys_.size(); ++i) {
      const Key &from = keys_[i - 1], &to = keys_[i];
      if (time < to.frame)
        return mix(from.value, to.value, (time - from.frame) / static_cast<f64>(to.frame - from.frame));
    }
    return keys_.back().value;
  }

  const std::vector<Key>& keys() const { return keys_; }

 private:
  std::vector<Key> keys_;
};

}  // namespace zr::tool
