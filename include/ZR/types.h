/* Records and codes of the C interface. Usable from C11 and from C++20. */
#ifndef ZR_TYPES_H
#define ZR_TYPES_H

#include <assert.h>
#include <stddef.h>
#include <stdint.h>
#ifndef __cplusplus
#include <stdbool.h>
#endif

#if defined(_WIN32)
#define ZR_API __declspec(dllexport)
#else
#define ZR_API __attribute__((visibility("default")))
#endif

typedef uint8_t u8;
typedef uint16_t u16;
typedef uint32_t u32;
typedef uint64_t u64;
typedef int16_t i16;
typedef int32_t i32;
typedef int64_t i64;
typedef float f32;
typedef double f64;

#ifdef __cplusplus
extern "C" {
#endif

/* ------------------------------------------------------------------------------------ codes */

enum {
  ZR_Err_None = 0,
  ZR_Err_Internal = 3,          /* failed verification, misuse, or a bad argument of a callback */
  ZR_Err_OutOfMemory = 4,       /* an allocation failed */
  ZR_Err_UnimplementedMode = 5, /* a transfer mode that does not exist */
  ZR_Err_NoRasterWorld = 513,   /* a world without raster frame was asked for it */
  ZR_Err_BadSelector = 515,     /* unknown selector, or an obsolete routine */
  ZR_Err_BadParam = 516,        /* a parameter was refused with a message */
  ZR_Err_UserAbort = 517        /* what a host's progress function returns to stop an iteration */
};

/* ---------------------------------------------------------------------------------- records */

#if defined(__GNUC__)
#pragma GCC visibility push(default) /* the records are arguments of exported templates */
#endif

typedef struct ZR_Pixel8 {
  u8 alpha, red, green, blue;
} ZR_Pixel8; /* 0..255 */
typedef struct ZR_Pixel16 {
  u16 alpha, red, green, blue;
} ZR_Pixel16; /* 0..32768 */
typedef struct ZR_PixelFloat {
  f32 alpha, red, green, blue;
} ZR_PixelFloat; /* 0..1, unclamped */
typedef struct ZR_PixelDouble {
  f64 alpha, red, green, blue;
} ZR_PixelDouble;

/* Rectangles hold left..right-1 and top..bottom-1, in pixels. */
typedef struct GX_LRect {
  i32 left, top, right, bottom;
} GX_LRect;
typedef struct GX_Rect {
  i16 top, left, bottom, right;
} GX_Rect;
typedef struct GX_LPoint {
  i32 x, y;
} GX_LPoint;

/* m[row][column], applied to column vectors: x' = (m00 x + m01 y + m02) / (m20 x + m21 y + m22). */
typedef struct GX_Matrix3 {
  f64 m[3][3];
} GX_Matrix3;

/* A raster frame, always held by a handle (one dereference gives the record). */
typedef struct RS_World {
  i16 width, height;  /* pixels */
  i16 bits_per_pixel; /* 32, 64 or 128 */
  i16 channel_order;  /* 0 alpha first, 1 blue first */
  i32 row_bytes;
  u32 lock_count;
  void* base; /* address of the top left pixel; null while the frame has no memory */
} RS_World;

struct ZR_World;

/* The image record that hosts and plug-ins pass around ("effect world"). */
typedef struct ZR_LayerDef {
  u64 reserved0[2];
  u32 flags; /* top byte: pixel format 0, 1, 2 for 8, 16, float; bit 0 set on a 16-bit world */
  u32 reserved1;
  void* data;        /* top left pixel */
  i32 row_bytes;     /* bytes from one row to the next; may be negative or padded in foreign memory */
  i32 width, height; /* pixels */
  GX_LRect extent;   /* the part known to hold content */
  u32 reserved2[3];
  u32 dispose_tag; /* ZR_DisposeTag on a record that ZR_NewEffectWorld filled */
  u32 reserved3;
  struct ZR_World* owner; /* the C++ world behind this record, or null */
  u64 host_word;          /* the host's own; sub-worlds inherit it */
  RS_World** raster;      /* the raster frame behind this world, or null */
  u64 reserved4[2];
} ZR_LayerDef;
typedef ZR_LayerDef ZR_EffectWorld;

#define ZR_DisposeTag 0xaaaabbbbu /* this record may be given to ZR_DisposeEffectWorld */
#define ZR_DeadTag 0xdeadu        /* left behind by the destructor of a world */

typedef i32 (*ZR_AbortFunc)(void* refcon);
typedef i32 (*ZR_ProgressFunc)(void* refcon, i32 done, i32 total);

/* First argument of every long operation; may be null, and each function may be null.
 * progress is asked if it is there, else abort; a non-zero answer stops the work and is returned. */
typedef struct ZR_ProgressInfo {
  void* refcon;
  ZR_AbortFunc abort;
  ZR_ProgressFunc progress;
} ZR_ProgressInfo;

/* The host's record of an effect call; only the two named fields are read here. */
typedef struct ZR_InData {
  u64 reserved0[4];
  ZR_ProgressFunc progress; /* (effect_ref, done, total); 517 stops an iteration at the row's end */
  u64 reserved1[18];
  void* effect_ref;
} ZR_InData;

/* Tables that take stored values to linear light and back; immutable once built.
 * from_linear follows to_linear directly: code may address it as entries 256 and up of one array. */
typedef struct ZR_LinearBlendingTables {
  u16 to_linear[256];    /* [i]: linear value 0..32768 of the stored 8-bit value i */
  u16 from_linear[4097]; /* [k]: stored value 0..32768 of the linear value 8 * k */
  f32 to_linear_gamma;   /* exponent into linear light, for float pixels */
  f32 from_linear_gamma; /* 1 / to_linear_gamma */
} ZR_LinearBlendingTables;

/* How a rectangle is composited, as hosts and plug-ins hold it. */
typedef struct ZR_CompositeMode {
  i32 xfer;      /* transfer mode, -3..40 */
  i32 rand_seed; /* for XferDissolve */
  u8 opacity;    /* 0..255 */
  u8 keep_alpha; /* non-zero: the destination's alpha stays as it is */
  u16 opacity16; /* 0..32768; taken instead of opacity while both agree within one 8-bit step */
} ZR_CompositeMode;

/* The same with linear-light tables and one exact opacity 0..1 (not clamped). */
typedef struct ZR_CompositeModePlus {
  i32 xfer;
  i32 rand_seed;
  bool keep_alpha;
  const ZR_LinearBlendingTables* tables;
  f32 opacity;
#ifdef __cplusplus
  ZR_CompositeModePlus() {} /* leaves every field unset */
  ZR_CompositeModePlus(i32 xfer_, f32 opacity_, const ZR_LinearBlendingTables* tables_, bool keep_alpha_,
                       i32 rand_seed_)
      : xfer(xfer_), rand_seed(rand_seed_), keep_alpha(keep_alpha_), tables(tables_), opacity(opacity_) {}
  /* The opacity that the two fields of a plain record mean; leaves `tables` unset. */
  ZR_API explicit ZR_CompositeModePlus(const ZR_CompositeMode& plain);
#endif
} ZR_CompositeModePlus;

/* A mask over the destination: a world of the same depth, where its origin lies, and its kind:
 * 0 alpha, 1 inverted alpha, 2 alpha times luminance, 3 the inverse of that.
 * Even kinds restrict the composite to the mask's area; odd kinds are fully open outside of it. */
typedef struct ZR_MaskWorld {
  ZR_LayerDef world;
  i32 offset_x, offset_y;
  u32 kind;
} ZR_MaskWorld;

/* A typed block of channels behind a handle. */
typedef struct ZR_Chunk {
  u64 reserved0[8];
  i32 width, height, channels;
  i32 row_bytes;
  i32 type; /* four characters as a big-endian word: 'FLT4', 'DBL8', 'SHT2', 'UBT1', ... */
  i32 reserved1;
  void** handle;
  void* data; /* the block while locked, else null */
} ZR_Chunk;

#if defined(__GNUC__)
#pragma GCC visibility pop
#endif

#ifdef __cplusplus
#define ZR_ASSERT_LAYOUT(condition) static_assert(condition, #condition)
#else
#define ZR_ASSERT_LAYOUT(condition) _Static_assert(condition, #condition)
#endif
ZR_ASSERT_LAYOUT(sizeof(ZR_Pixel8) == 4 && sizeof(ZR_Pixel16) == 8);
ZR_ASSERT_LAYOUT(sizeof(ZR_PixelFloat) == 16 && sizeof(ZR_PixelDouble) == 32);
ZR_ASSERT_LAYOUT(sizeof(GX_LRect) == 16 && sizeof(GX_Rect) == 8 && sizeof(GX_LPoint) == 8 && sizeof(GX_Matrix3) == 72);
ZR_ASSERT_LAYOUT(offsetof(RS_World, row_bytes) == 8 && offsetof(RS_World, lock_count) == 12);
ZR_ASSERT_LAYOUT(offsetof(RS_World, base) == 16 && sizeof(RS_World) == 24);
ZR_ASSERT_LAYOUT(offsetof(ZR_LayerDef, flags) == 16 && offsetof(ZR_LayerDef, data) == 24);
ZR_ASSERT_LAYOUT(offsetof(ZR_LayerDef, row_bytes) == 32 && offsetof(ZR_LayerDef, width) == 36);
ZR_ASSERT_LAYOUT(offsetof(ZR_LayerDef, height) == 40 && offsetof(ZR_LayerDef, extent) == 44);
ZR_ASSERT_LAYOUT(offsetof(ZR_LayerDef, dispose_tag) == 72 && offsetof(ZR_LayerDef, owner) == 80);
ZR_ASSERT_LAYOUT(offsetof(ZR_LayerDef, host_word) == 88 && offsetof(ZR_LayerDef, raster) == 96);
ZR_ASSERT_LAYOUT(sizeof(ZR_LayerDef) == 120);
ZR_ASSERT_LAYOUT(offsetof(ZR_ProgressInfo, abort) == 8 && sizeof(ZR_ProgressInfo) == 24);
ZR_ASSERT_LAYOUT(offsetof(ZR_InData, progress) == 32 && offsetof(ZR_InData, effect_ref) == 184);
ZR_ASSERT_LAYOUT(offsetof(ZR_LinearBlendingTables, from_linear) == 512);
ZR_ASSERT_LAYOUT(offsetof(ZR_LinearBlendingTables, to_linear_gamma) == 8708);
ZR_ASSERT_LAYOUT(offsetof(ZR_LinearBlendingTables, from_linear_gamma) == 8712);
ZR_ASSERT_LAYOUT(offsetof(ZR_CompositeMode, opacity) == 8 && offsetof(ZR_CompositeMode, opacity16) == 10);
ZR_ASSERT_LAYOUT(sizeof(ZR_CompositeMode) == 12);
ZR_ASSERT_LAYOUT(offsetof(ZR_CompositeModePlus, keep_alpha) == 8 && offsetof(ZR_CompositeModePlus, tables) == 16);
ZR_ASSERT_LAYOUT(offsetof(ZR_CompositeModePlus, opacity) == 24 && sizeof(ZR_CompositeModePlus) == 32);
ZR_ASSERT_LAYOUT(offsetof(ZR_MaskWorld, offset_x) == 120 && offsetof(ZR_MaskWorld, kind) == 128);
ZR_ASSERT_LAYOUT(sizeof(ZR_MaskWorld) == 136);
ZR_ASSERT_LAYOUT(offsetof(ZR_Chunk, width) == 64 && offsetof(ZR_Chunk, row_bytes) == 76);
ZR_ASSERT_LAYOUT(offsetof(ZR_Chunk, type) == 80 && offsetof(ZR_Chunk, handle) == 88);
ZR_ASSERT_LAYOUT(offsetof(ZR_Chunk, data) == 96 && sizeof(ZR_Chunk) == 104);

#ifdef __cplusplus
}
#endif

#endif
