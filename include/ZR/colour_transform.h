// Colour transforms on worlds, and the transforms that hosts need.
//
// Failure  an i32 is thrown: ZR_Err_Internal after a failed verification, a status of the colour engine,
//          ZR_Err_OutOfMemory, or what a progress or abort function returned. On an abort the rows that were
//          done stay; on any other failure nothing has been written.
// Threads  a call touches its worlds only; transforms may be shared.
#pragma once

#include <ZR/colour_settings.h>
#include <ZR/world.h>

// Takes the colours of src to dst, from (0, 0) on, at any pair of depths; alpha of dst stays as it is, or is
// copied from src with copy_alpha (equal depths only). dst may be src. A dst that is smaller is refused.
// Worlds without gaps between their rows go through in one piece (rows out through ZR_IterateGeneric) and
// nothing is polled; otherwise, and with copy_alpha, row by row: after every 64th row `progress` is asked,
// or else `abort`, which here gets the row as a second argument.
ZR_API void ZR_PRISMAApplyTransform(PRISMATransform* transform, const ZR_World* src, ZR_World* dst, bool copy_alpha,
                                    const ZR_ProgressInfo* progress);
// The same from ink: cyan, magenta, yellow and black stand in the source's alpha, red, green and blue, 0 is
// none and white full ink. Float sources are refused.
ZR_API void ZR_PRISMAApplyTransformSrcCMYK(PRISMATransform* transform, const ZR_World* src, ZR_World* dst,
                                           bool copy_alpha, const ZR_ProgressInfo* progress);
// Between two of the engine's own profiles, relative to white.
ZR_API void ZR_ConvertProfileToProfile(PRISMA_ProfileCode from, PRISMA_ProfileCode to, const ZR_World* src,
                                       ZR_World* dst, bool copy_alpha, const ZR_ProgressInfo* progress);

// From profile a to the linear form of b, or from the linear form of a to b. Empty profiles are sRGB.
ZR_API TON_PRISMA_Transform ZR_GetLinearizeTransform(boost::shared_ptr<TON_PRISMA_Profile> a,
                                                     boost::shared_ptr<TON_PRISMA_Profile> b, bool to_linear);
// From a working space to a monitor: directly, or as `output` would show it, or as `output` would show what
// `simulation` makes of it. skip_simulation_chain: with a simulation, its result is taken for output's own;
// without one, the picture is. `fast` gives speed for accuracy. The preference "Display Transform
// Section", "Clip over range in Display Transform when not Theater Preview" clamps floats.
ZR_API TON_PRISMA_Transform ZR_NewDisplayTransform(const TON_PRISMA_Profile& working, const TON_PRISMA_Profile& display,
                                                   const TON_PRISMA_Profile* simulation,
                                                   const TON_PRISMA_Profile* output, bool skip_simulation_chain,
                                                   bool fast);

// Profile of the monitor under a window, or of the main one for null; see TON_PRISMA_GetDisplayProfile.
ZR_API TON_PRISMA_Profile ZR_GetPlatformDisplayProfile(const void* window);
// Exponents of a profile's tone curves; null is sRGB. Any of the results may be null.
ZR_API void ZR_GetCalRGBGammas(const TON_PRISMA_Profile* profile, f32* r, f32* g, f32* b);
// "Working Space - " and the name of the adjusted profile, or "None" for null or empty settings.
ZR_API std::u16string ZR_GetWorkingSpaceProfileName(const ZR_ColorSettings* settings);
