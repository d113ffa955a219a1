// What a migration does not carry over, rule by rule. tests/program/LossesTest.cpp has the same
// losses in the words of the program.

#include "tests/ledger/LedgerFixture.h"

namespace accounts {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::UnorderedElementsAre;

const std::string kOfSettings = " of " + std::string(kSettingsPath) + ": ";

AccountDictionary calDAV(std::string_view identifier) {
  return accountWithHost(identifier, kCalDAVAccountType, "CalDAVAccount");
}
AccountDictionary mail(std::string_view identifier) {
  return accountWithHost(identifier, kMailAccountType, kIMAPAccountClass);
}

TEST(Losses, AnAccountOfAnUnknownType) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(12, {accountWithHost("A", "Unknown", "X"), calDAV("B")})});
  EXPECT_THAT(migrated.losses(),
              ElementsAre("Accounts[0] (identifier A)" + kOfSettings + "its type is unknown"));
  EXPECT_THAT(migrated.fates(), ElementsAre("Accounts[0] notCarriedOver", "Accounts[1] kept"));
}

TEST(Losses, AnAccountWithoutATypeOrWithOneThatIsNoText) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(
           12, {calDAV("A").without(kAccountType), calDAV("B").with(kAccountType, 7)})});
  EXPECT_THAT(migrated.losses(),
              ElementsAre(EndsWith(": it has no type"), EndsWith(": it has no type")));
}

TEST(Losses, AnAccountWithoutAClassOrWithOneThatIsEmptyOrNoText) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(
           12, {calDAV("A").without(kAccountClass), calDAV("B").with(kAccountClass, ""),
                calDAV("C").with(kAccountClass, 7)})});
  EXPECT_THAT(migrated.losses(),
              ElementsAre(EndsWith(": it has no class"), EndsWith(": it has no class"),
                          EndsWith(": it has no class")));
}

TEST(Losses, AMailAccountWhoseClassNothingTells) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(12, {accountWithHost("A", kMailAccountType, "Odd")})});
  EXPECT_THAT(migrated.losses(),
              ElementsAre(EndsWith("nothing tells the class of the mail account")));
}

TEST(Losses, AnElementThatIsNoDictionary) {
  const MigratedInMemory migrated({.settings = accountSettings(12, {"text", calDAV("B")})});
  EXPECT_THAT(migrated.losses(), ElementsAre("Accounts[0]" + kOfSettings + "it is no dictionary"));
}

TEST(Losses, AccountsThatAreNoArray) {
  const MigratedInMemory migrated(
      {.settings = PropertyDictionary{
           {kPlistVersionKey, 12}, {kPlistAccountsKey, PropertyDictionary{{"A", calDAV("A")}}}}});
  EXPECT_THAT(migrated.losses(), ElementsAre(EndsWith("its \"Accounts\" is no array")));
}

TEST(Losses, TheChildrenOfAnAccountThatIsDropped) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(
           12, {accountWithHost("A", "Unknown", "X").withChildren({calDAV("C")})})});
  EXPECT_THAT(migrated.losses(), ElementsAre(EndsWith(": its type is unknown"),
                                             "Accounts[0].ChildAccounts[0] (identifier C)" +
                                                 kOfSettings + "its parent was not carried over"));
}

TEST(Losses, AllButTheLastOfSeveralWithOneIdentifier) {
  PropertyArray accounts;
  for (const char* host : {"a", "b", "c"}) {
    accounts.append(calDAV("D").with("Hostname", host));
  }
  const MigratedInMemory migrated({.settings = accountSettings(12, accounts)});
  EXPECT_THAT(migrated.lost(), ElementsAre("Accounts[0]", "Accounts[1]"));
  EXPECT_THAT(migrated.losses(),
              Contains(EndsWith(": its \"Hostname\" gave way to another value; another account has "
                                "its identifier"))
                  .Times(2));
}

TEST(Losses, AccountsOfSettingsBesideAnEmptyMailStore) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(
           12, {mail("A"), calDAV("B"), accountWithHost("C", kSMTPAccountType, "X")}),
       .mail = mailStore({})});
  EXPECT_THAT(migrated.lost(), ElementsAre("Accounts[0]", "Accounts[2]"));
  EXPECT_THAT(migrated.losses(), Contains(HasSubstr("all accounts of its type gave way to others "
                                                    "(_migrateMailAccounts:)"))
                                     .Times(2));
}

TEST(Losses, AccountsOfSettingsBesideAnEmptyExchangeStore) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(12, {accountWithHost("A", kExchangeAccountType, "X")}),
       .exchange = exchangeStore({})});
  EXPECT_THAT(migrated.lost(), ElementsAre("Accounts[0]"));
}

TEST(Losses, OneOfTwoDescriptionsWithOneIdentifierInAStore) {
  const MigratedInMemory migrated(
      {.mail = mailStore({mailDescription("A", kIMAPAccountClass),
                          mailDescription("A", kIMAPAccountClass).with("Password", "x")})});
  EXPECT_THAT(migrated.losses(),
              ElementsAre("MailAccounts[1] \"Name of A\" (identifier A) of " +
                          std::string(kLegacyMailPath) +
                          ": its \"Password\" gave way to another value; another account has its "
                          "identifier"));
}

