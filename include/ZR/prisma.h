// Profiles, profile pools and transforms: the colour engine as hosts and the library's colour code see it.
//
// The engine is reached through procedure tables that ZR_Birth binds and ZR_Death lets go. Objects made
// before stay valid after; everything else fails then with PRISMA_Err_General.
//
// Failure  an i32 is thrown: a status below or ZR_Err_OutOfMemory. It has been reported before.
// Threads  profiles, pools and transforms may be shared; a TON_... object itself is a plain value.
#pragma once

#include <ZR/zr.h>

#include <boost/shared_ptr.hpp>

#include <cstring>
#include <string>
#include <utility>

// Four characters as the engine's words hold them: the first one in the highest byte.
constexpr u32 PRISMA_Word(const char (&text)[5]) {
  return static_cast<u32>(static_cast<u8>(text[0])) << 24 | static_cast<u32>(static_cast<u8>(text[1])) << 16 |
         static_cast<u32>(static_cast<u8>(text[2])) << 8 | static_cast<u32>(static_cast<u8>(text[3]));
}

// Statuses of engine calls; 0 is success and 4 (ZR_Err_OutOfMemory) memory.
enum PRISMA_Status : i32 {
  PRISMA_Err_General = 0x67656e20,                                 // "gen ": no engine, or it cannot say more
  PRISMA_Err_BadProfile = static_cast<i32>(PRISMA_Word("prof")),   // damaged, truncated or of an unusable kind
  PRISMA_Err_ColourSpace = static_cast<i32>(PRISMA_Word("spac")),  // another colour space is needed here
  PRISMA_Err_NoGamma = static_cast<i32>(PRISMA_Word("gama")),      // the profile has no tone curves of that form
  PRISMA_Err_BadParam = static_cast<i32>(PRISMA_Word("parm")),     // unknown code, intent, option or layout
  PRISMA_Err_File = static_cast<i32>(PRISMA_Word("file")),         // a file cannot be read
};

// Name of a profile: a digest of its bytes, so the same in every process.
struct _t_PRISMA_ID {
  u8 bytes[16];
  friend bool operator==(const _t_PRISMA_ID& a, const _t_PRISMA_ID& b) {
    return std::memcmp(a.bytes, b.bytes, sizeof a.bytes) == 0;
  }
};
inline constexpr _t_PRISMA_ID PRISMA_EmptyProfile_ID{};

// Profiles that the engine makes by itself.
enum PRISMA_ProfileCode : u32 {
  PRISMA_Profile_sRGB = PRISMA_Word("sRGB"),
  PRISMA_Profile_LinearSRGB = PRISMA_Word("lRGB"),
  PRISMA_Profile_DisplayP3 = PRISMA_Word("dsP3"),
  PRISMA_Profile_LinearDisplayP3 = PRISMA_Word("liP3"),
  PRISMA_Profile_Rec709 = PRISMA_Word("r709"),
  PRISMA_Profile_Rec2020 = PRISMA_Word("2020"),
  PRISMA_Profile_LinearRec2020 = PRISMA_Word("li20"),
  PRISMA_Profile_AdobeRGB = PRISMA_Word("aRGB"),
  PRISMA_Profile_LinearAdobeRGB = PRISMA_Word("liaR"),
  PRISMA_Profile_ProPhoto = PRISMA_Word("pPho"),
  PRISMA_Profile_LinearProPhoto = PRISMA_Word("lipP"),
  PRISMA_Profile_ACEScg = PRISMA_Word("AcCg"),
};

// Rendering intents, numbered as in profiles.
enum PRISMA_Intent : i32 {
  PRISMA_Intent_Perceptual = 0,
  PRISMA_Intent_RelativeColorimetric = 1,  // white to white, no black point compensation
  PRISMA_Intent_Saturation = 2,
  PRISMA_Intent_AbsoluteColorimetric = 3,  // the white of the source is kept
};

// A count and pairs of words.
struct PRISMA_Option {
  u32 tag, value;
};
struct PRISMA_Options {
  u32 count;  // 0..8
  PRISMA_Option pairs[8];
};
// 0: every pixel is computed at float precision. 1..99: what is no matrix and curves is first tabulated on
// a fine grid. 100: on a coarser one, which is made sooner and read faster.
inline constexpr u32 PRISMA_Option_Optimise = 0x6f70744c;
// Not 0: float values are clamped to 0..1 on their way in and out. A transform of several legs clamps its
// input by the first leg and its output by the last.
inline constexpr u32 PRISMA_Option_Clip = PRISMA_Word("clip");

