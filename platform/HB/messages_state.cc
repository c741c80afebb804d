// Where messages go, and the quiet pairs of each thread.
#include <HB/hb.h>
#include <JRN/jrn.h>

#include <cstdio>
#include <mutex>

namespace {

template <class Function>
struct Sink {
  Function function;  // null: the log
  void* refcon;
};

// Written by the host's setters, read by every thread that reports; never held during a call of a sink.
constinit std::mutex sink_lock;
constinit Sink<HB_MessageSink> message_sink{};
constinit Sink<HB_VerificationSink> verification_sink{};

template <class Function>
Sink<Function> current(const Sink<Function>& sink) {
  const std::lock_guard hold(sink_lock);
  return sink;
}

// The quiet pairs of one thread: for each open pair the first code dropped in it.
struct QuietPairs {
  static constexpr i32 kept = 32;  // pairs nested deeper share the last place
  i32 open = 0;
  u32 first[kept] = {};
  u32& innermost() { return first[(open < kept ? open : kept) - 1]; }
};
constinit thread_local QuietPairs quiet;

}  // namespace

extern "C" void HB_SetMessageSink(HB_MessageSink sink, void* refcon) {
  const std::lock_guard hold(sink_lock);
  message_sink = {sink, refcon};
}

extern "C" void HB_SetVerificationSink(HB_VerificationSink sink, void* refcon) {
  const std::lock_guard hold(sink_lock);
  verification_sink = {sink, refcon};
}

extern "C" void HBp_ReportErrString(u32 code, i32 severity, const char* text) {
  if (text == nullptr) text = "";
  if (quiet.open > 0) {
    if (quiet.innermost() == 0) quiet.innermost() = code;
    return;
  }
  const auto sink = current(message_sink);
  if (sink.function != nullptr) return sink.function(sink.refcon, code, severity, text);
  char key[16];
  std::snprintf(key, sizeof key, "0x%06x", code);
  JRN_Log(30, "HB", key, text);
}

extern "C" void HB_ReportFailedVerification(u32 code, i32 line, i32, const char* text) {
  if (text == nullptr) text = "";
  const auto sink = current(verification_sink);
  if (sink.function != nullptr) return sink.function(sink.refcon, code, line, text);
  char key[32];
  std::snprintf(key, sizeof key, "0x%06x:%d", code, line);
  JRN_Log(40, "HB", key, text);
}

extern "C" i32 HB_StartQuietErrorsOnCurrentThread(void) {
  if (quiet.open++ < QuietPairs::kept) quiet.innermost() = 0;
  return ZR_Err_None;
}

extern "C" i32 HB_EndQuietErrorsOnCurrentThread(void) {
  if (quiet.open == 0) return ZR_Err_None;
  const u32 dropped = quiet.innermost();
  --quiet.open;
  if (quiet.open > 0 && quiet.innermost() == 0) quiet.innermost() = dropped;  // dropped inside the outer pair too
  return static_cast<i32>(dropped);
}
