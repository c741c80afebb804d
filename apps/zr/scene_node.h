// One value of a scene file, with its place in the text, and the checks that its kind allows.
#pragma once

#include <ZR/zr.h>

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "json_place.h"

namespace zr::tool {

// The text lives as long as every node of it.
struct SceneText {
  std::string file, text;
};

class SceneNode {
 public:
  SceneNode(const SceneText& source, const nlohmann::json& value, JsonPath path)
      : source_(&source), value_(&value), path_(std::move(path)) {}

  const nlohmann::json& json() const { return *value_; }
  std::string path() const { return path_text(path_); }
  // "scene.json:3:5: layers[2].opacity " + what
  [[noreturn]] void fail(const std::string& what) const;
  // "... is 1.5; it must be " + expected
  [[noreturn]] void refuse(const std::string& expected) const;

  SceneNode at(const std::string& key) const;
  SceneNode at(size_t index) const;
  bool has(const std::string& key) const { return value_->contains(key); }
  size_t size() const { return value_->size(); }

  // An object with no other keys than these; an unknown one is told with the nearest. `kind` says of which kind the
  // object is, where there are several.
  void require_keys(const std::vector<std::string>& known, const std::string& kind = "") const;
  void require_array(size_t length, const std::string& expected) const;
  f64 number(f64 low, f64 high) const;
  i32 integer(i32 low, i32 high) const;
  bool boolean() const;
  std::string string(const std::string& expected) const;
  // Index of a name among `names`.
  size_t one_of(const std::vector<std::string>& names) const;

 private:
  const SceneText* source_;
  const nlohmann::json* value_;
  JsonPath path_;
};

}  // namespace zr::tool
