/* Plain C against the installed package: fills a world and composites it over another. */
#include <ZR/callback_block.h>
#include <ZR/module.h>
#include <ZR/platform.h>
#include <ZR/slots.h>
#include <ZR/zr.h>

#include <stdio.h>

int main(void) {
  ZR_LayerDef src, dst;
  const ZR_Pixel16 half_red = {16384, 32768, 0, 0}, blue = {32768, 0, 0, 32768};
  const GX_LRect all = {0, 0, 64, 32};
  ZR_CompositeModePlus mode = {2, 0, false, NULL, 1.0f};
  if (ZR_Birth() != 0) return 1;
  if (ZR_NewEffectWorld(NULL, 64, 32, 16, true, false, &src) != 0) return 2;
  if (ZR_NewEffectWorld(NULL, 64, 32, 16, true, false, &dst) != 0) return 3;
  if (ZR_Fill16(NULL, &half_red, NULL, &src) != 0 || ZR_Fill16(NULL, &blue, NULL, &dst) != 0) return 4;
  if (ZR_TransferRect(NULL, 0, 0, 0, &all, &src, &mode, NULL, NULL, 0, 0, &dst) != 0) return 5;
  const ZR_Pixel16* pixel = (const ZR_Pixel16*)dst.data;
  printf("%u %u %u %u\n", pixel->alpha, pixel->red, pixel->green, pixel->blue);
  if (pixel->alpha != 32768 || pixel->red != 16384 || pixel->green != 0 || pixel->blue != 16384) return 6;
  if (ZR_DisposeEffectWorld(NULL, &src) != 0 || ZR_DisposeEffectWorld(NULL, &dst) != 0) return 7;
  return ZR_Death();
}
