#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

/// A save that does not reach the file.
class AccountsManagerSavingFailures : public StoreFixture {
 protected:
  AccountsManagerSavingFailures() {
    writeSettings({mail("A").with("Username", "new")});
    after = device.fileSystem.contentsOf(kSettingsPath);
    startAgain();
    before = device.fileSystem.contentsOf(kSettingsPath);
  }

  /// Puts the old file back and opens a store with a change to save.
  void startAgain() {
    store = storeFromFileOf({mail("A").with("Username", "old")}, 9);
    store->allBasicAccounts().front()->setAccountProperty_forKey("new", "Username");
  }

  /// The lines about failures that a save writes.
  Lines failureLinesOfASave() {
    takeLines();
    store->saveAllAccounts();
    Lines lines = takeLinesOf("-[AccountsManager saveAllAccounts]");
    std::erase_if(lines, [](const std::string& line) {
      return line.find("\"Saving all") != line.npos || line.find("\"Calculated") != line.npos;
    });
    return lines;
  }
  void expectNothingChanged() const {
    EXPECT_EQ(device.fileSystem.contentsOf(kSettingsPath), before);
    EXPECT_EQ(device.fileSystem.temporaryFiles(), std::vector<std::string>{});
    const BasicAccountReference account = store->allBasicAccounts().front();
    EXPECT_EQ(account->originalProperties(), PropertyDictionary(mail("A").with("Username", "old")));
    EXPECT_EQ(account->textPropertyForKey("Username"), Text("new"));
    EXPECT_EQ(store->_originalAccounts().find("A")->textForKey("Username"), Text("old"));
  }

  const std::string failed =
      R"(-[AccountsManager saveAllAccounts] (N) "Failed to save accounts to filesystem.")";
  static constexpr std::size_t kOperationsOfASave = 5;
  Store store;
  /// The file before a save, and after one that succeeds.
  std::optional<std::string> before;
  std::optional<std::string> after;
};

TEST_F(AccountsManagerSavingFailures, WithoutDataNothingIsWritten) {
  device.propertyLists.serializationError = "nested too deeply";
  EXPECT_EQ(failureLinesOfASave(),
            (Lines{R"(-[AccountsManager saveAllAccounts] (N) )"
                   R"("Failed to serialize account settings data: nested too deeply")",
                   failed}));
  expectNothingChanged();
}

TEST_F(AccountsManagerSavingFailures, WithoutDataAndWithoutAnErrorNothingIsWrittenEither) {
  device.propertyLists.givesNone = true;
  EXPECT_EQ(failureLinesOfASave(),
            (Lines{R"(-[AccountsManager saveAllAccounts] (N) )"
                   R"*("Failed to serialize account settings data: (null)")*",
                   failed}));
  expectNothingChanged();
}

TEST_F(AccountsManagerSavingFailures, WithoutDataTheTemporaryFileIsMadeAndRemovedAgain) {
  device.propertyLists.serializationError = "nested too deeply";
  device.journal.clear();
  store->saveAllAccounts();
  EXPECT_EQ(device.journal,
            (std::vector<std::string>{"read " + std::string(kSettingsPath), "makeTemporary",
                                      "remove /var/mobile/tmp/temporary-0"}));
}

TEST_F(AccountsManagerSavingFailures, WithoutATemporaryNameNothingIsWrittenOrRemoved) {
  device.fileSystem.failWhenLineBegins("makeTemporary");
  device.journal.clear();
  EXPECT_EQ(failureLinesOfASave(), Lines{failed});
  EXPECT_EQ(device.journal.back(), "makeTemporary");
  expectNothingChanged();
}

TEST_F(AccountsManagerSavingFailures, AFailedWriteLeavesNoTemporaryFile) {
  device.fileSystem.failWhenLineBegins("write");
  EXPECT_EQ(failureLinesOfASave(), Lines{failed});
  expectNothingChanged();
}

