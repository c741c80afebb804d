/* An acceleration module: replaces the row that premultiplies 8-bit pixels by one that skips the products
 * of opaque and of clear pixels, and counts what it was asked for.
 *
 * Build it as a shared object accelerate_premul.ZNX and name its folder in modules.folders or to the host.
 * It links with nothing of the library. */
#include <ZR/module.h>

#include <stdatomic.h>

/* For programs that want to see the module at work: look these up in the loaded file. */
ZR_API u64 accelerate_premul_rows(void);    /* calls of the row so far */
ZR_API u64 accelerate_premul_unloads(void); /* how often it was told to go */

static atomic_ullong rows_done;
static atomic_ullong unloads_done;
static const u8* multiply_table; /* written before any row runs */

/* Must equal the default row for every pixel: the products are those of the shared table. */
static i32 premultiply_row(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  static const ZR_Pixel8 clear = {0, 0, 0, 0};
  i32 i;
  atomic_fetch_add_explicit(&rows_done, 1, memory_order_relaxed);
  if (src == NULL) src = dst;
  for (i = 0; i < n; ++i) {
    const ZR_Pixel8 pixel = src[i];
    if (pixel.alpha == 255) {
      dst[i] = pixel;
    } else if (pixel.alpha == 0) {
      dst[i] = clear;
    } else {
      const u8* const by_alpha = multiply_table + (size_t)pixel.alpha * 256;
      dst[i].alpha = pixel.alpha;
      dst[i].red = by_alpha[pixel.red];
      dst[i].green = by_alpha[pixel.green];
      dst[i].blue = by_alpha[pixel.blue];
    }
  }
  return ZR_Err_None;
}

static i32 entry(i32 command, void** out, const ZR_ModuleBlock* block, void** out2) {
  (void)out;
  (void)out2;
  if (command == ZR_ModuleCommand_Unload) {
    atomic_fetch_add_explicit(&unloads_done, 1, memory_order_relaxed);
    return ZR_Err_None;
  }
  if (block->version_major != 2) return ZR_Err_BadParam; /* another block than the one we know */
  multiply_table = block->multiply_table;
  block->slots[ZR_Slot_premul_row8] = (ZR_SlotFunc)premultiply_row;
  return ZR_Err_None;
}

u64 accelerate_premul_rows(void) { return atomic_load(&rows_done); }
u64 accelerate_premul_unloads(void) { return atomic_load(&unloads_done); }

static const u32 version = 2;
static const ZR_ModuleProperty manifest[] = {{ZR_ModuleProp_Version, sizeof version, &version}};
static const ZR_ModuleRoutine routines[] = {
    {"premultiply 8-bit rows", ZR_ModuleKind, ZR_ModuleFlag_Acceleration, 1, manifest, entry}};

ZR_API extern const ZR_ModuleDescriptor ZR_Module;
const ZR_ModuleDescriptor ZR_Module = {ZR_ModuleDescriptorVersion, 1, routines};
