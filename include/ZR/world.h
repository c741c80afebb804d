// Worlds as classes: the library's own form of an image buffer.
//
// A ZR_World contains a ZR_LayerDef, so every world may be passed to the C interface. It owns its
// pixels (a plain frame or a raster frame) or refers to somebody else's; references free nothing.
//
// Failure  every operation throws an i32 code (ZR_Err_...); none returns one.
// Threads  any number may read a world and write disjoint rows of one; nothing is locked.
// Floats   NaN and infinities are carried; they are clamped only on the way to an integer depth.
#pragma once

#include <ZR/depth.h>
#include <ZR/platform.h>
#include <ZR/zr.h>

// Anything with pixels.
class ZR_API ZR_PixelContainerBase : public HB_MemTrackedObject {
 public:
  virtual ~ZR_PixelContainerBase() = default;
  virtual i16 GetBitDepth() const = 0;                 // 8, 16 or 32 bits a channel
  i32 PixelSize() const { return GetBitDepth() / 2; }  // bytes
};

template <class T>
class ZR_API ZR_WorldX;

template <class World8, class World16, class WorldFloat>
class ZR_API ZR_PixelContainer : public ZR_PixelContainerBase {};

using ZR_AnyPixelContainer = ZR_PixelContainer<ZR_WorldX<ZR_Pixel8>, ZR_WorldX<ZR_Pixel16>, ZR_WorldX<ZR_PixelFloat>>;

// Flags of the constructors that allocate.
enum : i32 {
  ZR_WorldFlag_Clear = 1,        // zero the pixels
  ZR_WorldFlag_Deep = 2,         // the callback surface's request for 16 bits; no effect here
  ZR_WorldFlag_RasterFrame = 4,  // back the world with an RS_World
};

struct ZR_API ZR_World : public ZR_AnyPixelContainer, public ZR_LayerDef {
 public:
  ~ZR_World() override = default;
  ZR_World(const ZR_World&) = delete;
  ZR_World& operator=(const ZR_World&) = delete;

  virtual bool IsReference() const = 0;          // owns no pixels
  virtual void Clear(const GX_LRect* rect) = 0;  // zeroes a rectangle, clipped; null: all.
  // Clear of full rows in a world without row padding zeroes every row from `top` on, whatever the
  // rectangle's bottom: callers clear whole worlds that way.
  virtual void ClearExceptRect(const GX_LRect& rect) = 0;  // zeroes what lies outside; empty: all
  virtual void Fill(const ZR_PixelFloat& colour, const GX_LRect* rect) = 0;
  virtual void Fill(const ZR_Pixel16& colour, const GX_LRect* rect) = 0;
  virtual void FillAlpha() = 0;    // alpha to white
  virtual void InvertAlpha() = 0;  // alpha to white - alpha
  virtual void Premultiply() = 0;  // the four of a float world throw ZR_Err_Internal: use ZR_Premul
  virtual void Unmultiply() = 0;
  virtual void PremulColor(const ZR_Pixel16& colour) = 0;
  virtual void UnmulColor(const ZR_Pixel16& colour) = 0;
  // Copies `rect` of src to (dst_x, dst_y), clipped to both; equal depths only. Rows move as memmove.
  virtual void CopyRect(const ZR_World* src, const GX_LRect& rect, i32 dst_x, i32 dst_y) = 0;
  // The same between any depths. `dither` applies to 16 -> 8 and float -> 8. Polls every 64th row.
  virtual void CopyRectPossiblyDifferentBitdepth(const ZR_World* src, const GX_LRect& rect, bool dither, i32 dst_x,
                                                 i32 dst_y, ZR_ProgressInfo* progress) = 0;
  // To (0, 0), even rows for field 1, odd for 2, else all; conversions to 8 bits are dithered.
  virtual void CopyRectPossiblyDifferentBitdepthWithField(const ZR_World* src, const GX_LRect& rect, i32 field) = 0;
  // Someone wrote past the last pixel of an owned plain frame.
  virtual bool SubWorldSafetyGutterHasBeenOverWritten() const = 0;
  virtual void ReleaseOwnership() = 0;  // the pixels now belong to the caller

  // Each returns a new world, to be deleted by the caller; null only when operator new gave null.
  static ZR_World* New(i32 width, i32 height, i16 depth, i32 flags);
  static ZR_World* New(const GX_LRect& rect, i16 depth, i32 flags);
  static ZR_World* NewMatchingWorld(const ZR_World* like, i32 flags);
  static ZR_World* NewReference(ZR_World* parent, const GX_LRect& rect);
  static ZR_World* NewReference(ZR_World* parent, const GX_Rect& rect);
  static ZR_World* NewReference(RS_World** raster);
  static ZR_World* NewReference(RS_World** raster, const GX_Rect& rect);
  static ZR_World* NewReference(ZR_LayerDef* layer);
  static ZR_World* NewReference(void* data, i32 width, i32 height, i16 depth, i32 row_bytes);

