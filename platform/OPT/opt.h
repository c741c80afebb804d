// OPT: text preferences.
//
// Looked up in this order: the environment variable ZR_<KEY> (capitals, dots as underscores), then the
// TOML file that ZR_PREFERENCES names, else $XDG_CONFIG_HOME/zr/preferences.toml or
// ~/.config/zr/preferences.toml, where `log.level` is key level of table [log].
#pragma once

#include <string>

// The value as text, else `fallback`. A file that cannot be parsed is reported once and counts as empty.
std::string OPT_GetString(const char* key, const char* fallback);
int OPT_GetInt(const char* key, int fallback);
// Forgets what was read, so that the next look-up reads again; ZR_Birth calls it.
void OPT_Reload();
