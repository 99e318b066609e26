// The plug-in loader: libraries named after type GUIDs, entry points found with dlsym,
// dependencies loaded in turn, and a clear message for every way loading can fail.
#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cctype>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/plugin_loader.h"
#include "host/tests/test_channels.h"
#include "host/tests/test_plugin_guids.h"
#include "host/type_guids.h"

namespace {

namespace fs = std::filesystem;
using ::testing::HasSubstr;

fs::path TestPlugin(const char* variant) {
  return fs::path(HOST_TEST_PLUGIN_DIR) / (std::string("host_test_plugin_") + variant + ".so");
}

// A plug-in folder of the test's own, removed afterwards.
class PluginFolderTest : public HostContextTest {
 protected:
  PluginFolderTest() {
    const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
    std::string name = info->name();
    for (char& ch : name)
      if (ch == '/') ch = '_';
    folder_ = fs::temp_directory_path() / ("host-loader-" + std::to_string(getpid()) + "-" + name);
    fs::remove_all(folder_);
    fs::create_directories(folder_);
  }
  ~PluginFolderTest() override { fs::remove_all(folder_); }

  // Puts `library` into the folder under the file name of `type`.
  void Install(const fs::path& library, GUID type) {
    fs::copy_file(library, folder_ / (FormatGuid(type) + ".so"),
                  fs::copy_options::overwrite_existing);
  }
  void InstallObjectData() { Install(OBJECT_DATA_PLUGIN_FILE, kObjectDataGuid); }

  fs::path folder_;
};

TEST(PluginEntryPoints, GetTypeFillsOneRecordAndInitDllCreatesChannels) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  void* library = dlopen(OBJECT_DATA_PLUGIN_FILE, RTLD_NOW | RTLD_LOCAL);
  ASSERT_NE(library, nullptr) << dlerror();
  auto get_type = reinterpret_cast<GetTypeFunction>(dlsym(library, "GetType"));
  auto init_dll = reinterpret_cast<InitDllFunction>(dlsym(library, "InitDLL"));
  ASSERT_NE(get_type, nullptr);
  ASSERT_NE(init_dll, nullptr);

  ChannelType* first = get_type();
  ChannelType* second = get_type();
  EXPECT_EQ(first, second);
  EXPECT_STREQ(first->TypeName, "3D ObjectData");
  EXPECT_EQ(first->TypeGuid, kObjectDataGuid);
  EXPECT_EQ(first->BaseTypeGuid, GUID{});
  EXPECT_EQ(first->TypeWord, 0u);

  std::unique_ptr<Qen_Channel> channel(init_dll());
  ASSERT_NE(channel, nullptr);
  EXPECT_EQ(channel->GetChannelType().TypeGuid, kObjectDataGuid);
  EXPECT_EQ(context.GetChannelByType(kObjectDataGuid, 0), channel.get());
  channel.reset();
  dlclose(library);
}

TEST(PluginLoaderFolder, EnvironmentOverridesTheBuildFolder) {
  const char* saved = std::getenv("APE_PLUGIN_DIR");
  const std::optional<std::string> original =
      saved != nullptr ? std::optional<std::string>(saved) : std::nullopt;

  setenv("APE_PLUGIN_DIR", "/some/where", 1);
  EXPECT_EQ(PluginLoader::DefaultPluginFolder(), "/some/where");
  unsetenv("APE_PLUGIN_DIR");
  EXPECT_EQ(PluginLoader::DefaultPluginFolder(), APE_DEFAULT_PLUGIN_DIR);
  setenv("APE_PLUGIN_DIR", "", 1);
  EXPECT_EQ(PluginLoader::DefaultPluginFolder(), APE_DEFAULT_PLUGIN_DIR);

  if (original)
    setenv("APE_PLUGIN_DIR", original->c_str(), 1);
  else
    unsetenv("APE_PLUGIN_DIR");
}

using PluginLoading = PluginFolderTest;

