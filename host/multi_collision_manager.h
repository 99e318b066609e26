// "MultiCollisionManager": collision geometry (planes, spheres, oriented boxes, triangle meshes)
// answering closest front-face segment queries.
#pragma once

#include <memory>

#include "host/qen_channel.h"
#include "platform/d3dx_math.h"

class Tev_DX8_ObjectDataChannel;

class Tev_MultiCollisionManager : public Qen_Channel {
 public:
  Tev_MultiCollisionManager();
  ~Tev_MultiCollisionManager() override;
  Tev_MultiCollisionManager(const Tev_MultiCollisionManager&) = delete;
  Tev_MultiCollisionManager& operator=(const Tev_MultiCollisionManager&) = delete;
  ChannelType GetChannelType() override;

  // Recomputes every object's world-space data.
  void RebuildAllCollisionObjects();
  // Tests the segment origin .. origin + ray; on the closest front-facing hit writes the point,
  // the unit normal and the cosine (ray's unit direction . normal) and answers the object's id;
  // otherwise answers -1 and writes nothing.
  int GetClosestFrontFaceCollision(D3DXVECTOR3* origin, D3DXVECTOR3* ray, D3DXVECTOR3* hitPoint,
                                   D3DXVECTOR3* hitNormal, float* hitCosine);

  // Host API: each answers the new object's id (0, 1, 2... in the order added).
  int AddPlane(D3DXVECTOR3 point, D3DXVECTOR3 normal);
  int AddSphere(D3DXVECTOR3 centre, float radius);
  int AddBox(const D3DXMATRIX& world, D3DXVECTOR3 half_extents);  // oriented box
  int AddMesh(Tev_DX8_ObjectDataChannel* mesh);  // not owned; world space via its world matrix
  int GetObjectCount() const;
  void ClearObjects();

 private:
  struct Impl;
  std::unique_ptr<Impl> impl_;
};
