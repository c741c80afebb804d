// Draws the frames of a scene through the library's transfer rectangle.
#include "render.h"

#include <ZR/linear_tables.h>

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
  choose_spaces();
  for (const SceneImage& image : images_of(scene)) {
    stop_if_interrupted();
    images_.emplace(image.file, load(image));
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
  if (to_output_.Get() != nullptr) convert_world(canvas_, to_output_, "converting to the output space");
  return canvas_;
}

void Renderer::choose_spaces() {
  if (scene_.working_space) {
    working_ = load_space(*scene_.working_space, Device::kRgb, scene_.file + ": working_space");
    output_ =
        scene_.output_space ? load_space(*scene_.output_space, Device::kRgb, scene_.file + ": output_space") : working_;
    output_icc_ = icc_data(*output_);
    if (!same_space(working_, output_))
      to_output_ =
          make_transform(working_, output_, PRISMA_Intent_RelativeColorimetric, scene_.file + ": output_space");
  }
  // Values of a linear space are linear light already.
  if (scene_.linear_light && !(working_ && TON_PRISMA_Profile_IsOverRange(*working_)))
    tables_ = with_engine(scene_.file + ": linear_light", [&] { return ZR_MakeLinearizationTables(working_); });
}

OwnedWorld Renderer::load(const SceneImage& image) const {
  if (!working_) return load_image(image.file, scene_.depth, image.where);
  return world_in_space(load_picture(image.file, scene_.depth, image.where), {}, working_, scene_.depth,
                        PRISMA_Intent_RelativeColorimetric, image.file, image.where);
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
  check(ZR_TransferRect(&abort_on_interrupt(), 1, 0, layer.field, &all, source.layer(), &mode, tables_.get(),
                        layer.matte ? &mask : nullptr, place.x, place.y, canvas_.layer()),
        layer.place);
}

}  // namespace zr::tool
