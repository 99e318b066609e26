#include "tools/studio/scene_document.h"

namespace apestudio {
namespace {

constexpr std::size_t kMaximumPathLength = 16;
constexpr std::size_t kMaximumKeyLength = 200;

bool IsIndex(const Json& step) {
  return step.is_number_unsigned() || (step.is_number_integer() && step.get<long long>() >= 0);
}

// Whether a path step is usable: a key of reasonable length or an index.
bool ValidStep(const Json& step) {
  if (step.is_string()) return step.get_ref<const std::string&>().size() <= kMaximumKeyLength;
  return IsIndex(step);
}

}  // namespace

SceneDocument::SceneDocument(Json root) : root_(std::move(root)) {}

bool SceneDocument::WithEdit(const Json& path, const Json& value, Json* result,
                             std::string* error) const {
  if (!path.is_array() || path.empty() || path.size() > kMaximumPathLength) {
    *error = "the edit's path must be a list of 1 to 16 keys and indices";
    return false;
  }
  for (const Json& step : path) {
    if (!ValidStep(step)) {
      *error = "each step of the path must be a key (a string) or an index (0 or more)";
      return false;
    }
  }
  Json next = root_;
  Json* place = &next;
  for (std::size_t i = 0; i + 1 < path.size(); ++i) {
    const Json& step = path[i];
    if (step.is_string() && place->is_object()) {
      place = &(*place)[step.get<std::string>()];  // adds a missing member as null
      if (place->is_null()) *place = Json::object();
    } else if (IsIndex(step) && place->is_array() && step.get<std::size_t>() < place->size()) {
      place = &(*place)[step.get<std::size_t>()];
    } else {
      *error = "the path leads nowhere in the scene (step " + std::to_string(i + 1) + ")";
      return false;
    }
  }
  const Json& last = path.back();
  if (last.is_string() && place->is_object()) {
    if (value.is_null()) {
      place->erase(last.get<std::string>());
    } else {
      (*place)[last.get<std::string>()] = value;
    }
  } else if (IsIndex(last) && place->is_array() && last.get<std::size_t>() <= place->size()) {
    const std::size_t index = last.get<std::size_t>();
    if (value.is_null()) {
      if (index < place->size()) place->erase(index);
    } else if (index == place->size()) {
      place->push_back(value);
    } else {
      (*place)[index] = value;
    }
  } else {
    *error = "the path leads nowhere in the scene (its last step)";
    return false;
  }
  *result = std::move(next);
  return true;
}

void SceneDocument::Commit(Json next) {
  undo_.push_back(std::move(root_));
  if (undo_.size() > kHistoryLimit) undo_.erase(undo_.begin());
  redo_.clear();
  root_ = std::move(next);
}

bool SceneDocument::Undo() {
  if (undo_.empty()) return false;
  redo_.push_back(std::move(root_));
  root_ = std::move(undo_.back());
  undo_.pop_back();
  return true;
}

bool SceneDocument::Redo() {
  if (redo_.empty()) return false;
  undo_.push_back(std::move(root_));
  root_ = std::move(redo_.back());
  redo_.pop_back();
  return true;
}

}  // namespace apestudio