TEST_F(PluginLoading, LoadsTheObjectDataPluginFromTheBuildFolder) {
  PluginLoader loader(APE_DEFAULT_PLUGIN_DIR);
  std::string error;
  ASSERT_TRUE(loader.LoadType(kObjectDataGuid, &error)) << error;
  const ChannelType* record = loader.GetTypeRecord(kObjectDataGuid);
  ASSERT_NE(record, nullptr);
  EXPECT_STREQ(record->TypeName, "3D ObjectData");
  ASSERT_NE(loader.GetDependencies(kObjectDataGuid), nullptr);

  std::unique_ptr<Qen_Channel> by_guid(loader.CreateChannel(kObjectDataGuid, &error));
  std::unique_ptr<Qen_Channel> by_name(loader.CreateChannelByName("3D ObjectData", &error));
  ASSERT_NE(by_guid, nullptr) << error;
  ASSERT_NE(by_name, nullptr) << error;
  EXPECT_EQ(by_name->GetChannelType().TypeGuid, kObjectDataGuid);
  EXPECT_EQ(context_.GetChannelByType(kObjectDataGuid, 1), by_name.get());
}

TEST_F(PluginLoading, BuiltInTypesNeedNoFolder) {
  PluginLoader loader("/nonexistent/plugins");
  std::string error;
  for (const BuiltInChannelType& built_in : BuiltInChannelTypes()) {
    EXPECT_TRUE(loader.LoadType(built_in.Record.TypeGuid, &error)) << error;
    std::unique_ptr<Qen_Channel> channel(
        loader.CreateChannelByName(built_in.Record.TypeName, &error));
    ASSERT_NE(channel, nullptr) << built_in.Record.TypeName << ": " << error;
    EXPECT_EQ(channel->GetChannelType().TypeGuid, built_in.Record.TypeGuid);
  }
}

TEST_F(PluginLoading, UnknownTypeNameIsNamedInTheMessage) {
  PluginLoader loader(folder_.string());
  std::string error;
  EXPECT_EQ(loader.CreateChannelByName("AdvancedParticleEmitter", &error), nullptr);
  EXPECT_THAT(error, HasSubstr("\"AdvancedParticleEmitter\""));
  std::unique_ptr<Qen_Channel> value(loader.CreateChannelByName("Value", nullptr));
  EXPECT_NE(value, nullptr);
}

TEST_F(PluginLoading, DependenciesAreLoadedAndRecordedInOrder) {
  Install(TestPlugin("dependent"), kDependentPluginGuid);
  InstallObjectData();
  PluginLoader loader(folder_.string());
  std::string error;
  ASSERT_TRUE(loader.LoadType(kDependentPluginGuid, &error)) << error;
  EXPECT_NE(loader.GetTypeRecord(kObjectDataGuid), nullptr);

  const Qen_List* dependencies = loader.GetDependencies(kDependentPluginGuid);
  ASSERT_NE(dependencies, nullptr);
  ASSERT_EQ(dependencies->Entries.size(), 3u);
  EXPECT_EQ(dependencies->Entries[0].LibraryName, "libc.so.6");
  EXPECT_EQ(dependencies->Entries[1].TypeGuid, kObjectDataGuid);
  EXPECT_EQ(dependencies->Entries[2].TypeGuid, kValueGuid);

  std::unique_ptr<Qen_Channel> channel(loader.CreateChannelByName("Loader Test", &error));
  ASSERT_NE(channel, nullptr) << error;
  EXPECT_EQ(channel->GetChannelType().TypeGuid, kDependentPluginGuid);
}

TEST_F(PluginLoading, MissingDependencyLeavesNothingLoaded) {
  Install(TestPlugin("dependent"), kDependentPluginGuid);  // the object data is not there
  PluginLoader loader(folder_.string());
  std::string error;
  EXPECT_FALSE(loader.LoadType(kDependentPluginGuid, &error));
  EXPECT_THAT(error, HasSubstr(kObjectDataGuidText));
  EXPECT_THAT(error, HasSubstr(FormatGuid(kDependentPluginGuid)));
  EXPECT_EQ(loader.GetTypeRecord(kDependentPluginGuid), nullptr);
  EXPECT_EQ(loader.CreateChannel(kDependentPluginGuid, &error), nullptr);

  InstallObjectData();  // once it is there, a second attempt succeeds
  EXPECT_TRUE(loader.LoadType(kDependentPluginGuid, &error)) << error;
}

TEST_F(PluginLoading, DependencyCycleEnds) {
  Install(TestPlugin("cycle_first"), kCycleFirstPluginGuid);
  Install(TestPlugin("cycle_second"), kCycleSecondPluginGuid);
  PluginLoader loader(folder_.string());
  std::string error;
  ASSERT_TRUE(loader.LoadType(kCycleFirstPluginGuid, &error)) << error;
  EXPECT_NE(loader.GetTypeRecord(kCycleSecondPluginGuid), nullptr);
}

