#include "tests/accountsettings/CreatorsFixture.h"

namespace accounts {
namespace {

/// A device with a mail and a groupware notifier for mail accounts, and a store outside a migration
/// with one account.
class ChangeNotificationsTest : public CreatorsTest {
 protected:
  ChangeNotificationsTest() {
    const PropertyArray notifiers = {
        notifierCreator("Mail.so", "MailNotifier", {kAccountDataclassMail, kAccountDataclassNotes}),
        notifierCreator("Groupware.so", "GroupwareNotifier",
                        {kAccountDataclassCalendars, kAccountDataclassContacts})};
    setCreators({{kYahooAccountType, notifiers},
                 {kLDAPAccountType, PropertyArray{fullAccountCreator("Mail.so", "LDAPFull")}}});
    for (const std::string name : {"MailNotifier", "GroupwareNotifier"}) {
      AccountClass notifier;
      notifier.noteAccountChanges = [this, name](const PropertyArray& changes) {
        calls_.emplace_back(name, changes);
      };
      frameworkLoader.registerClass(name, notifier);
    }
    // Yahoo accounts support all of the dataclasses used here.
    store_ = AccountsManager::initWithAccounsInfoArray(
        {PropertyDictionary{{kAccountIdentifier, "A"},
                            {kAccountType, kYahooAccountType},
                            {kAccountClass, "YahooAccount"},
                            {kAccountEnabledDataclasses, PropertyArray{kAccountDataclassMail}}}});
    account_ = store_->accountWithIdentifier("A");
  }

  static PropertyDictionary record(int changeType, PropertyArray originalDataclasses,
                                   std::string_view identifier = "A") {
    return {{"ChangeType", changeType},
            {"AccountID", identifier},
            {"AccountType", kYahooAccountType},
            {"OriginalDataclasses", std::move(originalDataclasses)}};
  }

