#include "tools/scene/link_reference.h"

#include <array>

namespace apescene {
namespace {

constexpr std::string_view kEmitter = "AdvancedParticleEmitter";
constexpr std::string_view kAttractor = "AdvPE_Attractor";
constexpr std::string_view kSmoke = "AdvPE_SmokeSettings";
constexpr std::string_view kCollision = "MultiCollisionManager";

// Units, written once so that every link of a kind reads the same.
constexpr std::string_view kYesNo = "yes/no (yes when above 0)";
constexpr std::string_view kChance = "chance 0..1 (in steps of 0.01)";
constexpr std::string_view kSeconds = "seconds";
constexpr std::string_view kLifeByte = "x: fraction of the free life 0..1; y: 0..255";
constexpr std::string_view kAttachedFactor = "x: fraction of the attached life 0..1; y: factor";
constexpr std::string_view kPerStep = "units per logic step";
constexpr std::string_view kPerStepSquared =
    "units per logic step per logic step (added to the velocity each step)";

constexpr LinkReference E(int index, std::string_view name, std::string_view type,
                          std::string_view unit, std::string_view fallback,
                          std::string_view meaning, std::string_view group, int step_power = 0) {
  return {kEmitter, index, name, type, unit, fallback, meaning, group, step_power};
}

constexpr std::array kEmitterLinks = {
    E(0, "Emitter", "3D ObjectData", "mesh", "no births",
      "The mesh particles are born on, inside its triangles (or at its vertices with "
      "\"Vertex_Emissions?\"); they fly away from the mesh's own position (its transform's "
      "translation) unless \"InitialForce_Override\" is linked.",
      "emission"),
    E(1, "Emitter Motion", "Matrix", "transform of birth points", "identity",
      "Moves every birth point (in the mesh's object space) before the particle starts; offset "
      "it from the mesh's position to aim the spray.",
      "emission"),
    E(2, "Emitter_Active?", "Value", kYesNo, "nothing simulates: no births, no motion, no ageing",
      "Particles are born while this is yes; with it no, the living ones fly on and no new ones "
      "come.",
      "emission"),
    E(3, "ParticleCount", "Value", "records (whole number, at least 1, at most 1,000,000)",
      "an empty pool: no births",
      "The size of the pool, the most particles alive at once; every logic step visits every "
      "record, so the pool size, not the live count, is what a step costs.",
      "emission"),
    E(4, "Hardware Particles?", "Value", kYesNo, "no: camera-facing quads",
      "Draws point sprites instead of camera-facing quads; changing it rebuilds the pool.",
      "rendering"),
    E(5, "Logic Updates Per Second", "Value", "logic steps per second",
      "nothing simulates: no births, no motion, no ageing",
      "The fixed rate of the logic steps that move particles; every \"per logic step\" value "
      "is per one of these steps, and 0 or below runs no step (particles freeze).",
      "motion"),
    E(6, "Births Per Second", "Value", "births per second",
      "nothing simulates: no births, no motion, no ageing",
      "How many particles are born each second of real time while \"Emitter_Active?\" is yes "
      "(times \"Simulation Scaler\"); at most 1001 births happen in one frame.",
      "emission"),
    E(7, "ReplaceOldParticles?", "Value", kYesNo, "no: births wait for a free record",
      "When the pool is full, a birth takes the record of the free-flying particle furthest "
      "through its life instead of being dropped.",
      "emission"),
    E(8, "Lifespan_Min", "Value", kSeconds, "0 (particles die in their first logic step)",
      "Shortest free life; each particle's life is drawn from Lifespan_Min up to (not "
      "including) Lifespan_Max in steps of 0.01 s, or is Lifespan_Min when the two are equal "
      "or the minimum is larger.",
      "lifetime"),
    E(9, "Lifespan_Max", "Value", kSeconds, "0",
      "Longest free life (exclusive); see Lifespan_Min. A life counts real seconds from birth "
      "and is divided by \"Simulation Scaler\".",
      "lifetime"),
    E(10, "LookAt", "Value Vector", "world point (or offset with LookAt_Local)", "[0, 0, 0]",
      "The point every quad faces; link \"camera.eye\" so that particles face the camera.",
      "rendering"),
    E(11, "LookAt_Local", "Value", kYesNo, "no",
      "Makes \"LookAt\" an offset from each particle instead of a point in the world.",
      "rendering"),
    E(12, "Vertex_Emissions?", "Value", kYesNo, "no: inside the triangles",
      "Births happen at randomly chosen vertices of the \"Emitter\" mesh instead of inside its "
      "triangles.",
      "emission"),
    E(13, "InitialForce_Strength", "Value", kPerStep, "0: particles start at rest",
      "Starting speed, along the line from the emitter mesh's position to the birth point (or "
      "along the vertex normal with \"InitialForce_AlongNormal?\").",
      "motion", 1),
    E(14, "InitialForce_AlongNormal?", "Value", kYesNo, "no",
      "Particles start along the stored normal of the birth vertex (of the triangle's first "
      "corner), times \"InitialForce_Strength\"; the normal is used as stored, not normalised.",
      "motion"),
    E(15, "InitialForce_Override", "Value Vector", kPerStep, "not used",
      "Every particle starts with exactly this velocity, ignoring the direction rules and "
      "\"InitialForce_Strength\".",
      "motion", 1),
    E(16, "GlobalForce", "Value Vector", kPerStepSquared, "[0, 0, 0]",
      "Added to every free particle's velocity each logic step (gravity, wind): 9.8 units/s^2 "
      "at 60 steps a second is 9.8 / 60^2 = 0.00272.",
      "motion", 2),
    E(17, "Maximum Speed", "Value", kPerStep, "no limit",
      "Caps the length of a free particle's velocity each logic step, after the forces.", "motion",
      1),
    E(18, "Size Envelope", "EnvelopeStorage",
      "x: fraction of the free life 0..1; y: edge length in world units",
      "1 world unit, times the size multiplier",
      "A free particle's size over its life, times its random size multiplier; negative "
      "sizes draw nothing.",
      "size and colour"),
    E(19, "Mulitplicative Size Offset Max (a multiplier between 1 and this is generated)", "Value",
      "factor, at least 1", "1: every size multiplier is 1",
      "Each particle gets a size multiplier drawn from 1 up to (not including) this value in "
      "steps of 0.001; note the emitter's spelling \"Mulitplicative\".",
      "size and colour"),
    E(20, "Use Vertex Alpha Fading?", "Value", kYesNo,
      "no: drawn unblended, the texture's shape and the alpha envelope ignored",
      "Draws particles blended by vertex alpha times texture alpha; without it quads are "
      "opaque squares of their colour.",
      "rendering"),
    E(21, "Vertex Alpha Envelope", "EnvelopeStorage", kLifeByte,
      "alpha 0 (invisible once fading is on)",
      "A free particle's opacity over its life, 0 transparent to 255 opaque; shows only with "
      "\"Use Vertex Alpha Fading?\".",
      "size and colour"),
    E(22, "Red Color Envelope", "EnvelopeStorage", kLifeByte, "red 0",
      "A free particle's red over its life, 0..255 (not 0..1 like scene colours); values are "
      "truncated and capped at 255.",
      "size and colour"),
    E(23, "Green Color Envelope", "EnvelopeStorage", kLifeByte, "green 0",
      "A free particle's green over its life, 0..255.", "size and colour"),
    E(24, "Blue Color Envelope", "EnvelopeStorage", kLifeByte, "blue 0",
      "A free particle's blue over its life, 0..255.", "size and colour"),
    E(25, "MultiCollisionManager", "MultiCollisionManager", "collision geometry", "no collisions",
      "The surfaces particles hit; a hit needs \"Bounce Rate\" or \"Attach Rate\" linked to "
      "do anything but report.",
      "collision"),
    E(26, "Bounce Rate", "Value", kChance,
      "0 (when \"Attach Rate\" is also empty, hits pass through)",
      "Chance that a hitting particle that did not attach bounces (mirrored, at half its "
      "speed); a particle that neither attaches nor bounces dies.",
      "collision"),
    E(27, "Attach Rate", "Value", kChance, "0",
      "Chance that a hitting particle comes to rest on the surface: it then slides (chance "
      "\"Attached_SlideRate\") or sticks.",
      "collision"),
    E(28, "Attached Lifespan", "Value", kSeconds,
      "stuck particles never end and keep their records",
      "How long a stuck particle lives, counted from the moment it stuck; 0 or below means "
      "for ever.",
      "collision"),
    E(29, "Attached Particles Align to Normals?", "Value", kYesNo, "no: they face \"LookAt\"",
      "Stuck and sliding particles lie flat on the surface, facing along its normal.", "collision"),
    E(30, "Attached Size Offset Envelope", "EnvelopeStorage",
      "x: fraction of the attached life 0..1; y: factor (or added units)",
      "the size at sticking, unchanged",
      "A stuck particle's size over its attached life: the size it had when it stuck times "
      "this (plus this with \"Attached Size Offset Additive?\").",
      "collision"),
    E(31, "Attached Size Offset Additive?", "Value", kYesNo, "no: the envelope multiplies",
      "Adds the attached size envelope to the size at sticking instead of multiplying.",
      "collision"),
    E(32, "Attached Alpha Offset Envelope", "EnvelopeStorage", kAttachedFactor,
      "1: alpha as at sticking",
      "A stuck particle's alpha over its attached life: the alpha it had when it stuck times "
      "this, clamped to 0..255.",
      "collision"),
    E(33, "Attached Red Offset Envelope", "EnvelopeStorage", kAttachedFactor,
      "1: red as at sticking", "Factor on a stuck particle's red over its attached life.",
      "collision"),
    E(34, "Attached Green Offset Envelope", "EnvelopeStorage", kAttachedFactor,
      "1: green as at sticking", "Factor on a stuck particle's green over its attached life.",
      "collision"),
    E(35, "Attached Blue Offset Envelope", "EnvelopeStorage", kAttachedFactor,
      "1: blue as at sticking", "Factor on a stuck particle's blue over its attached life.",
      "collision"),
    E(36, "Attached_SlideRate", "Value", kChance, "0: particles that come to rest stick",
      "Chance that a particle coming to rest slides along the surface instead of sticking; a "
      "sliding particle keeps its free life and falls along the surface.",
      "collision"),
    E(37, "Attached_SlidingHeight", "Value", "world units", "0",
      "How high above the surface sliding particles travel; it also lengthens every collision "
      "probe.",
      "collision"),
    E(38, "Sliding Size Offset Envelope", "EnvelopeStorage",
      "x: fraction of the free life 0..1; y: added world units",
      "0: sliding particles are drawn 1 + their size larger",
      "A sliding particle's size is this + its size multiplier (at least 1) + its size when it "
      "began to slide, a sum: link [[0, -1], [1, -1]] to keep its flight size.",
      "collision"),
    E(39, "Sliding Particles Attractor Immunity?", "Value", kYesNo, "no",
      "Sliding particles ignore the attractors.", "collision"),
    E(40, "Collision Report Rate", "Value", kChance, "no reports",
      "Chance that a hit of a particle that is not sliding is written to the three \"Out:\" "
      "links.",
      "collision"),
    E(41, "Out: Collision ID (0 for no collision)", "Value", "output: object id + 1",
      "nothing written",
      "Written by the emitter: 1 + the id of the collision object of the last reported hit, "
      "reset to 0 every frame.",
      "collision"),
    E(42, "Out: Collision Position", "Value Vector", "output: world point", "nothing written",
      "Written by the emitter: where the last reported hit was; kept until the next report.",
      "collision"),
    E(43, "Out: Collision Normal", "Value Vector", "output: unit vector", "nothing written",
      "Written by the emitter: the surface normal of the last reported hit.", "collision"),
    E(44, "Bouncing Particles Report Collisions?", "Value", kYesNo, "no",
      "Read but without effect: every particle that is not sliding may report.", "collision"),
    E(45, "SpinSpeed_Min", "Value", "radians per logic step", "no spin (needs SpinSpeed_Max too)",
      "Slowest spin of a quad about its facing axis; each particle's speed is drawn from Min "
      "up to Max in steps of 0.01.",
      "motion", 1),
    E(46, "SpinSpeed_Max", "Value", "radians per logic step", "no spin (needs SpinSpeed_Min too)",
      "Fastest spin (exclusive); see SpinSpeed_Min.", "motion", 1),
    E(47, "SpinStart", "Value", "radians", "0",
      "The angle every particle starts at; linked alone it turns spin on at speed 0. Angles "
      "beyond +-360 (radians) jump back to 0.",
      "motion"),
    E(48, "Smoke?", "Value", kYesNo, "no",
      "Turns on smoke mode (pair forces, surface repulsion, drag, smoke collision); needs "
      "\"SmokeSettings\" too.",
      "smoke"),
    E(49, "SmokeSettings", "AdvPE_SmokeSettings", "smoke settings", "no smoke",
      "The smoke mode's settings; used only while \"Smoke?\" is yes.", "smoke"),
    E(50, "Simulation Scaler", "Value", "factor (0 or below pauses, above 3 acts as 1)", "1",
      "Speeds the whole effect up or down: births per second, motion per step and spin are "
      "multiplied by it, lifespans divided; the logic rate stays.",
      "motion"),
    E(51, "Particle Texture", "Texture", "picture (white, shape in alpha)", "untextured squares",
      "The picture on every free particle, tinted by its colour.", "rendering"),
    E(52, "Attached Texture", "Texture", "picture (white, shape in alpha)",
      "stuck particles show \"Particle Texture\"",
      "The picture on stuck particles; used only when \"Particle Texture\" is linked too.",
      "rendering"),
    E(53, "Attractors", "AdvPE_Attractor", "any number of attractors", "none",
      "Point forces acting on every free particle each logic step.", "motion"),
};

constexpr LinkReference A(int index, std::string_view name, std::string_view type,
                          std::string_view unit, std::string_view fallback,
                          std::string_view meaning, std::string_view group, int step_power = 0) {
  return {kAttractor, index, name, type, unit, fallback, meaning, group, step_power};
}

constexpr std::array kAttractorLinks = {
    A(0, "Position", "Value Vector", "world point", "the channel's \"position\" ([0, 0, 0])",
      "The attractor's centre.", "placement"),
    A(1, "Strength", "Value", kPerStepSquared, "the channel's \"strength\" (1)",
      "Pull towards the centre (negative pushes away), times the falloff: 1 / r^2 (r at least "
      "\"Minimum Radius\") or 1 - r / \"Radius\".",
      "force", 2),
    A(2, "Linear Falloff?", "Value", kYesNo, "the channel's \"falloff\" (inverse-square)",
      "Falls off linearly to zero at \"Radius\" instead of with the inverse square of the "
      "distance.",
      "force"),
    A(3, "Minimum Radius", "Value", "world units", "the channel's \"minimum_radius\" (0.1)",
      "Inverse-square falloff: distances below this count as this, so the pull near the "
      "centre stays finite.",
      "force"),
    A(4, "Radius", "Value", "world units", "the channel's \"radius\" (1)",
      "Linear falloff: the distance at which the force reaches zero.", "force"),
    A(5, "Vortex Strength", "Value", kPerStepSquared, "the channel's \"vortex_strength\" (0)",
      "Swirl around \"Vortex Axis\" through the centre, with the same falloff.", "force", 2),
    A(6, "Vortex Axis", "Value Vector", "direction", "the channel's \"vortex_axis\" ([0, 1, 0])",
      "The axis the swirl turns about; a negative \"Vortex Strength\" turns the other way.",
      "force"),
};

constexpr LinkReference S(int index, std::string_view name, std::string_view type,
                          std::string_view unit, std::string_view fallback,
                          std::string_view meaning, std::string_view group, int step_power = 0) {
  return {kSmoke, index, name, type, unit, fallback, meaning, group, step_power};
}

constexpr std::array kSmokeLinks = {
    S(0, "Repulsion Envelope", "EnvelopeStorage",
      "x: distance between two particles in world units; y: units per logic step per "
      "logic step",
      "no repulsion",
      "Pushes pairs of smoke particles apart, for distances strictly between the first and "
      "last key's x, times the strength envelope.",
      "pair forces", 2),
    S(1, "Attraction Envelope", "EnvelopeStorage",
      "x: distance between two particles in world units; y: units per logic step per "
      "logic step",
      "no attraction",
      "Pulls pairs of smoke particles together, for distances strictly between the first and "
      "last key's x, times the strength envelope.",
      "pair forces", 2),
    S(2, "Surface Repulsion Envelope", "EnvelopeStorage",
      "x: distance to the surface ahead in world units; y: units per logic step per "
      "logic step",
      "no surface repulsion",
      "Pushes a particle back from the collision surface ahead of it; the last key's x is how "
      "far it looks ahead.",
      "pair forces", 2),
    S(3, "Force Strength Envelope", "EnvelopeStorage",
      "x: fraction of the free life 0..1; y: factor", "0: no pair or surface force at all",
      "Scales the three smoke forces over a particle's life; without it they are all zero.",
      "pair forces"),
    S(4, "Collision Probe Minimum", "Value", "world units", "0",
      "Smoke collision looks at least this far ahead for a surface to slow down before.",
      "smoke collision"),
    S(5, "Approach Speed Factor", "Value", "factor", "1",
      "Speed factor for a particle that sees a surface ahead beyond this step's reach.",
      "smoke collision"),
    S(6, "Collision Enabled?", "Value", kYesNo, "no",
      "Turns on smoke collision: particles slow before and glide along the "
      "\"MultiCollisionManager\" surfaces instead of the ordinary collision response.",
      "smoke collision"),
    S(7, "Contact Speed Factor", "Value", "factor", "1",
      "Speed factor for a particle touching a surface within this step, gliding along it.",
      "smoke collision"),
    S(8, "Recheck Collision?", "Value", kYesNo, "no",
      "After a smoke collision, checks the new motion again and stops the particle if it "
      "would still hit.",
      "smoke collision"),
    S(9, "Drag", "Value", "velocity factor, applied each logic step", "1: no drag",
      "Every smoke particle's velocity is multiplied by this each logic step when below 1.",
      "motion"),
    S(10, "Drag Fades With Age?", "Value", kYesNo, "no",
      "Scales the drag factor by (1 - fraction of life), so old particles stop harder.", "motion"),
    S(11, "Max Speed Fades With Age?", "Value", kYesNo, "no",
      "Scales the emitter's \"Maximum Speed\" by (1 - fraction of life).", "motion"),
    S(12, "Global Force Fades With Age?", "Value", kYesNo, "no",
      "Scales the emitter's \"GlobalForce\" by (1 - fraction of life).", "motion"),
    S(13, "Debug Colours?", "Value", kYesNo, "no",
      "Colours smoke particles by their smoke collision instead of the colour envelopes: white "
      "(alpha 0) with no surface near, red when placed by it, green when the recheck stopped "
      "it.",
      "debugging"),
};

constexpr std::array kCollisionLinks = {
    LinkReference{kCollision, 0, "Collision Objects", "3D ObjectData", "any number of meshes",
                  "none (only the scene's \"colliders\")",
                  "Meshes collided with in world space, after the colliders added in the scene; "
                  "only their front faces (clockwise, as drawn) are hit.",
                  "geometry", 0},
};

}  // namespace

std::span<const LinkReference> LinkReferences(std::string_view channelTypeName) {
  if (channelTypeName == kEmitter) return kEmitterLinks;
  if (channelTypeName == kAttractor) return kAttractorLinks;
  if (channelTypeName == kSmoke) return kSmokeLinks;
  if (channelTypeName == kCollision) return kCollisionLinks;
  return {};
}

std::vector<std::string_view> KnownChannelTypes() {
  return {kEmitter, kCollision, kAttractor, kSmoke};
}

const LinkReference* FindLinkReference(std::string_view channelTypeName, std::string_view name) {
  for (const LinkReference& link : LinkReferences(channelTypeName))
    if (link.Name == name) return &link;
  return nullptr;
}

}  // namespace apescene
