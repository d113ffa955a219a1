#include "accountsettings/ASRuntimeFixMailAccount.h"
#include "accountsettings/Process.h"
#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

using AccountsManagerLoading = StoreFixture;

TEST_F(AccountsManagerLoading, TheSettingsFileStandsInThePreferencesOfTheMobileUser) {
  EXPECT_EQ(AccountsManager::fullPathToAccountSettingsPlist(),
            "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist");
}

TEST_F(AccountsManagerLoading, WithoutAFileTheStoreIsEmpty) {
  const Store store = AccountsManager::initInsideOfMigration();
  EXPECT_EQ(store->count(), 0u);
  EXPECT_EQ(store->dataVersion(), 0u);
  EXPECT_EQ(store->_originalAccounts().size(), 0u);
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerLoading, TheVersionAndTheAccountsOfTheFileAreTakenOverInFileOrder) {
  const Store store = storeFromFileOf({mail("C"), exchange("A"), calDAV("B")}, 9);
  EXPECT_EQ(store->dataVersion(), 9u);
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "C A B");
}

TEST_F(AccountsManagerLoading, ThePlainInitialiserReadsTheFileToo) {
  writeSettings({mail("A")}, 9);
  const Store store = AccountsManager::init();
  EXPECT_EQ(store->dataVersion(), 9u);
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A");
}

TEST_F(AccountsManagerLoading, AFileInXMLIsReadLikeABinaryOne) {
  device.fileSystem.addFile(kSettingsPath, R"(<?xml version="1.0" encoding="UTF-8"?>
<plist version="1.0"><dict><key>Version</key><integer>7</integer><key>Accounts</key><array><dict>
<key>Type</key><string>Mail</string><key>Class</key><string>POPAccount</string>
<key>Identifier</key><string>A</string></dict></array></dict></plist>)");
  const Store store = AccountsManager::initInsideOfMigration();
  EXPECT_EQ(store->dataVersion(), 7u);
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A");
}

TEST_F(AccountsManagerLoading, AMalformedFileGivesAnEmptyStoreWithoutALine) {
  device.fileSystem.addFile(kSettingsPath, "bplist00 and nothing behind it");
  const Store store = AccountsManager::initInsideOfMigration();
  EXPECT_EQ(store->count(), 0u);
  EXPECT_EQ(store->dataVersion(), 0u);
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerLoading, AFileThatHoldsNoDictionaryGivesAnEmptyStore) {
  device.addPropertyList(kSettingsPath, PropertyArray{mail("A")});
  const Store store = AccountsManager::initInsideOfMigration();
  EXPECT_EQ(store->count(), 0u);
  EXPECT_EQ(store->dataVersion(), 0u);
}

TEST_F(AccountsManagerLoading, AccountsThatAreNoArrayGiveAnEmptyStoreWithTheFilesVersion) {
  device.addPropertyList(kSettingsPath,
                         PropertyDictionary{{kPlistAccountsKey, mail("A")}, {kPlistVersionKey, 9}});
  const Store store = AccountsManager::initInsideOfMigration();
  EXPECT_EQ(store->count(), 0u);
  EXPECT_EQ(store->dataVersion(), 9u);
}

TEST_F(AccountsManagerLoading, AFileWithoutAVersionHasVersionZero) {
  device.addPropertyList(kSettingsPath,
                         PropertyDictionary{{kPlistAccountsKey, PropertyArray{mail("A")}}});
  EXPECT_EQ(AccountsManager::initInsideOfMigration()->dataVersion(), 0u);
}

TEST_F(AccountsManagerLoading, TheVersionIsReadAsAnInteger) {
  const std::vector<std::pair<PropertyValue, std::uint64_t>> versions = {{"11", 11u},
                                                                         {8.9, 8u},
                                                                         {true, 1u},
                                                                         {-1, ~std::uint64_t{0}},
                                                                         {PropertyArray{12}, 0u},
                                                                         {PropertyDate{12}, 0u}};
  for (const auto& [stored, read] : versions) {
    EXPECT_EQ(storeFromFileOf({}, stored)->dataVersion(), read);
  }
}

TEST_F(AccountsManagerLoading, TheVersionIsStampedInMemoryOnly) {
  const Store store = storeFromFileOf({mail("A")}, 9);
  store->setDataVersion(10);
  EXPECT_EQ(store->dataVersion(), 10u);
  EXPECT_EQ(AccountsManager::initInsideOfMigration()->dataVersion(), 9u);
}

TEST_F(AccountsManagerLoading, AnAccountWithoutAnIdentifierGetsAnotherOneOnEveryLoad) {
  const Store first = storeFromFileOf({mail("").without(kAccountIdentifier)});
  const Store second = AccountsManager::initInsideOfMigration();
  EXPECT_EQ(identifiersOf(first->allBasicAccounts()), "00000000-0000-0000-0000-000000000001");
  EXPECT_EQ(identifiersOf(second->allBasicAccounts()), "00000000-0000-0000-0000-000000000002");
}

TEST_F(AccountsManagerLoading, AnAccountWithAnEmptyIdentifierKeepsIt) {
  const Store store = storeOf({mail("")});
  EXPECT_EQ(store->accountWithIdentifier(""), store->allBasicAccounts().front());
}

