// The trials, one for each signature, and which slot has which.
#include "slot_trials.h"

#include <ZR/composite.h>
#include <ZR/sample.h>
#include <ZR/world.h>

#include <cmath>
#include <cstring>
#include <memory>
#include <random>
#include <type_traits>

namespace zr {

template <class T>
void Outcome::add(const T* values, size_t count) {
  const size_t start = bytes_.size();
  bytes_.resize(start + count * sizeof(T));
  std::memcpy(bytes_.data() + start, values, count * sizeof(T));
  if constexpr (std::is_floating_point_v<T>)
    for (size_t i = 0; i < count; ++i)
      if (std::isnan(values[i])) std::memset(bytes_.data() + start + i * sizeof(T), 0xff, sizeof(T));
}

namespace {

constexpr i32 widths[] = {1, 2, 3, 5, 8, 15, 17, 33, 64, 67};
constexpr i32 largest = 67;

template <class T>
void add_pixels(const T* pixels, i32 count, Outcome& out) {
  out.add(reinterpret_cast<const Channel<T>*>(pixels), 4 * static_cast<size_t>(count));
}

// Pixels of every kind; the same at each call.
template <class T>
std::vector<T> pixels(i32 count, u32 seed) {
  std::mt19937 random(seed);
  constexpr Channel<T> white = Depth<T>::white, edges[] = {0, 1, static_cast<Channel<T>>(white / 2), white};
  const auto channel = [&]() -> Channel<T> {
    const u32 word = static_cast<u32>(random());
    if (word % 3 == 0) return edges[word / 3 % 4];
    if constexpr (std::is_floating_point_v<Channel<T>>)
      return static_cast<f32>(word >> 8) * 0x1p-23f - 0.25f;  // from below 0 to above 1
    else
      return static_cast<Channel<T>>(word % (white + 1u));
  };
  std::vector<T> all(static_cast<size_t>(count));
  for (T& p : all) p = {channel(), channel(), channel(), channel()};
  for (size_t i = 0; i < all.size(); ++i)  // whole stretches of one alpha take roads of their own
    if (i / 16 % 3 != 0) all[i].alpha = i / 16 % 3 == 1 ? white : Channel<T>{0};
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    for (T& p : all) p.alpha = p.alpha < 0 ? 0 : p.alpha > 1 ? 1 : p.alpha;
  return all;
}

// Every alpha; at 8 bits with every value.
template <class T>
std::vector<T> all_alphas() {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    return pixels<T>(4099, 5);
  } else {
    constexpr u32 white = Depth<T>::white, rounds = sizeof(T) == 4 ? 256 : 1;
    std::vector<T> all = pixels<T>(static_cast<i32>((white + 1) * rounds), 5);
    for (u32 i = 0; i < all.size(); ++i) {
      all[i].alpha = static_cast<Channel<T>>(i % (white + 1));
      if (rounds > 1) all[i].green = static_cast<Channel<T>>(i / (white + 1));
    }
    return all;
  }
}

template <class T>
void try_row(ZR_SlotFunc routine, Outcome& out) {
  const auto row = reinterpret_cast<i32 (*)(i32, const T*, T*)>(routine);
  for (const i32 width : widths)
    for (const bool in_place : {false, true}) {
      const std::vector<T> src = pixels<T>(width, 1);
      std::vector<T> dst = in_place ? src : pixels<T>(width, 2);
      dst.push_back(T{7, 7, 7, 7});
      out.add(row(width, in_place ? nullptr : src.data(), dst.data()));
      add_pixels(dst.data(), width + 1, out);
    }
  std::vector<T> long_row = all_alphas<T>();
  const i32 length = static_cast<i32>(long_row.size());
  out.add(row(length, nullptr, long_row.data()));
  add_pixels(long_row.data(), length, out);
}

template <class T>
void try_union(ZR_SlotFunc routine, Outcome& out) {
  const auto row = reinterpret_cast<ZR_UnionAlphaFunc<T>>(routine);
  const std::vector<T> src = pixels<T>(largest, 1), mask = pixels<T>(largest, 3);
  constexpr Channel<T> white = Depth<T>::white;
  for (const i32 width : widths)
    for (const Channel<T> opacity : {white, static_cast<Channel<T>>(white / 3)})
      for (const T* m : {static_cast<const T*>(nullptr), mask.data()}) {
        std::vector<T> dst = pixels<T>(largest, 2);
        out.add(row(width, src.data(), opacity, m, dst.data()));
        add_pixels(dst.data(), largest, out);
      }
}

// The functions that a getter gives for each mode, one unknown too.
template <class T, bool masked>
void try_modes(ZR_SlotFunc routine, Outcome& out) {
  const auto get = reinterpret_cast<i32 (*)(i32, ZR_InnerBlendingFunc<T>*)>(routine);
  const std::vector<T> src = pixels<T>(largest, 1), mask = pixels<T>(largest, 3);
  constexpr Channel<T> white = Depth<T>::white;
  for (i32 number = 0; number <= 40; ++number)
    for (const Channel<T> opacity : {white, static_cast<Channel<T>>(white / 3)}) {
      ZR_InnerBlendingFunc<T> blend = nullptr;
      out.add(get(number, &blend));
      if (blend == nullptr) continue;
      ZR_BlendingMode<T> mode;
      mode.mode = number, mode.seed = 1234, mode.opacity = opacity, mode.keep_alpha = 0;
      std::vector<T> dst = pixels<T>(largest, 2);
      out.add(blend(largest, &mode, nullptr, src.data(), masked ? mask.data() : nullptr, dst.data()));
      add_pixels(dst.data(), largest, out);
    }
}

// A small picture with padded rows.
template <class T>
class Picture {
 public:
  static constexpr i32 width = 19, height = 13, pitch = width + 3;
  explicit Picture(u32 seed)
      : pixels_(pixels<T>(pitch * height, seed)), world_(pixels_.data(), width, height, pitch * i32{sizeof(T)}) {}
  ZR_LayerDef* layer() { return &world_; }
  void tell(Outcome& out) const { add_pixels(pixels_.data(), pitch * height, out); }

