// Box means: of single boxes, and by tables that average any box of a world in constant time.
//
// Positions  16.16, or for tables pixels; centres are on integers except where a rectangle of whole pixels
//            is asked for.
// Outside    counts as transparent black: alpha falls where a box leaves the world, colour does not.
// Failure    constructors throw an i32: ZR_Err_OutOfMemory, after the message. Sampling cannot fail.
// Threads    a built table is read-only; any number of threads may sample it.
#pragma once

#include <ZR/sample.h>
#include <ZR/world.h>

class ZR_ColorSettings;

// The straight mean of the box of 2 * x_radius by 2 * y_radius around (x, y). Where the box is not wider or
// higher than a pixel it is walked by point samples: bilinear for quality 1, bicubic for 2. For the three
// pixel types; returns 0, or 3 while the point sampler's slot is empty.
template <class T, i32 quality>
ZR_API i32 ZR_AreaSample_CPlusPlus(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, T* dst);

// A world made ready for box means. Entry (x, y) is the mean, not the sum, of the premultiplied pixels of
// (0, 0)..(x, y), on the channel's scale: single precision then serves far from the origin too. The world is
// not needed afterwards.
class ZR_API ZR_SummedAreaTable {
 public:
  // Float worlds get the double table in any case.
  ZR_SummedAreaTable(const ZR_World* world, bool use_double);
  ~ZR_SummedAreaTable();
  ZR_SummedAreaTable(const ZR_SummedAreaTable&) = delete;
  ZR_SummedAreaTable& operator=(const ZR_SummedAreaTable&) = delete;

  i32 Width() const { return width_; }
  i32 Height() const { return height_; }
  bool UsesDouble() const { return uses_double_; }
  // Row by row without padding; null for the table that is not in use and for a world without pixels.
  const ZR_PixelFloat* FloatTable() const { return float_table_; }
  const ZR_PixelDouble* DoubleTable() const { return double_table_; }

 private:
  ZR_PixelFloat* float_table_ = nullptr;
  ZR_PixelDouble* double_table_ = nullptr;
  i32 width_ = 0, height_ = 0;
  bool uses_double_ = false;
};

// The straight mean of whole pixels, left..right-1 by top..bottom-1. O is the pixel type of the table's
// world, T the table's.
template <class O, class T>
ZR_API void ZR_SummedAreaTable_SampleDraft(i32 width, i32 height, const T* table, i32 left, i32 top, i32 right,
                                           i32 bottom, O* dst);
// The same of a box with fractional edges, in coordinates of pixel centres: (-0.5, -0.5, 0.5, 0.5) is pixel (0, 0).
template <class O, class T>
ZR_API void ZR_SummedAreaTable_SampleAA(i32 width, i32 height, const T* table, f32 left, f32 top, f32 right, f32 bottom,
                                        O* dst);
