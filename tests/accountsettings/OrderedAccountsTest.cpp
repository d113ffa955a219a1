#include "accountsettings/OrderedAccounts.h"

#include <algorithm>
#include <random>

#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

class OrderedAccountsTest : public StoreFixture {
 protected:
  /// Appends an account with an identifier and returns its record.
  BasicAccountReference append(std::string_view identifier) {
    list.append(recordOf(mail(identifier)));
    return list.accounts().back();
  }
  [[nodiscard]] std::string identifiers() const { return identifiersOf(list.accounts()); }

  OrderedAccounts list;
};

TEST_F(OrderedAccountsTest, AccountsAreListedInTheOrderInWhichTheyWereAppended) {
  append("B");
  append("A");
  EXPECT_EQ(identifiers(), "B A");
  EXPECT_EQ(list.size(), 2u);
}

TEST_F(OrderedAccountsTest, AReplacedAccountLeavesItsPlaceToTheNewOne) {
  append("A");
  append("B");
  const BasicAccountReference replacement = recordOf(mail("A"));
  EXPECT_EQ(list.replaceAll("A", replacement), 1u);
  EXPECT_EQ(identifiers(), "A B");
  EXPECT_EQ(list.accounts().front(), replacement);
}

TEST_F(OrderedAccountsTest, EveryPlaceOfAnIdentifierIsReplaced) {
  append("A");
  append("B");
  append("A");
  const BasicAccountReference replacement = recordOf(mail("A"));
  EXPECT_EQ(list.replaceAll("A", replacement), 2u);
  EXPECT_EQ(list.accounts()[0], replacement);
  EXPECT_EQ(list.accounts()[2], replacement);
}

TEST_F(OrderedAccountsTest, ReplacingAnUnknownIdentifierChangesNothing) {
  append("A");
  EXPECT_EQ(list.replaceAll("B", recordOf(mail("B"))), 0u);
  EXPECT_EQ(identifiers(), "A");
}

TEST_F(OrderedAccountsTest, ARecordIsReplacedInItsFirstPlaceOnly) {
  const BasicAccountReference account = append("A");
  list.append(account);
  EXPECT_TRUE(list.replaceFirst(account, recordOf(mail("Q"))));
  EXPECT_EQ(identifiers(), "Q A");
}

TEST_F(OrderedAccountsTest, ARecordIsReplacedByIdentityAndNotByIdentifier) {
  append("A");
  const BasicAccountReference second = append("A");
  EXPECT_TRUE(list.replaceFirst(second, recordOf(mail("Q"))));
  EXPECT_EQ(identifiers(), "A Q");
}

TEST_F(OrderedAccountsTest, AReplacementIsFoundUnderItsOwnIdentifier) {
  const BasicAccountReference account = append("A");
  list.replaceFirst(account, recordOf(mail("Q")));
  EXPECT_EQ(list.removeLast("A"), nullptr);
  EXPECT_NE(list.removeLast("Q"), nullptr);
  EXPECT_EQ(list.size(), 0u);
}

TEST_F(OrderedAccountsTest, ARecordThatIsNotThereCannotBeReplaced) {
  append("A");
  EXPECT_FALSE(list.replaceFirst(recordOf(mail("A")), recordOf(mail("Q"))));
  EXPECT_EQ(identifiers(), "A");
}

TEST_F(OrderedAccountsTest, OnlyTheLastRecordOfAnIdentifierIsRemoved) {
  const BasicAccountReference first = append("A");
  append("B");
  append("A");
  EXPECT_NE(list.removeLast("A"), nullptr);
  EXPECT_EQ(identifiers(), "A B");
  EXPECT_EQ(list.accounts().front(), first);
}

TEST_F(OrderedAccountsTest, ARecordIsRemovedFromEveryPlaceThatItHas) {
  const BasicAccountReference account = append("A");
  append("B");
  list.append(account);
  EXPECT_NE(list.removeLast("A"), nullptr);
  EXPECT_EQ(identifiers(), "B");
  EXPECT_EQ(list.size(), 1u);
}

TEST_F(OrderedAccountsTest, RemovingAnUnknownIdentifierChangesNothing) {
  append("A");
  EXPECT_EQ(list.removeLast("B"), nullptr);
  EXPECT_EQ(identifiers(), "A");
}

