#include "tools/render/tile_label.h"

#include <algorithm>
#include <cstdio>

namespace aperender {
namespace {

constexpr int kGlyphWidth = 5;
constexpr int kGlyphHeight = 7;
constexpr int kMargin = 2;  // font pixels around the text
constexpr std::uint32_t kInk = 0xFFFFFFFFu;
constexpr std::uint32_t kBox = 0xFF000000u;

struct Glyph {
  char Character;
  const char* Rows[kGlyphHeight];  // '#' marks a pixel
};

constexpr Glyph kGlyphs[] = {
    {'0', {" ### ", "#   #", "#  ##", "# # #", "##  #", "#   #", " ### "}},
    {'1', {"  #  ", " ##  ", "  #  ", "  #  ", "  #  ", "  #  ", " ### "}},
    {'2', {" ### ", "#   #", "    #", "   # ", "  #  ", " #   ", "#####"}},
    {'3', {"#####", "   # ", "  #  ", "   # ", "    #", "#   #", " ### "}},
    {'4', {"   # ", "  ## ", " # # ", "#  # ", "#####", "   # ", "   # "}},
    {'5', {"#####", "#    ", "#### ", "    #", "    #", "#   #", " ### "}},
    {'6', {"  ## ", " #   ", "#    ", "#### ", "#   #", "#   #", " ### "}},
    {'7', {"#####", "    #", "   # ", "  #  ", " #   ", " #   ", " #   "}},
    {'8', {" ### ", "#   #", "#   #", " ### ", "#   #", "#   #", " ### "}},
    {'9', {" ### ", "#   #", "#   #", " ####", "    #", "   # ", " ##  "}},
    {'.', {"     ", "     ", "     ", "     ", "     ", " ##  ", " ##  "}},
    {'a', {"     ", "     ", " ### ", "    #", " ####", "#   #", " ####"}},
    {'e', {"     ", "     ", " ### ", "#   #", "#####", "#    ", " ### "}},
    {'f', {"  ## ", " #  #", " #   ", "###  ", " #   ", " #   ", " #   "}},
    {'m', {"     ", "     ", "## # ", "# # #", "# # #", "#   #", "#   #"}},
    {'r', {"     ", "     ", "# ## ", "##  #", "#    ", "#    ", "#    "}},
    {'s', {"     ", "     ", " ####", "#    ", " ### ", "    #", "#### "}},
};

const Glyph* GlyphOf(char c) {
  for (const Glyph& glyph : kGlyphs)
    if (glyph.Character == c) return &glyph;
  return nullptr;
}

void Fill(apescene::Image* picture, int left, int top, int width, int height, std::uint32_t argb) {
  for (int y = std::max(0, top); y < std::min(picture->Height, top + height); ++y)
    for (int x = std::max(0, left); x < std::min(picture->Width, left + width); ++x)
      picture->Argb[static_cast<std::size_t>(y) * static_cast<std::size_t>(picture->Width) +
                    static_cast<std::size_t>(x)] = argb;
}

}  // namespace

std::string TileCaption(int frame, double seconds) {
  char text[64];
  std::snprintf(text, sizeof text, "frame %d  %.2f s", frame, seconds);
  return text;
}

void DrawCaption(apescene::Image* picture, const std::string& text, int scale) {
  if (text.empty() || scale < 1) return;
  const int advance = (kGlyphWidth + 1) * scale;
  const int width = static_cast<int>(text.size()) * advance - scale + 2 * kMargin * scale;
  Fill(picture, 0, 0, width, (kGlyphHeight + 2 * kMargin) * scale, kBox);
  for (std::size_t i = 0; i < text.size(); ++i) {
    const Glyph* glyph = GlyphOf(text[i]);
    if (glyph == nullptr) continue;
    const int left = kMargin * scale + static_cast<int>(i) * advance;
    for (int row = 0; row < kGlyphHeight; ++row)
      for (int column = 0; column < kGlyphWidth; ++column)
        if (glyph->Rows[row][column] == '#')
          Fill(picture, left + column * scale, (kMargin + row) * scale, scale, scale, kInk);
  }
}

}  // namespace aperender
