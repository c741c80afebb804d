// A world of a depth that does not exist.
#pragma once

#include <ZR/world.h>

// To be met only through an owner.
struct OddWorld final : ZR_World {
  i16 depth = 24;
  explicit OddWorld(i32 side = 0) {
    owner = this;
    width = height = side;
  }
  i16 GetBitDepth() const override { return depth; }
  bool IsReference() const override { return true; }
  void Clear(const GX_LRect*) override {}
  void ClearExceptRect(const GX_LRect&) override {}
  void Fill(const ZR_PixelFloat&, const GX_LRect*) override {}
  void Fill(const ZR_Pixel16&, const GX_LRect*) override {}
  void FillAlpha() override {}
  void InvertAlpha() override {}
  void Premultiply() override {}
  void Unmultiply() override {}
  void PremulColor(const ZR_Pixel16&) override {}
  void UnmulColor(const ZR_Pixel16&) override {}
  void CopyRect(const ZR_World*, const GX_LRect&, i32, i32) override {}
  void CopyRectPossiblyDifferentBitdepth(const ZR_World*, const GX_LRect&, bool, i32, i32, ZR_ProgressInfo*) override {}
  void CopyRectPossiblyDifferentBitdepthWithField(const ZR_World*, const GX_LRect&, i32) override {}
  bool SubWorldSafetyGutterHasBeenOverWritten() const override { return false; }
  void ReleaseOwnership() override {}
};