  using Calls = std::vector<std::pair<std::string, PropertyArray>>;
  Calls calls_;
  std::unique_ptr<AccountsManager> store_;
  BasicAccountReference account_;
};

TEST_F(ChangeNotificationsTest, AnUnchangedAccountNotifiesNobody) {
  store_->saveAllAccounts();

  EXPECT_TRUE(calls_.empty());
  EXPECT_TRUE(frameworkLoader.loads.empty());
}

TEST_F(ChangeNotificationsTest, AnAddedAccountNotifiesTheNotifiersOfItsEnabledDataclasses) {
  store_->insertAccount(
      account("B", kYahooAccountType,
              {{kAccountEnabledDataclasses, PropertyArray{kAccountDataclassContacts}}}));

  store_->saveAllAccounts();

  EXPECT_EQ(calls_, (Calls{{"GroupwareNotifier", {record(0, {}, "B")}}}));
}

TEST_F(ChangeNotificationsTest, ADeletedAccountNotifiesTheNotifiersOfWhatItHadEnabled) {
  store_->deleteAccount(account_);

  store_->saveAllAccounts();

  EXPECT_EQ(calls_, (Calls{{"MailNotifier", {record(2, {kAccountDataclassMail})}}}));
}

TEST_F(ChangeNotificationsTest, SwitchedDataclassesNotifyTheNotifiersOfBothSides) {
  account_->setEnabled_forDataclass(false, kAccountDataclassMail);
  account_->setEnabled_forDataclass(true, kAccountDataclassCalendars);

  store_->saveAllAccounts();

  const PropertyArray changes = {record(1, {kAccountDataclassMail})};
  EXPECT_EQ(calls_, (Calls{{"GroupwareNotifier", changes}, {"MailNotifier", changes}}));
}

TEST_F(ChangeNotificationsTest, AnyOtherChangeNotifiesTheNotifiersOfAllThatIsEnabled) {
  account_->setEnabledForDataclasses({kAccountDataclassContacts, kAccountDataclassNotes});
  store_->saveAllAccounts();
  calls_.clear();
  account_->setDisplayName("Home");

  store_->saveAllAccounts();

  const PropertyArray changes = {record(1, {kAccountDataclassContacts, kAccountDataclassNotes})};
  EXPECT_EQ(calls_, (Calls{{"GroupwareNotifier", changes}, {"MailNotifier", changes}}));
}

TEST_F(ChangeNotificationsTest, ADataclassSwitchedOffBesideAnotherChangeNotifiesItsNotifiers) {
  account_->setEnabledForDataclasses({kAccountDataclassContacts});
  account_->setDisplayName("Home");

  store_->saveAllAccounts();

  const PropertyArray changes = {record(1, {kAccountDataclassMail})};
  EXPECT_EQ(calls_, (Calls{{"GroupwareNotifier", changes}, {"MailNotifier", changes}}));
}

TEST_F(ChangeNotificationsTest, ADataclassThatIsListedTwiceNotifiesOnce) {
  account_->setAccountProperty_forKey(
      PropertyArray{kAccountDataclassNotes, kAccountDataclassContacts, kAccountDataclassMail,
                    kAccountDataclassContacts, kAccountDataclassNotes},
      kAccountEnabledDataclasses);
  AccountsManager::NotificationBatch batch;
  AccountsManager::_addNotificationToDictionary_forChangeType_originalProperties_currentProperties(
      batch, AccountChangeType::Added, std::nullopt, account_->properties());
  const std::vector<PropertyValue> once = {record(0, {})};
  EXPECT_EQ(batch, (AccountsManager::NotificationBatch{{"GroupwareNotifier", once},
                                                       {"MailNotifier", once}}));
}

TEST_F(ChangeNotificationsTest, ARecordNamesTheTypeAndTheIdentifierThatTheAccountHasNow) {
  const PropertyArray mailOn = {kAccountDataclassMail};
  AccountsManager::NotificationBatch batch;
  AccountsManager::_addNotificationToDictionary_forChangeType_originalProperties_currentProperties(
      batch, AccountChangeType::Modified,
      PropertyDictionary{{kAccountIdentifier, "before"}, {kAccountType, kLDAPAccountType}},
      PropertyDictionary{{kAccountIdentifier, "now"},
                         {kAccountType, kYahooAccountType},
                         {kAccountEnabledDataclasses, mailOn}});
  EXPECT_EQ(batch, (AccountsManager::NotificationBatch{{"MailNotifier", {record(1, {}, "now")}}}));
}

TEST_F(ChangeNotificationsTest, ARecordNamesTheOldTypeAndIdentifierWhereThereAreNoneNow) {
  const PropertyArray mailOn = {kAccountDataclassMail};
  AccountsManager::NotificationBatch batch;
  AccountsManager::_addNotificationToDictionary_forChangeType_originalProperties_currentProperties(
      batch, AccountChangeType::Modified,
      PropertyDictionary{{kAccountIdentifier, "before"}, {kAccountType, kYahooAccountType}},
      PropertyDictionary{{kAccountEnabledDataclasses, mailOn}});
  EXPECT_EQ(batch,
            (AccountsManager::NotificationBatch{{"MailNotifier", {record(1, {}, "before")}}}));
}

TEST_F(ChangeNotificationsTest, AnyOtherChangeOfAnAccountWithNothingEnabledNotifiesNobody) {
  account_->removeAccountPropertyForKey(kAccountEnabledDataclasses);
  store_->saveAllAccounts();
  calls_.clear();
  account_->setDisplayName("Home");

  store_->saveAllAccounts();

  EXPECT_TRUE(calls_.empty());
}

TEST_F(ChangeNotificationsTest, TheActivityFlagAloneNotifiesNobody) {
  account_->setAccountProperty_forKey(false, "IsActive");

  store_->saveAllAccounts();

  EXPECT_TRUE(calls_.empty());
}

TEST_F(ChangeNotificationsTest, ChangedChildrenAloneNotifyNobody) {
  store_->addChild_toAccount(account("C", kYahooAccountType), account_);

  store_->saveAllAccounts();

  EXPECT_TRUE(calls_.empty());
}

TEST_F(ChangeNotificationsTest, ATypeWithoutNotifiersNotifiesNobody) {
  store_->insertAccount(
      account("L", kLDAPAccountType,
              {{kAccountEnabledDataclasses, PropertyArray{kAccountDataclassContactsSearch}}}));

  store_->saveAllAccounts();

  EXPECT_TRUE(calls_.empty());
  EXPECT_TRUE(AccountsManager::_notifierClassNamesForAccountType_dataclass(
                  kLDAPAccountType, kAccountDataclassContactsSearch)
                  .empty());
}

TEST_F(ChangeNotificationsTest, EachClassIsCalledOnceWithDeletionsThenAdditionsThenModifications) {
  const PropertyDictionary mailOn = {
      {kAccountEnabledDataclasses, PropertyArray{kAccountDataclassMail}}};
  store_->insertAccount(account("B", kYahooAccountType, mailOn));
  store_->saveAllAccounts();
  calls_.clear();
  account_->setDisplayName("Home");
  store_->insertAccount(account("C", kYahooAccountType, mailOn));
  store_->deleteAccountWithIdentifier("B");

  store_->saveAllAccounts();

  EXPECT_EQ(calls_, (Calls{{"MailNotifier",
                            {record(2, {kAccountDataclassMail}, "B"), record(0, {}, "C"),
                             record(1, {kAccountDataclassMail}, "A")}}}));
}

TEST_F(ChangeNotificationsTest, AClassThatServesSeveralChangedDataclassesGetsOneRecordOfAChange) {
  account_->setEnabled_forDataclass(true, kAccountDataclassCalendars);
  account_->setEnabled_forDataclass(true, kAccountDataclassContacts);

  store_->saveAllAccounts();

  EXPECT_EQ(calls_, (Calls{{"GroupwareNotifier", {record(1, {kAccountDataclassMail})}}}));
}

TEST_F(ChangeNotificationsTest, AnAccountPutInThePlaceOfAnotherIsReportedAsADeletionAlone) {
  store_->replaceAccount_withAccount(
      account_, account("B", kYahooAccountType,
                        {{kAccountEnabledDataclasses, PropertyArray{kAccountDataclassContacts}}}));

  store_->saveAllAccounts();

  EXPECT_EQ(calls_, (Calls{{"MailNotifier", {record(2, {kAccountDataclassMail})}}}));
}

TEST_F(ChangeNotificationsTest, ASecondSaveReportsOnlyWhatChangedSinceTheFirst) {
  account_->setDisplayName("Home");
  store_->saveAllAccounts();
  calls_.clear();

  store_->saveAllAccounts();

  EXPECT_TRUE(calls_.empty());
}

TEST_F(ChangeNotificationsTest,
       WhatSavesWithoutNotificationsChangedIsReportedByTheNextOneWithThem) {
  AccountsManager::_setShouldSkipNotifications(true);
  account_->setDisplayName("Home");
  store_->saveAllAccounts();
  EXPECT_TRUE(calls_.empty());
  AccountsManager::_setShouldSkipNotifications(false);

  store_->saveAllAccounts();

  EXPECT_EQ(calls_, (Calls{{"MailNotifier", {record(1, {kAccountDataclassMail})}}}));
}

TEST_F(ChangeNotificationsTest, AFailedSaveNotifiesNobodyAndKeepsTheBaseline) {
  account_->setDisplayName("Home");
  fileSystem.failWhenLineBegins("rename");
  store_->saveAllAccounts();
  EXPECT_TRUE(calls_.empty());
  fileSystem.removeFaults();

  store_->saveAllAccounts();

  EXPECT_EQ(calls_, (Calls{{"MailNotifier", {record(1, {kAccountDataclassMail})}}}));
}

TEST_F(ChangeNotificationsTest, TheFrameworkOfANotifierIsLoadedBeneathTheSystemRoot) {
  account_->setDisplayName("Home");

  store_->saveAllAccounts();

  EXPECT_EQ(frameworkLoader.loads, std::vector<std::string>{"/Mail.so"});
}

TEST_F(ChangeNotificationsTest, MembersOfAListThatAreNoTextsAreNoDataclasses) {
  account_->setAccountProperty_forKey(PropertyArray{kAccountDataclassMail, 7},
                                      kAccountEnabledDataclasses);

  store_->saveAllAccounts();

  EXPECT_TRUE(calls_.empty());
}

TEST_F(ChangeNotificationsTest, AnAccountWithoutTypeConcernsNobody) {
  AccountsManager::NotificationBatch batch;

  AccountsManager::_addNotificationToDictionary_forChangeType_originalProperties_currentProperties(
      batch, AccountChangeType::Added, std::nullopt, PropertyDictionary());

  EXPECT_TRUE(batch.empty());
}

using ChangeNotificationsDeathTest = ChangeNotificationsTest;

TEST_F(ChangeNotificationsDeathTest, ANotifierThatCannotBeToldOfChangesIsAnError) {
  frameworkLoader.registerClass("MailNotifier", AccountClass());
  account_->setDisplayName("other");

  EXPECT_DEATH(store_->saveAllAccounts(),
               "AccountsManager: The class MailNotifier does not answer noteAccountChanges:");
}

}  // namespace
}  // namespace accounts
