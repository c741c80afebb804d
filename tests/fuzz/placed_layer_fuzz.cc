// Layers placed by whatever bytes say: transforms, copies and clipping samplers over small worlds that lie
// exactly in memory of their own, so that the address sanitizer sees every touch outside of them.
#include <ZR/platform.h>
#include <ZR/zr.h>
#include <fuzzer/FuzzedDataProvider.h>
#include <sanitizer/asan_interface.h>

#include <cstdlib>
#include <cstring>
#include <vector>

#include "sample/sample_functions.h"

namespace {

class Bytes {
 public:
  Bytes(const u8* data, size_t size) : data_(data, size) {}
  i32 between(i32 low, i32 high) { return data_.ConsumeIntegralInRange<i32>(low, high); }
  i32 any() { return data_.ConsumeIntegral<i32>(); }
  bool flip() { return data_.ConsumeBool(); }
  // Mostly near the worlds, now and then anywhere.
  i32 coordinate() { return between(0, 7) == 0 ? any() : between(-24, 24); }
  i32 position() { return between(0, 3) == 0 ? any() : between(-20 * 65536, 20 * 65536); }
  GX_LRect rect() { return {coordinate(), coordinate(), coordinate(), coordinate()}; }
  f64 term(f64 usual) {
    switch (between(0, 7)) {
      case 0: {
        f64 raw = 0;
        data_.ConsumeData(&raw, sizeof raw);
        return raw;
      }
      case 1: return between(-128, 127) / 8.0;
      case 2: return usual + between(-128, 127) / 256.0;
      default: return usual;
    }
  }
  GX_Matrix3 matrix() {
    GX_Matrix3 out;
    for (i32 row = 0; row < 3; ++row)
      for (i32 column = 0; column < 3; ++column) out.m[row][column] = term(row == column ? 1 : 0);
    return out;
  }
  void fill(void* to, size_t bytes) { data_.ConsumeData(to, bytes); }

 private:
  FuzzedDataProvider data_;
};

// A world whose row padding must not be touched either.
class World {
 public:
  World(Bytes& bytes, i32 depth) {
    const i32 pixel = depth / 2, width = bytes.between(0, 16), height = bytes.between(0, 16);
    const size_t row = static_cast<size_t>(width * pixel);
    const size_t stride = row + static_cast<size_t>(bytes.between(0, 2) * 16);
    size_ = stride * static_cast<size_t>(height);
    memory_ = static_cast<u8*>(std::calloc(size_ + 1, 1));
    for (i32 y = 0; y < height; ++y) {
      u8* const at = memory_ + static_cast<size_t>(y) * stride;
      bytes.fill(at, row < 24 ? row : 24);  // the rest of a row repeats it
      for (size_t i = 24; i < row; ++i) at[i] = at[i - 24];
      ASAN_POISON_MEMORY_REGION(at + row, stride - row);
    }
    ASAN_POISON_MEMORY_REGION(memory_ + size_, 1);
    layer_ = {};
    layer_.flags = depth == 8 ? 0u : depth == 16 ? 0x1000001u : 0x2000000u;
    layer_.data = memory_;
    layer_.row_bytes = static_cast<i32>(stride);
    layer_.width = width, layer_.height = height;
    layer_.extent = {0, 0, width, height};
    if (height > 0 && bytes.flip()) {
      layer_.data = memory_ + size_ - stride;
      layer_.row_bytes = -layer_.row_bytes;
    }
    if (bytes.between(0, 31) == 0) layer_.data = nullptr;
  }
  ~World() {
    ASAN_UNPOISON_MEMORY_REGION(memory_, size_ + 1);
    std::free(memory_);
  }
  World(const World&) = delete;
  World& operator=(const World&) = delete;
  ZR_LayerDef* layer() { return &layer_; }

