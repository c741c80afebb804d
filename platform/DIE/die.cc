// The random words behind dither.
#include <DIE/die.h>

#include <array>

namespace {

// Prime, so that rows whose draws divide a power of two never fall into step with the table.
constexpr i32 word_count = 65537;

// SplitMix64: each word is a bijective mix of a counter, of which the upper half is kept.
std::array<u32, word_count> make_table() {
  std::array<u32, word_count> table;
  u64 counter = 0x5a522064697468ull;
  for (u32& word : table) {
    counter += 0x9e3779b97f4a7c15ull;
    u64 mixed = (counter ^ (counter >> 30)) * 0xbf58476d1ce4e5b9ull;
    mixed = (mixed ^ (mixed >> 27)) * 0x94d049bb133111ebull;
    word = static_cast<u32>((mixed ^ (mixed >> 31)) >> 32);
  }
  return table;
}

}  // namespace

void DIE_GetPrimeSizedTable(const u32** start, i32* count) {
  static const std::array<u32, word_count> table = make_table();
  if (start != nullptr) *start = table.data();
  if (count != nullptr) *count = word_count;
}
