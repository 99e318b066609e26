// PNG files through libpng.
#pragma once

#include <string>

#include "tools/scene/image.h"

namespace apescene {

// Any PNG (grey, palette, 16-bit...) as A8R8G8B8. False with a message naming the file.
bool ReadPng(const std::string& path, Image* image, std::string* error);
// Writes RGB, or RGBA when `keep_alpha`. False with a message naming the file.
bool WritePng(const std::string& path, const Image& image, bool keep_alpha, std::string* error);

}  // namespace apescene
