// The pixels of a raster frame, locked while an object lives.
#pragma once

#include <RS/rs.h>

namespace zr {

class RasterLock {
 public:
  explicit RasterLock(RS_World** raster) : raster_(raster), error_(RS_LoadLockPixels(raster)) {}
  ~RasterLock() {
    if (error_ == 0) RS_UnlockPixels(raster_);
  }
  RasterLock(const RasterLock&) = delete;
  RasterLock& operator=(const RasterLock&) = delete;
  i32 error() const { return error_; }

 private:
  RS_World** raster_;
  i32 error_;
};

}  // namespace zr
