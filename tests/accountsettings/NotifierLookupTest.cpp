#include "tests/accountsettings/CreatorsFixture.h"

namespace accounts {
namespace {

class NotifierLookupTest : public CreatorsTest {};

TEST_F(NotifierLookupTest, NamesTheClassesOfAllMatchingEntriesInOrderWithDuplicates) {
  setCreators({{"Mail", PropertyArray{notifierCreator("A.so", "A", {kAccountDataclassMail}),
                                      notifierCreator("B.so", "B", {kAccountDataclassNotes}),
                                      fullAccountCreator("C.so", "C"),
                                      notifierCreator("A.so", "A", {kAccountDataclassMail})}}});

  EXPECT_EQ(
      AccountsManager::_notifierClassNamesForAccountType_dataclass("Mail", kAccountDataclassMail),
      (std::vector<Text>{"A", "A"}));
  EXPECT_EQ(frameworkLoader.loads, (std::vector<std::string>{"/A.so", "/A.so"}));
}

TEST_F(NotifierLookupTest, AnEntryThatNamesNoDataclassesIsConcernedWithNone) {
  setCreators({{"Mail", PropertyArray{creatorEntry("NotifierAccount",
                                                   {{"Framework", "A.so"}, {"Class", "A"}})}}});

  EXPECT_TRUE(
      AccountsManager::_notifierClassNamesForAccountType_dataclass("Mail", kAccountDataclassMail)
          .empty());
}

class AnnouncedChangeTest : public CreatorsTest {
 protected:
  AnnouncedChangeTest() {
    setCreators(
        {{"Mail", PropertyArray{notifierCreator("A.so", "Full", {kAccountDataclassMail}),
                                notifierCreator("A.so", "Bare", {kAccountDataclassMail})}}});
    AccountClass full;
    full.accountWillChange_forDataclass = [this](std::string_view id, std::string_view dataclass) {
      calls_.push_back("will " + std::string(id) + " " + std::string(dataclass));
    };
    full.accountDidChange_forDataclass = [this](std::string_view id, std::string_view dataclass) {
      calls_.push_back("did " + std::string(id) + " " + std::string(dataclass));
    };
    frameworkLoader.registerClass("Full", full);
    frameworkLoader.registerClass("Bare", AccountClass());
  }

