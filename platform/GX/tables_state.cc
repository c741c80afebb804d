// The shared tables and how many hold them.
#include <GX/gx.h>
#include <HB/hb.h>
#include <ZR/errors.h>

#include <cmath>
#include <mutex>

namespace {

// A table that lives while at least one caller has it. Locked: plug-ins ask for tables at any time.
struct SharedTable {
  std::mutex lock;
  void* block = nullptr;
  i32 holders = 0;

  // The block, built if this is the first holder; null when memory is short.
  template <class Build>
  const void* hold(std::size_t bytes, const char* label, Build&& build) {
    const std::lock_guard guard(lock);
    if (holders == 0) {
      block = HB_AllocatePtr(bytes, label, ZR_ModuleCode | ZR_Site_Plain);
      if (block == nullptr) return nullptr;
      build(block);
    }
    ++holders;
    return block;
  }
  void let_go() {
    const std::lock_guard guard(lock);
    if (holders == 0 || --holders != 0) return;
    HB_FreePtr(block);
    block = nullptr;
  }
};

constinit SharedTable byte_tables, trig_table;

constexpr std::size_t byte_table_size = 65536;

// The multiply table, then the divide table.
void build_byte_tables(void* block) {
  u8* const multiply = static_cast<u8*>(block);
  u8* const divide = multiply + byte_table_size;
  for (u32 row = 0; row < 256; ++row)
    for (u32 column = 0; column < 256; ++column) {
      const u32 product = row * column;
      const u32 at = row * 256 + column;
      multiply[at] = static_cast<u8>((product + ((product + 128) >> 8) + 128) >> 8);
      divide[at] = static_cast<u8>(column >= row ? 255 : (column * 255 + row / 2) / row);
    }
}

// One quarter is computed and mirrored, so that the symmetries of the sine hold exactly.
void build_trig_table(void* block) {
  constexpr i32 quarter = GX_FTrigSteps / 4;
  constexpr f64 step = 3.14159265358979323846 / (2 * quarter);
  f64* const sine = static_cast<f64*>(block);
  for (i32 i = 0; i <= quarter; ++i) {
    const f64 value = i == quarter ? 1.0 : std::sin(i * step);
    sine[i] = sine[2 * quarter - i] = value;
    sine[2 * quarter + i] = sine[4 * quarter - i] = -value;
  }
  sine[0] = sine[2 * quarter] = sine[4 * quarter] = 0.0;
}

}  // namespace

i32 GX_PrepareFCMD(i32, i32, i32, const u8** multiply, const u8** divide) {
  const void* const block =
      byte_tables.hold(2 * byte_table_size, "colour multiply and divide tables", build_byte_tables);
  if (block == nullptr) return ZR_Err_OutOfMemory;
  if (multiply != nullptr) *multiply = static_cast<const u8*>(block);
  if (divide != nullptr) *divide = static_cast<const u8*>(block) + byte_table_size;
  return ZR_Err_None;
}

i32 GX_UnprepareFCMD() {
  byte_tables.let_go();
  return ZR_Err_None;
}

i32 GX_PrepareFTrig(i32, i32, i32, const void** table) {
  const void* const block = trig_table.hold((GX_FTrigSteps + 1) * sizeof(f64), "trigonometry table", build_trig_table);
  if (block == nullptr) return ZR_Err_OutOfMemory;
  if (table != nullptr) *table = block;
  return ZR_Err_None;
}

i32 GX_UnprepareFTrig() {
  trig_table.let_go();
  return ZR_Err_None;
}
