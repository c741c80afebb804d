// Colour spaces by name or ICC file, what a picture's values mean, and worlds from one space to another.
#pragma once

#include <ZR/colour_transform.h>

#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "owned_world.h"

namespace zr::tool {

using Profile = boost::shared_ptr<TON_PRISMA_Profile>;

struct SpaceName {
  const char* name;
  PRISMA_ProfileCode code;
};
std::span<const SpaceName> all_spaces();

// One of the spaces by name, or else an ICC file.
struct SpaceChoice {
  const SpaceName* named = nullptr;
  std::string file;
};
// A text with a '.' or a '/' is a file, anything else a name: letter case, '_' and ' ' do not count, and
// "linear-..." is "...-linear". Empty for an unknown name.
std::optional<SpaceChoice> find_space(std::string_view text);
// "is an unknown colour space "srbg"; the nearest is "srgb" ..."
std::string unknown_space(const std::string& text);
// The same with `where` in front of the message of the ToolError.
SpaceChoice parse_space(const std::string& text, const std::string& where);

// What follows lives while the host lives and throws ToolError; `where` begins messages.

enum class Device { kRgb, kRgbOrInk };
Profile load_space(const SpaceChoice& space, Device device, const std::string& where);
Profile standard_space(PRISMA_ProfileCode code);
std::string space_name(const TON_PRISMA_Profile& profile);
std::vector<u8> icc_data(const TON_PRISMA_Profile& profile);

// What a file says about its values.
struct PictureColour {
  bool ink = false;     // cyan, magenta, yellow, black
  bool floats = false;  // channels are floats or halves
  std::vector<u8> icc;  // the profile inside of the file; empty: none
};
// The file's own profile; without one integer pictures are sRGB and floats linear sRGB. Ink has no usual
// profile: without one it is an error.
Profile profile_of(const PictureColour& colour, const std::string& file, const std::string& where);

// Alpha stays as it is. Profiles with the same bytes leave the values as they are.
TON_PRISMA_Transform make_transform(const Profile& from, const Profile& to, i32 intent, const std::string& where);
void convert_world(OwnedWorld& world, const TON_PRISMA_Transform& transform, const std::string& where);
// `ink` is a 16-bit world of ink amounts; the result is opaque.
OwnedWorld world_from_ink(const OwnedWorld& ink, i32 depth, const TON_PRISMA_Transform& transform,
                          const std::string& where);
bool same_space(const Profile& a, const Profile& b);

// Runs `body`; a status that the library throws becomes a ToolError.
template <class Body>
decltype(auto) with_engine(const std::string& where, Body&& body) {
  try {
    return body();
  } catch (const i32 status) {
    check(status, where);
    throw;  // not reached: a status is never 0
  }
}

}  // namespace zr::tool
