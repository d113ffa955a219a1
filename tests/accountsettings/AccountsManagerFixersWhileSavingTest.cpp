#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

class AccountsManagerFixersWhileSaving : public StoreFixture {
 protected:
  /// A store with an account that has a child and a class that fixers will not accept on saving.
  Store storeWithBrokenAccount(const AccountDictionary& account) {
    Store store = storeFromFileOf({account.withChildren({calDAV("c")}), mail("B")});
    store->allBasicAccounts().front()->setAccountClass("BrokenAccount");
    return store;
  }
  using Announcements = std::vector<std::pair<std::string, std::string>>;
  const Announcements mailAccountsOnce = {{"com.quarx.mobilemail", "MailAccounts"}};
};

TEST_F(AccountsManagerFixersWhileSaving, ARepairedAccountIsWrittenRepaired) {
  const Store store = storeWithBrokenAccount(mail("A").with("AccountPath", "/Library/Mail/POP-x"));
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccount(0).textForKey(kAccountClass), Text("POPAccount"));
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "A B c");
}

TEST_F(AccountsManagerFixersWhileSaving, AnAccountThatCannotBeKeptLeavesTheIndexesButIsWritten) {
  const Store store = storeWithBrokenAccount(mail("A"));
  store->saveAllAccounts();
  EXPECT_EQ(store->accountWithIdentifier("A"), nullptr);
  EXPECT_EQ(store->accountWithIdentifier("c"), nullptr);
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "A B");
  EXPECT_EQ(identifiersOf(settingsAccounts()), "A B");
  EXPECT_EQ(settingsAccount(0),
            PropertyDictionary(mailThatCannotBeFixed("A").withChildren({calDAV("c")})));
}

TEST_F(AccountsManagerFixersWhileSaving, TheOtherAccountsStayIndexed) {
  const Store store = storeWithBrokenAccount(mail("A"));
  store->saveAllAccounts();
  EXPECT_EQ(store->accountWithIdentifier("B"), store->allBasicAccounts().back());
}

TEST_F(AccountsManagerFixersWhileSaving, ARepairIsAnnouncedOnce) {
  const Store store = storeWithBrokenAccount(mail("A").with("AccountPath", "/Library/Mail/POP-x"));
  store->saveAllAccounts();
  store->saveAllAccounts();
  EXPECT_EQ(device.preferencesBroadcast.announcements, mailAccountsOnce);
}

TEST_F(AccountsManagerFixersWhileSaving, AnAccountThatCannotBeKeptIsAnnouncedToo) {
  storeWithBrokenAccount(mail("A"))->saveAllAccounts();
  EXPECT_EQ(device.preferencesBroadcast.announcements, mailAccountsOnce);
}

TEST_F(AccountsManagerFixersWhileSaving, ARepairIsAnnouncedAfterTheFileWasMoved) {
  const Store store = storeWithBrokenAccount(mail("A").with("AccountPath", "/Library/Mail/POP-x"));
  store->saveAllAccounts();
  ASSERT_GE(device.journal.size(), 2u);
  EXPECT_TRUE(device.journal[device.journal.size() - 2].starts_with("rename "));
  EXPECT_EQ(device.journal.back(), "announceChange com.quarx.mobilemail MailAccounts");
}

TEST_F(AccountsManagerFixersWhileSaving, ARepairIsAnnouncedThoughTheSaveFailed) {
  const Store store = storeWithBrokenAccount(mail("A").with("AccountPath", "/Library/Mail/POP-x"));
  device.fileSystem.failWhenLineBegins("rename");
  store->saveAllAccounts();
  EXPECT_EQ(device.preferencesBroadcast.announcements, mailAccountsOnce);
}

TEST_F(AccountsManagerFixersWhileSaving, WithoutARepairNothingIsAnnounced) {
  storeFromFileOf({mail("A"), exchange("B")})->saveAllAccounts();
  EXPECT_EQ(device.preferencesBroadcast.announcements, Announcements{});
}

TEST_F(AccountsManagerFixersWhileSaving, RepairsOfTheAccountsOnDiskAreNotAnnounced) {
  const Store store = storeFromFileOf({exchange("A")});
  writeSettings({exchange("A"), mailThatCanBeFixed("B"), mailThatCannotBeFixed("C")});
  store->saveAllAccounts();
  EXPECT_EQ(device.preferencesBroadcast.announcements, Announcements{});
  EXPECT_EQ(identifiersOf(settingsAccounts()), "A");
}

TEST_F(AccountsManagerFixersWhileSaving, FixersRunFromTheLastAccountToTheFirst) {
  const Store store = storeFromFileOf({mail("A"), mail("B"), mail("C")});
  for (const BasicAccountReference& account : store->allBasicAccounts()) {
    account->setAccountClass("BrokenAccount");
  }
  takeLines();
  store->saveAllAccounts();
  const auto line = [](std::string_view identifier) {
    return R"(-[ASRuntimeFixMailAccount(Internal) _cleanupAccountClass:] (N) "Could not fix the )"
           R"(class of the mail account: {"Class":"BrokenAccount","Identifier":")" +
           std::string(identifier) + R"(","Type":"Mail"}")";
  };
  EXPECT_EQ(takeLinesOf("-[ASRuntimeFixMailAccount"), (Lines{line("C"), line("B"), line("A")}));
}

}  // namespace
}  // namespace accounts