 private:
  std::vector<T> pixels_;
  ZR_WorldX<T> world_;
};

// Calls sample(x, y, params) at positions between and on pixels; inside of all neighbours alone, or out of the picture
// too.
template <class T, class Sample>
void each_position(bool inside, Sample sample) {
  Picture<T> picture(4);
  ZR_SampPB params{};
  params.src = picture.layer();
  constexpr i32 right = (Picture<T>::width - 2) << 16, bottom = (Picture<T>::height - 2) << 16, out = 3 << 16;
  const i32 low = inside ? 0 : -out, margin = inside ? 0 : 2 * out;
  for (const i32 radius : {0x10000, 0x17000}) {
    params.x_radius = radius, params.y_radius = 0x1a000;
    params.area = static_cast<i32>(i64{4} * radius * params.y_radius >> 16);
    for (i32 y = low; y <= bottom + margin; y += 0xd400)
      for (i32 x = low; x <= right + margin; x += 0xb800) sample(x, y, params);
    sample(2 << 16, 3 << 16, params);
  }
}

template <class T, bool inside>
void try_sample(ZR_SlotFunc routine, Outcome& out) {
  const auto sampler = reinterpret_cast<i32 (*)(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, T*)>(routine);
  each_position<T>(inside, [&](i32 x, i32 y, const ZR_SampPB& params) {
    T pixel{};
    out.add(sampler(nullptr, x, y, &params, &pixel));
    add_pixels(&pixel, 1, out);
  });
}
template <class T>
void try_plus(ZR_SlotFunc routine, Outcome& out) {
  const auto sampler = reinterpret_cast<i32 (*)(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, u8*, T*)>(routine);
  each_position<T>(false, [&](i32 x, i32 y, const ZR_SampPB& params) {
    T pixel{};
    u8 all_in = 7;
    out.add(sampler(nullptr, x, y, &params, &all_in, &pixel));
    out.add(&all_in, 1);
    add_pixels(&pixel, 1, out);
  });
}
void weights_of(i32 x, i32 y, f64* w) {
  ZR_SubpixelSampleComputeWeight(static_cast<u16>(x & 65535), static_cast<u16>(y & 65535), w);
}
template <class T>
void try_translate(ZR_SlotFunc routine, Outcome& out) {
  const auto sampler =
      reinterpret_cast<i32 (*)(const ZR_ProgressInfo*, i32, i32, const f64*, const ZR_SampPB*, T*)>(routine);
  each_position<T>(true, [&](i32 x, i32 y, const ZR_SampPB& params) {
    T pixel{};
    f64 w[4];
    weights_of(x, y, w);
    out.add(sampler(nullptr, x, y, w, &params, &pixel));
    add_pixels(&pixel, 1, out);
  });
}
template <class T>
void try_span(ZR_SlotFunc routine, Outcome& out) {
  const auto sampler =
      reinterpret_cast<i32 (*)(const ZR_ProgressInfo*, i32, i32, i32, const ZR_SampPB*, u32*, T*)>(routine);
  each_position<T>(true, [&](i32 x, i32 y, const ZR_SampPB& params) {
    const i32 room = Picture<T>::width - 2 - (x >> 16);
    std::vector<T> row(static_cast<size_t>(room) + 1, T{7, 7, 7, 7});
    u32 sum = 5;
    out.add(sampler(nullptr, room, x, y, &params, &sum, row.data()));
    out.add(&sum, 1);
    add_pixels(row.data(), room + 1, out);
  });
}
template <bool with_weights>
void try_four(ZR_SlotFunc routine, Outcome& out) {
  each_position<ZR_Pixel8>(true, [&](i32 x, i32 y, const ZR_SampPB& params) {
    const i32 at[8] = {x, y, x / 2, y, x, y / 2, x / 3, y / 3};
    ZR_Pixel8 four[4] = {};
    if constexpr (with_weights) {
      f64 w[16];
      for (i32 i = 0; i < 4; ++i) weights_of(at[2 * i], at[2 * i + 1], w + 4 * i);
      out.add(reinterpret_cast<i32 (*)(const ZR_ProgressInfo*, const i32*, const f64*, const ZR_SampPB*, ZR_Pixel8*)>(
          routine)(nullptr, at, w, &params, four));
    } else {
      out.add(reinterpret_cast<i32 (*)(const ZR_ProgressInfo*, const i32*, const ZR_SampPB*, ZR_Pixel8*)>(routine)(
          nullptr, at, &params, four));
    }
    add_pixels(four, 4, out);
  });
}
void try_weights(ZR_SlotFunc routine, Outcome& out) {
  for (const u16 fx : {u16{0}, u16{1}, u16{0x8000}, u16{0xffff}, u16{0x1234}})
    for (const u16 fy : {u16{0}, u16{0x7fff}, u16{0xffff}}) {
      f64 w[4] = {};
      out.add(reinterpret_cast<i32 (*)(u16, u16, f64*)>(routine)(fx, fy, w));
      out.add(w, 4);
    }
}

// Runs `work` on pictures of all three depths.
template <class Work>
void each_depth(Work work) {
  work.template operator()<ZR_Pixel8>();
  work.template operator()<ZR_Pixel16>();
  work.template operator()<ZR_PixelFloat>();
}

template <bool premul>
void try_copy(ZR_SlotFunc routine, Outcome& out) {
  const auto copy =
      reinterpret_cast<i32 (*)(const ZR_ProgressInfo*, ZR_LayerDef*, ZR_LayerDef*, const GX_LRect*, const GX_LRect*)>(
          routine);
  const GX_LRect part{2, 1, 13, 9}, large{0, 0, 19, 13}, small{3, 2, 9, 6};
  const auto at_depth = [&]<class T>() {
    for (const GX_LRect* to : {&part, &large, &small}) {
      Picture<T> src(1), dst(2);
      out.add(copy(nullptr, src.layer(), dst.layer(), &part, to));
      dst.tell(out);
    }
  };
  if constexpr (premul)
    at_depth.template operator()<ZR_Pixel8>();
  else
    each_depth(at_depth);
}

void try_premul_rect(ZR_SlotFunc routine, Outcome& out) {
  const auto run = reinterpret_cast<i32 (*)(const ZR_ProgressInfo*, i32, const GX_LRect*, ZR_LayerDef*)>(routine);
  const GX_LRect part{2, 1, 13, 9};
  each_depth([&]<class T>() {
    for (const i32 forward : {0, 1})
      for (const GX_LRect* rect : {&part, static_cast<const GX_LRect*>(nullptr)}) {
        Picture<T> dst(2);
        out.add(run(nullptr, forward, rect, dst.layer()));
        dst.tell(out);
      }
  });
}

void try_look_up(ZR_SlotFunc routine, Outcome& out) {
  const auto run = reinterpret_cast<i32 (*)(ZR_InData*, i32, i32, ZR_LayerDef*, const GX_LRect*, const u8*, const u8*,
                                            const u8*, const u8*, ZR_LayerDef*)>(routine);
  u8 table[256];
  for (i32 i = 0; i < 256; ++i) table[i] = static_cast<u8>(255 - i / 2);
  const GX_LRect part{2, 1, 13, 9};
  Picture<ZR_Pixel8> src(1), dst(2);
  out.add(run(nullptr, 0, 0, src.layer(), &part, nullptr, table, table, table, dst.layer()));
  dst.tell(out);
}

struct Trial {
  ZR_SlotIndex slot;
  SlotTrial* run;
};
#define ZR_ROW_TRIALS(suffix)                                                                                \
  {ZR_Slot_premul_row##suffix, try_row<Pixel##suffix>}, {ZR_Slot_unmul_row##suffix, try_row<Pixel##suffix>}, \
      {ZR_Slot_white_fade_row##suffix, try_row<Pixel##suffix>},                                              \
      {ZR_Slot_white_unfade_row##suffix, try_row<Pixel##suffix>},                                            \
      {ZR_Slot_grey_fade_row##suffix, try_row<Pixel##suffix>},                                               \
      {ZR_Slot_grey_unfade_row##suffix, try_row<Pixel##suffix>},                                             \
      {ZR_Slot_union_alpha_row##suffix, try_union<Pixel##suffix>},                                           \
      {ZR_Slot_inner_blend##suffix, try_modes<Pixel##suffix, false>}, {                                      \
    ZR_Slot_inner_blend_mask##suffix, try_modes<Pixel##suffix, true>                                         \
  }
using Pixel8 = ZR_Pixel8;
using Pixel16 = ZR_Pixel16;
using PixelFloat = ZR_PixelFloat;
constexpr Trial trials[] = {ZR_ROW_TRIALS(8),
                            ZR_ROW_TRIALS(16),
                            ZR_ROW_TRIALS(Float),
                            {ZR_Slot_nn_sample8, try_sample<ZR_Pixel8, false>},
                            {ZR_Slot_nn_sample16, try_sample<ZR_Pixel16, false>},
                            {ZR_Slot_bilinear_straight8, try_sample<ZR_Pixel8, false>},
                            {ZR_Slot_bilinear_straight16, try_sample<ZR_Pixel16, false>},
                            {ZR_Slot_bilinear_premul8, try_sample<ZR_Pixel8, false>},
                            {ZR_Slot_area_straight8, try_sample<ZR_Pixel8, false>},
                            {ZR_Slot_area_straight16, try_sample<ZR_Pixel16, false>},
                            {ZR_Slot_area_premul8, try_sample<ZR_Pixel8, false>},
                            {ZR_Slot_bilinear_no_clip8, try_sample<ZR_Pixel8, true>},
                            {ZR_Slot_bilinear_no_clip16, try_sample<ZR_Pixel16, true>},
                            {ZR_Slot_bilinear_plus8, try_plus<ZR_Pixel8>},
                            {ZR_Slot_bilinear_plus16, try_plus<ZR_Pixel16>},
                            {ZR_Slot_bilinear_translate_no_clip8, try_translate<ZR_Pixel8>},
                            {ZR_Slot_bilinear_translate_no_clip16, try_translate<ZR_Pixel16>},
                            {ZR_Slot_bilinear_span8, try_span<ZR_Pixel8>},
                            {ZR_Slot_bilinear_span16, try_span<ZR_Pixel16>},
                            {ZR_Slot_bilinear_no_clip8_x4, try_four<false>},
                            {ZR_Slot_bilinear_translate_no_clip8_x4, try_four<true>},
                            {ZR_Slot_sample_compute_weight, try_weights},
                            {ZR_Slot_copy_bits_draft, try_copy<false>},
                            {ZR_Slot_copy_bits_hq_straight, try_copy<false>},
                            {ZR_Slot_copy_bits_hq_premul, try_copy<true>},
                            {ZR_Slot_premul_rect, try_premul_rect},
                            {ZR_Slot_iterate_lut, try_look_up}};
#undef ZR_ROW_TRIALS

}  // namespace

SlotTrial* slot_trial(i32 slot) {
  for (const Trial& trial : trials)
    if (trial.slot == slot) return trial.run;
  return nullptr;
}

i32 check_slot(void*, i32 slot, ZR_SlotFunc before, ZR_SlotFunc now) {
  SlotTrial* const trial = slot_trial(slot);
  if (trial == nullptr) return -1;
  try {
    Outcome expected, got;
    trial(before, expected);
    trial(now, got);
    return expected == got ? 0 : 1;
  } catch (...) {
    return 1;
  }
}

}  // namespace zr
