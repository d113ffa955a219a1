#include "inspection/StoreDifference.h"

#include <gtest/gtest.h>

#include "inspection/DifferenceJSON.h"
#include "inspection/DifferenceText.h"
#include "tests/fakes/StoreContents.h"

namespace accounts {
namespace {

AccountDictionary account(std::string_view identifier, std::string_view name = "Name") {
  return anAccount(identifier, "Mail", "IMAPAccount").with("DisplayName", name);
}

AccountDictionary parentOf(std::string_view identifier, PropertyArray children) {
  return account(identifier).withChildren(std::move(children));
}

/// The lines in which two settings files differ.
std::string difference(const PropertyDictionary& before, const PropertyDictionary& after,
                       Secrets secrets = Secrets::Hide) {
  const StoreDifference found =
      differenceBetween(before, after, FileKind::AccountSettings, secrets);
  const std::string text =
      differenceText(differenceObject(found, *layoutOf(FileKind::AccountSettings)), {});
  EXPECT_EQ(found.isEmpty(), text.empty());
  return text;
}

TEST(StoreDifference, AnAccountThatAloneHasItsTypeAndNameIsTheSameWithAnotherIdentifier) {
  EXPECT_EQ(difference(accountSettings(12, {account("A", "Work")}),
                       accountSettings(12, {account("B", "Work")})),
            "* 1 Mail 'Work' (B)\n"
            "    - Identifier: A\n"
            "    + Identifier: B\n");
}

TEST(StoreDifference, AccountsWithANamesakeAreNotTheSameWithAnotherIdentifier) {
  EXPECT_EQ(difference(accountSettings(12, {account("A", "Work")}),
                       accountSettings(12, {account("B", "Work"), account("C", "Work")})),
            "+ 1 Mail 'Work' (B)\n"
            "+ 2 Mail 'Work' (C)\n"
            "- 1 Mail 'Work' (A)\n");
}

TEST(StoreDifference, EqualFilesDoNotDiffer) {
  const PropertyDictionary file =
      accountSettings(12, {account("A"), parentOf("B", {account("C")})});

  EXPECT_EQ(difference(file, file), "");
  EXPECT_EQ(difference(accountSettings(12, {}), accountSettings(12, {})), "");
}

TEST(StoreDifference, AccountsAreAddedAndRemoved) {
  EXPECT_EQ(difference(accountSettings(12, {account("A", "Old"), account("B")}),
                       accountSettings(12, {account("C", "New"), account("B")})),
            "+ 1 Mail 'New' (C)\n"
            "- 1 Mail 'Old' (A)\n");
}

TEST(StoreDifference, ChildrenAreAccountsOfTheirOwn) {
  EXPECT_EQ(difference(accountSettings(12, {parentOf("P", {account("A", "Old")})}),
                       accountSettings(12, {parentOf("P", {account("B", "New")})})),
            "+ 1.1 Mail 'New' (B)\n"
            "- 1.1 Mail 'Old' (A)\n");
}

TEST(StoreDifference, PropertiesThatChangedAreListedInTheOrderOfTheirKeys) {
  EXPECT_EQ(difference(accountSettings(12, {account("A", "Old").with("Gone", 1)}),
                       accountSettings(12, {account("A", "New").with("Fresh", true)})),
            "* 1 Mail 'New' (A)\n"
            "    - DisplayName: Old\n"
            "    + DisplayName: New\n"
            "    + Fresh: true\n"
            "    - Gone: 1\n");
}

TEST(StoreDifference, DictionariesAreComparedKeyByKeyAndArraysAsAWhole) {
  const auto nested = [](int port, int member) {
    return account("A").with(
        "Server", PropertyDictionary{{"List", PropertyArray{member}}, {"Port", port}, {"Same", 1}});
  };

  EXPECT_EQ(difference(accountSettings(12, {nested(1, 5)}), accountSettings(12, {nested(2, 6)})),
            "* 1 Mail 'Name' (A)\n"
            "    - Server/List: [5]\n"
            "    + Server/List: [6]\n"
            "    - Server/Port: 1\n"
            "    + Server/Port: 2\n");
}

TEST(StoreDifference, ATopLevelAccountThatBecameAChildHasMoved) {
  EXPECT_EQ(difference(accountSettings(12, {account("P"), account("A")}),
                       accountSettings(12, {parentOf("P", {account("A")})})),
            "* 1.1 Mail 'Name' (A), now a child of P\n");
}

TEST(StoreDifference, AChildThatBecameATopLevelAccountHasMoved) {
  EXPECT_EQ(difference(accountSettings(12, {parentOf("P", {account("A")})}),
                       accountSettings(12, {parentOf("P", {}), account("A")})),
            "* 2 Mail 'Name' (A), now a top-level account\n");
}

TEST(StoreDifference, AChildWithAnotherParentHasMoved) {
  EXPECT_EQ(difference(accountSettings(12, {parentOf("P", {account("A")}), parentOf("Q", {})}),
                       accountSettings(12, {parentOf("P", {}), parentOf("Q", {account("A")})})),
            "* 2.1 Mail 'Name' (A), now a child of Q\n");
}

TEST(StoreDifference, AnAccountThatMovedShowsItsChangesToo) {
  EXPECT_EQ(difference(accountSettings(12, {account("P"), account("A", "Old")}),
                       accountSettings(12, {parentOf("P", {account("A", "New")})})),
            "* 1.1 Mail 'New' (A), now a child of P\n"
            "    - DisplayName: Old\n"
            "    + DisplayName: New\n");
}

TEST(StoreDifference, AChildWhoseParentTookAnotherPlaceHasNotMoved) {
  EXPECT_EQ(difference(accountSettings(12, {account("X"), parentOf("P", {account("A")})}),
                       accountSettings(12, {parentOf("P", {account("A")})})),
            "- 1 Mail 'Name' (X)\n");
}

TEST(StoreDifference, AnotherOrderIsADifference) {
  EXPECT_EQ(difference(accountSettings(12, {account("A"), account("B")}),
                       accountSettings(12, {account("B"), account("A")})),
            "The accounts stand in another order\n");
}

TEST(StoreDifference, WhatStandsBesideTheAccountsIsComparedToo) {
  EXPECT_EQ(difference(PropertyDictionary{{"Version", 9}, {"Accounts", PropertyArray{}}},
                       accountSettings(12, {})),
            "- Version: 9\n"
            "+ Version: 12\n");
}

TEST(StoreDifference, AnEmptyListOfAccountsIsNotTheSameAsNone) {
  EXPECT_EQ(difference(PropertyDictionary{{"Version", 12}}, accountSettings(12, {})),
            "+ Accounts: []\n");
}

TEST(StoreDifference, AccountsWithOneIdentifierAreComparedInTheirOrder) {
  EXPECT_EQ(
      difference(accountSettings(12, {account("A", "1"), account("A", "2")}),
                 accountSettings(12, {account("A", "1"), account("A", "3"), account("A", "4")})),
      "* 2 Mail '3' (A)\n"
      "    - DisplayName: 2\n"
      "    + DisplayName: 3\n"
      "+ 3 Mail '4' (A)\n");
}

TEST(StoreDifference, AccountsWithoutIdentifiersAreMatchedByTypeAndName) {
  const auto nameless = [](std::string_view name, int port) {
    return PropertyDictionary{{"Type", "Mail"}, {"DisplayName", name}, {"Port", port}};
  };

  EXPECT_EQ(difference(accountSettings(12, {nameless("One", 1), nameless("Two", 2)}),
                       accountSettings(12, {nameless("Two", 3)})),
            "* 1 Mail 'Two' (none)\n"
            "    - Port: 2\n"
            "    + Port: 3\n"
            "- 1 Mail 'One' (none)\n");
}

TEST(StoreDifference, SecretsThatChangedAreHidden) {
  const PropertyDictionary before = accountSettings(12, {account("A").with("Password", "old")});
  const PropertyDictionary after = accountSettings(12, {account("A").with("Password", "new")});

  EXPECT_EQ(difference(before, after),
            "* 1 Mail 'Name' (A)\n"
            "    - Password: (hidden)\n"
            "    + Password: (hidden)\n");
  EXPECT_EQ(difference(before, after, Secrets::Show),
            "* 1 Mail 'Name' (A)\n"
            "    - Password: old\n"
            "    + Password: new\n");
}

TEST(StoreDifference, ASecretDictionaryIsHiddenAsAWhole) {
  const auto tokens = [](const char* value) {
    return accountSettings(12, {account("A").with("Tokens", PropertyDictionary{{"Inner", value}})});
  };

  EXPECT_EQ(difference(tokens("old"), tokens("new")),
            "* 1 Mail 'Name' (A)\n"
            "    - Tokens: (hidden)\n"
            "    + Tokens: (hidden)\n");
}

TEST(StoreDifference, WhatATerminalMightObeyIsEscaped) {
  EXPECT_EQ(difference(accountSettings(12, {}), accountSettings(12, {account("A\n", "\x1B[2J")})),
            "+ 1 Mail '\\u001b[2J' (A\\n)\n");
}

TEST(StoreDifference, ManyAccountsWithOneIdentifierAreComparedToo) {
  PropertyArray many;
  for (int number = 0; number < 3000; ++number) {
    many.append(account("A", std::to_string(number)));
  }

  EXPECT_EQ(difference(accountSettings(12, many), accountSettings(12, many)), "");
}

TEST(StoreDifference, InJSONAMoveNamesBothPlaces) {
  const StoreLayout layout = *layoutOf(FileKind::AccountSettings);
  const JSON object =
      differenceObject(differenceBetween(accountSettings(12, {account("P"), account("A")}),
                                         accountSettings(12, {parentOf("P", {account("A")})}),
                                         FileKind::AccountSettings, Secrets::Hide),
                       layout);

  ASSERT_EQ(object["accounts"].size(), 1U);
  EXPECT_EQ(object["accounts"][0]["change"], "moved");
  EXPECT_EQ(object["accounts"][0]["before"], (JSON{{"place", "2"}, {"parent", nullptr}}));
  EXPECT_EQ(object["accounts"][0]["after"], (JSON{{"place", "1.1"}, {"parent", "P"}}));
}

}  // namespace
}  // namespace accounts