  std::vector<std::string> calls_;
  BasicAccountReference account_ = account("A", kMailAccountType);
};

TEST_F(AnnouncedChangeTest, WillChangeReachesTheClassesThatAnswerIt) {
  AccountsManager::accountWillChange_forDataclass(*account_, kAccountDataclassMail);

  EXPECT_EQ(calls_, std::vector<std::string>{"will A com.quarx.Dataclass.Mail"});
}

TEST_F(AnnouncedChangeTest, DidChangeReachesTheClassesThatAnswerIt) {
  AccountsManager::accountDidChange_forDataclass(*account_, kAccountDataclassMail);

  EXPECT_EQ(calls_, std::vector<std::string>{"did A com.quarx.Dataclass.Mail"});
}

TEST_F(AnnouncedChangeTest, AnotherDataclassConcernsNobody) {
  AccountsManager::accountDidChange_forDataclass(*account_, kAccountDataclassNotes);

  EXPECT_TRUE(calls_.empty());
}

class GroupNameTest : public CreatorsTest {
 protected:
  GroupNameTest() {
    localizedStrings.texts = {
        {{"AccountsManager", "SUBSCRIBED_CALENDAR_GROUP_TITLE"}, "Subscribed"},
        {{"AccountsManager", "SUBSCRIBED_CALENDAR_GROUP_MID_SENTENCE_TITLE"}, "subscribed"}};
  }
};

TEST_F(GroupNameTest, SubscribedCalendarsHaveANameForEachPlaceInASentence) {
  using Store = AccountsManager;
  EXPECT_EQ(
      Store::displayNameForGroupOfAccountType_forBeginningOfSentence("Subscribed Calendar", true),
      "Subscribed");
  EXPECT_EQ(
      Store::displayNameForGroupOfAccountType_forBeginningOfSentence("Subscribed Calendar", false),
      "subscribed");
}

TEST_F(GroupNameTest, NoOtherTypeHasAGroupName) {
  EXPECT_EQ(
      AccountsManager::displayNameForGroupOfAccountType_forBeginningOfSentence("CalDAV", true),
      std::nullopt);
}

class NotifierAssertionsDeathTest : public CreatorsTest {
 protected:
  static void expectDeathOfLookup(const std::string& text) {
    EXPECT_EXIT(static_cast<void>(AccountsManager::_notifierClassNamesForAccountType_dataclass(
                    "Mail", kAccountDataclassMail)),
                testing::KilledBySignal(SIGABRT), testing::HasSubstr("AccountsManager: " + text));
  }
};

TEST_F(NotifierAssertionsDeathTest, ATypeWithoutEntryInTheMap) {
  setCreators({});
  expectDeathOfLookup(
      "Malformed AccountCreators information. Could not find the information for the type Mail\n");
}

// Not even when the map has an entry under the empty text.
TEST_F(NotifierAssertionsDeathTest, AChangeOfAnAccountWithoutType) {
  setCreators({{"", PropertyArray{notifierCreator("A.so", "A", {kAccountDataclassMail})}}});
  const std::string text =
      "Malformed AccountCreators information. Could not find the information for the type (null)\n";
  AccountsManager::NotificationBatch batch;
  EXPECT_EXIT(AccountsManager::
                  _addNotificationToDictionary_forChangeType_originalProperties_currentProperties(
                      batch, AccountChangeType::Deleted,
                      PropertyDictionary{
                          {kAccountIdentifier, "A"},
                          {kAccountEnabledDataclasses, PropertyArray{kAccountDataclassMail}}},
                      std::nullopt),
              testing::KilledBySignal(SIGABRT), testing::HasSubstr(text));

  const BasicAccountReference record = account("A", kMailAccountType);
  record->removeAccountPropertyForKey(kAccountType);
  EXPECT_EXIT(AccountsManager::accountWillChange_forDataclass(*record, kAccountDataclassMail),
              testing::KilledBySignal(SIGABRT), testing::HasSubstr(text));
}

TEST_F(NotifierAssertionsDeathTest, AnUnaffectedAccountWithoutTypeIsNoError) {
  AccountsManager::NotificationBatch batch;
  AccountsManager::_addNotificationToDictionary_forChangeType_originalProperties_currentProperties(
      batch, AccountChangeType::Deleted, PropertyDictionary{{kAccountIdentifier, "A"}},
      std::nullopt);
  EXPECT_TRUE(batch.empty());
}

TEST_F(NotifierAssertionsDeathTest, ANotifierWithoutFramework) {
  setCreators({{"Mail", PropertyArray{creatorEntry(
                            "NotifierAccount",
                            {{"Class", "A"},
                             {"Supported Dataclasses", PropertyArray{kAccountDataclassMail}}})}}});
  expectDeathOfLookup(
      "Malformed AccountCreators information. Could not find the path to the framework for the "
      "notifier with type Mail\n");
}

TEST_F(NotifierAssertionsDeathTest, AFrameworkThatCannotBeLoaded) {
  setCreators({{"Mail", PropertyArray{notifierCreator("A.so", "A", {kAccountDataclassMail})}}});
  frameworkLoader.errors["/A.so"] = "file too short";
  expectDeathOfLookup("Could not load the account creator framework /A.so. Error file too short\n");
}

TEST_F(NotifierAssertionsDeathTest, ANotifierWithoutClassName) {
  setCreators({{"Mail", PropertyArray{notifierCreator("A.so", "", {kAccountDataclassMail})}}});
  expectDeathOfLookup(
      "Malformed AccountCreators information. Could not find the name of the class for "
      "notificatinos with the type Mail\n");
}

TEST_F(NotifierAssertionsDeathTest, AClassThatTheFrameworkDoesNotBringWhenAChangeIsAnnounced) {
  setCreators({{"Mail", PropertyArray{notifierCreator("A.so", "A", {kAccountDataclassMail})}}});
  const BasicAccountReference record = account("A", kMailAccountType);
  EXPECT_EXIT(AccountsManager::accountWillChange_forDataclass(*record, kAccountDataclassMail),
              testing::KilledBySignal(SIGABRT),
              testing::HasSubstr("Could not find a class for class name A\n"));
}

TEST_F(NotifierAssertionsDeathTest, AClassThatTheFrameworkDoesNotBringWhenASaveIsReported) {
  setCreators({{"Mail", PropertyArray{notifierCreator("A.so", "A", {kAccountDataclassMail})}}});
  const std::unique_ptr<AccountsManager> store = AccountsManager::initInsideOfMigration();
  store->insertAccount(account(
      "N", kMailAccountType, {{kAccountEnabledDataclasses, PropertyArray{kAccountDataclassMail}}}));
  EXPECT_EXIT(store->saveAllAccounts(), testing::KilledBySignal(SIGABRT),
              testing::HasSubstr("AccountsManager: Could not find a class for class name A\n"));
}

}  // namespace
}  // namespace accounts
