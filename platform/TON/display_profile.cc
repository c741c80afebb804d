// The profile of the monitor.
#include <JRN/jrn.h>
#include <OPT/opt.h>

#include <string>

#include "TON/lcms_engine.h"
#include "TON/x11_display.h"

namespace zr::prisma {

PRISMAProfile* display_profile(const void* window) {
  const std::string named = OPT_GetString("display.profile", "");
  if (!named.empty()) {
    try {
      return profile_from_file(named.c_str());
    } catch (const i32) {
      // A broken preference must not leave the user without a picture.
      JRN_Log(30, "TON", "display.profile", (named + " cannot be used as a profile").c_str());
    }
  }
  const Counted<u8> stated = profile_of_x11_display(window);
  if (!stated.empty()) {
    try {
      return profile_from_memory(stated.data(), stated.size());
    } catch (const i32) {
      JRN_Log(30, "TON", "display", "the desktop's profile of this monitor cannot be used");
    }
  }
  forget_memory_failure();
  return standard_profile(PRISMA_Profile_sRGB);
}

}  // namespace zr::prisma
