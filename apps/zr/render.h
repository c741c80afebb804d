// Draws the frames of a scene through the library's transfer rectangle.
#pragma once

#include <map>
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
  // Loads every image and makes every solid.
  explicit Renderer(const Scene& scene);
  // The picture of a frame; valid until the next call.
  const OwnedWorld& draw(i32 frame);
  size_t image_count() const { return images_.size(); }

 private:
  void composite(const Layer& layer, OwnedWorld& source, i32 frame);

  const Scene& scene_;
  OwnedWorld canvas_;
  std::map<std::string, OwnedWorld> images_;  // by file name
  std::map<const Layer*, OwnedWorld> solids_;
};

}  // namespace zr::tool
