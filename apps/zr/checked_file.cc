// A file under the image library that remembers a write that failed.
#include "checked_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>

namespace zr::tool {

CheckedFile::CheckedFile(const std::string& name)
    : IOProxy(name, Write), file_(::open(name.c_str(), O_RDWR | O_CREAT | O_TRUNC | O_CLOEXEC, 0666)) {
  note(file_ >= 0);
  if (file_ < 0) m_mode = Closed;
}

void CheckedFile::note(bool good) {
  if (!good && failure_.empty()) failure_ = std::generic_category().message(errno);
}

void CheckedFile::close() {
  if (file_ < 0) return;
  note(::close(file_) == 0);
  file_ = -1;
  m_mode = Closed;
}

size_t CheckedFile::read(void* bytes, size_t count) {
  size_t done = 0;
  while (done < count) {
    const ssize_t got = ::pread(file_, static_cast<char*>(bytes) + done, count - done, m_pos);
    if (got < 0 && errno == EINTR) continue;
    note(got >= 0);
    if (got <= 0) break;
    done += static_cast<size_t>(got);
    m_pos += got;
  }
  return done;
}

size_t CheckedFile::write(const void* bytes, size_t count) {
  size_t done = 0;
  while (done < count) {
    const ssize_t put = ::pwrite(file_, static_cast<const char*>(bytes) + done, count - done, m_pos);
    if (put < 0 && errno == EINTR) continue;
    note(put > 0);
    if (put <= 0) break;
    done += static_cast<size_t>(put);
    m_pos += put;
  }
  return done;
}

size_t CheckedFile::size() const {
  struct stat status = {};
  return fstat(file_, &status) == 0 ? static_cast<size_t>(status.st_size) : 0;
}

}  // namespace zr::tool
