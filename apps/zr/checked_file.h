// A file under the image library that remembers a write that failed.
#pragma once

#include <OpenImageIO/filesystem.h>

#include <string>

namespace zr::tool {

// The library's PNG writer takes no notice of a full disk, and its TIFF and OpenEXR writers none of the
// last few bytes: half a picture would get a whole name. So all bytes go through here.
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
  size_t read(void* bytes, size_t count) override;
  size_t write(const void* bytes, size_t count) override;
  size_t size() const override;

 private:
  void note(bool good);
  int file_;
  std::string failure_;
};

}  // namespace zr::tool
