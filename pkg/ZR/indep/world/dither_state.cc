// The random words behind dithered conversions.
#include "world/dither_state.h"

#include <DIE/die.h>

#include <algorithm>
#include <atomic>
#include <cstring>

namespace zr {
namespace {

struct DitherTable {
  const u32* start;
  const u32* end;
};

constinit DitherTable ZR_DitherTable = {};
// The word last used. Relaxed: a torn address is the one race that would not be harmless.
constinit std::atomic<const u32*> ZR_DitherCursor = nullptr;

const u32* cursor_behind(i64 words) {
  const i64 at = ZR_DitherCursor.load(std::memory_order_relaxed) - ZR_DitherTable.start;
  return ZR_DitherTable.start + (at + words) % (ZR_DitherTable.end - ZR_DitherTable.start);
}

}  // namespace

void prepare_dither() {
  const u32* start = nullptr;
  i32 count = 0;
  DIE_GetPrimeSizedTable(&start, &count);
  ZR_DitherTable = {start, start + count};
  ZR_ResetDitherRandomIndex();
}

DitherRow::DitherRow() : cursor_(ZR_DitherCursor.load(std::memory_order_relaxed)), puts_back_(true) {}
DitherRow::DitherRow(i64 words_before) : cursor_(cursor_behind(words_before)), puts_back_(false) {}
DitherRow::~DitherRow() {
  if (puts_back_) ZR_DitherCursor.store(cursor_, std::memory_order_relaxed);
}
void skip_dither_words(i64 count) { ZR_DitherCursor.store(cursor_behind(count), std::memory_order_relaxed); }

void DitherRow::draw(std::size_t count, u32* words) {
  while (count > 0) {
    const u32* next = cursor_ + 1;
    if (next >= ZR_DitherTable.end) next = ZR_DitherTable.start;
    const std::size_t run = std::min(count, static_cast<std::size_t>(ZR_DitherTable.end - next));
    std::memcpy(words, next, run * sizeof(u32));
    cursor_ = next + (run - 1);
    words += run;
    count -= run;
  }
}

const u32* DitherRow::next(std::size_t count, u32* words) {
  if (static_cast<std::size_t>(ZR_DitherTable.end - cursor_) > count) {
    const u32* const first = cursor_ + 1;
    cursor_ += count;
    return first;
  }
  draw(count, words);
  return words;
}

}  // namespace zr

extern "C" void ZR_ResetDitherRandomIndex() {
  zr::ZR_DitherCursor.store(zr::ZR_DitherTable.start, std::memory_order_relaxed);
}