TEST(Losses, OneIdentifierInBothStores) {
  const MigratedInMemory migrated({.mail = mailStore({mailDescription("A", kIMAPAccountClass)}),
                                   .exchange = exchangeStore({exchangeDescription("A")})});
  EXPECT_THAT(migrated.lost(), testing::SizeIs(1));
}

TEST(Losses, ADescriptionWhoseIdentifierIsInTheSettingsFile) {
  const MigratedInMemory migrated({.settings = accountSettings(12, {calDAV("A")}),
                                   .mail = mailStore({mailDescription("A", kIMAPAccountClass)})});
  EXPECT_THAT(migrated.lost(), Contains("MailAccounts[0]"));
}

TEST(Losses, ADescriptionWhoseIdentifierIsThatOfAChild) {
  const MigratedInMemory migrated(
      {.settings = accountSettings(12, {accountWithHost("Q", kQuarxAccountType, kCloudAccountClass)
                                            .withChildren({calDAV("A")})}),
       .mail = mailStore({mailDescription("A", kIMAPAccountClass)})});
  EXPECT_THAT(migrated.lost(), Contains("MailAccounts[0]"));
}

TEST(Losses, AnAccountArrayOfAStoreThatIsNoArray) {
  const MigratedInMemory migrated(
      {.mail = PropertyDictionary{{kLegacyIncomingAccounts, PropertyDictionary{{"A", 1}}}}});
  EXPECT_THAT(migrated.losses(),
              ElementsAre(std::string(kLegacyMailPath) +
                          " holds accounts in an unknown form: its \"MailAccounts\" is no "
                          "array"));
}

TEST(Losses, ADescriptionThatTheConversionRefusesWithAllOthersOfItsStore) {
  const MigratedInMemory migrated(
      {.mail = mailStore({mailDescription("A", kIMAPAccountClass),
                          mailDescription("B", "").without(kLegacyMailClass)},
                         {mailDescription("C", kSMTPAccountClass)})});
  EXPECT_THAT(migrated.lost(),
              UnorderedElementsAre("DeliveryAccounts[0]", "MailAccounts[0]", "MailAccounts[1]"));
  EXPECT_THAT(migrated.losses(), Contains(EndsWith(": it has no class")));
  EXPECT_THAT(migrated.losses(), Contains(EndsWith("so the store stays out as a whole")).Times(2));
}

TEST(Losses, AKeyOfADescriptionThatAnotherKeyReplaces) {
  const MigratedInMemory migrated(
      {.mail =
           mailStore({mailDescription("A", kIMAPAccountClass).with(kAccountClass, "Odd"),
                      mailDescription("B", kIMAPAccountClass).with(kAccountIdentifier, "other")})});
  EXPECT_THAT(migrated.losses(),
              ElementsAre(EndsWith("its \"Class\" gave way to the value under \"AccountType\""),
                          EndsWith("its \"Identifier\" gave way to the value under \"uniqueId\"")));
}

TEST(Losses, AnOutgoingDescriptionOfAMailClassIsConvertedAndRemovedAgain) {
  const MigratedInMemory migrated(
      {.mail = mailStore({}, {mailDescription("OUT", kIMAPAccountClass)})});
  EXPECT_THAT(migrated.lost(), ElementsAre("DeliveryAccounts[0]"));
}

TEST(Losses, TheChildOfACalendarAccountThatIsJoined) {
  const PropertyDictionary gmail =
      accountWithHost("G", kMailAccountType, kGmailAccountClass).with(kAccountUsername, "jo");
  PropertyDictionary calendars =
      accountWithHost("K", kCalDAVAccountType, kCalDAVAccountClass)
          .with("CalDAVPrincipalConfiguration",
                PropertyDictionary{{"Login_Key", "jo"}, {"CalDAV_Server_Key", "www.google.com"}})
          .with("CalDAVAccountConfiguration",
                PropertyDictionary{{"CalDAV_PrincipalPath_Key", "/calendar/dav/jo/user"}});
  calendars.set(kAccountChildAccounts, PropertyArray{calDAV("C")});
  EXPECT_THAT(MigratedInMemory({.settings = accountSettings(4, {gmail, calendars})}).losses(),
              ElementsAre(EndsWith(": its parent was joined into another account")));
}

TEST(Losses, ADescriptionThatAnEarlierRunDidNotCarryOver) {
  const MigratedInMemory migrated({.settings = accountSettings(12, {calDAV("B")}),
                                   .mail = mailStore({mailDescription("A", kIMAPAccountClass)}),
                                   .hasSentinel = true});
  EXPECT_THAT(migrated.losses(), ElementsAre(HasSubstr("it is not in the settings file")));
}

}  // namespace
}  // namespace accounts
