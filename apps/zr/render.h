// Draws the frames of a scene through the library's layer transform.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "owned_world.h"
#include "scene.h"

namespace zr::tool {

// An image file that a scene uses, and where it says so, for messages.
struct SceneImage {
  std::string file, where;
};
// Each file once, in the order of the layers.
std::vector<SceneImage> images_of(const Scene& scene);

// Opens every image of the scene (headers only) and adds up what rendering needs: worlds at the scene's
// depth, the largest file being decoded, and rows on their way out. Throws ToolError for a bad image.
u64 memory_needed(const Scene& scene);

// Lives while the host lives.
class Renderer {
 public:
  // Loads every image, takes it to the working space, and makes every solid.
  explicit Renderer(const Scene& scene);
  // The picture of a frame; valid until the next call.
  const OwnedWorld& draw(i32 frame);
  // ICC data for the files, empty without a working space.
  const std::vector<u8>& output_icc() const { return output_icc_; }
  size_t image_count() const { return images_.size(); }

 private:
  void choose_spaces();
  OwnedWorld load(const SceneImage& image) const;
  void apply_mask(const Layer& layer);
  OwnedWorld& own_pixels(const Layer& layer);
  ZR_MaskWorld matte_of(const Layer& layer, i32 frame);
  // A layer's pixels after its mask and effects, and what they have added on each side.
  struct Source {
    OwnedWorld& world;
    GX_LPoint grown;
  };
  Source source_of(const Layer& layer, i32 frame);
  void composite(const Layer& layer, i32 frame);

  const Scene& scene_;
  Profile working_, output_;  // empty: values are taken as they are
  boost::shared_ptr<ZR_LinearBlendingTables> tables_;
  TON_PRISMA_Transform to_output_;  // empty: nothing to convert
  std::vector<u8> output_icc_;
  OwnedWorld canvas_;
  std::optional<OwnedWorld> matte_;           // of the frame's size, once a matte needs it
  std::map<std::string, OwnedWorld> images_;  // by file name
  std::map<const Layer*, OwnedWorld> solids_;
  std::map<const Layer*, OwnedWorld> masked_;  // pixels of layers with a mask, after it
  std::map<const Layer*, Filtered> filtered_;  // after effects: for all frames, or the latest
};

}  // namespace zr::tool
