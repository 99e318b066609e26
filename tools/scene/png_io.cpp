#include "tools/scene/png_io.h"

#include <png.h>

#include <cstring>

namespace apescene {

bool ReadPng(const std::string& path, Image* image, std::string* error) {
  png_image png;
  std::memset(&png, 0, sizeof png);
  png.version = PNG_IMAGE_VERSION;
  if (!png_image_begin_read_from_file(&png, path.c_str())) {
    *error = "cannot read PNG file \"" + path + "\": " + png.message;
    return false;
  }
  png.format = PNG_FORMAT_RGBA;
  std::vector<png_byte> bytes(PNG_IMAGE_SIZE(png));
  if (!png_image_finish_read(&png, nullptr, bytes.data(), 0, nullptr)) {
    *error = "cannot read PNG file \"" + path + "\": " + png.message;
    png_image_free(&png);
    return false;
  }
  image->Width = static_cast<int>(png.width);
  image->Height = static_cast<int>(png.height);
  image->Argb.resize(static_cast<std::size_t>(png.width) * png.height);
  for (std::size_t i = 0; i < image->Argb.size(); ++i) {
    const png_byte* p = &bytes[i * 4];
    image->Argb[i] = (std::uint32_t{p[3]} << 24) | (std::uint32_t{p[0]} << 16) |
                     (std::uint32_t{p[1]} << 8) | std::uint32_t{p[2]};
  }
  return true;
}

bool WritePng(const std::string& path, const Image& image, bool keep_alpha, std::string* error) {
  png_image png;
  std::memset(&png, 0, sizeof png);
  png.version = PNG_IMAGE_VERSION;
  png.width = static_cast<png_uint_32>(image.Width);
  png.height = static_cast<png_uint_32>(image.Height);
  png.format = keep_alpha ? PNG_FORMAT_RGBA : PNG_FORMAT_RGB;
  const std::size_t channels = keep_alpha ? 4 : 3;
  std::vector<png_byte> bytes(image.Argb.size() * channels);
  for (std::size_t i = 0; i < image.Argb.size(); ++i) {
    const std::uint32_t p = image.Argb[i];
    png_byte* out = &bytes[i * channels];
    out[0] = static_cast<png_byte>(p >> 16);
    out[1] = static_cast<png_byte>(p >> 8);
    out[2] = static_cast<png_byte>(p);
    if (keep_alpha) out[3] = static_cast<png_byte>(p >> 24);
  }
  if (!png_image_write_to_file(&png, path.c_str(), 0, bytes.data(), 0, nullptr)) {
    *error = "cannot write PNG file \"" + path + "\": " + png.message;
    return false;
  }
  return true;
}

}  // namespace apescene
