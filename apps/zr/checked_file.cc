// A file under the image library that remembers a write that failed.
#include "checked_file.h"

#include <cerrno>
#include <system_error>

namespace zr::tool {

CheckedFile::CheckedFile(const std::string& name) : IOProxy(name, Write), file_(std::fopen(name.c_str(), "wb")) {
  note(file_ != nullptr);
  if (file_ == nullptr) m_mode = Closed;
}

void CheckedFile::note(bool good) {
  if (!good && failure_.empty()) failure_ = std::generic_category().message(errno);
}

void CheckedFile::close() {
  if (file_ == nullptr) return;
  note(std::fclose(file_) == 0);
  file_ = nullptr;
  m_mode = Closed;
}

bool CheckedFile::seek(int64_t offset) {
  const bool good = file_ != nullptr && fseeko(file_, offset, SEEK_SET) == 0;
  note(good);
  if (good) m_pos = offset;
  return good;
}

size_t CheckedFile::write(const void* bytes, size_t count) {
  const size_t written = file_ == nullptr ? 0 : std::fwrite(bytes, 1, count, file_);
  note(written == count);
  m_pos += static_cast<int64_t>(written);
  return written;
}

}  // namespace zr::tool
