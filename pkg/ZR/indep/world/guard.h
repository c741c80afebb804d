// The border between exports and the code behind them: codes thrown inside become results here, and
// one place turns a plain record into a typed world.
#pragma once

#include <HB/hb.h>
#include <ZR/errors.h>
#include <ZR/world.h>

#include <exception>
#include <string>
#include <utility>

namespace zr {

[[noreturn]] inline void fail(i32 code) { throw code; }  // the one type this library throws

// Runs the body of an export; nothing thrown gets past it.
template <class Body>
i32 guarded(Body&& body) noexcept {
  try {
    return std::forward<Body>(body)();
  } catch (const i32 code) {
    return code;  // reported where it was thrown
  } catch (const std::exception& error) {
    return HB_TranslateAndReportException(error);
  }
}

// Reports a failed internal check; the result is what the caller returns or throws.
inline i32 failed_verification(ZR_CallSite site, const char* text, i32 line = __builtin_LINE()) {
  HB_ReportFailedVerification(ZR_ModuleCode | site, line, 0, text);
  return ZR_Err_Internal;
}

// Shows one of the library's own texts under a call site.
inline void report_string(ZR_StringIndex index, u32 site) {
  HBp_ReportErrString(ZR_ModuleCode | site, ZR_ReportSeverity, HB_ZLookupLStrCache(ZR_G_zref, index, 0, 0));
}

// Calls body.template operator()<Pixel>() for the depth; the only switch on 8, 16, 32 for exports.
template <class Body>
i32 on_depth(i32 depth, const char* unknown_text, Body&& body, ZR_CallSite unknown_site = ZR_Site_UnknownDepth) {
  switch (depth) {
    case 8: return body.template operator()<ZR_Pixel8>();
    case 16: return body.template operator()<ZR_Pixel16>();
    case 32: return body.template operator()<ZR_PixelFloat>();
    default: return failed_verification(unknown_site, unknown_text);
  }
}

// The text of most depth checks; the macro's name in it was never expanded, and hosts match on it.
inline constexpr char unknown_depth_text[] = "Unknown world bitdepth in##CONDITIONNAME";

// One poll: progress if it is there, else abort; 0 to go on.
inline i32 poll(const ZR_ProgressInfo* progress, i32 done, i32 total) {
  if (progress == nullptr) return 0;
  if (progress->progress != nullptr) return progress->progress(progress->refcon, done, total);
  if (progress->abort != nullptr) return progress->abort(progress->refcon);
  return 0;
}

// A stack world around a record that the callee does not change.
inline ZR_LayerDef* mutable_layer(const ZR_LayerDef* layer) { return const_cast<ZR_LayerDef*>(layer); }

}  // namespace zr
