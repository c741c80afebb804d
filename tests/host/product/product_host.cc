// A host on the products alone: premultiplies one world with one thread and with several and compares.
#include <ZR/hostkit.h>
#include <ZR/slots.h>

#include <cstdio>
#include <cstring>
#include <exception>
#include <vector>

namespace {

constexpr i32 width = 333, height = 200;

std::vector<ZR_Pixel16> premultiplied(int threads, bool* threaded) {
  zr::Hostkit host({.threads = threads});
  *threaded = ZRp_G_OverFuncs[ZR_Slot_iterate_generic] != reinterpret_cast<ZR_SlotFunc>(&ZR_IterateGeneric_Static);
  ZR_LayerDef world{};
  if (ZR_NewEffectWorld(nullptr, width, height, 16, true, false, &world) != 0) return {};
  std::vector<ZR_Pixel16> pixels;
  u32 seed = 1;
  for (i32 y = 0; y < height; ++y) {
    auto* const row =
        reinterpret_cast<ZR_Pixel16*>(static_cast<char*>(world.data) + std::ptrdiff_t{y} * world.row_bytes);
    for (i32 x = 0; x < width; ++x) {
      const auto channel = [&] { return static_cast<u16>(ZR_Rand(&seed)); };
      row[x] = {channel(), channel(), channel(), channel()};
    }
  }
  if (ZR_Premul(nullptr, 1, &world) == 0)
    for (i32 y = 0; y < height; ++y) {
      const auto* const row =
          reinterpret_cast<ZR_Pixel16*>(static_cast<char*>(world.data) + std::ptrdiff_t{y} * world.row_bytes);
      pixels.insert(pixels.end(), row, row + width);
    }
  ZR_DisposeEffectWorld(nullptr, &world);
  return host.End() == 0 ? pixels : std::vector<ZR_Pixel16>{};
}

}  // namespace

int main() {
  try {
    bool serial_is_threaded = true, parallel_is_threaded = false;
    const auto serial = premultiplied(1, &serial_is_threaded);
    const auto parallel = premultiplied(5, &parallel_is_threaded);
    const bool same = !serial.empty() && serial.size() == parallel.size() &&
                      std::memcmp(serial.data(), parallel.data(), serial.size() * sizeof serial[0]) == 0;
    std::printf("%s\n", same ? "same pixels" : "different pixels");
    return same && !serial_is_threaded && parallel_is_threaded ? 0 : 1;
  } catch (const std::exception& error) {
    std::printf("%s\n", error.what());
    return 1;
  }
}
