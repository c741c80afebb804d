// Work done by tiles, when they are needed and once: a map of square tiles in front of an operation that is costly for
// the whole of its target, such as copying a large world.
//
// Tiles     are marked before the operation runs on them and stay so: after a throw a map is of no more use.
// Failure   constructors throw an i32, ZR_Err_Internal, reported, for a null operator and a tile size below 1, and
//           std::bad_alloc; what an operation throws passes through.
// Threads   a map belongs to one thread at a time.
#pragma once

#include <ZR/mask_buffer.h>
#include <ZR/types.h>

#include <boost/scoped_ptr.hpp>
#include <vector>

template <class T>
struct GX_Vector2T {
  T x, y;
};

class ZR_API ZR_LazyOperator {
 public:
  virtual GX_Vector2T<i16> GetExtent() const = 0;  // width and height of the target, pixels
  virtual ~ZR_LazyOperator() = default;
  virtual void DoItImp(const GX_Rect& rect) = 0;  // rect lies in the extent

  void DoIt(GX_Rect rect) { DoItImp(rect); }
};

// Which tiles are done.
class ZR_API ZR_LazyTileMap {
 public:
  ZR_LazyTileMap(i16 tile_size, GX_Vector2T<i16> extent);
  // Runs `work` on the tiles under the rectangle that are not done, joined along rows.
  void MakeValid(i32 left, i32 top, i32 right, i32 bottom, GX_Vector2T<i16> extent, ZR_LazyOperator& work);

 private:
  i16 tile_size_, columns_, rows_;
  std::vector<std::vector<bool>> valid_;  // by rows
};

class ZR_API ZR_LazyTiles {
 public:
  // Takes the operator out of the pointer and owns it.
  ZR_LazyTiles(i16 tile_size, boost::scoped_ptr<ZR_LazyOperator>* work);

  // Does what is not done yet of the tiles under `rect`, moved by the offset (16-bit sums) and cut to the extent.
  void MakeValid(const GX_Rect& rect);
  ZR_LazyOperator* GetOperator() const { return operator_.get(); }
  void SetOffset(GX_Vector2T<i16> offset) { offset_ = offset; }
  GX_Vector2T<i16> GetOffset() const { return offset_; }

 private:
  boost::scoped_ptr<ZR_LazyOperator> operator_;
  ZR_LazyTileMap tiles_;
  GX_Vector2T<i16> offset_ = {0, 0};
};

// The same without an offset, and with a condition: while it is false nothing is done or marked.
class ZR_API ZR_LazyTilesCondition {
 public:
  ZR_LazyTilesCondition(i16 tile_size, boost::scoped_ptr<ZR_LazyOperator>* work, bool condition);

  void ConditionalMakeValid(const GX_Rect& rect);
  void SetCondition(bool condition) { condition_ = condition; }

 private:
  boost::scoped_ptr<ZR_LazyOperator> operator_;
  ZR_LazyTileMap tiles_;
  bool condition_;
};

// Copies a world onto another by ZR_CopyBits_Draft, each rectangle to its own place. Neither is owned.
class ZR_API ZR_LazyWorldCopyOperator final : public ZR_LazyOperator {
 public:
  ZR_LazyWorldCopyOperator(ZR_LayerDef* src, ZR_LayerDef* dst) : src_(src), dst_(dst) {}
  GX_Vector2T<i16> GetExtent() const override;
  void DoItImp(const GX_Rect& rect) override;
  void SetSourceWorld(ZR_LayerDef* src) { src_ = src; }

 private:
  ZR_LayerDef *src_, *dst_;
};

// Fills a mask buffer of 8 or 16 bits, which it takes out of the pointer and owns.
class ZR_API ZR_LazyFillUnoBufferOperator final : public ZR_LazyOperator {
 public:
  ZR_LazyFillUnoBufferOperator(boost::scoped_ptr<ZR_UnoBuffer>* buffer, u16 value);
  GX_Vector2T<i16> GetExtent() const override;
  void DoItImp(const GX_Rect& rect) override;
  ZR_UnoBuffer* GetBuffer() const { return buffer_.get(); }

 private:
  boost::scoped_ptr<ZR_UnoBuffer> buffer_;
  u16 value_;
};