  bool HasRSWorld() const { return raster != nullptr; }
  RS_World** GetRSWorld() const;                             // throws 513 without one
  void CopyWorld(const ZR_World* src);                       // CopyRect of all of src to (0, 0)
  void ShrinkToSubRect(const GX_LRect& rect);                // throws 3 outside the world, or on a raster frame
  void ReReference(ZR_World* parent, const GX_LRect& rect);  // throws 3; for worlds that own nothing
  void FillOutEffectWorld(ZR_LayerDef* out) const;           // a plain record of this world; null: nothing
  bool RefersTo(const ZR_World* other) const;                // this reference's first pixel lies in `other`

  // Where the top left pixel lies among the worlds of a filter; (0, 0) in a new world. Only the blurs read it.
  GX_LPoint origin = {0, 0};

 protected:
  ZR_World() : ZR_LayerDef{} {}
};

// The three concrete worlds; T is ZR_Pixel8, ZR_Pixel16 or ZR_PixelFloat.
template <class T>
class ZR_API ZR_WorldX final : public ZR_World {
 public:
  ZR_WorldX(i32 width, i32 height, i32 flags);         // allocates; each side 1..30000, else 516
  ZR_WorldX(ZR_WorldX* parent, const GX_LRect& rect);  // sub-world; the rectangle is not checked
  ZR_WorldX(RS_World** raster, const GX_Rect* rect);   // view of a frame; null: all of it
  ZR_WorldX(void* data, i32 width, i32 height, i32 row_bytes);
  // Wraps a plain record on the stack: seven fields are copied, nothing is allocated or freed.
  // With keep_layer false the world's own record is zeroed first.
  ZR_WorldX(ZR_LayerDef* layer, bool keep_layer);
  ~ZR_WorldX() override;  // leaves ZR_DeadTag in dispose_tag

  i16 GetBitDepth() const override { return static_cast<i16>(zr::Depth<T>::bits); }
  bool IsReference() const override { return allocation == 0; }
  void Clear(const GX_LRect* rect) override;
  void ClearExceptRect(const GX_LRect& rect) override;
  void Fill(const ZR_PixelFloat& colour, const GX_LRect* rect) override;
  void Fill(const ZR_Pixel16& colour, const GX_LRect* rect) override;
  void FillAlpha() override;
  void InvertAlpha() override;
  void Premultiply() override;
  void Unmultiply() override;
  void PremulColor(const ZR_Pixel16& colour) override;
  void UnmulColor(const ZR_Pixel16& colour) override;
  void CopyRect(const ZR_World* src, const GX_LRect& rect, i32 dst_x, i32 dst_y) override;
  void CopyRectPossiblyDifferentBitdepth(const ZR_World* src, const GX_LRect& rect, bool dither, i32 dst_x, i32 dst_y,
                                         ZR_ProgressInfo* progress) override;
  void CopyRectPossiblyDifferentBitdepthWithField(const ZR_World* src, const GX_LRect& rect, i32 field) override;
  bool SubWorldSafetyGutterHasBeenOverWritten() const override;
  void ReleaseOwnership() override;

  // Row y; any x or y is accepted, the caller stays inside.
  T* Row(i32 y) const { return reinterpret_cast<T*>(static_cast<char*>(data) + static_cast<ptrdiff_t>(y) * row_bytes); }
  T* At(i32 x, i32 y) const { return Row(y) + x; }

  u16 alloc_width = 0, alloc_height = 0;  // size at allocation, for the frame's size when it is freed
  u64 allocation = 0;                     // frame address; 1: owns `raster`; 0: owns nothing
};

extern template class ZR_WorldX<ZR_Pixel8>;
extern template class ZR_WorldX<ZR_Pixel16>;
extern template class ZR_WorldX<ZR_PixelFloat>;

// Depth of a plain record: its owner's, else by its format byte; an unknown byte reports the failed
// verification "Unknown pixel format" and counts as 8.
ZR_API i32 ZRp_WorldDepth(const ZR_LayerDef* layer);

// Worlds and chunks alive now; informative, not atomic.
ZR_API extern i32 ZR_G_LiveWorlds, ZR_G_LiveChunks;
// Result of the latest new world that a plug-in asked for through the callback block; for hosts.
ZR_API extern i32 ZR_G_LastWorldStatus;
