// A working host in one object: births the library with threads in the iterate slot, a message sink and
// module folders, and ends it again. Link ZR::hostkit.
#pragma once

#include <ZR/zr.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace zr {

struct HostkitOptions {
  // Threads for row-parallel work: 0 takes the machine's count, 1 keeps the serial body. HB_GetNumThreads
  // answers with the same number, so that operations size their scratch by it.
  int threads = 0;
  // Folders that are scanned for .ZNX acceleration modules, in this order; none leaves the preference.
  std::vector<std::string> module_folders = {};
  // Receives every message; null leaves them to the log. Called on whichever thread reports, also on two at
  // once; must not throw.
  std::function<void(u32 code, i32 severity, const std::string& text)> message_sink = nullptr;
  // Receives failed verifications; null leaves them to the log.
  std::function<void(u32 code, i32 line, const std::string& text)> verification_sink = nullptr;
  // Bytes that the frame pool may keep for reuse; negative leaves the pool's default.
  i64 frame_pool_limit = -1;
};

// One at a time in a process; construct and destroy on the main thread while nothing renders.
//
// With more than one thread, ZR_IterateGeneric works like this:
//   - thread_index is in 0..threads()-1; two callbacks of one call that run at the same time have two indices.
//   - A count runs every i once, in bands of consecutive i, in any order. -1 calls fn(refcon, t, t, threads())
//     once for each index t, at the same time as far as threads are free; callbacks must not wait for each other.
//   - After a failure no iteration behind it is started any more. Those before it are finished, so the result is
//     that of the smallest failing i, the one that a serial walk returns.
//   - A call from inside a callback is done there and then on the calling thread: a count under the caller's
//     index, -1 for all indices in order. What the only iteration of a call calls may be parallel again.
//   - fn may throw an i32: it counts as returned. Other exceptions become codes; none crosses threads.
//   - Calls from several threads at once are independent and share the threads.
// A body that a module brought for this slot is replaced.
//
// Birth checks the slots that acceleration modules rewrote (<ZR/module.h>, preference "module.check"): rows, samplers,
// copies and functions of modes are run on a small fixed set of pixels, beside the routine that stood there before, and
// must give the same bytes. What it cannot tell:
//   - whole transfers, transforms, blurs, mask rows and linear light have no trial: they are taken as they are;
//   - pixels and sizes that are not in the set, calls from several threads, and anything but results;
//   - a routine, or the entry of a module, that crashes, writes outside its pixels or never returns takes the process
//     along, during the check as later. Exceptions and codes it survives.
class Hostkit {
 public:
  // Throws std::runtime_error when birth fails, or when there is one already; nothing is left changed then.
  explicit Hostkit(HostkitOptions options = {});
  ~Hostkit();
  Hostkit(const Hostkit&) = delete;
  Hostkit& operator=(const Hostkit&) = delete;

  int threads() const;
  // ZR_Death's result; the destructor then does nothing more.
  i32 End();

 private:
  struct State;
  std::unique_ptr<State> state_;
};

}  // namespace zr

// ZR_TransferRect and ZR_TransformWorld on all threads of the Hostkit that lives: destination rows are cut into
// bands, each drawn with a scratch record of its own (kept between calls, freed with the host). Arguments, results
// and bytes are those of the undivided call, whatever the number of threads; but
//   - only the calling thread polls: before the first row, then now and then with the rows done so far, which never
//     fall. After a refusal, or an error, no further band is begun: rows are whole, done or not, in any order;
//   - an error is that of the topmost band that met one; several bands may report theirs;
//   - without memory for scratch nothing is drawn (ZR_Err_OutOfMemory).
// Calls from several threads at once are independent, where no replacement takes the shared scratch. Undivided run:
// small rectangles, a call from inside an iterate callback, worlds or a mask that share memory with the destination,
// transfer modes beyond the known ones, a replaced ZR_Slot_transfer_rect or ZR_Slot_transform_world (replaced rows
// of a transform likewise). Bands of a composite go through ZR_TransferRectPlus and what stands in its slots.
extern "C" {
i32 ZRHost_TransferRect(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                        ZR_LayerDef* src, const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                        const ZR_MaskWorld* mask, i32 dest_x, i32 dest_y, ZR_LayerDef* dst);
i32 ZRHost_TransformWorld(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                          const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                          const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                          const GX_LRect* dst_rect, ZR_LayerDef* dst);
}

// The copies of <ZR/copy_bits.h> and the blends of <ZR/zr.h> likewise: arguments, results and bytes of the undivided
// call. The copies of high quality ask the abort function only, before the first row and then now and then; draft
// copies and blends ask nobody. Undivided run: small rectangles and inverted ones, a call from inside an iterate
// callback, copies within one memory (a blend may be onto one of its worlds), a replaced slot of the copy.
extern "C" {
i32 ZRHost_CopyBits_Draft(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect,
                          const GX_LRect* dst_rect);
i32 ZRHost_CopyBits_HQ_Straight(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                                const GX_LRect* src_rect, const GX_LRect* dst_rect);
i32 ZRHost_CopyBits_HQ_Premul(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                              const GX_LRect* src_rect, const GX_LRect* dst_rect);
i32 ZRHost_Blend(const ZR_ProgressInfo* progress, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio, ZR_LayerDef* dst);
i32 ZRHost_Blend_Premul(const ZR_ProgressInfo* progress, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio,
                        ZR_LayerDef* dst);
}

// The convolution of <ZR/filter.h> likewise. The progress function is asked on the calling thread, before the first row
// and before each band that this thread takes, with the rows that are done; its answer ends the call as it ends the
// undivided one. Undivided run: few pixels, worlds that share memory, a call from inside an iterate callback.
extern "C" {
i32 ZRHost_Convolve(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const GX_LRect* rect, u32 flags, i32 size,
                    const i32* a_kernel, const i32* r_kernel, const i32* g_kernel, const i32* b_kernel,
                    ZR_LayerDef* dst);
}
