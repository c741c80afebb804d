// TON: the way to the colour engine.
//
// An engine is a function that gives procedure tables by name. ZR_Birth asks for it and binds two tables;
// the classes of <ZR/prisma.h> call through them.
#pragma once

#include <ZR/prisma.h>

#include <atomic>

// Every engine object begins with this.
struct PRISMA_Object {
  std::atomic<i32> shares{1};
  void (*destroy)(PRISMA_Object*);
  explicit PRISMA_Object(void (*how)(PRISMA_Object*)) : destroy(how) {}
};

// All procedures return a status; an object that they give belongs to the caller, who holds one share.
// Nothing is written through an out pointer on failure. Any thread.
inline constexpr u32 PRISMA_TablesVersion = 1;
struct PRISMA_ProfileProcs {  // "PRISMA Profiles"
  u32 version;
  i32 (*from_memory)(const void* data, size_t size, PRISMAProfile** out);
  i32 (*from_file)(const char* path, PRISMAProfile** out);
  i32 (*standard)(u32 code, PRISMAProfile** out);
  i32 (*linear)(PRISMAProfile* profile, PRISMAProfile** out);
  i32 (*display)(const void* window, PRISMAProfile** out);
  i32 (*id)(PRISMAProfile* profile, _t_PRISMA_ID* out);
  i32 (*data)(PRISMAProfile* profile, const void** data, size_t* size);
  i32 (*colour_space)(PRISMAProfile* profile, u32* out);
  i32 (*name)(PRISMAProfile* profile, char16_t* text, size_t limit, size_t* length);  // units without the zero
  i32 (*is_over_range)(PRISMAProfile* profile, bool* out);
  i32 (*cal_rgb)(PRISMAProfile* profile, PRISMA_CalRGB* out);
};
struct PRISMA_TransformProcs {  // "PRISMA Transforms"
  u32 version;
  i32 (*create)(PRISMAProfile* from, PRISMAProfile* to, i32 intent, const PRISMA_Options* options,
                PRISMATransform** out);
  i32 (*concatenate)(PRISMATransform* first, PRISMATransform* then, PRISMATransform** out);
  i32 (*duplicate)(PRISMATransform* transform, PRISMATransform** out);
  i32 (*optimise)(PRISMATransform* transform, const PRISMA_Options* options, PRISMATransform** out);
  i32 (*apply)(PRISMATransform* transform, u32 src_layout, const void* src, u32 dst_layout, void* dst, size_t count,
               PRISMA_IterateFunc iterate);
  void (*shut_down)();  // gives back what the engine holds for itself
};

// Gives a table by name, null for an unknown one.
typedef const void* (*TON_AddressProc)(const char* table);

// Where an engine's tables are found: the built-in one, or what TON_SetQILAddressProc was given. 0.
i32 TON_GetQILAddressProc(TON_AddressProc* out);
// For hosts with an engine of their own, before ZR_Birth; null puts the built-in engine back.
void TON_SetQILAddressProc(TON_AddressProc proc);
// Takes the tables; false, with nothing bound, when one is missing or of another version. Allocates nothing.
bool TON_PRISMA_Bind(TON_AddressProc proc);
// Frees the default profile and shuts the engine down. Without a binding nothing happens.
void TON_PRISMA_Unbind();

// The bound tables, null without an engine.
const PRISMA_ProfileProcs* TON_PRISMA_ProfileTable();
const PRISMA_TransformProcs* TON_PRISMA_TransformTable();
// Engines' part: the built-in one's tables.
const void* TON_LcmsAddressProc(const char* table);
