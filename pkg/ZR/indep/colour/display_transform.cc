// The monitor path: from a working space to the screen, through what is to be simulated.
#include <OPT/opt.h>
#include <ZR/colour_transform.h>

#include "world/guard.h"

TON_PRISMA_Transform ZR_NewDisplayTransform(const TON_PRISMA_Profile& working, const TON_PRISMA_Profile& display,
                                            const TON_PRISMA_Profile* simulation, const TON_PRISMA_Profile* output,
                                            bool skip_simulation_chain, bool fast) {
  bool clip = false;
  if (const i32 error = OPT_GetTextPrefData("Display Transform Section",
                                            "Clip over range in Display Transform when not Theater Preview", &clip))
    zr::fail(error);
  const PRISMA_Options& exact = TON_GetDefaultPRISMAOptions();
  const PRISMA_Options& quick = TON_GetFastPRISMAOptions();
  const PRISMA_Options& chosen = clip || fast ? quick : exact;
  // Over-range values keep their meaning only where nothing is fitted to the destination's white.
  const auto intent = [](bool over) {
    return over ? PRISMA_Intent_AbsoluteColorimetric : PRISMA_Intent_RelativeColorimetric;
  };
  bool over = TON_PRISMA_Profile_IsOverRange(working);

  const auto through_output = [&] {
    const TON_PRISMA_Transform shown(*output, display, PRISMA_Intent_RelativeColorimetric, quick);
    if (simulation != nullptr) {
      over = over || TON_PRISMA_Profile_IsOverRange(*simulation);
      const TON_PRISMA_Transform simulated(working, *simulation, intent(over), exact);
      if (skip_simulation_chain) return simulated.Concatenate(shown);
      const TON_PRISMA_Transform put_out(*simulation, *output, PRISMA_Intent_RelativeColorimetric, quick);
      return simulated.Concatenate(put_out).Concatenate(shown);
    }
    if (skip_simulation_chain) return shown.Duplicate();
    return TON_PRISMA_Transform(working, *output, intent(over), over ? exact : quick).Concatenate(shown);
  };
  const TON_PRISMA_Transform result = output == nullptr
                                          ? TON_PRISMA_Transform(working, display, intent(over), over ? exact : chosen)
                                          : through_output();
  return fast ? result.Optimise(TON_GetOptimisePRISMAOptions()) : result;
}

TON_PRISMA_Profile ZR_GetPlatformDisplayProfile(const void* window) { return TON_PRISMA_GetDisplayProfile(window); }
