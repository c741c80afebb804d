// Iterations against the model: positions, addresses, order, progress, results.
#include <ZR/slots.h>

#include "model/compare.h"
#include "model/walks.h"

namespace model {
namespace {

struct Recorder {
  Walk walk;
  Answers answers;
  size_t bytes = 4;
  const ZR_LayerDef* source = nullptr;  // where given: a pixel outside of it must be transparent black

  i32 pixel(i32 x, i32 y, const void* in, const void* out) {
    bool own = source == nullptr;
    for (i32 row = 0; !own && row < source->height; ++row) {
      const u8 *start = address(*source, 0, row, bytes), *p = static_cast<const u8*>(in);
      own = p >= start && p < start + static_cast<size_t>(source->width) * bytes;
    }
    const u8 zero[16] = {};
    const bool black = !own && std::memcmp(in, zero, bytes) == 0;
    walk.visits.push_back({x, y, black ? nullptr : in, out, black});
    return static_cast<i64>(walk.visits.size()) - 1 == answers.pixel_at ? answers.pixel_code : 0;
  }
};
i32 record(void* refcon, i32 x, i32 y, const void* in, void* out) {
  return static_cast<Recorder*>(refcon)->pixel(x, y, in, out);
}
i32 record_progress(void* refcon, i32 count, i32 total) {
  auto* r = static_cast<Recorder*>(refcon);
  r->walk.told.emplace_back(count, total);
  return static_cast<i64>(r->walk.told.size()) - 1 == r->answers.progress_at ? r->answers.progress_code : 0;
}

using OriginFunc = i32 (*)(ZR_InData*, i32, i32, ZR_LayerDef*, const GX_LRect*, const GX_LPoint*, void*, ZR_PixelFunc,
                           ZR_LayerDef*);
enum Form { plain, with_origin, with_origin_no_clip };

template <class D>
void walks(Form form, u32 seed) {
  void* block[69];
  ASSERT_EQ(ZR_GetCallbackBlock(1, 1, block), 0);
  const auto no_clip = reinterpret_cast<OriginFunc>(block[56]);
  Random random(seed);
  Complaints complaints(3);
  for (i32 i = 0; i < 3000; ++i) {
    World<D> src(random, random.in(1, 20), random.in(1, 8)), dst(random, random.in(1, 20), random.in(1, 8));
    // Without a source the origin walk of rows that run upward would leave the memory; nobody wants that.
    const bool sourceless = random.one_in(4) && (form == plain || dst.layer()->row_bytes > 0), same = random.one_in(6);
    ZR_LayerDef* source = sourceless ? nullptr : same ? dst.layer() : src.layer();
    GX_LRect area{random.in(-5, 22), random.in(-3, 10), 0, 0};
    area.right = area.left + random.in(0, 20), area.bottom = area.top + random.in(0, 9);
    const GX_LRect* given = random.one_in(3) ? nullptr : &area;
    const GX_LPoint origin{random.in(-8, 12), random.in(-5, 6)};
    const i32 base = random.in(0, 50), final = random.one_in(3) ? 0 : random.in(1, 900);
    Recorder recorder;
    recorder.bytes = sizeof(typename D::Pixel);
    if (form != plain) recorder.source = source;
    recorder.answers = {random.one_in(5) ? random.in(0, 30) : -1, random.in(1, 600),
                        random.one_in(4) ? random.in(0, 5) : -1, random.one_in(2) ? 517 : random.in(-3, 600)};
    ZR_InData in_data{};
    in_data.progress = record_progress;
    in_data.effect_ref = &recorder;
    const auto call = form == with_origin ? ZR_IterateOrigin : no_clip;
    const Walk expected = form == plain ? iterate(base, final, source, given, dst, recorder.bytes, recorder.answers)
                                        : iterate_origin(form == with_origin, base, final, source, given, origin, dst,
                                                         recorder.bytes, recorder.answers);
    recorder.walk.result = form == plain
                               ? ZR_Iterate(&in_data, base, final, source, given, &recorder, record, dst.layer())
                               : call(&in_data, base, final, source, given, &origin, &recorder, record, dst.layer());
    if (recorder.walk == expected) continue;
    std::string what = "src " + text(src.width()) + "x" + text(src.height()) +
                       (sourceless ? " (none)"
                        : same     ? " (dst)"
                                   : "") +
                       ", dst " + text(dst.width()) + "x" + text(dst.height()) + ", area " +
                       (given != nullptr ? text(area) : "none") + (dst.layer()->row_bytes < 0 ? ", rows upward" : "") +
                       ", origin " + text(origin.x) + "," + text(origin.y);
    what += "\n  expected " + std::to_string(expected.visits.size()) + " pixels, " +
            std::to_string(expected.told.size()) + " progress calls, result " + text(expected.result);
    what += "\n  got      " + std::to_string(recorder.walk.visits.size()) + " pixels, " +
            std::to_string(recorder.walk.told.size()) + " progress calls, result " + text(recorder.walk.result);
    complaints.add("walk", what);
  }
}
TEST(ModelIterate, Plain) { walks<Eight>(plain, 91), walks<Sixteen>(plain, 92), walks<Float>(plain, 93); }
TEST(ModelIterate, Origin) {
  walks<Eight>(with_origin, 94), walks<Sixteen>(with_origin, 95), walks<Float>(with_origin, 96);
}
TEST(ModelIterate, OriginNoClip) { walks<Eight>(with_origin_no_clip, 97), walks<Float>(with_origin_no_clip, 98); }

TEST(ModelIterate, Tables) {
  Random random(99);
  Complaints complaints;
  u8 tables[4][256];
  for (auto& table : tables)
    for (u8& v : table) v = static_cast<u8>(random.word());
  for (i32 i = 0; i < 2000; ++i) {
    World<Eight> src(random, random.in(1, 20), random.in(1, 8)), dst(random, random.in(1, 20), random.in(1, 8)),
        expected = dst;
    const World<Eight> before = dst;
    ZR_LayerDef* source = random.one_in(3) ? nullptr : src.layer();
    GX_LRect area{random.in(-5, 22), random.in(-3, 10), 0, 0};
    area.right = area.left + random.in(0, 20), area.bottom = area.top + random.in(0, 9);
    const GX_LRect* given = random.one_in(3) ? nullptr : &area;
    const u8* lut[4];
    for (int k = 0; k < 4; ++k) lut[k] = random.one_in(3) ? nullptr : tables[k];
    Recorder recorder;
    recorder.answers = {-1, 0, random.one_in(4) ? random.in(0, 5) : -1, random.one_in(2) ? 517 : 33};
    ZR_InData in_data{};
    in_data.progress = record_progress;
    in_data.effect_ref = &recorder;
    const i32 final = random.one_in(3) ? 0 : 100;
    const Walk model_walk = iterate_lut(7, final, source, given, lut, expected, recorder.answers);
    recorder.walk.result =
        ZR_IterateLUT(&in_data, 7, final, source, given, lut[0], lut[1], lut[2], lut[3], dst.layer());
    const std::string difference = dst.difference(expected, before);
    if (!difference.empty() || !(recorder.walk == model_walk))
      complaints.add("tables", "area " + (given != nullptr ? text(area) : std::string("none")) + "\n" + difference +
                                   "\n  progress calls " + std::to_string(model_walk.told.size()) + " expected, got " +
                                   std::to_string(recorder.walk.told.size()));
  }
}

TEST(ModelIterate, RefusedArguments) {
  Random random(100);
  CaughtMessages caught;
  World<Eight> a(random, 3, 3), b(random, 3, 3);
  World<Sixteen> deep(random, 3, 3);
  ZR_LayerDef no_data = *a.layer();
  no_data.data = nullptr;
  Recorder r;
  const GX_LPoint origin{0, 0};
  struct {
    ZR_LayerDef *src, *dst;
    ZR_PixelFunc fn;
  } const cases[] = {{&no_data, b.layer(), record},
                     {a.layer(), nullptr, record},
                     {a.layer(), &no_data, record},
                     {a.layer(), b.layer(), nullptr},
                     {a.layer(), deep.layer(), record}};
  for (const auto& c : cases) {
    EXPECT_EQ(ZR_Iterate(nullptr, 0, 0, c.src, nullptr, &r, c.fn, c.dst), ZR_Err_Internal);
    EXPECT_EQ(ZR_IterateOrigin(nullptr, 0, 0, c.src, nullptr, &origin, &r, c.fn, c.dst), ZR_Err_Internal);
  }
  EXPECT_EQ(ZR_IterateLUT(nullptr, 0, 0, deep.layer(), nullptr, nullptr, nullptr, nullptr, nullptr, a.layer()),
            ZR_Err_Internal);
  EXPECT_EQ(ZR_IterateLUT(nullptr, 0, 0, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, deep.layer()),
            ZR_Err_Internal);
  EXPECT_TRUE(r.walk.visits.empty());
}

TEST(ModelIterate, Generic) {
  struct Count {
    std::vector<std::array<i32, 3>> calls;
    i32 stop_at = -1;
  };
  const ZR_GenericFunc fn = [](void* self, i32 thread, i32 i, i32 n) {
    auto* c = static_cast<Count*>(self);
    c->calls.push_back({thread, i, n});
    return i == c->stop_at ? 21 : 0;
  };
  for (i32 n = -3; n < 20; ++n)
    for (const i32 stop : {-1, 0, 7}) {
      Count count;
      count.stop_at = stop;
      std::vector<std::array<i32, 3>> expected;
      if (n == -1) expected = {{0, 0, 1}};
      for (i32 i = 0; i < n && (i <= stop || stop < 0); ++i) expected.push_back({0, i, n});
      const i32 code = stop >= 0 && stop < (n == -1 ? 1 : n) ? 21 : 0;
      EXPECT_EQ(ZR_IterateGeneric(n, &count, fn), code) << n << ", " << stop;
      EXPECT_EQ(count.calls, expected) << n << ", " << stop;
    }
}

}  // namespace
}  // namespace model
