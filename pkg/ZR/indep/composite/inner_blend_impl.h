// Row functions around one mode: with or without mask, and the wrapper that runs one in linear light.
// Included by the file of each depth, which instantiates them from the list of modes.
#pragma once

#include <ZR/composite.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <memory>

#include "composite/linear_light.h"
#include "composite/mode_kinds_impl.h"
#include "world/guard.h"

namespace zr {

template <class T>
using InnerRows = std::array<ZR_InnerBlendingFunc<T>, mode_rows>;  // index mode + 3; null at -1

// The row functions in stored values of one depth.
template <class T, bool masked>
const InnerRows<T>& inner_rows();

// ------------------------------------------------------------------------------ one row

template <class T, bool masked>
struct Row {
  i32 n;
  const ZR_BlendingMode<T>* mode;
  const T* src;
  const T* mask;
  T* dst;

  // A source channel under opacity and mask; of the alpha, the effective alpha.
  class Cover {
   public:
    explicit Cover(const Row& row) : opacity_(row.mode->opacity), mask_(row.mask) {}
    Wide<T> operator()(Wide<T> c, i32 i) const {
      if constexpr (masked)
        return ModeMath<T>::covered(c, opacity_, mask_[i].alpha);
      else
        return ModeMath<T>::mul(c, opacity_);
    }

