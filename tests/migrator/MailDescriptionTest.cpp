#include <array>

#include "migrator/LegacyDescriptions.h"
#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

class MailDescriptionTest : public MigratorTest {
 protected:
  PropertyDictionary incoming(const PropertyDictionary& description) {
    return accountPropertiesOfMailDescription(description, kMailAccountType);
  }
  BasicAccountReference convertIncoming(const PropertyDictionary& description) {
    return migrator._convertMailAccountDescription_type(description, kMailAccountType);
  }
};

struct ClassRow {
  std::string_view accountClass;
  std::string_view type;
  std::string_view typeString;
};

TEST_F(MailDescriptionTest, EachClassHasItsTypeAndTypeStrings) {
  const std::array<ClassRow, 13> rows = {{
      {"GmailAccount", "Gmail", "Gmail"},
      {"MarrowAccount", "Velmora", "Velmora"},
      {"VelmoraAccount", "Velmora", "Velmora"},
      {"TolvaneIMAPAccount", "TolvaneIMAP", "Stratix"},
      {"YahooAccount", "Yahoo", "Yahoo!\u200E"},
      {"DAMailAccount", "Exchange", "Exchange ActiveSync"},
      {"DeliveryAccount", "SMTP", "Account"},
      {"SMTPAccount", "SMTP", "Account"},
      {"IMAPAccount", "Mail", "Account"},
      {"POPAccount", "Mail", "Account"},
      {"AOLAccount", "Mail", "Account"},
      {"MailAccount", "Mail", "Account"},
      {"gmailaccount", "Mail", "Account"},
  }};
  for (const ClassRow& row : rows) {
    SCOPED_TRACE(row.accountClass);
    EXPECT_EQ(Migrator::_accountTypeForMailAccountClass(row.accountClass), row.type);
    EXPECT_EQ(Migrator::_accountTypeStringForMailAccountClass(row.accountClass), row.typeString);
    EXPECT_EQ(Migrator::_accountShortTypeStringForMailAccountClass(row.accountClass),
              row.typeString);
  }
}

TEST_F(MailDescriptionTest, LegacyKeysMoveAndEveryOtherKeyIsCarriedOver) {
  const PropertyDictionary properties = incoming({{"AccountType", "IMAPAccount"},
                                                  {"AccountName", "Work"},
                                                  {"uniqueId", "M"},
                                                  {"Hostname", "mail.example"},
                                                  {"Port", 993}});

  EXPECT_EQ(properties, (PropertyDictionary{{"Class", "IMAPAccount"},
                                            {"DisplayName", "Work"},
                                            {"Identifier", "M"},
                                            {"Hostname", "mail.example"},
                                            {"Port", 993},
                                            {"Type", "Mail"},
                                            {"Type String", "Account"},
                                            {"Short Type String", "Account"}}));
}

TEST_F(MailDescriptionTest, AValueUnderALegacyKeyTakesThePlaceOfOneUnderTheNewKey) {
  const PropertyDictionary properties = incoming({{"AccountType", "IMAPAccount"},
                                                  {"Class", "YahooAccount"},
                                                  {"AccountName", "Work"},
                                                  {"DisplayName", "Home"},
                                                  {"uniqueId", "M"},
                                                  {"Identifier", "N"}});

  EXPECT_EQ(properties.textForKey(kAccountClass), "IMAPAccount");
  EXPECT_EQ(properties.textForKey(kAccountDisplayName), "Work");
  EXPECT_EQ(properties.textForKey(kAccountIdentifier), "M");
}

TEST_F(MailDescriptionTest, GmailIsGmailWhereTheRegionSaysNo) {
  device.deviceInfoService.answers.insert_or_assign("RegionalBehaviorGoogleMail", false);

  EXPECT_EQ(AccountsDataMigrator::_accountTypeStringForMailAccountClass("GmailAccount"), "Gmail");
}

TEST_F(MailDescriptionTest, GmailIsGoogleMailWhereTheRegionSaysSo) {
  device.deviceInfoService.answers.insert_or_assign("RegionalBehaviorGoogleMail", true);

  const PropertyDictionary properties = incoming({{"AccountType", "GmailAccount"}});

  EXPECT_EQ(properties.textForKey(kAccountType), kGmailAccountType);
  EXPECT_EQ(properties.textForKey(kAccountTypeString), "Google Mail");
  EXPECT_EQ(properties.textForKey(kAccountShortTypeString), "Google Mail");
}

TEST_F(MailDescriptionTest, GmailIsGmailWhereTheRegionsAnswerHasNoBooleanValue) {
  device.deviceInfoService.answers.insert_or_assign("RegionalBehaviorGoogleMail",
                                                    PropertyDictionary());

  EXPECT_EQ(AccountsDataMigrator::_accountTypeStringForMailAccountClass("GmailAccount"), "Gmail");
}

TEST_F(MailDescriptionTest, GmailIsGmailWithoutAnAnswerOfTheRegion) {
  const PropertyDictionary properties = incoming({{"AccountType", "GmailAccount"}});

  EXPECT_EQ(properties.textForKey(kAccountType), kGmailAccountType);
  EXPECT_EQ(properties.textForKey(kAccountTypeString), "Gmail");
  EXPECT_EQ(properties.textForKey(kAccountShortTypeString), "Gmail");
}

TEST_F(MailDescriptionTest, TheRegionIsAskedOnceAndOnlyForGmail) {
  incoming({{"AccountType", "IMAPAccount"}});
  EXPECT_TRUE(device.deviceInfoService.questions.empty());

  incoming({{"AccountType", "GmailAccount"}});
  incoming({{"AccountType", "GmailAccount"}});
  EXPECT_EQ(device.deviceInfoService.questions, Lines{"RegionalBehaviorGoogleMail"});
}

