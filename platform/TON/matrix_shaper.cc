// Tables and loops of the matrix and curves.
#include "TON/matrix_shaper.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace zr::prisma {
namespace {

bool same_curve(const cmsToneCurve* a, const cmsToneCurve* b) {
  const i32 form = cmsGetToneCurveParametricType(a);
  if (form != cmsGetToneCurveParametricType(b)) return false;
  if (form != 0) {
    const f64* const left = cmsGetToneCurveParams(a);
    const f64* const right = cmsGetToneCurveParams(b);
    constexpr int used[] = {0, 1, 3, 4, 5, 7};  // numbers that each form of the profile format has
    const i32 kind = form < 0 ? -form : form;
    return kind <= 5 && std::equal(left, left + used[kind], right);
  }
  const u32 count = cmsGetToneCurveEstimatedTableEntries(a);
  return count == cmsGetToneCurveEstimatedTableEntries(b) &&
         std::memcmp(cmsGetToneCurveEstimatedTable(a), cmsGetToneCurveEstimatedTable(b), count * sizeof(u16)) == 0;
}

// Bytes by linear value: 256 entries an octave from 2^-30 to 1, so that the steep begin of an inverse gamma
// is met finely.
constexpr int byte_shift = 15;
constexpr u32 first_byte = (127u - 30u) << (23 - byte_shift);
constexpr u32 byte_entries = 30u * 256u + 1u;
constexpr f32 least_byte = 0x1p-30f;

}  // namespace

bool CurveSet::prepare(const cmsToneCurve* const curves[3]) {
  sampled_ = cmsGetToneCurveParametricType(curves[0]) == 0;
  for (int c = 0; c < 3; ++c) {
    if ((cmsGetToneCurveParametricType(curves[c]) == 0) != sampled_) return false;
    if (cmsIsToneCurveMultisegment(curves[c])) return false;
    int same = 0;
    while (same < c && !same_curve(curves[same], curves[c])) ++same;
    same_as_[c] = same;
    if (same < c) continue;
    if (sampled_)
      samples_[c].build(curves[c]);
    else if (!formulas_[c].build(curves[c]))
      return false;
  }
  return true;
}

MatrixShaper::~MatrixShaper() {
  for (cmsToneCurve* const curve : inverse_curves_)
    if (curve != nullptr) cmsFreeToneCurve(curve);
}

bool MatrixShaper::prepare(const cmsToneCurve* const forward[3], cmsToneCurve* const inverse[3], const LinearMap& map) {
  std::copy(inverse, inverse + 3, inverse_curves_);
  same_light_ = true;
  map_is_exact_ = map.exact;
  for (int i = 0; i < 3; ++i) {
    offset_[i] = map.offset[i];
    for (int c = 0; c < 3; ++c) {
      columns_[c][i] = map.columns[c][i];
      product_[i][c] = map.product[i][c];
      same_light_ =
          same_light_ && std::fabs(map.columns[c][i] - (i == c ? 1.0f : 0.0f)) < 2e-6f && map.offset[i] == 0.0f;
    }
  }
  return forward_.prepare(forward) && inverse_.prepare(inverse);
}

void MatrixShaper::prepare_exact_source8() {
  for (int c = 0; c < 3; ++c) {
    if (forward_.distinct(c) != c || !linear8_[c].empty()) continue;
    CurveVector<f32> linear(256);
    for (u32 v = 0; v < 256; ++v) linear[v] = forward_.exact(c, unit(static_cast<u8>(v)));
    linear8_[c].swap(linear);
  }
}

void MatrixShaper::prepare_source8() {
  if (!products8_[2].empty()) return;
  for (int c = 0; c < 3; ++c) {
    CurveVector<Vector> products(256);
    for (u32 v = 0; v < 256; ++v) {
      const f32 linear = forward_(c, unit(static_cast<u8>(v)));
      products[v] = columns_[c] * Vector{linear, linear, linear, linear};
      if (c == 0) products[v] += offset_;
    }
    products8_[c].swap(products);
  }
}

void MatrixShaper::prepare_source16() {
  for (int c = 0; c < 3; ++c) {
    if (forward_.distinct(c) != c || !linear16_[c].empty()) continue;
    CurveVector<f32> linear(32769);
    for (u32 v = 0; v <= 32768; ++v) linear[v] = forward_.exact(c, unit(static_cast<u16>(v)));
    linear16_[c].swap(linear);
  }
}

