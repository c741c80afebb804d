// Profiles by id.
#include <HB/allocator.h>
#include <HB/hb.h>
#include <ZR/prisma.h>

#include <algorithm>
#include <mutex>
#include <new>
#include <vector>

#include "TON/prisma_state.h"

namespace {
struct PoolLabel {
  static constexpr const char* text = "colour profile pool";
};
struct Entry {
  _t_PRISMA_ID id;
  boost::shared_ptr<TON_PRISMA_Profile> profile;
};
}  // namespace

struct TON_PRISMA_ProfilePool::Entries {
  std::mutex lock;
  std::vector<Entry, HB_Allocator<Entry, PoolLabel>> list;

  const Entry* find(const _t_PRISMA_ID& id) const {
    const auto found = std::find_if(list.begin(), list.end(), [&](const Entry& entry) { return entry.id == id; });
    return found != list.end() ? &*found : nullptr;
  }
};

TON_PRISMA_ProfilePool::TON_PRISMA_ProfilePool() {
  void* const place = HB_AllocatePtr(sizeof(Entries), PoolLabel::text, ZR_ModuleCode | ZR_Site_ColourEngine);
  if (place == nullptr) throw i32{ZR_Err_OutOfMemory};
  entries_ = new (place) Entries;
}

TON_PRISMA_ProfilePool::~TON_PRISMA_ProfilePool() {
  entries_->~Entries();
  HB_FreePtr(entries_);
}

_t_PRISMA_ID TON_PRISMA_ProfilePool::AddProfile(const boost::shared_ptr<TON_PRISMA_Profile>& profile) {
  if (!profile) return PRISMA_EmptyProfile_ID;
  const _t_PRISMA_ID id = profile->GetID();
  const std::lock_guard hold(entries_->lock);
  if (entries_->find(id) == nullptr)
    zr::prisma::with_memory_code([&] {
      entries_->list.push_back({id, profile});
      return 0;
    });
  return id;
}

boost::shared_ptr<TON_PRISMA_Profile> TON_PRISMA_ProfilePool::GetProfile(const _t_PRISMA_ID& id) const {
  const std::lock_guard hold(entries_->lock);
  const Entry* const entry = entries_->find(id);
  return entry != nullptr ? entry->profile : boost::shared_ptr<TON_PRISMA_Profile>();
}
