// In which colour space a render happens.
//
// A settings object names a profile of a pool (which is not owned and must outlive it) and says whether
// data are linearised and whether blending runs in linear light. It caches what is costly to make.
//
// Failure  an i32 is thrown: ZR_Err_Internal where noted, else a status of the colour engine.
// Threads  an object belongs to one thread at a time, since reading it may fill a cache. Copies of one
//          settings object may be used by many threads.
#pragma once

#include <ZR/guid.h>
#include <ZR/prisma.h>

#include <boost/shared_ptr.hpp>

class ZR_API ZR_ColorSettings {
 public:
  explicit ZR_ColorSettings(TON_PRISMA_ProfilePool* pool = nullptr);
  // Caches are never copied. A source without a pool gives an empty object.
  ZR_ColorSettings(const ZR_ColorSettings& from);
  // Nothing happens when the source has no pool. A destination with a pool keeps it and takes the profile
  // into it; one without takes the source's pool.
  ZR_ColorSettings& operator=(const ZR_ColorSettings& from);
  ~ZR_ColorSettings() = default;

  void SetProfilePool(TON_PRISMA_ProfilePool* pool) { pool_ = pool; }
  TON_PRISMA_ProfilePool* GetProfilePool() const { return pool_; }

  // Data are linearised. Drops no cache.
  bool GetLinearize() const { return linearize_; }
  void SetLinearize(bool linearize) { linearize_ = linearize; }
  bool GetLinearBlending() const { return linear_blending_; }
  void SetLinearBlending(bool linear_blending) { linear_blending_ = linear_blending; }

  const _t_PRISMA_ID& GetProfileID() const { return profile_id_; }
  // Drops the caches and clears both flags: set them afterwards.
  void SetProfileID(const _t_PRISMA_ID& id) { InvalidateCachedValues(id); }
  // Adds the profile to the pool, then as SetProfileID. Without a pool: a failed verification and 3.
  void SetProfile(const boost::shared_ptr<TON_PRISMA_Profile>& profile);
  // The pool's profile; empty without a pool or when the pool does not know the id.
  boost::shared_ptr<TON_PRISMA_Profile> GetProfile() const;
  // The profile that pixels are in: the linear form of the profile when data are linearised, and the
  // engine's default where there is no profile.
  boost::shared_ptr<TON_PRISMA_Profile> GetAdjustedProfile();
  // Empty when blending needs none: linear blending is off, or data are linear already. `force` gives
  // them always.
  boost::shared_ptr<ZR_LinearBlendingTables> GetLinearBlendingTables(bool force);
  // The green exponent of the adjusted profile.
  f32 GetCalGrayGamma();

  // The profile differs from the empty one.
  bool IsValid() const { return valid_; }
  // Flags, pools and profile objects agree.
  bool operator==(const ZR_ColorSettings& other) const;
  bool operator!=(const ZR_ColorSettings& other) const { return !(*this == other); }
  // -1, 0 or 1; an order for keys within one process.
  i32 GetSortOrder(const ZR_ColorSettings& other);
  // Two settings with one Guid render the same; the same in every process, and whatever the pool.
  nucleo::utility::Guid GetRenderGuid() const;

 private:
  void InvalidateCachedValues(_t_PRISMA_ID id);
  void ZRp_TransferColorSettings(const ZR_ColorSettings& from);

  u8 gamma_cached_ = 0;
  f32 gammas_[3] = {};
  _t_PRISMA_ID profile_id_ = PRISMA_EmptyProfile_ID;
  boost::shared_ptr<TON_PRISMA_Profile> linear_profile_;
  bool linearize_ = false;
  bool linear_blending_ = false;
  boost::shared_ptr<ZR_LinearBlendingTables> blending_tables_;
  TON_PRISMA_ProfilePool* pool_ = nullptr;
  bool valid_ = false;
};

// Settings for callers that have none: the engine's default profile, linearised. One object for the
// process, made on the first call and freed by ZR_Death.
ZR_API ZR_ColorSettings* ZR_GetEmergencyColorSettings();