void MatrixShaper::prepare_result8() {
  bool fine = true;
  for (int c = 0; c < 3; ++c) {
    if (inverse_.distinct(c) != c || !bytes_[c].empty()) continue;
    CurveVector<u8> bytes(byte_entries);
    for (u32 i = 0; i < byte_entries; ++i) {
      const f32 begin = std::bit_cast<f32>((i + first_byte) << byte_shift);
      const f32 end = std::bit_cast<f32>((i + 1 + first_byte) << byte_shift);
      // Below the first entry is 0, at the last exactly 1.
      const f32 x = i == 0 ? 0.0f : i == byte_entries - 1 ? 1.0f : 0.5f * (begin + end);
      bytes[i] = from_unit<u8>(inverse_(c, x));
      if (i > 0 && (bytes[i] > bytes[i - 1] ? bytes[i] - bytes[i - 1] : bytes[i - 1] - bytes[i]) > 1) fine = false;
    }
    bytes_[c].swap(bytes);
    bytes_are_fine_ = c == 0 ? fine : bytes_are_fine_ && fine;
  }
}

// Where linear light is the same on both sides, a code decides its result alone.
template <class From, class To>
void MatrixShaper::prepare_codes() {
  for (int c = 0; c < 3; ++c) {
    CurveVector<u8>& table = codes_[sizeof(From) - 1][sizeof(To) - 1][c];
    if (code_table(c) != c || !table.empty()) continue;
    constexpr u32 white = static_cast<u32>(white_code<From>);
    CurveVector<u8> bytes((white + 1) * sizeof(To));
    for (u32 v = 0; v <= white; ++v) {
      const To code = from_unit<To>(inverse_(c, forward_(c, unit(static_cast<From>(v)))));
      std::memcpy(bytes.data() + v * sizeof(To), &code, sizeof code);
    }
    table.swap(bytes);
  }
}

int MatrixShaper::code_table(int channel) const {
  for (int c = 0; c < channel; ++c)
    if (forward_.distinct(c) == forward_.distinct(channel) && inverse_.distinct(c) == inverse_.distinct(channel))
      return c;
  return channel;
}

void MatrixShaper::prepare_pair(Layout src, Layout dst) {
  if (same_light_ && src != Layout::rgb_float && dst != Layout::rgb_float) {
    if (src == Layout::rgb8)
      dst == Layout::rgb8 ? prepare_codes<u8, u8>() : prepare_codes<u8, u16>();
    else
      dst == Layout::rgb8 ? prepare_codes<u16, u8>() : prepare_codes<u16, u16>();
    return;
  }
  if (src == Layout::rgb8) by_steps(dst) ? prepare_exact_source8() : prepare_source8();
  if (src == Layout::rgb16) prepare_source16();
  if (dst == Layout::rgb8) prepare_result8();
}

// The loops: one body, four sources, five results. Each source gives the linear result of a pixel, each
// result writes one.
struct MatrixShaper::Kernels {
  static Vector all(f32 v) { return Vector{v, v, v, v}; }

  struct Source8 {
    using Pixel = ZR_Pixel8;
    const Vector *red, *green, *blue;
    explicit Source8(const MatrixShaper& s)
        : red(s.products8_[0].data()), green(s.products8_[1].data()), blue(s.products8_[2].data()) {}
    Vector operator()(const Pixel& p) const { return red[p.red] + green[p.green] + blue[p.blue]; }
  };
  struct Matrix {
    Vector red, green, blue, offset;
    explicit Matrix(const MatrixShaper& s)
        : red(s.columns_[0]), green(s.columns_[1]), blue(s.columns_[2]), offset(s.offset_) {}
    Vector operator()(f32 r, f32 g, f32 b) const { return red * all(r) + offset + green * all(g) + blue * all(b); }
  };
  struct Source16 {
    using Pixel = ZR_Pixel16;
    Matrix matrix;
    const f32 *red, *green, *blue;
    explicit Source16(const MatrixShaper& s)
        : matrix(s),
          red(s.linear16_[s.forward_.distinct(0)].data()),
          green(s.linear16_[s.forward_.distinct(1)].data()),
          blue(s.linear16_[s.forward_.distinct(2)].data()) {}
    static u32 legal(u16 v) { return v < 32768 ? v : 32768; }
    Vector operator()(const Pixel& p) const {
      return matrix(red[legal(p.red)], green[legal(p.green)], blue[legal(p.blue)]);
    }
  };
  template <class Curve, bool clip>
  struct SourceFloat {
    using Pixel = ZR_PixelFloat;
    Matrix matrix;
    const Curve &red, &green, &blue;
    SourceFloat(const MatrixShaper& s, const Curve& r, const Curve& g, const Curve& b)
        : matrix(s), red(r), green(g), blue(b) {}
    Vector operator()(const Pixel& p) const {
      if constexpr (clip)
        return matrix(red(clamp_unit(p.red)), green(clamp_unit(p.green)), blue(clamp_unit(p.blue)));
      else
        return matrix(red(p.red), green(p.green), blue(p.blue));
    }
  };

