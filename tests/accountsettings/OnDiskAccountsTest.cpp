#include "accountsettings/OnDiskAccounts.h"

#include <random>

#include "accountsettings/ASRuntimeFixMailAccount.h"
#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

const NewestSave kNeverSaved;

class OnDiskAccountsTest : public StoreFixture {
 protected:
  /// Records of these dictionaries, in order.
  static OrderedAccounts memoryOf(const std::vector<PropertyDictionary>& dictionaries) {
    OrderedAccounts memory;
    for (const PropertyDictionary& dictionary : dictionaries) {
      memory.append(BasicAccount::initWithProperties(dictionary));
    }
    return memory;
  }
};

TEST_F(OnDiskAccountsTest, AnAccountIsFoundUnderItsIdentifierWhereverItIs) {
  const OrderedAccounts memory = memoryOf({mail("A"), mail("B")});
  const OnDiskAccounts onDisk({mail("B").with("Username", "b"), mail("A").with("Username", "a")},
                              kNeverSaved, memory);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0), PropertyDictionary(mail("A").with("Username", "a")));
  EXPECT_EQ(onDisk.propertiesForAccountAt(1), PropertyDictionary(mail("B").with("Username", "b")));
}

TEST_F(OnDiskAccountsTest, AnAccountThatTheDiskDoesNotHaveIsNotFound) {
  const OrderedAccounts memory = memoryOf({mail("A")});
  EXPECT_EQ(OnDiskAccounts({mail("B")}, kNeverSaved, memory).propertiesForAccountAt(0),
            std::nullopt);
}

TEST_F(OnDiskAccountsTest, AnAccountWithoutAnIdentifierIsNotFound) {
  const PropertyDictionary nameless = mail("A").without(kAccountIdentifier);
  const OrderedAccounts memory = memoryOf({nameless});
  memory.accounts().front()->removeAccountPropertyForKey(kAccountIdentifier);
  EXPECT_EQ(OnDiskAccounts({nameless}, kNeverSaved, memory).propertiesForAccountAt(0),
            std::nullopt);
}

TEST_F(OnDiskAccountsTest, OfSeveralAccountsWithAnIdentifierTheLastOneThatMakesARecordCounts) {
  const OrderedAccounts memory = memoryOf({mail("A")});
  const OnDiskAccounts onDisk(
      {mail("A"), exchange("A"), ofUnknownType("A"), mailThatCannotBeFixed("A"), "no account"},
      kNeverSaved, memory);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0), PropertyDictionary(exchange("A")));
}

TEST_F(OnDiskAccountsTest, AnAccountOnDiskIsFixedBeforeItIsGivenBack) {
  const OrderedAccounts memory = memoryOf({mail("A")});
  const OnDiskAccounts onDisk({mailThatCanBeFixed("A")}, kNeverSaved, memory);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0)->textForKey(kAccountClass), Text("POPAccount"));
}

TEST_F(OnDiskAccountsTest, AChildsIdentifierFindsItsParent) {
  const PropertyDictionary parent = exchange("P").withChildren({mail("A")});
  const OrderedAccounts memory = memoryOf({mail("A"), mail("B")});
  const OnDiskAccounts onDisk({parent}, kNeverSaved, memory);
  EXPECT_EQ(onDisk.propertiesForAccountAt(0), parent);
  EXPECT_EQ(onDisk.propertiesForAccountAt(1), std::nullopt);
}

TEST_F(OnDiskAccountsTest, AFileThatAnotherProgramEmptiedHasNoAccountOfTheLastSave) {
  const OrderedAccounts saved = memoryOf({mail("A"), mail("B")});
  NewestSave lastSave;
  lastSave.note({mail("A"), mail("B").without(kAccountIdentifier)}, saved, FixResult::Unchanged);
  const OrderedAccounts memory = memoryOf({mail("A")});
  EXPECT_EQ(OnDiskAccounts({}, lastSave, memory).propertiesForAccountAt(0), std::nullopt);
}

// A store of the same few identifiers in every kind of state, and the file that it saved last, to
// which the disk may have contributed. Most have changed since.
TEST_F(OnDiskAccountsTest, WhateverWasSavedTheAnswersAreThoseOfAStoreMadeFromTheFile) {
  std::mt19937 random(20260101);
  const auto below = [&](std::uint_fast32_t limit) { return random() % limit; };
  const auto identifier = [&] { return std::string(1, static_cast<char>('A' + below(6))); };
  const auto dictionary = [&]() -> PropertyDictionary {
    switch (below(12)) {
      case 0:
        return ofUnknownType(identifier());
      case 1:
        return mailThatCanBeFixed(identifier());
      case 2:
        return mailThatCannotBeFixed(identifier());
      case 3:
        return exchange(identifier()).withChildren({mail(identifier()), ofUnknownType("A")});
      case 4:
        return exchange(identifier()).withChildren({mail(identifier())});
      default:
        return mail(identifier()).with("Username", identifier());
    }
  };
  int unloadedCount = 0;
  for (int round = 0; round < 5000; ++round) {
    NewestSave lastSave;
    OrderedAccounts memory;
    std::vector<PropertyValue> elements;
    FixResult fixing = FixResult::Unchanged;
    for (auto count = below(4); count > 0; --count) {
      ASRuntimeFixMailAccount fixer;
      const auto account = BasicAccount::initWithProperties(dictionary());
      if (account == nullptr) {
        continue;
      }
      fixing = std::max(fixing, fixer.fixBasicAccountIfNeeded_loggingMessage(*account, "saving"));
      const bool isContributed = below(8) == 0;
      elements.emplace_back(isContributed ? dictionary() : account->properties());
      memory.append(account);
    }
    PropertyArray file(std::move(elements));
    lastSave.note(file, memory, fixing);
    for (const BasicAccountReference& account : memory.accounts()) {
      account->setAccountProperty_forKey(identifier(), "Username");
      if (below(8) == 0) {
        account->setAccountProperty_forKey(identifier(), kAccountIdentifier);
      }
    }
    if (below(8) == 0) {
      memory.append(recordOf(mail(identifier())));
    }
    if (below(8) == 0) {
      memory.removeLast(identifier());
    }
    if (below(8) == 0) {
      file = PropertyArray();
    }
    unloadedCount += lastSave.isThere(file, memory) && !file.empty() ? 1 : 0;
    const Store store = AccountsManager::initWithAccounsInfoArray(file);
    const OnDiskAccounts onDisk(file, lastSave, memory);
    for (std::size_t index = 0; index < memory.size(); ++index) {
      const BasicAccountReference found =
          store->accountWithIdentifier(*memory.accounts()[index]->identifier());
      ASSERT_EQ(onDisk.propertiesForAccountAt(index),
                found != nullptr ? std::optional(found->propertiesToSave()) : std::nullopt)
          << "round " << round << ", account " << index;
    }
  }
  EXPECT_GT(unloadedCount, 500);
}

}  // namespace
}  // namespace accounts
