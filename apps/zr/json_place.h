// Line and column of things in a JSON text, for messages.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace zr::tool {

struct TextPlace {
  size_t line = 1, column = 1;  // counted from 1; a column is a UTF-8 character
};
TextPlace place_of_byte(std::string_view text, size_t byte);

// From the top of a document down to a value: object keys and array indices.
using JsonPath = std::vector<std::variant<std::string, size_t>>;
// "layers[2].opacity"
std::string path_text(const JsonPath& path);
// Byte where the value stands (of the last key itself, with `key`). `text` is valid JSON and has it.
size_t byte_of_path(std::string_view text, const JsonPath& path, bool key = false);

}  // namespace zr::tool
