// Names and folders of the meeting feature in the three Sametime client
// layouts: Sametime Connect 7, Sametime Connect 8 and later, and the Sametime
// embedded in Notes 8 and later.
#pragma once

namespace sametime_layout {

// The feature's files, all found side by side in the suite install folder.
constexpr wchar_t kNativeLibrary[] = L"qmmrvjni.dll";
constexpr wchar_t kRuntimeC[] = L"msvcr120.dll";
constexpr wchar_t kRuntimeCpp[] = L"msvcp120.dll";
constexpr wchar_t kJar[] = L"com.mrv.realtime.meeting_1.0.1.jar";
constexpr wchar_t kFeatureXml[] = L"feature.xml";
constexpr wchar_t kFeatureFolderName[] = L"com.mrv.realtime.meeting.feature_1.0.1";

// Runtime of the previous release, which the removal still cleans up.
constexpr wchar_t kOldRuntimeCpp[] = L"msvcp90.dll";
constexpr wchar_t kOldRuntimeC[] = L"msvcr90.dll";
constexpr wchar_t kOldRuntimeManifest[] = L"Microsoft.VC90.CRT.manifest";

// Sametime 7, relative to the Sametime Connect folder.
constexpr wchar_t kST7NativeFolder[] = L"native";
constexpr wchar_t kST7PluginsFolder[] = L"plugins";
constexpr wchar_t kST7FeaturesFolder[] = L"features";
constexpr wchar_t kST7PlatformXml[] = L"configuration\\org.eclipse.update\\platform.xml";
constexpr wchar_t kST7Site[] = L"//site[@url=\"platform:/base/\"]";

// Sametime 8, relative to the Sametime Connect folder; platform.xml is per user.
constexpr wchar_t kST8NativeFolder[] = L"rcp";
constexpr wchar_t kST8PluginsFolder[] = L"shared\\eclipse\\plugins";
constexpr wchar_t kST8FeaturesFolder[] = L"shared\\eclipse\\features";
constexpr wchar_t kST8Site[] = L"//site[@url=\"file:../shared/eclipse/\"]";
constexpr wchar_t kST8SiteNested[] = L"//site[@url=\"file:../../shared/eclipse/\"]";

// Embedded: the native library in the Notes program folder (its old runtime
// in "native"), the rest relative to the Notes data folder.
constexpr wchar_t kEmbeddedOldRuntimeFolder[] = L"native";
constexpr wchar_t kEmbeddedPluginsFolder[] = L"workspace\\applications\\eclipse\\plugins";
constexpr wchar_t kEmbeddedFeaturesFolder[] = L"workspace\\applications\\eclipse\\features";
constexpr wchar_t kEmbeddedPlatformXml[] = L"workspace\\.config\\org.eclipse.update\\platform.xml";
constexpr wchar_t kEmbeddedSite[] = L"//site[@url=\"platform:/config/../applications/eclipse/\"]";

// Version of a Sametime lookup that finds none; 8 and above is Sametime 8.
constexpr unsigned long kPresetVersion = 7;
constexpr unsigned long kSametime8Version = 8;

}  // namespace sametime_layout