   private:
    Wide<T> opacity_;
    const T* mask_;
  };
};

// Calls body(source pixel, A, destination pixel) where A is not zero.
template <class T, bool masked, class Body>
[[gnu::always_inline]] inline void each_covered(const Row<T, masked>& row, Body&& body) {
  const typename Row<T, masked>::Cover cover(row);
  for (i32 i = 0; i < row.n; ++i) {
    const T s = row.src[i];  // by value: the rows may be one row
    const Wide<T> A = cover(s.alpha, i);
    if (A != 0) body(s, A, row.dst[i]);
  }
}

template <class T>
void copy_colour(const T& s, T& d) {
  d.red = s.red;
  d.green = s.green;
  d.blue = s.blue;
}

// ------------------------------------------------------------------------------ modes with rows of their own

template <class T, bool masked>
void run_row(Copy, const Row<T, masked>& row) {
  if (row.mode->keep_alpha != 0) {
    for (i32 i = 0; i < row.n; ++i) copy_colour(row.src[i], row.dst[i]);
  } else if (!masked && row.mode->opacity == Depth<T>::white) {
    if (row.n > 0) std::memmove(row.dst, row.src, static_cast<std::size_t>(row.n) * sizeof(T));
  } else {
    const typename Row<T, masked>::Cover cover(row);
    for (i32 i = 0; i < row.n; ++i) {
      const T s = row.src[i];
      row.dst[i] = {store<T>(cover(s.alpha, i)), s.red, s.green, s.blue};
    }
  }
}
template <class T, bool masked>
void run_row(CopyFast, const Row<T, masked>& row) {
  run_row(Copy{}, row);
}

// Reads neither opacity nor mode record, and a mask in either variant; without one it counts as white.
template <class T, bool masked>
void run_row(MatteMix, const Row<T, masked>& row) {
  using M = ModeMath<T>;
  for (i32 i = 0; i < row.n; ++i) {
    const T s = row.src[i];
    T& d = row.dst[i];
    const Wide<T> k = row.mask != nullptr ? Wide<T>{row.mask[i].alpha} : M::white;
    if (k == M::white) {
      d = s;
    } else if (k != 0) {
      const auto p = M::product(s.alpha, k);
      const auto q = M::product(M::inv(k), d.alpha);
      const auto t = p + q;
      if (t == 0) continue;
      d = {store<T>(M::mix_alpha(t)), store<T>(M::mix(s.red, p, d.red, q, t)),
           store<T>(M::mix(s.green, p, d.green, q, t)), store<T>(M::mix(s.blue, p, d.blue, q, t))};
    }
  }
}

// A lot is drawn only under a partial alpha, but the seed steps on with every pixel.
template <class T, bool masked>
void run_row(Dissolve, const Row<T, masked>& row) {
  using M = ModeMath<T>;
  const typename Row<T, masked>::Cover cover(row);
  const bool keep_alpha = row.mode->keep_alpha != 0;
  u32 seed = static_cast<u32>(row.mode->seed);
  for (i32 i = 0; i < row.n; ++i, ++seed) {
    const T s = row.src[i];
    const Wide<T> A = cover(s.alpha, i);
    bool wins = A >= M::white;
    if (!wins && A > 0) wins = M::dissolves(ZR_Rand(&seed), A);
    if (!wins) continue;
    copy_colour(s, row.dst[i]);
    if (!keep_alpha) row.dst[i].alpha = store<T>(M::white);
  }
}

// Also the first pass of the colour modes.
template <class T, bool masked>
void run_row(Behind, const Row<T, masked>& row) {
  const bool keep_alpha = row.mode->keep_alpha != 0;
  each_covered(row, [keep_alpha](const T& s, Wide<T> A, T& d) {
    const auto alpha = d.alpha;
    Behind::pixel(s, A, d);
    if (keep_alpha) d.alpha = alpha;
  });
}

// ------------------------------------------------------------------------------ all others, by kind

template <class M, class Mode>
[[gnu::always_inline]] inline auto row_full(auto s, auto d) {
  if constexpr (requires { Mode::template row_full<M>(s, d); })
    return Mode::template row_full<M>(s, d);
  else
    return Mode::template full<M>(s, d);
}

template <class Mode, class T, bool masked>
void run_row(Mode, const Row<T, masked>& row) {
  using M = ModeMath<T>;
  if constexpr (Mode::row_class == RowClass::black_ground || Mode::row_class == RowClass::white_ground ||
                Mode::row_class == RowClass::grey_ground) {
    // The destination row has been faded; other passes see to alpha.
    each_covered(row, [](const T& s, Wide<T> A, T& d) {
      if (A == M::white)
        each_colour(s, d, [](Wide<T> sc, Wide<T> dc) { return row_full<M, Mode>(sc, dc); });
      else
        each_colour(s, d, [A](Wide<T> sc, Wide<T> dc) { return Mode::template partial<M>(sc, A, dc); });
    });
  } else if constexpr (Mode::kind == ModeKind::colour) {
    // The first pass has composited the source behind: lumas are compared after it, not before.
    each_covered(row, [](const T& s, Wide<T> A, T& d) {
      if (recolours<T, Mode>(s, d)) recolour<T, Mode>(s, A, d);
    });
  } else if constexpr (Mode::kind == ModeKind::alpha_only) {
    // On every pixel: a clear source makes alpha 0 too.
    const typename Row<T, masked>::Cover cover(row);
    for (i32 i = 0; i < row.n; ++i) {
      const T s = row.src[i];
      blend<T, Mode>(s, cover(s.alpha, i), row.dst[i]);
    }
  } else if constexpr (scales_source<Mode>) {
    const typename Row<T, masked>::Cover cover(row);
    for (i32 i = 0; i < row.n; ++i) {
      const T s = scaled(row.src[i], [&](auto c) { return cover(c, i); });
      blend<T, Mode>(s, s.alpha, row.dst[i]);
    }
  } else {
    each_covered(row, [](const T& s, Wide<T> A, T& d) { blend<T, Mode>(s, A, d); });
  }
}

template <class T, class Mode, bool masked>
i32 inner_row(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables*, const T* src, const T* mask,
              T* dst) {
  if (masked && mask == nullptr)  // no mask is a mask that is open everywhere
    run_row(Mode{}, Row<T, false>{n, mode, src, nullptr, dst});
  else
    run_row(Mode{}, Row<T, masked>{n, mode, src, mask, dst});
  return 0;
}

template <class T, bool masked>
const InnerRows<T>& inner_rows() {
  static constexpr InnerRows<T> rows = [] {
    InnerRows<T> functions{};
    for_each_mode([&]<class Mode>() { functions[Mode::number - first_mode] = &inner_row<T, Mode, masked>; });
    return functions;
  }();
  return rows;
}

// ------------------------------------------------------------------------------ in linear light

// Runs `main` of the working depth over converted copies of the rows. Only here does a row allocate: the
// copies live as long as the call.
template <class T>
i32 in_linear_light(ZR_InnerBlendingFunc<Linear<T>> main, i32 n, const ZR_BlendingMode<T>* mode,
                    const ZR_LinearBlendingTables* tables, const T* src, const T* mask, T* dst) {
  return guarded([&]() -> i32 {
    if (tables == nullptr) return failed_verification(ZR_Site_LinearTables, "Invalid tables for linearized blending");
    if (n < 1) return 0;
    const auto count = static_cast<std::size_t>(n);
    const auto converted = [&](const T* row) {
      auto copy = std::make_unique_for_overwrite<Linear<T>[]>(count);
      for (std::size_t i = 0; i < count; ++i) copy[i] = to_linear(row[i], *tables);
      return copy;
    };
    const auto source = converted(src);
    const auto destination = converted(dst);

    std::unique_ptr<Linear<T>[]> mask_copy;
    const Linear<T>* linear_mask = nullptr;
    if constexpr (std::is_same_v<T, Linear<T>>) {
      linear_mask = mask;  // alpha is the same in linear light, and nothing else of a mask is read
    } else if (mask != nullptr) {
      mask_copy = std::make_unique_for_overwrite<Linear<T>[]>(count);
      for (std::size_t i = 0; i < count; ++i)
        mask_copy[i] = {store<Linear<T>>(linear_amount<T>(mask[i].alpha)), 0, 0, 0};
      linear_mask = mask_copy.get();
    }

    ZR_BlendingMode<Linear<T>> record;
    record.mode = mode->mode;
    record.seed = mode->seed;
    record.opacity = store<Linear<T>>(linear_amount<T>(mode->opacity));
    record.keep_alpha = mode->keep_alpha;
    const i32 error = main(n, &record, nullptr, source.get(), linear_mask, destination.get());
    if (error != 0) fail(error);
    for (std::size_t i = 0; i < count; ++i) dst[i] = from_linear<T>(destination[i], *tables);
    return 0;
  });
}

template <class T, i32 number, bool masked>
i32 linear_row(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const T* src,
               const T* mask, T* dst) {
  return in_linear_light<T>(inner_rows<Linear<T>, masked>()[number - first_mode], n, mode, tables, src, mask, dst);
}

template <class T, bool masked>
constexpr InnerRows<T> linear_rows = [] {
  InnerRows<T> functions{};
  for_each_mode([&]<class Mode>() { functions[Mode::number - first_mode] = &linear_row<T, Mode::number, masked>; });
  return functions;
}();

}  // namespace zr

