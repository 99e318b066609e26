// The plug-in loader: libraries named after type GUIDs, dependencies loaded in turn, and a
// message naming the cause of every failure. (The sibling and emitter plug-ins' own loading is
// tested with the emitter.)
#include <gmock/gmock.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>

#include "host/plugin_loader.h"
#include "host/tests/test_channels.h"
#include "host/tests/test_plugin_guids.h"
#include "host/type_guids.h"

namespace {

namespace fs = std::filesystem;
using ::testing::HasSubstr;

constexpr GUID kDependent = TestPluginGuid(TEST_PLUGIN_DEPENDENT);
constexpr GUID kNowhere = TestPluginGuid(0xFF);  // no plug-in has this type

fs::path TestPlugin(int variant) {
  return fs::path(HOST_TEST_PLUGIN_DIR) / ("host_test_plugin_" + std::to_string(variant) + ".so");
}

// A plug-in folder of the test's own, removed afterwards.
class PluginFolderTest : public HostContextTest {
 protected:
  PluginFolderTest() { fs::create_directories(folder_); }
  ~PluginFolderTest() override { fs::remove_all(folder_); }
  // Puts `library` into the folder under the file name of `type`.
  void Install(const fs::path& library, GUID type) {
    fs::copy_file(library, folder_ / (FormatGuid(type) + ".so"),
                  fs::copy_options::overwrite_existing);
  }
  const fs::path folder_ = fs::temp_directory_path() / ("host-loader-" + std::to_string(getpid()));
};

// Every failure answers false with a message naming its cause and the type, and keeps nothing
// loaded; once the missing piece is there, loading succeeds.
TEST_F(PluginFolderTest, FailuresAreNamedAndDependenciesLoadInOrder) {
  constexpr int kNoFolder = -3, kNothing = -2, kTextFile = -1, kObjectData = 0;
  const std::string nowhere = FormatGuid(kNowhere);
  const fs::path absent = folder_ / "absent";
  struct Case {
    int installed;  // a test plug-in variant, or what else the folder holds
    std::string cause;
  };
  // In this order: the folder's file for kNowhere changes from case to case.
  const Case cases[] = {
      {kNoFolder, "plug-in folder " + absent.string() + " not found"},
      {kNothing, "plug-in file " + (folder_ / nowhere).string() + ".so not found"},
      {kTextFile, "cannot load plug-in"},
      {kObjectData, std::string("declares type ") + kObjectDataGuidText + ", not " + nowhere},
      {TEST_PLUGIN_NULL_INIT, "created no channel"},
      {TEST_PLUGIN_NO_INIT, "has no InitDLL"},
      {TEST_PLUGIN_MISSING_LIBRARY, "runtime library libape-no-such-runtime.so.9 needed by"},
      {TEST_PLUGIN_THROWING, "threw: dependency declaration failed"},
      {TEST_PLUGIN_DEPENDENT, std::string("type ") + kObjectDataGuidText + " needed by plug-in"}};
  for (const Case& c : cases) {
    SCOPED_TRACE(c.cause);
    const GUID type = c.installed > 0 ? TestPluginGuid(c.installed) : kNowhere;
    if (c.installed == kTextFile) std::ofstream(folder_ / (nowhere + ".so")) << "not a library";
    if (c.installed == kObjectData) Install(OBJECT_DATA_PLUGIN_FILE, kNowhere);
    if (c.installed > 0) Install(TestPlugin(c.installed), type);
    PluginLoader loader(c.installed == kNoFolder ? absent.string() : folder_.string());
    std::string error;
    EXPECT_FALSE(loader.LoadType(type, &error));
    EXPECT_THAT(error, HasSubstr(c.cause));
    EXPECT_THAT(error, HasSubstr(FormatGuid(type)));
    EXPECT_EQ(loader.GetTypeRecord(type), nullptr);
    EXPECT_EQ(loader.CreateChannelByName("Loader Test", &error), nullptr);
    EXPECT_THAT(error, HasSubstr("\"Loader Test\""));
  }

  Install(OBJECT_DATA_PLUGIN_FILE, kObjectDataGuid);
  PluginLoader loader(folder_.string());
  std::string error;
  ASSERT_TRUE(loader.LoadType(kDependent, &error)) << error;
  const std::vector<Qen_Dependency>& entries = loader.GetDependencies(kDependent)->Entries;
  ASSERT_EQ(entries.size(), 4u);  // the last, its own type, is a cycle that must end
  EXPECT_EQ(entries[0].LibraryName, "libc.so.6");
  EXPECT_TRUE(entries[1].TypeGuid == kObjectDataGuid && entries[2].TypeGuid == kValueGuid &&
              entries[3].TypeGuid == kDependent);
  EXPECT_NE(loader.GetTypeRecord(kObjectDataGuid), nullptr);
  for (const char* name : {"Loader Test", "Matrix"}) {  // loaded and built in
    std::unique_ptr<Qen_Channel> channel(loader.CreateChannelByName(name, &error));
    EXPECT_NE(channel, nullptr) << error;
  }
}

}  // namespace
