#include "tools/scene/json_values.h"

#include <cmath>
#include <limits>

#include "tools/scene/scene_error.h"

namespace apescene {
namespace {

int HexValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

// A colour component 0..1 as a byte, rounded.
std::uint32_t UnitToByte(const Json& value, const DocPath& path) {
  const float unit = ReadNumber(value, path);
  if (unit < 0.0f || unit > 1.0f)
    throw SceneError(path, "expected a colour component from 0 to 1, got " + value.dump());
  return static_cast<std::uint32_t>(std::lround(unit * 255.0f));
}

Transform ReadTransform(const Json& value, const DocPath& path) {
  CheckObject(value, path, {"translation", "rotation", "scale"});
  Transform transform;
  if (const Json* t = Find(value, "translation"))
    transform.Translation = ReadVector3(*t, path.Key("translation"));
  if (const Json* r = Find(value, "rotation")) {
    const DocPath rotation_path = path.Key("rotation");
    if (r->is_object()) {
      CheckObject(*r, rotation_path, {"yaw", "pitch", "roll"});
      transform.Order = Transform::RotationOrder::YawPitchRoll;
      const char* names[3] = {"yaw", "pitch", "roll"};
      float* parts[3] = {&transform.RotationDegrees.x, &transform.RotationDegrees.y,
                         &transform.RotationDegrees.z};
      for (int i = 0; i < 3; ++i)
        if (const Json* angle = Find(*r, names[i]))
          *parts[i] = ReadNumber(*angle, rotation_path.Key(names[i]));
    } else if (r->is_array()) {
      transform.RotationDegrees = ReadVector3(*r, rotation_path);
    } else {
      ThrowExpected(rotation_path,
                    "a rotation in degrees, [x, y, z] or {\"yaw\", \"pitch\", \"roll\"}", *r);
    }
  }
  if (const Json* s = Find(value, "scale")) {
    const DocPath scale_path = path.Key("scale");
    if (s->is_number()) {
      const float uniform = ReadNumber(*s, scale_path);
      transform.Scale = {uniform, uniform, uniform};
    } else if (s->is_array()) {
      transform.Scale = ReadVector3(*s, scale_path);
    } else {
      ThrowExpected(scale_path, "a scale, a number or [x, y, z]", *s);
    }
  }
  return transform;
}

}  // namespace

std::string DescribeJson(const Json& value) {
  switch (value.type()) {
    case Json::value_t::null:
      return "null";
    case Json::value_t::boolean:
      return value.get<bool>() ? "true" : "false";
    case Json::value_t::number_integer:
    case Json::value_t::number_unsigned:
    case Json::value_t::number_float:
      return "a number";
    case Json::value_t::string:
      return "a string";
    case Json::value_t::array:
      return value.empty() ? "an empty array" : "an array of " + std::to_string(value.size());
    case Json::value_t::object:
      return "an object";
    default:
      return "a value of another kind";
  }
}

void ThrowExpected(const DocPath& path, const std::string& what, const Json& value) {
  throw SceneError(path, "expected " + what + ", got " + DescribeJson(value));
}

float ReadNumber(const Json& value, const DocPath& path) {
  if (!value.is_number()) ThrowExpected(path, "a number", value);
  const double number = value.get<double>();
  if (!std::isfinite(number) || std::fabs(number) > std::numeric_limits<float>::max())
    throw SceneError(path, "expected a number, got one too large for a float");
  return static_cast<float>(number);
}

int ReadInteger(const Json& value, const DocPath& path, int minimum, int maximum) {
  const std::string what =
      "a whole number from " + std::to_string(minimum) + " to " + std::to_string(maximum);
  if (!value.is_number()) ThrowExpected(path, what, value);
  const double number = value.get<double>();
  // Compared as doubles first, so that the conversion below is always defined.
  if (!(number >= minimum && number <= maximum) || number != std::floor(number))
    throw SceneError(path, "expected " + what + ", got " + value.dump());
  return static_cast<int>(number);
}

bool ReadBool(const Json& value, const DocPath& path) {
  if (!value.is_boolean()) ThrowExpected(path, "true or false", value);
  return value.get<bool>();
}

std::string ReadString(const Json& value, const DocPath& path) {
  if (!value.is_string()) ThrowExpected(path, "a string", value);
  return value.get<std::string>();
}

D3DXVECTOR3 ReadVector3(const Json& value, const DocPath& path) {
  if (!value.is_array() || value.size() != 3) ThrowExpected(path, "a 3-vector [x, y, z]", value);
  return {ReadNumber(value[0], path.Index(0)), ReadNumber(value[1], path.Index(1)),
          ReadNumber(value[2], path.Index(2))};
}

D3DCOLOR ReadColor(const Json& value, const DocPath& path) {
  const char* what = "a colour, [r, g, b], [r, g, b, a] from 0 to 1, or \"#RRGGBB\"";
  if (value.is_string()) {
    const std::string text = value.get<std::string>();
    if ((text.size() != 7 && text.size() != 9) || text[0] != '#')
      throw SceneError(path, std::string("expected ") + what + ", got \"" + text + "\"");
    std::uint32_t bits = 0;
    for (std::size_t i = 1; i < text.size(); ++i) {
      const int digit = HexValue(text[i]);
      if (digit < 0)
        throw SceneError(path, std::string("expected ") + what + ", got \"" + text + "\"");
      bits = (bits << 4) | static_cast<std::uint32_t>(digit);
    }
    return text.size() == 7 ? (0xFF000000u | bits) : bits;
  }
  if (!value.is_array() || (value.size() != 3 && value.size() != 4))
    ThrowExpected(path, what, value);
  std::uint32_t c[4] = {0, 0, 0, 255};
  for (std::size_t i = 0; i < value.size(); ++i) c[i] = UnitToByte(value[i], path.Index(i));
  return D3DCOLOR_ARGB(c[3], c[0], c[1], c[2]);
}

MatrixValue ReadMatrixValue(const Json& value, const DocPath& path) {
  MatrixValue result;
  if (value.is_object()) {
    result.IsTransform = true;
    result.Parts = ReadTransform(value, path);
    result.Matrix = ComposeTransform(result.Parts);
    return result;
  }
  const char* what = "a 4x4 matrix (four rows of four numbers) or a transform object";
  if (!value.is_array() || value.size() != 4) ThrowExpected(path, what, value);
  for (std::size_t row = 0; row < 4; ++row) {
    const Json& cells = value[row];
    if (!cells.is_array() || cells.size() != 4)
      ThrowExpected(path.Index(row), "a matrix row of four numbers", cells);
    for (std::size_t col = 0; col < 4; ++col)
      result.Matrix.m[row][col] = ReadNumber(cells[col], path.Index(row).Index(col));
  }
  return result;
}

D3DXMATRIX ReadMatrix(const Json& value, const DocPath& path) {
  return ReadMatrixValue(value, path).Matrix;
}

void CheckObject(const Json& value, const DocPath& path,
                 std::initializer_list<const char*> allowed) {
  if (!value.is_object()) ThrowExpected(path, "an object", value);
  for (const auto& item : value.items()) {
    bool known = false;
    for (const char* name : allowed) known = known || item.key() == name;
    if (known) continue;
    std::string list;
    for (const char* name : allowed) list += std::string(list.empty() ? "" : ", ") + name;
    throw SceneError(path.Key(item.key()), "unknown key (expected one of: " + list + ")");
  }
}

const Json& Require(const Json& object, const DocPath& path, const char* key) {
  const Json* member = Find(object, key);
  if (member == nullptr) throw SceneError(path, std::string("missing key \"") + key + "\"");
  return *member;
}

const Json* Find(const Json& object, const char* key) {
  if (!object.is_object()) return nullptr;
  const auto found = object.find(key);
  return found == object.end() ? nullptr : &*found;
}

}  // namespace apescene