// One way of failing: what the folder holds, what is asked for, what the message must name.
struct FailureCase {
  const char* what;
  const char* variant;  // test plug-in installed under `installed_as`; null: none
  GUID installed_as;
  GUID requested;
  std::vector<std::string> message_parts;
};

class PluginLoadFailure : public PluginFolderTest,
                          public ::testing::WithParamInterface<FailureCase> {};

TEST_P(PluginLoadFailure, AnswersFalseWithAClearMessage) {
  const FailureCase& c = GetParam();
  if (c.variant != nullptr) {
    const std::string variant = c.variant;
    if (variant == "object_data")
      Install(OBJECT_DATA_PLUGIN_FILE, c.installed_as);
    else if (variant == "not_a_library")
      std::ofstream(folder_ / (FormatGuid(c.installed_as) + ".so")) << "not a library";
    else
      Install(TestPlugin(c.variant), c.installed_as);
  }
  PluginLoader loader(folder_.string());
  std::string error;
  EXPECT_FALSE(loader.LoadType(c.requested, &error)) << c.what;
  for (const std::string& part : c.message_parts) EXPECT_THAT(error, HasSubstr(part)) << c.what;
  EXPECT_EQ(loader.GetTypeRecord(c.requested), nullptr) << c.what;
  EXPECT_EQ(loader.CreateChannel(c.requested, nullptr), nullptr) << c.what;
}

INSTANTIATE_TEST_SUITE_P(
    Cases, PluginLoadFailure,
    ::testing::Values(FailureCase{"no such file",
                                  nullptr,
                                  GUID{},
                                  kNowhereGuid,
                                  {"not found", FormatGuid(kNowhereGuid) + ".so"}},
                      FailureCase{"not a library",
                                  "not_a_library",
                                  kNowhereGuid,
                                  kNowhereGuid,
                                  {"cannot load plug-in", FormatGuid(kNowhereGuid)}},
                      FailureCase{"file under another type's name",
                                  "object_data",
                                  kNowhereGuid,
                                  kNowhereGuid,
                                  {std::string("declares type ") + kObjectDataGuidText,
                                   "not " + FormatGuid(kNowhereGuid)}},
                      FailureCase{"InitDLL creates nothing",
                                  "null_init",
                                  kNullInitPluginGuid,
                                  kNullInitPluginGuid,
                                  {"InitDLL", "created no channel"}},
                      FailureCase{"no InitDLL",
                                  "no_init",
                                  kNoInitPluginGuid,
                                  kNoInitPluginGuid,
                                  {"has no InitDLL", FormatGuid(kNoInitPluginGuid)}},
                      FailureCase{"runtime library missing",
                                  "missing_library",
                                  kMissingLibraryPluginGuid,
                                  kMissingLibraryPluginGuid,
                                  {"runtime library libape-no-such-runtime.so.9",
                                   FormatGuid(kMissingLibraryPluginGuid)}},
                      FailureCase{
                          "unknown dependency type",
                          "unknown_type",
                          kUnknownTypePluginGuid,
                          kUnknownTypePluginGuid,
                          {"type " + FormatGuid(kNowhereGuid), FormatGuid(kUnknownTypePluginGuid)}},
                      FailureCase{"dependency declaration throws",
                                  "throwing",
                                  kThrowingPluginGuid,
                                  kThrowingPluginGuid,
                                  {"threw", "dependency declaration failed"}}),
    [](const ::testing::TestParamInfo<FailureCase>& info) {
      std::string name = info.param.what;
      for (char& ch : name)
        if (!std::isalnum(static_cast<unsigned char>(ch))) ch = '_';
      return name;
    });

TEST(PluginLoaderFolderMissing, MessageNamesTheFolderAndType) {
  PluginLoader loader("/nonexistent/plugin/folder");
  std::string error;
  EXPECT_FALSE(loader.LoadType(kObjectDataGuid, &error));
  EXPECT_THAT(error, HasSubstr("/nonexistent/plugin/folder"));
  EXPECT_THAT(error, HasSubstr(kObjectDataGuidText));
  EXPECT_FALSE(loader.LoadType(kObjectDataGuid, nullptr));  // no message wanted: no crash
}

}  // namespace
