/* What a host may set and ask of the layers below the library: messages, memory, threads, frames.
 * Usable from C. Setters belong to the main thread while nothing renders, except where noted. */
#ifndef ZR_PLATFORM_H
#define ZR_PLATFORM_H

#include <ZR/zr.h>

#ifdef __cplusplus
extern "C" {
#endif

/* -------------------------------------------------------------------------------- messages */

/* code: 0x25 in the high half for this library, a call-site number in the low half. severity: 8.
 * text: UTF-8, valid during the call. May be called on any thread that works for the library. */
typedef void (*HB_MessageSink)(void* refcon, u32 code, i32 severity, const char* text);
/* A failed internal check: a programming error of a caller. */
typedef void (*HB_VerificationSink)(void* refcon, u32 code, i32 line, const char* text);

/* Null puts the default back, which writes to the log. */
ZR_API void HB_SetMessageSink(HB_MessageSink sink, void* refcon);
ZR_API void HB_SetVerificationSink(HB_VerificationSink sink, void* refcon);

/* Shows a message, unless the calling thread is inside a quiet pair. */
ZR_API void HBp_ReportErrString(u32 code, i32 severity, const char* text);
ZR_API void HB_ReportFailedVerification(u32 code, i32 line, i32 unused, const char* text);
/* Pairs nest; messages (not verifications) of this thread are dropped in between. Start returns 0.
 * End returns the first error code that was dropped, else 0. */
ZR_API i32 HB_StartQuietErrorsOnCurrentThread(void);
ZR_API i32 HB_EndQuietErrorsOnCurrentThread(void);

/* ---------------------------------------------------------------------------------- memory */

typedef struct HB_MemoryStats {
  u64 live_blocks, live_bytes; /* now */
  u64 peak_bytes;              /* since the process began */
  u64 allocations;             /* attempts since the process began */
} HB_MemoryStats;
/* Counts of everything that the library allocates; any thread. Frames at rest in the recycling pool
 * are not live. */
ZR_API void HB_GetMemoryStats(HB_MemoryStats* out);
/* For tests: the n-th allocation from now on fails, once (1 is the next); 0 switches this off. */
ZR_API void HB_FailNthAllocation(u64 n);

/* --------------------------------------------------------------------------------- threads */

/* How many threads a parallel operation should size for: what HB_SetNumThreads said, else
 * `default_count`. Never below 1. Returns 0. Any thread. */
ZR_API i32 HB_GetNumThreads(i32* out, i32 default_count);
/* 0 takes the setting back. */
ZR_API void HB_SetNumThreads(i32 count);

/* ------------------------------------------------------------------------------- processor */

/* i32 words counted from 0, each non-zero where the processor has: 0 a floating point unit, 1 MMX,
 * 2 SSE2, 3 SSE3, 4 SSSE3, 5 hardware threads counted, 6 SSE4.1, 7 AVX2, 8 AVX-512. ZR_Birth reads
 * it once. The preference "cpu" (ZR_CPU=scalar|sse4|avx2|avx512) caps it. */
enum { HB_CPU_WordCount = 16 };
ZR_API extern const i32* HB_G_CPU_DataP;

/* ---------------------------------------------------------------------------- raster frames */

/* A raster world of 32, 64 or 128 bits a pixel, zeroed, base address set, alpha first; the base is
 * aligned and the rows are padded to 64 bytes. Only the size of `bounds` counts, 1..32767 each way. `format` is not
 * read. 0; 516 for another size or depth; 4 with a message when memory is short. *out is null on failure. */
ZR_API i32 RS_NewWorld(const GX_Rect* bounds, i32 format, i32 bits_per_pixel, RS_World*** out);
ZR_API void RS_DisposeWorld(RS_World** raster); /* null is nothing; locks do not matter */
/* Counted. 0; 4 for a frame without memory, 516 for null. Any thread. */
ZR_API i32 RS_LoadLockPixels(RS_World** raster);
ZR_API void RS_UnlockPixels(RS_World** raster);

/* Frames that are freed wait in a pool for the next of their size. The limit is in bytes, 256 MiB at
 * first; beyond it the frames that wait longest go back to the system. Any thread. */
ZR_API void RS_SetFramePoolLimit(u64 bytes);
ZR_API u64 RS_GetFramePoolSize(void);
/* Gives all waiting frames back to the system. */
ZR_API void RS_PurgeFramePool(void);

/* ---------------------------------------------------------------------------------- modules */

/* Folders that the next ZR_Birth scans for acceleration modules, in this order; the texts are copied.
 * None (count below 1) puts the preference "modules.folders" back. Null entries are passed over. */
ZR_API void ADDIN_SetModuleFolders(const char* const* folders, i32 count);

#ifdef __cplusplus
}

/* Base of heap objects that are counted with the rest; operator new gives null when memory is short. */
class ZR_API HB_MemTrackedObject {
 public:
  static void* operator new(size_t bytes) noexcept;
  static void* operator new(size_t, void* place) noexcept { return place; }
  static void operator delete(void* block) noexcept;
};
#endif

#endif
