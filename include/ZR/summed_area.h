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
// pixel types; returns 0, or 3 where it needs a point sampler whose slot is empty.
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
  void free_tables();

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

// Running sums of each row of a world, for walks that average runs of a row at every pixel of an output of
// another size. Sums are premultiplied, of channels 0..1, in linear light where the settings ask for it.
template <class T>
class ZR_API ZR_HorizontalSumTable {
 public:
  // The output has ceil(scale * output_width) by ceil(scale * output_height) pixels. Runs reach up to the box
  // of 2 * radius_x by 2 * radius_y beyond the world; with transform_radius that box is scaled by
  // (radius_scale_x, radius_scale_y) and turned by `degrees` first, and its bounds count. settings, or where
  // they are null the fallback, name the linear-light tables; both may be null. Throws an i32: out of memory,
  // or ZR_Err_Internal for sizes that are no number or beyond 30000.
  ZR_HorizontalSumTable(const ZR_WorldX<T>* world, i32 output_width, i32 output_height, f64 scale, f64 radius_x,
                        f64 radius_y, f64 radius_scale_x, f64 radius_scale_y, f64 degrees, bool transform_radius,
                        const ZR_ColorSettings* settings, const ZR_ColorSettings* fallback);
  ~ZR_HorizontalSumTable();
  ZR_HorizontalSumTable(const ZR_HorizontalSumTable&) = delete;
  ZR_HorizontalSumTable& operator=(const ZR_HorizontalSumTable&) = delete;

  i32 OutputWidth() const { return output_width_; }
  i32 OutputHeight() const { return output_height_; }
  i32 PaddingX() const { return padding_x_; }
  i32 PaddingY() const { return padding_y_; }
  // Row y of the world: entry n is the sum of columns -PaddingX()..n - PaddingX() - 1, the last one that of
  // all columns up to width + PaddingX() - 1. So columns a..b - 1 sum up to [b + PaddingX()] - [a + PaddingX()].
  const ZR_PixelFloat* Row(i32 y) const { return sums_ + static_cast<size_t>(y) * static_cast<size_t>(entries_); }
  i32 Entries() const { return entries_; }

 private:
  ZR_PixelFloat* sums_ = nullptr;
  i32 output_width_ = 0, output_height_ = 0, padding_x_ = 0, padding_y_ = 0, entries_ = 0;
};
