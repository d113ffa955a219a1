#include "tests/accountsctl/FindingsFixture.h"

namespace accounts {
namespace {

using LegacyFindings = FindingsFixture;

AccountDictionary incoming(std::string_view accountClass) {
  return aMailDescription("A", accountClass);
}

TEST_F(LegacyFindings, StoresAsTheyShouldBeHaveNone) {
  EXPECT_EQ(linesOf(findingsInMailStore(
                {{"MailAccounts", PropertyArray{incoming("IMAPAccount")}},
                 {"DeliveryAccounts", PropertyArray{PropertyDictionary{{"uniqueId", "B"}}}}})),
            Lines{});
  EXPECT_EQ(linesOf(findingsInExchangeStore(
                {{"DAAccountsKey", PropertyArray{PropertyDictionary{
                                       {"DAAccountConfigurationClass", "ExchangeAccount"},
                                       {"DAAccountConfigurationAccountID", "C"}}}}})),
            Lines{});
}

TEST_F(LegacyFindings, ADescriptionThatCannotBeConvertedIsRefused) {
  EXPECT_EQ(linesOf(findingsInMailStore(
                {{"MailAccounts", PropertyArray{incoming("IMAPAccount"),
                                                PropertyDictionary{{"uniqueId", "B"}}, "stray"}}})),
            (Lines{"MailAccounts 2 refused missingClass", "MailAccounts 3 refused noDictionary"}));
  EXPECT_EQ(
      linesOf(findingsInExchangeStore({{"DAAccountsKey", PropertyArray{PropertyDictionary{}}}})),
      Lines{"DAAccountsKey 1 refused missingClass"});
}

TEST_F(LegacyFindings, AConvertedAccountThatTheStoreWouldDropIsFound) {
  EXPECT_EQ(
      linesOf(findingsInMailStore({{"MailAccounts", PropertyArray{incoming("StrangeAccount")}}})),
      Lines{"MailAccounts 1 dropped unfixableClass"});
}

TEST_F(LegacyFindings, AMissingIdentifierIsRepaired) {
  EXPECT_EQ(
      linesOf(findingsInMailStore(
          {{"MailAccounts", PropertyArray{PropertyDictionary{{"AccountType", "IMAPAccount"}}}}})),
      Lines{"MailAccounts 1 repaired missingIdentifier"});
}

TEST_F(LegacyFindings, WhatStandsBesideTheAccountsIsDropped) {
  EXPECT_EQ(linesOf(findingsInMailStore({{"MailAccounts", PropertyArray{}}, {"Other", 1}})),
            Lines{"file dropped unknownKey"});
}

}  // namespace
}  // namespace accounts
