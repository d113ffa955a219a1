#include "accountsettings/OnDiskAccounts.h"

#include <random>

#include "accountsettings/ASRuntimeFixMailAccount.h"
#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

using InMemory = OnDiskAccounts::InMemory;

class OnDiskAccountsTest : public StoreFixture {
 protected:
  // With the channel on everything is made that could write a line.
  OnDiskAccountsTest() { device.logSystem.channel.enabled = false; }

  /// Records of these dictionaries, in order.
  static OrderedAccounts memoryOf(const std::vector<PropertyDictionary>& dictionaries) {
    OrderedAccounts memory;
    for (const PropertyDictionary& dictionary : dictionaries) {
      memory.append(BasicAccount::initWithProperties(dictionary));
    }
    return memory;
  }

  /// What a save does with the accounts before it asks the disk.
  static InMemory fix(const OrderedAccounts& memory) {
    ASRuntimeFixMailAccount fixer;
    FixResult gravest = FixResult::Unchanged;
    for (const BasicAccountReference& account : memory.accounts()) {
      gravest = std::max(gravest,
                         fixer.fixBasicAccountIfNeeded_loggingMessage(*account, "saving accounts"));
    }
    return gravest != FixResult::CannotBeKept ? InMemory::AllCanBeKept : InMemory::Unknown;
  }
};

TEST_F(OnDiskAccountsTest, AnAccountIsFoundUnderItsIdentifierWhereverItIs) {
  const OrderedAccounts memory = memoryOf({mail("A"), mail("B")});
  OnDiskAccounts onDisk({mail("B").with("Username", "b"), mail("A").with("Username", "a")}, memory,
                        InMemory::Unknown);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0), PropertyDictionary(mail("A").with("Username", "a")));
  EXPECT_EQ(onDisk.propertiesForAccountAt(1), PropertyDictionary(mail("B").with("Username", "b")));
}

TEST_F(OnDiskAccountsTest, AnAccountThatTheDiskDoesNotHaveIsNotFound) {
  const OrderedAccounts memory = memoryOf({mail("A")});
  OnDiskAccounts onDisk({mail("B")}, memory, InMemory::Unknown);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0), std::nullopt);
}

TEST_F(OnDiskAccountsTest, ADictionaryThatMemorySharesIsGivenBackAsItIs) {
  const PropertyDictionary shared = mail("A");
  const OrderedAccounts memory = memoryOf({shared});
  OnDiskAccounts onDisk({shared}, memory, InMemory::AllCanBeKept);
  ASSERT_TRUE(onDisk.propertiesForAccountAt(0));
  EXPECT_TRUE(onDisk.propertiesForAccountAt(0)->isSameAs(shared));
}

TEST_F(OnDiskAccountsTest, OfSeveralAccountsWithAnIdentifierTheLastOneCounts) {
  const PropertyDictionary shared = mail("A");
  const OrderedAccounts memory = memoryOf({shared});
  OnDiskAccounts onDisk({shared, exchange("A")}, memory, InMemory::AllCanBeKept);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0), PropertyDictionary(exchange("A")));
}

TEST_F(OnDiskAccountsTest, WhatMakesNoAccountHidesNone) {
  const OrderedAccounts memory = memoryOf({mail("A"), mail("A")});
  OnDiskAccounts onDisk(
      {exchange("A"), ofUnknownType("A"), mailThatCannotBeFixed("A"), "no account"}, memory,
      InMemory::Unknown);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0), PropertyDictionary(exchange("A")));
  EXPECT_EQ(onDisk.propertiesForAccountAt(1), PropertyDictionary(exchange("A")));
}

TEST_F(OnDiskAccountsTest, AnAccountOnDiskIsFixedBeforeItIsGivenBack) {
  const OrderedAccounts memory = memoryOf({mail("A")});
  OnDiskAccounts onDisk({mailThatCanBeFixed("A")}, memory, InMemory::Unknown);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0)->textForKey(kAccountClass), Text("POPAccount"));
}

TEST_F(OnDiskAccountsTest, AChildsIdentifierFindsItsParent) {
  const PropertyDictionary parent = exchange("P").withChildren({mail("A")});
  const OrderedAccounts memory = memoryOf({mail("A"), mail("B")});
  OnDiskAccounts onDisk({parent}, memory, InMemory::Unknown);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0), parent);
  EXPECT_EQ(onDisk.propertiesForAccountAt(1), std::nullopt);
}

TEST_F(OnDiskAccountsTest, AnIdentifierInheritedInMemoryFindsNoDictionaryWithoutOne) {
  const PropertyDictionary shared = mail("A").without(kAccountIdentifier);
  OrderedAccounts memory = memoryOf({shared});
  BasicAccount& account = *memory.accounts().front();
  account.removeAccountPropertyForKey(kAccountIdentifier);
  account.removeAccountPropertyForKey(kAccountSyncIdentifier);
  account.setParentAccount(mail("P").record());
  OnDiskAccounts onDisk({account.properties()}, memory, InMemory::AllCanBeKept);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0), std::nullopt);
}

