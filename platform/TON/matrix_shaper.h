// From one RGB profile of curves and a matrix to another, computed here: three curves, one affine map,
// three inverse curves, straight from and to the pixels of worlds.
//
// Results are within one code of the float computation at 8 bits, two at 16 bits, 1e-5 in float, and the
// same whatever the number of bands.
#pragma once

#include <lcms2.h>

#include "TON/curve_table.h"
#include "TON/pixel_layout.h"

namespace zr::prisma {

// The map between the linear light of two profiles: out = offset + sum of columns[c] * in[c].
struct LinearMap {
  f32 columns[3][3], offset[3];
  f64 product[3][3];  // the same, row by row, at double precision
  bool exact;         // there is no offset, and `product` is what lcms multiplies by
};

// Three curves of one form; equal ones are tabulated once.
class CurveSet {
 public:
  // The curves must live as long as the set. False when they differ in form or one cannot be tabulated.
  bool prepare(const cmsToneCurve* const curves[3]);
  bool sampled() const { return sampled_; }
  int distinct(int channel) const { return same_as_[channel]; }
  const FormulaCurve& formula(int channel) const { return formulas_[same_as_[channel]]; }
  const SampledCurve& samples(int channel) const { return samples_[same_as_[channel]]; }
  f32 operator()(int channel, f32 x) const { return sampled_ ? samples(channel)(x) : formula(channel)(x); }
  f32 exact(int channel, f32 x) const { return sampled_ ? samples(channel).exact(x) : formula(channel).exact(x); }

 private:
  bool sampled_ = false;
  int same_as_[3] = {0, 1, 2};
  FormulaCurve formulas_[3];
  SampledCurve samples_[3];
};

class MatrixShaper {
 public:
  MatrixShaper() = default;
  MatrixShaper(const MatrixShaper&) = delete;
  MatrixShaper& operator=(const MatrixShaper&) = delete;
  ~MatrixShaper();
  // The forward curves live as long as the transform; the inverse ones are taken over, whatever the result.
  // False when a curve is of no form that this evaluates well.
  bool prepare(const cmsToneCurve* const forward[3], cmsToneCurve* const inverse[3], const LinearMap& map);
  // An inverse curve of samples is a staircase of 16-bit words, steep near black: the last place of its argument
  // decides for a step, so everything before it has to be lcms's own arithmetic. False where that is not had.
  bool reaches(Layout dst) const { return dst == Layout::rgb8 || !inverse_.sampled() || map_is_exact_; }
  bool by_steps(Layout dst) const { return dst != Layout::rgb8 && inverse_.sampled(); }
  // Makes the tables of a pair of layouts; before the first run of the pair, one caller at a time.
  void prepare_pair(Layout src, Layout dst);
  // clip: the float side is clamped to 0..1. from may be to.
  void run(Layout src, bool clip_src, const void* from, Layout dst, bool clip_dst, void* to, size_t count) const;

 private:
  typedef f32 Vector __attribute__((vector_size(16)));  // red, green, blue, nothing
  struct Kernels;

  template <class From, class To>
  void prepare_codes();
  int code_table(int channel) const;  // the first channel with the same curves
  void prepare_exact_source8();
  void prepare_source8();
  void prepare_source16();
  void prepare_result8();

  CurveSet forward_, inverse_;
  cmsToneCurve* inverse_curves_[3] = {};
  Vector columns_[3] = {}, offset_ = {};
  f64 product_[3][3] = {};            // rows
  CurveVector<f32> linear8_[3];       // curve of each byte
  CurveVector<Vector> products8_[3];  // curve and column of each byte; the offset is in the first
  CurveVector<f32> linear16_[3];      // curve of each 16-bit value
  CurveVector<u8> bytes_[3];          // finished byte by the top bits of the linear float
  CurveVector<u8> codes_[2][2][3];    // results of integer codes, by bytes of both sides less one
  bool same_light_ = false;           // the map is the identity
  bool map_is_exact_ = false;
  bool bytes_are_fine_ = false;  // no step of bytes_ skips a code
};

}  // namespace zr::prisma
