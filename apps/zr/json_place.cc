// Line and column of things in a JSON text, for messages.
//
// The parser keeps no places, and they are only needed once something is wrong: so the text, which is
// known to be valid by then, is walked again down to the value.
#include "json_place.h"

#include <algorithm>
#include <nlohmann/json.hpp>

namespace zr::tool {
namespace {

class Walk {
 public:
  explicit Walk(std::string_view text) : text_(text) {}
  size_t at() const { return at_; }
  char here() const { return at_ < text_.size() ? text_[at_] : '\0'; }
  void space() {
    while (at_ < text_.size() && std::string_view(" \t\r\n,:\xEF\xBB\xBF").find(text_[at_]) != std::string_view::npos)
      ++at_;
  }
  void step() {
    ++at_;
    space();
  }
  // Past a string, with its quotes.
  std::string_view string() {
    const size_t begin = at_++;
    while (at_ < text_.size() && text_[at_] != '"') at_ += text_[at_] == '\\' ? 2 : 1;
    at_ = std::min(at_ + 1, text_.size());
    return text_.substr(begin, at_ - begin);
  }
  // Past a value; nesting is counted, not recursed into.
  void value() {
    size_t depth = 0;
    do {
      if (here() == '"') {
        string();
      } else if (here() == '{' || here() == '[') {
        ++depth, ++at_;
      } else if (here() == '}' || here() == ']') {
        --depth, ++at_;
      } else {
        while (at_ < text_.size() && std::string_view(" \t\r\n,:]}").find(text_[at_]) == std::string_view::npos) ++at_;
      }
      space();
    } while (depth > 0 && at_ < text_.size());
  }

 private:
  std::string_view text_;
  size_t at_ = 0;
};

}  // namespace

TextPlace place_of_byte(std::string_view text, size_t byte) {
  TextPlace place;
  for (const char c : text.substr(0, std::min(byte, text.size()))) {
    if (c == '\n') {
      ++place.line;
      place.column = 1;
    } else if ((static_cast<unsigned char>(c) & 0xc0) != 0x80) {
      ++place.column;
    }
  }
  return place;
}

std::string path_text(const JsonPath& path) {
  std::string text;
  for (const auto& part : path) {
    if (const auto* index = std::get_if<size_t>(&part))
      text += '[' + std::to_string(*index) + ']';
    else
      text += (text.empty() ? "" : ".") + std::get<std::string>(part);
  }
  return text;
}

size_t byte_of_path(std::string_view text, const JsonPath& path, bool key) {
  Walk walk(text);
  walk.space();
  for (size_t depth = 0; depth < path.size(); ++depth) {
    walk.step();
    if (const auto* index = std::get_if<size_t>(&path[depth])) {
      for (size_t i = 0; i < *index; ++i) walk.value();
      continue;
    }
    while (walk.here() == '"') {
      const size_t begin = walk.at();
      const bool found = nlohmann::json::parse(walk.string()) == std::get<std::string>(path[depth]);
      if (found && key && depth + 1 == path.size()) return begin;
      walk.space();
      if (found) break;
      walk.value();
    }
  }
  return walk.at();
}

}  // namespace zr::tool
