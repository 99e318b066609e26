#include "host/multi_collision_manager.h"

#include <limits>
#include <memory>
#include <new>
#include <type_traits>
#include <variant>
#include <vector>

#include "host/collision_mesh.h"
#include "host/collision_shapes.h"
#include "host/host_context.h"
#include "host/object_data_channel.h"
#include "host/sibling_links.h"
#include "host/type_guids.h"

namespace {

constexpr SiblingLink kLinks[] = {
    {"Collision Objects", "3D ObjectData", kObjectDataGuid, true},
};

struct MeshObject {
  Tev_DX8_ObjectDataChannel* Source;  // null for a linked mesh, which is taken afresh instead
  std::unique_ptr<CollisionMesh> Mesh;
};

using CollisionObject = std::variant<CollisionPlane, CollisionSphere, CollisionBox, MeshObject>;

bool IntersectObject(const CollisionObject& object, const CollisionSegment& segment, double max_t,
                     CollisionHit* hit) {
  return std::visit(
      [&](const auto& shape) {
        if constexpr (std::is_same_v<std::decay_t<decltype(shape)>, MeshObject>)
          return shape.Mesh->Intersect(segment, max_t, hit);
        else
          return IntersectFrontFace(shape, segment, max_t, hit);
      },
      object);
}

void ReportRebuildFailure(Qen_HostContext* context) noexcept {
  if (!context) return;
  try {
    context->DebugMessages("MultiCollisionManager: collision objects not rebuilt");
  } catch (...) {
  }
}

}  // namespace

struct Tev_MultiCollisionManager::Impl {
  std::vector<CollisionObject> CodeObjects;
  std::vector<CollisionObject> LinkedObjects;  // numbered after CodeObjects
  RTCDevice Device = nullptr;
  bool DeviceTried = false;

  ~Impl() {
    // The meshes' scenes go before the device they were made on.
    CodeObjects.clear();
    LinkedObjects.clear();
    if (Device) rtcReleaseDevice(Device);
  }

  // Made on first need; null when Embree cannot run here, and meshes are then searched plainly.
  // One thread: the host runs every channel on its own thread.
  RTCDevice EmbreeDevice() {
    if (!DeviceTried) {
      DeviceTried = true;
      Device = rtcNewDevice("threads=1");
    }
    return Device;
  }

  std::unique_ptr<CollisionMesh> BuildMesh(Tev_DX8_ObjectDataChannel& source) {
    return std::make_unique<CollisionMesh>(EmbreeDevice(), CollisionMesh::ReadTriangles(source));
  }

  // The id of the object now at the end of the code-added ones, or -1 when it could not be added.
  int AppendCodeObject(CollisionObject&& object) noexcept {
    if (CodeObjects.size() >= static_cast<std::size_t>(std::numeric_limits<int>::max())) return -1;
    try {
      CodeObjects.push_back(std::move(object));
    } catch (const std::bad_alloc&) {
      return -1;
    }
    return static_cast<int>(CodeObjects.size()) - 1;
  }
};

Tev_MultiCollisionManager::Tev_MultiCollisionManager() : impl_(std::make_unique<Impl>()) {
  DeclareSiblingLinks(*this, kLinks, std::size(kLinks));
}

Tev_MultiCollisionManager::~Tev_MultiCollisionManager() = default;

