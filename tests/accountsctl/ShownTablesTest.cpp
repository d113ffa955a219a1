#include <gtest/gtest.h>

#include "accountsctl/ShowCommand.h"
#include "inspection/StoreLayout.h"
#include "tests/fakes/StoreContents.h"

namespace accounts {
namespace {

AccountDictionary account(std::string_view type, std::string_view name,
                          std::string_view identifier) {
  return anAccount(identifier, type, "C").with("DisplayName", name);
}

std::string shown(const PropertyValue& content, ShowOptions options = {}) {
  return shownTables(content, options, {.width = 120, .isColoured = false});
}

TEST(KindOfFile, IsToldByItsKeys) {
  const PropertyArray list;
  const PropertyDictionary dictionary;
  EXPECT_EQ(kindOf(accountSettings(12, {})), FileKind::AccountSettings);
  EXPECT_EQ(kindOf(PropertyDictionary{{"Version", 3}}), FileKind::AccountSettings);
  EXPECT_EQ(kindOf(PropertyDictionary{{"MailAccounts", list}}), FileKind::MailStore);
  EXPECT_EQ(kindOf(PropertyDictionary{{"DeliveryAccounts", list}}), FileKind::MailStore);
  EXPECT_EQ(kindOf(PropertyDictionary{{"DAAccountsKey", list}}), FileKind::ExchangeStore);
  EXPECT_EQ(kindOf(PropertyDictionary{{"NewAccounSettings", dictionary}}),
            FileKind::MigrationInformation);
  EXPECT_EQ(kindOf(PropertyDictionary{{"DeviceInfo", dictionary}}), FileKind::DeviceDescription);
}

TEST(KindOfFile, KeysWithValuesOfAnotherKindTellNothing) {
  EXPECT_EQ(kindOf(PropertyDictionary{{"MailAccounts", "text"}}), FileKind::Other);
  EXPECT_EQ(kindOf(PropertyDictionary{}), FileKind::Other);
  EXPECT_EQ(kindOf(PropertyArray{}), FileKind::Other);
}

TEST(ShownTables, ASettingsFileHasARowForEachAccountAndChild) {
  PropertyDictionary parent = account("Exchange", "Work", "E");
  parent.set("ChildAccounts", PropertyArray{account("Mail", "Post", "M")});
  parent.set("Enabled Dataclasses",
             PropertyArray{"com.quarx.Dataclass.Mail", "com.quarx.Dataclass.Notes", "else"});
  parent.set("Username", "ada");

  EXPECT_EQ(shown(accountSettings(12, {parent, account("CalDAV", "Days", "C")})),
            "Account settings, version 12 (current is 12)\n"
            "2 accounts and 1 child\n"
            "       Type      Name  User  Enabled          Identifier\n"
            "1      Exchange  Work  ada   Mail Notes else  E\n"
            "  1.1  Mail      Post                         M\n"
            "2      CalDAV    Days                         C\n");
}

TEST(ShownTables, ASettingsFileWithoutAVersionSaysSo) {
  EXPECT_EQ(shown(PropertyDictionary{{"Accounts", PropertyArray{}}}),
            "Account settings, without a version (current is 12)\n"
            "0 accounts and 0 children\n");
}

TEST(ShownTables, AnElementThatIsNoAccountIsShownAsItIs) {
  const std::string text = shown(accountSettings(12, {"stray"}));

  EXPECT_NE(text.find("1        stray"), std::string::npos) << text;
}

TEST(ShownTables, WhatStandsBesideTheAccountsIsShown) {
  PropertyDictionary root = accountSettings(12, {});
  root.set("Extra", PropertyDictionary{{"Inner", 5}});

  const std::string text = shown(root);

  EXPECT_NE(text.find("Beside the accounts:\nExtra/Inner  5\n"), std::string::npos) << text;
}

TEST(ShownTables, WithPropertiesEachAccountHasAllOfThem) {
  PropertyDictionary parent = account("Exchange", "Work", "E");
  parent.set("ChildAccounts", PropertyArray{account("Mail", "Post", "M")});

  ShowOptions options;
  options.withProperties = true;

  const std::string text = shown(accountSettings(12, {parent}), options);

  EXPECT_NE(text.find("\n1 Exchange 'Work'\nClass        C\n"), std::string::npos) << text;
  EXPECT_NE(text.find("\n1.1 Mail 'Post'\nClass        C\n"), std::string::npos) << text;
  EXPECT_EQ(text.find("ChildAccounts"), std::string::npos) << text;
}

TEST(ShownTables, ALegacyMailStoreHasATableForEachDirection) {
  const PropertyDictionary incoming = {
      {"uniqueId", "M"}, {"AccountType", "IMAPAccount"}, {"AccountName", "Post"}};

  EXPECT_EQ(shown(PropertyDictionary{{"MailAccounts", PropertyArray{incoming}}}),
            "Legacy mail accounts\n"
            "1 incoming account\n"
            "   Class        Name  User  Identifier\n"
            "1  IMAPAccount  Post        M\n"
            "0 outgoing accounts\n");
}

TEST(ShownTables, AMigrationInformationFileShowsEachOfItsStores) {
  const std::string text = shown(PropertyDictionary{
      {"OldMailAccounts", PropertyDictionary{}},
      {"NewAccounSettings", accountSettings(12, {account("Mail", "Post", "M")})}});

  EXPECT_TRUE(text.starts_with("Migration information\n\nOldMailAccounts\n")) << text;
  EXPECT_NE(text.find("\n\nNewAccounSettings, version 12 (current is 12)\n1 account and"),
            std::string::npos)
      << text;
}

TEST(ShownTables, AnyOtherPropertyListIsATableOfItsValues) {
  EXPECT_EQ(shown(PropertyDictionary{{"a", PropertyDictionary{{"b", PropertyArray{1, 2}}}}}),
            "Property list of another kind\n"
            "a/b  [1,2]\n");
  EXPECT_EQ(shown("alone"), "Property list of another kind\nalone\n");
}

}  // namespace
}  // namespace accounts