TEST_F(AccountsManagerSavingFailures, AFailedChangeOfOwnerLeavesThePreviousFileByteForByte) {
  device.fileSystem.failWhenLineBegins("setOwner");
  EXPECT_EQ(failureLinesOfASave(),
            (Lines{R"(-[AccountsManager saveAllAccounts] (N) )"
                   R"("Could not set attributes on the temporary account settings plist. )"
                   R"(setOwner /var/mobile/tmp/temporary-0: Input/output error")",
                   failed}));
  expectNothingChanged();
}

TEST_F(AccountsManagerSavingFailures, AnUnknownMobileUserFailsTheSave) {
  device.fileSystem.accountNames.erase("mobile");
  EXPECT_EQ(failureLinesOfASave().size(), 2u);
  expectNothingChanged();
}

TEST_F(AccountsManagerSavingFailures, AFailedRenameLeavesNoTemporaryFile) {
  device.fileSystem.failWhenLineBegins("rename");
  EXPECT_EQ(failureLinesOfASave(), Lines{failed});
  expectNothingChanged();
}

TEST_F(AccountsManagerSavingFailures, ATemporaryFileThatCannotBeRemovedIsIgnored) {
  device.fileSystem.failWhenLineBegins("rename");
  device.fileSystem.failWhenLineBegins("remove");
  EXPECT_EQ(failureLinesOfASave(), Lines{failed});
  EXPECT_EQ(device.fileSystem.contentsOf(kSettingsPath), before);
}

TEST_F(AccountsManagerSavingFailures, ASaveThatSucceedsWritesNoFailure) {
  EXPECT_EQ(failureLinesOfASave(), Lines{});
  EXPECT_NE(device.fileSystem.contentsOf(kSettingsPath), before);
}

TEST_F(AccountsManagerSavingFailures, ALaterSaveMergesAgainstTheSameOriginal) {
  device.fileSystem.failWhenLineBegins("rename");
  store->saveAllAccounts();
  device.fileSystem.removeFaults();
  writeSettings({mail("A").with("Username", "from disk").with("DisplayName", "from disk")});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0),
            PropertyDictionary(mail("A").with("Username", "new").with("DisplayName", "from disk")));
}

TEST_F(AccountsManagerSavingFailures, AFileThatCannotBeReadIsReplacedByMemory) {
  device.fileSystem.failWhenLineBegins("read");
  EXPECT_EQ(failureLinesOfASave(), Lines{});
  EXPECT_EQ(settingsAccount(0), PropertyDictionary(mail("A").with("Username", "new")));
}

TEST_F(AccountsManagerSavingFailures, WhereverAnOperationFailsTheFileIsTheOldOneOrTheWholeNewOne) {
  for (std::size_t operation = 0; operation < kOperationsOfASave; ++operation) {
    startAgain();
    device.fileSystem.failAt(device.fileSystem.operationCount() + operation);
    store->saveAllAccounts();
    // Only the failure of the first operation, the reading of the file, lets a save go on.
    EXPECT_EQ(device.fileSystem.contentsOf(kSettingsPath), operation == 0 ? after : before)
        << operation;
    EXPECT_EQ(device.fileSystem.temporaryFiles(), std::vector<std::string>{}) << operation;
  }
}

TEST_F(AccountsManagerSavingFailures, WhereverTheWorldStopsTheFileIsTheOldOneOrTheWholeNewOne) {
  for (std::size_t operation = 0; operation < kOperationsOfASave; ++operation) {
    startAgain();
    device.fileSystem.stopAfter(device.fileSystem.operationCount() + operation);
    EXPECT_THROW(store->saveAllAccounts(), WorldStopped);
    const bool isMoved = operation + 1 == kOperationsOfASave;
    EXPECT_EQ(device.fileSystem.contentsOf(kSettingsPath), isMoved ? after : before) << operation;
  }
}

TEST_F(AccountsManagerSavingFailures, ASaveWithoutFaultsHasSoManyOperations) {
  const std::size_t first = device.fileSystem.operationCount();
  store->saveAllAccounts();
  EXPECT_EQ(device.fileSystem.operationCount() - first, kOperationsOfASave);
  EXPECT_EQ(device.fileSystem.contentsOf(kSettingsPath), after);
}

}  // namespace
}  // namespace accounts
