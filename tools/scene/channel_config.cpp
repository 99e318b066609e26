// Per-type settings of a channel definition: values, envelopes, textures, meshes, collision
// objects and attractors. Types without settings of their own take only links.
#include <algorithm>
#include <cstdio>

#include "host/attractor.h"
#include "host/envelope_storage.h"
#include "host/link_channels.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"
#include "host/type_guids.h"
#include "tools/scene/mesh_building.h"
#include "tools/scene/png_io.h"
#include "tools/scene/procedural_images.h"
#include "tools/scene/scene_builder.h"
#include "tools/scene/scene_error.h"

namespace apescene {
namespace {

// Textures larger than this a side are refused (64 MB of pixels at most).
constexpr int kMaximumTextureSize = 4096;

const std::function<float(const Json&, const DocPath&)> kNumber = ReadNumber;
const std::function<D3DXVECTOR3(const Json&, const DocPath&)> kVector = ReadVector3;
const std::function<MatrixValue(const Json&, const DocPath&)> kMatrix = ReadMatrixValue;

float ReadPositive(const Json& value, const DocPath& path) {
  const float number = ReadNumber(value, path);
  if (!(number > 0.0f)) throw SceneError(path, "expected a number above 0, got " + value.dump());
  return number;
}

// The member if present, else `fallback`.
float NumberOr(const Json& object, const char* key, const DocPath& path, float fallback,
               bool positive) {
  const Json* member = Find(object, key);
  if (member == nullptr) return fallback;
  return positive ? ReadPositive(*member, path.Key(key)) : ReadNumber(*member, path.Key(key));
}

int IntegerOr(const Json& object, const char* key, const DocPath& path, int fallback, int minimum,
              int maximum) {
  const Json* member = Find(object, key);
  return member == nullptr ? fallback : ReadInteger(*member, path.Key(key), minimum, maximum);
}

// [a, b] with both above 0.
void ReadSize2(const Json& value, const DocPath& path, float* a, float* b) {
  if (!value.is_array() || value.size() != 2) ThrowExpected(path, "[width, depth]", value);
  *a = ReadPositive(value[0], path.Index(0));
  *b = ReadPositive(value[1], path.Index(1));
}

Tev_EnvelopeStorage::Interpolation ReadMode(const Json& value, const DocPath& path) {
  const std::string text = ReadString(value, path);
  if (text == "linear") return Tev_EnvelopeStorage::Interpolation::Linear;
  if (text == "step") return Tev_EnvelopeStorage::Interpolation::Step;
  if (text == "smooth") return Tev_EnvelopeStorage::Interpolation::Smooth;
  throw SceneError(path, "expected \"linear\", \"step\" or \"smooth\", got \"" + text + "\"");
}

std::string Number(float value) {
  char text[32];
  std::snprintf(text, sizeof text, "%g", static_cast<double>(value));
  return text;
}

// Keys out of order are used sorted, as the envelope channel sorts whatever it is given; two keys
// at one x make a jump, but a third one there is never read and a repeated key says nothing.
void NoteKeyMistakes(const std::vector<Tev_EnvelopeStorage::Key>& keys, const DocPath& path,
                     std::vector<SceneWarning>* warnings) {
  for (std::size_t i = 1; i < keys.size(); ++i) {
    if (keys[i].X < keys[i - 1].X) {
      warnings->push_back({path.Index(i), 0,
                           "key x = " + Number(keys[i].X) +
                               " comes after x = " + Number(keys[i - 1].X) +
                               ": envelope keys are used sorted by x, so this curve is not the "
                               "one written; write the keys in increasing x"});
      break;
    }
  }
  for (std::size_t i = 0; i < keys.size(); ++i) {
    for (std::size_t j = i + 1; j < keys.size(); ++j) {
      if (keys[j].X != keys[i].X) continue;
      if (keys[j].Y == keys[i].Y) {
        warnings->push_back(
            {path.Index(j), 0,
             "the key [" + Number(keys[j].X) + ", " + Number(keys[j].Y) + "] is given twice"});
        return;
      }
      for (std::size_t k = j + 1; k < keys.size(); ++k) {
        if (keys[k].X != keys[i].X) continue;
        warnings->push_back({path.Index(j), 0,
                             "three keys at x = " + Number(keys[i].X) +
                                 ": two keys at one x make a jump, but the middle one is never "
                                 "read"});
        return;
      }
    }
  }
}

}  // namespace

void SceneBuilder::Configure(Qen_Channel* channel, const Json& definition, const DocPath& path) {
  const GUID type = TypeGuidOf(channel);
  if (type == kValueGuid) return ConfigureValue(channel, definition, path);
  if (type == kValueVectorGuid) return ConfigureVector(channel, definition, path);
  if (type == kMatrixGuid) return ConfigureMatrix(channel, definition, path);
  if (type == kEnvelopeStorageGuid) return ConfigureEnvelope(channel, definition, path);
  if (type == kTextureGuid) return ConfigureTexture(channel, definition, path);
  if (type == kObjectDataGuid) return ConfigureMesh(channel, definition, path);
  if (type == kMultiCollisionManagerGuid) return ConfigureCollision(channel, definition, path);
  if (type == kAttractorGuid) return ConfigureAttractor(channel, definition, path);
  CheckObject(definition, path, {"type", "links"});
  if (const Json* links = Find(definition, "links"))
    ConfigureLinks(channel, *links, path.Key("links"));
}

void SceneBuilder::ConfigureValue(Qen_Channel* channel, const Json& definition,
                                  const DocPath& path) {
  CheckObject(definition, path, {"type", "value"});
  auto* value = static_cast<Qen_ValueChannel*>(channel);
  const Track<float> track =
      ReadTrack(Require(definition, path, "value"), path.Key("value"), kNumber);
  value->SetValue(track.Sample(0.0));
  RememberRange(channel, track);
  if (track.IsAnimated())
    scene_->Animators.push_back([value, track](double t) { value->SetValue(track.Sample(t)); });
}

void SceneBuilder::ConfigureVector(Qen_Channel* channel, const Json& definition,
                                   const DocPath& path) {
  CheckObject(definition, path, {"type", "value"});
  auto* vector = static_cast<Qen_ValueVectorChannel*>(channel);
  const Track<D3DXVECTOR3> track =
      ReadTrack(Require(definition, path, "value"), path.Key("value"), kVector);
  vector->SetVector(track.Sample(0.0));
  if (track.IsAnimated())
    scene_->Animators.push_back([vector, track](double t) { vector->SetVector(track.Sample(t)); });
}

void SceneBuilder::ConfigureMatrix(Qen_Channel* channel, const Json& definition,
                                   const DocPath& path) {
  CheckObject(definition, path, {"type", "value"});
  auto* matrix = static_cast<Qen_MatrixChannel*>(channel);
  const Track<MatrixValue> track =
      ReadTrack(Require(definition, path, "value"), path.Key("value"), kMatrix);
  matrix->SetMatrix(track.Sample(0.0).Matrix);
  if (track.IsAnimated())
    scene_->Animators.push_back(
        [matrix, track](double t) { matrix->SetMatrix(track.Sample(t).Matrix); });
}

void SceneBuilder::ConfigureEnvelope(Qen_Channel* channel, const Json& definition,
                                     const DocPath& path) {
  CheckObject(definition, path, {"type", "keys", "interpolation"});
  std::string mode = "linear";
  if (const Json* interpolation = Find(definition, "interpolation")) {
    ReadMode(*interpolation, path.Key("interpolation"));
    mode = interpolation->get<std::string>();
  }
  SetEnvelopeKeys(channel, Require(definition, path, "keys"), path.Key("keys"), mode);
}

void SceneBuilder::SetEnvelopeKeys(Qen_Channel* channel, const Json& keys, const DocPath& path,
                                   const std::string& default_mode) {
  if (!keys.is_array() || keys.empty()) ThrowExpected(path, "a list of keys [[x, y], ...]", keys);
  const Tev_EnvelopeStorage::Interpolation fallback = ReadMode(Json(default_mode), path);
  std::vector<Tev_EnvelopeStorage::Key> list;
  for (std::size_t i = 0; i < keys.size(); ++i) {
    const DocPath at = path.Index(i);
    const Json& key = keys[i];
    if (!key.is_array() || (key.size() != 2 && key.size() != 3))
      ThrowExpected(at, "a key [x, y] or [x, y, \"linear\" | \"step\" | \"smooth\"]", key);
    list.push_back({ReadNumber(key[0], at.Index(0)), ReadNumber(key[1], at.Index(1)),
                    key.size() == 3 ? ReadMode(key[2], at.Index(2)) : fallback});
  }
  NoteKeyMistakes(list, path, &scene_->LoadWarnings);
  static_cast<Tev_EnvelopeStorage*>(channel)->SetKeys(list);
}

void SceneBuilder::ConfigureTexture(Qen_Channel* channel, const Json& definition,
                                    const DocPath& path) {
  CheckObject(definition, path, {"type", "image", "size", "file"});
  Image image;
  const Json* file = Find(definition, "file");
  const Json* name = Find(definition, "image");
  if ((file == nullptr) == (name == nullptr))
    throw SceneError(path, "give either \"image\" (a built-in picture) or \"file\" (a PNG)");
  if (file != nullptr) {
    if (Find(definition, "size") != nullptr)
      throw SceneError(path.Key("size"), "a PNG file has its own size");
    std::string error;
    if (!ReadPng(ResolveFile(ReadString(*file, path.Key("file"))), &image, &error))
      throw SceneError(path.Key("file"), error);
    if (image.Width > kMaximumTextureSize || image.Height > kMaximumTextureSize)
      throw SceneError(path.Key("file"), "the picture is " + std::to_string(image.Width) + "x" +
                                             std::to_string(image.Height) + ", more than " +
                                             std::to_string(kMaximumTextureSize) + " a side");
  } else {
    const std::string shape = ReadString(*name, path.Key("image"));
    const int size = IntegerOr(definition, "size", path, 64, 1, kMaximumTextureSize);
    if (!MakeProceduralImage(shape, size, &image)) {
      std::string known;
      for (const std::string& n : ProceduralImageNames()) known += (known.empty() ? "" : ", ") + n;
      throw SceneError(path.Key("image"),
                       "unknown built-in image \"" + shape + "\" (known: " + known + ")");
    }
  }
  auto* texture = static_cast<Qen_TextureChannel*>(channel);
  const UINT width = static_cast<UINT>(image.Width), height = static_cast<UINT>(image.Height);
  D3DLOCKED_RECT locked{};
  if (FAILED(texture->CreateTexture(width, height)) || FAILED(texture->LockLevel(0, &locked)))
    throw SceneError(path, "the device could not make a " + std::to_string(width) + "x" +
                               std::to_string(height) + " texture");
  for (UINT y = 0; y < height; ++y)
    std::copy_n(&image.Argb[static_cast<std::size_t>(y) * width], width,
                reinterpret_cast<std::uint32_t*>(static_cast<std::uint8_t*>(locked.pBits) +
                                                 static_cast<std::ptrdiff_t>(y) * locked.Pitch));
  texture->UnlockLevel(0);
}

void SceneBuilder::ConfigureMesh(Qen_Channel* channel, const Json& definition,
                                 const DocPath& path) {
  CheckObject(definition, path,
              {"type", "links", "shape", "size", "half_extents", "radius", "slices", "stacks",
               "segments", "cells", "obj", "transform", "draw", "color", "color2", "shade"});
  auto* mesh = static_cast<Tev_DX8_ObjectDataChannel*>(channel);
  const Json* shape_json = Find(definition, "shape");
  const Json* obj = Find(definition, "obj");
  if ((shape_json == nullptr) == (obj == nullptr))
    throw SceneError(path, "give either \"shape\" (a built-in shape) or \"obj\" (an OBJ file)");

  // Which keys each shape takes; the rest must be absent.
  struct ShapeKeys {
    const char* Shape;
    std::vector<std::string> Keys;
  };
  static const ShapeKeys kShapeKeys[] = {{"quad", {"size"}},
                                         {"grid", {"size", "cells", "color2"}},
                                         {"box", {"half_extents"}},
                                         {"sphere", {"radius", "slices", "stacks"}},
                                         {"disc", {"radius", "segments"}},
                                         {"obj", {}}};
  const std::string shape = obj != nullptr ? "obj" : ReadString(*shape_json, path.Key("shape"));
  const ShapeKeys* keys = nullptr;
  for (const ShapeKeys& candidate : kShapeKeys)
    if (shape == candidate.Shape) keys = &candidate;
  if (keys == nullptr || (shape == "obj" && obj == nullptr))
    throw SceneError(path.Key("shape"),
                     "unknown shape \"" + shape + "\" (known: quad, grid, box, sphere, disc)");
  for (const char* parameter :
       {"size", "half_extents", "radius", "slices", "stacks", "segments", "cells", "color2"}) {
    if (Find(definition, parameter) != nullptr &&
        std::find(keys->Keys.begin(), keys->Keys.end(), parameter) == keys->Keys.end())
      throw SceneError(path.Key(parameter), "does not apply to a " + shape);
  }

  const D3DCOLOR color = Find(definition, "color") != nullptr
                             ? ReadColor(definition["color"], path.Key("color"))
                             : 0xFFB4B4B4u;
  if (shape == "obj") {
    std::string error;
    if (!LoadObjMesh(ResolveFile(ReadString(*obj, path.Key("obj"))), mesh, &error))
      throw SceneError(path.Key("obj"), error);
  } else if (shape == "quad" || shape == "grid") {
    float width = 1.0f, depth = 1.0f;
    if (const Json* size = Find(definition, "size"))
      ReadSize2(*size, path.Key("size"), &width, &depth);
    if (shape == "quad") {
      mesh->BuildQuad(width, depth);
    } else {
      const D3DCOLOR second = Find(definition, "color2") != nullptr
                                  ? ReadColor(definition["color2"], path.Key("color2"))
                                  : 0xFF5A5A5Au;
      BuildGrid(mesh, width, depth, IntegerOr(definition, "cells", path, 8, 1, 512), color, second);
    }
  } else if (shape == "box") {
    D3DXVECTOR3 half{0.5f, 0.5f, 0.5f};
    if (const Json* h = Find(definition, "half_extents")) {
      half = ReadVector3(*h, path.Key("half_extents"));
      if (!(half.x > 0 && half.y > 0 && half.z > 0))
        throw SceneError(path.Key("half_extents"), "expected half extents above 0");
    }
    mesh->BuildBox(half);
  } else if (shape == "sphere") {
    mesh->BuildUvSphere(NumberOr(definition, "radius", path, 0.5f, true),
                        IntegerOr(definition, "slices", path, 16, 3, 1024),
                        IntegerOr(definition, "stacks", path, 12, 2, 1024));
  } else {
    mesh->BuildDisc(NumberOr(definition, "radius", path, 0.5f, true),
                    IntegerOr(definition, "segments", path, 24, 3, 4096));
  }
  if (shape != "grid") PaintMesh(mesh, color);
  const bool shade = Find(definition, "shade") != nullptr
                         ? ReadBool(definition["shade"], path.Key("shade"))
                         : shape != "grid" && shape != "quad";
  if (shade) ShadeMesh(mesh);

  if (const Json* transform = Find(definition, "transform")) {
    const Track<MatrixValue> track = ReadTrack(*transform, path.Key("transform"), kMatrix);
    mesh->SetWorldMatrix(track.Sample(0.0).Matrix);
    if (track.IsAnimated()) {
      scene_->Animators.push_back(
          [mesh, track](double t) { mesh->SetWorldMatrix(track.Sample(t).Matrix); });
      scene_->MovingGeometry = true;
    }
  }
  if (Find(definition, "draw") != nullptr && ReadBool(definition["draw"], path.Key("draw")))
    scene_->DrawnMeshes.push_back(mesh);
  if (const Json* links = Find(definition, "links"))
    ConfigureLinks(channel, *links, path.Key("links"));
}

void SceneBuilder::ConfigureCollision(Qen_Channel* channel, const Json& definition,
                                      const DocPath& path) {
  CheckObject(definition, path, {"type", "links", "colliders"});
  auto* manager = static_cast<Tev_MultiCollisionManager*>(channel);
  scene_->CollisionManagers.push_back(manager);
  if (const Json* colliders = Find(definition, "colliders")) {
    const DocPath list_path = path.Key("colliders");
    if (!colliders->is_array()) ThrowExpected(list_path, "a list of colliders", *colliders);
    for (std::size_t i = 0; i < colliders->size(); ++i) {
      const DocPath at = list_path.Index(i);
      const Json& collider = (*colliders)[i];
      const std::string shape = ReadString(Require(collider, at, "shape"), at.Key("shape"));
      if (shape == "plane") {
        CheckObject(collider, at, {"shape", "point", "normal"});
        const D3DXVECTOR3 normal = ReadVector3(Require(collider, at, "normal"), at.Key("normal"));
        if (D3DXVec3Length(&normal) == 0.0f)
          throw SceneError(at.Key("normal"), "a plane's normal must not be zero");
        manager->AddPlane(ReadVector3(Require(collider, at, "point"), at.Key("point")), normal);
      } else if (shape == "sphere") {
        CheckObject(collider, at, {"shape", "centre", "radius"});
        manager->AddSphere(ReadVector3(Require(collider, at, "centre"), at.Key("centre")),
                           ReadPositive(Require(collider, at, "radius"), at.Key("radius")));
      } else if (shape == "box") {
        CheckObject(collider, at, {"shape", "transform", "half_extents"});
        D3DXMATRIX world;
        D3DXMatrixIdentity(&world);
        if (const Json* transform = Find(collider, "transform"))
          world = ReadMatrix(*transform, at.Key("transform"));
        const D3DXVECTOR3 half =
            ReadVector3(Require(collider, at, "half_extents"), at.Key("half_extents"));
        if (!(half.x > 0 && half.y > 0 && half.z > 0))
          throw SceneError(at.Key("half_extents"), "expected half extents above 0");
        manager->AddBox(world, half);
      } else if (shape == "mesh") {
        CheckObject(collider, at, {"shape", "mesh"});
        Qen_Channel* mesh = ResolveChannel(Require(collider, at, "mesh"), at.Key("mesh"),
                                           kObjectDataGuid, "3D ObjectData");
        manager->AddMesh(static_cast<Tev_DX8_ObjectDataChannel*>(mesh));
      } else {
        throw SceneError(at.Key("shape"), "unknown collider shape \"" + shape +
                                              "\" (known: plane, sphere, box, mesh)");
      }
    }
  }
  if (const Json* links = Find(definition, "links"))
    ConfigureLinks(channel, *links, path.Key("links"));
}

void SceneBuilder::ConfigureAttractor(Qen_Channel* channel, const Json& definition,
                                      const DocPath& path) {
  CheckObject(definition, path,
              {"type", "links", "position", "strength", "falloff", "minimum_radius", "radius",
               "vortex_strength", "vortex_axis"});
  auto* attractor = static_cast<Tev_AdvPE_Attractor*>(channel);
  if (const Json* position = Find(definition, "position")) {
    const Track<D3DXVECTOR3> track = ReadTrack(*position, path.Key("position"), kVector);
    attractor->Position = track.Sample(0.0);
    if (track.IsAnimated())
      scene_->Animators.push_back(
          [attractor, track](double t) { attractor->Position = track.Sample(t); });
  }
  if (const Json* strength = Find(definition, "strength")) {
    const Track<float> track = ReadTrack(*strength, path.Key("strength"), kNumber);
    attractor->Strength = track.Sample(0.0);
    if (track.IsAnimated())
      scene_->Animators.push_back(
          [attractor, track](double t) { attractor->Strength = track.Sample(t); });
  }
  if (const Json* falloff = Find(definition, "falloff")) {
    const std::string text = ReadString(*falloff, path.Key("falloff"));
    if (text == "inverse-square") {
      attractor->FalloffMode = Tev_AdvPE_Attractor::Falloff::InverseSquare;
    } else if (text == "linear") {
      attractor->FalloffMode = Tev_AdvPE_Attractor::Falloff::Linear;
    } else {
      throw SceneError(path.Key("falloff"),
                       "expected \"inverse-square\" or \"linear\", got \"" + text + "\"");
    }
  }
  attractor->MinimumRadius =
      NumberOr(definition, "minimum_radius", path, attractor->MinimumRadius, true);
  attractor->Radius = NumberOr(definition, "radius", path, attractor->Radius, true);
  attractor->VortexStrength =
      NumberOr(definition, "vortex_strength", path, attractor->VortexStrength, false);
  if (const Json* axis = Find(definition, "vortex_axis"))
    attractor->VortexAxis = ReadVector3(*axis, path.Key("vortex_axis"));
  if (const Json* links = Find(definition, "links"))
    ConfigureLinks(channel, *links, path.Key("links"));
}

}  // namespace apescene