  // The road of by_steps(): every rounding is that of lcms.
  template <class P>
  struct Exact {
    using Pixel = P;
    const MatrixShaper& s;
    const bool clip;
    const f32* tables[3] = {};
    Exact(const MatrixShaper& shaper, bool clip_src) : s(shaper), clip(clip_src) {
      if constexpr (!std::is_same_v<P, ZR_PixelFloat>)
        for (int c = 0; c < 3; ++c)
          tables[c] = (sizeof(P) == 4 ? s.linear8_ : s.linear16_)[s.forward_.distinct(c)].data();
    }
    f64 linear(int c, Channel<P> v) const {
      if constexpr (std::is_same_v<P, ZR_PixelFloat>)
        return s.forward_.exact(c, clip ? clamp_unit(v) : v);
      else
        return tables[c][v < Depth<P>::white ? v : Depth<P>::white];
    }
    Vector operator()(const Pixel& p) const {
      const f64 r = linear(0, p.red), g = linear(1, p.green), b = linear(2, p.blue);
      const auto row = [&](const f64(&m)[3]) { return static_cast<f32>(m[0] * r + m[1] * g + m[2] * b); };
      return Vector{row(s.product_[0]), row(s.product_[1]), row(s.product_[2]), 0.0f};
    }
  };

  // NaN takes the lower bound.
  static Vector within(Vector v, f32 low) {
    const Vector floor = all(low), ceiling = all(1.0f);
    v = v > floor ? v : floor;
    return v < ceiling ? v : ceiling;
  }

  struct Bytes {
    using Pixel = ZR_Pixel8;
    const u8 *red, *green, *blue;
    explicit Bytes(const MatrixShaper& s)
        : red(s.bytes_[s.inverse_.distinct(0)].data()),
          green(s.bytes_[s.inverse_.distinct(1)].data()),
          blue(s.bytes_[s.inverse_.distinct(2)].data()) {}
    void operator()(Vector v, Pixel& p) const {
      typedef u32 Index __attribute__((vector_size(16)));
      const Index entry = (reinterpret_cast<Index>(within(v, least_byte)) >> byte_shift) - first_byte;
      p.red = red[entry[0]];
      p.green = green[entry[1]];
      p.blue = blue[entry[2]];
    }
  };
  template <class P, class Curve>
  struct Integers {
    using Pixel = P;
    const Curve &red, &green, &blue;
    Integers(const Curve& r, const Curve& g, const Curve& b) : red(r), green(g), blue(b) {}
    void operator()(Vector v, Pixel& p) const {
      typedef i32 Codes __attribute__((vector_size(16)));
      v = within(v, 0.0f);
      const Vector unit = within(Vector{red.in_unit(v[0]), green.in_unit(v[1]), blue.in_unit(v[2]), 0.0f}, 0.0f);
      const Codes codes = __builtin_convertvector(unit * all(white_code<Channel<P>>) + all(0.5f), Codes);
      p.red = static_cast<Channel<P>>(codes[0]);
      p.green = static_cast<Channel<P>>(codes[1]);
      p.blue = static_cast<Channel<P>>(codes[2]);
    }
  };
  template <class Curve, bool clip>
  struct Floats {
    using Pixel = ZR_PixelFloat;
    const Curve &red, &green, &blue;
    Floats(const Curve& r, const Curve& g, const Curve& b) : red(r), green(g), blue(b) {}
    void operator()(Vector v, Pixel& p) const {
      if constexpr (clip) v = within(v, 0.0f);
      const f32 r = red(v[0]), g = green(v[1]), b = blue(v[2]);
      p.red = clip ? clamp_unit(r) : r;
      p.green = clip ? clamp_unit(g) : g;
      p.blue = clip ? clamp_unit(b) : b;
    }
  };

