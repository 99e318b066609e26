#include "host/attractor.h"

#include "host/collision_vector.h"
#include "host/link_values.h"
#include "host/sibling_links.h"
#include "host/type_guids.h"

namespace {

constexpr SiblingLink kLinks[Tev_AdvPE_Attractor::kLinkCount] = {
    {"Position", "Value Vector", kValueVectorGuid},
    {"Strength", "Value", kValueGuid},
    {"Linear Falloff?", "Value", kValueGuid},
    {"Minimum Radius", "Value", kValueGuid},
    {"Radius", "Value", kValueGuid},
    {"Vortex Strength", "Value", kValueGuid},
    {"Vortex Axis", "Value Vector", kValueVectorGuid},
};

// f(r) of the field's description in the header.
double FalloffFactor(bool linear, double minimum_radius, double radius, double r) {
  if (linear) {
    if (!(radius > 0.0)) return 0.0;
    return std::max(0.0, 1.0 - r / radius);
  }
  // A non-positive (or NaN) minimum radius leaves the force uncapped; r = 0 has no direction.
  const double capped = minimum_radius > 0.0 ? std::max(r, minimum_radius) : r;
  return capped > 0.0 ? 1.0 / (capped * capped) : 0.0;
}

}  // namespace

Tev_AdvPE_Attractor::Tev_AdvPE_Attractor() {
  DeclareSiblingLinks(*this, kLinks, kLinkCount);
}

D3DXVECTOR3 Tev_AdvPE_Attractor::GetForceAtPosition(D3DXVECTOR3 position) {
  if (!IsFinite(position)) return {0.0f, 0.0f, 0.0f};
  return ForceAt(TakeField(), position);
}

Tev_AdvPE_Attractor::Field Tev_AdvPE_Attractor::TakeField() {
  Field field;
  Qen_ValueChannel* linear_link = ValueLink(*this, kLinkLinearFalloff);
  field.Linear = linear_link ? IsYes(linear_link->GetValue()) : FalloffMode == Falloff::Linear;
  field.Centre = VectorOr(*this, kLinkPosition, Position);
  field.Axis = VectorOr(*this, kLinkVortexAxis, VortexAxis);
  field.Strength = ValueOr(*this, kLinkStrength, Strength);
  field.VortexStrength = ValueOr(*this, kLinkVortexStrength, VortexStrength);
  field.MinimumRadius = ValueOr(*this, kLinkMinimumRadius, MinimumRadius);
  field.Radius = ValueOr(*this, kLinkRadius, Radius);
  return field;
}

D3DXVECTOR3 Tev_AdvPE_Attractor::ForceAt(const Field& field, D3DXVECTOR3 position) {
  if (!IsFinite(position)) return {0.0f, 0.0f, 0.0f};
  const Vec3d centre = ToVec3d(field.Centre);
  const Vec3d axis = ToVec3d(field.Axis);
  const double strength = field.Strength;
  const double vortex_strength = field.VortexStrength;
  const Vec3d offset = ToVec3d(position) - centre;  // from the centre to the point
  const double falloff =
      FalloffFactor(field.Linear, field.MinimumRadius, field.Radius, Length(offset));

  Vec3d force = Normalized(-offset) * (strength * falloff);
  force += Normalized(Cross(axis, offset)) * (vortex_strength * falloff);
  return ToFiniteFloat(force);
}

void Tev_AdvPE_Attractor::DoDependencyInit(Qen_List* list) {
  AddChannelGuidDepend(kValueGuid, list);
  AddChannelGuidDepend(kValueVectorGuid, list);
}
