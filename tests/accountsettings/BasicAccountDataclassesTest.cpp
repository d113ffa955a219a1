#include <gtest/gtest.h>

#include "tests/accountsettings/TestRecords.h"

namespace accounts {
namespace {

BasicAccountReference accountWithEnabled(const PropertyArray& dataclasses) {
  return cloudAccount({{kAccountEnabledDataclasses, dataclasses}});
}

std::string stored(const BasicAccountReference& account) {
  return shortNames(account->properties().arrayForKey(kAccountEnabledDataclasses));
}

TEST(SupportedDataclasses, ATypeWithoutConfiguredListSupportsAndProvisionsNothing) {
  FakeProcess device;
  configureType(device, kMailAccountType, {});
  const auto account =
      mailAccount({{kAccountProvisionedDataclasses, PropertyArray{kAccountDataclassMail}}});
  EXPECT_EQ(shortNames(account->supportedDataclasses()), "");
  EXPECT_EQ(shortNames(account->provisionedDataclasses()), "");
}

TEST(SupportedDataclasses, ATypeThatBecameUnknownSupportsNothing) {
  FakeProcess device;
  const auto account = mailAccount();
  account->_forcedSetAccountProperty_forKey("X", kAccountType);
  EXPECT_EQ(shortNames(account->supportedDataclasses()), "");
}

TEST(ProvisionedDataclasses, WithoutAListTheyAreTheSupportedOnes) {
  FakeProcess device;
  EXPECT_EQ(shortNames(mailAccount()->provisionedDataclasses()), "Mail Notes");
}

TEST(ProvisionedDataclasses, TheListIsReducedToTheSupportedOnesAndOrdered) {
  FakeProcess device;
  const auto account = mailAccount(
      {{kAccountProvisionedDataclasses,
        PropertyArray{kAccountDataclassNotes, kAccountDataclassBackup, kAccountDataclassMail}}});
  EXPECT_EQ(shortNames(account->provisionedDataclasses()), "Mail Notes");
}

TEST(ProvisionedDataclasses, AnEmptyListProvisionsNothing) {
  FakeProcess device;
  const auto account = mailAccount({{kAccountProvisionedDataclasses, PropertyArray{}}});
  EXPECT_EQ(shortNames(account->provisionedDataclasses()), "");
}

TEST(ProvisionedDataclasses, AChildWithoutAListHasItsParents) {
  FakeProcess device;
  const auto child = mailAccount();
  child->setParentAccount(
      cloudAccount({{kAccountProvisionedDataclasses,
                     PropertyArray{kAccountDataclassBackup, kAccountDataclassNotes}}}));
  EXPECT_EQ(shortNames(child->provisionedDataclasses()), "Notes");
}

TEST(ProvisionedDataclasses, AListOfAnotherKindCountsAsNone) {
  FakeProcess device;
  const auto account = mailAccount({{kAccountProvisionedDataclasses, "Mail"}});
  EXPECT_EQ(shortNames(account->provisionedDataclasses()), "Mail Notes");
}

TEST(EnabledDataclasses, WithoutAListThereAreNoneWhichIsNotAnEmptyList) {
  FakeProcess device;
  EXPECT_EQ(mailAccount()->enabledDataclasses(), std::nullopt);
  EXPECT_EQ(shortNames(accountWithEnabled({})->enabledDataclasses()), "");
}

TEST(EnabledDataclasses, RepeatedAndUnknownOnesAreLeftOutAndTheRestIsOrdered) {
  FakeProcess device;
  const auto account = accountWithEnabled(
      {kAccountDataclassNotes, kAccountDataclassMail, "X", kAccountDataclassMail});
  EXPECT_EQ(shortNames(account->enabledDataclasses()), "Mail Notes");
}

TEST(EnabledDataclasses, WhatIsNoLongerProvisionedIsNotReportedButStaysStored) {
  FakeProcess device;
  const auto account = mailAccount(
      {{kAccountEnabledDataclasses, PropertyArray{kAccountDataclassMail, kAccountDataclassNotes}},
       {kAccountProvisionedDataclasses, PropertyArray{kAccountDataclassMail}}});
  EXPECT_EQ(shortNames(account->enabledDataclasses()), "Mail");
  EXPECT_EQ(stored(account), "Mail Notes");
}

TEST(EnabledDataclasses, AListOfAnotherKindCountsAsNone) {
  FakeProcess device;
  const auto account = mailAccount({{kAccountEnabledDataclasses, true}});
  EXPECT_EQ(account->enabledDataclasses(), std::nullopt);
}

TEST(EnabledDataclasses, AChildHasItsParentsWhateverItsOwnListSays) {
  FakeProcess device;
  const auto child =
      mailAccount({{kAccountEnabledDataclasses, PropertyArray{kAccountDataclassContacts}}});
  child->setParentAccount(accountWithEnabled({kAccountDataclassMail}));
  EXPECT_EQ(shortNames(child->enabledDataclasses()), "Mail");
}

TEST(EnabledDataclasses, TheParentsAreNotReducedToWhatTheChildSupports) {
  FakeProcess device;
  const auto child = mailAccount();
  child->setParentAccount(accountWithEnabled({kAccountDataclassBackup}));
  EXPECT_EQ(shortNames(child->enabledDataclasses()), "Backup");
}

TEST(EnabledDataclasses, WhenTheParentHasNoneTheOwnListDecides) {
  FakeProcess device;
  const auto child =
      mailAccount({{kAccountEnabledDataclasses, PropertyArray{kAccountDataclassNotes}}});
  child->setParentAccount(accountWithEnabled({}));
  EXPECT_EQ(shortNames(child->enabledDataclasses()), "Notes");
}

TEST(EnabledDataclasses, WithoutAnOwnListTheParentsStoredListDecidesByInheritance) {
  FakeProcess device;
  const auto parent = accountWithEnabled({kAccountDataclassNotes});
  parent->setAccountProperty_forKey(PropertyArray{}, kAccountProvisionedDataclasses);
  const auto child =
      mailAccount({{kAccountProvisionedDataclasses, PropertyArray{kAccountDataclassNotes}}});
  child->setParentAccount(parent);
  EXPECT_EQ(shortNames(parent->enabledDataclasses()), "");
  EXPECT_EQ(shortNames(child->enabledDataclasses()), "Notes");
}

TEST(EnabledDataclasses, ADataclassIsEnabledWhenItIsAmongThem) {
  FakeProcess device;
  const auto account = accountWithEnabled({kAccountDataclassMail});
  EXPECT_TRUE(account->isEnabledForDataclass(kAccountDataclassMail));
  EXPECT_FALSE(account->isEnabledForDataclass(kAccountDataclassNotes));
  EXPECT_FALSE(mailAccount()->isEnabledForDataclass(kAccountDataclassMail));
}

TEST(SwitchingDataclasses, ASupportedOneIsAddedAtTheEnd) {
  FakeProcess device;
  const auto account = accountWithEnabled({kAccountDataclassNotes});
  account->setEnabled_forDataclass(true, kAccountDataclassMail);
  EXPECT_EQ(stored(account), "Notes Mail");
}

TEST(SwitchingDataclasses, AnUnsupportedOneIsSilentlyLeft) {
  FakeProcess device;
  const auto account = mailAccount();
  account->setEnabled_forDataclass(true, kAccountDataclassBackup);
  EXPECT_EQ(stored(account), "none");
  EXPECT_TRUE(device.logSystem.channel.lines.empty());
}

TEST(SwitchingDataclasses, SwitchingOffTheLastLeavesAnEmptyList) {
  FakeProcess device;
  const auto account = accountWithEnabled({kAccountDataclassMail});
  account->setEnabled_forDataclass(false, kAccountDataclassMail);
  EXPECT_EQ(stored(account), "");
}

TEST(SwitchingDataclasses, OtherMembersStay) {
  FakeProcess device;
  const auto account = accountWithEnabled({"X", 1, kAccountDataclassNotes});
  account->setEnabled_forDataclass(true, kAccountDataclassMail);
  EXPECT_EQ(stored(account), "X 1 Notes Mail");
}

TEST(SwitchingDataclasses, TheParentsListIsNotTakenOver) {
  FakeProcess device;
  const auto child = mailAccount();
  child->setParentAccount(accountWithEnabled({kAccountDataclassNotes}));
  child->setEnabled_forDataclass(true, kAccountDataclassMail);
  EXPECT_EQ(stored(child), "Mail");
}

TEST(SwitchingDataclasses, TheForcedSwitchTakesAnUnsupportedOne) {
  FakeProcess device;
  const auto account = mailAccount();
  account->_forcedSetEnabled_forDataclass(true, kAccountDataclassBackup);
  EXPECT_EQ(stored(account), "Backup");
  EXPECT_EQ(shortNames(account->enabledDataclasses()), "");

  account->_forcedSetEnabled_forDataclass(false, kAccountDataclassBackup);
  EXPECT_EQ(stored(account), "");
}

TEST(SwitchingDataclasses, AListReplacesWhatWasEnabledWithoutUnsupportedOnes) {
  FakeProcess device;
  const auto account =
      mailAccount({{kAccountEnabledDataclasses, PropertyArray{kAccountDataclassMail}}});
  account->setEnabledForDataclasses({kAccountDataclassBackup, kAccountDataclassNotes, 3});
  EXPECT_EQ(stored(account), "Notes");
}

TEST(SwitchingDataclasses, AnEmptyListLeavesNoListStored) {
  FakeProcess device;
  const auto account = accountWithEnabled({kAccountDataclassMail});
  account->setEnabledForDataclasses({});
  EXPECT_FALSE(account->properties().contains(kAccountEnabledDataclasses));
  EXPECT_EQ(account->enabledDataclasses(), std::nullopt);
}

TEST(OrderedDataclassesOfARecord, UnknownTextsFollowWithTheirRepetitions) {
  FakeProcess device;
  EXPECT_EQ(
      shortNames(BasicAccount::_orderedDataclasses(PropertyArray{"X", kAccountDataclassMail, "X"})),
      "Mail X X");
}

TEST(OrderedDataclassesOfARecord, NoListGivesAnEmptyOne) {
  FakeProcess device;
  EXPECT_TRUE(BasicAccount::_orderedDataclasses(std::nullopt).empty());
}

}  // namespace
}  // namespace accounts
