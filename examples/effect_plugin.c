/* An effect plug-in: gives a picture two colours by its brightness, mixes that with the picture itself, and darkens the
 * corners. Build it as a shared object; it links with nothing of the library. */
#include "effect_interface.h"

typedef struct Suites {
  const ZR_WorldSuite2* worlds;
  const ZR_Iterate8Suite1* iterate;
  const ZR_ColorSuite1* colours;
  const ZR_WorldTransformSuite1* transform;
} Suites;

typedef struct Wanted {
  const char* name;
  i32 version;
} Wanted;
static const Wanted wanted[] = {
    {ZR_WorldSuite_Name, 2}, {ZR_Iterate8Suite_Name, 1}, {ZR_ColorSuite_Name, 1}, {ZR_WorldTransformSuite_Name, 1}};
enum { kSuites = sizeof wanted / sizeof wanted[0] };

/* What the pixel functions know. */
typedef struct Tint {
  const ZR_ColorSuite1* colours;
  ZR_Pixel8 dark, light;
  f64 middle_x, middle_y, reach; /* reach: squared distance of the corners */
} Tint;

/* luminance: hundredths of a level. */
static u8 between(u8 from, u8 to, i32 luminance) { return (u8)(from + (to - from) * luminance / 25500); }

static i32 two_colours(void* refcon, i32 x, i32 y, const void* in, void* out) {
  const Tint* const tint = (const Tint*)refcon;
  const ZR_Pixel8* const from = (const ZR_Pixel8*)in;
  ZR_Pixel8* const to = (ZR_Pixel8*)out;
  i32 luminance = 0;
  const i32 error = tint->colours->luminance(NULL, from, &luminance);
  (void)x, (void)y;
  to->alpha = from->alpha;
  to->red = between(tint->dark.red, tint->light.red, luminance);
  to->green = between(tint->dark.green, tint->light.green, luminance);
  to->blue = between(tint->dark.blue, tint->light.blue, luminance);
  return error; /* anything but 0 stops the walk */
}

/* In place: in and out are the same pixel. */
static i32 darken_corners(void* refcon, i32 x, i32 y, const void* in, void* out) {
  const Tint* const tint = (const Tint*)refcon;
  ZR_Pixel8* const pixel = (ZR_Pixel8*)out;
  const f64 dx = x + 0.5 - tint->middle_x, dy = y + 0.5 - tint->middle_y;
  const f64 far = (dx * dx + dy * dy) / tint->reach; /* 0 in the middle, 1 in the corners */
  const f64 light = 1 - 0.6 * far * far;
  (void)in;
  pixel->red = (u8)(pixel->red * light + 0.5);
  pixel->green = (u8)(pixel->green * light + 0.5);
  pixel->blue = (u8)(pixel->blue * light + 0.5);
  return ZR_Err_None;
}

static i32 draw(ZR_InData* in_data, void* const* block, const Suites* suites, ZR_LayerDef* src, ZR_LayerDef* dst) {
  /* An entry of the block, by its number; null where this host has none. */
  f64 (*const square_root)(f64) = (f64(*)(f64))block[ZR_Entry_sqrt];
  const i32 rows = src->height, total = 2 * rows;
  ZR_LayerDef coloured;
  Tint tint = {suites->colours, {255, 26, 22, 74}, {255, 255, 214, 150}, src->width / 2.0, src->height / 2.0, 0};
  i32 error;
  if (square_root == NULL) return ZR_Err_BadParam;
  tint.reach = square_root(tint.middle_x * tint.middle_x + tint.middle_y * tint.middle_y);
  tint.reach *= tint.reach;

  error = suites->worlds->new_world(NULL, src->width, src->height, false, ZR_PixelFormat_ARGB8, &coloured);
  if (error != 0) return error;
  /* The first half of the progress, then the second; a refusal comes back as the result. */
  error = suites->iterate->iterate(in_data, 0, total, src, NULL, &tint, two_colours, &coloured);
  if (error == 0) error = suites->transform->blend(NULL, src, &coloured, 49152, dst); /* of 65536: three quarters */
  if (error == 0) error = suites->iterate->iterate(in_data, rows, total, NULL, NULL, &tint, darken_corners, dst);
  suites->worlds->dispose_world(NULL, &coloured);
  return error;
}

ZR_API i32 render_effect(ZR_InData* in_data, void* const* block, const ZR_BasicSuite* basic, ZR_LayerDef* src,
                         ZR_LayerDef* dst) {
  const void* found[kSuites];
  Suites suites;
  i32 error = 0, held = 0;
  /* Each suite that was acquired is released, also when a later one is not there (515). */
  while (held < kSuites && (error = basic->acquire(wanted[held].name, wanted[held].version, &found[held])) == 0) ++held;
  if (error == 0) {
    suites.worlds = (const ZR_WorldSuite2*)found[0];
    suites.iterate = (const ZR_Iterate8Suite1*)found[1];
    suites.colours = (const ZR_ColorSuite1*)found[2];
    suites.transform = (const ZR_WorldTransformSuite1*)found[3];
    error = draw(in_data, block, &suites, src, dst);
  }
  while (held > 0) {
    --held;
    basic->release(wanted[held].name, wanted[held].version);
  }
  return error;
}
