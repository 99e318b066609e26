// The scene being edited, as its JSON document, with the edits' history for undo and redo. An
// edit replaces one value at a path; the caller checks the resulting document (by loading it)
// before committing it, so a refused edit leaves the document as it was.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "tools/scene/json_values.h"

namespace apestudio {

using Json = apescene::Json;

class SceneDocument {
 public:
  explicit SceneDocument(Json root);

  const Json& Root() const { return root_; }

  // The document with the value at `path` (a list of object keys and array indices) replaced:
  // missing object members are added, an index one past an array's end appends, and null
  // removes the member or element. False with the reason in *error when the path is malformed
  // or leads nowhere.
  bool WithEdit(const Json& path, const Json& value, Json* result, std::string* error) const;

  // Makes `next` the document; the previous one can be brought back by Undo.
  void Commit(Json next);
  bool Undo();
  bool Redo();
  std::size_t UndoDepth() const { return undo_.size(); }
  std::size_t RedoDepth() const { return redo_.size(); }

  // The most edits remembered for undo.
  static constexpr std::size_t kHistoryLimit = 200;

 private:
  Json root_;
  std::vector<Json> undo_;
  std::vector<Json> redo_;
};

}  // namespace apestudio
