#include "tests/accountsctl/FindingsFixture.h"

namespace accounts {
namespace {

using SettingsFindings = FindingsFixture;

TEST_F(SettingsFindings, AFileAsItShouldBeHasNone) {
  EXPECT_EQ(found({mail("A"), with(account("Exchange", "ExchangeAccount", "B"), "ChildAccounts",
                                   PropertyArray{mail("C")})}),
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
  EXPECT_EQ(linesOf(findingsInSettings(with(settings({}), "Extra", 1))),
            Lines{"file dropped unknownKey"});
}

TEST_F(SettingsFindings, AnElementThatIsNoDictionaryIsDropped) {
  EXPECT_EQ(found({mail("A"), "stray"}), Lines{"2 dropped noDictionary"});
}

TEST_F(SettingsFindings, AnUnknownTypeOrAMissingClassDropsAnAccount) {
  EXPECT_EQ(found({account("Pigeon", "C", "A")}), Lines{"1 dropped unknownType"});
  EXPECT_EQ(found({without(mail("A"), "Type")}), Lines{"1 dropped missingType"});
  EXPECT_EQ(found({without(mail("A"), "Class")}), Lines{"1 dropped missingClass"});
  EXPECT_EQ(found({with(mail("A"), "Class", "")}), Lines{"1 dropped missingClass"});
  EXPECT_EQ(found({account("Pigeon", "", "A")}),
            (Lines{"1 dropped unknownType", "1 dropped missingClass"}));
}

TEST_F(SettingsFindings, ChildrenOfADroppedAccountAreDroppedWithIt) {
  EXPECT_EQ(found({with(account("Pigeon", "C", "A"), "ChildAccounts", PropertyArray{mail("B")})}),
            (Lines{"1 dropped unknownType", "1.1 dropped orphaned"}));
}

TEST_F(SettingsFindings, AChildThatIsNoAccountIsIgnored) {
  const PropertyDictionary parent =
      with(account("Exchange", "ExchangeAccount", "P"), "ChildAccounts",
           PropertyArray{account("Pigeon", "C", "A"), "stray", mail("B")});

  EXPECT_EQ(found({parent}), (Lines{"1.1 ignored unknownType", "1.2 ignored noDictionary"}));
}

TEST_F(SettingsFindings, ChildrenOfAChildAreIgnored) {
  const PropertyDictionary child = with(mail("C"), "ChildAccounts", PropertyArray{mail("G")});

  EXPECT_EQ(found({with(account("Exchange", "ExchangeAccount", "P"), "ChildAccounts",
                        PropertyArray{child})}),
            Lines{"1.1 ignored childrenOfChild"});
}

TEST_F(SettingsFindings, AMissingIdentifierIsRepaired) {
  EXPECT_EQ(found({without(mail("A"), "Identifier")}), Lines{"1 repaired missingIdentifier"});
  EXPECT_EQ(found({with(mail("A"), "Identifier", 5)}), Lines{"1 repaired missingIdentifier"});
}

TEST_F(SettingsFindings, AMailAccountOfAWrongClassIsRepairedOrDropped) {
  const PropertyDictionary wrong = account("Mail", "BrokenAccount", "A");

  EXPECT_EQ(found({with(wrong, "AccountPath", "/Library/Mail/POP-somewhere")}),
            Lines{"1 repaired wrongClass"});
  EXPECT_EQ(found({wrong}), Lines{"1 dropped unfixableClass"});
  EXPECT_EQ(found({account("CalDAV", "BrokenAccount", "A")}), Lines{});
}

TEST_F(SettingsFindings, AValueOfTheWrongKindIsIgnored) {
  EXPECT_EQ(found({with(mail("A"), "DisplayName", 5)}), Lines{"1 ignored wrongKind"});
  EXPECT_EQ(found({with(mail("A"), "ChildAccounts", "text")}), Lines{"1 ignored wrongKind"});
  EXPECT_EQ(found({with(mail("A"), "Unheard of", 5)}), Lines{});
}

TEST_F(SettingsFindings, OfAccountsWithOneIdentifierTheLastIsFound) {
  EXPECT_EQ(found({mail("A"), mail("B"), mail("A"), mail("A")}),
            (Lines{"1 ignored duplicateIdentifier", "3 ignored duplicateIdentifier"}));
}

TEST_F(SettingsFindings, AChildWithTheIdentifierOfATopLevelAccountIsNotFound) {
  EXPECT_EQ(found({mail("A"), with(account("Exchange", "ExchangeAccount", "P"), "ChildAccounts",
                                   PropertyArray{mail("A")})}),
            Lines{"2.1 ignored duplicateIdentifier"});
}

TEST_F(SettingsFindings, OfChildrenWithOneIdentifierTheLastIsFound) {
  EXPECT_EQ(found({with(account("Exchange", "ExchangeAccount", "P"), "ChildAccounts",
                        PropertyArray{mail("A"), mail("A")})}),
            Lines{"1.1 ignored duplicateIdentifier"});
}

TEST_F(SettingsFindings, ADroppedAccountTakesNoIdentifier) {
  EXPECT_EQ(found({mail("A"), account("Pigeon", "C", "A")}), Lines{"2 dropped unknownType"});
}

TEST_F(SettingsFindings, ManyAccountsWithOneIdentifierAreLookedAtToo) {
  std::vector<PropertyValue> many(3000, mail("A"));

  EXPECT_EQ(found(std::move(many)).size(), 2999U);
}

TEST_F(SettingsFindings, AFindingNamesTheAccountAndSaysWhy) {
  const std::vector<Finding> findings =
      findingsInSettings(settings({with(account("Pigeon", "C", "A"), "DisplayName", "Loft")}));

  ASSERT_EQ(findings.size(), 1U);
  EXPECT_EQ(findings[0].title, "Pigeon 'Loft'");
  EXPECT_EQ(findings[0].identifier, Text("A"));
  EXPECT_EQ(findings[0].text, "The type 'Pigeon' is unknown");
}

}  // namespace
}  // namespace accounts
