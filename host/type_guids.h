// The channel type GUIDs of this host installation. Plug-in libraries are named after them
// ("{registry form}.so"); the build reads the *GuidText lines below to name its plug-in files,
// so this header is the one place they are written.
#pragma once

#include "platform/windows_types.h"

inline constexpr char kAdvancedParticleEmitterGuidText[] = "5E1A7C3B-9D42-4F08-A6B1-2C7E90D4F315";
inline constexpr char kObjectDataGuidText[] = "0B7D2E61-4A93-4C5F-8E20-D16F3A9B7C48";
inline constexpr char kDeviceChannelGuidText[] = "9A4C1F27-3E85-4B6D-B0C2-7D18E5F4A691";
inline constexpr char kEnvelopeStorageGuidText[] = "3F8B6D20-71C4-4E9A-95D3-B2A04C6E1F87";
inline constexpr char kMultiCollisionManagerGuidText[] = "C2E91A54-8B3F-4D70-A1E6-5F27D0B94C3A";
inline constexpr char kAttractorGuidText[] = "7D5A3E92-C16B-4F84-B9A0-E3C82F1D6B55";
inline constexpr char kSmokeSettingsGuidText[] = "E4B07C19-2D6A-4A3E-87F5-19C6B3A0D2E8";
inline constexpr char kValueGuidText[] = "6C0F4A85-E2B7-4D19-A3C8-51E9D7F02B64";
inline constexpr char kValueVectorGuidText[] = "A8D35E07-6F1C-4B92-8D4A-C0E7B2953F1D";
inline constexpr char kMatrixGuidText[] = "2E97C6B1-D05A-4837-9F6E-8A14C3D7E520";
inline constexpr char kTextureGuidText[] = "D61F8B3A-47E2-4C05-B8D9-6A2F105E97C3";

inline constexpr GUID kAdvancedParticleEmitterGuid =
    GuidFromRegistryText(kAdvancedParticleEmitterGuidText);
inline constexpr GUID kObjectDataGuid = GuidFromRegistryText(kObjectDataGuidText);
inline constexpr GUID kDeviceChannelGuid = GuidFromRegistryText(kDeviceChannelGuidText);
inline constexpr GUID kEnvelopeStorageGuid = GuidFromRegistryText(kEnvelopeStorageGuidText);
inline constexpr GUID kMultiCollisionManagerGuid =
    GuidFromRegistryText(kMultiCollisionManagerGuidText);
inline constexpr GUID kAttractorGuid = GuidFromRegistryText(kAttractorGuidText);
inline constexpr GUID kSmokeSettingsGuid = GuidFromRegistryText(kSmokeSettingsGuidText);
inline constexpr GUID kValueGuid = GuidFromRegistryText(kValueGuidText);
inline constexpr GUID kValueVectorGuid = GuidFromRegistryText(kValueVectorGuidText);
inline constexpr GUID kMatrixGuid = GuidFromRegistryText(kMatrixGuidText);
inline constexpr GUID kTextureGuid = GuidFromRegistryText(kTextureGuidText);
