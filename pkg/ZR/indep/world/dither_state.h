// The random words behind dithered conversions: one table and one cursor for the whole process.
//
// The table is set by birth. The cursor is shared and unlocked: dithering on several threads at once races
// on it, which changes the pattern of the noise and nothing else.
#pragma once

#include <ZR/zr.h>

#include <cstddef>

namespace zr {

// Takes the table from its library and puts the cursor to its start.
void prepare_dither();

// The words of rows: takes the cursor when it is made and puts it back when it goes.
class DitherRow {
 public:
  DitherRow();
  // From the word behind so many that are left to others, with the cursor as it is: skip_dither_words() moves that when
  // all are drawn.
  explicit DitherRow(i64 words_before);
  ~DitherRow();
  DitherRow(const DitherRow&) = delete;
  DitherRow& operator=(const DitherRow&) = delete;

  // The next `count` words. The cursor steps before it reads, so that the first word after a reset is
  // entry 1, and entry 0 is reached by wrapping only.
  void draw(std::size_t count, u32* words);
  // The same words where they lie, or else in `words`.
  const u32* next(std::size_t count, u32* words);

 private:
  const u32* cursor_;
  bool puts_back_;
};

// Moves the cursor on as drawing so many words does.
void skip_dither_words(i64 count);

}  // namespace zr
