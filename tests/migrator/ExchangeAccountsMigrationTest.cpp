#include "migrator/LegacyDescriptions.h"
#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

class ExchangeAccountsMigrationTest : public MigratorTest {
 protected:
  void addLegacyFile(PropertyValue descriptions) {
    device.addPropertyList(kLegacyExchangePath,
                           PropertyDictionary{{"DAAccountsKey", std::move(descriptions)}});
  }
  std::optional<TextList> enabledOf(const PropertyDictionary& description) {
    return texts(accountPropertiesOfExchangeDescription(description)
                     .arrayForKey(kAccountEnabledDataclasses));
  }
};

PropertyDictionary exchange(std::string_view identifier) {
  return {{"DAAccountConfigurationAccountID", identifier},
          {"DAAccountConfigurationClass", "ASAccount"}};
}

const std::string original = std::string(kLegacyExchangePath) + ".original";
const std::string failure =
    "-[AccountsDataMigrator(Internal) _migrateDAAccounts:]. Could not convert the description for "
    "the Exchange account ";

TEST_F(ExchangeAccountsMigrationTest, LegacyKeysMoveAndEveryOtherKeyIsCarriedOver) {
  const PropertyDictionary properties =
      accountPropertiesOfExchangeDescription({{"DAAccountConfigurationClass", "ASAccount"},
                                              {"DAAccountDescription", "Work"},
                                              {"DAAccountConfigurationAccountID", "E"},
                                              {"DAAccountEnabledForEmail", true},
                                              {"DAAccountHost", "exchange.example"}});

  EXPECT_EQ(properties,
            (PropertyDictionary{
                {"Class", "ASAccount"},
                {"DisplayName", "Work"},
                {"Identifier", "E"},
                {"DAAccountHost", "exchange.example"},
                {"Type", "Exchange"},
                {"Type String", "Exchange"},
                {"Short Type String", "Exchange"},
                {"Enabled Dataclasses",
                 PropertyArray{kAccountDataclassCalendars, kAccountDataclassContacts,
                               kAccountDataclassMail, kAccountDataclassContactsSearch}}}));
}

TEST_F(ExchangeAccountsMigrationTest, WithoutSwitchesEveryDataclassIsOnInTheirOrder) {
  EXPECT_EQ(enabledOf({}), dataclasses({kAccountDataclassCalendars, kAccountDataclassContacts,
                                        kAccountDataclassMail, kAccountDataclassContactsSearch}));
}

TEST_F(ExchangeAccountsMigrationTest, ASwitchThatSaysNoLeavesItsDataclassOut) {
  EXPECT_EQ(enabledOf({{"DAAccountEnabledForEmail", false}}),
            dataclasses({kAccountDataclassCalendars, kAccountDataclassContacts,
                         kAccountDataclassContactsSearch}));
  EXPECT_EQ(enabledOf({{"DAAccountEnabledForCalendar", 0},
                       {"DAAccountEnabledForContacts", "NO"},
                       {"DAAccountEnabledForContactsSearch", false}}),
            dataclasses({kAccountDataclassMail}));
}

TEST_F(ExchangeAccountsMigrationTest, ASwitchWithoutABooleanValueReadsAsAbsent) {
  EXPECT_EQ(enabledOf({{"DAAccountEnabledForEmail", PropertyArray()}}), enabledOf({}));
}

TEST_F(ExchangeAccountsMigrationTest, NoSwitchIsCarriedOver) {
  const PropertyDictionary properties =
      accountPropertiesOfExchangeDescription({{"DAAccountEnabledForCalendar", true},
                                              {"DAAccountEnabledForContacts", false},
                                              {"DAAccountEnabledForEmail", PropertyArray()},
                                              {"DAAccountEnabledForContactsSearch", "YES"}});

  for (const PropertyEntry& entry : properties) {
    EXPECT_FALSE(entry.key.view().starts_with("DAAccountEnabledFor")) << entry.key.string();
  }
}

