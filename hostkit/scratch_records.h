// Scratch records for composites and transforms that run at the same time: lent to calls, kept between them.
#pragma once

#include <ZR/zr.h>

#include <list>
#include <mutex>
#include <vector>

namespace zr {

// The ten pointers that ZR_TransferRectPlus describes, for rows of up to some width.
class ScratchRecord {
 public:
  ScratchRecord() = default;
  ~ScratchRecord();
  ScratchRecord(const ScratchRecord&) = delete;
  ScratchRecord& operator=(const ScratchRecord&) = delete;

  // Makes rows of `width` pixels fit; false when there is no memory, and then what it had stays.
  bool reach(i32 width);
  void** pointers() { return pointers_; }

 private:
  void* pointers_[10] = {};
  i32 width_ = 0;
};

// As many records as ran at once so far. Any thread.
class ScratchRecords {
 private:
  std::mutex lock_;
  std::list<ScratchRecord> resting_;
  friend class ScratchLease;
};

// Records for the length of a call, one for each of its workers.
class ScratchLease {
 public:
  // Throws ZR_Err_OutOfMemory or std::bad_alloc, and then nothing is lent.
  ScratchLease(ScratchRecords& records, i32 workers, i32 width);
  ~ScratchLease();
  ScratchLease(const ScratchLease&) = delete;
  ScratchLease& operator=(const ScratchLease&) = delete;

  void** operator[](i32 worker) { return by_worker_[static_cast<size_t>(worker)]; }

 private:
  void give_back() noexcept;

  ScratchRecords& records_;
  std::list<ScratchRecord> taken_;
  std::vector<void**> by_worker_;
};

}  // namespace zr
