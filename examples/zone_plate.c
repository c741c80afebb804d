/* Draws a zone plate, rings that get finer outwards, and reduces it with three samplers: the nearest pixel, a bilinear
 * point, and the mean of the area under each new pixel. Writes four PPM files.
 *   zone_plate FOLDER */
#include <ZR/sample.h>
#include <ZR/zr.h>

#include <math.h>
#include <stdio.h>

enum { kLarge = 640, kSmall = 176 };
#define STEP ((double)kLarge / kSmall) /* pixels of the large picture to one of the small */

static ZR_Pixel8* row_of(const ZR_LayerDef* world, i32 y) {
  return (ZR_Pixel8*)((char*)world->data + (ptrdiff_t)y * world->row_bytes);
}

static i32 fixed(double pixels) { return (i32)lround(pixels * 65536); }

static void draw_rings(ZR_LayerDef* world) {
  for (i32 y = 0; y < world->height; ++y) {
    for (i32 x = 0; x < world->width; ++x) {
      const double dx = x + 0.5 - kLarge / 2.0, dy = y + 0.5 - kLarge / 2.0;
      /* Two pixels a ring at the middle of each side. */
      const u8 grey = (u8)lround(127.5 + 127.5 * cos(acos(-1) * (dx * dx + dy * dy) / kLarge));
      const ZR_Pixel8 pixel = {255, grey, grey, grey};
      row_of(world, y)[x] = pixel;
    }
  }
}

static void reduce(ZR_LayerDef* from, ZR_SampleFunc8 sampler, ZR_LayerDef* to) {
  ZR_SampPB params = {0};
  params.src = from;
  params.x_radius = params.y_radius = fixed(STEP / 2);
  params.area = fixed(STEP * STEP);
  for (i32 y = 0; y < to->height; ++y)
    for (i32 x = 0; x < to->width; ++x)
      sampler(NULL, fixed((x + 0.5) * STEP - 0.5), fixed((y + 0.5) * STEP - 0.5), &params, &row_of(to, y)[x]);
}

static int write_ppm(const char* folder, const char* name, const ZR_LayerDef* world) {
  char file[4096];
  snprintf(file, sizeof file, "%s/%s.ppm", folder, name);
  FILE* stream = fopen(file, "wb");
  if (stream == NULL) return 1;
  fprintf(stream, "P6\n%d %d\n255\n", world->width, world->height);
  for (i32 y = 0; y < world->height; ++y) {
    for (i32 x = 0; x < world->width; ++x) {
      const ZR_Pixel8 pixel = row_of(world, y)[x];
      const u8 colour[3] = {pixel.red, pixel.green, pixel.blue};
      fwrite(colour, 1, 3, stream);
    }
  }
  const int failed = ferror(stream);
  return fclose(stream) != 0 || failed;
}

int main(int argc, char** argv) {
  static const struct {
    const char* name;
    ZR_SampleFunc8 sampler;
  } ways[] = {
      {"zone-draft", ZR_NNSample}, {"zone-point", ZR_SubpixelSample_Straight}, {"zone-area", ZR_AreaSample_Straight}};
  ZR_LayerDef large, small;
  int failed = argc != 2 || ZR_Birth() != 0;
  if (!failed) {
    failed = ZR_NewEffectWorld(NULL, kLarge, kLarge, 8, false, false, &large) != 0 ||
             ZR_NewEffectWorld(NULL, kSmall, kSmall, 8, false, false, &small) != 0;
    if (!failed) {
      draw_rings(&large);
      failed = write_ppm(argv[1], "zone", &large);
      for (size_t i = 0; i < sizeof ways / sizeof ways[0]; ++i) {
        reduce(&large, ways[i].sampler, &small);
        failed |= write_ppm(argv[1], ways[i].name, &small);
      }
      ZR_DisposeEffectWorld(NULL, &large);
      ZR_DisposeEffectWorld(NULL, &small);
    }
    ZR_Death();
  }
  if (failed) fprintf(stderr, "usage: zone_plate FOLDER (which can be written to)\n");
  return failed;
}
