// The settings value: profile, flags, caches, order and hash.
#include <ZR/colour_settings.h>
#include <ZR/colour_transform.h>
#include <ZR/linear_tables.h>
#include <nucleo/nucleo.h>

#include <functional>

#include "world/guard.h"

ZR_ColorSettings::ZR_ColorSettings(TON_PRISMA_ProfilePool* pool) : pool_(pool) {}

ZR_ColorSettings::ZR_ColorSettings(const ZR_ColorSettings& from) {
  if (from.pool_ == nullptr) return;
  pool_ = from.pool_;
  profile_id_ = from.profile_id_;
  linearize_ = from.linearize_;
  linear_blending_ = from.linear_blending_;
  valid_ = from.valid_;
}

ZR_ColorSettings& ZR_ColorSettings::operator=(const ZR_ColorSettings& from) {
  if (this != &from) ZRp_TransferColorSettings(from);
  return *this;
}

void ZR_ColorSettings::ZRp_TransferColorSettings(const ZR_ColorSettings& from) {
  if (from.pool_ == nullptr) return;
  if (pool_ != nullptr) {
    SetProfile(from.GetProfile());
  } else {
    InvalidateCachedValues(from.profile_id_);
    pool_ = from.pool_;
  }
  linearize_ = from.linearize_;
  linear_blending_ = from.linear_blending_;
  valid_ = from.valid_;
}

void ZR_ColorSettings::InvalidateCachedValues(_t_PRISMA_ID id) {
  profile_id_ = id;
  blending_tables_.reset();
  linear_profile_.reset();
  gamma_cached_ = 0;
  linearize_ = false;
  linear_blending_ = false;
  valid_ = !(id == PRISMA_EmptyProfile_ID);
}

void ZR_ColorSettings::SetProfile(const boost::shared_ptr<TON_PRISMA_Profile>& profile) {
  if (pool_ == nullptr)
    zr::fail(
        zr::failed_verification(ZR_Site_ColourSettings, "You have to have a valid profile pool to set a profile."));
  InvalidateCachedValues(pool_->AddProfile(profile));
}

boost::shared_ptr<TON_PRISMA_Profile> ZR_ColorSettings::GetProfile() const {
  return pool_ != nullptr ? pool_->GetProfile(profile_id_) : boost::shared_ptr<TON_PRISMA_Profile>();
}

boost::shared_ptr<TON_PRISMA_Profile> ZR_ColorSettings::GetAdjustedProfile() {
  const boost::shared_ptr<TON_PRISMA_Profile> profile = GetProfile();
  if (!profile) return TON_PRISMA_GetDefaultProfile();
  if (!linearize_) return profile;
  if (!linear_profile_) linear_profile_ = TON_PRISMA_GetLinearRGBProfile(profile);
  return linear_profile_;
}

boost::shared_ptr<ZR_LinearBlendingTables> ZR_ColorSettings::GetLinearBlendingTables(bool force) {
  if (!force && (!linear_blending_ || linearize_)) return {};
  if (!blending_tables_) blending_tables_ = ZR_MakeLinearizationTables(GetProfile());
  return blending_tables_;
}

f32 ZR_ColorSettings::GetCalGrayGamma() {
  if (gamma_cached_ == 0) {
    ZR_GetCalRGBGammas(GetAdjustedProfile().get(), &gammas_[0], &gammas_[1], &gammas_[2]);
    gamma_cached_ = 1;
  }
  return gammas_[1];
}

bool ZR_ColorSettings::operator==(const ZR_ColorSettings& other) const {
  return linearize_ == other.linearize_ && linear_blending_ == other.linear_blending_ && pool_ == other.pool_ &&
         GetProfile() == other.GetProfile();
}

i32 ZR_ColorSettings::GetSortOrder(const ZR_ColorSettings& other) {
  const auto order = [](auto a, auto b) { return std::less<>()(a, b) ? -1 : std::less<>()(b, a) ? 1 : 0; };
  if (const i32 by_pool = order(pool_, other.pool_)) return by_pool;
  if (const i32 by_profile = order(GetProfile().get(), other.GetProfile().get())) return by_profile;
  if (const i32 by_blending = order(linear_blending_, other.linear_blending_)) return by_blending;
  return order(linearize_, other.linearize_);
}

nucleo::utility::Guid ZR_ColorSettings::GetRenderGuid() const {
  nucleo::utility::MixHash hash;
  hash.Mix("ZR_ColorSettings", 16);
  hash.Mix(profile_id_.bytes, sizeof profile_id_.bytes);
  hash.Mix(linear_blending_);
  hash.Mix(linearize_);
  // The engine's options decide about pixels too; the text marks their block.
  hash.Mix("PRISMA Options", 12);
  const PRISMA_Options& options = TON_GetDefaultPRISMAOptions();
  hash.Mix(options.count);
  for (u32 i = 0; i < options.count; ++i) {
    hash.Mix(options.pairs[i].tag);
    hash.Mix(options.pairs[i].value);
  }
  return hash.Digest();
}
