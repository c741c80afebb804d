// A shape of a mask as a command line tells it.
#include "mask_text.h"

#include <charconv>

#include "nearest_name.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

class ShapeText {
 public:
  ShapeText(const std::string& text, const std::string& where) : text_(text), where_(where) {
    static constexpr const char* kGaps = " \t\n,";
    for (size_t at = text.find_first_not_of(kGaps); at != std::string::npos;) {
      const size_t end = text.find_first_of(kGaps, at);
      words_.push_back(text.substr(at, end - at));
      at = end == std::string::npos ? end : text.find_first_not_of(kGaps, end);
    }
  }

  bool at_end() const { return next_ == words_.size(); }
  std::string word() { return words_[next_++]; }
  // Whether the next word begins as a number does.
  bool at_number() const { return !at_end() && words_[next_].find_first_of("0123456789+-.") == 0; }
  f64 number(const std::string& what, f64 low, f64 high) {
    if (at_end()) fail("lacks the number after \"" + what + '"');
    const std::string text = word();
    f64 value = 0;
    const auto [stop, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (error != std::errc() || stop != text.data() + text.size() || !(value >= low && value <= high))
      fail("has " + what + " \"" + text.substr(0, 60) + "\"; it must be a number " +
           std::to_string(static_cast<i32>(low)) + " to " + std::to_string(static_cast<i32>(high)));
    return value;
  }
  [[noreturn]] void fail(const std::string& what) const {
    const std::string shown = text_.size() > 60 ? text_.substr(0, 57) + "..." : text_;
    throw bad_input(where_ + " \"" + shown + "\" " + what);
  }

 private:
  const std::string &text_, &where_;
  std::vector<std::string> words_;
  size_t next_ = 0;
};

void read_place(ShapeText& text, MaskShape& shape) {
  std::vector<f64> numbers;
  while (text.at_number()) numbers.push_back(text.number("a place", -kFarthestPoint, kFarthestPoint));
  const std::string count = std::to_string(numbers.size()) + (numbers.size() == 1 ? " number" : " numbers");
  if (shape.kind == MaskShape::Kind::kPolygon) {
    if (numbers.size() < 6 || numbers.size() % 2 != 0 || numbers.size() > 2 * kMostPoints)
      text.fail("begins with " + count + "; it must have the x,y of 3 to " + std::to_string(kMostPoints) + " points");
    for (size_t i = 0; i < numbers.size(); i += 2) shape.points.push_back({numbers[i], numbers[i + 1]});
    return;
  }
  if (numbers.size() != 4) text.fail("begins with " + count + "; it must have four: x y width height");
  shape.x = numbers[0];
  shape.y = numbers[1];
  shape.width = numbers[2];
  shape.height = numbers[3];
  if (const auto wrong = wrong_with_box(shape.width, shape.height)) text.fail(*wrong);
}

}  // namespace

MaskShape parse_shape(MaskShape::Kind kind, const std::string& line, const std::string& where) {
  static const std::vector<std::string> kWords = {"feather", "mode", "opacity"};
  ShapeText text(line, where);
  MaskShape shape;
  shape.kind = kind;
  read_place(text, shape);
  while (!text.at_end()) {
    const std::string word = text.word();
    if (word == "feather") {
      shape.feather = text.number(word, 0, kWidestFeather);
    } else if (word == "opacity") {
      shape.opacity = text.number(word, 0, 1);
    } else if (word == "mode") {
      if (text.at_end()) text.fail("lacks the name after \"mode\"");
      const std::string name = text.word();
      const auto mode = find_mask_mode(name);
      if (!mode) text.fail(unknown_mask_mode(name));
      shape.mode = *mode;
    } else {
      text.fail("has an unknown word " + quoted_list({word.substr(0, 60)}) + "; the nearest is " +
                quoted_list(nearest_names(word, kWords, 1)));
    }
  }
  return shape;
}

}  // namespace zr::tool
