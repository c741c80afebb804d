// Preferences, from the environment and one TOML file.
#define TOML_HEADER_ONLY 1
#include <toml++/toml.h>

#include <JRN/jrn.h>
#include <OPT/opt.h>

#include <charconv>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <mutex>
#include <sstream>

namespace {

// Values of the file by dotted key. Never destroyed: the log asks while the process ends.
struct Preferences {
  std::mutex lock;
  bool read = false;
  std::map<std::string, std::string> values;
};
Preferences& preferences() {
  static auto* const instance = new Preferences;
  return *instance;
}

std::string text_of(const toml::node& node) {
  if (const auto* text = node.as_string()) return text->get();
  if (const auto* list = node.as_array()) {  // the elements, separated by colons as in a path list
    std::string all;
    for (const toml::node& element : *list) all += (all.empty() ? "" : ":") + text_of(element);
    return all;
  }
  std::ostringstream text;
  node.visit([&](const auto& value) {
    if constexpr (toml::is_value<decltype(value)>) text << value;
  });
  return text.str();
}

void flatten(const toml::table& table, const std::string& prefix, std::map<std::string, std::string>& out) {
  for (const auto& [key, node] : table) {
    const std::string name = prefix + std::string(key.str());
    if (const auto* inner = node.as_table())
      flatten(*inner, name + ".", out);
    else
      out[name] = text_of(node);
  }
}

// Empty: there is no place to look.
std::filesystem::path file_path(bool* must_exist) {
  if (const char* named = std::getenv("ZR_PREFERENCES"); named != nullptr && *named != '\0') {
    *must_exist = true;
    return named;
  }
  *must_exist = false;
  if (const char* base = std::getenv("XDG_CONFIG_HOME"); base != nullptr && *base != '\0')
    return std::filesystem::path(base) / "zr" / "preferences.toml";
  if (const char* home = std::getenv("HOME"); home != nullptr && *home != '\0')
    return std::filesystem::path(home) / ".config" / "zr" / "preferences.toml";
  return {};
}

// Fills `values`; what is returned is to be reported.
std::string read_file(std::map<std::string, std::string>& values) {
  bool must_exist = false;
  const std::filesystem::path path = file_path(&must_exist);
  std::error_code ignored;
  if (path.empty() || (!must_exist && !std::filesystem::exists(path, ignored))) return {};
  try {
    flatten(toml::parse_file(path.string()), "", values);
    return {};
  } catch (const toml::parse_error& error) {
    values.clear();
    std::ostringstream text;
    text << path.string() << ": " << error.description();
    if (error.source().begin.line != 0)
      text << " (line " << error.source().begin.line << ", column " << error.source().begin.column << ")";
    return text.str();
  }
}

bool find_in_environment(const char* key, std::string* out) {
  std::string name = "ZR_";
  for (const char* at = key; *at != '\0'; ++at) {
    const char letter = *at;
    name += letter == '.' ? '_' : letter >= 'a' && letter <= 'z' ? static_cast<char>(letter - 'a' + 'A') : letter;
  }
  const char* const value = std::getenv(name.c_str());
  if (value != nullptr) *out = value;
  return value != nullptr;
}

bool find_in_file(const char* key, std::string* out) {
  std::string trouble;
  bool found = false;
  {
    Preferences& all = preferences();
    const std::lock_guard hold(all.lock);
    if (!all.read) {
      all.read = true;
      trouble = read_file(all.values);
    }
    if (const auto entry = all.values.find(key); entry != all.values.end()) {
      *out = entry->second;
      found = true;
    }
  }
  if (!trouble.empty()) JRN_Log(30, "OPT", "preferences", trouble.c_str());  // which asks for preferences itself
  return found;
}

}  // namespace

std::string OPT_GetString(const char* key, const char* fallback) {
  std::string value;
  if (find_in_environment(key, &value) || find_in_file(key, &value)) return value;
  return fallback != nullptr ? fallback : "";
}

int OPT_GetInt(const char* key, int fallback) {
  const std::string text = OPT_GetString(key, "");
  int value = 0;
  const char* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, value);
  return error == std::errc() && stop == end ? value : fallback;
}

i32 OPT_GetTextPrefData(const char* section, const char* key, bool* out) {
  const std::string text = OPT_GetString((std::string(section) + "." + key).c_str(), "false");
  if (text != "true" && text != "false") return ZR_Err_BadParam;
  *out = text == "true";
  return ZR_Err_None;
}

void OPT_Reload() {
  Preferences& all = preferences();
  const std::lock_guard hold(all.lock);
  all.read = false;
  all.values.clear();
}
