// The emitter's declared links, checked against a table written out here independently.
#include <cstring>
#include <string>

#include <gtest/gtest.h>

#include "host/host_context.h"
#include "host/type_guids.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

namespace {

struct ExpectedLink {
  const char* Name;
  const char* Type;
  int Flag;
};

const ExpectedLink kExpected[kEmitterLinkCount] = {
    {"Emitter", "3D ObjectData", 0},
    {"Emitter Motion", "Matrix", 0},
    {"Emitter_Active?", "Value", 0},
    {"ParticleCount", "Value", 1},
    {"Hardware Particles?", "Value", 0},
    {"Logic Updates Per Second", "Value", 1},
    {"Births Per Second", "Value", 1},
    {"ReplaceOldParticles?", "Value", 0},
    {"Lifespan_Min", "Value", 1},
    {"Lifespan_Max", "Value", 1},
    {"LookAt", "Value Vector", 0},
    {"LookAt_Local", "Value", 0},
    {"Vertex_Emissions?", "Value", 0},
    {"InitialForce_Strength", "Value", 0},
    {"InitialForce_AlongNormal?", "Value", 0},
    {"InitialForce_Override", "Value Vector", 1},
    {"GlobalForce", "Value Vector", 1},
    {"Maximum Speed", "Value", 0},
    {"Size Envelope", "EnvelopeStorage", 1},
    {"Mulitplicative Size Offset Max (a multiplier between 1 and this is generated)", "Value", 0},
    {"Use Vertex Alpha Fading?", "Value", 0},
    {"Vertex Alpha Envelope", "EnvelopeStorage", 0},
    {"Red Color Envelope", "EnvelopeStorage", 1},
    {"Green Color Envelope", "EnvelopeStorage", 1},
    {"Blue Color Envelope", "EnvelopeStorage", 1},
    {"MultiCollisionManager", "MultiCollisionManager", 0},
    {"Bounce Rate", "Value", 0},
    {"Attach Rate", "Value", 0},
    {"Attached Lifespan", "Value", 0},
    {"Attached Particles Align to Normals?", "Value", 0},
    {"Attached Size Offset Envelope", "EnvelopeStorage", 0},
    {"Attached Size Offset Additive?", "Value", 0},
    {"Attached Alpha Offset Envelope", "EnvelopeStorage", 0},
    {"Attached Red Offset Envelope", "EnvelopeStorage", 0},
    {"Attached Green Offset Envelope", "EnvelopeStorage", 0},
    {"Attached Blue Offset Envelope", "EnvelopeStorage", 0},
    {"Attached_SlideRate", "Value", 0},
    {"Attached_SlidingHeight", "Value", 0},
    {"Sliding Size Offset Envelope", "EnvelopeStorage", 0},
    {"Sliding Particles Attractor Immunity?", "Value", 0},
    {"Collision Report Rate", "Value", 0},
    {"Out: Collision ID (0 for no collision)", "Value", 0},
    {"Out: Collision Position", "Value Vector", 0},
    {"Out: Collision Normal", "Value Vector", 0},
    {"Bouncing Particles Report Collisions?", "Value", 0},
    {"SpinSpeed_Min", "Value", 0},
    {"SpinSpeed_Max", "Value", 0},
    {"SpinStart", "Value", 0},
    {"Smoke?", "Value", 0},
    {"SmokeSettings", "AdvPE_SmokeSettings", 0},
    {"Simulation Scaler", "Value", 0},
    {"Particle Texture", "Texture", 0},
    {"Attached Texture", "Texture", 0},
    {"Attractors", "AdvPE_Attractor", 0},
};

GUID GuidOfType(const std::string& type) {
  if (type == "3D ObjectData") return kObjectDataGuid;
  if (type == "Matrix") return kMatrixGuid;
  if (type == "Value") return kValueGuid;
  if (type == "Value Vector") return kValueVectorGuid;
  if (type == "EnvelopeStorage") return kEnvelopeStorageGuid;
  if (type == "MultiCollisionManager") return kMultiCollisionManagerGuid;
  if (type == "AdvPE_SmokeSettings") return kSmokeSettingsGuid;
  if (type == "Texture") return kTextureGuid;
  if (type == "AdvPE_Attractor") return kAttractorGuid;
  ADD_FAILURE() << "unknown type " << type;
  return GUID{};
}

class LinkTableTest : public ::testing::Test {
 protected:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
};

TEST_F(LinkTableTest, ConstructorDeclaresEveryLinkAsTheTableSays) {
  Tev_AdvancedParticleEmitter emitter;
  ASSERT_EQ(emitter.GetChildCreationCount(), kEmitterLinkCount);
  int flagged = 0;
  for (int i = 0; i < kEmitterLinkCount; ++i) {
    SCOPED_TRACE(i);
    const ChildCreation* record = emitter.GetChildCreation(i);
    ASSERT_NE(record, nullptr);
    EXPECT_STREQ(record->LinkName, kExpected[i].Name);
    EXPECT_STREQ(record->Type.TypeName, kExpected[i].Type);
    EXPECT_EQ(record->Type.TypeGuid, GuidOfType(kExpected[i].Type));
    EXPECT_EQ(record->LinkPosition, i == kLinkAttractors ? -1 : i);
    EXPECT_EQ(record->LinkFlag, kExpected[i].Flag);
    flagged += record->LinkFlag;
    // Fields the table does not set keep the record constructor's values.
    EXPECT_EQ(record->Type.BaseTypeGuid, PatternGuid11());
    EXPECT_EQ(record->Flag, 0);
    EXPECT_EQ(record->ExtraGuid, GUID{});
    EXPECT_EQ(record->ExtraWord256, 0);
    EXPECT_EQ(record->ExtraWord260, 1);
    EXPECT_EQ(emitter.FindChildLinkByName(kExpected[i].Name), i);
  }
  EXPECT_EQ(flagged, 11);
}

}  // namespace