TEST_F(AccountsManagerLoading, AnAccountOfAnUnknownTypeIsDroppedWithALine) {
  const Store store = storeOf({mail("A"), ofUnknownType("B"), mail("C")});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A C");
  EXPECT_EQ(
      takeLines(),
      (Lines{R"(-[BasicAccount initWithProperties:] (N) "Invalid account type: Carrier Pigeon")",
             R"(-[AccountsManager _initWithAccountsInfo:] (N) )"
             R"("ERROR: Failed to create a BasicAccount from )"
             R"({"Class":"PigeonAccount","Identifier":"B","Type":"Carrier Pigeon"}")"}));
}

TEST_F(AccountsManagerLoading, AnElementThatIsNoDictionaryIsDroppedWithALine) {
  const Store store = storeOf({"not an account", mail("A")});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A");
  EXPECT_EQ(takeLines(), Lines{R"(-[AccountsManager _initWithAccountsInfo:] (N) )"
                               R"("ERROR: Failed to create a BasicAccount from not an account")"});
}

TEST_F(AccountsManagerLoading, AccountsThatAreTakenInWriteNoLine) {
  storeOf({mail("A").withChildren({calDAV("B")}), exchange("C")});
  EXPECT_EQ(takeLines(), Lines{});
}

TEST_F(AccountsManagerLoading, AccountsWithTheSameIdentifierAreAllListedAndTheLastIsFound) {
  const Store store = storeOf({mail("A"), exchange("B"), calDAV("A")});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A B A");
  EXPECT_EQ(store->accountWithIdentifier("A"), store->allBasicAccounts()[2]);
}

TEST_F(AccountsManagerLoading, AnArrayOfAccountsIsTakenWithoutReadingTheFile) {
  writeSettings({mail("of the file")}, 9);
  const Store store = storeOf({mail("A")});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "A");
  EXPECT_EQ(store->dataVersion(), 0u);
  EXPECT_EQ(device.journal, std::vector<std::string>{});
}

TEST_F(AccountsManagerLoading, AnEmptyArrayGivesAnEmptyStore) {
  const Store store = storeOf({});
  EXPECT_EQ(store->count(), 0u);
  EXPECT_EQ(store->dataVersion(), 0u);
  EXPECT_EQ(store->_originalAccounts().size(), 0u);
}

TEST_F(AccountsManagerLoading, AStoreHasTheMailFixerAlone) {
  const auto fixers = AccountsManager::_createRuntimeFixers();
  ASSERT_EQ(fixers.size(), 1u);
  EXPECT_NE(dynamic_cast<ASRuntimeFixMailAccount*>(fixers.front().get()), nullptr);
}

TEST_F(AccountsManagerLoading, AnAccountThatAFixerRepairsIsTakenInRepaired) {
  const Store store = storeOf({mailThatCanBeFixed("A")});
  ASSERT_EQ(identifiersOf(store->allBasicAccounts()), "A");
  EXPECT_EQ(store->allBasicAccounts().front()->accountClass(), Text("POPAccount"));
}

TEST_F(AccountsManagerLoading, AnAccountThatCannotBeKeptIsDroppedWithItsChildren) {
  const Store store =
      storeOf({mailThatCannotBeFixed("A").withChildren({calDAV("child")}), mail("B")});
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "B");
  EXPECT_EQ(store->accountWithIdentifier("A"), nullptr);
  EXPECT_EQ(takeLinesOf("-[AccountsManager"), Lines{});
}

TEST_F(AccountsManagerLoading, LoadingOnlyReadsEvenWhenFixersChangeAccounts) {
  storeFromFileOf({mailThatCanBeFixed("A"), mailThatCannotBeFixed("B")});
  EXPECT_EQ(device.journal, std::vector<std::string>{"read " + std::string(kSettingsPath)});
}

TEST_F(AccountsManagerLoading, TheBaselineHoldsTheTopLevelAccountsAsTheyWereLoaded) {
  const AccountDictionary account = mail("A").withChildren({calDAV("child")});
  const Store store = storeOf({account, exchange("B")});
  store->allBasicAccounts().front()->setDisplayName("changed since");
  EXPECT_EQ(store->_originalAccounts().size(), 2u);
  ASSERT_TRUE(store->_originalAccounts().contains("A"));
  EXPECT_EQ(*store->_originalAccounts().find("A"), PropertyDictionary(account));
}

TEST_F(AccountsManagerLoading, TheBaselineCanBeRetaken) {
  const Store store = storeOf({mail("A"), mail("B")});
  store->deleteAccountWithIdentifier("A");
  store->allBasicAccounts().front()->setDisplayName("new name");
  store->_setOriginalAccountDictionaries();
  EXPECT_FALSE(store->_originalAccounts().contains("A"));
  EXPECT_EQ(store->_originalAccounts().find("B")->textForKey(kAccountDisplayName),
            Text("new name"));
}

TEST_F(AccountsManagerLoading, AnAccountThatGetsNoIdentifierIsListedButMissingInTheBaseline) {
  device.uuidGenerator.canGenerate = false;
  const Store store = storeOf({mail("").without(kAccountIdentifier), mail("B")});
  EXPECT_EQ(identifiersOf(store->allBasicAccounts()), "- B");
  EXPECT_EQ(store->_originalAccounts().size(), 1u);
  EXPECT_EQ(takeLines(),
            Lines{R"(-[AccountsManager _setOriginalAccountDictionaries] (N) )"
                  R"("{"Class":"IMAPAccount","Type":"Mail"} returned a nil identifier. )"
                  R"(Account properties may not get saved")"});
}

TEST_F(AccountsManagerLoading, NotificationsAreSentUnlessTheyAreSwitchedOff) {
  EXPECT_FALSE(device.process.shouldSkipNotifications);
  AccountsManager::_setShouldSkipNotifications(true);
  EXPECT_TRUE(device.process.shouldSkipNotifications);
  AccountsManager::_setShouldSkipNotifications(false);
  EXPECT_FALSE(device.process.shouldSkipNotifications);
}

}  // namespace
}  // namespace accounts
