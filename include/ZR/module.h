/* The interface of acceleration modules: shared objects with the extension .ZNX that replace slots.
 *
 * A module exports one record, `ZR_ModuleDescriptor ZR_Module`, which lists its routines. At birth
 * each routine is called with command ZR_ModuleCommand_Load and may rewrite slots of the table; if it
 * returns non-zero every slot goes back to what it was, the module is refused and the others are
 * kept. At death it is called once more with ZR_ModuleCommand_Unload. Usable from C. */
#ifndef ZR_MODULE_H
#define ZR_MODULE_H

#include <ZR/slots.h>
#include <ZR/zr.h>

#define ZR_ModuleKind 0x65465354u         /* 'eFST' */
#define ZR_ModuleFlag_Acceleration 0x8u   /* bit 3 of a routine's flags: it wants the slot table */
#define ZR_ModuleProp_Version 0x76657273u /* 'vers': four bytes, a u32 that must be 2 */

enum { ZR_ModuleCommand_Load = 0, ZR_ModuleCommand_Unload = 1 };

/* What a routine receives when it is loaded. The pointers stay valid until it is unloaded. */
typedef struct ZR_ModuleBlock {
  void (*report)(u16 call_site, const char* text); /* shows a message, severity 8 */
  void* ansi[19]; /* atan, atan2, ceil, cos, exp, fabs, floor, fmod, hypot, log, log10, pow,
                     sin, sqrt, tan, sprintf, strcpy, asin, acos */
  void* (*calloc)(size_t, size_t);
  void (*free)(void*);
  void* (*malloc)(size_t);
  void* (*realloc)(void*, size_t);
  void (*exit)(int);
  const u8* multiply_table; /* 256 x 256, row * 256 + column */
  const u8* divide_table;
  u32 version_major;  /* 2 */
  u32 version_minor;  /* 1 */
  ZR_SlotFunc* slots; /* ZR_SlotCount entries */
} ZR_ModuleBlock;

/* Load: (0, out, block, out2), where *out and *out2 are words for the module's own use, kept for it.
 * Unload: (1, 0, 0, 0). Returns 0, or a code for which the module is refused. */
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

#define ZR_ModuleDescriptorVersion 1u
#define ZR_ModuleDescriptorSymbol "ZR_Module"
typedef struct ZR_ModuleDescriptor {
  u32 version; /* ZR_ModuleDescriptorVersion */
  u32 routine_count;
  const ZR_ModuleRoutine* routines;
} ZR_ModuleDescriptor;

#endif
