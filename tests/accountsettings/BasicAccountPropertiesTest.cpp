#include <gtest/gtest.h>

#include "tests/accountsettings/TestRecords.h"

namespace accounts {
namespace {

BasicAccountReference childOf(const BasicAccountReference& parent,
                              const PropertyDictionary& further = {}) {
  BasicAccountReference child = mailAccount(
      AccountDictionary(PropertyDictionary{{kAccountIdentifier, "child-1"}}).with(further));
  child->setParentAccount(parent);
  return child;
}

TEST(AccountProperties, AnOwnValueHidesTheParents) {
  FakeProcess device;
  const auto child = childOf(cloudAccount({{"Host", "parent"}}), {{"Host", "own"}});
  EXPECT_EQ(described(child->accountPropertyForKey("Host")), "own");
}

TEST(AccountProperties, AnOwnEmptyTextHidesTheParents) {
  FakeProcess device;
  const auto child = childOf(cloudAccount());
  child->_forcedSetAccountProperty_forKey("", kAccountIdentifier);
  child->_forcedSetAccountProperty_forKey("", kAccountType);
  child->_forcedSetAccountProperty_forKey("", kAccountClass);

  EXPECT_EQ(child->identifier(), "");
  EXPECT_EQ(child->type(), "");
  EXPECT_EQ(child->accountClass(), "");
}

TEST(AccountProperties, AMissingValueIsTheParents) {
  FakeProcess device;
  const auto child = childOf(cloudAccount({{"Host", "parent"}}));
  EXPECT_EQ(described(child->accountPropertyForKey("Host")), "parent");
}

TEST(AccountProperties, AMissingValueOfTheParentIsTheGrandparents) {
  FakeProcess device;
  const auto grandchild = childOf(childOf(cloudAccount({{"Host", "top"}})));
  EXPECT_EQ(described(grandchild->accountPropertyForKey("Host")), "top");
}

TEST(AccountProperties, WithoutAParentAMissingValueIsNone) {
  FakeProcess device;
  EXPECT_EQ(mailAccount()->accountPropertyForKey("Host"), std::nullopt);
}

TEST(AccountProperties, InheritedValuesAreNotOwnProperties) {
  FakeProcess device;
  const auto child = childOf(cloudAccount({{"Host", "parent"}}));
  EXPECT_FALSE(child->properties().contains("Host"));
  EXPECT_FALSE(child->propertiesToSave().contains("Host"));
}

TEST(AccountProperties, AChildWithoutSyncIdentifierHasItsParents) {
  FakeProcess device;
  const auto child = childOf(cloudAccount({{kAccountSyncIdentifier, "sync-1"}}));
  EXPECT_EQ(child->syncStoreIdentifier(), "sync-1");
}

TEST(AccountProperties, TheAccessorsReadTheirKeys) {
  FakeProcess device;
  const auto account = mailAccount({{kAccountSyncIdentifier, "sync-1"},
                                    {kAccountDisplayName, "Home"},
                                    {kAccountTypeString, "Long"},
                                    {kAccountShortTypeString, "Short"}});
  EXPECT_EQ(account->type(), "Mail");
  EXPECT_EQ(account->identifier(), "mail-1");
  EXPECT_EQ(account->syncStoreIdentifier(), "sync-1");
  EXPECT_EQ(account->accountClass(), "IMAPAccount");
  EXPECT_EQ(account->displayName(), "Home");
  EXPECT_EQ(account->typeString(), "Long");
  EXPECT_EQ(account->shortTypeString(), "Short");
}

TEST(AccountProperties, AValueOfTheWrongKindReadsAsAbsentAndStays) {
  FakeProcess device;
  const auto account = mailAccount({{kAccountDisplayName, 5}});
  EXPECT_EQ(account->displayName(), std::nullopt);
  EXPECT_EQ(described(account->accountPropertyForKey(kAccountDisplayName)), "5");
}

TEST(AccountProperties, TypedReadsGiveTheirKindAlone) {
  FakeProcess device;
  const auto account = mailAccount(
      {{"Text", "1"}, {"List", PropertyArray{"a"}}, {"Table", PropertyDictionary{{"a", 1}}}});
  EXPECT_EQ(account->textPropertyForKey("Text"), "1");
  EXPECT_EQ(account->textPropertyForKey("List"), std::nullopt);
  EXPECT_EQ(account->arrayPropertyForKey("List"), PropertyArray{"a"});
  EXPECT_EQ(account->arrayPropertyForKey("Table"), std::nullopt);
  EXPECT_EQ(account->dictionaryPropertyForKey("Table"), (PropertyDictionary{{"a", 1}}));
  EXPECT_EQ(account->dictionaryPropertyForKey("Text"), std::nullopt);
}

TEST(AccountProperties, FlagsAndNumbersAreReadFromTextsToo) {
  FakeProcess device;
  const auto account = mailAccount({{"Flag", "YES"}, {"Number", "12"}, {"List", PropertyArray{}}});
  EXPECT_EQ(account->booleanPropertyForKey("Flag"), true);
  EXPECT_EQ(account->integerPropertyForKey("Number"), 12);
  EXPECT_EQ(account->booleanPropertyForKey("List"), std::nullopt);
  EXPECT_EQ(account->integerPropertyForKey("Missing"), std::nullopt);
}

TEST(SettingProperties, AValueIsStoredAndNoneRemovesTheKey) {
  FakeProcess device;
  const auto account = mailAccount();
  account->setAccountProperty_forKey("mail.example", "Host");
  EXPECT_EQ(described(account->accountPropertyForKey("Host")), "mail.example");

  account->setAccountProperty_forKey(std::nullopt, "Host");
  EXPECT_FALSE(account->properties().contains("Host"));
}

TEST(SettingProperties, TypeAndClassAreSilentlyLeft) {
  FakeProcess device;
  const auto account = mailAccount();
  for (const std::string_view key : {kAccountType, kAccountClass}) {
    account->setAccountProperty_forKey("Gmail", key);
    account->setAccountProperty_forKey(std::nullopt, key);
  }
  EXPECT_EQ(account->type(), "Mail");
  EXPECT_EQ(account->accountClass(), "IMAPAccount");
  EXPECT_TRUE(device.logSystem.channel.lines.empty());
}

TEST(SettingProperties, TheForcedSetterChangesTypeAndClass) {
  FakeProcess device;
  const auto account = mailAccount();
  account->_forcedSetAccountProperty_forKey("Gmail", kAccountType);
  account->_forcedSetAccountProperty_forKey(std::nullopt, kAccountClass);
  EXPECT_EQ(account->type(), "Gmail");
  EXPECT_EQ(account->accountClass(), std::nullopt);
}

TEST(SettingProperties, AValueThatDiffersInKindAloneIsStored) {
  FakeProcess device;
  const auto account = mailAccount({{"IsActive", 1}});
  account->setAccountProperty_forKey(true, "IsActive");
  EXPECT_EQ(described(account->accountPropertyForKey("IsActive")), "true");
}

TEST(SettingProperties, RemovingRevealsTheParentsValue) {
  FakeProcess device;
  const auto child = childOf(cloudAccount({{"Host", "parent"}}), {{"Host", "own"}});
  child->removeAccountPropertyForKey("Host");
  EXPECT_EQ(described(child->accountPropertyForKey("Host")), "parent");
}

TEST(SettingProperties, ANewClassIsStored) {
  FakeProcess device;
  const auto account = mailAccount();
  account->setAccountClass("POPAccount");
  EXPECT_EQ(account->properties().textForKey(kAccountClass), "POPAccount");
}

TEST(SettingProperties, TheCurrentClassChangesNothingEvenWhenItIsInherited) {
  FakeProcess device;
  const auto child = childOf(cloudAccount());
  child->_forcedSetAccountProperty_forKey(std::nullopt, kAccountClass);

  child->setAccountClass("ZQAccount");

  EXPECT_FALSE(child->properties().contains(kAccountClass));
}

TEST(SettingProperties, TheDisplayNameAlreadyStoredChangesNothing) {
  FakeProcess device;
  const auto account = mailAccount({{kAccountDisplayName, "Home"}});
  const PropertyDictionary before = account->properties();
  account->setDisplayName("Home");
  EXPECT_TRUE(account->properties().isSameAs(before));
}

TEST(SettingProperties, AnInheritedDisplayNameIsStoredAsAnOwnOne) {
  FakeProcess device;
  const auto child = childOf(cloudAccount({{kAccountDisplayName, "Home"}}));
  child->setDisplayName("Home");
  EXPECT_EQ(child->properties().textForKey(kAccountDisplayName), "Home");
}

TEST(SettingProperties, NoDisplayNameRemovesTheStoredOne) {
  FakeProcess device;
  const auto account = mailAccount({{kAccountDisplayName, "Home"}});
  account->setDisplayName(std::nullopt);
  EXPECT_FALSE(account->properties().contains(kAccountDisplayName));
}

TEST(Snapshot, ANewOneReplacesTheOld) {
  FakeProcess device;
  const auto account = mailAccount();
  account->setOriginalProperties(PropertyDictionary{{"a", 1}});
  EXPECT_EQ(account->originalProperties(), (PropertyDictionary{{"a", 1}}));

  account->setOriginalProperties(std::nullopt);
  EXPECT_EQ(account->originalProperties(), std::nullopt);
}

TEST(Snapshot, ItIsACopyThatLaterChangesLeave) {
  FakeProcess device;
  const auto account = mailAccount();
  account->setOriginalProperties(account->properties());
  account->setAccountProperty_forKey("mail.example", "Host");
  EXPECT_FALSE(account->originalProperties()->contains("Host"));
}

TEST(ParentAccount, ItsIdentifierIsTheParentIdentifier) {
  FakeProcess device;
  EXPECT_EQ(childOf(cloudAccount())->parentAccountIdentifier(), "cloud-1");
  EXPECT_EQ(mailAccount()->parentAccountIdentifier(), std::nullopt);
}

TEST(ParentAccount, AChildKeepsItsParentAlive) {
  FakeProcess device;
  const auto child = childOf(cloudAccount());
  EXPECT_EQ(child->parentAccount()->identifier(), "cloud-1");
}

TEST(ParentAccount, ANewParentLetsGoOfTheOld) {
  FakeProcess device;
  const auto child = childOf(cloudAccount());
  const std::weak_ptr<BasicAccount> oldParent = child->parentAccount();
  child->setParentAccount(nullptr);
  EXPECT_TRUE(oldParent.expired());
}

TEST(IdentifierChanges, SettingAndRemovingTheIdentifierOfARecordCount) {
  FakeProcess device;
  const auto account = mailAccount();
  account->setAccountProperty_forKey("mail-2", kAccountIdentifier);
  EXPECT_EQ(device.process.identifierChanges, 1U);
  account->removeAccountPropertyForKey(kAccountIdentifier);
  EXPECT_EQ(device.process.identifierChanges, 2U);
}

TEST(IdentifierChanges, TheSameIdentifierAndOtherPropertiesDoNotCount) {
  FakeProcess device;
  const auto account = mailAccount();
  account->setAccountProperty_forKey("mail-1", kAccountIdentifier);
  account->setAccountProperty_forKey("sync-1", kAccountSyncIdentifier);
  account->removeAccountPropertyForKey("Host");
  EXPECT_EQ(device.process.identifierChanges, 0U);
}

TEST(IdentifierChanges, SyncIdentifiersHaveACountOfTheirOwn) {
  FakeProcess device;
  mailAccount()->setAccountProperty_forKey("sync-1", kAccountSyncIdentifier);
  EXPECT_EQ(device.process.syncIdentifierChanges, 1U);
  EXPECT_EQ(device.process.identifierChanges, 0U);
}

TEST(IdentifierChanges, ANewParentCountsForARecordThatHasNoIdentifierOfItsOwn) {
  FakeProcess device;
  const auto account = mailAccount();
  account->removeAccountPropertyForKey(kAccountIdentifier);
  const std::uint64_t before = device.process.identifierChanges;

  account->setParentAccount(cloudAccount());

  EXPECT_EQ(account->identifier(), "cloud-1");
  EXPECT_GT(device.process.identifierChanges, before);
}

TEST(IdentifierChanges, ANewParentDoesNotCountForARecordWithAnIdentifier) {
  FakeProcess device;
  childOf(cloudAccount());
  EXPECT_EQ(device.process.identifierChanges, 0U);
}

}  // namespace
}  // namespace accounts
