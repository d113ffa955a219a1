#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

/// Remembers what it is told.
class Observer final : public MigrationObserver {
 public:
  struct Stage {
    std::string operation;
    std::string purpose;
    bool succeeded = false;
    std::optional<PropertyDictionary> accountSettings;
  };

  [[nodiscard]] bool wantsAccounts() const override { return wants; }
  void stageBegan(std::string_view operation, std::string_view purpose) override {
    EXPECT_TRUE(hasEnded_) << operation << " began within another stage";
    EXPECT_FALSE(purpose.empty());
    hasEnded_ = false;
    stages.push_back({std::string(operation), std::string(purpose), false, std::nullopt});
  }
  void accountFared(const AccountEvent& event) override { told.push_back(event.account); }
  void stageEnded(bool succeeded, const std::optional<AccountsInMemory>& accounts) override {
    EXPECT_FALSE(hasEnded_);
    hasEnded_ = true;
    stages.back().succeeded = succeeded;
    stages.back().accountSettings = accounts ? std::optional(accounts->settings) : std::nullopt;
  }

  [[nodiscard]] TextList operations() const {
    TextList result;
    for (const Stage& stage : stages) {
      result.push_back(stage.operation);
    }
    return result;
  }
  /// Each operation with what it is for.
  [[nodiscard]] TextList purposes() const {
    TextList result;
    for (const Stage& stage : stages) {
      result.push_back(stage.operation + ": " + stage.purpose);
    }
    return result;
  }
  [[nodiscard]] const Stage& stage(std::string_view operation) const {
    return *std::find_if(stages.begin(), stages.end(),
                         [&](const Stage& each) { return each.operation == operation; });
  }

  std::vector<Stage> stages;
  std::vector<AccountOrigin> told;
  bool wants = true;

 private:
  bool hasEnded_ = true;
};

class ObservedMigration : public MigratorTest {
 protected:
  ObservedMigration() { device.platform.migrationObserver = &observer; }

  void addSettings(std::int64_t version) {
    device.addPropertyList(
        kSettingsPath,
        PropertyDictionary{{"Version", version},
                           {"Accounts", PropertyArray{PropertyDictionary{{"Identifier", "A"},
                                                                         {"Type", "SMTP"},
                                                                         {"Class", "SMTPAccount"},
                                                                         {"uniqueId", "B"}}}}});
  }

  Observer observer;
};

TEST_F(ObservedMigration, OfNothingKeepsACopyOpensSavesAndTells) {
  migrator.performMigration();
  EXPECT_EQ(observer.operations(), (TextList{"_copyAsideAccountsPlist", "initInsideOfMigration",
                                             "saveAllAccounts", "announceChange"}));
}

TEST_F(ObservedMigration, TellsEachStepOfTheChainThatRuns) {
  addSettings(10);
  migrator.performMigration();
  EXPECT_EQ(observer.operations(),
            (TextList{"_copyAsideAccountsPlist", "initInsideOfMigration",
                      "_migrateAccountsFrom9A334:", "_migrateAccountsFrom9B176:", "saveAllAccounts",
                      "announceChange"}));
}

TEST_F(ObservedMigration, TellsOnceOfEachDescriptionThatStaysOutWithItsStore) {
  const PropertyDictionary good = {{"uniqueId", "A"}, {"Class", "IMAPAccount"}};
  device.addPropertyList(kLegacyMailPath,
                         PropertyDictionary{{"MailAccounts", PropertyArray{good, "bad", good}}});
  migrator.performMigration();
  using Kind = AccountOrigin::Kind;
  std::vector<std::uint32_t> numbers;
  for (const AccountOrigin& each : observer.told) {
    EXPECT_EQ(each.kind, Kind::IncomingMail);
    numbers.push_back(each.number);
  }
  std::ranges::sort(numbers);
  EXPECT_EQ(numbers, (std::vector<std::uint32_t>{0, 1, 2}));
}

TEST_F(ObservedMigration, TellsPeopleWhatEachStageIsFor) {
  addSettings(12);
  device.addPropertyList(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{}}});
  device.addPropertyList(kLegacyExchangePath,
                         PropertyDictionary{{"DAAccountsKey", PropertyArray{}}});
  switchMigrationInformationOn();
  migrator.performMigration();
  EXPECT_EQ(observer.purposes(),
            (TextList{"_copyAsideAccountsPlist: Keep a copy of the settings file for engineers",
                      "initInsideOfMigration: Open the settings file",
                      "_migrateDAAccounts:: Convert the legacy Exchange accounts",
                      "_migrateMailAccounts:: Convert the legacy mail accounts",
                      "saveAllAccounts: Save the accounts",
                      "_removeOldAccountsInfo: Remove the legacy stores",
                      "_saveCollatedMigrationInformation: Write the migration-information file",
                      "announceChange: Tell the mail application that its accounts changed"}));
}

