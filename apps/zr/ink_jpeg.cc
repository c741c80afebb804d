// CMYK JPEG files by the JPEG library itself.
#include "ink_jpeg.h"

#include <csetjmp>
#include <cstdio>
#include <memory>

#include <jpeglib.h>

#include "interrupt_state.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

struct Failure {
  jpeg_error_mgr base;  // first, as the library hands out a pointer to it
  std::jmp_buf back;
  char reason[JMSG_LENGTH_MAX];
};

void leave(j_common_ptr state) {
  Failure* const failure = reinterpret_cast<Failure*>(state->err);
  failure->base.format_message(state, failure->reason);
  std::longjmp(failure->back, 1);
}

// A file that breaks off is only worth a warning to the library, which goes on with grey.
void note(j_common_ptr state, int level) {
  if (level < 0) leave(state);
}

// No object with a destructor lives in here, since failures jump out of it.
bool decode(std::FILE* stream, jpeg_decompress_struct& state, Failure& failure, InkImage& image) {
  if (setjmp(failure.back) != 0) return false;
  jpeg_create_decompress(&state);
  jpeg_stdio_src(&state, stream);
  jpeg_read_header(&state, TRUE);
  state.out_color_space = JCS_CMYK;
  jpeg_start_decompress(&state);
  image.width = static_cast<i32>(state.output_width);
  image.height = static_cast<i32>(state.output_height);
  const size_t row_bytes = static_cast<size_t>(state.output_width) * 4;
  image.values.resize(row_bytes * static_cast<size_t>(state.output_height));
  while (state.output_scanline < state.output_height && !interrupted()) {
    JSAMPROW row = image.values.data() + row_bytes * static_cast<size_t>(state.output_scanline);
    jpeg_read_scanlines(&state, &row, 1);
  }
  // Files with the Adobe mark hold the absence of ink.
  if (state.saw_Adobe_marker)
    for (u8& value : image.values) value = static_cast<u8>(255 - value);
  return true;
}

}  // namespace

InkImage read_ink_jpeg(const std::string& file, const std::string& where) {
  const std::unique_ptr<std::FILE, int (*)(std::FILE*)> stream(std::fopen(file.c_str(), "rb"), &std::fclose);
  if (!stream) throw file_error(where + ": " + file + " cannot be read");
  Failure failure{};
  jpeg_decompress_struct state{};
  state.err = jpeg_std_error(&failure.base);
  failure.base.error_exit = &leave;
  failure.base.emit_message = &note;
  InkImage image;
  const bool read = decode(stream.get(), state, failure, image);
  jpeg_destroy_decompress(&state);
  stop_if_interrupted();
  if (!read) throw file_error(where + ": " + file + " cannot be read: " + failure.reason);
  return image;
}

}  // namespace zr::tool
