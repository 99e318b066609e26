// Typed reading of scene values. Every reader names what it expected and what it got, and
// throws SceneError at the value's path.
#pragma once

#include <initializer_list>
#include <string>

#include <nlohmann/json.hpp>

#include "platform/d3d9_types.h"
#include "platform/d3dx_math.h"
#include "tools/scene/doc_path.h"
#include "tools/scene/transform.h"

namespace apescene {

// Keys keep the order they were written in, so channels are created and called in that order.
using Json = nlohmann::ordered_json;

// "a number", "a string", "an array of 2", "an object", "true", "null"...
std::string DescribeJson(const Json& value);

// Throws "<path>: expected <what>, got <DescribeJson(value)>".
[[noreturn]] void ThrowExpected(const DocPath& path, const std::string& what, const Json& value);

// A finite number.
float ReadNumber(const Json& value, const DocPath& path);
// A whole number in [minimum, maximum].
int ReadInteger(const Json& value, const DocPath& path, int minimum, int maximum);
bool ReadBool(const Json& value, const DocPath& path);
std::string ReadString(const Json& value, const DocPath& path);
// [x, y, z]
D3DXVECTOR3 ReadVector3(const Json& value, const DocPath& path);
// [r, g, b] or [r, g, b, a] with components 0..1, or "#RRGGBB" / "#AARRGGBB". Alpha defaults to 1.
D3DCOLOR ReadColor(const Json& value, const DocPath& path);
// Four rows of four numbers (row-vector convention: translation in the fourth row), or a
// transform {"translation": [x, y, z], "rotation": ..., "scale": s or [x, y, z]}.
D3DXMATRIX ReadMatrix(const Json& value, const DocPath& path);
// The same, keeping a transform's parts so that animation can blend them.
struct MatrixValue {
  bool IsTransform = false;
  Transform Parts;    // when IsTransform
  D3DXMATRIX Matrix;  // always: the composed matrix
};
MatrixValue ReadMatrixValue(const Json& value, const DocPath& path);

// An object whose keys are all among `allowed`; otherwise "<path>.<key>: unknown key (expected
// one of: ...)".
void CheckObject(const Json& value, const DocPath& path,
                 std::initializer_list<const char*> allowed);
// The member `key` of an object, which must be present: "<path>: missing key "<key>"".
const Json& Require(const Json& object, const DocPath& path, const char* key);
// The member or null when absent.
const Json* Find(const Json& object, const char* key);

}  // namespace apescene