TEST_F(ExchangeAccountsMigrationTest, TheIdentifierBecomesTheSyncIdentifierToo) {
  const BasicAccountReference record = migrator._convertExchangeAccountDescription(exchange("E"));

  EXPECT_EQ(record->identifier(), "E");
  EXPECT_EQ(record->syncStoreIdentifier(), "E");
  EXPECT_EQ(record->accountClass(), "ASAccount");
}

TEST_F(ExchangeAccountsMigrationTest, WithoutAnIdentifierTheConversionAddsNoSyncIdentifier) {
  const BasicAccountReference record = migrator._convertExchangeAccountDescription(
      {{"DAAccountConfigurationClass", "ASAccount"}, {"Sync Identifier", "kept"}});

  EXPECT_EQ(record->syncStoreIdentifier(), "kept");
}

TEST_F(ExchangeAccountsMigrationTest, WithoutAnIdentifierTheRecordsInitialiserDecides) {
  const BasicAccountReference record =
      migrator._convertExchangeAccountDescription({{"DAAccountConfigurationClass", "ASAccount"}});

  EXPECT_EQ(record->identifier(), "00000000-0000-0000-0000-000000000001");
  EXPECT_EQ(record->syncStoreIdentifier(), record->identifier());
}

TEST_F(ExchangeAccountsMigrationTest, ConvertedAccountsTakeThePlaceOfExchangeAccounts) {
  openStoreWith({anAccount("old", kExchangeAccountType, "ASAccount"),
                 anAccount("mail", kMailAccountType, "IMAPAccount")});
  addLegacyFile(PropertyArray{exchange("E1"), exchange("E2")});

  EXPECT_TRUE(migrator._migrateDAAccounts(*store));

  EXPECT_EQ(identifiers(), (TextList{"mail", "E1", "E2"}));
}

TEST_F(ExchangeAccountsMigrationTest, AnUnreadableFileReplacesTheAccountsByNothing) {
  openStoreWith({anAccount("old", kExchangeAccountType, "ASAccount"),
                 anAccount("mail", kMailAccountType, "IMAPAccount")});
  device.fileSystem.addFile(kLegacyExchangePath, "unreadable");

  EXPECT_TRUE(migrator._migrateDAAccounts(*store));

  EXPECT_EQ(identifiers(), TextList{"mail"});
}

TEST_F(ExchangeAccountsMigrationTest, AnArrayOfTheWrongKindCountsAsEmpty) {
  openStoreWith({anAccount("old", kExchangeAccountType, "ASAccount")});
  addLegacyFile(PropertyDictionary());

  EXPECT_TRUE(migrator._migrateDAAccounts(*store));

  EXPECT_TRUE(identifiers().empty());
}

TEST_F(ExchangeAccountsMigrationTest, AFailingDescriptionLeavesTheStore) {
  openStoreWith({anAccount("old", kExchangeAccountType, "ASAccount")});
  addLegacyFile(PropertyArray{exchange("E1"), PropertyDictionary{{"Host", "x"}}, exchange("E2")});

  EXPECT_FALSE(migrator._migrateDAAccounts(*store));

  EXPECT_EQ(identifiers(), TextList{"old"});
  EXPECT_EQ(console(), Lines{failure + R"({"Host":"x"})"});
}

TEST_F(ExchangeAccountsMigrationTest, ADescriptionThatIsNoDictionaryCannotBeConverted) {
  addLegacyFile(PropertyArray{17});

  EXPECT_FALSE(migrator._migrateDAAccounts(*store));

  EXPECT_EQ(console(), Lines{failure + "17"});
}

TEST_F(ExchangeAccountsMigrationTest, TheOriginalFileIsRemovedAfterSuccessAndAfterFailure) {
  device.fileSystem.addFile(original, "");
  addLegacyFile(PropertyArray());
  EXPECT_TRUE(migrator._migrateDAAccounts(*store));
  EXPECT_FALSE(exists(original));

  device.fileSystem.addFile(original, "");
  addLegacyFile(PropertyArray{17});
  EXPECT_FALSE(migrator._migrateDAAccounts(*store));
  EXPECT_FALSE(exists(original));
}

}  // namespace
}  // namespace accounts
