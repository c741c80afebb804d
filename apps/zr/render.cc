// Draws the frames of a scene through the library's transfer rectangle.
#include "render.h"

#include <algorithm>
#include <cmath>
#include <set>

#include "image_files.h"
#include "interrupt_state.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

u64 world_bytes(i32 width, i32 height, i32 depth) {
  return static_cast<u64>(width) * static_cast<u64>(height) * static_cast<u64>(depth / 2);
}

// Halves go up, on both sides of 0: a steady move stays steady.
GX_LPoint whole_pixels(const Point& point) {
  return {static_cast<i32>(std::floor(point.x + 0.5)), static_cast<i32>(std::floor(point.y + 0.5))};
}

void fill(OwnedWorld& world, const ZR_PixelFloat& colour, const std::string& what) {
  check(ZR_FillFloat(nullptr, &colour, nullptr, world.layer()), what);
}

}  // namespace

std::vector<SceneImage> images_of(const Scene& scene) {
  std::vector<SceneImage> images;
  std::set<std::string> seen;
  const auto add = [&](const std::string& file, const std::string& place) {
    if (!file.empty() && seen.insert(file).second) images.push_back({file, scene.file + ": " + place});
  };
  for (const Layer& layer : scene.layers) {
    add(layer.image, layer.place + ".image");
    if (layer.matte) add(layer.matte->image, layer.place + ".matte.image");
  }
  return images;
}

u64 memory_needed(const Scene& scene) {
  u64 worlds = world_bytes(scene.width, scene.height, scene.depth), decoding = 0;
  for (const Layer& layer : scene.layers)
    if (layer.image.empty()) worlds += world_bytes(layer.width, layer.height, scene.depth);
  for (const SceneImage& image : images_of(scene)) {
    stop_if_interrupted();
    const ImageInfo info = probe_image(image.file, image.where);
    worlds += world_bytes(info.width, info.height, scene.depth);
    decoding = std::max(decoding, info.decoded_bytes);
  }
  const u64 strip = world_bytes(scene.width, std::min(scene.height, 256), scene.depth);
  return worlds + std::max(decoding, strip);
}

Renderer::Renderer(const Scene& scene) : scene_(scene), canvas_(scene.width, scene.height, scene.depth) {
  for (const SceneImage& image : images_of(scene)) {
    stop_if_interrupted();
    images_.emplace(image.file, load_image(image.file, scene.depth, image.where));
  }
  for (const Layer& layer : scene.layers) {
    if (!layer.image.empty()) continue;
    const auto made = solids_.emplace(&layer, OwnedWorld(layer.width, layer.height, scene.depth)).first;
    fill(made->second, layer.colour, layer.place);
  }
}

const OwnedWorld& Renderer::draw(i32 frame) {
  fill(canvas_, scene_.background, "background");
  for (const Layer& layer : scene_.layers) {
    stop_if_interrupted();
    composite(layer, layer.image.empty() ? solids_.at(&layer) : images_.at(layer.image), frame);
  }
  return canvas_;
}

void Renderer::composite(const Layer& layer, OwnedWorld& source, i32 frame) {
  const ZR_CompositeModePlus mode(layer.mode, static_cast<f32>(layer.opacity.at(frame)), nullptr, layer.keep_alpha,
                                  layer.seed);
  const GX_LPoint place = whole_pixels(layer.position.at(frame));
  ZR_MaskWorld mask;
  if (layer.matte) {
    const GX_LPoint offset = whole_pixels(layer.matte->position.at(frame));
    mask.world = *images_.at(layer.matte->image).layer();
    mask.offset_x = offset.x;
    mask.offset_y = offset.y;
    mask.kind = layer.matte->kind;
  }
  const GX_LRect all = source.bounds();
  check(ZR_TransferRect(&abort_on_interrupt(), 1, 0, layer.field, &all, source.layer(), &mode, nullptr,
                        layer.matte ? &mask : nullptr, place.x, place.y, canvas_.layer()),
        layer.place);
}

}  // namespace zr::tool
