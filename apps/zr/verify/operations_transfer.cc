// Every transfer mode: rows of rectangles, with masks, in linear light, and single pixels.
#include <ZR/transfer_mode.h>

#include <span>

#include "verify/depth_calls.h"
#include "verify/operation.h"

namespace zr::tool {
namespace {

constexpr i32 kHeight = 13;
constexpr i32 kSeed = 4711;

struct Transfer {
  ZR_CompositeModePlus mode;
  const ZR_LinearBlendingTables* tables = nullptr;
  const ZR_MaskWorld* mask = nullptr;
  i32 field = 0;
};

template <class T>
i32 transfer(const Transfer& how, Canvas<T>& src, const GX_LRect& rect, i32 x, i32 y, Canvas<T>& dst) {
  return ZR_TransferRect(nullptr, 1, 0, how.field, &rect, &src, &how.mode, how.tables, how.mask, x, y, &dst);
}

// The whole picture over a mixed and an opaque one, and rows of every length up to two vectors of bytes.
template <class T>
void over_pictures(Digest& digest, Content content, const Transfer& how) {
  Canvas<T> src(odd_width, kHeight, content, 20);
  for (const Content under : {content, Content::opaque}) {
    Canvas<T> dst(odd_width, kHeight, under, 21);
    digest.number(transfer(how, src, src.all(), 0, 0, dst));
    dst.digest(digest);
  }
}
template <class T>
void over_short_rows(Digest& digest, Content content, const Transfer& how) {
  constexpr i32 widths[] = {1, 2, 3, 4, 5, 7, 8, 9, 15, 16, 17, 31, 33};
  Canvas<T> src(odd_width, kHeight, content, 22), dst(odd_width, kHeight, content, 23);
  i32 y = 0;
  for (const i32 width : widths) {
    digest.number(transfer(how, src, {y, y, y + width, y + 1}, 2 * y, y, dst));
    ++y;
  }
  dst.digest(digest);
}

template <class T>
void transfer_plain(Digest& digest, i32 mode, Content content) {
  over_pictures<T>(digest, content, {{mode, 1.0f, nullptr, false, kSeed}});
  over_short_rows<T>(digest, content, {{mode, 1.0f, nullptr, false, kSeed}});
  over_pictures<T>(digest, content, {{mode, 0.6f, nullptr, false, kSeed}});
  over_pictures<T>(digest, content, {{mode, 0.8f, nullptr, true, kSeed}, nullptr, nullptr, 1});
  over_pictures<T>(digest, content, {{mode, 0.0f, nullptr, false, kSeed}, nullptr, nullptr, 2});
}

template <class T>
ZR_MaskWorld mask_of(Canvas<T>& picture, u32 kind, i32 x, i32 y) {
  ZR_MaskWorld mask{};
  picture->FillOutEffectWorld(&mask.world);
  mask.offset_x = x;
  mask.offset_y = y;
  mask.kind = kind;
  return mask;
}

template <class T>
void transfer_masked(Digest& digest, i32 mode, Content content, const ZR_LinearBlendingTables* tables) {
  Canvas<T> picture(odd_width, kHeight, content, 24);
  for (u32 kind = 0; kind < 4; ++kind) {
    const i32 shift = static_cast<i32>(kind) * 3;
    const ZR_MaskWorld mask = mask_of(picture, kind, shift, shift / 3);
    over_pictures<T>(digest, content, {{mode, kind == 1 ? 0.7f : 1.0f, nullptr, kind == 2, kSeed}, tables, &mask});
  }
}

template <class T>
void transfer_linear(Digest& digest, i32 mode, Content content) {
  const ZR_LinearBlendingTables* const tables = &square_tables();
  over_pictures<T>(digest, content, {{mode, 1.0f, nullptr, false, kSeed}, tables});
  over_short_rows<T>(digest, content, {{mode, 0.6f, nullptr, false, kSeed}, tables});
  transfer_masked<T>(digest, mode, content, tables);
}

template <class T>
void single_pixels(Digest& digest, i32 mode, Content content) {
  constexpr const ZR_LinearBlendingTables* stored = nullptr;
  const auto plain = pick<T>(&ZR_Get_Xfer1_table8, &ZR_Get_Xfer1_table16, &ZR_Get_Xfer1_tableF)(mode);
  const auto faint =
      pick<T>(&ZR_Get_Xfer1_Opacity_table8, &ZR_Get_Xfer1_Opacity_table16, &ZR_Get_Xfer1_Opacity_tableF)(mode);
  const auto fainter =
      pick<T>(&ZR_Get_Xfer1_Opacity2_table8, &ZR_Get_Xfer1_Opacity2_table16, &ZR_Get_Xfer1_Opacity2_tableF)(mode);
  const T opacity = convert_colour<T>(ZR_PixelFloat{0.5f, 0.9f, 0, 0});
  for (const auto* tables : {stored, &square_tables()}) {
    Canvas<T> src(odd_width, 3, content, 25), dst(odd_width, 3, content, 26);
    for (i32 x = 0; x < odd_width; ++x) {
      if (plain != nullptr) plain(*src->At(x, 0), tables, dst->At(x, 0));
      if (faint != nullptr) faint(*src->At(x, 1), tables, opacity.alpha, dst->At(x, 1));
      if (fainter != nullptr) fainter(*src->At(x, 2), tables, opacity.alpha, opacity.red, dst->At(x, 2));
    }
    dst.digest(digest);
  }
}

}  // namespace

void add_transfer_operations(Operations& list) {
  i32 count = 0;
  const ZR_TransferModeInfo* const modes = ZR_ListTransferModes(&count);
  for (const ZR_TransferModeInfo& info : std::span(modes, static_cast<size_t>(count))) {
    const i32 mode = info.mode;
    const std::string name = info.short_name;
    add_all_with_hostile(list, "transfer/" + name, [mode]<class T>(Digest& digest, Content content) {
      transfer_plain<T>(digest, mode, content);
    });
    add_all_with_hostile(list, "transfer-mask/" + name, [mode]<class T>(Digest& digest, Content content) {
      transfer_masked<T>(digest, mode, content, nullptr);
    });
    add_all_with_hostile(list, "transfer-linear/" + name, [mode]<class T>(Digest& digest, Content content) {
      transfer_linear<T>(digest, mode, content);
    });
    if (mode < 0) continue;
    add_all_with_hostile(list, "pixel/" + name,
                         [mode]<class T>(Digest& digest, Content content) { single_pixels<T>(digest, mode, content); });
  }
}

}  // namespace zr::tool
