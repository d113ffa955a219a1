#include "migrator/UpgradeChain.h"

#include <utility>

#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

/// A migrator whose steps only write down that they ran. The step of one version may fail.
class RecordingMigrator : public AccountsDataMigrator {
 public:
  using AccountsDataMigrator::AccountsDataMigrator;

  std::vector<std::uint64_t> ran;
  std::optional<std::uint64_t> failing;

  template <std::uint64_t version>
  bool step(AccountsManager&) {
    ran.push_back(version);
    return version != failing;
  }
};

template <std::size_t... versions>
constexpr std::array<UpgradeStep, sizeof...(versions)> recordingChain(
    std::index_sequence<versions...>) {
  return {{{kUpgradeChain.at(versions).entryVersion, kUpgradeChain.at(versions).name,
            kUpgradeChain.at(versions).purpose,
            static_cast<UpgradeStep::Operation>(&RecordingMigrator::step<versions>)}...}};
}

class UpgradeChainTest : public StepTest {
 protected:
  bool run() { return recorder._migrateNewAccountsInfo(*store); }

  static constexpr auto kChain = recordingChain(std::make_index_sequence<kUpgradeChain.size()>());
  RecordingMigrator recorder{kChain};
  using Versions = std::vector<std::uint64_t>;
  const Versions allVersions = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11};
};

TEST_F(UpgradeChainTest, TheStepsStandInTheOrderOfTheirBuilds) {
  Lines names;
  for (const UpgradeStep& step : kUpgradeChain) {
    names.emplace_back(step.name);
  }
  EXPECT_EQ(names, (Lines{"_migrateAccountsFrom7A149:", "_migrateAccountsFrom7A150:",
                          "_migrateAccountsFrom7A153:", "_migrateAccountsFrom7A241:",
                          "_migrateAccountsFrom7A242:", "_migrateAccountsFrom8A293:",
                          "_migrateAccountsFrom8B117:", "_migrateAccountsFrom8C136:",
                          "_migrateAccountsFrom8F191:", "_migrateAccountsFrom9A182:",
                          "_migrateAccountsFrom9A334:", "_migrateAccountsFrom9B176:"}));
}

TEST_F(UpgradeChainTest, WithoutAFileEveryStepRuns) {
  EXPECT_TRUE(run());

  EXPECT_EQ(recorder.ran, allVersions);
}

TEST_F(UpgradeChainTest, AnUnreadableFileCountsAsVersion0) {
  device.fileSystem.addFile(kSettingsPath, "unreadable");

  EXPECT_TRUE(run());

  EXPECT_EQ(recorder.ran, allVersions);
}

TEST_F(UpgradeChainTest, AFileWithoutAVersionCountsAsVersion0) {
  device.addPropertyList(kSettingsPath, PropertyDictionary{{kPlistAccountsKey, PropertyArray()}});

  EXPECT_TRUE(run());

  EXPECT_EQ(recorder.ran, allVersions);
}

TEST_F(UpgradeChainTest, AVersionWithoutAnIntegerValueCountsAsVersion0) {
  addSettingsFile(PropertyArray(), {});

  EXPECT_TRUE(run());

  EXPECT_EQ(recorder.ran, allVersions);
}

TEST_F(UpgradeChainTest, EveryVersionEntersAtItsStepAndRunsToTheEnd) {
  for (std::uint64_t version = 0; version < 12; ++version) {
    SCOPED_TRACE(version);
    recorder.ran.clear();
    addSettingsFile(version, {});

    EXPECT_TRUE(run());

    EXPECT_EQ(recorder.ran, Versions(allVersions.begin() + static_cast<std::ptrdiff_t>(version),
                                     allVersions.end()));
  }
}

TEST_F(UpgradeChainTest, VersionsMayBeTextsAndFractions) {
  addSettingsFile("4", {});
  run();
  EXPECT_EQ(recorder.ran.front(), 4u);

  recorder.ran.clear();
  addSettingsFile(4.9, {});
  run();
  EXPECT_EQ(recorder.ran.front(), 4u);
}

TEST_F(UpgradeChainTest, CurrentNewerAndNegativeVersionsRunNoStep) {
  for (const PropertyValue& version : {PropertyValue(12), PropertyValue(20), PropertyValue(-1),
                                       PropertyValue(~std::uint64_t{0})}) {
    addSettingsFile(version, {});

    EXPECT_TRUE(run());

    EXPECT_TRUE(recorder.ran.empty());
  }
}

