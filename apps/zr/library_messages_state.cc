// The last message that the library reported, for the tool's one error line.
#include "library_messages_state.h"

#include <mutex>

namespace zr::tool {
namespace {

constinit std::mutex message_lock;

std::string& last_message() {
  static std::string text;
  return text;
}

}  // namespace

void keep_message(const std::string& text) {
  const std::lock_guard lock(message_lock);
  last_message() = text;
}

std::string take_last_message() {
  const std::lock_guard lock(message_lock);
  std::string text;
  text.swap(last_message());
  return text;
}

}  // namespace zr::tool
