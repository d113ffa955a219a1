// What becomes of accounts that are carried over.

#include "tests/ledger/LedgerFixture.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

AccountDictionary hosted(std::string_view identifier) {
  return accountWithHost(identifier, kVelmoraAccountType, kVelmoraAccountClass);
}

TEST(Fates, AnAccountThatNoRuleTouchesIsKept) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(12, {accountWithHost("A", kLDAPAccountType, "LDAPAccount")})});
  EXPECT_THAT(migrated.fates(), ElementsAre("Accounts[0] kept"));
}

TEST(Fates, AnAccountWithoutAnIdentifierIsGivenAFreshOneAndIsChanged) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(
           12,
           {accountWithHost("A", kLDAPAccountType, "LDAPAccount").without(kAccountIdentifier)})});
  EXPECT_THAT(migrated.fates(), ElementsAre("Accounts[0] changed"));
}

TEST(Fates, AnAccountWithAUniqueIdIsRenamed) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(1, {accountWithHost("A", kMailAccountType, kIMAPAccountClass)
                                           .with(kLegacyMailIdentifier, "B")})});
  EXPECT_THAT(migrated.fates(), ElementsAre("Accounts[0] renamed"));
  EXPECT_THAT(migrated.losses(), IsEmpty());
}

TEST(Fates, DescriptionsAreConverted) {
  const MigratedInMemory migrated({.mail = mailStore({mailDescription("A", kIMAPAccountClass)},
                                                     {mailDescription("B", kSMTPAccountClass)}),
                                   .exchange = exchangeStore({exchangeDescription("C")})});
  EXPECT_THAT(migrated.fates(),
              ElementsAre("DeliveryAccounts[0] converted", "MailAccounts[0] converted",
                          "DAAccountsKey[0] converted"));
}

TEST(Fates, DescriptionsWithoutIdentifiersAreConverted) {
  const MigratedInMemory migrated(
      {.mail = mailStore({mailDescription("A", kIMAPAccountClass).without(kLegacyMailIdentifier)}),
       .exchange = exchangeStore({exchangeDescription("C").without(kLegacyExchangeIdentifier)})});
  EXPECT_THAT(migrated.losses(), IsEmpty());
}

TEST(Fates, AHostedAccountMovesBelowAParentWithItsChildrenAtTheParentsSide) {
  const PropertyDictionary child = accountWithHost("K", kCalDAVAccountType, "CalDAVAccount");
  const MigratedInMemory migrated(
      {.settings = accountSettings(6, {hosted("A").withChildren({child})})});
  EXPECT_THAT(migrated.fates(), ElementsAre("Accounts[0] movedBelow",
                                            "Accounts[0].ChildAccounts[0] movedToOtherParent"));
  EXPECT_EQ(migrated.ledger().entries[0].now, std::vector{LedgerPlace({0, 1})});
  EXPECT_EQ(migrated.ledger().entries[1].now, std::vector{LedgerPlace({0, 0})});
  EXPECT_THAT(migrated.losses(), IsEmpty());
}

TEST(Fates, AHostedChildWithoutAnIdentifierIsGivenOneWhereAStepTakesItsNameOff) {
  const PropertyDictionary child =
      hosted("A").with(kAccountDisplayName, "Velmora").without(kAccountIdentifier);
  const PropertyDictionary cloud =
      accountWithHost("Q", kQuarxAccountType, kCloudAccountClass).withChildren({child});
  EXPECT_THAT(MigratedInMemory({.settings = accountSettings(7, {cloud})}).fates(),
              ElementsAre("Accounts[0] changed", "Accounts[0].ChildAccounts[0] changed"));
}

TEST(Fates, ACalendarAccountIsJoinedIntoItsMailAccount) {
  const PropertyDictionary gmail =
      accountWithHost("G", kMailAccountType, kGmailAccountClass).with(kAccountUsername, "jo");
  const PropertyDictionary calendars =
      accountWithHost("K", kCalDAVAccountType, kCalDAVAccountClass)
          .with("CalDAVPrincipalConfiguration",
                PropertyDictionary{{"Login_Key", "jo"}, {"CalDAV_Server_Key", "www.google.com"}})
          .with("CalDAVAccountConfiguration",
                PropertyDictionary{{"CalDAV_PrincipalPath_Key", "/calendar/dav/jo/user"}});
  const MigratedInMemory migrated({.settings = accountSettings(4, {gmail, calendars})});
  EXPECT_THAT(migrated.fates(), ElementsAre("Accounts[0] changed", "Accounts[1] joined"));
}

TEST(Fates, TheOnDeviceAccountIsMadeAnew) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(2, {accountWithHost("DeviceLocalAccount", kOnMyDeviceAccountType,
                                                       "DeviceLocalAccount")})});
  EXPECT_THAT(migrated.fates(), ElementsAre("Accounts[0] rebuilt"));
}

TEST(Fates, WhatAnEarlierRunCarriedOverIsFoundByIdentifierChildrenIncluded) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(
           12, {accountWithHost("Q", kQuarxAccountType, "X").withChildren({hosted("A")})}),
       .mail = mailStore({mailDescription("A", kVelmoraAccountClass)}),
       .hasSentinel = true});
  EXPECT_THAT(migrated.fates(),
              ElementsAre("MailAccounts[0] carriedOverEarlier", "Accounts[0] kept",
                          "Accounts[0].ChildAccounts[0] kept"));
}

TEST(Fates, WhatAnEarlierRunCarriedOverWithoutAnIdentifierIsFoundByItsValues) {
  const PropertyDictionary account =
      accountWithHost("fresh", kMailAccountType, kIMAPAccountClass).with("Password", "of A");
  const MigratedInMemory migrated(
      {.settings = accountSettings(12, {AccountDictionary(account).without("Hostname")}),
       .mail = mailStore({mailDescription("A", kIMAPAccountClass).without(kLegacyMailIdentifier)}),
       .hasSentinel = true});
  EXPECT_THAT(migrated.losses(), IsEmpty());
}

TEST(DeviceFacts, SayWhetherTheDeviceHasTheOldestProcessor) {
  FakePlatform device;
  EXPECT_FALSE(factsOf(device.platform).hasOldestProcessor);
  device.deviceInfoService.answers.insert_or_assign("CPUArchitecture", "armv7");
  EXPECT_FALSE(factsOf(device.platform).hasOldestProcessor);
  device.deviceInfoService.answers.insert_or_assign("CPUArchitecture", "armv6");
  EXPECT_TRUE(factsOf(device.platform).hasOldestProcessor);
}

TEST(Fates, OtherContentsAreListedAsLeftBehind) {
  PropertyDictionary file = accountSettings(12, {});
  file.set("Other", 1);
  const MigratedInMemory migrated({.settings = file});
  EXPECT_THAT(migrated.losses(), IsEmpty());
  ASSERT_EQ(migrated.ledger().leftBehind.size(), 1u);
  EXPECT_EQ(migrated.ledger().leftBehind.front().key, "Other");
}

}  // namespace
}  // namespace accounts