  template <class Source, class Result>
  static void loop(const Source& source, const Result& result, const void* from, void* to, size_t count) {
    const auto* src = static_cast<const typename Source::Pixel*>(from);
    auto* dst = static_cast<typename Result::Pixel*>(to);
    for (size_t i = 0; i < count; ++i) result(source(src[i]), dst[i]);
  }

  template <class From, class To>
  static void codes(const MatrixShaper& s, const void* from, void* to, size_t count) {
    const auto* src = static_cast<const From*>(from);
    auto* dst = static_cast<To*>(to);
    using In = Channel<From>;
    using Out = Channel<To>;
    const auto table = [&](int c) {
      return reinterpret_cast<const Out*>(s.codes_[sizeof(In) - 1][sizeof(Out) - 1][s.code_table(c)].data());
    };
    const Out* const red = table(0);
    const Out* const green = table(1);
    const Out* const blue = table(2);
    constexpr In white = static_cast<In>(Depth<From>::white);
    const auto legal = [](In v) { return v < white ? v : white; };
    for (size_t i = 0; i < count; ++i) {
      const From p = src[i];
      dst[i].red = red[legal(p.red)];
      dst[i].green = green[legal(p.green)];
      dst[i].blue = blue[legal(p.blue)];
    }
  }

  template <class Body>
  static void with_curves(const CurveSet& set, Body&& body) {
    if (set.sampled())
      body(set.samples(0), set.samples(1), set.samples(2));
    else
      body(set.formula(0), set.formula(1), set.formula(2));
  }
};

void MatrixShaper::run(Layout src, bool clip_src, const void* from, Layout dst, bool clip_dst, void* to,
                       size_t count) const {
  using K = Kernels;
  if (same_light_ && src != Layout::rgb_float && dst != Layout::rgb_float) {
    const auto run_codes = src == Layout::rgb8
                               ? dst == Layout::rgb8 ? K::codes<ZR_Pixel8, ZR_Pixel8> : K::codes<ZR_Pixel8, ZR_Pixel16>
                           : dst == Layout::rgb8 ? K::codes<ZR_Pixel16, ZR_Pixel8>
                                                 : K::codes<ZR_Pixel16, ZR_Pixel16>;
    return run_codes(*this, from, to, count);
  }
  const auto to_result = [&](const auto& source) {
    if (dst == Layout::rgb8 && bytes_are_fine_) return K::loop(source, K::Bytes(*this), from, to, count);
    K::with_curves(inverse_, [&]<class Curve>(const Curve& r, const Curve& g, const Curve& b) {
      if (dst == Layout::rgb8)
        K::loop(source, K::Integers<ZR_Pixel8, Curve>(r, g, b), from, to, count);
      else if (dst == Layout::rgb16)
        K::loop(source, K::Integers<ZR_Pixel16, Curve>(r, g, b), from, to, count);
      else if (clip_dst)
        K::loop(source, K::Floats<Curve, true>(r, g, b), from, to, count);
      else
        K::loop(source, K::Floats<Curve, false>(r, g, b), from, to, count);
    });
  };
  if (by_steps(dst)) {
    if (src == Layout::rgb8) return to_result(K::Exact<ZR_Pixel8>(*this, clip_src));
    if (src == Layout::rgb16) return to_result(K::Exact<ZR_Pixel16>(*this, clip_src));
    return to_result(K::Exact<ZR_PixelFloat>(*this, clip_src));
  }
  if (src == Layout::rgb8) return to_result(K::Source8(*this));
  if (src == Layout::rgb16) return to_result(K::Source16(*this));
  K::with_curves(forward_, [&]<class Curve>(const Curve& r, const Curve& g, const Curve& b) {
    if (clip_src)
      to_result(K::SourceFloat<Curve, true>(*this, r, g, b));
    else
      to_result(K::SourceFloat<Curve, false>(*this, r, g, b));
  });
}

}  // namespace zr::prisma
