// JRN: the log.
#pragma once

#include <ZR/zr.h>

// level: 10 tells of life (birth, death), 30 warns, 40 is an error. Lines below the preference
// "log.level" (default 30) are dropped; "log.file" sends them to a file instead of stderr. Any thread.
void JRN_Log(i32 level, const char* module, const char* key, const char* text) noexcept;
