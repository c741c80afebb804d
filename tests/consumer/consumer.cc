// The C++ classes against the installed package.
#include <ZR/ZR.h>

#include <cstdio>
#include <memory>

int main() {
  if (ZR_Birth() != 0) return 1;
  {
    const std::unique_ptr<ZR_World> world(ZR_World::New(32, 16, 32, ZR_WorldFlag_Clear));
    world->Fill(ZR_PixelFloat{1.0f, 0.25f, 0.5f, 2.0f}, nullptr);
    const std::unique_ptr<ZR_World> narrow(ZR_World::New(32, 16, 8, 0));
    narrow->CopyRectPossiblyDifferentBitdepth(world.get(), {0, 0, 32, 16}, false, 0, 0, nullptr);
    const auto* pixel = static_cast<const ZR_Pixel8*>(narrow->data);
    std::printf("%u %u %u %u\n", pixel->alpha, pixel->red, pixel->green, pixel->blue);
    if (pixel->alpha != 255 || pixel->red != 64 || pixel->green != 128 || pixel->blue != 255) return 2;
    try {
      (void)world->GetRSWorld();
      return 3;
    } catch (const i32 code) {
      if (code != ZR_Err_NoRasterWorld) return 4;
    }
    ZR_BlendingMode<ZR_PixelFloat> mode{};
    mode.mode = XferInFront;
    mode.opacity = 1.0f;
    const ZR_BlendModeDescriptor<ZR_PixelFloat> plan(mode, false, nullptr);
    auto* row = static_cast<ZR_PixelFloat*>(world->data);
    const ZR_PixelFloat over[2] = {{0.5f, 1, 1, 1}, {0, 1, 1, 1}};
    f32 scratch[2];
    if (ZR_BlendPipeline<ZR_PixelFloat>(nullptr, 2, &plan, over, nullptr, scratch, row) != 0) return 5;
    if (row[0].red != 0.625f || row[1].red != 0.25f) return 6;
  }
  return ZR_Death();
}
