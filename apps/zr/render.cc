// Draws the frames of a scene through the library's layer transform.
#include "render.h"

#include <ZR/hostkit.h>
#include <ZR/linear_tables.h>
#include <ZR/transfer_mode.h>
#include <ZR/transform_world.h>

#include <algorithm>
#include <set>

#include "image_files.h"
#include "interrupt_state.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

u64 world_bytes(i32 width, i32 height, i32 depth) {
  return static_cast<u64>(width) * static_cast<u64>(height) * static_cast<u64>(depth / 2);
}

void fill(OwnedWorld& world, const ZR_PixelFloat& colour, const std::string& what) {
  check(ZR_FillFloat(nullptr, &colour, nullptr, world.layer()), what);
}

ImageInfo size_of(const Scene& scene, const Layer& layer) {
  if (layer.image.empty()) return {layer.width, layer.height, 0};
  return probe_image(layer.image, scene.file + ": " + layer.place + ".image");
}

// The masked picture, and its mask while it is drawn.
u64 masked_bytes(const Scene& scene, const Layer& layer) {
  const ImageInfo size = size_of(scene, layer);
  return world_bytes(size.width, size.height, scene.depth) +
         mask_bytes(size.width, size.height, mask_depth_for(scene.depth), layer.mask);
}

// The picture before and after an effect, and one in between.
u64 effect_bytes(const Scene& scene, const Layer& layer) {
  const GX_LPoint growth = largest_growth(layer.effects);
  const ImageInfo size = size_of(scene, layer);
  const i64 width = i64{size.width} + 2 * i64{growth.x}, height = i64{size.height} + 2 * i64{growth.y};
  if (width > kLargestSide || height > kLargestSide)
    throw bad_input(scene.file + ": " + layer.place + ".effects make the layer grow to " + std::to_string(width) +
                    " x " + std::to_string(height) + " pixels; a side has at most " + std::to_string(kLargestSide));
  return 3 * world_bytes(static_cast<i32>(width), static_cast<i32>(height), scene.depth);
}

// The whole sequence of matrices goes into one call, which makes the motion blur.
void transform(OwnedWorld& source, const std::vector<GX_Matrix3>& matrices, i32 quality, i32 field,
               const ZR_CompositeModePlus& mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
               OwnedWorld& target, const std::string& what) {
  const GX_LRect all = target.bounds();
  check(ZRHost_TransformWorld(&abort_on_interrupt(), quality, 0, field, source.layer(), &mode, tables, mask,
                              matrices.data(), static_cast<i32>(matrices.size()), true, &all, target.layer()),
        what);
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
  const bool mattes =
      std::any_of(scene.layers.begin(), scene.layers.end(), [](const Layer& layer) { return layer.matte.has_value(); });
  if (mattes) worlds *= 2;  // one to draw mattes in
  for (const Layer& layer : scene.layers)
    if (layer.image.empty()) worlds += world_bytes(layer.width, layer.height, scene.depth);
  for (const Layer& layer : scene.layers)
    if (!layer.mask.empty()) worlds += masked_bytes(scene, layer);
  for (const Layer& layer : scene.layers)
    if (!layer.effects.empty()) worlds += effect_bytes(scene, layer);
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
  for (const Layer& layer : scene.layers)
    if (!layer.mask.empty()) apply_mask(layer);
}

const OwnedWorld& Renderer::draw(i32 frame) {
  fill(canvas_, scene_.background, "background");
  for (const Layer& layer : scene_.layers) {
    stop_if_interrupted();
    composite(layer, frame);
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

// Where no matrix is needed the mask is the image itself, else the image drawn into a world of the frame's size.
ZR_MaskWorld Renderer::matte_of(const Layer& layer, i32 frame) {
  const TrackMatte& matte = *layer.matte;
  OwnedWorld& image = images_.at(matte.image);
  const std::vector<GX_Matrix3> matrices = matte.placement.matrices_of(frame);
  ZR_MaskWorld mask;
  mask.kind = matte.kind;
  if (matrices.size() == 1 && moves_whole_pixels(matrices[0])) {
    mask.world = *image.layer();
    mask.offset_x = static_cast<i32>(matrices[0].m[0][2]);
    mask.offset_y = static_cast<i32>(matrices[0].m[1][2]);
    return mask;
  }
  if (!matte_) matte_.emplace(scene_.width, scene_.height, scene_.depth);
  fill(*matte_, {0, 0, 0, 0}, layer.place + ".matte");
  transform(image, matrices, matte.placement.quality, 0, ZR_CompositeModePlus(XferCopy, 1.0f, nullptr, false, 0),
            nullptr, nullptr, *matte_, layer.place + ".matte");
  mask.world = *matte_->layer();
  mask.offset_x = mask.offset_y = 0;
  return mask;
}

// Others may show the same image, so the mask goes onto a copy.
void Renderer::apply_mask(const Layer& layer) {
  const std::string where = layer.place + ".mask";
  OwnedWorld picture = copied(own_pixels(layer), where);
  const OwnedMask mask =
      draw_mask(picture.width(), picture.height(), mask_depth_for(scene_.depth), layer.mask, {}, where);
  merge_mask(*mask, picture, where);
  masked_.emplace(&layer, std::move(picture));
}

OwnedWorld& Renderer::own_pixels(const Layer& layer) {
  if (const auto masked = masked_.find(&layer); masked != masked_.end()) return masked->second;
  return layer.image.empty() ? solids_.at(&layer) : images_.at(layer.image);
}

Renderer::Source Renderer::source_of(const Layer& layer, i32 frame) {
  OwnedWorld& own = own_pixels(layer);
  if (layer.effects.empty()) return {own, {0, 0}};
  const auto kept = filtered_.find(&layer);
  if (kept != filtered_.end() && stand_still(layer.effects)) return {kept->second.world, kept->second.grown};
  filtered_.erase(&layer);
  Filtered made = with_effects(own, layer.effects, frame, layer.place + ".effects");
  Filtered& filtered = filtered_.emplace(&layer, std::move(made)).first->second;
  return {filtered.world, filtered.grown};
}

void Renderer::composite(const Layer& layer, i32 frame) {
  if (scene_.field != 0 && layer.field != 0 && scene_.field != layer.field) return;  // no row is left
  const ZR_CompositeModePlus mode(layer.mode, static_cast<f32>(layer.opacity.at(frame)), nullptr, layer.keep_alpha,
                                  layer.seed);
  ZR_MaskWorld mask;
  if (layer.matte) mask = matte_of(layer, frame);
  const Source source = source_of(layer, frame);
  std::vector<GX_Matrix3> matrices = layer.placement.matrices_of(frame);
  for (GX_Matrix3& matrix : matrices) matrix = with_border(matrix, source.grown);
  transform(source.world, matrices, layer.placement.quality, scene_.field | layer.field, mode, tables_.get(),
            layer.matte ? &mask : nullptr, canvas_, layer.place);
}

}  // namespace zr::tool
