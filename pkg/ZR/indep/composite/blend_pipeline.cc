// The plan of a row and the five steps that run it.
#include <ZR/composite.h>

#include <algorithm>
#include <array>

#include "composite/ground_rows.h"
#include "composite/row_overlap.h"
#include "composite/transfer_modes-inl.h"
#include "world/guard.h"
#include "world/premul_rows.h"
#include "world/slot_table.h"

namespace zr {
namespace {

// Index mode + 3; mode -1 has no class.
struct KnownClass {
  bool known = false;
  RowClass row_class = RowClass::plain;
};
constexpr auto row_classes = [] {
  std::array<KnownClass, mode_rows> classes{};
  for_each_mode([&]<class Mode>() { classes[Mode::number - first_mode] = {true, Mode::row_class}; });
  return classes;
}();

constexpr char no_function[] = "Something went wrong attempting get the blending function.";

// What stands in a slot now; an empty one ends the construction.
template <ZR_SlotIndex S>
auto* filled_slot() {
  auto* const routine = slot<S>();
  if (routine == nullptr) fail(failed_verification(ZR_Site_EmptySlot, no_function));
  return routine;
}

// Of the four variants of a depth, by (tables given) + 2 * (mask given).
template <class T>
InnerBlendGetter<T>* getter(i32 index) {
  switch (index) {
    case 0: return filled_slot<DepthSlots<T>::inner>();
    case 1: return filled_slot<DepthSlots<T>::inner_linear>();
    case 2: return filled_slot<DepthSlots<T>::inner_mask>();
    case 3: return filled_slot<DepthSlots<T>::inner_mask_linear>();
    default: fail(failed_verification(ZR_Site_BlendDescriptor, no_function));
  }
}

}  // namespace
}  // namespace zr

template <class T>
ZR_BlendModeDescriptor<T>::ZR_BlendModeDescriptor(const ZR_BlendingMode<T>& mode_record, bool has_mask,
                                                  const ZR_LinearBlendingTables* linear_tables)
    : mode(mode_record), tables(linear_tables) {
  using Slots = zr::DepthSlots<T>;
  zr::InnerBlendGetter<T>* const get = zr::getter<T>((tables != nullptr ? 1 : 0) + (has_mask ? 2 : 0));
  get(mode.mode, &main);
  get(XferBehind, &first_pass);
  union_alpha = zr::filled_slot<Slots::union_alpha>();

  const u32 row = static_cast<u32>(mode.mode) - static_cast<u32>(zr::first_mode);
  if (row >= zr::row_classes.size() || !zr::row_classes[row].known) {
    zr::report_string(ZR_Str_UnimplementedMode, ZR_Site_BlendDescriptor);
    main = nullptr;
    return;
  }
  const auto on_ground = [this](ZR_RowFunc<T> to_ground, ZR_RowFunc<T> back) {
    fade = to_ground;
    unfade = back;
    use_fade = use_union_alpha = 1;
  };
  const zr::RowClass row_class = zr::row_classes[row].row_class;
  may_keep_alpha = row_class != zr::RowClass::plain;
  switch (row_class) {
    case zr::RowClass::plain:
    case zr::RowClass::self_contained: break;
    case zr::RowClass::black_ground:
      on_ground(zr::filled_slot<Slots::premul>(), zr::filled_slot<Slots::unmul>());
      break;
    case zr::RowClass::white_ground:
      on_ground(zr::filled_slot<Slots::white_fade>(), zr::filled_slot<Slots::white_unfade>());
      break;
    case zr::RowClass::grey_ground:
      on_ground(zr::filled_slot<Slots::grey_fade>(), zr::filled_slot<Slots::grey_unfade>());
      break;
    case zr::RowClass::colour: use_first_pass = 1; break;
  }
}

