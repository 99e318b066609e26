// Type GUIDs of the small plug-ins the loader tests build; a test copies a plug-in into a
// folder of its own under whichever GUID file name the case needs.
#pragma once

#include "platform/windows_types.h"

inline constexpr GUID kDependentPluginGuid =
    GuidFromRegistryText("D0000001-0000-4000-8000-000000000001");
inline constexpr GUID kMissingLibraryPluginGuid =
    GuidFromRegistryText("D0000002-0000-4000-8000-000000000002");
inline constexpr GUID kUnknownTypePluginGuid =
    GuidFromRegistryText("D0000003-0000-4000-8000-000000000003");
inline constexpr GUID kNullInitPluginGuid =
    GuidFromRegistryText("D0000004-0000-4000-8000-000000000004");
inline constexpr GUID kNoInitPluginGuid =
    GuidFromRegistryText("D0000005-0000-4000-8000-000000000005");
inline constexpr GUID kCycleFirstPluginGuid =
    GuidFromRegistryText("D0000006-0000-4000-8000-000000000006");
inline constexpr GUID kCycleSecondPluginGuid =
    GuidFromRegistryText("D0000007-0000-4000-8000-000000000007");
inline constexpr GUID kThrowingPluginGuid =
    GuidFromRegistryText("D0000008-0000-4000-8000-000000000008");
// Declared as a dependency, but no plug-in has it.
inline constexpr GUID kNowhereGuid = GuidFromRegistryText("D00000FF-0000-4000-8000-0000000000FF");
