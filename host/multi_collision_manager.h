// "MultiCollisionManager": collision geometry (planes, spheres, oriented boxes, triangle meshes)
// answering closest front-face segment queries.
//
// Identifiers: the objects added from code are 0, 1, 2... in the order added; the meshes linked
// at "Collision Objects" follow them, in link order, from the latest RebuildAllCollisionObjects
// on (so adding from code renumbers the linked ones).
//
// Queries: the segment runs from origin (t = 0) to origin + ray (t = 1), both ends included. A
// front face is one the ray runs against (ray . outward normal < 0): a plane's Normal side, a
// sphere's or box's outside, a triangle's clockwise side as Direct3D draws it (normal along
// cross(b - a, c - a)). The closest hit wins; equal distances go to the lowest identifier.
#pragma once

#include <memory>

#include "host/qen_channel.h"
#include "platform/d3dx_math.h"

class Tev_DX8_ObjectDataChannel;

class Tev_MultiCollisionManager : public Qen_Channel {
 public:
  static constexpr int kLinkCollisionObjects = 0;  // "Collision Objects" (3D ObjectData, many)

  Tev_MultiCollisionManager();
  ~Tev_MultiCollisionManager() override;
  Tev_MultiCollisionManager(const Tev_MultiCollisionManager&) = delete;
  Tev_MultiCollisionManager& operator=(const Tev_MultiCollisionManager&) = delete;
  ChannelType GetChannelType() override;
  void DoDependencyInit(Qen_List* list) override;  // the link type

  // Recomputes every object's world-space data: re-reads the meshes added from code and takes
  // the linked meshes afresh. Never throws; on failure the objects stay as they were and a debug
  // message says so.
  void RebuildAllCollisionObjects();
  // Tests the segment origin .. origin + ray; on the closest front-facing hit writes the point,
  // the unit normal and the cosine (ray's unit direction . normal) and answers the object's id;
  // otherwise answers -1 and writes nothing. A null, zero-length or non-finite origin or ray
  // answers -1. Never allocates or throws.
  int GetClosestFrontFaceCollision(D3DXVECTOR3* origin, D3DXVECTOR3* ray, D3DXVECTOR3* hitPoint,
                                   D3DXVECTOR3* hitNormal, float* hitCosine);

  // Host API: each answers the new object's id (0, 1, 2... in the order added), or -1 without
  // adding anything for values that describe no shape (non-finite values, a zero normal, a radius
  // or half extent not above 0, a singular box matrix, a null mesh) or when memory runs out.
  int AddPlane(D3DXVECTOR3 point, D3DXVECTOR3 normal);
  int AddSphere(D3DXVECTOR3 centre, float radius);
  // An oriented box: half extents about its own origin, placed by an affine world matrix (its
  // fourth column is ignored).
  int AddBox(const D3DXMATRIX& world, D3DXVECTOR3 half_extents);
  // Not owned: the host keeps it alive until ClearObjects or this manager's end. Read now and at
  // every rebuild, in world space through its world matrix.
  int AddMesh(Tev_DX8_ObjectDataChannel* mesh);
  int GetObjectCount() const;
  void ClearObjects();  // the linked meshes come back at the next rebuild

 private:
  struct Impl;
  std::unique_ptr<Impl> impl_;
};