namespace zr {
namespace {

// The rows of our own that a class runs around its main function, of which one pass can take the place.
template <class T>
bool has_own_rows(const ZR_BlendModeDescriptor<T>& plan, RowClass row_class) {
  if (plan.union_alpha != &union_alpha_row<T> || plan.use_union_alpha == 0) return false;
  switch (row_class) {
    case RowClass::black_ground: return plan.fade == &premul_row<T> && plan.unfade == &unmul_row<T>;
    case RowClass::white_ground: return plan.fade == &white_fade_row<T> && plan.unfade == &white_unfade_row<T>;
    case RowClass::grey_ground: return plan.fade == &grey_fade_row<T> && plan.unfade == &grey_unfade_row<T>;
    default: return false;
  }
}

// The one pass in which this row can run, or null: no routine is another's, and the rows have nothing in common.
template <class T>
ZR_InnerBlendingFunc<T> one_pass(const ZR_BlendModeDescriptor<T>& plan, i32 n, const T* src, const T* mask,
                                 const T* dst) {
  const u32 row = static_cast<u32>(plan.mode.mode) - static_cast<u32>(first_mode);
  if (row >= row_classes.size() || !has_own_rows(plan, row_classes[row].row_class)) return nullptr;
  const bool own_main = plan.main == inner_rows<T, true>()[row] ||  // with no mask they are the same
                        (mask == nullptr && plan.main == inner_rows<T, false>()[row]);
  if (!own_main || plan.tables != nullptr || src == dst || !rows_apart(n, src, dst)) return nullptr;
  if (mask != nullptr && (mask == dst || !rows_apart(n, mask, dst))) return nullptr;
  return whole_ground_row<T>(static_cast<i32>(row));
}

// Several passes go over a piece of the row at a time, which stays in the nearest cache between them.
template <class T>
constexpr i32 piece_pixels = 8192 / sizeof(T);

template <class T>
i32 run_on_ground(const ZR_BlendModeDescriptor<T>& plan, i32 n, const T* src, const T* mask, T* dst) {
  if (const ZR_InnerBlendingFunc<T> whole = one_pass(plan, n, src, mask, dst))
    return whole(n, &plan.mode, nullptr, src, mask, dst);
  const bool in_pieces = rows_apart(n, src, dst) && (mask == nullptr || rows_apart(n, mask, dst));
  const i32 piece = in_pieces ? piece_pixels<T> : n;
  i32 error = 0;
  for (i32 i = 0; i < n && error == 0; i += piece) {
    const i32 count = std::min(n - i, piece);
    const T* const cover = mask != nullptr ? mask + i : nullptr;
    error = plan.fade(count, nullptr, dst + i);
    if (error == 0) error = plan.main(count, &plan.mode, plan.tables, src + i, cover, dst + i);
    if (error == 0 && plan.use_union_alpha != 0)
      error = plan.union_alpha(count, src + i, plan.mode.opacity, cover, dst + i);
    if (error == 0) error = plan.unfade(count, nullptr, dst + i);
  }
  return error;
}

}  // namespace
}  // namespace zr

template <class T>
i32 ZR_BlendPipeline(const ZR_ProgressInfo*, i32 n, const ZR_BlendModeDescriptor<T>* descriptor, const T* src,
                     const T* mask, zr::Channel<T>* scratch, T* dst) {
  const ZR_BlendModeDescriptor<T>& plan = *descriptor;
  if (plan.main == nullptr) return ZR_Err_UnimplementedMode;
  if (n < 1) return 0;

  const bool restores_alpha = plan.may_keep_alpha != 0 && plan.mode.keep_alpha != 0;
  if (restores_alpha)
    for (i32 i = 0; i < n; ++i) scratch[i] = dst[i].alpha;

  i32 error = 0;
  if (plan.use_fade != 0) {
    error = zr::run_on_ground(plan, n, src, mask, dst);
  } else {
    if (plan.use_first_pass != 0) error = plan.first_pass(n, &plan.mode, plan.tables, src, mask, dst);
    if (error == 0) error = plan.main(n, &plan.mode, plan.tables, src, mask, dst);
    if (error == 0 && plan.use_union_alpha != 0) error = plan.union_alpha(n, src, plan.mode.opacity, mask, dst);
  }

  if (error == 0 && restores_alpha)
    for (i32 i = 0; i < n; ++i) dst[i].alpha = scratch[i];
  return error;
}

#define ZR_INSTANTIATE(T)                                                                                          \
  template struct ZR_BlendModeDescriptor<T>;                                                                       \
  template ZR_API i32 ZR_BlendPipeline<T>(const ZR_ProgressInfo*, i32, const ZR_BlendModeDescriptor<T>*, const T*, \
                                          const T*, zr::Channel<T>*, T*);
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE
