// Guessing whether colours are premultiplied, and with which matte, by one pass over the pixels.
#include <ZR/alpha_guess.h>
#include <ZR/depth.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>

#include "filter/guess_rows.h"
#include "filter/raster_lock.h"
#include "world/guard.h"

namespace zr {
namespace {

constexpr i32 white = Depth<ZR_Pixel8>::white;

i32 apart(u8 a, u8 b) { return std::abs(a - b); }

// What a pass over the pixels notes.
class AlphaScan {
 public:
  // By lanes where runs are long; pixel by pixel the result is the same.
  void row(const ZR_Pixel8* row, i32 n, const GuessRuns* runs) {
    i32 i = 0, patience = 0;
    while (i < n) {
      pixel(row[i++]);
      if (runs == nullptr || --patience > 0) continue;
      const i32 length = run(row + i, n - i, *runs);
      i += length;
      // Where pixels of both kinds mix, looking for runs costs more than it finds.
      patience = length == 0 ? 16 : 0;
    }
  }

  // What a pass over the rows behind these has noted.
  void append(const AlphaScan& next) {
    if (next.clear_ > 0) {
      clear_colours_vary_ =
          clear_colours_vary_ || next.clear_colours_vary_ || (clear_ > 0 && are_apart(next.first_clear_, last_clear_));
      if (clear_ == 0) first_clear_ = next.first_clear_;
      last_clear_ = next.last_clear_;
    }
    if (next.covered_ > 0) {
      covered_colours_vary_ = covered_colours_vary_ || next.covered_colours_vary_ ||
                              (covered_ > 0 && differ(next.first_covered_, last_covered_));
      if (covered_ == 0) first_covered_ = next.first_covered_;
      if (covered_ == 0 || next.faintest_.alpha < faintest_.alpha) faintest_ = next.faintest_;
      last_covered_ = next.last_covered_;
    }
    colour_exceeds_alpha_ = colour_exceeds_alpha_ || next.colour_exceeds_alpha_;
    clear_ += next.clear_, clear_white_ += next.clear_white_, clear_black_ += next.clear_black_;
    covered_ += next.covered_;
    for (i32 c = 0; c < 3; ++c)
      for (i32 i = 0; i < 256; ++i) counts_[c][i] += next.counts_[c][i];
  }

  // One of the codes; the matte is stored with ZR_AlphaGuess_Premultiplied.
  ZR_AlphaGuess decide(ZR_Pixel8* matte) const {
    if (covered_ == 0) return ZR_AlphaGuess_Unknown;
    const ZR_Pixel8& s = faintest_;
    const i32 m = s.alpha;
    const auto premultiplied = [matte](u8 red, u8 green, u8 blue) {
      *matte = {static_cast<u8>(white), red, green, blue};
      return ZR_AlphaGuess_Premultiplied;
    };
    if (clear_ > 0 && clear_white_ == clear_ && white - s.red <= m && white - s.green <= m && white - s.blue <= m)
      return premultiplied(white, white, white);
    if (clear_ > 0 && clear_black_ == clear_ && !colour_exceeds_alpha_) return premultiplied(0, 0, 0);
    if (!clear_colours_vary_ && covered_colours_vary_) {
      const u8 red = peak(counts_[0]), green = peak(counts_[1]), blue = peak(counts_[2]);
      if (apart(red, s.red) <= m + 1 && apart(green, s.green) <= m + 1 && apart(blue, s.blue) <= m + 1)
        return premultiplied(red, green, blue);
    }
    return ZR_AlphaGuess_Straight;
  }

 private:
  static bool are_apart(const ZR_Pixel8& a, const ZR_Pixel8& b) {
    return apart(a.red, b.red) >= 3 || apart(a.green, b.green) >= 3 || apart(a.blue, b.blue) >= 3;
  }
  static bool differ(const ZR_Pixel8& a, const ZR_Pixel8& b) {
    return a.red != b.red || a.green != b.green || a.blue != b.blue;
  }
  void pixel(const ZR_Pixel8& p) {
    if (p.alpha == 0) {
      if (!clear_colours_vary_ && clear_ > 0 && are_apart(p, last_clear_)) clear_colours_vary_ = true;
      if (clear_ == 0) first_clear_ = p;
      count_clear(p, 1);
      last_clear_ = p;
    } else {
      if (!covered_colours_vary_ && covered_ > 0 && differ(p, last_covered_)) covered_colours_vary_ = true;
      if (covered_ == 0) first_covered_ = p;
      if (covered_ == 0 || p.alpha < faintest_.alpha) faintest_ = p;
      if (!colour_exceeds_alpha_ && (p.alpha < p.red || p.alpha < p.green || p.alpha < p.blue))
        colour_exceeds_alpha_ = true;
      ++covered_;
      last_covered_ = p;
    }
  }

