/* A host in one file: births the library, loads an effect, gives it a picture, and writes what comes back.
 *   minimal_host EFFECT.so OUTPUT.ppm [STOP]
 * With STOP the effect is told to stop after so many hundredths of its work. */
#include <ZR/zr.h>

#include <dlfcn.h>
#include <stdio.h>
#include <stdlib.h>

#include "effect_interface.h"

enum { kWidth = 320, kHeight = 200 };

typedef struct Job {
  i32 stop_at; /* hundredths */
  i32 told;
} Job;

static i32 on_progress(void* effect_ref, i32 done, i32 total) {
  Job* const job = (Job*)effect_ref;
  const i32 hundredths = (i32)((i64)done * 100 / total);
  if (hundredths / 25 > job->told / 25) printf("%d%%\n", hundredths);
  job->told = hundredths;
  return hundredths >= job->stop_at ? ZR_Err_UserAbort : ZR_Err_None;
}

static ZR_Pixel8* row_of(const ZR_LayerDef* world, i32 y) {
  return (ZR_Pixel8*)((char*)world->data + (ptrdiff_t)y * world->row_bytes);
}

/* Hills under a sky. */
static void draw_picture(ZR_LayerDef* world) {
  for (i32 y = 0; y < kHeight; ++y)
    for (i32 x = 0; x < kWidth; ++x) {
      ZR_Pixel8* const pixel = &row_of(world, y)[x];
      *pixel = (ZR_Pixel8){255, (u8)(90 + y / 2), (u8)(140 + y / 2), 235};
      for (i32 hill = 0; hill < 3; ++hill) {
        const i32 from_top = (x - 70 - 95 * hill) * (x - 70 - 95 * hill) / (300 - 60 * hill);
        if (y > 95 + 25 * hill + from_top) *pixel = (ZR_Pixel8){255, 60, (u8)(150 - 40 * hill), 70};
      }
    }
}

static int write_ppm(const char* file, const ZR_LayerDef* world) {
  FILE* const stream = fopen(file, "wb");
  if (stream == NULL) return 1;
  fprintf(stream, "P6\n%d %d\n255\n", world->width, world->height);
  for (i32 y = 0; y < world->height; ++y)
    for (i32 x = 0; x < world->width; ++x) {
      const ZR_Pixel8 pixel = row_of(world, y)[x];
      const u8 colour[3] = {pixel.red, pixel.green, pixel.blue};
      fwrite(colour, 1, sizeof colour, stream);
    }
  const int failed = ferror(stream);
  return fclose(stream) != 0 || failed;
}

static i32 run_effect(EffectFunc effect, Job* job, ZR_LayerDef* src, ZR_LayerDef* dst) {
  void* block[ZR_CallbackEntryCount];
  const ZR_BasicSuite* basic = NULL;
  ZR_InData in_data = {0};
  i32 error = ZR_GetCallbackBlock(ZR_Quality_Best, ZR_BlockFlag_Straight, block);
  if (error == 0) error = ZR_GetBasicSuite(&basic);
  in_data.progress = on_progress;
  in_data.effect_ref = job;
  return error != 0 ? error : effect(&in_data, block, basic, src, dst);
}

int main(int argc, char** argv) {
  Job job = {argc > 3 ? atoi(argv[3]) : 101, 0};
  ZR_LayerDef src, dst;
  if (argc < 3) return fprintf(stderr, "usage: minimal_host EFFECT.so OUTPUT.ppm [STOP]\n"), 2;
  void* const library = dlopen(argv[1], RTLD_NOW | RTLD_LOCAL);
  const EffectFunc effect = library != NULL ? (EffectFunc)dlsym(library, EFFECT_SYMBOL) : NULL;
  if (effect == NULL) return fprintf(stderr, "%s: %s\n", argv[1], dlerror()), 2;

  if (ZR_Birth() != 0) return fprintf(stderr, "the library was not born\n"), 1;
  i32 error = ZR_NewEffectWorld(NULL, kWidth, kHeight, 8, false, false, &src);
  if (error == 0) {
    error = ZR_NewEffectWorld(NULL, kWidth, kHeight, 8, true, false, &dst);
    if (error == 0) {
      draw_picture(&src);
      error = run_effect(effect, &job, &src, &dst);
      if (error == ZR_Err_UserAbort) printf("stopped at %d%%\n", job.told);
      if (error == 0) error = write_ppm(argv[2], &dst);
      ZR_DisposeEffectWorld(NULL, &dst);
    }
    ZR_DisposeEffectWorld(NULL, &src);
  }
  const i32 end = ZR_Death();
  dlclose(library);
  if (error != 0) fprintf(stderr, "error %d\n", error);
  return error != 0 || end != 0;
}