TEST_F(OnDiskAccountsTest, ADictionaryThatWasSavedAndIsStillThereNeedsNoMergeWhateverMemoryHasNow) {
  const OrderedAccounts memory = memoryOf({mail("A")});
  BasicAccount& account = *memory.accounts().front();
  account.noteSaved(/*canBeKept=*/true);
  const PropertyArray file = {PropertyValue(account.properties())};
  account.setAccountProperty_forKey("changed", "Username");
  EXPECT_TRUE(OnDiskAccounts(file, memory, InMemory::AllCanBeKept).isAsMemoryKnowsIt(0));
}

TEST_F(OnDiskAccountsTest, ADictionaryThatWasLoadedAndNeverSavedIsMerged) {
  // The fixers see it as it was loaded, and may change it: memory has changed it already.
  const PropertyDictionary loaded = mailThatCanBeFixed("A");
  const OrderedAccounts memory = memoryOf({loaded});
  const InMemory state = fix(memory);
  EXPECT_FALSE(OnDiskAccounts({loaded}, memory, state).isAsMemoryKnowsIt(0));
}

TEST_F(OnDiskAccountsTest, ADictionaryWithTheSameContentThatSomebodyElseWroteIsMerged) {
  const OrderedAccounts memory = memoryOf({mail("A")});
  EXPECT_FALSE(OnDiskAccounts({mail("A")}, memory, InMemory::AllCanBeKept).isAsMemoryKnowsIt(0));
}

TEST_F(OnDiskAccountsTest, WithTheChannelOnEveryAccountIsMerged) {
  device.logSystem.channel.enabled = true;
  const PropertyDictionary shared = mail("A");
  const OrderedAccounts memory = memoryOf({shared});
  EXPECT_FALSE(OnDiskAccounts({shared}, memory, InMemory::AllCanBeKept).isAsMemoryKnowsIt(0));
}

// A file and a store of the same few identifiers, in every kind of state: the store shares most of
// its dictionaries with the file, as it does after a save, and has saved some of them.
TEST_F(OnDiskAccountsTest, WhateverTheFileHoldsTheAnswersAreThoseOfAStoreMadeFromIt) {
  std::mt19937 random(20260101);
  const auto below = [&](std::uint_fast32_t limit) { return random() % limit; };
  const auto identifier = [&] { return std::string(1, static_cast<char>('A' + below(5))); };
  const auto dictionary = [&]() -> PropertyDictionary {
    switch (below(8)) {
      case 0:
        return ofUnknownType(identifier());
      case 1:
        return mailThatCanBeFixed(identifier());
      case 2:
        return mailThatCannotBeFixed(identifier());
      case 3:
        return exchange(identifier()).withChildren({mail(identifier()), ofUnknownType("A")});
      default:
        return mail(identifier()).with("Username", identifier());
    }
  };
  int unmergedCount = 0;
  for (int round = 0; round < 3000; ++round) {
    std::vector<PropertyValue> elements;
    OrderedAccounts memory;
    for (auto count = below(5); count > 0; --count) {
      const PropertyDictionary element = dictionary();
      elements.emplace_back(element);
      const BasicAccountReference account =
          BasicAccount::initWithProperties(below(4) > 0 ? element : dictionary());
      if (account == nullptr) {
        continue;
      }
      if (below(3) == 0) {
        ASRuntimeFixMailAccount fixer;
        account->noteSaved(fixer.fixBasicAccountIfNeeded_loggingMessage(
                               *account, "saving accounts") != FixResult::CannotBeKept);
        elements.back() = account->properties();
      }
      if (below(4) == 0) {
        account->setAccountProperty_forKey(identifier(), "Username");
      }
      if (below(8) == 0) {
        account->setAccountProperty_forKey(identifier(), kAccountIdentifier);
      }
      if (below(8) == 0) {
        account->_forcedSetAccountProperty_forKey("Carrier Pigeon", kAccountType);
      }
      memory.append(account);
    }
    const InMemory state = fix(memory);
    const PropertyArray file(std::move(elements));
    const Store store = AccountsManager::initWithAccounsInfoArray(file);
    OnDiskAccounts onDisk(file, memory, state);
    for (std::size_t index = 0; index < memory.size(); ++index) {
      const BasicAccount& account = *memory.accounts()[index];
      const BasicAccountReference found = store->accountWithIdentifier(*account.identifier());
      const std::optional<PropertyDictionary> expected =
          found != nullptr ? std::optional(found->propertiesToSave()) : std::nullopt;
      ASSERT_EQ(onDisk.propertiesForAccountAt(index), expected)
          << "round " << round << ", account " << index;
      if (onDisk.isAsMemoryKnowsIt(index)) {
        ++unmergedCount;
        ASSERT_EQ(AccountsManager::mergeInMemoryProperties_originalProperties_onDiskProperties(
                      account.properties(), account.originalProperties(), expected),
                  account.properties())
            << "round " << round << ", account " << index;
      }
    }
  }
  EXPECT_GT(unmergedCount, 100);
}

}  // namespace
}  // namespace accounts
