// The transfer modes by number, with what each computes, and by name.
//
// s and d are a channel of source and destination, D the destination's alpha, A the source's effective alpha
// (its own times opacity and mask), R = 1 - (1 - A)(1 - D); 1 is white. Where a formula stands alone it is
// that of an opaque source over an opaque destination; the kind says how alpha enters:
//   ground    d is faded to black, white or grey by D, mixed, and taken back by R
//   weighted  ((1 - D) A s + (1 - A) D d + A D f(s, d)) / R
//   colour    the source goes behind the destination, then the new colour is mixed in by A
// Colours outside 0..1, in float: only the colour modes, LinearBurn (at 0) and the luma mattes (alpha)
// clamp. NaN stays NaN in what it takes part in. Integer channels above white give some colour, no fault.
#pragma once

#include <ZR/zr.h>

#include <string_view>

enum ZR_TransferMode : i32 {
  XferCopyFast = -3,              // rows only: XferCopy
  XferMatteMix = -2,              // rows only: source and destination mixed by the mask's alpha
  XferCopy = 0,                   // s, alpha A
  XferBehind = 1,                 // destination over source
  XferInFront = 2,                // source over destination, the ordinary composite
  XferDissolve = 3,               // rows only: the source, opaque, where a random number is below A
  XferAdd = 4,                    // s + d                                            black ground
  XferMultiply = 5,               // s d                                              white ground
  XferScreen = 6,                 // 1 - (1 - s)(1 - d)                               black ground
  XferOverlay = 7,                // hard light with s and d exchanged                grey ground
  XferSoftLight = 8,              // d - (1 - 2s)(d - d^2), or d + (2s - 1)(g(d) - d) grey ground
  XferHardLight = 9,              // 2 s d, or 1 - 2 (1 - s)(1 - d) from s = 1/2 on   grey ground
  XferDarken = 10,                // min(s, d)                                        white ground
  XferLighten = 11,               // max(s, d)                                        black ground
  XferDifference = 12,            // |s - d|                                          black ground
  XferHue = 13,                   // hue of the source, saturation and luma of the destination
  XferSaturation = 14,            // saturation of the source, hue and luma of the destination
  XferColor = 15,                 // hue and saturation of the source, luma of the destination
  XferLuminosity = 16,            // luma of the source, hue and saturation of the destination
  XferMultiplyAlpha = 17,         // alpha D A; colour stays
  XferMultiplyAlphaLuma = 18,     // alpha D A luma(s)
  XferMultiplyNotAlpha = 19,      // alpha D (1 - A)
  XferMultiplyNotAlphaLuma = 20,  // alpha D (1 - A luma(s))
  XferAddPremul = 21,             // (s + d D (1 - A)) / R: the source is premultiplied
  XferAlphaAdd = 22,              // (s A + d D) / (A + D), alpha A + D; full coverage at most
  XferColorDodge = 23,            // d / (1 - s)                                      black ground
  XferColorBurn = 24,             // 1 - (1 - d) / s                                  white ground
  XferExclusion = 25,             // s + d - 2 s d                                    black ground
  XferDifferenceW = 26,           // |s - d|                                          weighted, as all to 38
  XferColorDodgeW = 27,           // d / (1 - s); black stays black
  XferColorBurnW = 28,            // 1 - (1 - d) / s; white stays white
  XferLinearDodge = 29,           // s + d
  XferLinearBurn = 30,            // s + d - 1
  XferLinearLight = 31,           // 2 s + d - 1
  XferVividLight = 32,            // burn by 2 s, or dodge by 2 s - 1 from s = 1/2 on
  XferPinLight = 33,              // min(2 s, d), or max(2 s - 1, d) from s = 1/2 on
  XferHardMix = 34,               // 1 where s + d > 1, else 0
  XferLighterColor = 35,          // the colour of greater luma
  XferDarkerColor = 36,           // the colour of lesser luma
  XferSubtract = 37,              // d - s                                            weighted
  XferDivide = 38,                // d / s                                            weighted
  XferBlueThreshold = 39,         // blue of the source and alpha 1 where A >= 1/2
  XferKeyProtect = 40,            // the source, except onto red, green and two blues
};

// One row of the list of modes. The texts live as long as the process.
struct ZR_TransferModeInfo {
  i32 mode;
  const char* name;        // "XferInFront"
  const char* short_name;  // "in-front"
  const char* kind;        // "copy", "over", "rows only", "black ground", "white ground", "grey ground",
                           // "weighted", "colour", "alpha only" or "special"
};

// All modes in the order of their numbers, *count of them. Any thread; cannot fail.
ZR_API const ZR_TransferModeInfo* ZR_ListTransferModes(i32* count);
// "XferInFront" for 2; null for a number that is no mode.
ZR_API const char* ZR_TransferModeName(i32 mode);
// The mode of a name, long or short. Case, spaces, '-' and '_' do not count: "XferColorDodge",
// "color-dodge" and "Color Dodge" are one. False, and *mode as it was, when there is none.
ZR_API bool ZR_FindTransferMode(std::string_view name, i32* mode);
