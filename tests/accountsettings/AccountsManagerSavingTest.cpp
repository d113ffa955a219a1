#include "propertylist/PropertyListFile.h"
#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

class AccountsManagerSaving : public StoreFixture {
 protected:
  /// Changes a property of an account that a store holds.
  static void change(const AccountsManager& store, std::string_view identifier,
                     std::string_view key, std::optional<PropertyValue> value) {
    store.accountWithIdentifier(identifier)->setAccountProperty_forKey(std::move(value), key);
  }
};

TEST_F(AccountsManagerSaving, ChangesOfMemoryAndDiskUnderDifferentKeysAreBothWritten) {
  const AccountDictionary account = mail("A").with("DisplayName", "old").with("Username", "old");
  const Store store = storeFromFileOf({account});
  change(*store, "A", "DisplayName", "from memory");
  writeSettings({account.with("Username", "from disk")});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0),
            PropertyDictionary(
                mail("A").with("DisplayName", "from memory").with("Username", "from disk")));
}

TEST_F(AccountsManagerSaving, AKeyThatBothSidesChangedGetsMemorysValue) {
  const AccountDictionary account = mail("A").with("DisplayName", "old");
  const Store store = storeFromFileOf({account});
  change(*store, "A", "DisplayName", "from memory");
  writeSettings({account.with("DisplayName", "from disk")});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0).textForKey("DisplayName"), Text("from memory"));
}

TEST_F(AccountsManagerSaving, AKeyThatMemoryDeletedIsGoneThoughTheDiskChangedIt) {
  const AccountDictionary account = mail("A").with("Username", "old");
  const Store store = storeFromFileOf({account});
  change(*store, "A", "Username", std::nullopt);
  writeSettings({account.with("Username", "from disk")});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0), PropertyDictionary(mail("A")));
}

TEST_F(AccountsManagerSaving, AKeyThatTheDiskDeletedAndMemoryLeftAloneStaysDeleted) {
  const Store store = storeFromFileOf({mail("A").with("Username", "old")});
  writeSettings({mail("A")});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0), PropertyDictionary(mail("A")));
}

TEST_F(AccountsManagerSaving, AnAccountThatIsNewInMemoryIsWrittenAsItIs) {
  const Store store = storeFromFileOf({mail("A")});
  store->insertAccount(recordOf(mail("B").with("Username", "somebody")));
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(1), PropertyDictionary(mail("B").with("Username", "somebody")));
}

TEST_F(AccountsManagerSaving, AnAccountThatTheDiskLostIsWrittenAgain) {
  const Store store = storeFromFileOf({mail("A"), exchange("B")});
  writeSettings({mail("A")});
  store->saveAllAccounts();
  EXPECT_EQ(identifiersOf(settingsAccounts()), "A B");
}

TEST_F(AccountsManagerSaving, AnAccountThatOnlyTheDiskHasIsGoneAfterTheSave) {
  const Store store = storeFromFileOf({mail("A")});
  writeSettings({mail("A"), exchange("of another writer")});
  store->saveAllAccounts();
  EXPECT_EQ(identifiersOf(settingsAccounts()), "A");
}

TEST_F(AccountsManagerSaving, AnAccountThatIsAChildOnDiskIsMergedWithItsParentThere) {
  const Store store = storeFromFileOf({mail("A").with("Username", "old")});
  writeSettings({exchange("P").withChildren({mail("A")})});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0), PropertyDictionary(exchange("P").withChildren({mail("A")})));
}

TEST_F(AccountsManagerSaving, AnAccountThatIsAChildOnDiskIsMergedSoWithTheChannelOffToo) {
  device.logSystem.channel.enabled = false;
  const Store store = storeFromFileOf({mail("A").with("Username", "old")});
  writeSettings({exchange("P").withChildren({mail("A")})});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0), PropertyDictionary(exchange("P").withChildren({mail("A")})));
}

TEST_F(AccountsManagerSaving, WithoutAFileEveryAccountIsWrittenFromMemory) {
  const Store store = AccountsManager::initInsideOfMigration();
  store->insertAccount(recordOf(mail("A")));
  store->saveAllAccounts();
  EXPECT_EQ(identifiersOf(settingsAccounts()), "A");
}

TEST_F(AccountsManagerSaving, TheWrittenVersionIsTwelveWhateverTheStoreWasStampedWith) {
  for (const std::uint64_t version : {0u, 3u, 12u, 13u}) {
    const Store store = storeFromFileOf({mail("A")}, 9);
    store->setDataVersion(version);
    store->saveAllAccounts();
    EXPECT_EQ(*settings().find("Version"), PropertyValue(12));
  }
}