ZR_API const PRISMA_Options& TON_GetDefaultPRISMAOptions();   // no tables, no clamping
ZR_API const PRISMA_Options& TON_GetFastPRISMAOptions();      // fine tables, clamping
ZR_API const PRISMA_Options& TON_GetOptimisePRISMAOptions();  // the record that asks for the fastest form

// Tone curves of an RGB profile as exponents.
struct PRISMA_CalRGB {
  f64 gamma[3];  // red, green, blue
};

// Pixel layouts by their four characters in memory order; pixels follow each other without gaps.
// All have four channels. RGB: the first channel, alpha, is neither read nor written; then red, green,
// blue. CMYK: the amounts of cyan, magenta, yellow and black ink stand where a world has alpha, red, green
// and blue; 0 is no ink, white's value is full ink.
constexpr u32 PRISMA_Layout(const char (&text)[5]) {
  return static_cast<u32>(static_cast<u8>(text[3])) << 24 | static_cast<u32>(static_cast<u8>(text[2])) << 16 |
         static_cast<u32>(static_cast<u8>(text[1])) << 8 | static_cast<u32>(static_cast<u8>(text[0]));
}
inline constexpr u32 PRISMA_Layout_RGB8 = PRISMA_Layout("bgrp");      // 0..255
inline constexpr u32 PRISMA_Layout_RGB16 = PRISMA_Layout("BGRP");     // 0..32768
inline constexpr u32 PRISMA_Layout_RGBFloat = PRISMA_Layout("BGRf");  // 0..1, unclamped
inline constexpr u32 PRISMA_Layout_CMYK8 = PRISMA_Layout("wymc");     // 0..255
inline constexpr u32 PRISMA_Layout_CMYK16 = PRISMA_Layout("KYMC");    // 0..32768

// The engine's own objects. Each begins with its count, so that whoever holds one can let it go.
struct PRISMAProfile;
struct PRISMATransform;
ZR_API void TON_PRISMA_Retain(PRISMAProfile*);
ZR_API void TON_PRISMA_Retain(PRISMATransform*);
ZR_API void TON_PRISMA_Release(PRISMAProfile*);
ZR_API void TON_PRISMA_Release(PRISMATransform*);

// Shared ownership of an engine object; may be empty.
template <class Object>
class TON_PRISMA_Ref {
 public:
  TON_PRISMA_Ref() = default;
  explicit TON_PRISMA_Ref(Object* taken) : object_(taken) {}  // takes over the caller's share
  TON_PRISMA_Ref(const TON_PRISMA_Ref& other) : object_(other.object_) {
    if (object_ != nullptr) TON_PRISMA_Retain(object_);
  }
  TON_PRISMA_Ref(TON_PRISMA_Ref&& other) noexcept : object_(std::exchange(other.object_, nullptr)) {}
  TON_PRISMA_Ref& operator=(TON_PRISMA_Ref other) noexcept {
    std::swap(object_, other.object_);
    return *this;
  }
  ~TON_PRISMA_Ref() {
    if (object_ != nullptr) TON_PRISMA_Release(object_);
  }
  Object* get() const { return object_; }
  explicit operator bool() const { return object_ != nullptr; }

 private:
  Object* object_ = nullptr;
};

// One profile. An empty one counts as damaged wherever a profile is needed.
class ZR_API TON_PRISMA_Profile {
 public:
  TON_PRISMA_Profile() = default;
  explicit TON_PRISMA_Profile(TON_PRISMA_Ref<PRISMAProfile> handle) : handle_(std::move(handle)) {}
  // From ICC data, which are copied; at most 64 MiB.
  TON_PRISMA_Profile(const void* data, size_t size);
  explicit TON_PRISMA_Profile(const char* path);
  explicit TON_PRISMA_Profile(PRISMA_ProfileCode code);

  PRISMAProfile* Get() const { return handle_.get(); }
  _t_PRISMA_ID GetID() const;
  // The ICC data; they live as long as a profile that shares them.
  const void* GetData(size_t* size) const;
  // "RGB ", "CMYK", "GRAY", "Lab " and so on, as PRISMA_Word gives them.
  u32 GetColourSpace() const;

