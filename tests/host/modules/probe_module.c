/* A module for tests: says through the report function when it is called, so that a test sees the order of
 * the calls, and does as the definitions below say. Routine 0 and routine 2 are acceleration routines,
 * routine 1 is not. */
#include <ZR/module.h>

#ifndef PROBE_SITE /* distinguishes modules; routine 2 reports under the next number */
#define PROBE_SITE 0x100
#endif
#ifndef PROBE_VERSION
#define PROBE_VERSION 2
#endif
#ifndef PROBE_LOAD_RESULT /* of routine 0 */
#define PROBE_LOAD_RESULT 0
#endif
#ifndef PROBE_UNLOAD_RESULT /* of both */
#define PROBE_UNLOAD_RESULT 0
#endif

static i32 answer_of_module(void) { return PROBE_SITE; }

static i32 block_is_whole(const ZR_ModuleBlock* block) {
  f64 (*const square_root)(f64) = (f64(*)(f64))block->ansi[13];
  void* const memory = block->realloc(block->malloc(1), 8);
  u8* const zeroed = (u8*)block->calloc(2, 4);
  const i32 whole = memory != NULL && zeroed != NULL && zeroed[7] == 0 && block->exit != NULL &&
                    square_root(6.25) == 2.5 && block->multiply_table[255 * 256 + 77] == 77 &&
                    block->divide_table[100 * 256 + 50] == 128 && block->version_major == 2 &&
                    block->version_minor == 1;
  block->free(memory);
  block->free(zeroed);
  return whole;
}

/* Remembers the block and the two words, which stay valid until the end. */
static i32 run(i32 command, void** out, const ZR_ModuleBlock* block, void** out2, u16 site, const ZR_ModuleBlock** kept,
               void*** words, i32 slot, i32 result) {
  if (command == ZR_ModuleCommand_Load) {
    const i32 clean = *out == NULL && *out2 == NULL && block_is_whole(block);
    *kept = block;
    words[0] = out;
    words[1] = out2;
    *out = (void*)kept;
    *out2 = (void*)words;
    block->report(site, clean ? "load" : "load with a wrong block");
    block->slots[slot] = (ZR_SlotFunc)answer_of_module;
    block->slots[ZR_Slot_iterate_generic] = (ZR_SlotFunc)answer_of_module;
    return result;
  }
  (*kept)->report(site,
                  out == NULL && block == NULL && out2 == NULL && *words[0] == (void*)kept && *words[1] == (void*)words
                      ? "unload"
                      : "unload with wrong arguments");
  return PROBE_UNLOAD_RESULT;
}

static const ZR_ModuleBlock *block0, *block2;
static void **words0[2], **words2[2];

static i32 entry0(i32 command, void** out, const ZR_ModuleBlock* block, void** out2) {
  return run(command, out, block, out2, PROBE_SITE, &block0, words0, ZR_Slot_module0, PROBE_LOAD_RESULT);
}
static i32 entry1(i32 command, void** out, const ZR_ModuleBlock* block, void** out2) {
  (void)command, (void)out, (void)out2;
  block->report(PROBE_SITE, "a routine without the flag was called");
  return ZR_Err_Internal;
}
static i32 entry2(i32 command, void** out, const ZR_ModuleBlock* block, void** out2) {
  return run(command, out, block, out2, PROBE_SITE + 1, &block2, words2, ZR_Slot_module1, 0);
}

static const u32 version = PROBE_VERSION;
static const u16 short_version = 2; /* of another size: counts as none */
static const ZR_ModuleProperty manifest[] = {{0x6e616d65u, sizeof version, &version},
                                             {ZR_ModuleProp_Version, sizeof version, &version}};
static const ZR_ModuleProperty short_manifest[] = {{ZR_ModuleProp_Version, sizeof short_version, &short_version}};
static const ZR_ModuleRoutine routines[] = {
    {"probe 0", ZR_ModuleKind, ZR_ModuleFlag_Acceleration | 1u, 2, manifest, entry0},
    {"probe 1", ZR_ModuleKind, 7u, 2, manifest, entry1},
    {"probe 2", ZR_ModuleKind, ZR_ModuleFlag_Acceleration, 2, manifest, entry2},
    {"of another kind", 0x65465355u, ZR_ModuleFlag_Acceleration, 2, manifest, entry1},
    {"without version", ZR_ModuleKind, ZR_ModuleFlag_Acceleration, 0, NULL, entry1},
    {"with a short version", ZR_ModuleKind, ZR_ModuleFlag_Acceleration, 1, short_manifest, entry1}};

ZR_API extern const ZR_ModuleDescriptor ZR_Module;
const ZR_ModuleDescriptor ZR_Module = {ZR_ModuleDescriptorVersion, sizeof routines / sizeof *routines, routines};