void Tev_MultiCollisionManager::RebuildAllCollisionObjects() {
  try {
    // Everything is built aside first, so that a failure leaves the objects as they were.
    std::vector<std::unique_ptr<CollisionMesh>> code_meshes;
    for (const CollisionObject& object : impl_->CodeObjects) {
      const auto* mesh = std::get_if<MeshObject>(&object);
      code_meshes.push_back(mesh ? impl_->BuildMesh(*mesh->Source) : nullptr);
    }
    std::vector<CollisionObject> linked;
    const int count = GetChildLinkPositionCount(kLinkCollisionObjects);
    for (int position = 0; position < count; ++position) {
      auto* source = dynamic_cast<Tev_DX8_ObjectDataChannel*>(
          GetChildFromLinkPosition(kLinkCollisionObjects, position));
      if (source) linked.emplace_back(MeshObject{nullptr, impl_->BuildMesh(*source)});
    }

    for (std::size_t i = 0; i < code_meshes.size(); ++i)
      if (auto* mesh = std::get_if<MeshObject>(&impl_->CodeObjects[i]))
        mesh->Mesh = std::move(code_meshes[i]);
    impl_->LinkedObjects = std::move(linked);
  } catch (...) {
    // Whatever went wrong (memory, or a mesh channel that threw), the emitter must not see it.
    ReportRebuildFailure(HostContext);
  }
}

int Tev_MultiCollisionManager::GetClosestFrontFaceCollision(D3DXVECTOR3* origin, D3DXVECTOR3* ray,
                                                            D3DXVECTOR3* hitPoint,
                                                            D3DXVECTOR3* hitNormal,
                                                            float* hitCosine) {
  if (!origin || !ray || !IsFinite(*origin) || !IsFinite(*ray)) return -1;
  const CollisionSegment segment{ToVec3d(*origin), ToVec3d(*ray)};
  const double length = Length(segment.Ray);
  if (!(length > 0.0)) return -1;

  int best_id = -1;
  CollisionHit best;
  best.T = 1.0;
  int id = 0;
  for (const auto* objects : {&impl_->CodeObjects, &impl_->LinkedObjects}) {
    for (const CollisionObject& object : *objects) {
      CollisionHit hit;
      // Only a strictly closer hit replaces the best, so equal distances keep the lower id.
      if (IntersectObject(object, segment, best.T, &hit) && (best_id < 0 || hit.T < best.T)) {
        best = hit;
        best_id = id;
      }
      ++id;
    }
  }
  if (best_id < 0) return -1;
  if (hitPoint) *hitPoint = ToFiniteFloat(segment.Origin + segment.Ray * best.T);
  if (hitNormal) *hitNormal = ToFiniteFloat(best.Normal);
  if (hitCosine) *hitCosine = ToFiniteFloat(Dot(segment.Ray, best.Normal) / length);
  return best_id;
}

int Tev_MultiCollisionManager::AddPlane(D3DXVECTOR3 point, D3DXVECTOR3 normal) {
  CollisionPlane plane;
  return MakeCollisionPlane(point, normal, &plane) ? impl_->AppendCodeObject(plane) : -1;
}

int Tev_MultiCollisionManager::AddSphere(D3DXVECTOR3 centre, float radius) {
  CollisionSphere sphere;
  return MakeCollisionSphere(centre, radius, &sphere) ? impl_->AppendCodeObject(sphere) : -1;
}

int Tev_MultiCollisionManager::AddBox(const D3DXMATRIX& world, D3DXVECTOR3 half_extents) {
  CollisionBox box;
  return MakeCollisionBox(world, half_extents, &box) ? impl_->AppendCodeObject(box) : -1;
}

int Tev_MultiCollisionManager::AddMesh(Tev_DX8_ObjectDataChannel* mesh) {
  if (!mesh) return -1;
  try {
    return impl_->AppendCodeObject(MeshObject{mesh, impl_->BuildMesh(*mesh)});
  } catch (...) {
    return -1;
  }
}

int Tev_MultiCollisionManager::GetObjectCount() const {
  return static_cast<int>(impl_->CodeObjects.size() + impl_->LinkedObjects.size());
}

void Tev_MultiCollisionManager::ClearObjects() {
  impl_->CodeObjects.clear();
  impl_->LinkedObjects.clear();
}

void Tev_MultiCollisionManager::DoDependencyInit(Qen_List* list) {
  AddChannelGuidDepend(kObjectDataGuid, list);
}
