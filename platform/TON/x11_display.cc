// Asking an X11 server for the profile of a monitor. libxcb is looked up when it is needed, so that the
// library does not depend on it; a protocol error is an empty reply there and never ends the process.
#include "TON/x11_display.h"

#include <dlfcn.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace zr::prisma {
namespace {

// The part of libxcb's binary interface that is called.
struct Connection;
struct Cookie {
  unsigned sequence;
};
struct Screen {
  u32 root;
};
struct ScreenIterator {
  Screen* data;
  int left, index;
};
struct AtomReply {
  u8 type, unused;
  u16 sequence;
  u32 length, atom;
};
struct GeometryReply {
  u8 type, depth;
  u16 sequence;
  u32 length, root;
  i16 x, y;
  u16 width, height, border;
};
struct TranslateReply {
  u8 type, same_screen;
  u16 sequence;
  u32 length, child;
  i16 x, y;
};
struct MonitorRect {  // of Xinerama
  i16 x, y;
  u16 width, height;
};

class Library {
 public:
  explicit Library(const char* name) : handle_(dlopen(name, RTLD_LAZY | RTLD_LOCAL)) {}
  Library(const Library&) = delete;
  Library& operator=(const Library&) = delete;
  ~Library() {
    if (handle_ != nullptr) dlclose(handle_);
  }
  template <class Function>
  bool find(const char* name, Function*& out) const {
    out = handle_ != nullptr ? reinterpret_cast<Function*>(dlsym(handle_, name)) : nullptr;
    return out != nullptr;
  }

 private:
  void* handle_;
};

struct Xcb {
  Library library{"libxcb.so.1"}, monitors{"libxcb-xinerama.so.0"};
  Connection* (*connect)(const char*, int*);
  int (*has_error)(Connection*);
  void (*disconnect)(Connection*);
  const void* (*setup)(Connection*);
  ScreenIterator (*screens)(const void*);
  Cookie (*intern)(Connection*, u8, u16, const char*);
  AtomReply* (*intern_reply)(Connection*, Cookie, void**);
  Cookie (*property)(Connection*, u8, u32, u32, u32, u32, u32);
  void* (*property_reply)(Connection*, Cookie, void**);
  void* (*property_value)(const void*);
  int (*property_length)(const void*);
  Cookie (*geometry)(Connection*, u32);
  GeometryReply* (*geometry_reply)(Connection*, Cookie, void**);
  Cookie (*translate)(Connection*, u32, u32, i16, i16);
  TranslateReply* (*translate_reply)(Connection*, Cookie, void**);

  bool found() {
    return library.find("xcb_connect", connect) && library.find("xcb_connection_has_error", has_error) &&
           library.find("xcb_disconnect", disconnect) && library.find("xcb_get_setup", setup) &&
           library.find("xcb_setup_roots_iterator", screens) && library.find("xcb_intern_atom", intern) &&
           library.find("xcb_intern_atom_reply", intern_reply) && library.find("xcb_get_property", property) &&
           library.find("xcb_get_property_reply", property_reply) &&
           library.find("xcb_get_property_value", property_value) &&
           library.find("xcb_get_property_value_length", property_length) &&
           library.find("xcb_get_geometry", geometry) && library.find("xcb_get_geometry_reply", geometry_reply) &&
           library.find("xcb_translate_coordinates", translate) &&
           library.find("xcb_translate_coordinates_reply", translate_reply);
  }
};

struct Free {
  void operator()(void* reply) const { std::free(reply); }
};
template <class Reply>
using ReplyPtr = std::unique_ptr<Reply, Free>;

// Number of the monitor under the middle of a window; 0, the first, when that cannot be told.
u32 monitor_of(const Xcb& x, Connection* to, u32 root, u32 window) {
  Cookie (*query)(Connection*);
  void* (*query_reply)(Connection*, Cookie, void**);
  MonitorRect* (*rects)(const void*);
  int (*count)(const void*);
  if (!x.monitors.find("xcb_xinerama_query_screens", query) ||
      !x.monitors.find("xcb_xinerama_query_screens_reply", query_reply) ||
      !x.monitors.find("xcb_xinerama_query_screens_screen_info", rects) ||
      !x.monitors.find("xcb_xinerama_query_screens_screen_info_length", count))
    return 0;
  const ReplyPtr<GeometryReply> size(x.geometry_reply(to, x.geometry(to, window), nullptr));
  if (size == nullptr) return 0;
  const ReplyPtr<TranslateReply> middle(x.translate_reply(
      to, x.translate(to, window, root, static_cast<i16>(size->width / 2), static_cast<i16>(size->height / 2)),
      nullptr));
  const ReplyPtr<void> all(query_reply(to, query(to), nullptr));
  if (middle == nullptr || all == nullptr) return 0;
  for (int i = 0; i < count(all.get()); ++i) {
    const MonitorRect& one = rects(all.get())[i];
    if (middle->x >= one.x && middle->x < one.x + one.width && middle->y >= one.y && middle->y < one.y + one.height)
      return static_cast<u32>(i);
  }
  return 0;
}

Counted<u8> property_bytes(const Xcb& x, Connection* to, u32 root, const char* name) {
  const ReplyPtr<AtomReply> atom(
      x.intern_reply(to, x.intern(to, 1, static_cast<u16>(std::strlen(name)), name), nullptr));
  if (atom == nullptr || atom->atom == 0) return {};
  constexpr u32 any_type = 0, longest = 16u << 20;  // in words
  const ReplyPtr<void> reply(x.property_reply(to, x.property(to, 0, root, atom->atom, any_type, 0, longest), nullptr));
  if (reply == nullptr || x.property_length(reply.get()) <= 0) return {};
  const u8* const bytes = static_cast<const u8*>(x.property_value(reply.get()));
  return Counted<u8>(bytes, bytes + x.property_length(reply.get()));
}

}  // namespace

Counted<u8> profile_of_x11_display(const void* window) {
  if (const char* display = std::getenv("DISPLAY"); display == nullptr || *display == '\0') return {};
  Xcb x;
  if (!x.found()) return {};
  Connection* const to = x.connect(nullptr, nullptr);
  struct Disconnect {
    const Xcb& x;
    Connection* to;
    ~Disconnect() { x.disconnect(to); }
  } const disconnect{x, to};
  if (x.has_error(to) != 0) return {};
  const ScreenIterator first = x.screens(x.setup(to));
  if (first.left < 1) return {};
  const u32 root = first.data->root;
  const u32 monitor =
      window != nullptr ? monitor_of(x, to, root, static_cast<u32>(reinterpret_cast<uintptr_t>(window))) : 0;
  char name[40] = "_ICC_PROFILE";
  if (monitor != 0) std::snprintf(name, sizeof name, "_ICC_PROFILE_%u", monitor);
  return property_bytes(x, to, root, name);
}

}  // namespace zr::prisma