template <class T, bool masked, bool linear>
i32 ZR_GetInnerBlendingFunc(i32 mode, ZR_InnerBlendingFunc<T>* out) {
  const zr::InnerRows<T>& rows = [&]() -> const zr::InnerRows<T>& {
    if constexpr (linear)
      return zr::linear_rows<T, masked>;
    else
      return zr::inner_rows<T, masked>();
  }();
  const u32 row = static_cast<u32>(mode) - static_cast<u32>(zr::first_mode);
  if (row >= rows.size() || rows[row] == nullptr) {
    zr::report_string(ZR_Str_UnimplementedMode, ZR_Site_UnimplementedMode);
    return ZR_Err_UnimplementedMode;
  }
  *out = rows[row];
  return 0;
}

// What the file of a depth instantiates.
#define ZR_INSTANTIATE_INNER_BLENDS(T)                                                                   \
  template const zr::InnerRows<T>& zr::inner_rows<T, false>();                                           \
  template const zr::InnerRows<T>& zr::inner_rows<T, true>();                                            \
  template ZR_API i32 ZR_GetInnerBlendingFunc<T, false, false>(i32 mode, ZR_InnerBlendingFunc<T> * out); \
  template ZR_API i32 ZR_GetInnerBlendingFunc<T, false, true>(i32 mode, ZR_InnerBlendingFunc<T> * out);  \
  template ZR_API i32 ZR_GetInnerBlendingFunc<T, true, false>(i32 mode, ZR_InnerBlendingFunc<T> * out);  \
  template ZR_API i32 ZR_GetInnerBlendingFunc<T, true, true>(i32 mode, ZR_InnerBlendingFunc<T> * out);
