#include "plugin/link_table.h"

#include <array>

#include "host/type_guids.h"

namespace {

constexpr const char* kObjectData = "3D ObjectData";
constexpr const char* kMatrix = "Matrix";
constexpr const char* kValue = "Value";
constexpr const char* kVector = "Value Vector";
constexpr const char* kEnvelope = "EnvelopeStorage";
constexpr const char* kCollision = "MultiCollisionManager";
constexpr const char* kSmoke = "AdvPE_SmokeSettings";
constexpr const char* kTexture = "Texture";
constexpr const char* kAttractor = "AdvPE_Attractor";

// Link position = the index, except -1 for the one link that takes any number of channels.
constexpr EmitterLinkSpec Link(int index, const char* name, const char* type, const GUID& guid,
                               std::uint8_t flag) {
  return {name, type, guid, index == kLinkAttractors ? -1 : index, flag};
}

constexpr std::array<EmitterLinkSpec, kEmitterLinkCount> kLinks = {{
    Link(0, "Emitter", kObjectData, kObjectDataGuid, 0),
    Link(1, "Emitter Motion", kMatrix, kMatrixGuid, 0),
    Link(2, "Emitter_Active?", kValue, kValueGuid, 0),
    Link(3, "ParticleCount", kValue, kValueGuid, 1),
    Link(4, "Hardware Particles?", kValue, kValueGuid, 0),
    Link(5, "Logic Updates Per Second", kValue, kValueGuid, 1),
    Link(6, "Births Per Second", kValue, kValueGuid, 1),
    Link(7, "ReplaceOldParticles?", kValue, kValueGuid, 0),
    Link(8, "Lifespan_Min", kValue, kValueGuid, 1),
    Link(9, "Lifespan_Max", kValue, kValueGuid, 1),
    Link(10, "LookAt", kVector, kValueVectorGuid, 0),
    Link(11, "LookAt_Local", kValue, kValueGuid, 0),
    Link(12, "Vertex_Emissions?", kValue, kValueGuid, 0),
    Link(13, "InitialForce_Strength", kValue, kValueGuid, 0),
    Link(14, "InitialForce_AlongNormal?", kValue, kValueGuid, 0),
    Link(15, "InitialForce_Override", kVector, kValueVectorGuid, 1),
    Link(16, "GlobalForce", kVector, kValueVectorGuid, 1),
    Link(17, "Maximum Speed", kValue, kValueGuid, 0),
    Link(18, "Size Envelope", kEnvelope, kEnvelopeStorageGuid, 1),
    Link(19,
         "Mulitplicative Size Offset Max (a multiplier between 1 and this is generated)",
         kValue, kValueGuid, 0),
    Link(20, "Use Vertex Alpha Fading?", kValue, kValueGuid, 0),
    Link(21, "Vertex Alpha Envelope", kEnvelope, kEnvelopeStorageGuid, 0),
    Link(22, "Red Color Envelope", kEnvelope, kEnvelopeStorageGuid, 1),
    Link(23, "Green Color Envelope", kEnvelope, kEnvelopeStorageGuid, 1),
    Link(24, "Blue Color Envelope", kEnvelope, kEnvelopeStorageGuid, 1),
    Link(25, "MultiCollisionManager", kCollision, kMultiCollisionManagerGuid, 0),
    Link(26, "Bounce Rate", kValue, kValueGuid, 0),
    Link(27, "Attach Rate", kValue, kValueGuid, 0),
    Link(28, "Attached Lifespan", kValue, kValueGuid, 0),
    Link(29, "Attached Particles Align to Normals?", kValue, kValueGuid, 0),
    Link(30, "Attached Size Offset Envelope", kEnvelope, kEnvelopeStorageGuid, 0),
    Link(31, "Attached Size Offset Additive?", kValue, kValueGuid, 0),
    Link(32, "Attached Alpha Offset Envelope", kEnvelope, kEnvelopeStorageGuid, 0),
    Link(33, "Attached Red Offset Envelope", kEnvelope, kEnvelopeStorageGuid, 0),
    Link(34, "Attached Green Offset Envelope", kEnvelope, kEnvelopeStorageGuid, 0),
    Link(35, "Attached Blue Offset Envelope", kEnvelope, kEnvelopeStorageGuid, 0),
    Link(36, "Attached_SlideRate", kValue, kValueGuid, 0),
    Link(37, "Attached_SlidingHeight", kValue, kValueGuid, 0),
    Link(38, "Sliding Size Offset Envelope", kEnvelope, kEnvelopeStorageGuid, 0),
    Link(39, "Sliding Particles Attractor Immunity?", kValue, kValueGuid, 0),
    Link(40, "Collision Report Rate", kValue, kValueGuid, 0),
    Link(41, "Out: Collision ID (0 for no collision)", kValue, kValueGuid, 0),
    Link(42, "Out: Collision Position", kVector, kValueVectorGuid, 0),
    Link(43, "Out: Collision Normal", kVector, kValueVectorGuid, 0),
    Link(44, "Bouncing Particles Report Collisions?", kValue, kValueGuid, 0),
    Link(45, "SpinSpeed_Min", kValue, kValueGuid, 0),
    Link(46, "SpinSpeed_Max", kValue, kValueGuid, 0),
    Link(47, "SpinStart", kValue, kValueGuid, 0),
    Link(48, "Smoke?", kValue, kValueGuid, 0),
    Link(49, "SmokeSettings", kSmoke, kSmokeSettingsGuid, 0),
    Link(50, "Simulation Scaler", kValue, kValueGuid, 0),
    Link(51, "Particle Texture", kTexture, kTextureGuid, 0),
    Link(52, "Attached Texture", kTexture, kTextureGuid, 0),
    Link(53, "Attractors", kAttractor, kAttractorGuid, 0),
}};

}  // namespace

const EmitterLinkSpec& GetEmitterLinkSpec(int index) {
  return kLinks[static_cast<std::size_t>(index)];
}
