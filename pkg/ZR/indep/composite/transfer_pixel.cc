// The nine tables of per-pixel functions, generated from the list of modes.
#include <ZR/composite.h>

#include <array>

#include "composite/linear_light.h"
#include "composite/mode_kinds-inl.h"

namespace zr {
namespace {

// Kept out of line: the three opacity forms and linear light share one body for each mode and depth.
template <class T, class Mode>
[[gnu::noinline]] void blend_pixel(const T& s, Wide<T> A, T& d) {
  using M = ModeMath<T>;
  d = packed<T>(blend<Mode>(unpacked<M>(s), A, unpacked<M>(d)));
}

// `amount` are the opacities, applied one after the other with a rounding between.
template <class T>
Wide<T> under(Wide<T> c, auto... amount) {
  ((c = ModeMath<T>::mul(c, amount)), ...);
  return c;
}

template <class T, class Mode, class... Opacity>
void transfer(const T& s, const ZR_LinearBlendingTables* tables, T& d, Opacity... opacity) {
  if constexpr (scales_source<Mode>) {
    // In linear light the opacities work there too.
    const auto run = []<class Depth>(const Depth& source, Depth& onto, auto... amount) {
      using M = ModeMath<Depth>;
      const Depth whole =
          packed<Depth>(scaled<M>(unpacked<M>(source), [&](auto c) { return under<Depth>(c, amount...); }));
      blend_pixel<Depth, Mode>(whole, whole.alpha, onto);
    };
    if (tables == nullptr) {
      run(s, d, Wide<T>{opacity}...);
    } else {
      Linear<T> onto = to_linear(d, *tables);
      run(to_linear(s, *tables), onto, linear_amount<T>(opacity)...);
      d = from_linear<T>(onto, *tables);
    }
  } else {
    const Wide<T> A = under<T>(s.alpha, Wide<T>{opacity}...);
    if (A == 0) return;
    if (tables == nullptr) {
      blend_pixel<T, Mode>(s, A, d);
    } else {
      Linear<T> onto = to_linear(d, *tables);
      blend_pixel<Linear<T>, Mode>(to_linear(s, *tables), linear_amount<T>(A), onto);
      d = from_linear<T>(onto, *tables);
    }
  }
}

using Tables = ZR_LinearBlendingTables;
template <class T>
struct Plain {
  using Function = void (*)(T, const Tables*, T*);
  template <class Mode>
  static void run(T s, const Tables* tables, T* d) {
    transfer<T, Mode>(s, tables, *d);
  }
};
template <class T>
struct WithOpacity {
  using Function = void (*)(T, const Tables*, Channel<T>, T*);
  template <class Mode>
  static void run(T s, const Tables* tables, Channel<T> opacity, T* d) {
    transfer<T, Mode>(s, tables, *d, opacity);
  }
};
template <class T>
struct WithOpacity2 {
  using Function = void (*)(T, const Tables*, Channel<T>, Channel<T>, T*);
  template <class Mode>
  static void run(T s, const Tables* tables, Channel<T> opacity, Channel<T> opacity2, T* d) {
    transfer<T, Mode>(s, tables, *d, opacity, opacity2);
  }
};

// Modes that exist for rows only have no pixel function, and 41 to 43 stay null.
template <class Form>
constexpr auto table = [] {
  std::array<typename Form::Function, pixel_slots> functions{};
  for_each_mode([&]<class Mode>() {
    if constexpr (Mode::number >= 0) functions[Mode::number] = &Form::template run<Mode>;
  });
  return functions;
}();

constexpr u64 transfer_flags = 0x300120ff7b9;  // bit mode + 3

}  // namespace
}  // namespace zr

#define ZR_EIGHT(t, i) t[i], t[i + 1], t[i + 2], t[i + 3], t[i + 4], t[i + 5], t[i + 6], t[i + 7]
#define ZR_ALL_SLOTS(...)                                                                     \
  ZR_EIGHT((zr::table<zr::__VA_ARGS__>), 0), ZR_EIGHT((zr::table<zr::__VA_ARGS__>), 8),       \
      ZR_EIGHT((zr::table<zr::__VA_ARGS__>), 16), ZR_EIGHT((zr::table<zr::__VA_ARGS__>), 24), \
      ZR_EIGHT((zr::table<zr::__VA_ARGS__>), 32), zr::table<zr::__VA_ARGS__>[40], nullptr, nullptr, nullptr