 private:
  u8* memory_;
  size_t size_;
  ZR_LayerDef layer_;
};

ZR_ProgressInfo stops_after(i32* polls) {
  return {polls, [](void* left) -> i32 { return --*static_cast<i32*>(left) < 0 ? 517 : 0; }, nullptr};
}

void transform(Bytes& bytes, i32 depth, const ZR_ProgressInfo* progress) {
  World src(bytes, depth), dst(bytes, bytes.between(0, 31) == 0 ? 8 : depth), matte(bytes, depth);
  const ZR_MaskWorld mask = {*matte.layer(), bytes.coordinate(), bytes.coordinate(), static_cast<u32>(bytes.any())};
  ZR_CompositeModePlus mode(bytes.between(-4, 42), static_cast<f32>(bytes.between(0, 16)) / 16.0f, nullptr,
                            bytes.flip(), bytes.any());
  std::vector<GX_Matrix3> matrices;
  for (i32 count = bytes.between(0, 5); count > 0; --count)
    matrices.push_back(!matrices.empty() && bytes.flip() ? matrices.front() : bytes.matrix());
  for (size_t i = 1; i < matrices.size(); ++i) matrices[i].m[0][2] += bytes.between(-64, 64) / 8.0;
  const GX_LRect rect = bytes.flip() ? GX_LRect{0, 0, 16, 16} : bytes.rect();
  const ZR_MaskWorld* const used = bytes.flip() ? &mask : nullptr;
  const i32 quality = bytes.between(-1, 4), field = bytes.between(0, 3), count = static_cast<i32>(matrices.size());
  const bool forward = bytes.flip();
  if (bytes.flip()) {
    ZR_TransformWorld(progress, quality, 0, field, src.layer(), &mode, nullptr, used, matrices.data(), count, forward,
                      &rect, dst.layer());
    return;
  }
  void* scratch[10] = {std::malloc(16 * 4), std::malloc(16 * 16), std::malloc(16 * 16)};
  if (ZR_AllocateMotionBlurScratch(scratch + 3) == 0)
    ZR_TransformWorldPlus(progress, quality, 0, field, src.layer(), &mode, nullptr, used, matrices.data(), count,
                          forward, scratch, &rect, dst.layer());
  ZR_DisposeMotionBlurScratch(scratch + 3);
  for (i32 i = 0; i < 3; ++i) std::free(scratch[i]);
}

void copy(Bytes& bytes, i32 depth, const ZR_ProgressInfo* progress) {
  World src(bytes, depth), dst(bytes, bytes.flip() ? depth : 8 << bytes.between(0, 2));
  const GX_LRect from = bytes.rect(), to = bytes.rect();
  const GX_LRect *const a = bytes.flip() ? &from : nullptr, *const b = bytes.flip() ? &to : nullptr;
  const GX_Matrix3 matrix = bytes.matrix();
  switch (bytes.between(0, 3)) {
    case 0: ZR_CopyBits_Draft(progress, src.layer(), dst.layer(), a, b); break;
    case 1: ZR_CopyBits_HQ_Straight(progress, src.layer(), dst.layer(), a, b); break;
    case 2: ZR_CopyBits_HQ_Premul(progress, src.layer(), dst.layer(), a, b); break;
    default: ZR_CopyBits3_LO_Straight(progress, src.layer(), &matrix, bytes.flip(), b, dst.layer()); break;
  }
}

template <class T>
void sample(Bytes& bytes, zr::SampleFunc<T>* nearest) {
  World src(bytes, zr::Depth<T>::bits);
  if (src.layer()->data == nullptr) return;
  ZR_SampPB params{};
  params.x_radius = bytes.flip() ? bytes.between(0, 127 * 65536) : 32768;
  params.y_radius = bytes.flip() ? bytes.between(0, 127 * 65536) : 32768;
  params.area = bytes.any();
  params.src = src.layer();
  const zr::SampleFunctions<T> samplers = zr::sample_functions<T>(bytes.between(0, 3));
  T pixel;
  u8 all_in;
  for (i32 i = 0; i < 4; ++i) {
    const i32 x = bytes.position(), y = bytes.position();
    nearest(nullptr, x, y, &params, &pixel);
    samplers.clipping(nullptr, x, y, &params, &pixel);
    samplers.inside_flag(nullptr, x, y, &params, &all_in, &pixel);
    if (all_in != 0) samplers.no_clipping(nullptr, x, y, &params, &pixel);
    samplers.area(nullptr, x, y, &params, &pixel);
    if constexpr (std::is_same_v<T, ZR_Pixel8>) {
      ZR_SubpixelSample_Premul(nullptr, x, y, &params, &pixel);
      ZR_AreaSample_Premul(nullptr, x, y, &params, &pixel);
    }
  }
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  HB_SetMessageSink([](void*, u32, i32, const char*) {}, nullptr);
  HB_SetVerificationSink([](void*, u32, i32, const char*) {}, nullptr);
  return ZR_Birth();
}

extern "C" int LLVMFuzzerTestOneInput(const u8* data, size_t size) {
  Bytes bytes(data, size);
  i32 polls = bytes.between(0, 7) == 0 ? bytes.between(0, 3) : 1 << 20;
  const ZR_ProgressInfo progress = stops_after(&polls);
  const i32 depth = 8 << bytes.between(0, 2);
  switch (bytes.between(0, 3)) {
    case 0: copy(bytes, depth, &progress); break;
    case 1:
      if (depth == 8) sample<ZR_Pixel8>(bytes, ZR_NNSample);
      if (depth == 16) sample<ZR_Pixel16>(bytes, ZR_NNSample16);
      if (depth == 32) sample<ZR_PixelFloat>(bytes, ZR_NNSampleFloat);
      break;
    default: transform(bytes, depth, &progress); break;
  }
  return 0;
}
