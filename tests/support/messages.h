// Catches what the library reports, for the life of the object.
#pragma once

#include <ZR/platform.h>

#include <mutex>
#include <string>
#include <vector>

class CaughtMessages {
 public:
  struct Report {
    u32 code;
    std::string text;
  };
  CaughtMessages() {
    HB_SetMessageSink([](void* self, u32 code, i32,
                         const char* text) { static_cast<CaughtMessages*>(self)->add(messages_of(self), code, text); },
                      this);
    HB_SetVerificationSink(
        [](void* self, u32 code, i32, const char* text) {
          static_cast<CaughtMessages*>(self)->add(static_cast<CaughtMessages*>(self)->verifications_, code, text);
        },
        this);
  }
  ~CaughtMessages() {
    HB_SetMessageSink(nullptr, nullptr);
    HB_SetVerificationSink(nullptr, nullptr);
  }
  CaughtMessages(const CaughtMessages&) = delete;
  CaughtMessages& operator=(const CaughtMessages&) = delete;

  const std::vector<Report>& messages() const { return messages_; }
  const std::vector<Report>& verifications() const { return verifications_; }
  // Text of the last one, or "" when there was none; the list starts anew.
  std::string take_message() { return take(messages_); }
  std::string take_verification() { return take(verifications_); }
  bool quiet() const { return messages_.empty() && verifications_.empty(); }
  void clear() { messages_.clear(), verifications_.clear(); }

 private:
  static std::vector<Report>& messages_of(void* self) { return static_cast<CaughtMessages*>(self)->messages_; }
  void add(std::vector<Report>& list, u32 code, const char* text) {
    const std::lock_guard lock(mutex_);
    list.push_back({code, text != nullptr ? text : ""});
  }
  static std::string take(std::vector<Report>& list) {
    std::string text = list.empty() ? "" : list.back().text;
    list.clear();
    return text;
  }
  std::mutex mutex_;
  std::vector<Report> messages_, verifications_;
};