TEST_F(OrderedAccountsTest, AnAccountIsFoundUnderTheIdentifierThatItHasNow) {
  const BasicAccountReference account = append("A");
  list.removeLast("nothing, but the list is indexed now");
  account->setAccountProperty_forKey("B", kAccountIdentifier);
  EXPECT_EQ(list.removeLast("A"), nullptr);
  EXPECT_NE(list.removeLast("B"), nullptr);
}

TEST_F(OrderedAccountsTest, AnAccountWithoutAnIdentifierStaysInItsPlace) {
  append("A")->removeAccountPropertyForKey(kAccountIdentifier);
  append("B");
  EXPECT_EQ(list.removeLast(""), nullptr);
  EXPECT_EQ(identifiers(), "- B");
}

TEST_F(OrderedAccountsTest, AssigningPutsOtherAccountsInThePlaceOfAll) {
  append("A");
  list.assign({recordOf(mail("B")), recordOf(mail("C"))});
  EXPECT_EQ(list.removeLast("A"), nullptr);
  EXPECT_NE(list.removeLast("B"), nullptr);
  EXPECT_EQ(identifiers(), "C");
}

TEST_F(OrderedAccountsTest, AssignedAccountsAreFoundInTheirOwnPlaces) {
  append("A");
  append("B");
  list.removeLast("nothing, but the list is indexed now");
  list.assign({recordOf(mail("B")), recordOf(mail("C")), recordOf(mail("A"))});
  const BasicAccountReference replacement = recordOf(mail("Q"));
  EXPECT_EQ(list.replaceAll("A", replacement), 1u);
  EXPECT_EQ(identifiers(), "B C Q");
  EXPECT_EQ(list.replaceAll("A", replacement), 0u);
}

TEST_F(OrderedAccountsTest, TheReferenceToTheAccountsStaysValid) {
  const std::vector<BasicAccountReference>& accounts = list.accounts();
  append("A");
  append("B");
  list.removeLast("A");
  EXPECT_EQ(&list.accounts(), &accounts);
  EXPECT_EQ(identifiersOf(accounts), "B");
}

/// The same operations, each a walk through the whole list.
struct PlainList {
  std::vector<BasicAccountReference> accounts;

  void replaceAll(std::string_view identifier, const BasicAccountReference& account) {
    for (BasicAccountReference& place : accounts) {
      if (place->identifier() == std::optional<Text>(identifier)) {
        place = account;
      }
    }
  }
  void replaceFirst(const BasicAccountReference& oldAccount,
                    const BasicAccountReference& newAccount) {
    const auto place = std::find(accounts.begin(), accounts.end(), oldAccount);
    if (place != accounts.end()) {
      *place = newAccount;
    }
  }
  void removeLast(std::string_view identifier) {
    const auto place = std::find_if(accounts.rbegin(), accounts.rend(), [&](const auto& account) {
      return account->identifier() == std::optional<Text>(identifier);
    });
    if (place != accounts.rend()) {
      std::erase(accounts, BasicAccountReference(*place));
    }
  }
};

TEST_F(OrderedAccountsTest, AnySequenceOfOperationsGivesWhatPlainWalksGive) {
  std::mt19937 random(20120919);
  const auto below = [&](std::size_t limit) { return random() % limit; };
  const std::vector<std::string> names = {"A", "B", "C", "D", "E", "F"};
  std::vector<BasicAccountReference> records;
  for (std::size_t count = 0; count < 12; ++count) {
    records.push_back(recordOf(mail(names[count % names.size()])));
  }
  PlainList plain;
  for (int step = 0; step < 5000; ++step) {
    const std::string& name = names[below(names.size())];
    const BasicAccountReference& record = records[below(records.size())];
    const BasicAccountReference& other = records[below(records.size())];
    switch (below(7)) {
      case 0:
      case 1:
        list.append(record);
        plain.accounts.push_back(record);
        break;
      case 2:
        list.replaceAll(name, record);
        plain.replaceAll(name, record);
        break;
      case 3:
        list.replaceFirst(record, other);
        plain.replaceFirst(record, other);
        break;
      case 4:
        list.removeLast(name);
        plain.removeLast(name);
        break;
      case 5:
        // Now and then, since it makes a long list short.
        if (below(4) == 0) {
          list.assign({other, record, other});
          plain.accounts = {other, record, other};
        }
        break;
      default:
        record->setAccountProperty_forKey(name, kAccountIdentifier);
    }
    ASSERT_EQ(list.size(), plain.accounts.size());
    if (below(3) == 0) {
      ASSERT_EQ(list.accounts(), plain.accounts);
    }
  }
}

}  // namespace
}  // namespace accounts
