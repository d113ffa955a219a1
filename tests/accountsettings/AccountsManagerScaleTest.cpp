#include "tests/accountsettings/StoreFixture.h"

// What is done once for each account or child of a large store must not be a walk through all of
// them. Nothing is timed here: with a walk these tests would take minutes.

namespace accounts {
namespace {

constexpr std::size_t manyAccounts = 10'000;

class AccountsManagerScale : public StoreFixture {
 protected:
  AccountsManagerScale() { device.logSystem.channel.enabled = false; }

  static std::string name(std::string_view prefix, std::size_t number) {
    return std::string(prefix) + std::to_string(number);
  }
  /// A store of so many accounts, each with one child.
  static Store largeStore(std::size_t count = manyAccounts) {
    std::vector<PropertyValue> accounts;
    for (std::size_t number = 0; number < count; ++number) {
      accounts.push_back(mail(name("A", number))
                             .with(kAccountSyncIdentifier, name("s", number))
                             .withChildren({calDAV(name("c", number))}));
    }
    return storeOf(std::move(accounts));
  }
};

TEST_F(AccountsManagerScale, EveryAccountIsDeletedOneByOne) {
  const Store store = largeStore(2 * manyAccounts);
  const AccountsManager::Accounts accounts = store->allBasicAccounts();
  for (const BasicAccountReference& account : accounts) {
    store->deleteAccount(account);
  }
  EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "");
}

TEST_F(AccountsManagerScale, EveryAccountIsReplacedOneByOne) {
  const Store store = largeStore();
  const AccountsManager::Accounts accounts = store->allBasicAccounts();
  for (const BasicAccountReference& account : accounts) {
    const BasicAccountReference parent = exchange(account->identifier()->string() + "Q").record();
    store->replaceAccount_withAccount(account, parent);
    account->setParentAccount(parent);
    store->addChild_toAccount(account, parent);
  }
  EXPECT_EQ(store->countOfBasicAccountsWithTypes({kExchangeAccountType}), manyAccounts);
  EXPECT_EQ(store->allBasicSyncableAccounts().size(), 2 * manyAccounts);
}

TEST_F(AccountsManagerScale, EveryAccountIsUpdatedAndFoundOneByOne) {
  const Store store = largeStore();
  for (std::size_t number = 0; number < manyAccounts; ++number) {
    const BasicAccountReference account = exchange(name("A", number)).record();
    store->updateAccount(account);
    ASSERT_EQ(store->accountWithIdentifier(name("A", number)), account);
  }
  EXPECT_EQ(store->count(), manyAccounts);
}

TEST_F(AccountsManagerScale, EveryAccountIsFoundByItsSyncIdentifier) {
  const Store store = largeStore();
  for (std::size_t number = 0; number < manyAccounts; ++number) {
    ASSERT_EQ(store->displayAccountWithSyncIdentifier(name("s", number))->identifier(),
              Text(name("A", number)));
  }
}

TEST_F(AccountsManagerScale, AccountsWithOneIdentifierAreDeletedOneByOne) {
  const Store store = storeOf(std::vector<PropertyValue>(manyAccounts, mail("A")));
  const AccountsManager::Accounts accounts = store->allBasicAccounts();
  for (const BasicAccountReference& account : accounts) {
    store->deleteAccount(account);
  }
  EXPECT_EQ(store->count(), 0u);
}

TEST_F(AccountsManagerScale, EveryAccountIsReplacedAtOnce) {
  const Store store = largeStore();
  AccountsManager::Accounts accounts;
  for (std::size_t number = 0; number < manyAccounts; ++number) {
    accounts.push_back(
        exchange(name("A", number)).withChildren({calDAV(name("d", number))}).record());
  }
  store->replaceAccountsWithTypes_withAccounts({kMailAccountType}, accounts);
  EXPECT_EQ(store->allBasicAccounts(), accounts);
  EXPECT_EQ(store->allBasicSyncableAccounts().size(), 2 * manyAccounts);
}

TEST_F(AccountsManagerScale, OneNewAccountTakesManyPlaces) {
  const Store store = storeOf(std::vector<PropertyValue>(manyAccounts, mail("A")));
  store->replaceAccountsWithTypes_withAccounts({},
                                               {mail("A").withChildren({calDAV("c")}).record()});
  EXPECT_EQ(store->count(), manyAccounts);
  EXPECT_EQ(childrenOf(*store), "c");
}

TEST_F(AccountsManagerScale, ALargeStoreIsSaved) {
  const Store store = largeStore();
  store->saveAllAccounts();
  store->saveAllAccounts();
  EXPECT_EQ(settingsAccounts().size(), manyAccounts);
}

}  // namespace
}  // namespace accounts
