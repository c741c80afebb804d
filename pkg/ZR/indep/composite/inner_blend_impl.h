// Row functions around one mode, of single numbers: with or without mask, and the wrapper that runs one in
// linear light. Included by the file of each depth, which instantiates them from the list of modes.
#pragma once

#include <ZR/composite.h>

#include <algorithm>
#include <memory>

#include "composite/linear_rows.h"
#include "composite/row_overlap.h"
#include "composite/row_only_modes.h"
#include "world/guard.h"

namespace zr {

// ------------------------------------------------------------------------------ all modes but those, by kind

template <class Mode, class T, bool masked>
void run_row(Mode, const Row<T, masked>& row) {
  using M = ModeMath<T>;
  const typename Row<T, masked>::Cover cover(row);
  const bool keep_alpha =
      Mode::kind == ModeKind::over && Mode::row_class == RowClass::plain && row.mode->keep_alpha != 0;
  for (i32 i = 0; i < row.n; ++i) {
    Px<M> s = unpacked<M>(row.src[i]);  // by value: the rows may be one row
    if constexpr (scales_source<Mode>) s = scaled<M>(s, [&](Wide<T> c) { return cover(c, i); });
    const Wide<T> A = scales_source<Mode> ? s.alpha : cover(s.alpha, i);
    if (passes_clear<Mode> && A == 0) continue;
    T& d = row.dst[i];
    const Channel<T> alpha = d.alpha;
    d = packed<T>(blend_in_row<Mode>(s, A, unpacked<M>(d)));
    if (keep_alpha) d.alpha = alpha;
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
const InnerRows<T>& single_rows() {
  static constexpr InnerRows<T> rows = [] {
    InnerRows<T> functions{};
    for_each_mode([&]<class Mode>() { functions[Mode::number - first_mode] = &inner_row<T, Mode, masked>; });
    return functions;
  }();
  return rows;
}

// ------------------------------------------------------------------------------ in linear light

// Copies of n pixels at the working depth: source, destination, and mask where its alpha differs there.
template <class T>
struct LinearCopies {
  Linear<T>*source, *destination, *mask;
};

// Runs `main` of the working depth over converted copies of n pixels.
template <class T>
i32 blend_copies(ZR_InnerBlendingFunc<Linear<T>> main, i32 n, const ZR_BlendingMode<Linear<T>>& mode,
                 const ZR_LinearBlendingTables& tables, const LinearCopies<T>& copies, const T* src, const T* mask,
                 T* dst) {
  to_linear_row(n, src, copies.source, tables);
  to_linear_row<T>(n, dst, copies.destination, tables);
  const Linear<T>* cover = nullptr;
  if constexpr (std::is_same_v<T, Linear<T>>) {
    cover = mask;  // alpha is the same in linear light, and nothing else of a mask is read
  } else if (mask != nullptr) {
    for (i32 i = 0; i < n; ++i)
      copies.mask[i] = {static_cast<Channel<Linear<T>>>(linear_amount<T>(mask[i].alpha)), 0, 0, 0};
    cover = copies.mask;
  }
  const i32 error = main(n, &mode, nullptr, copies.source, cover, copies.destination);
  if (error == 0) from_linear_row(n, copies.destination, dst, tables);
  return error;
}

// Pieces of a row go through copies on the stack. Where the pieces hang together, because rows overlap or lots are
// drawn along the row, it goes as a whole through copies that live as long as the call: only there a row allocates.
template <class T>
i32 in_linear_light(ZR_InnerBlendingFunc<Linear<T>> main, i32 n, const ZR_BlendingMode<T>* mode,
                    const ZR_LinearBlendingTables* tables, const T* src, const T* mask, T* dst) {
  return guarded([&]() -> i32 {
    if (tables == nullptr) return failed_verification(ZR_Site_LinearTables, "Invalid tables for linearized blending");
    if (n < 1) return 0;
    ZR_BlendingMode<Linear<T>> record;
    record.mode = mode->mode;
    record.seed = mode->seed;
    record.opacity = static_cast<Channel<Linear<T>>>(linear_amount<T>(mode->opacity));
    record.keep_alpha = mode->keep_alpha;

    constexpr i32 piece = 256;
    const bool one_by_one =
        mode->mode != XferDissolve && rows_apart(n, src, dst) && (mask == nullptr || rows_apart(n, mask, dst));
    if (one_by_one) {
      Linear<T> source[piece], destination[piece], cover[piece];
      for (i32 i = 0; i < n; i += piece) {
        const i32 error = blend_copies<T>(main, std::min(n - i, piece), record, *tables, {source, destination, cover},
                                          src + i, mask != nullptr ? mask + i : nullptr, dst + i);
        if (error != 0) fail(error);
      }
      return 0;
    }
    const auto count = static_cast<std::size_t>(n);
    const auto copy = [count] { return std::make_unique_for_overwrite<Linear<T>[]>(count); };
    const auto source = copy(), destination = copy();
    const auto cover = mask != nullptr && !std::is_same_v<T, Linear<T>> ? copy() : nullptr;
    const i32 error =
        blend_copies<T>(main, n, record, *tables, {source.get(), destination.get(), cover.get()}, src, mask, dst);
    if (error != 0) fail(error);
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
  template const zr::InnerRows<T>& zr::single_rows<T, false>();                                          \
  template const zr::InnerRows<T>& zr::single_rows<T, true>();                                           \
  template ZR_API i32 ZR_GetInnerBlendingFunc<T, false, false>(i32 mode, ZR_InnerBlendingFunc<T> * out); \
  template ZR_API i32 ZR_GetInnerBlendingFunc<T, false, true>(i32 mode, ZR_InnerBlendingFunc<T> * out);  \
  template ZR_API i32 ZR_GetInnerBlendingFunc<T, true, false>(i32 mode, ZR_InnerBlendingFunc<T> * out);  \
  template ZR_API i32 ZR_GetInnerBlendingFunc<T, true, true>(i32 mode, ZR_InnerBlendingFunc<T> * out);