TEST_F(UpgradeChainTest, AStepThatFailsEndsTheChain) {
  addSettingsFile(3, {});
  recorder.failing = 5;

  EXPECT_FALSE(run());

  EXPECT_EQ(recorder.ran, (Versions{3, 4, 5}));
}

TEST_F(UpgradeChainTest, AChainWithoutAStepForTheVersionFails) {
  RecordingMigrator lackingTheLast(std::span(kChain).first(11));
  addSettingsFile(11, {});

  EXPECT_FALSE(lackingTheLast._migrateNewAccountsInfo(*store));

  EXPECT_TRUE(lackingTheLast.ran.empty());
}

TEST_F(UpgradeChainTest, TheFileDecidesNotTheStore) {
  addSettingsFile(11, {});
  store->setDataVersion(3);

  run();

  EXPECT_EQ(recorder.ran, Versions{11});
}

TEST_F(UpgradeChainTest, AChainWithAGapIsRecognised) {
  constexpr std::array<UpgradeStep, 2> gap = {kUpgradeChain[0], kUpgradeChain[2]};

  EXPECT_FALSE(hasConsecutiveVersions(gap));
  EXPECT_TRUE(hasConsecutiveVersions(kUpgradeChain));
}

TEST_F(UpgradeChainTest, TheSettingsFileIsPresentWhenSomethingStandsThere) {
  EXPECT_FALSE(AccountsDataMigrator::_newAccountsInformationPresent());

  device.fileSystem.addFile(kSettingsPath, "unreadable");
  EXPECT_TRUE(AccountsDataMigrator::_newAccountsInformationPresent());
}

TEST_F(UpgradeChainTest, ARunFromVersion3EndsAtVersion12WithSixSaves) {
  addSettingsFile(3, {});
  store = AccountsManager::initInsideOfMigration();

  EXPECT_TRUE(migrator._migrateNewAccountsInfo(*store));

  EXPECT_EQ(store->dataVersion(), 12u);
  EXPECT_EQ(saves(), 6);
  EXPECT_EQ(settingsFile()->find(kPlistVersionKey)->integerValue(), 12);
}

/// What each step does to a store that it finds nothing in.
struct StepRow {
  std::size_t position;
  std::uint64_t dataVersionAfterwards;
  std::ptrdiff_t saves;
};

class UpgradeStepTest : public StepTest, public testing::WithParamInterface<StepRow> {};

TEST_P(UpgradeStepTest, StampsAndSavesAsTheChainSays) {
  constexpr std::uint64_t versionBefore = 99;
  store->setDataVersion(versionBefore);

  EXPECT_TRUE((migrator.*kUpgradeChain.at(GetParam().position).run)(*store));

  EXPECT_EQ(store->dataVersion(), GetParam().dataVersionAfterwards);
  EXPECT_EQ(saves(), GetParam().saves);
}

INSTANTIATE_TEST_SUITE_P(AllSteps, UpgradeStepTest,
                         testing::Values(StepRow{0, 1, 0}, StepRow{1, 2, 0}, StepRow{2, 3, 0},
                                         StepRow{3, 4, 0}, StepRow{4, 5, 0}, StepRow{5, 6, 0},
                                         StepRow{6, 99, 1}, StepRow{7, 99, 1}, StepRow{8, 9, 1},
                                         StepRow{9, 10, 1}, StepRow{10, 11, 1}, StepRow{11, 12, 1}),
                         [](const auto& row) {
                           return "Position" + std::to_string(row.param.position + 1);
                         });

class OldAccountSettingsTest : public StepTest {};

TEST_F(OldAccountSettingsTest, AreRecordedAlsoWhenNoStepRuns) {
  switchMigrationInformationOn();
  device.addPropertyList(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray()}});
  addSettingsFile(12, {anAccount("E", kExchangeAccountType, "ASAccount")});
  const std::optional<PropertyDictionary> before = settingsFile();

  migrator.executeMigrationSteps();

  ASSERT_TRUE(migrator.collatedMigrationData());
  EXPECT_EQ(migrator.collatedMigrationData()->dictionaryForKey("OldAccountSettings"), before);
}

TEST_F(OldAccountSettingsTest, AreEmptyWithoutAFile) {
  switchMigrationInformationOn();
  device.addPropertyList(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray()}});

  migrator.executeMigrationSteps();

  ASSERT_TRUE(migrator.collatedMigrationData());
  EXPECT_EQ(migrator.collatedMigrationData()->dictionaryForKey("OldAccountSettings"),
            PropertyDictionary());
}

}  // namespace
}  // namespace accounts
