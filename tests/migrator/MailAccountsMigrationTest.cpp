#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

PropertyDictionary incoming(std::string_view identifier, std::string_view accountClass) {
  return {{"uniqueId", identifier}, {"AccountType", accountClass}};
}
PropertyDictionary outgoing(std::string_view identifier) {
  return {{"uniqueId", identifier}};
}

class MailAccountsMigrationTest : public MigratorTest {
 protected:
  void addLegacyFile(PropertyValue outgoingAccounts, PropertyValue incomingAccounts) {
    device.addPropertyList(kLegacyMailPath,
                           PropertyDictionary{{"DeliveryAccounts", std::move(outgoingAccounts)},
                                              {"MailAccounts", std::move(incomingAccounts)}});
  }
  void openStoreWithOneAccountOfEachKind() {
    openStoreWith({anAccount("oldMail", kMailAccountType, "IMAPAccount"),
                   anAccount("oldGmail", kGmailAccountType, "GmailAccount"),
                   anAccount("oldSMTP", kSMTPAccountType, "SMTPAccount")});
  }
  const TextList unchanged = {"oldMail", "oldGmail", "oldSMTP"};
};

const std::string originalMail = std::string(kLegacyMailPath) + ".original";
const std::string mailFailure =
    "-[AccountsDataMigrator(Internal) _migrateMailAccounts:]. Could not convert the description "
    "for the ";

TEST_F(MailAccountsMigrationTest, ConvertedAccountsTakeThePlaceOfMailAndSMTPAccounts) {
  openStoreWithOneAccountOfEachKind();
  addLegacyFile(PropertyArray{outgoing("S1"), outgoing("S2")},
                PropertyArray{incoming("M1", "IMAPAccount"), incoming("M2", "POPAccount")});

  EXPECT_TRUE(migrator._migrateMailAccounts(*store));

  EXPECT_EQ(identifiers(), (TextList{"oldGmail", "S1", "S2", "M1", "M2"}));
  EXPECT_TRUE(console().empty());
}

TEST_F(MailAccountsMigrationTest, IncomingAccountsOfOtherTypesAreAddedWithoutReplacingTheirs) {
  openStoreWithOneAccountOfEachKind();
  addLegacyFile(PropertyArray(), PropertyArray{incoming("G", "GmailAccount")});

  migrator._migrateMailAccounts(*store);

  EXPECT_EQ(identifiers(), (TextList{"oldGmail", "G"}));
  EXPECT_EQ(account(1).type(), kGmailAccountType);
}

TEST_F(MailAccountsMigrationTest, AnUnreadableFileReplacesBothKindsByNothing) {
  openStoreWithOneAccountOfEachKind();
  device.fileSystem.addFile(kLegacyMailPath, "unreadable");

  EXPECT_TRUE(migrator._migrateMailAccounts(*store));

  EXPECT_EQ(identifiers(), TextList{"oldGmail"});
}

TEST_F(MailAccountsMigrationTest, ArraysOfTheWrongKindCountAsEmpty) {
  openStoreWithOneAccountOfEachKind();
  addLegacyFile("no array", 5);

  EXPECT_TRUE(migrator._migrateMailAccounts(*store));

  EXPECT_EQ(identifiers(), TextList{"oldGmail"});
}

TEST_F(MailAccountsMigrationTest, AFailingOutgoingAccountLeavesTheStoreAndTheIncomingOnes) {
  openStoreWithOneAccountOfEachKind();
  addLegacyFile(PropertyArray{outgoing("S1"), PropertyDictionary{{"AccountType", ""}}},
                PropertyArray{PropertyDictionary{{"AccountType", ""}}});

  EXPECT_FALSE(migrator._migrateMailAccounts(*store));

  EXPECT_EQ(identifiers(), unchanged);
  EXPECT_EQ(console(), Lines{mailFailure + R"(delivery account {"AccountType":""})"});
}

TEST_F(MailAccountsMigrationTest, AFailingIncomingAccountLeavesTheStore) {
  openStoreWithOneAccountOfEachKind();
  addLegacyFile(PropertyArray{outgoing("S1")},
                PropertyArray{incoming("M1", "IMAPAccount"), PropertyDictionary{{"Port", 993}}});

  EXPECT_FALSE(migrator._migrateMailAccounts(*store));

  EXPECT_EQ(identifiers(), unchanged);
  EXPECT_EQ(console(), Lines{mailFailure + R"(incoming account {"Port":993})"});
}

TEST_F(MailAccountsMigrationTest, ADescriptionThatIsNoDictionaryCannotBeConverted) {
  openStoreWithOneAccountOfEachKind();
  addLegacyFile(PropertyArray{"no dictionary"}, PropertyArray());

  EXPECT_FALSE(migrator._migrateMailAccounts(*store));

  EXPECT_EQ(console(), Lines{mailFailure + "delivery account no dictionary"});
}

TEST_F(MailAccountsMigrationTest, TheOriginalFileIsRemovedAfterSuccessAndAfterFailure) {
  device.fileSystem.addFile(originalMail, "");
  addLegacyFile(PropertyArray(), PropertyArray());
  EXPECT_TRUE(migrator._migrateMailAccounts(*store));
  EXPECT_FALSE(exists(originalMail));

  device.fileSystem.addFile(originalMail, "");
  addLegacyFile(PropertyArray{"no dictionary"}, PropertyArray());
  EXPECT_FALSE(migrator._migrateMailAccounts(*store));
  EXPECT_FALSE(exists(originalMail));
}

TEST_F(MailAccountsMigrationTest, AnOriginalFileThatStaysIsNotReported) {
  device.fileSystem.addFile(originalMail, "");
  device.fileSystem.failWhenLineBegins("remove");
  addLegacyFile(PropertyArray(), PropertyArray());

  EXPECT_TRUE(migrator._migrateMailAccounts(*store));

  EXPECT_TRUE(console().empty());
}

TEST_F(MailAccountsMigrationTest, TheLegacyFileItselfStays) {
  addLegacyFile(PropertyArray(), PropertyArray());

  migrator._migrateMailAccounts(*store);

  EXPECT_TRUE(exists(kLegacyMailPath));
}

}  // namespace
}  // namespace accounts