constinit const ZR_Xfer1Func8 ZRp_G_Xfer1_table8[44] = {ZR_ALL_SLOTS(Plain<ZR_Pixel8>)};
constinit const ZR_Xfer1Func16 ZRp_G_Xfer1_table16[44] = {ZR_ALL_SLOTS(Plain<ZR_Pixel16>)};
constinit const ZR_Xfer1FuncF ZRp_G_Xfer1_tableF[44] = {ZR_ALL_SLOTS(Plain<ZR_PixelFloat>)};
constinit const ZR_Xfer1OpacityFunc8 ZRp_G_Xfer1_Opacity_table8[44] = {ZR_ALL_SLOTS(WithOpacity<ZR_Pixel8>)};
constinit const ZR_Xfer1OpacityFunc16 ZRp_G_Xfer1_Opacity_table16[44] = {ZR_ALL_SLOTS(WithOpacity<ZR_Pixel16>)};
constinit const ZR_Xfer1OpacityFuncF ZRp_G_Xfer1_Opacity_tableF[44] = {ZR_ALL_SLOTS(WithOpacity<ZR_PixelFloat>)};
constinit const ZR_Xfer1Opacity2Func8 ZRp_G_Xfer1_Opacity2_table8[44] = {ZR_ALL_SLOTS(WithOpacity2<ZR_Pixel8>)};
constinit const ZR_Xfer1Opacity2Func16 ZRp_G_Xfer1_Opacity2_table16[44] = {ZR_ALL_SLOTS(WithOpacity2<ZR_Pixel16>)};
constinit const ZR_Xfer1Opacity2FuncF ZRp_G_Xfer1_Opacity2_tableF[44] = {ZR_ALL_SLOTS(WithOpacity2<ZR_PixelFloat>)};
#undef ZR_ALL_SLOTS
#undef ZR_EIGHT

// No range check, as documented.
ZR_Xfer1Func8 ZR_Get_Xfer1_table8(i32 mode) { return ZRp_G_Xfer1_table8[mode]; }
ZR_Xfer1Func16 ZR_Get_Xfer1_table16(i32 mode) { return ZRp_G_Xfer1_table16[mode]; }
ZR_Xfer1FuncF ZR_Get_Xfer1_tableF(i32 mode) { return ZRp_G_Xfer1_tableF[mode]; }
ZR_Xfer1OpacityFunc8 ZR_Get_Xfer1_Opacity_table8(i32 mode) { return ZRp_G_Xfer1_Opacity_table8[mode]; }
ZR_Xfer1OpacityFunc16 ZR_Get_Xfer1_Opacity_table16(i32 mode) { return ZRp_G_Xfer1_Opacity_table16[mode]; }
ZR_Xfer1OpacityFuncF ZR_Get_Xfer1_Opacity_tableF(i32 mode) { return ZRp_G_Xfer1_Opacity_tableF[mode]; }
ZR_Xfer1Opacity2Func8 ZR_Get_Xfer1_Opacity2_table8(i32 mode) { return ZRp_G_Xfer1_Opacity2_table8[mode]; }
ZR_Xfer1Opacity2Func16 ZR_Get_Xfer1_Opacity2_table16(i32 mode) { return ZRp_G_Xfer1_Opacity2_table16[mode]; }
ZR_Xfer1Opacity2FuncF ZR_Get_Xfer1_Opacity2_tableF(i32 mode) { return ZRp_G_Xfer1_Opacity2_tableF[mode]; }

i32 ZR_GetTransferFlags(i32 mode) {
  if (mode < -3 || mode > 60) return 0;
  return static_cast<i32>((zr::transfer_flags >> (mode + 3)) & 1);
}
