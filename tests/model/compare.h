// Worlds with guards for both sides, random content, comparison bit for bit, and reports that a person can
// work through by hand.
#pragma once

#include <gtest/gtest.h>

#include <array>
#include <cstdio>
#include <map>
#include <random>
#include <string>

#include <ZR/transfer_mode.h>

#include "model/rects.h"
#include "support/messages.h"

namespace model {

class BornLibrary : public testing::Environment {
 public:
  void SetUp() override { ASSERT_EQ(ZR_Birth(), 0); }
  void TearDown() override { EXPECT_EQ(ZR_Death(), 0); }
};
inline testing::Environment* const born_library = testing::AddGlobalTestEnvironment(new BornLibrary);

inline std::string mode_name(i32 mode) {
  const char* const name = ZR_TransferModeName(mode);
  return std::to_string(mode) + (name != nullptr ? std::string(" ") + name : "");
}

inline std::string text(f32 v) {
  char line[64];
  std::snprintf(line, sizeof line, "%.9g (%a)", static_cast<f64>(v), static_cast<f64>(v));
  return line;
}
inline std::string text(i32 v) { return std::to_string(v); }
template <class D>
std::string text(const typename D::Pixel& p) {
  const Px<D> v = load<D>(p);
  return "{a " + text(v.a) + ", r " + text(v.c[0]) + ", g " + text(v.c[1]) + ", b " + text(v.c[2]) + "}";
}
inline std::string text(const GX_LRect& r) {
  return "[" + text(r.left) + "," + text(r.top) + " " + text(r.right) + "," + text(r.bottom) + "]";
}

inline bool same_channel(f32 a, f32 b) {
  return (std::isnan(a) && std::isnan(b)) || std::memcmp(&a, &b, sizeof a) == 0;
}
inline bool same_channel(i32 a, i32 b) { return a == b; }
template <class D>
bool same(const typename D::Pixel& p, const typename D::Pixel& q) {
  return same_channel(p.alpha, q.alpha) && same_channel(p.red, q.red) && same_channel(p.green, q.green) &&
         same_channel(p.blue, q.blue);
}

// Fails the test, but shows no more than a few cases of a kind; the rest is counted.
class Complaints {
 public:
  explicit Complaints(int shown_each = 2) : shown_each_(shown_each) {}
  ~Complaints() {
    for (const auto& [kind, count] : counts_)
      if (count > shown_each_) ADD_FAILURE() << kind << ": " << count << " cases differ in all";
  }
  void add(const std::string& kind, const std::string& what) {
    if (++counts_[kind] <= shown_each_) ADD_FAILURE() << kind << "\n" << what;
  }

 private:
  int shown_each_;
  std::map<std::string, int> counts_;
};

// ---------------------------------------------------------------------------------- random

// wild: floats below 0, above 1, tiny ones; broken: infinities, NaN and denormals as well
enum class Range { legal, wild, broken };

class Random {
 public:
  explicit Random(u32 seed) : engine_(seed) {}
  u32 word() { return static_cast<u32>(engine_()); }
  i32 in(i32 low, i32 high) {
    return low + static_cast<i32>(word() % static_cast<u32>(high - low + 1));
  }  // both included
  bool one_in(i32 n) { return in(1, n) == 1; }
  template <class D>
  typename D::Channel channel(Range range = Range::legal) {
    if constexpr (is_float<D>) {
      static constexpr f32 edges[] = {0, 1, 0.5f, 0x1.fffffep-2f, 0x1.000002p-1f, 0x1.fffffep-1f, 0.25f, 0.75f};
      static constexpr f32 wild[] = {-0.0f, -0.3f, 1.5f, 0x1.000002p+0f, 2, -4, 1e-12f, 60000, 1e-6f};
      static constexpr f32 broken[] = {INFINITY, -INFINITY, NAN, 1e-40f, -1e-42f, 3e38f};
      if (range == Range::broken && one_in(8)) return broken[word() % std::size(broken)];
      if (range != Range::legal && one_in(3)) return wild[word() % std::size(wild)];
      if (one_in(3)) return edges[word() % std::size(edges)];
      return static_cast<f32>(word() >> 8) * 0x1p-24f;
    } else {
      constexpr i32 W = D::white, H = D::half;
      static constexpr i32 edges[] = {0, 1, H - 1, H, H + 1, W - 1, W, W / 4, W * 3 / 4};
      return static_cast<typename D::Channel>(one_in(3) ? edges[word() % std::size(edges)] : in(0, W));
    }
  }
  template <class D>
  typename D::Pixel pixel(Range range = Range::legal) {
    using C = typename D::Channel;
    const auto alpha = one_in(5) ? C{0} : one_in(4) ? static_cast<C>(D::white) : channel<D>(range);
    return {alpha, channel<D>(range), channel<D>(range), channel<D>(range)};
  }

