// OPT: text preferences.
//
// Looked up in this order: the environment variable ZR_<KEY> (capitals, dots as underscores), then the
// TOML file that ZR_PREFERENCES names, else $XDG_CONFIG_HOME/zr/preferences.toml or
// ~/.config/zr/preferences.toml, where `log.level` is key level of table [log]. An array counts as its
// elements with colons between. Any thread, while nobody changes the environment.
#pragma once

#include <ZR/zr.h>

#include <string>

// The value as text, else `fallback`. A file that cannot be parsed, or that ZR_PREFERENCES names and that
// cannot be read, is logged once and counts as empty. May throw std::bad_alloc.
std::string OPT_GetString(const char* key, const char* fallback);
int OPT_GetInt(const char* key, int fallback);  // `fallback` too for what is no whole number
// Forgets what was read, so that the next look-up reads again; ZR_Birth calls it.
void OPT_Reload();
// A yes-or-no preference under a section's and a key's text, which may hold blanks: key `key` of table
// [section]. Absent is no. 0, or ZR_Err_BadParam when the value is neither true nor false.
i32 OPT_GetTextPrefData(const char* section, const char* key, bool* out);
