// Tiles on demand, and the operators that the library brings for them.
#include <ZR/copy_bits.h>
#include <ZR/lazy_tiles.h>

#include <algorithm>

#include "world/guard.h"

namespace zr {
namespace {

i16 tiles_in(i32 extent, i16 tile_size) {
  if (tile_size < 1) fail(failed_verification(ZR_Site_LazyTiles, "lazy tiles have a size of 1 or more"));
  return static_cast<i16>(std::max((extent + tile_size - 1) / tile_size, 0));
}

// Moves the operator over, and asks it for the extent of its map.
GX_Vector2T<i16> take(boost::scoped_ptr<ZR_LazyOperator>* from, boost::scoped_ptr<ZR_LazyOperator>* to) {
  if (from == nullptr || *from == nullptr) fail(failed_verification(ZR_Site_LazyTiles, "lazy tiles need an operator"));
  to->swap(*from);
  return (*to)->GetExtent();
}

}  // namespace
}  // namespace zr

ZR_LazyTileMap::ZR_LazyTileMap(i16 tile_size, GX_Vector2T<i16> extent)
    : tile_size_(tile_size),
      columns_(zr::tiles_in(extent.x, tile_size)),
      rows_(zr::tiles_in(extent.y, tile_size)),
      valid_(static_cast<std::size_t>(rows_), std::vector<bool>(static_cast<std::size_t>(columns_))) {}

void ZR_LazyTileMap::MakeValid(i32 left, i32 top, i32 right, i32 bottom, GX_Vector2T<i16> extent,
                               ZR_LazyOperator& work) {
  // An operator whose extent has grown since has no tiles there.
  const i32 size = tile_size_, width = std::min<i32>(extent.x, columns_ * size),
            height = std::min<i32>(extent.y, rows_ * size);
  left = std::max(left, 0);
  top = std::max(top, 0);
  right = std::min(right, width);
  bottom = std::min(bottom, height);
  if (left >= right || top >= bottom) return;
  const i32 end = (right - 1) / size + 1;
  for (i32 row = top / size; row <= (bottom - 1) / size; ++row) {
    std::vector<bool>& valid = valid_[static_cast<std::size_t>(row)];
    for (i32 column = left / size; column < end;) {
      const i32 first = column;
      for (; column < end && !valid[static_cast<std::size_t>(column)]; ++column)
        valid[static_cast<std::size_t>(column)] = true;
      if (column > first)
        work.DoIt({static_cast<i16>(row * size), static_cast<i16>(first * size),
                   static_cast<i16>(std::min((row + 1) * size, height)),
                   static_cast<i16>(std::min(column * size, width))});
      else
        ++column;
    }
  }
}

ZR_LazyTiles::ZR_LazyTiles(i16 tile_size, boost::scoped_ptr<ZR_LazyOperator>* work)
    : tiles_(tile_size, zr::take(work, &operator_)) {}

void ZR_LazyTiles::MakeValid(const GX_Rect& rect) {
  const auto moved = [](i16 edge, i16 by) { return static_cast<i16>(edge + by); };
  const GX_Vector2T<i16> extent = operator_->GetExtent();
  tiles_.MakeValid(moved(rect.left, offset_.x), moved(rect.top, offset_.y), moved(rect.right, offset_.x),
                   moved(rect.bottom, offset_.y), extent, *operator_);
}

ZR_LazyTilesCondition::ZR_LazyTilesCondition(i16 tile_size, boost::scoped_ptr<ZR_LazyOperator>* work, bool condition)
    : tiles_(tile_size, zr::take(work, &operator_)), condition_(condition) {}

void ZR_LazyTilesCondition::ConditionalMakeValid(const GX_Rect& rect) {
  if (!condition_) return;
  // Asked twice, and the lesser answer counts: kept for operators whose target shrinks meanwhile.
  const GX_Vector2T<i16> one = operator_->GetExtent(), other = operator_->GetExtent();
  tiles_.MakeValid(rect.left, rect.top, rect.right, rect.bottom, {std::min(one.x, other.x), std::min(one.y, other.y)},
                   *operator_);
}

GX_Vector2T<i16> ZR_LazyWorldCopyOperator::GetExtent() const {
  return {static_cast<i16>(src_->width), static_cast<i16>(src_->height)};
}

void ZR_LazyWorldCopyOperator::DoItImp(const GX_Rect& rect) {
  const GX_LRect place = {rect.left, rect.top, rect.right, rect.bottom};
  if (const i32 error = ZR_CopyBits_Draft(nullptr, src_, dst_, &place, &place); error != 0) zr::fail(error);
}

ZR_LazyFillUnoBufferOperator::ZR_LazyFillUnoBufferOperator(boost::scoped_ptr<ZR_UnoBuffer>* buffer, u16 value)
    : value_(value) {
  if (buffer == nullptr || *buffer == nullptr)
    zr::fail(zr::failed_verification(ZR_Site_LazyTiles, "a lazy fill needs a mask buffer"));
  buffer_.swap(*buffer);
}

GX_Vector2T<i16> ZR_LazyFillUnoBufferOperator::GetExtent() const {
  return {static_cast<i16>(buffer_->width), static_cast<i16>(buffer_->height)};
}

void ZR_LazyFillUnoBufferOperator::DoItImp(const GX_Rect& rect) {
  const GX_LRect place = {rect.left, rect.top, rect.right, rect.bottom};
  const i32 error = buffer_->depth == 16 ? ZR_FillDeepUnoBuffer(value_, &place, buffer_.get())
                                         : ZR_FillUnoBuffer(static_cast<u8>(value_), &place, buffer_.get());
  if (error != 0) zr::fail(error);
}
