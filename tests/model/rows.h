// One row under a transfer mode: ground passes, main pass, alpha union, kept alpha.
#pragma once

#include "model/modes.h"

namespace model {

template <class D>
struct RowPlan {
  i32 mode;
  i32 seed;
  typename D::V opacity;
  bool keep_alpha;
  const ZR_LinearBlendingTables* tables;
};

template <class D>
using Row = std::vector<Px<D>>;

inline bool known_mode(i32 mode) { return kind_of(mode) != Kind::none; }

// Something of the source under opacity and mask. At 8 bits the main pass and the alpha union take the
// factors in different orders.
template <class D>
typename D::V factored(typename D::V v, typename D::V opacity, const typename D::V* mask, bool mask_first) {
  if (mask == nullptr) return D::mul(v, opacity);
  if (is_eight<D> && mask_first) return D::mul(D::mul(*mask, v), opacity);
  return D::mul(*mask, D::mul(v, opacity));
}

template <class D>
void mix_by_matte(const Px<D>& s, typename D::V k, Px<D>& d) {
  if (k == 0) return;
  if (k >= D::white) {
    d = s;
    return;
  }
  if constexpr (is_float<D>) {
    const f32 p = s.a * k, q = (1 - k) * d.a, t = p + q;
    if (t == 0) return;
    for (int i = 0; i < 3; ++i) d.c[i] = D::div(s.c[i] * p + d.c[i] * q, t);
    d.a = t;
  } else {
    const i64 p = i64{s.a} * k, q = i64{D::white - k} * d.a, t = p + q;
    if (t == 0) return;
    for (int i = 0; i < 3; ++i) d.c[i] = static_cast<i32>((s.c[i] * p + (t >> 1) + d.c[i] * q) / t);
    d.a = static_cast<i32>(is_eight<D> ? (t + 128) / 255 : (t + 16384) / 32768);
  }
}

template <class D>
void draw_dissolved(const Px<D>& s, typename D::V A, bool keep_alpha, u32& seed, Px<D>& d) {
  bool drawn = A >= D::white;
  if (!drawn && A > 0) {
    const i32 r = rand(seed);
    if constexpr (is_eight<D>)
      drawn = (r & 255) <= A;
    else if constexpr (is_float<D>)
      drawn = static_cast<f32>(r) / 32768 < A;
    else
      drawn = r < A;
  }
  ++seed;
  if (!drawn) return;
  const auto alpha = keep_alpha ? d.a : D::white;
  d = s, d.a = alpha;
}

template <class D>
void main_pass(i32 mode, const RowPlan<D>& plan, const Row<D>& src, const typename D::V* mask, Row<D>& dst) {
  u32 seed = static_cast<u32>(plan.seed);
  const Kind kind = kind_of(mode);
  for (size_t i = 0; i < dst.size(); ++i) {
    const auto* m = mask != nullptr ? mask + i : nullptr;
    const auto factor = [&](typename D::V v) { return factored<D>(v, plan.opacity, m, true); };
    Px<D> s = src[i], &d = dst[i];
    const auto A = factor(s.a);
    if (kind == Kind::copy) {
      const auto alpha = plan.keep_alpha ? d.a : A;
      d = s, d.a = alpha;
    } else if (mode == matte_mix) {
      mix_by_matte(s, m != nullptr ? *m : D::white, d);
    } else if (mode == dissolve) {
      draw_dissolved(s, A, plan.keep_alpha, seed, d);
    } else if (mode == add_premul) {
      kernel(mode, {A, {factor(s.c[0]), factor(s.c[1]), factor(s.c[2])}}, A, d);
    } else if (kind == Kind::alpha) {
      alpha_only(mode, s, A, d);
    } else if (A == 0) {
      continue;
    } else if (kind == Kind::black || kind == Kind::white || kind == Kind::grey) {
      for (int c = 0; c < 3; ++c)
        d.c[c] = A == D::white ? opaque<D>(mode, s.c[c], d.c[c], true) : partial<D>(mode, s.c[c], A, d.c[c]);
    } else if (kind == Kind::colour) {
      mix_colour(mode, s, A, luma(d), d);
    } else {
      const auto before = d.a;
      kernel(mode, s, A, d);
      if (mode == behind && plan.keep_alpha) d.a = before;
    }
    d = stored(d);
  }
}

// The main pass where it belongs: in linear light when there are tables, and then on every pixel.
template <class D>
void main_or_linear(i32 mode, const RowPlan<D>& plan, const Row<D>& src, const typename D::V* mask, Row<D>& dst) {
  if (plan.tables == nullptr) {
    main_pass(mode, plan, src, mask, dst);
    return;
  }
  using E = Linear<D>;
  Row<E> s, d;
  std::vector<typename E::V> m;
  for (size_t i = 0; i < dst.size(); ++i) {
    s.push_back(into_linear(*plan.tables, src[i]));
    d.push_back(into_linear(*plan.tables, dst[i]));
    if (mask != nullptr) m.push_back(alpha_into<D>(mask[i]));
  }
  const RowPlan<E> linear{plan.mode, plan.seed, alpha_into<D>(plan.opacity), plan.keep_alpha, nullptr};
  main_pass<E>(mode, linear, s, mask != nullptr ? m.data() : nullptr, d);
  for (size_t i = 0; i < dst.size(); ++i) dst[i] = stored(from_linear<D>(*plan.tables, d[i]));
}

template <class D>
void composite_row(const RowPlan<D>& plan, const Row<D>& src, const typename D::V* mask, Row<D>& dst) {
  const Kind kind = kind_of(plan.mode);
  const bool ground = kind == Kind::black || kind == Kind::white || kind == Kind::grey;
  const bool self_contained = plan.mode == in_front || plan.mode == add_premul || plan.mode == alpha_add;
  const bool may_keep_alpha = ground || self_contained || kind == Kind::weighted || kind == Kind::colour;
  const Row<D> before = dst;
  const auto each = [&dst](auto&& change) {
    for (auto& d : dst) {
      for (auto& c : d.c) c = change(c, d.a);
      d = stored(d);
    }
  };
  if (ground) each([kind](auto c, auto a) { return fade<D>(kind, c, a); });
  if (kind == Kind::colour) main_or_linear<D>(behind, plan, src, mask, dst);
  main_or_linear<D>(plan.mode, plan, src, mask, dst);
  if (ground) {
    for (size_t i = 0; i < dst.size(); ++i) {
      const auto A = factored<D>(src[i].a, plan.opacity, mask != nullptr ? mask + i : nullptr, false);
      dst[i].a = D::inv(D::mul(D::inv(dst[i].a), D::inv(A)));
      dst[i] = stored(dst[i]);
    }
    each([kind](auto c, auto a) { return unfade<D>(kind, c, a); });
  }
  if (may_keep_alpha && plan.keep_alpha)
    for (size_t i = 0; i < dst.size(); ++i) dst[i].a = before[i].a;
}

// --------------------------------------------------------------------------------- mask rows

// Alpha of a mask pixel as the kinds 0..3 read it.
template <class D>
typename D::V mask_value(const Px<D>& m, u32 kind) {
  auto v = (kind & 2) != 0 ? D::mul(m.a, luma(m)) : m.a;
  if ((kind & 1) != 0) v = D::inv(v);
  return static_cast<typename D::Channel>(v);
}

}  // namespace model