TEST_F(ObservedMigration, TellsPeopleThatARemovalIsFinished) {
  device.fileSystem.addFile(kSentinelPath, "");
  migrator.performMigration();
  EXPECT_EQ(observer.purposes().back(),
            "_removeOldAccountsInfo: Finish the removal of the legacy stores");
}

TEST_F(ObservedMigration, TellsTheConversionsAndTheRemovalOfTheLegacyStores) {
  device.addPropertyList(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{}}});
  device.addPropertyList(kLegacyExchangePath,
                         PropertyDictionary{{"DAAccountsKey", PropertyArray{}}});
  migrator.performMigration();
  const TextList operations = observer.operations();
  EXPECT_EQ(operations.at(2), "_migrateDAAccounts:");
  EXPECT_EQ(operations.at(3), "_migrateMailAccounts:");
  EXPECT_EQ(operations.at(operations.size() - 2), "_removeOldAccountsInfo");
}

TEST_F(ObservedMigration, TellsThatARemovalIsFinished) {
  static_cast<void>(device.fileSystem.createFile(kSentinelPath, ""));
  migrator.performMigration();
  EXPECT_EQ(observer.operations(), (TextList{"_copyAsideAccountsPlist", "_removeOldAccountsInfo"}));
}

TEST_F(ObservedMigration, AConversionThatFailsIsAStageThatFailed) {
  device.addPropertyList(
      kLegacyExchangePath,
      PropertyDictionary{{"DAAccountsKey", PropertyArray{PropertyDictionary{}}}});
  EXPECT_TRUE(migrator.performMigration());
  EXPECT_FALSE(observer.stage("_migrateDAAccounts:").succeeded);
  EXPECT_TRUE(observer.stage("saveAllAccounts").succeeded);
}

TEST_F(ObservedMigration, EachStageShowsTheAccountsAsTheyAreAfterIt) {
  addSettings(1);
  migrator.performMigration();
  const auto firstIdentifier = [&](std::string_view operation) {
    const PropertyDictionary settings = *observer.stage(operation).accountSettings;
    return settings.arrayForKey("Accounts")->begin()->asDictionary()->textForKey("Identifier");
  };
  EXPECT_EQ(firstIdentifier("initInsideOfMigration"), Text("A"));
  EXPECT_EQ(firstIdentifier("_migrateAccountsFrom7A150:"), Text("B"));
}

TEST_F(ObservedMigration, AStageWithoutAStoreShowsNoAccounts) {
  migrator.performMigration();
  EXPECT_FALSE(observer.stage("announceChange").accountSettings);
}

TEST_F(ObservedMigration, EachStageShowsTheVersionThatTheAccountsHaveAfterIt) {
  addSettings(1);
  migrator.performMigration();
  const auto version = [&](std::string_view operation) {
    return *observer.stage(operation).accountSettings->find("Version");
  };
  EXPECT_EQ(version("initInsideOfMigration"), PropertyValue(1));
  EXPECT_EQ(version("_migrateAccountsFrom7A150:"), PropertyValue(2));
  EXPECT_EQ(version("saveAllAccounts"), PropertyValue(12));
}

TEST_F(ObservedMigration, TheStoreThatIsSavedIsStampedAsCurrentAlsoAfterAFailedChain) {
  addSettings(5);
  FailingUpgrade().performMigration();
  EXPECT_EQ(*observer.stage("initInsideOfMigration").accountSettings->find("Version"),
            PropertyValue(5));
  EXPECT_EQ(*observer.stage("saveAllAccounts").accountSettings->find("Version"), PropertyValue(12));
}

TEST_F(ObservedMigration, AnObserverThatDoesNotWantTheAccountsGetsNone) {
  observer.wants = false;
  addSettings(10);
  migrator.performMigration();
  for (const Observer::Stage& stage : observer.stages) {
    EXPECT_FALSE(stage.accountSettings) << stage.operation;
  }
}

}  // namespace
}  // namespace accounts
