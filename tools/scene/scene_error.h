// The one kind of failure a scene file can cause: a message for people, tied to a place in the
// document. The loader adds the file name and the line when it reports it.
#pragma once

#include <stdexcept>
#include <string>

#include "tools/scene/doc_path.h"

namespace apescene {

class SceneError : public std::runtime_error {
 public:
  SceneError(DocPath path, const std::string& message)
      : std::runtime_error(message), path_(std::move(path)) {}
  const DocPath& Path() const { return path_; }

 private:
  DocPath path_;
};

}  // namespace apescene
