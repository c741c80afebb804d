// One value of a scene file, with its place in the text, and the checks that its kind allows.
#include "scene_node.h"

#include <algorithm>

#include "nearest_name.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

std::string place_text(const SceneText& source, size_t byte) {
  const TextPlace place = place_of_byte(source.text, byte);
  return source.file + ':' + std::to_string(place.line) + ':' + std::to_string(place.column) + ": ";
}

// A value as it stands in the file, short.
std::string shown(const nlohmann::json& value) {
  if (value.is_object()) return "an object";
  if (value.is_array()) return "a list of " + std::to_string(value.size());
  std::string text = value.dump(-1, ' ', true, nlohmann::json::error_handler_t::replace);
  if (text.size() > 60) text = text.substr(0, 57) + "...";
  return text;
}

std::string number_text(f64 value) {
  nlohmann::json number = value;
  if (value == static_cast<f64>(static_cast<i64>(value))) number = static_cast<i64>(value);
  return number.dump();
}

}  // namespace

void SceneNode::fail(const std::string& what) const {
  throw bad_input(place_text(*source_, byte_of_path(source_->text, path_)) + (path_.empty() ? "the scene" : path()) +
                  ' ' + what);
}

void SceneNode::refuse(const std::string& expected) const { fail("is " + shown(*value_) + "; it must be " + expected); }

SceneNode SceneNode::at(const std::string& key) const {
  JsonPath path = path_;
  path.emplace_back(key);
  return {*source_, value_->at(key), std::move(path)};
}

SceneNode SceneNode::at(size_t index) const {
  JsonPath path = path_;
  path.emplace_back(index);
  return {*source_, value_->at(index), std::move(path)};
}

void SceneNode::require_keys(const std::vector<std::string>& known, const std::string& kind) const {
  if (!value_->is_object()) refuse("an object { ... }");
  for (const auto& [key, value] : value_->items()) {
    if (std::find(known.begin(), known.end(), key) != known.end()) continue;
    JsonPath path = path_;
    path.emplace_back(key);
    throw bad_input(place_text(*source_, byte_of_path(source_->text, path, true)) +
                    (path_.empty() ? "the scene" : this->path()) + (kind.empty() ? "" : " (" + kind + ')') +
                    " has an unknown key " + shown(key) + "; the nearest is " +
                    quoted_list(nearest_names(key, known, 1)));
  }
}

void SceneNode::require_array(size_t length, const std::string& expected) const {
  if (!value_->is_array() || value_->size() != length) refuse(expected);
}

f64 SceneNode::number(f64 low, f64 high) const {
  const bool in_range = value_->is_number() && value_->get<f64>() >= low && value_->get<f64>() <= high;
  if (!in_range) refuse("a number " + number_text(low) + " to " + number_text(high));
  return value_->get<f64>();
}

i32 SceneNode::integer(i32 low, i32 high) const {
  const bool whole = value_->is_number_integer() ||
                     (value_->is_number_float() && value_->get<f64>() == std::floor(value_->get<f64>()));
  const bool in_range = whole && value_->get<f64>() >= low && value_->get<f64>() <= high;
  if (!in_range) refuse("a whole number " + std::to_string(low) + " to " + std::to_string(high));
  return static_cast<i32>(value_->get<f64>());
}

bool SceneNode::boolean() const {
  if (!value_->is_boolean()) refuse("true or false");
  return value_->get<bool>();
}

std::string SceneNode::string(const std::string& expected) const {
  if (!value_->is_string() || value_->get_ref<const std::string&>().empty()) refuse(expected);
  return value_->get<std::string>();
}

size_t SceneNode::one_of(const std::vector<std::string>& names) const {
  if (value_->is_string()) {
    const std::string plain = plain_name(value_->get_ref<const std::string&>());
    const auto found = std::find(names.begin(), names.end(), plain);
    if (found != names.end()) return static_cast<size_t>(found - names.begin());
  }
  refuse(quoted_list(names));
}

}  // namespace zr::tool
