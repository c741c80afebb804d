// One labelled picture of every transfer mode, made by the modes themselves.
#include "gallery.h"

#include <ZR/transfer_mode.h>

#include <algorithm>
#include <string>

#include "fit_image.h"
#include "interrupt_state.h"
#include "lettering.h"
#include "mode_names.h"

namespace zr::tool {
namespace {

// Pixels.
constexpr i32 kColumns = 9, kCellWidth = 216, kCellHeight = 150, kGap = 18, kMargin = 36, kLabel = 34, kTitle = 64;
constexpr i32 kLetterHeight = 10, kTitleHeight = 22, kChecker = 10;
constexpr i32 kReach = 140;  // of either picture into the cell
constexpr i32 kSoft = 36;    // of that, the soft edge
constexpr ZR_Pixel8 kPage{255, 24, 26, 31}, kInk{255, 232, 232, 228}, kFaintInk{255, 128, 132, 142};
constexpr ZR_Pixel8 kLightSquare{255, 92, 94, 100}, kDarkSquare{255, 74, 76, 82};

i32 row_count() { return (static_cast<i32>(all_modes().size()) + 2 + kColumns - 1) / kColumns; }
i32 page_width() { return 2 * kMargin + kColumns * kCellWidth + (kColumns - 1) * kGap; }
i32 page_height() { return kMargin + kTitle + row_count() * (kCellHeight + kLabel) + kMargin / 2; }

void composite(OwnedWorld& source, i32 transfer_mode, i32 x, i32 y, OwnedWorld& target) {
  const ZR_CompositeModePlus mode(transfer_mode, 1.0f, nullptr, false, 0);
  const GX_LRect all = source.bounds();
  check(ZR_TransferRect(&abort_on_interrupt(), 1, 0, 0, &all, source.layer(), &mode, nullptr, nullptr, x, y,
                        target.layer()),
        "compositing the gallery");
}

// Alpha falls to 0 over the soft edge; `inward` counts columns from the side where the picture is full.
void soften(OwnedWorld& cell, bool from_left) {
  for (i32 y = 0; y < cell.height(); ++y) {
    for (i32 x = 0; x < cell.width(); ++x) {
      const i32 inward = from_left ? x : cell.width() - 1 - x;
      const i32 cover = std::clamp((kReach - inward) * 255 / kSoft, 0, 255);
      u8& alpha = cell.row<ZR_Pixel8>(y)[x].alpha;
      alpha = static_cast<u8>(Depth<ZR_Pixel8>::mul(alpha, cover));
    }
  }
}

void draw_checker(OwnedWorld& cell) {
  for (i32 y = 0; y < cell.height(); ++y)
    for (i32 x = 0; x < cell.width(); ++x)
      cell.row<ZR_Pixel8>(y)[x] = (x / kChecker + y / kChecker) % 2 == 0 ? kLightSquare : kDarkSquare;
}

class Page {
 public:
  Page() : world_(page_width(), page_height(), 8) {
    check(ZR_Fill(nullptr, &kPage, nullptr, world_.layer()), "drawing the gallery");
    draw_text(world_, "ZR transfer modes", kMargin, kMargin, kTitleHeight, kInk);
  }
  void add(OwnedWorld& picture, const std::string& name, const std::string& number) {
    const i32 x = kMargin + index_ % kColumns * (kCellWidth + kGap);
    const i32 y = kMargin + kTitle + index_ / kColumns * (kCellHeight + kLabel);
    OwnedWorld cell(kCellWidth, kCellHeight, 8);
    draw_checker(cell);
    composite(picture, XferInFront, 0, 0, cell);
    composite(cell, XferCopy, x, y, world_);
    draw_text(world_, name, x + 1, y + kCellHeight + 7, kLetterHeight, kInk);
    draw_text(world_, number, x + kCellWidth - 1 - text_width(number, kLetterHeight), y + kCellHeight + 7,
              kLetterHeight, kFaintInk);
    ++index_;
  }
  OwnedWorld take() { return std::move(world_); }

 private:
  OwnedWorld world_;
  i32 index_ = 0;
};

}  // namespace

OwnedWorld draw_gallery(const OwnedWorld& base_picture, const OwnedWorld& layer_picture) {
  OwnedWorld base = fit_image(base_picture, kCellWidth, kCellHeight);
  OwnedWorld layer = fit_image(layer_picture, kCellWidth, kCellHeight);
  soften(base, true);
  soften(layer, false);
  Page page;
  page.add(base, "base", "");
  page.add(layer, "layer", "");
  for (const ModeName& mode : all_modes()) {
    stop_if_interrupted();
    OwnedWorld cell(kCellWidth, kCellHeight, 8);
    composite(base, XferCopy, 0, 0, cell);
    composite(layer, mode.number, 0, 0, cell);
    page.add(cell, mode.name, std::to_string(mode.number));
  }
  return page.take();
}

u64 gallery_bytes() { return static_cast<u64>(page_width()) * static_cast<u64>(page_height()) * 8; }

}  // namespace zr::tool
