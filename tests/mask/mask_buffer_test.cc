// Mask buffers by themselves: making, filling, inverting, fading, converting, and what is refused.
#include <HB/hb.h>
#include <ZR/mask_alpha.h>

#include <cmath>
#include <functional>

#include "mask/masks.h"
#include "support/thrown.h"

namespace {

using Masks = BornLibrary;

TEST_F(Masks, AreMadeAndFreedByEitherInterface) {
  for (const bool deep : {false, true}) {
    ZR_UnoBuffer* made = nullptr;
    ASSERT_EQ((deep ? ZR_NewDeepUnoBuffer : ZR_NewUnoBuffer)(7, 5, &made), 0);
    EXPECT_EQ(made->magic, 0xfeedabbau);
    EXPECT_EQ(made->depth, deep ? 16 : 8);
    EXPECT_EQ(made->width * 100 + made->height, 705);
    if (deep)
      delete made;
    else
      EXPECT_EQ(ZR_DisposeUnoBuffer(made), 0);
  }
  EXPECT_EQ(ZR_DisposeUnoBuffer(nullptr), 0);
  EXPECT_EQ(ZR_DisposeUnoBuffer(new ZR_UnoBuffer(3, 3, 32)), 0);
  EXPECT_EQ(ZR_UnoBuffer(3, 3, 1).depth, 8);
  EXPECT_EQ(ZR_UnoBuffer(3, 3, 0).depth, 16);
  EXPECT_TRUE(caught.quiet());
  EXPECT_EQ(ZR_NewUnoBuffer(1, 1, nullptr), 3);
  EXPECT_EQ(caught.take_verification(), "damaged mask buffer");
}

TEST_F(Masks, WithoutMemoryLeaveNothingBehind) {
  const auto make = [](i32 width, i32 height) {
    ZR_UnoBuffer* made = reinterpret_cast<ZR_UnoBuffer*>(8);
    const i32 error = ZR_NewDeepUnoBuffer(width, height, &made);
    EXPECT_EQ(made == nullptr, error != 0);
    EXPECT_EQ(ZR_DisposeUnoBuffer(made), 0);
    return error;
  };
  EXPECT_EQ(make(-1, 5), 4);
  EXPECT_EQ(make(INT32_MAX, INT32_MAX), 4);
  EXPECT_EQ(make(INT32_MIN, INT32_MIN), 4);
  u64 n = 1;
  for (;; ++n) {
    HB_FailNthAllocation(n);
    const i32 error = make(9, 9);
    if (error == 0) break;
    EXPECT_EQ(error, 4);
  }
  EXPECT_GE(n, 3u);
  HB_FailNthAllocation(1);
  EXPECT_THROW(ZR_UnoBuffer(5, 5, 8), i32);
}

TEST_F(Masks, AreFilledWholeAndInPart) {
  Mask<u16> deep(6, 4);
  Mask<f32> real(6, 4);
  EXPECT_EQ(ZR_FillFloatUnoBuffer(0.25f, &real), 0);
  EXPECT_EQ(ZR_FillUnoBuffer(1, &deep), 0);
  EXPECT_EQ(real.all(), std::vector<f32>(24, 0.25f));
  EXPECT_EQ(deep.all(), std::vector<u16>(24, 0x101)) << "all bytes of any depth";
  for (const GX_LRect& rect :
       {GX_LRect{1, 1, 4, 3}, GX_LRect{0, 1, 6, 3}, GX_LRect{2, 2, 2, 4}, GX_LRect{0, 0, 6, 4}}) {
    std::vector<u16> result = deep.all();
    for (i32 y = rect.top; y < rect.bottom; ++y)
      for (i32 x = rect.left; x < rect.right; ++x) result[static_cast<size_t>(y * 6 + x)] = 77;
    EXPECT_EQ(ZR_FillDeepUnoBuffer(77, &rect, &deep), 0);
    EXPECT_EQ(deep.all(), result);
    ZR_FillDeepUnoBuffer(5, &deep);
  }
}

TEST_F(Masks, AreInvertedAndFadedByTheirDepth) {
  const auto run = [&]<class C>() {
    using P = Plain<C>;
    for (const f64 fade : {1.0, 0.5, 0.299987792968750, 0.0}) {
      const auto k = static_cast<typename P::N>(sizeof(C) == 4 ? fade : std::floor(fade * white_of<C> + 0.5));
      Mask<C> faded(131, 70, 5), inverted(131, 70, 5), both(131, 70, 5);
      std::vector<C> results[3] = {faded.all(), faded.all(), faded.all()};
      for (C& v : results[0]) v = static_cast<C>(P::mul(v, k));
      for (C& v : results[1]) v = static_cast<C>(P::white - v);
      for (C& v : results[2]) v = static_cast<C>(P::mul(P::white - v, k));
      EXPECT_EQ(ZR_FadeUnoBuffer(static_cast<f32>(fade), &faded), 0);
      EXPECT_EQ(ZR_InvertUnoBuffer(nullptr, &inverted), 0);
      EXPECT_EQ(ZR_InvertAndFadeUnoBuffer(nullptr, static_cast<i32>(fade * 65536), &both), 0);
      EXPECT_EQ(faded.all(), results[0]) << depth_of<C> << " by " << fade;
      EXPECT_EQ(inverted.all(), results[1]) << depth_of<C>;
      EXPECT_EQ(both.all(), results[2]) << depth_of<C> << " by " << fade;
    }
    Mask<C> any(20, 20, 8);
    for (const f32 wild : {-3.0f, 1e30f, NAN, INFINITY}) ASSERT_EQ(ZR_FadeUnoBuffer(wild, &any), 0);
    for (const i32 wild : {-1, INT32_MAX, INT32_MIN}) ASSERT_EQ(ZR_InvertAndFadeUnoBuffer(nullptr, wild, &any), 0);
    const ZR_ProgressInfo stop = {nullptr, [](void*) -> i32 { return 8; }, nullptr};
    const std::vector<C> before = any.all();
    EXPECT_EQ(ZR_InvertUnoBuffer(&stop, &any), 8);
    if constexpr (sizeof(C) < 4) {
      EXPECT_EQ(any.all(), before);
    }
  };
  run.operator()<u8>();
  run.operator()<u16>();
  run.operator()<f32>();
}

TEST_F(Masks, ConvertDeepValuesByADivisor) {
  Mask<u16> src(300, 220);
  for (i32 i = 0; i < 66000; ++i) src.values()[i] = static_cast<u16>(i);
  const GX_LRect rect = {-4, 0, 290, 230};
  const auto run = [&]<class C>(i32 divisor) {
    Mask<C> dst(295, 240, 3);
    const Mask<C> before(295, 240, 3);
    ASSERT_EQ(ZR_ConvertDeepUnoBuffer(nullptr, &src, &rect, divisor, &dst), 0);
    for (i32 y = 0; y < 240; ++y)
      for (i32 x = 0; x < 295; ++x) {
        C result = before.at(x, y);
        if (x < 290 && y < 220) {
          const i64 v = src.at(x, y);
          if constexpr (sizeof(C) == 4)
            result = static_cast<f32>(v) * (1.0f / static_cast<f32>(divisor));
          else
            result = static_cast<C>((v + (divisor >> 1)) / divisor);
        }
        ASSERT_EQ(dst.at(x, y), result) << divisor << " to " << depth_of<C> << " at " << x << ' ' << y;
      }
  };
  for (const i32 divisor : {1, 4, 8, 16, 3, 129, -2, INT32_MAX}) {
    run.operator()<u8>(divisor);
    run.operator()<u16>(divisor);
    run.operator()<f32>(divisor);
  }
  Mask<u8> eight(4, 4, 1), other(4, 4, 2);
  const std::vector<u8> before = other.all();
  EXPECT_EQ(ZR_ConvertDeepUnoBuffer(nullptr, &eight, nullptr, 4, &other), 0);
  EXPECT_EQ(other.all(), before);
}

// Every function with a buffer that is none: each report is the one text, and the other buffers stay.
TEST_F(Masks, RefuseDamagedBuffers) {
  Mask<u16> good(8, 8, 4), damaged(8, 8), empty(8, 8);
  const std::vector<u16> before = good.all();
  damaged.magic = 0xfeedabbb;
  void** const handle = empty.data;
  empty.data = nullptr;
  const GX_LRect rect = {0, 0, 4, 4};
  const GX_LPoint point = {0, 0};
  for (ZR_UnoBuffer* bad : {static_cast<ZR_UnoBuffer*>(&damaged), static_cast<ZR_UnoBuffer*>(&empty),
                            static_cast<ZR_UnoBuffer*>(nullptr)}) {
    const std::function<i32()> calls[] = {
        [&] { return ZR_FillUnoBuffer(1, bad); },
        [&] { return ZR_FillDeepUnoBuffer(1, bad); },
        [&] { return ZR_FillFloatUnoBuffer(1, bad); },
        [&] { return ZR_FillUnoBuffer(1, &rect, bad); },
        [&] { return ZR_FillDeepUnoBuffer(1, &rect, bad); },
        [&] { return ZR_InvertUnoBuffer(nullptr, bad); },
        [&] { return ZR_InvertAndFadeUnoBuffer(nullptr, 9, bad); },
        [&] { return ZR_FadeUnoBuffer(1, bad); },
        [&] { return ZR_AccumulateUnoBuffers(nullptr, bad, 0, &rect, &good); },
        [&] { return ZR_AccumulateUnoBuffers(nullptr, &good, 0, &rect, &point, bad); },
        [&] { return ZR_AccumulateUnoBuffers(nullptr, bad, 0, 0.5f, 1, &rect, &point, &good); },
        [&] { return ZR_TransferUnoBuffers(nullptr, bad, &good, 0, &rect, &point, &good); },
        [&] { return ZR_TransferUnoBuffers(nullptr, &good, bad, 0, &rect, &point, &good); },
        [&] { return ZR_TransferUnoBuffers(nullptr, &good, &good, 0, &rect, &point, bad); },
        [&] { return ZR_ConvertDeepUnoBuffer(nullptr, bad, &rect, 4, &good); },
        [&] { return ZR_ConvertDeepUnoBuffer(nullptr, &good, &rect, 4, bad); },
        [&] { return thrown_by([&] { ZR_MergeMaskAlpha(nullptr, 0, 0, nullptr, bad, nullptr, nullptr); }); },
    };
    for (const auto& call : calls) {
      EXPECT_EQ(call(), 3) << &call - calls;
      EXPECT_EQ(caught.take_verification(), "damaged mask buffer") << &call - calls;
    }
  }
  EXPECT_EQ(good.all(), before);
  damaged.magic = ZR_UnoMagic;
  empty.data = handle;

  ZR_UnoBuffer* record = nullptr;  // freed without its memory
  ASSERT_EQ(ZR_NewUnoBuffer(4, 4, &record), 0);
  void** const left = record->data;
  record->magic = 1;
  EXPECT_EQ(ZR_DisposeUnoBuffer(record), 3);
  EXPECT_EQ(caught.take_verification(), "damaged mask buffer");
  HB_FreeHandle(left);
}

TEST_F(Masks, RefuseWhatDoesNotGoTogether) {
  Mask<u8> eight(8, 8, 1);
  Mask<u16> deep(8, 8, 2);
  Mask<f32> real(8, 8, 3);
  Mask<u16> odd(8, 8);
  odd.depth = 24;
  const GX_LRect outside[] = {{-1, 0, 3, 3}, {0, -1, 3, 3}, {0, 0, 9, 3}, {6, 6, 8, 9}};
  const std::vector<u8> before = eight.all();
  const std::function<i32()> calls[] = {
      [&] { return ZR_FillUnoBuffer(1, &outside[0], &eight); },
      [&] { return ZR_FillUnoBuffer(1, &outside[1], &eight); },
      [&] { return ZR_FillUnoBuffer(1, &outside[2], &eight); },
      [&] { return ZR_FillUnoBuffer(1, &outside[3], &eight); },
      [&] { return ZR_FillUnoBuffer(1, &odd); },
      [&] { return ZR_FillDeepUnoBuffer(1, &eight); },
      [&] { return ZR_FillFloatUnoBuffer(1, &eight); },
      [&] { return ZR_InvertUnoBuffer(nullptr, &odd); },
      [&] { return ZR_FadeUnoBuffer(0.5f, &odd); },
      [&] { return ZR_AccumulateUnoBuffers(nullptr, &real, 0, nullptr, &eight); },
      [&] { return ZR_AccumulateUnoBuffers(nullptr, &eight, 0, nullptr, &real); },
      [&] { return ZR_AccumulateUnoBuffers(nullptr, &odd, 0, nullptr, &eight); },
      [&] { return ZR_TransferUnoBuffers(nullptr, &deep, &eight, 0, nullptr, nullptr, &eight); },
      [&] { return ZR_TransferUnoBuffers(nullptr, &eight, &eight, 0, nullptr, nullptr, &deep); },
      [&] { return ZR_ConvertDeepUnoBuffer(nullptr, &deep, nullptr, 0, &eight); },
      [&] { return ZR_ConvertDeepUnoBuffer(nullptr, &deep, nullptr, 4, &odd); },
      [&] { return ZR_BoxBlurUnoScan(0, -1, 0, 7, 8, eight.values(), eight.values()); },
      [&] { return ZR_GBlurUnoScan(0, INT32_MAX, 0, 7, 8, eight.values(), eight.values()); },
      [&] { return ZR_GBlurDeepUnoScan(0, 65536, 0, 7, 8, nullptr, deep.values()); },
  };
  for (const auto& call : calls) {
    EXPECT_EQ(call(), 3) << &call - calls;
    EXPECT_NE(caught.take_verification(), "") << &call - calls;
  }
  EXPECT_EQ(eight.all(), before);
}

}  // namespace