 private:
  TON_PRISMA_Ref<PRISMAProfile> handle_;
};

// Values above 1 mean something in this profile: its tone curves are straight lines (scene-linear data)
// or it carries unbounded float tables.
ZR_API bool TON_PRISMA_Profile_IsOverRange(const TON_PRISMA_Profile& profile);
// The description, in English where there are several; may be empty.
ZR_API std::u16string TON_PRISMA_Profile_GetName(const TON_PRISMA_Profile& profile);
// The same primaries and white with straight tone curves; an already straight one is returned itself.
// PRISMA_Err_ColourSpace for what is not RGB, PRISMA_Err_NoGamma for RGB without primaries.
ZR_API boost::shared_ptr<TON_PRISMA_Profile> TON_PRISMA_GetLinearRGBProfile(
    const boost::shared_ptr<TON_PRISMA_Profile>& profile);
// sRGB; the same object until ZR_Death.
ZR_API boost::shared_ptr<TON_PRISMA_Profile> TON_PRISMA_GetDefaultProfile();
// Exponents of the tone curves. A curve that is no pure power is given by the power that fits it best, by
// least squares of the curve's values over 0..1. PRISMA_Err_ColourSpace, PRISMA_Err_NoGamma.
ZR_API PRISMA_CalRGB TON_PRISMA_GetCalRGB(const TON_PRISMA_Profile& profile);
// Profile of the monitor under a window of the desktop (an X11 window id, cast), or of the main monitor for
// null: the file that the preference "display.profile" names, else what the desktop states for its screen,
// else sRGB.
ZR_API TON_PRISMA_Profile TON_PRISMA_GetDisplayProfile(const void* window);

// From one device to another, or through several.
class ZR_API TON_PRISMA_Transform {
 public:
  TON_PRISMA_Transform() = default;
  explicit TON_PRISMA_Transform(TON_PRISMA_Ref<PRISMATransform> handle) : handle_(std::move(handle)) {}
  // Both profiles are RGB or CMYK, else PRISMA_Err_ColourSpace.
  TON_PRISMA_Transform(const TON_PRISMA_Profile& from, const TON_PRISMA_Profile& to, i32 intent,
                       const PRISMA_Options& options);
  // This one, then `next`, as one transform. It computes at the precision of its most exact part.
  TON_PRISMA_Transform Concatenate(const TON_PRISMA_Transform& next) const;
  TON_PRISMA_Transform Duplicate() const;
  TON_PRISMA_Transform Optimise(const PRISMA_Options& options) const;
  PRISMATransform* Get() const { return handle_.get(); }

 private:
  TON_PRISMA_Ref<PRISMATransform> handle_;
};

// Hands out pieces of work: calls fn(refcon, thread, i, pieces) for each i below pieces.
typedef i32 (*PRISMA_IterateFunc)(i32 pieces, void* refcon, i32 (*fn)(void* refcon, i32 thread, i32 i, i32 pieces));
// Takes `count` pixels through a transform; src may be dst when the layouts are of one size. Many pixels
// go out in bands through `iterate`, or stay on this thread when it is null. Returns the status.
ZR_API i32 TON_PRISMA_Apply(PRISMATransform* transform, u32 src_layout, const void* src, u32 dst_layout, void* dst,
                            size_t count, PRISMA_IterateFunc iterate);

// Keeps profiles alive and finds them by id. Any thread.
class ZR_API TON_PRISMA_ProfilePool {
 public:
  TON_PRISMA_ProfilePool();
  ~TON_PRISMA_ProfilePool();
  TON_PRISMA_ProfilePool(const TON_PRISMA_ProfilePool&) = delete;
  TON_PRISMA_ProfilePool& operator=(const TON_PRISMA_ProfilePool&) = delete;
  // The profile's id. Of profiles with one id the pool keeps the object that came first. An empty pointer
  // adds nothing and gives PRISMA_EmptyProfile_ID.
  _t_PRISMA_ID AddProfile(const boost::shared_ptr<TON_PRISMA_Profile>& profile);
  // Empty when there is none.
  boost::shared_ptr<TON_PRISMA_Profile> GetProfile(const _t_PRISMA_ID& id) const;

 private:
  struct Entries;
  Entries* entries_;
};

// Raises a failed engine call: reports it and throws the status. 0 returns.
ZR_API void TON_PRISMA_ETX(i32 status);
