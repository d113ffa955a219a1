#include "tests/safetynet/SafetyNetFixture.h"

namespace accounts {
namespace {

using testing::HasSubstr;
using testing::IsEmpty;

/// The plug-in gives true, and what it left cannot be verified.
class PuttingInputsBackTest : public SafetyNetTest {
 protected:
  void expectNotVerified(const Settlement& settlement, const std::string& reason) {
    ASSERT_TRUE(settlement.error);
    EXPECT_EQ(settlement.error->exitStatus, ExitStatus::NotVerified);
    EXPECT_EQ(settlement.error->message, "The plug-in reported success but " + reason +
                                             "; the files are put back as they were");
    EXPECT_THAT(settlement.warnings, IsEmpty());
    EXPECT_THAT(entriesOfTheHost(), IsEmpty());
  }
};

TEST_F(PuttingInputsBackTest, LegacyStoresComeBackAfterASaveThatFailed) {
  addSettings(12, {"one"});
  addLegacyMail({"mail"});
  addLegacyExchange({"exchange"});
  const auto before = device.fileSystem.files;
  keep();
  remove(kLegacyMailPath);
  remove(kLegacyExchangePath);

  expectNotVerified(net.settle(PluginEnd::GaveTrue, kFailedSave),
                    "the settings file was not written");

  EXPECT_EQ(device.fileSystem.files.size(), before.size());
  for (const auto& [path, file] : before) {
    EXPECT_EQ(contentsOf(path), file.contents);
  }
}

TEST_F(PuttingInputsBackTest, AReplacedSettingsFileComesBackWhenTheNewOneCannotBeRead) {
  addSettings(11, {"one"});
  const std::string before = contentsOf(kSettingsPath);
  keep();
  device.fileSystem.addFile(kSettingsPath, "half a file");

  expectNotVerified(net.settle(PluginEnd::GaveTrue, kWrittenSave),
                    "the settings file cannot be read as a property list");

  EXPECT_EQ(contentsOf(kSettingsPath), before);
}

TEST_F(PuttingInputsBackTest, AnOldVersionIsNotVerified) {
  for (const PropertyValue& version : {PropertyValue(11), PropertyValue(PropertyArray())}) {
    device.addPropertyList(kSettingsPath, PropertyDictionary{{"Version", version}});
    SafetyNet guard(device.fileSystem, device.propertyLists, accountFilesInHome("/var/mobile"), "");
    ASSERT_TRUE(guard.keepInputs(kTime));

    expectNotVerified(guard.settle(PluginEnd::GaveTrue, kWrittenSave),
                      "the settings file has not the current version");
  }
}

TEST_F(PuttingInputsBackTest, AMissingSettingsFileIsNotVerified) {
  addLegacyMail({"mail"});
  keep();
  remove(kLegacyMailPath);

  expectNotVerified(net.settle(PluginEnd::GaveTrue, kNoSave),
                    "the settings file cannot be read as a property list");

  EXPECT_TRUE(exists(kLegacyMailPath));
}

TEST_F(PuttingInputsBackTest, ASettingsFileThatTheRunMadeIsRemoved) {
  addLegacyMail({"mail"});
  keep();
  remove(kLegacyMailPath);
  addSettings(12);

  expectNotVerified(net.settle(PluginEnd::GaveTrue, {LastSave::Failed, true}),
                    "the settings file was not written");

  EXPECT_FALSE(exists(kSettingsPath));
  EXPECT_TRUE(exists(kLegacyMailPath));
}

TEST_F(PuttingInputsBackTest, ASettingsFileThatAnotherProgramMadeStays) {
  keep();
  addSettings(11);

  expectNotVerified(net.settle(PluginEnd::GaveTrue, kNoSave),
                    "the settings file has not the current version");

  EXPECT_TRUE(exists(kSettingsPath));
}

TEST_F(PuttingInputsBackTest, ASentinelGoesSoThatTheNextMigrationConvertsTheStores) {
  addLegacyMail({"mail"});
  keep();
  remove(kLegacyMailPath);
  device.fileSystem.addFile(kSentinelPath, "the removal had begun");

  expectNotVerified(net.settle(PluginEnd::GaveTrue, kFailedSave),
                    "the settings file was not written");

  EXPECT_FALSE(exists(kSentinelPath));
}

TEST_F(PuttingInputsBackTest, AtEveryFaultTheFilesAreInTheirPlacesOrKept) {
  addSettings(11, {"one"});
  addLegacyMail({"mail"});
  const auto before = device.fileSystem.files;
  std::size_t operations = 1;
  for (std::size_t operation = 0; operation < operations; ++operation) {
    FakePlatform faulty;
    faulty.fileSystem.files = before;
    SafetyNet guard(faulty.fileSystem, faulty.propertyLists, accountFilesInHome("/var/mobile"),
                    "restore");
    ASSERT_TRUE(guard.keepInputs(kTime));
    faulty.fileSystem.files.erase(std::string(kLegacyMailPath));
    faulty.fileSystem.addFile(kSettingsPath, "half a file");
    const std::size_t first = faulty.fileSystem.operationCount();
    faulty.fileSystem.failAt(first + operation);

    const Settlement settlement = guard.settle(PluginEnd::GaveTrue, kWrittenSave);

    operations = std::max(operations, faulty.fileSystem.operationCount() - first);
    ASSERT_TRUE(settlement.error) << operation;
    const bool isPutBack = settlement.error->exitStatus == ExitStatus::NotVerified;
    for (const auto& [path, file] : before) {
      EXPECT_EQ(faulty.fileSystem.contentsOf(isPutBack ? path : kept(path)), file.contents)
          << operation;
    }
    if (!isPutBack) {
      EXPECT_EQ(settlement.error->exitStatus, ExitStatus::InputOutputError);
      EXPECT_THAT(settlement.error->message, HasSubstr("\"restore --from Kept-20260102T030405Z\""));
      EXPECT_THAT(settlement.keptFolders, testing::ElementsAre(folder));
    }
  }
  EXPECT_GT(operations, 10u);
}

}  // namespace
}  // namespace accounts
