#include <gtest/gtest.h>

#include "propertylist/SecretKeys.h"

namespace accounts {
namespace {

TEST(SecretKeys, NamesOfPasswordsAndTokensAreSecretHoweverTheyAreSpelt) {
  for (const char* key :
       {"Password", "password", "SMTP PASSWORD", "Pass-Word", "account_passwd", "Passphrase",
        "PassCode", "OAuthToken", "OAuth Token Secret", "ClientSecret", "Credentials", "API Key",
        "Access-Key", "PrivateKey", "Authorization", "Session Cookie", "2nd_Password2"}) {
    EXPECT_TRUE(isSecretKey(key)) << key;
  }
}

TEST(SecretKeys, OtherNamesAreNot) {
  for (const char* key : {"", "Username", "Identifier", "Hostname", "AuthenticationScheme", "Pass",
                          "Key", "IsPrimary", "Wortpass"}) {
    EXPECT_FALSE(isSecretKey(key)) << key;
  }
}

TEST(SecretKeys, ASecretIsHiddenWhateverItsDepth) {
  const PropertyValue value = PropertyDictionary{
      {"Accounts", PropertyArray{PropertyDictionary{{"Password", "x"}, {"Username", "u"}}}}};

  EXPECT_EQ(withSecretsHidden(value),
            PropertyValue(PropertyDictionary{
                {"Accounts",
                 PropertyArray{PropertyDictionary{{"Password", "(hidden)"}, {"Username", "u"}}}}}));
}

TEST(SecretKeys, SeveralSecretsOfOneContainerAreAllHidden) {
  const PropertyDictionary account = {{"Password", "x"}, {"Token", "y"}};
  const PropertyDictionary hidden = {{"Password", "(hidden)"}, {"Token", "(hidden)"}};

  EXPECT_EQ(withSecretsHidden(PropertyArray{account, account}),
            PropertyValue(PropertyArray{hidden, hidden}));
}

TEST(SecretKeys, SecretsOfEveryTellingKindAreHidden) {
  for (const PropertyValue& value :
       {PropertyValue("x"), PropertyValue(1234), PropertyValue(0.5),
        PropertyValue(PropertyData("x")), PropertyValue(PropertyArray{"x"}),
        PropertyValue(PropertyDictionary{{"a", "x"}})}) {
    EXPECT_EQ(withSecretsHidden("Password", value), PropertyValue("(hidden)"));
    EXPECT_EQ(withSecretsHidden("Username", value), value);
  }
}

TEST(SecretKeys, WhatGivesNothingAwayIsNotHidden) {
  for (const PropertyValue& value :
       {PropertyValue(true), PropertyValue(PropertyDate{1}), PropertyValue(""),
        PropertyValue(PropertyData()), PropertyValue(PropertyArray{}),
        PropertyValue(PropertyDictionary{})}) {
    EXPECT_EQ(withSecretsHidden("UsesPassword", value), value);
  }
}

TEST(SecretKeys, AValueWithoutSecretsStaysTheSameInMemory) {
  const PropertyDictionary dictionary = {{"Username", "u"}, {"List", PropertyArray{"Password"}}};

  EXPECT_TRUE(withSecretsHidden(dictionary).asDictionary()->isSameAs(dictionary));
}

TEST(SecretKeys, HidingLeavesTheOriginalAsItWas) {
  const PropertyDictionary dictionary = {{"Password", "x"}};

  (void)withSecretsHidden(dictionary);

  EXPECT_EQ(dictionary.textForKey("Password"), Text("x"));
}

}  // namespace
}  // namespace accounts