TEST_F(AccountsManagerSaving, TheRootHasTheAccountsAndTheVersionOnly) {
  device.addPropertyList(
      kSettingsPath,
      PropertyDictionary{{"Accounts", PropertyArray{}}, {"Version", 12}, {"Other", "value"}});
  AccountsManager::initInsideOfMigration()->saveAllAccounts();
  EXPECT_EQ(settings(), (PropertyDictionary{{"Accounts", PropertyArray{}}, {"Version", 12}}));
}

TEST_F(AccountsManagerSaving, TheFileIsABinaryPropertyListOfTheMobileUser) {
  storeFromFileOf({mail("A")})->saveAllAccounts();
  const FakeFile& file = device.fileSystem.files.find(kSettingsPath)->second;
  EXPECT_EQ(file.contents.substr(0, 8), "bplist00");
  EXPECT_EQ(file.owner, "mobile");
  EXPECT_EQ(file.group, "mobile");
}

TEST_F(AccountsManagerSaving, TheAccountsAreWrittenInTheOrderOfTheStore) {
  const Store store = storeFromFileOf({mail("C"), mail("A"), mail("B")});
  store->replaceAccount_withAccount(store->accountWithIdentifier("A"), recordOf(exchange("Q")));
  store->saveAllAccounts();
  EXPECT_EQ(identifiersOf(settingsAccounts()), "C Q B");
}

TEST_F(AccountsManagerSaving, EveryAccountOfADuplicateIdentifierIsWritten) {
  storeFromFileOf({mail("A"), exchange("A")})->saveAllAccounts();
  EXPECT_EQ(identifiersOf(settingsAccounts()), "A A");
}

TEST_F(AccountsManagerSaving, AnAccountOfAnUnknownTypeIsAbsentFromTheWrittenFile) {
  storeFromFileOf({mail("A"), ofUnknownType("B"), "no account"})->saveAllAccounts();
  EXPECT_EQ(identifiersOf(settingsAccounts()), "A");
}

TEST_F(AccountsManagerSaving, AGeneratedIdentifierIsKeptOnceItWasSaved) {
  const Store store = storeFromFileOf({mail("").without(kAccountIdentifier)});
  store->saveAllAccounts();
  EXPECT_EQ(identifiersOf(AccountsManager::initInsideOfMigration()->allBasicAccounts()),
            identifiersOf(store->allBasicAccounts()));
}

TEST_F(AccountsManagerSaving, WhatTheDiskContributedIsNotTakenIntoMemory) {
  const Store store = storeFromFileOf({mail("A").with("Username", "old")});
  writeSettings({mail("A").with("Username", "from disk")});
  store->saveAllAccounts();
  EXPECT_EQ(store->accountWithIdentifier("A")->textPropertyForKey("Username"), Text("old"));
}

TEST_F(AccountsManagerSaving, ASaveMakesMemoryTheOriginalOfTheNextOne) {
  const Store store = storeFromFileOf({mail("A").with("Username", "old")});
  change(*store, "A", "Username", "from memory");
  store->saveAllAccounts();
  EXPECT_EQ(store->accountWithIdentifier("A")->originalProperties(),
            PropertyDictionary(mail("A").with("Username", "from memory")));
  // Memory has not changed it since, so what the disk has now holds.
  writeSettings({mail("A").with("Username", "from disk")});
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0).textForKey("Username"), Text("from disk"));
}

TEST_F(AccountsManagerSaving, ASecondSaveWithoutChangesWritesTheSameBytes) {
  const Store store = storeFromFileOf({mail("A").withChildren({calDAV("c")}), exchange("B")});
  store->saveAllAccounts();
  const std::optional<std::string> first = device.fileSystem.contentsOf(kSettingsPath);
  store->saveAllAccounts();
  EXPECT_EQ(device.fileSystem.contentsOf(kSettingsPath), first);
}

TEST_F(AccountsManagerSaving, TheFileIsReadWrittenAsideOwnedAndMovedInThisOrder) {
  const Store store = storeFromFileOf({mail("A")});
  device.journal.clear();
  store->saveAllAccounts();
  const std::string path(kSettingsPath);
  const std::string temporary = "/var/mobile/tmp/temporary-0";
  EXPECT_EQ(device.journal, (std::vector<std::string>{"read " + path, "makeTemporary",
                                                      "write " + temporary, "setOwner " + temporary,
                                                      "rename " + temporary + " -> " + path}));
}

