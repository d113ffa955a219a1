#include "tests/accountsctl/FindingsFixture.h"

namespace accounts {
namespace {

using SettingsFindings = FindingsFixture;

TEST_F(SettingsFindings, AFileAsItShouldBeHasNone) {
  EXPECT_EQ(
      found({mail("A"), anAccount("B", "Exchange", "ExchangeAccount").withChildren({mail("C")})}),
      Lines{});
}

TEST_F(SettingsFindings, AMissingVersionIsNoted) {
  EXPECT_EQ(linesOf(findingsInSettings({{"Accounts", PropertyArray{}}})),
            Lines{"file noted missingVersion"});
  EXPECT_EQ(
      linesOf(findingsInSettings({{"Accounts", PropertyArray{}}, {"Version", PropertyArray{}}})),
      Lines{"file noted missingVersion"});
}

TEST_F(SettingsFindings, AnOldOrNewVersionIsNoted) {
  const auto ofVersion = [](int version) {
    return linesOf(findingsInSettings({{"Accounts", PropertyArray{}}, {"Version", version}}));
  };
  EXPECT_EQ(ofVersion(11), Lines{"file noted oldVersion"});
  EXPECT_EQ(ofVersion(12), Lines{});
  EXPECT_EQ(ofVersion(13), Lines{"file noted newVersion"});
  EXPECT_EQ(ofVersion(-1), Lines{"file noted newVersion"});
}

TEST_F(SettingsFindings, AccountsThatAreNoArrayAreNoted) {
  EXPECT_EQ(linesOf(findingsInSettings({{"Version", 12}, {"Accounts", "text"}})),
            Lines{"file noted noAccounts"});
}

TEST_F(SettingsFindings, OtherKeysOfTheRootAreDropped) {
  EXPECT_EQ(
      linesOf(findingsInSettings({{"Version", 12}, {"Accounts", PropertyArray()}, {"Extra", 1}})),
      Lines{"file dropped unknownKey"});
}

TEST_F(SettingsFindings, AnElementThatIsNoDictionaryIsDropped) {
  EXPECT_EQ(found({mail("A"), "stray"}), Lines{"2 dropped noDictionary"});
}

TEST_F(SettingsFindings, AnUnknownTypeOrAMissingClassDropsAnAccount) {
  EXPECT_EQ(found({anAccount("A", "Pigeon", "C")}), Lines{"1 dropped unknownType"});
  EXPECT_EQ(found({mail("A").without("Type")}), Lines{"1 dropped missingType"});
  EXPECT_EQ(found({mail("A").without("Class")}), Lines{"1 dropped missingClass"});
  EXPECT_EQ(found({mail("A").with("Class", "")}), Lines{"1 dropped missingClass"});
  EXPECT_EQ(found({anAccount("A", "Pigeon", "")}),
            (Lines{"1 dropped unknownType", "1 dropped missingClass"}));
}

TEST_F(SettingsFindings, ChildrenOfADroppedAccountAreDroppedWithIt) {
  EXPECT_EQ(found({anAccount("A", "Pigeon", "C").withChildren({mail("B")})}),
            (Lines{"1 dropped unknownType", "1.1 dropped orphaned"}));
}

TEST_F(SettingsFindings, AChildThatIsNoAccountIsIgnored) {
  const PropertyDictionary parent =
      anAccount("P", "Exchange", "ExchangeAccount")
          .withChildren({anAccount("A", "Pigeon", "C"), "stray", mail("B")});

  EXPECT_EQ(found({parent}), (Lines{"1.1 ignored unknownType", "1.2 ignored noDictionary"}));
}

TEST_F(SettingsFindings, ChildrenOfAChildAreIgnored) {
  const PropertyDictionary child = mail("C").withChildren({mail("G")});

  EXPECT_EQ(found({anAccount("P", "Exchange", "ExchangeAccount").withChildren({child})}),
            Lines{"1.1 ignored childrenOfChild"});
}

TEST_F(SettingsFindings, AMissingIdentifierIsRepaired) {
  EXPECT_EQ(found({mail("A").without("Identifier")}), Lines{"1 repaired missingIdentifier"});
  EXPECT_EQ(found({mail("A").with("Identifier", 5)}), Lines{"1 repaired missingIdentifier"});
}

TEST_F(SettingsFindings, AMailAccountOfAWrongClassIsRepairedOrDropped) {
  const PropertyDictionary wrong = anAccount("A", "Mail", "BrokenAccount");

  EXPECT_EQ(found({AccountDictionary(wrong).with("AccountPath", "/Library/Mail/POP-somewhere")}),
            Lines{"1 repaired wrongClass"});
  EXPECT_EQ(found({wrong}), Lines{"1 dropped unfixableClass"});
  EXPECT_EQ(found({anAccount("A", "CalDAV", "BrokenAccount")}), Lines{});
}

TEST_F(SettingsFindings, AValueOfTheWrongKindIsIgnored) {
  EXPECT_EQ(found({mail("A").with("DisplayName", 5)}), Lines{"1 ignored wrongKind"});
  EXPECT_EQ(found({mail("A").with("ChildAccounts", "text")}), Lines{"1 ignored wrongKind"});
  EXPECT_EQ(found({mail("A").with("Unheard of", 5)}), Lines{});
}

TEST_F(SettingsFindings, OfAccountsWithOneIdentifierTheLastIsFound) {
  EXPECT_EQ(found({mail("A"), mail("B"), mail("A"), mail("A")}),
            (Lines{"1 ignored duplicateIdentifier", "3 ignored duplicateIdentifier"}));
}

TEST_F(SettingsFindings, AChildWithTheIdentifierOfATopLevelAccountIsNotFound) {
  EXPECT_EQ(
      found({mail("A"), anAccount("P", "Exchange", "ExchangeAccount").withChildren({mail("A")})}),
      Lines{"2.1 ignored duplicateIdentifier"});
}

TEST_F(SettingsFindings, OfChildrenWithOneIdentifierTheLastIsFound) {
  EXPECT_EQ(
      found({anAccount("P", "Exchange", "ExchangeAccount").withChildren({mail("A"), mail("A")})}),
      Lines{"1.1 ignored duplicateIdentifier"});
}

TEST_F(SettingsFindings, ADroppedAccountTakesNoIdentifier) {
  EXPECT_EQ(found({mail("A"), anAccount("A", "Pigeon", "C")}), Lines{"2 dropped unknownType"});
}

TEST_F(SettingsFindings, ManyAccountsWithOneIdentifierAreLookedAtToo) {
  const PropertyArray many(std::vector<PropertyValue>(3000, mail("A")));

  EXPECT_EQ(found(many).size(), 2999U);
}

TEST_F(SettingsFindings, AFindingNamesTheAccountAndSaysWhy) {
  const std::vector<Finding> findings = findingsInSettings(
      accountSettings(12, {anAccount("A", "Pigeon", "C").with("DisplayName", "Loft")}));

  ASSERT_EQ(findings.size(), 1U);
  EXPECT_EQ(findings[0].title, "Pigeon 'Loft'");
  EXPECT_EQ(findings[0].identifier, Text("A"));
  EXPECT_EQ(findings[0].text, "The type 'Pigeon' is unknown");
}

}  // namespace
}  // namespace accounts
