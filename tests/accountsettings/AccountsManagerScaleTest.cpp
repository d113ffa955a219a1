#include "tests/accountsettings/CountedComparisons.h"
#include "tests/accountsettings/StoreFixture.h"

// What is done once for each account or child of a large store must not be a walk through all of
// them: four times the accounts make four times the comparisons, not sixteen.

namespace accounts {
namespace {

class AccountsManagerScale : public StoreFixture {
 protected:
  AccountsManagerScale() { device.logSystem.channel.enabled = false; }

  void SetUp() override {
    if (!kCountsComparisons) {
      GTEST_SKIP() << "Comparisons are counted in the preset asan-ubsan alone.";
    }
  }

  /// Requires that the comparisons that an action makes for a number of accounts, the making of the
  /// store included, are in proportion to the number.
  template <class Action>
  static void expectInProportion(const Action& action) {
    constexpr std::size_t kFew = 1'000;
    constexpr std::size_t kMany = 4 * kFew;
    const std::uint64_t forFew = comparisonsIn([&] { action(kFew); });
    const std::uint64_t forMany = comparisonsIn([&] { action(kMany); });
    EXPECT_GT(forFew, kFew);
    // A little more: tables grow by leaps, and what is sorted takes the logarithm besides.
    EXPECT_LT(forMany, forFew * 5) << forFew << " comparisons for " << kFew << " accounts";
  }

  static std::string name(std::string_view prefix, std::size_t number) {
    return std::string(prefix) + std::to_string(number);
  }
  /// A store of so many accounts, each with one child.
  static Store largeStore(std::size_t count) {
    std::vector<PropertyValue> accounts;
    for (std::size_t number = 0; number < count; ++number) {
      accounts.push_back(mail(name("A", number))
                             .with(kAccountSyncIdentifier, name("s", number))
                             .withChildren({calDAV(name("c", number))}));
    }
    return storeOf(std::move(accounts));
  }

 private:
  template <class Action>
  static std::uint64_t comparisonsIn(const Action& action) {
    const std::uint64_t before = comparisonsSoFar();
    action();
    return comparisonsSoFar() - before;
  }
};

TEST_F(AccountsManagerScale, EveryAccountIsDeletedOneByOne) {
  expectInProportion([](std::size_t count) {
    const Store store = largeStore(count);
    const AccountsManager::Accounts accounts = store->allBasicAccounts();
    for (const BasicAccountReference& account : accounts) {
      store->deleteAccount(account);
    }
    EXPECT_EQ(identifiersOf(store->allBasicSyncableAccounts()), "");
  });
}

TEST_F(AccountsManagerScale, EveryAccountIsReplacedOneByOne) {
  expectInProportion([](std::size_t count) {
    const Store store = largeStore(count);
    const AccountsManager::Accounts accounts = store->allBasicAccounts();
    for (const BasicAccountReference& account : accounts) {
      const BasicAccountReference parent =
          recordOf(exchange(account->identifier()->string() + "Q"));
      store->replaceAccount_withAccount(account, parent);
      account->setParentAccount(parent);
      store->addChild_toAccount(account, parent);
    }
    EXPECT_EQ(store->countOfBasicAccountsWithTypes({kExchangeAccountType}), count);
    EXPECT_EQ(store->allBasicSyncableAccounts().size(), 2 * count);
  });
}

TEST_F(AccountsManagerScale, EveryAccountIsUpdatedAndFoundOneByOne) {
  expectInProportion([](std::size_t count) {
    const Store store = largeStore(count);
    for (std::size_t number = 0; number < count; ++number) {
      const BasicAccountReference account = recordOf(exchange(name("A", number)));
      store->updateAccount(account);
      ASSERT_EQ(store->accountWithIdentifier(name("A", number)), account);
    }
    EXPECT_EQ(store->count(), count);
  });
}

TEST_F(AccountsManagerScale, EveryAccountIsFoundByItsSyncIdentifier) {
  expectInProportion([](std::size_t count) {
    const Store store = largeStore(count);
    for (std::size_t number = 0; number < count; ++number) {
      ASSERT_EQ(store->displayAccountWithSyncIdentifier(name("s", number))->identifier(),
                Text(name("A", number)));
    }
  });
}

TEST_F(AccountsManagerScale, AccountsWithOneIdentifierAreDeletedOneByOne) {
  expectInProportion([](std::size_t count) {
    const Store store = storeOf(std::vector<PropertyValue>(count, mail("A")));
    const AccountsManager::Accounts accounts = store->allBasicAccounts();
    for (const BasicAccountReference& account : accounts) {
      store->deleteAccount(account);
    }
    EXPECT_EQ(store->count(), 0u);
  });
}

TEST_F(AccountsManagerScale, EveryAccountIsReplacedAtOnce) {
  expectInProportion([](std::size_t count) {
    const Store store = largeStore(count);
    AccountsManager::Accounts accounts;
    for (std::size_t number = 0; number < count; ++number) {
      accounts.push_back(
          recordOf(exchange(name("A", number)).withChildren({calDAV(name("d", number))})));
    }
    store->replaceAccountsWithTypes_withAccounts({kMailAccountType}, accounts);
    EXPECT_EQ(store->allBasicAccounts(), accounts);
    EXPECT_EQ(store->allBasicSyncableAccounts().size(), 2 * count);
  });
}

TEST_F(AccountsManagerScale, OneNewAccountTakesManyPlaces) {
  expectInProportion([](std::size_t count) {
    const Store store = storeOf(std::vector<PropertyValue>(count, mail("A")));
    store->replaceAccountsWithTypes_withAccounts({},
                                                 {recordOf(mail("A").withChildren({calDAV("c")}))});
    EXPECT_EQ(store->count(), count);
    EXPECT_EQ(childrenOf(*store), "c");
  });
}

TEST_F(AccountsManagerScale, ALargeStoreIsSaved) {
  expectInProportion([this](std::size_t count) {
    const Store store = largeStore(count);
    store->saveAllAccounts();
    store->saveAllAccounts();
    EXPECT_EQ(settingsAccounts().size(), count);
  });
}

}  // namespace
}  // namespace accounts
