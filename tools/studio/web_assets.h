// The page's files, compiled into the program from tools/studio/web/ (web_assets.cpp.in), so
// that ape-studio runs from anywhere.
#pragma once

#include <string_view>

namespace apestudio {

// index.html holds "{{TOKEN}}" where the request's token goes.
std::string_view IndexHtml();
std::string_view StudioJs();
std::string_view StudioCss();

}  // namespace apestudio