 private:
  std::mt19937 engine_;
};

// ---------------------------------------------------------------------------------- worlds

template <class D>
class World {
 public:
  World(Random& random, i32 width, i32 height, Range range = Range::legal) {
    const i32 stride = width + random.in(0, 3), lead = 40 + random.in(0, 3);
    pixels_.resize(static_cast<size_t>(lead) + 40 + static_cast<size_t>(stride) * static_cast<size_t>(height));
    std::memset(pixels_.data(), 0x5a, pixels_.size() * sizeof(pixels_[0]));
    const bool upward = random.one_in(5);  // rows may run from the bottom up
    layer_ = {};
    layer_.flags = D::flags;
    layer_.data = pixels_.data() + lead + (upward ? stride * (height - 1) : 0);
    layer_.row_bytes = static_cast<i32>(sizeof(pixels_[0])) * (upward ? -stride : stride);
    layer_.width = width, layer_.height = height, layer_.extent = {0, 0, width, height};
    for (i32 y = 0; y < height; ++y)
      for (i32 x = 0; x < width; ++x) at<D>(layer_, x, y) = random.pixel<D>(range);
  }
  World(const World& other) : pixels_(other.pixels_), layer_(other.layer_) {
    layer_.data = pixels_.data() + (static_cast<typename D::Pixel*>(other.layer_.data) - other.pixels_.data());
  }
  World& operator=(const World&) = delete;
  ZR_LayerDef* layer() { return &layer_; }                // for the library
  operator const ZR_LayerDef&() const { return layer_; }  // for the model
  i32 width() const { return layer_.width; }
  i32 height() const { return layer_.height; }
  typename D::Pixel* row(i32 y) { return &at<D>(layer_, 0, y); }

  // The first pixel that differs from `expected`, the memory around the pixels included; "" for none.
  std::string difference(const World& expected, const World& before) const {
    for (i32 y = 0; y < layer_.height; ++y)
      for (i32 x = 0; x < layer_.width; ++x)
        if (!same<D>(at<D>(layer_, x, y), at<D>(expected.layer_, x, y)))
          return "at (" + text(x) + ", " + text(y) + ")\n  before   " + text<D>(at<D>(before.layer_, x, y)) +
                 "\n  expected " + text<D>(at<D>(expected.layer_, x, y)) + "\n  got      " +
                 text<D>(at<D>(layer_, x, y));
    for (size_t i = 0; i < pixels_.size(); ++i)
      if (!same<D>(pixels_[i], expected.pixels_[i])) return "memory outside of the pixels was written";
    return "";
  }

 private:
  std::vector<typename D::Pixel> pixels_;
  ZR_LayerDef layer_;
};

// A caller's progress record that counts and can stop the work; the same one serves the model.
struct ToldProgress {
  std::vector<std::pair<i32, i32>> calls;
  i64 stop_at = -1;
  i32 code = 0;
  i32 ask(i32 done, i32 total) {
    calls.emplace_back(done, total);
    return static_cast<i64>(calls.size()) - 1 == stop_at ? code : 0;
  }
  ZR_ProgressInfo info() {
    return {this, nullptr,
            [](void* self, i32 done, i32 total) { return static_cast<ToldProgress*>(self)->ask(done, total); }};
  }
  Progress function() {
    return [this](i32 done, i32 total) { return ask(done, total); };
  }
};

// Tables of a bright and a dark curve, and one of no curve at all, in which every neighbour differs.
inline const ZR_LinearBlendingTables* test_tables(u32 which) {
  static const std::array<ZR_LinearBlendingTables, 3> tables = [] {
    std::array<ZR_LinearBlendingTables, 3> made{gamma_tables(2.2), gamma_tables(0.45), gamma_tables(1.8)};
    Random random(7);
    for (u16& v : made[2].to_linear) v = random.channel<Sixteen>();
    for (u16& v : made[2].from_linear) v = random.channel<Sixteen>();
    return made;
  }();
  return &tables[which % tables.size()];
}

}  // namespace model
