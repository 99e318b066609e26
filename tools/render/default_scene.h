// The scene ape-render draws when it is given none: scenes/fountain.json, compiled in so that
// the program needs no file.
#pragma once

namespace aperender {

const char* DefaultSceneText();
inline constexpr char kDefaultSceneName[] = "<built-in fountain>";

}  // namespace aperender
