// The default profile that all callers share: made on first use, freed when the engine is let go.
#include "TON/prisma_state.h"

#include <HB/allocator.h>
#include <TON/ton.h>

#include <boost/make_shared.hpp>

#include <mutex>

namespace zr::prisma {
namespace {

struct ProfileLabel {
  static constexpr const char* text = "colour profile";
};

struct DefaultProfile {
  std::mutex lock;
  boost::shared_ptr<TON_PRISMA_Profile> profile;
};
// Never destroyed: holders outlive the end of main.
DefaultProfile& default_profile() {
  static auto* const instance = new DefaultProfile;
  return *instance;
}

}  // namespace

void free_default_profile() {
  boost::shared_ptr<TON_PRISMA_Profile> last;
  const std::lock_guard hold(default_profile().lock);
  last.swap(default_profile().profile);
}

}  // namespace zr::prisma

boost::shared_ptr<TON_PRISMA_Profile> TON_PRISMA_GetDefaultProfile() {
  using namespace zr::prisma;
  DefaultProfile& shared = default_profile();
  const std::lock_guard hold(shared.lock);
  if (!shared.profile)
    shared.profile = with_memory_code([] {
      return boost::allocate_shared<TON_PRISMA_Profile>(HB_Allocator<TON_PRISMA_Profile, ProfileLabel>(),
                                                        PRISMA_Profile_sRGB);
    });
  return shared.profile;
}
