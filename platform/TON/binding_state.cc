// Which engine is bound.
#include <TON/ton.h>

#include "TON/prisma_state.h"

namespace {

// Set by hosts before birth.
constinit std::atomic<TON_AddressProc> host_engine{nullptr};
// Set by birth and death, which run alone; read by everyone in between.
constinit std::atomic<const PRISMA_ProfileProcs*> profile_table{nullptr};
constinit std::atomic<const PRISMA_TransformProcs*> transform_table{nullptr};

}  // namespace

i32 TON_GetQILAddressProc(TON_AddressProc* out) {
  const TON_AddressProc chosen = host_engine.load();
  *out = chosen != nullptr ? chosen : TON_LcmsAddressProc;
  return 0;
}

void TON_SetQILAddressProc(TON_AddressProc proc) { host_engine.store(proc); }

bool TON_PRISMA_Bind(TON_AddressProc proc) {
  if (proc == nullptr) return false;
  const auto* const profiles = static_cast<const PRISMA_ProfileProcs*>(proc("PRISMA Profiles"));
  const auto* const transforms = static_cast<const PRISMA_TransformProcs*>(proc("PRISMA Transforms"));
  if (profiles == nullptr || profiles->version != PRISMA_TablesVersion || transforms == nullptr ||
      transforms->version != PRISMA_TablesVersion)
    return false;
  profile_table.store(profiles);
  transform_table.store(transforms);
  return true;
}

void TON_PRISMA_Unbind() {
  zr::prisma::free_default_profile();
  const PRISMA_TransformProcs* const transforms = transform_table.exchange(nullptr);
  profile_table.store(nullptr);
  if (transforms != nullptr) transforms->shut_down();
}

const PRISMA_ProfileProcs* TON_PRISMA_ProfileTable() { return profile_table.load(std::memory_order_relaxed); }
const PRISMA_TransformProcs* TON_PRISMA_TransformTable() { return transform_table.load(std::memory_order_relaxed); }
