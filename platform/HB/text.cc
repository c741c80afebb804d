// Bounded substitution into texts, and exceptions turned into codes.
#include <HB/hb.h>
#include <ZR/errors.h>

#include <cstring>
#include <new>

i32 HB_SubString(char* out, std::size_t limit, const char* format, const char* first, const char* second,
                 const char* third, const char* fourth) {
  if (out == nullptr || limit == 0) return ZR_Err_BadParam;
  const char* const arguments[] = {first, second, third, fourth};
  std::size_t used = 0;
  const auto append = [&](const char* text, std::size_t length) {
    if (length >= limit - used) return false;  // one byte stays for the ending zero
    std::memcpy(out + used, text, length);
    used += length;
    return true;
  };
  bool fits = format != nullptr;
  for (const char* at = format; fits && *at != '\0';) {
    if (at[0] == '^' && at[1] == 'L' && at[2] >= '1' && at[2] <= '4') {
      const char* const argument = arguments[at[2] - '1'];
      fits = argument == nullptr || append(argument, std::strlen(argument));
      at += 3;
    } else {
      fits = append(at++, 1);
    }
  }
  out[fits ? used : 0] = '\0';
  return fits ? ZR_Err_None : ZR_Err_BadParam;
}

i32 HB_TranslateAndReportException(const std::exception& error) noexcept {
  const bool memory = dynamic_cast<const std::bad_alloc*>(&error) != nullptr;
  HBp_ReportErrString(ZR_ModuleCode | ZR_Site_Plain, ZR_ReportSeverity, error.what());
  return memory ? ZR_Err_OutOfMemory : ZR_Err_Internal;
}
