/* The interface of acceleration modules: shared objects with the extension .ZNX that replace slots.
 *
 * A module exports one record, `ZR_ModuleDescriptor ZR_Module`, which lists its routines. At birth, after
 * the slots got their default routines, each routine that has the kind, the flag and the version below is
 * called with ZR_ModuleCommand_Load, the last of a file first, and may rewrite slots. If it returns
 * non-zero, or throws an i32, every slot goes back to what it was before the call, the user is told, and
 * the module is refused; birth goes on and the other modules are kept. At death each is called once more
 * with ZR_ModuleCommand_Unload, in the order of loading. Whoever births again is asked again.
 *
 * What it puts into a slot must do what the default does, bit for bit, be callable from any thread, and
 * stay callable until Unload. The routine that it replaces may be kept and called from the new one.
 * A module needs no library to link with: all it may use stands in the block. Usable from C. */
#ifndef ZR_MODULE_H
#define ZR_MODULE_H

#include <ZR/slots.h>
#include <ZR/zr.h>

#define ZR_ModuleKind 0x65465354u         /* 'eFST' */
#define ZR_ModuleFlag_Acceleration 0x8u   /* bit 3 of a routine's flags: it wants the slot table */
#define ZR_ModuleProp_Version 0x76657273u /* 'vers': four bytes, a u32 that must be 2 */

enum { ZR_ModuleCommand_Load = 0, ZR_ModuleCommand_Unload = 1 };

/* What a routine receives when it is loaded. The block and what it points to stay valid until Unload, the two
 * tables until death begins: they are gone when Unload is called. */
typedef struct ZR_ModuleBlock {
  void (*report)(u16 call_site, const char* text); /* shows a message; call_site is a number of the module's own */
  void* ansi[19]; /* atan, atan2, ceil, cos, exp, fabs, floor, fmod, hypot, log, log10, pow,
                     sin, sqrt, tan, sprintf, strcpy, asin, acos */
  void* (*calloc)(size_t, size_t);
  void (*free)(void*);
  void* (*malloc)(size_t);
  void* (*realloc)(void*, size_t);
  void (*exit)(int);
  const u8* multiply_table; /* 256 x 256, row * 256 + column: row * column / 255, rounded */
  const u8* divide_table;   /* column * 255 / row, rounded, 255 from column >= row on */
  u32 version_major;        /* 2 */
  u32 version_minor;        /* 1 */
  ZR_SlotFunc* slots;       /* ZR_SlotCount entries */
} ZR_ModuleBlock;

/* Rows, as many slots hold them (premultiply and unmultiply, 35 and 36, among them): n pixels from src to
 * dst, in place where src is null or dst. Returns 0. */
typedef i32 (*ZR_ModuleRow8)(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst);
typedef i32 (*ZR_ModuleRow16)(i32 n, const ZR_Pixel16* src, ZR_Pixel16* dst);
typedef i32 (*ZR_ModuleRowFloat)(i32 n, const ZR_PixelFloat* src, ZR_PixelFloat* dst);

/* Load: (0, out, block, out2), where *out and *out2 are words for the module's own use, zero at first and
 * kept for it until Unload. Unload: (1, 0, 0, 0). Returns 0, or a code for which the module is refused, or
 * which becomes the result of death. */
typedef i32 (*ZR_ModuleEntry)(i32 command, void** out, const ZR_ModuleBlock* block, void** out2);

typedef struct ZR_ModuleProperty {
  u32 key;
  u32 size;
  const void* data;
} ZR_ModuleProperty;

typedef struct ZR_ModuleRoutine {
  const char* name;
  u32 kind;           /* ZR_ModuleKind */
  u32 flags;          /* ZR_ModuleFlag_Acceleration */
  u32 property_count; /* the Manifest */
  const ZR_ModuleProperty* properties;
  ZR_ModuleEntry entry;
} ZR_ModuleRoutine;

/* ------------------------------------------------------------------------------ for hosts */

#ifdef __cplusplus
extern "C" {
#endif

/* The name of a slot as in ZR_SlotIndex, without its prefix; null for one without. Any thread. */
ZR_API const char* ZR_GetSlotName(i32 slot);

/* Compares two routines of a slot, on the main thread, while the library is being born: 0 where `now` does what
 * `before` does, above 0 where it does not, below where that cannot be told. A Hostkit brings one (<ZR/hostkit.h>). */
typedef i32 (*ZR_SlotCheck)(void* refcon, i32 slot, ZR_SlotFunc before, ZR_SlotFunc now);
/* The check of the following births: asked for each slot that a routine of a module rewrote, after it was loaded and
 * before the suites are made. A slot that was emptied counts as one that differs, unasked. What differs is named in the
 * log and, by the preference "module.check" (ZR_MODULE_CHECK=off|warn|strict), put back (strict, without a preference),
 * kept (warn), or not asked for (off). Null: no check. Main thread. */
ZR_API void ZR_SetSlotCheck(ZR_SlotCheck check, void* refcon);

/* What the last birth found in the module folders, file by file: path, whether it was accepted, and if not why. The
 * texts are valid until the next birth. 516 for an index behind the last. Main thread. */
typedef struct ZR_ModuleFile {
  const char* path;
  i32 accepted;
  const char* reason; /* empty for one accepted */
} ZR_ModuleFile;
ZR_API i32 ZR_GetModuleFile(i32 index, ZR_ModuleFile* out);
/* The same for the slots that accepted modules rewrote, in the order of loading. Valid until death. */
typedef enum ZR_SlotVerdict {
  ZR_SlotVerdict_Replaced = 0, /* in use, not checked or without a check */
  ZR_SlotVerdict_Kept = 1,     /* differs and is in use */
  ZR_SlotVerdict_PutBack = 2,  /* differs and is not in use */
  ZR_SlotVerdict_Equal = 3     /* in use, checked */
} ZR_SlotVerdict;
typedef struct ZR_ModuleSlot {
  const char* routine; /* the module's name for its routine */
  i32 slot;
  i32 verdict;
} ZR_ModuleSlot;
ZR_API i32 ZR_GetModuleSlot(i32 index, ZR_ModuleSlot* out);

#ifdef __cplusplus
}
#endif

#define ZR_ModuleDescriptorVersion 1u
#define ZR_ModuleDescriptorSymbol "ZR_Module"
typedef struct ZR_ModuleDescriptor {
  u32 version; /* ZR_ModuleDescriptorVersion */
  u32 routine_count;
  const ZR_ModuleRoutine* routines;
} ZR_ModuleDescriptor;

#endif
