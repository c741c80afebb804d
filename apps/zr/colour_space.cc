// Colour spaces by name or ICC file, and worlds from one space to another.
#include "colour_space.h"

#include <ZR/world.h>

#include <boost/make_shared.hpp>

#include <algorithm>
#include <filesystem>

#include "interrupt_state.h"
#include "library_messages_state.h"
#include "nearest_name.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

constexpr SpaceName kSpaces[] = {
    {"srgb", PRISMA_Profile_sRGB},
    {"srgb-linear", PRISMA_Profile_LinearSRGB},
    {"display-p3", PRISMA_Profile_DisplayP3},
    {"display-p3-linear", PRISMA_Profile_LinearDisplayP3},
    {"rec709", PRISMA_Profile_Rec709},
    {"rec2020", PRISMA_Profile_Rec2020},
    {"rec2020-linear", PRISMA_Profile_LinearRec2020},
    {"adobe-rgb", PRISMA_Profile_AdobeRGB},
    {"adobe-rgb-linear", PRISMA_Profile_LinearAdobeRGB},
    {"prophoto", PRISMA_Profile_ProPhoto},
    {"prophoto-linear", PRISMA_Profile_LinearProPhoto},
    {"acescg", PRISMA_Profile_ACEScg},
};

std::string without_hyphens(std::string text) {
  text.erase(std::remove(text.begin(), text.end(), '-'), text.end());
  return text;
}

const char* device_name(u32 space) {
  switch (space) {
    case PRISMA_Word("RGB "): return "an RGB";
    case PRISMA_Word("CMYK"): return "a CMYK";
    case PRISMA_Word("GRAY"): return "a grey";
    case PRISMA_Word("Lab "): return "a Lab";
    case PRISMA_Word("XYZ "): return "an XYZ";
    default: return "an unusual";
  }
}

// A profile of which nothing is known but that the text names it; a failure tells the thing by `what`.
template <class... Source>
Profile opened(const std::string& what, Source... source) {
  try {
    return boost::make_shared<TON_PRISMA_Profile>(source...);
  } catch (const i32 status) {
    if (status == ZR_Err_OutOfMemory) check(status, what);
    take_last_message();
    throw file_error(what + " is no usable ICC profile");
  }
}

// Calls body(world) with the library's view of a world.
template <class Body>
void with_view(const OwnedWorld& world, Body&& body) {
  with_pixel_of(world.depth(), [&]<class Pixel>() {
    ZR_WorldX<Pixel> view(world.layer()->data, world.width(), world.height(), world.layer()->row_bytes);
    body(view);
  });
}

}  // namespace

std::span<const SpaceName> all_spaces() { return kSpaces; }

std::optional<SpaceChoice> find_space(std::string_view text) {
  if (text.find_first_of("./") != std::string_view::npos) return SpaceChoice{nullptr, std::string(text)};
  std::string plain = plain_name(text);
  if (plain.rfind("linear-", 0) == 0) plain = plain.substr(7) + "-linear";
  for (const SpaceName& space : kSpaces)
    if (without_hyphens(space.name) == without_hyphens(plain)) return SpaceChoice{&space, {}};
  return std::nullopt;
}

std::string unknown_space(const std::string& text) {
  std::vector<std::string> names;
  for (const SpaceName& space : kSpaces) names.emplace_back(space.name);
  const std::vector<std::string> nearest = nearest_names(text, names);
  return "is an unknown colour space " + quoted_list({text.substr(0, 60)}) + "; the nearest " +
         (nearest.size() == 1 ? "is " : "are ") + quoted_list(nearest, " and ") +
         " (zr list spaces shows all; an ICC file has a '.' in its name)";
}

SpaceChoice parse_space(const std::string& text, const std::string& where) {
  if (const std::optional<SpaceChoice> space = find_space(text)) return *space;
  throw bad_input(where + ' ' + unknown_space(text));
}

Profile load_space(const SpaceChoice& space, Device device, const std::string& where) {
  if (space.named != nullptr) return standard_space(space.named->code);
  std::error_code error;
  if (!std::filesystem::exists(space.file, error))
    throw file_error(where + ": profile " + space.file + " does not exist");
  if (std::filesystem::is_directory(space.file, error)) throw file_error(where + ": " + space.file + " is a folder");
  const Profile profile = opened(where + ": " + space.file, space.file.c_str());
  const u32 found = with_engine(where, [&] { return profile->GetColourSpace(); });
  const bool fits = found == PRISMA_Word("RGB ") || (device == Device::kRgbOrInk && found == PRISMA_Word("CMYK"));
  if (!fits)
    throw file_error(where + ": " + space.file + " is " + device_name(found) + " profile; an RGB " +
                     (device == Device::kRgbOrInk ? "or CMYK " : "") + "one is needed");
  return profile;
}

Profile standard_space(PRISMA_ProfileCode code) {
  return with_engine("making a profile", [&] { return boost::make_shared<TON_PRISMA_Profile>(code); });
}

std::string space_name(const TON_PRISMA_Profile& profile) {
  const std::u16string name = with_engine("naming a profile", [&] { return TON_PRISMA_Profile_GetName(profile); });
  return std::filesystem::path(name).u8string().empty() ? "unnamed" : std::filesystem::path(name).string();
}

std::vector<u8> icc_data(const TON_PRISMA_Profile& profile) {
  return with_engine("reading a profile", [&] {
    size_t size = 0;
    const u8* const data = static_cast<const u8*>(profile.GetData(&size));
    return std::vector<u8>(data, data + size);
  });
}

Profile profile_of(const PictureColour& colour, const std::string& file, const std::string& where) {
  if (colour.icc.empty()) {
    if (colour.ink) throw file_error(where + ": " + file + " is CMYK without a profile, so its colours are not known");
    return standard_space(colour.floats ? PRISMA_Profile_LinearSRGB : PRISMA_Profile_sRGB);
  }
  const Profile profile =
      opened(where + ": what " + file + " carries", static_cast<const void*>(colour.icc.data()), colour.icc.size());
  const u32 found = with_engine(where, [&] { return profile->GetColourSpace(); });
  if (found != (colour.ink ? PRISMA_Word("CMYK") : PRISMA_Word("RGB ")))
    throw file_error(where + ": " + file + " carries " + device_name(found) + " profile; " +
                     (colour.ink ? "a CMYK" : "an RGB") + " one is needed");
  return profile;
}

bool same_space(const Profile& a, const Profile& b) {
  return with_engine("comparing profiles", [&] { return a->GetID() == b->GetID(); });
}

TON_PRISMA_Transform make_transform(const Profile& from, const Profile& to, i32 intent, const std::string& where) {
  return with_engine(where, [&] { return TON_PRISMA_Transform(*from, *to, intent, TON_GetDefaultPRISMAOptions()); });
}

void convert_world(OwnedWorld& world, const TON_PRISMA_Transform& transform, const std::string& where) {
  with_engine(where, [&] {
    with_view(world, [&](auto& view) {
      ZR_PRISMAApplyTransform(transform.Get(), &view, &view, false, &abort_on_interrupt());
    });
  });
}

OwnedWorld world_from_ink(const OwnedWorld& ink, i32 depth, const TON_PRISMA_Transform& transform,
                          const std::string& where) {
  OwnedWorld world(ink.width(), ink.height(), depth);
  with_engine(where, [&] {
    with_view(ink, [&](auto& from) {
      with_view(world, [&](auto& to) {
        to.FillAlpha();
        ZR_PRISMAApplyTransformSrcCMYK(transform.Get(), &from, &to, false, &abort_on_interrupt());
      });
    });
  });
  return world;
}

}  // namespace zr::tool