TEST_F(AccountsManagerSaving, TheBaselineIsRetakenWhenNotificationsAreNotSkipped) {
  const Store store = storeFromFileOf({mail("A")});
  change(*store, "A", "Username", "new");
  store->saveAllAccounts();
  EXPECT_EQ(store->_originalAccounts().find("A")->textForKey("Username"), Text("new"));
}

TEST_F(AccountsManagerSaving, TheBaselineStaysAsItWasWhenNotificationsAreSkipped) {
  const Store store = storeFromFileOf({mail("A")});
  AccountsManager::_setShouldSkipNotifications(true);
  change(*store, "A", "Username", "new");
  store->insertAccount(recordOf(mail("B")));
  store->saveAllAccounts();
  EXPECT_EQ(*store->_originalAccounts().find("A"), PropertyDictionary(mail("A")));
  EXPECT_FALSE(store->_originalAccounts().contains("B"));
}

TEST_F(AccountsManagerSaving, EveryStepOfASaveIsLogged) {
  const Store store = storeFromFileOf({calDAV("A").with("Username", "x"), ofUnknownType("B")});
  change(*store, "A", "Username", "y");
  takeLines();
  store->saveAllAccounts();
  const std::string before =
      R"({"Class":"MobileCalDAVAccount","Identifier":"A","Type":"CalDAV","Username":"x"})";
  const std::string after =
      R"({"Class":"MobileCalDAVAccount","Identifier":"A","Type":"CalDAV","Username":"y"})";
  const std::string merge =
      "-[AccountsManager mergeInMemoryProperties:originalProperties:onDiskProperties:] (N) ";
  EXPECT_EQ(
      takeLines(),
      (Lines{R"(-[AccountsManager saveAllAccounts] (N) "Saving all accounts")",
             R"(-[BasicAccount initWithProperties:] (N) "Invalid account type: Carrier Pigeon")",
             R"(-[AccountsManager _initWithAccountsInfo:] (N) )"
             R"("ERROR: Failed to create a BasicAccount from )"
             R"({"Class":"PigeonAccount","Identifier":"B","Type":"Carrier Pigeon"}")",
             merge + "\"Merging inmem " + after + " orig " + before + " onDisk " + before + "\"",
             merge + "\"Merged to " + after + "\"",
             R"(-[AccountsManager saveAllAccounts] (N) "Calculated Properties - Type: CalDAV, )"
             R"(Properties: )" +
                 after + ", Dataclasses: (null)\""}));
}

TEST_F(AccountsManagerSaving, TheEnabledDataclassesAreLogged) {
  const PropertyArray enabled = {kAccountDataclassCalendars};
  storeFromFileOf({calDAV("A").with(kAccountEnabledDataclasses, enabled)})->saveAllAccounts();
  EXPECT_TRUE(takeLines().back().ends_with(R"(, Dataclasses: ["com.quarx.Dataclass.Calendars"]")"));
}

TEST_F(AccountsManagerSaving, AMergeWithAbsentSidesIsLoggedAsSuch) {
  const PropertyDictionary memory = {{"a", 1}};
  EXPECT_EQ(AccountsManager::mergeInMemoryProperties_originalProperties_onDiskProperties(
                memory, std::nullopt, std::nullopt),
            memory);
  const std::string merge =
      "-[AccountsManager mergeInMemoryProperties:originalProperties:onDiskProperties:] (N) ";
  EXPECT_EQ(takeLines(), (Lines{merge + "\"Merging inmem {\"a\":1} orig (null) onDisk (null)\"",
                                merge + "\"Merged to {\"a\":1}\""}));
}

TEST_F(AccountsManagerSaving, TheSidesOfAMergeAreLoggedInTheirOrder) {
  EXPECT_EQ(AccountsManager::mergeInMemoryProperties_originalProperties_onDiskProperties(
                {{"a", 1}}, PropertyDictionary{{"a", 2}}, PropertyDictionary{{"a", 3}}),
            (PropertyDictionary{{"a", 1}}));
  const std::string merge =
      "-[AccountsManager mergeInMemoryProperties:originalProperties:onDiskProperties:] (N) ";
  EXPECT_EQ(takeLines(),
            (Lines{merge + "\"Merging inmem {\"a\":1} orig {\"a\":2} onDisk {\"a\":3}\"",
                   merge + "\"Merged to {\"a\":1}\""}));
}

}  // namespace
}  // namespace accounts