TEST_F(MailDescriptionTest, AnOutgoingDescriptionWithoutAClassIsAnSMTPAccount) {
  EXPECT_EQ(accountPropertiesOfMailDescription({{"Hostname", "smtp.example"}}, kSMTPAccountType),
            (PropertyDictionary{{"Hostname", "smtp.example"},
                                {"Class", "SMTPAccount"},
                                {"Type", "SMTP"},
                                {"Type String", "Account"},
                                {"Short Type String", "Account"}}));
}

TEST_F(MailDescriptionTest, AnOutgoingClassOfTheWrongKindReadsAsAbsent) {
  const PropertyDictionary properties =
      accountPropertiesOfMailDescription({{"AccountType", 7}}, kSMTPAccountType);

  EXPECT_EQ(properties.textForKey(kAccountClass), "SMTPAccount");
}

TEST_F(MailDescriptionTest, AnIncomingDescriptionWithoutAClassKeepsItsTypeAndGetsNoTypeStrings) {
  EXPECT_EQ(incoming({{"Hostname", "mail.example"}}),
            (PropertyDictionary{{"Hostname", "mail.example"}, {"Type", "Mail"}}));
}

TEST_F(MailDescriptionTest, AnIncomingDescriptionWithoutAClassMakesNoRecord) {
  EXPECT_EQ(convertIncoming({{"Hostname", "mail.example"}}), nullptr);
}

TEST_F(MailDescriptionTest, AnIncomingDescriptionMayCarryAClassOfItsOwn) {
  const BasicAccountReference record = convertIncoming({{"Class", "YahooAccount"}});

  ASSERT_NE(record, nullptr);
  EXPECT_EQ(record->type(), kYahooAccountType);
}

TEST_F(MailDescriptionTest, AnEmptyClassMakesNoRecord) {
  EXPECT_EQ(convertIncoming({{"AccountType", ""}}), nullptr);
  EXPECT_EQ(migrator._convertMailAccountDescription_type({{"AccountType", ""}}, kSMTPAccountType),
            nullptr);
}

TEST_F(MailDescriptionTest, AHostedServiceAddressIsCutToTheUserName) {
  EXPECT_EQ(incoming({{"AccountType", "VelmoraAccount"}, {"Username", "jdoe@velmora.example@x"}})
                .textForKey(kAccountUsername),
            "jdoe");
  EXPECT_EQ(incoming({{"AccountType", "MarrowAccount"}, {"Username", "jdoe@marrow.example"}})
                .textForKey(kAccountUsername),
            "jdoe");
}

TEST_F(MailDescriptionTest, AHostedServiceUserNameWithoutADomainIsLeft) {
  EXPECT_EQ(incoming({{"AccountType", "VelmoraAccount"}, {"Username", "jdoe"}})
                .textForKey(kAccountUsername),
            "jdoe");
}

TEST_F(MailDescriptionTest, AnAddressOfAnotherServiceIsNotCut) {
  EXPECT_EQ(incoming({{"AccountType", "IMAPAccount"}, {"Username", "jdoe@host"}})
                .textForKey(kAccountUsername),
            "jdoe@host");
}

TEST_F(MailDescriptionTest, AUserNameThatIsNoTextIsLeft) {
  EXPECT_EQ(*incoming({{"AccountType", "VelmoraAccount"}, {"Username", 5}}).find(kAccountUsername),
            PropertyValue(5));
}

TEST_F(MailDescriptionTest, TheLegacyIdentifierBecomesTheSyncIdentifierToo) {
  const BasicAccountReference record =
      convertIncoming({{"AccountType", "IMAPAccount"}, {"uniqueId", "M"}});

  EXPECT_EQ(record->identifier(), "M");
  EXPECT_EQ(record->syncStoreIdentifier(), "M");
}

TEST_F(MailDescriptionTest, ADescriptionWithoutAnIdentifierGetsAFreshSyncIdentifierOfItsOwn) {
  const BasicAccountReference record = convertIncoming({{"AccountType", "IMAPAccount"}});

  EXPECT_EQ(record->identifier(), "00000000-0000-0000-0000-000000000001");
  EXPECT_EQ(record->syncStoreIdentifier(), "00000000-0000-0000-0000-000000000002");
}

TEST_F(MailDescriptionTest, WithoutUUIDsNoSyncIdentifierIsSet) {
  device.uuidGenerator.canGenerate = false;

  const BasicAccountReference record = convertIncoming({{"AccountType", "IMAPAccount"}});

  ASSERT_NE(record, nullptr);
  EXPECT_EQ(record->syncStoreIdentifier(), std::nullopt);
}

TEST_F(MailDescriptionTest, AnOldSyncIdentifierGivesWayToTheIdentifier) {
  const BasicAccountReference record = convertIncoming(
      {{"AccountType", "IMAPAccount"}, {"uniqueId", "M"}, {"Sync Identifier", "old"}});

  EXPECT_EQ(record->syncStoreIdentifier(), "M");
}

TEST_F(MailDescriptionTest, TheGenericMailClassIsKeptForTheFixer) {
  const BasicAccountReference record = convertIncoming({{"AccountType", "MailAccount"}});

  ASSERT_NE(record, nullptr);
  EXPECT_EQ(record->accountClass(), Text("MailAccount"));
  EXPECT_EQ(record->type(), kMailAccountType);
}

}  // namespace
}  // namespace accounts
