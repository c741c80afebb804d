// The taps of the bell that the scan blurs used last.
#include "mask/scan_weights_state.h"

#include <HB/hb.h>
#include <ZR/depth.h>
#include <ZR/errors.h>
#include <ZR/filter.h>

#include <mutex>

namespace zr {
namespace {

// Guards the pointer and the counts of users.
constinit std::mutex G_bell_lock;
constinit BellTaps* G_bell_taps = nullptr;

void let_go(BellTaps* taps) {
  if (taps != nullptr && --taps->users == 0) HB_FreePtr(taps);
}

BellTaps* make_taps(u32 radius) {
  const i32 reach = static_cast<i32>((radius + 0xffff) >> 16);
  const std::size_t bytes = sizeof(BellTaps) + (static_cast<std::size_t>(reach) + 1) * sizeof(i32);
  void* const block = HB_AllocatePtr(bytes, HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_GaussianWeights, 0, 0),
                                     ZR_ModuleCode | ZR_Site_MaskBlur);
  if (block == nullptr) return nullptr;
  BellTaps* const taps = ::new (block) BellTaps{1, radius, reach, 0};
  taps->divisor = write_bell_taps(radius, reach, taps->weight());
  return taps;
}

}  // namespace

i32 write_bell_taps(u32 radius, i32 reach, i32* weight) {
  i32 sum = weight[0] = 255;
  for (i32 i = 1; i <= reach; ++i) {
    weight[i] = truncate_i32(ZRp_GaussianValue(i / (1.0 + radius / 65536.0)) * 255);
    sum += 2 * weight[i];
  }
  return sum;
}

BellInUse::BellInUse(u32 radius) {
  const std::lock_guard lock(G_bell_lock);
  if (G_bell_taps == nullptr || G_bell_taps->radius != radius) {
    let_go(G_bell_taps);
    G_bell_taps = make_taps(radius);
  }
  taps_ = G_bell_taps;
  if (taps_ != nullptr) ++taps_->users;
}

BellInUse::~BellInUse() {
  const std::lock_guard lock(G_bell_lock);
  let_go(taps_);
}

void free_bell_taps() {
  const std::lock_guard lock(G_bell_lock);
  let_go(G_bell_taps);
  G_bell_taps = nullptr;
}

}  // namespace zr
