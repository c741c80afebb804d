// A file under the image library that remembers a write that failed.
#pragma once

#include <OpenImageIO/filesystem.h>

#include <cstdio>
#include <string>

namespace zr::tool {

// The library's PNG writer takes no notice of a full disk and would leave half a picture under a whole
// name; so its bytes go through here.
class CheckedFile : public OIIO::Filesystem::IOProxy {
 public:
  explicit CheckedFile(const std::string& name);
  ~CheckedFile() override { close(); }
  CheckedFile(const CheckedFile&) = delete;
  CheckedFile& operator=(const CheckedFile&) = delete;

  // The system's reason for the first failure, "" if all went well; final once closed.
  const std::string& failure() const { return failure_; }

  const char* proxytype() const override { return "checked"; }
  void close() override;
  bool seek(int64_t offset) override;
  size_t write(const void* bytes, size_t count) override;

 private:
  void note(bool good);
  std::FILE* file_;
  std::string failure_;
};

}  // namespace zr::tool
