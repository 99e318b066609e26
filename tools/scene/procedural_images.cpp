#include "tools/scene/procedural_images.h"

#include <algorithm>
#include <cmath>
#include <cstdint>

namespace apescene {
namespace {

// Alpha of each shape at (x, y) in [-1, 1]^2.
float Dot(float x, float y) {
  const float r2 = x * x + y * y;
  return r2 >= 1.0f ? 0.0f : (1.0f - r2) * (1.0f - r2);
}

float Spark(float x, float y) {
  const float r = std::sqrt(x * x + y * y);
  const float core = std::exp(-(r / 0.18f) * (r / 0.18f));
  const float ray_x = std::exp(-(y / 0.05f) * (y / 0.05f)) * std::max(0.0f, 1.0f - std::fabs(x));
  const float ray_y = std::exp(-(x / 0.05f) * (x / 0.05f)) * std::max(0.0f, 1.0f - std::fabs(y));
  const float glow = 0.35f * Dot(x, y);
  return std::min(1.0f, core + 0.7f * (ray_x + ray_y) + glow);
}

float Ring(float x, float y) {
  const float d = (std::sqrt(x * x + y * y) - 0.7f) / 0.12f;
  return std::exp(-d * d);
}

// Smooth value noise on an 8 x 8 lattice from a fixed hash: the same picture every run.
float LatticeValue(int i, int j) {
  std::uint32_t h =
      static_cast<std::uint32_t>(i) * 374761393u + static_cast<std::uint32_t>(j) * 668265263u;
  h = (h ^ (h >> 13)) * 1274126177u;
  return static_cast<float>((h ^ (h >> 16)) & 0xFFFFu) / 65535.0f;
}

float Noise(float x, float y) {
  const float u = (x + 1.0f) * 4.0f, v = (y + 1.0f) * 4.0f;
  const int i = static_cast<int>(std::floor(u)), j = static_cast<int>(std::floor(v));
  const float fu = u - static_cast<float>(i), fv = v - static_cast<float>(j);
  const float su = fu * fu * (3.0f - 2.0f * fu), sv = fv * fv * (3.0f - 2.0f * fv);
  const float top = LatticeValue(i, j) + (LatticeValue(i + 1, j) - LatticeValue(i, j)) * su;
  const float bottom =
      LatticeValue(i, j + 1) + (LatticeValue(i + 1, j + 1) - LatticeValue(i, j + 1)) * su;
  return top + (bottom - top) * sv;
}

float Puff(float x, float y) {
  return Dot(x, y) * (0.55f + 0.45f * Noise(x, y));
}

struct Shape {
  const char* Name;
  float (*Alpha)(float, float);
};
constexpr Shape kShapes[] = {{"dot", Dot}, {"spark", Spark}, {"ring", Ring}, {"puff", Puff}};

}  // namespace

const std::vector<std::string>& ProceduralImageNames() {
  static const std::vector<std::string> names = [] {
    std::vector<std::string> list;
    for (const Shape& shape : kShapes) list.emplace_back(shape.Name);
    return list;
  }();
  return names;
}

bool MakeProceduralImage(const std::string& name, int size, Image* image) {
  const Shape* shape = nullptr;
  for (const Shape& candidate : kShapes)
    if (name == candidate.Name) shape = &candidate;
  if (shape == nullptr || size <= 0) return false;
  image->Width = image->Height = size;
  image->Argb.assign(static_cast<std::size_t>(size) * static_cast<std::size_t>(size), 0);
  for (int py = 0; py < size; ++py) {
    for (int px = 0; px < size; ++px) {
      // Pixel centres mapped to [-1, 1].
      const float x = (static_cast<float>(px) + 0.5f) / static_cast<float>(size) * 2.0f - 1.0f;
      const float y = (static_cast<float>(py) + 0.5f) / static_cast<float>(size) * 2.0f - 1.0f;
      const float alpha = std::clamp(shape->Alpha(x, y), 0.0f, 1.0f);
      const std::uint32_t a = static_cast<std::uint32_t>(std::lround(alpha * 255.0f));
      image->Argb[static_cast<std::size_t>(py) * size + static_cast<std::size_t>(px)] =
          (a << 24) | 0x00FFFFFFu;
    }
  }
  return true;
}

}  // namespace apescene