  // Takes the run that goes on behind row[-1], which is counted; its length.
  i32 run(const ZR_Pixel8* row, i32 n, const GuessRuns& runs) {
    if (row[-1].alpha == 0) {
      const i32 length = runs.same(row, n);
      count_clear(row[-1], length);
      return length;
    }
    const i32 length = runs.covered(row, n, faintest_.alpha, &covered_colours_vary_, &colour_exceeds_alpha_);
    covered_ += length;
    last_covered_ = row[length - 1];
    return length;
  }

  void count_clear(const ZR_Pixel8& p, i32 pixels) {
    clear_ += pixels;
    if (p.red == white && p.green == white && p.blue == white) clear_white_ += pixels;
    if (p.red == 0 && p.green == 0 && p.blue == 0) clear_black_ += pixels;
    counts_[0][p.red] += pixels;
    counts_[1][p.green] += pixels;
    counts_[2][p.blue] += pixels;
  }

  // Of equal counts the lowest entry wins.
  static u8 peak(const i32 (&counts)[256]) {
    i32 best = 0;
    for (i32 i = 1; i < 256; ++i)
      if (counts[i] > counts[best]) best = i;
    return static_cast<u8>(best);
  }

  i32 counts_[3][256] = {};  // of the colours of transparent pixels
  i32 clear_ = 0, clear_white_ = 0, clear_black_ = 0, covered_ = 0;
  ZR_Pixel8 first_clear_{}, last_clear_{}, first_covered_{}, last_covered_{};
  ZR_Pixel8 faintest_{};  // the first of the smallest alpha above 0
  bool clear_colours_vary_ = false, covered_colours_vary_ = false, colour_exceeds_alpha_ = false;
};

// Bands of rows are scanned each for itself.
struct BandedScan {
  static constexpr i32 most_bands = 16;
  static constexpr i64 band_bytes = i64{1} << 19;

  explicit BandedScan(const ZR_WorldX<ZR_Pixel8>& of)
      : world(of),
        bands(static_cast<i32>(std::clamp<i64>(i64{of.width} * of.height * i64{sizeof(ZR_Pixel8)} / band_bytes, 1,
                                               std::clamp(of.height, 1, most_bands)))) {}
  void scan(i32 band) {
    const auto row_of = [&](i32 i) { return static_cast<i32>(i64{world.height} * i / bands); };
    AlphaScan scan;  // of this thread alone
    for (i32 y = row_of(band); y < row_of(band + 1); ++y) scan.row(world.Row(y), world.width, runs);
    scans[band] = scan;
  }

  const ZR_WorldX<ZR_Pixel8>& world;
  const i32 bands;
  const GuessRuns* const runs = lane_guess_runs();
  AlphaScan scans[most_bands];
};

i32 guess(const ZR_WorldX<ZR_Pixel8>& world, i32* code, ZR_Pixel8* matte) {
  BandedScan all(world);
  const i32 error = ZR_IterateGeneric(all.bands, &all, [](void* refcon, i32, i32 band, i32) -> i32 {
    static_cast<BandedScan*>(refcon)->scan(band);
    return ZR_Err_None;
  });
  if (error != 0) return error;
  for (i32 band = 1; band < all.bands; ++band) all.scans[0].append(all.scans[band]);
  *matte = {};
  *code = all.scans[0].decide(matte);
  return ZR_Err_None;
}

i32 wrong_depth() { return failed_verification(ZR_Site_GuessAlpha, "ZR_GuessAlpha only works on 8bpc worlds"); }

}  // namespace
}  // namespace zr

extern "C" {

i32 ZR_GuessAlpha(void*, ZR_LayerDef* world, RS_World** raster, i32* code, ZR_Pixel8* matte) {
  return zr::guarded([&]() -> i32 {
    if (code == nullptr || matte == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_GuessAlpha);
    if (world != nullptr) {
      if (ZRp_WorldDepth(world) != zr::Depth<ZR_Pixel8>::bits) return zr::wrong_depth();
      if (world->data == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_GuessAlpha);
      return zr::guess(ZR_WorldX<ZR_Pixel8>(world, false), code, matte);
    }
    const zr::RasterLock lock(raster);
    if (lock.error() != 0) return lock.error();
    if (ZR_DepthOfRSWorld(raster) != zr::Depth<ZR_Pixel8>::bits) return zr::wrong_depth();
    return zr::guess(ZR_WorldX<ZR_Pixel8>(raster, nullptr), code, matte);
  });
}

i32 ZR_GuessAlphaMessage(void* ref, ZR_LayerDef* world, RS_World** raster, i32* code, ZR_Pixel8* matte,
                         char message[256]) {
  constexpr size_t message_bytes = 256;
  if (message != nullptr) message[0] = '\0';
  const i32 error = ZR_GuessAlpha(ref, world, raster, code, matte);
  if (error != 0 || *code != ZR_AlphaGuess_Unknown || message == nullptr) return error;
  const char* const text = HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_CannotGuessAlpha, 0, 0);
  if (text != nullptr) std::snprintf(message, message_bytes, "%s", text);
  return ZR_Err_None;
}

}  // extern "C"
