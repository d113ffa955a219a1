#include "tests/migrator/MigratorFixture.h"

// The step of 7A150: identifiers.

namespace accounts {
namespace {

class IdentifiersStepTest : public StepTest {
 protected:
  /// What becomes of an account when it is the only one of the store.
  PropertyDictionary upgraded(const AccountDictionary& builder) {
    openStoreWith({builder});
    EXPECT_TRUE(migrator._migrateAccountsFrom7A150(*store));
    return account(0).properties();
  }
};

TEST_F(IdentifiersStepTest, TheUniqueIdBecomesTheIdentifierAndTheOldOneTheSyncIdentifier) {
  EXPECT_EQ(upgraded(anAccount("X", kExchangeAccountType, "ASAccount").with("uniqueId", "Y")),
            anAccount("Y", kExchangeAccountType, "ASAccount").with("Sync Identifier", "X"));
}

TEST_F(IdentifiersStepTest, MailAndHostedServiceAccountsAreTreatedLikeExchangeAccounts) {
  EXPECT_EQ(upgraded(anAccount("X", kMailAccountType, "IMAPAccount").with("uniqueId", "Y")),
            anAccount("Y", kMailAccountType, "IMAPAccount").with("Sync Identifier", "X"));
  EXPECT_EQ(upgraded(anAccount("X", kVelmoraAccountType, "VelmoraAccount").with("uniqueId", "Y")),
            anAccount("Y", kVelmoraAccountType, "VelmoraAccount").with("Sync Identifier", "X"));
}

TEST_F(IdentifiersStepTest, WithoutAUniqueIdTheIdentifierStaysAndIsCopied) {
  EXPECT_EQ(upgraded(anAccount("X", kMailAccountType, "IMAPAccount").with("Sync Identifier", "S")),
            anAccount("X", kMailAccountType, "IMAPAccount").with("Sync Identifier", "X"));
}

TEST_F(IdentifiersStepTest, AnEmptyUniqueIdStays) {
  EXPECT_EQ(upgraded(anAccount("X", kMailAccountType, "IMAPAccount").with("uniqueId", "")),
            anAccount("X", kMailAccountType, "IMAPAccount")
                .with("uniqueId", "")
                .with("Sync Identifier", "X"));
}

TEST_F(IdentifiersStepTest, AUniqueIdOfTheWrongKindReadsAsAbsentAndStays) {
  EXPECT_EQ(upgraded(anAccount("X", kMailAccountType, "IMAPAccount").with("uniqueId", 5)),
            anAccount("X", kMailAccountType, "IMAPAccount")
                .with("uniqueId", 5)
                .with("Sync Identifier", "X"));
}

TEST_F(IdentifiersStepTest, AnEmptyIdentifierIsReplacedByAFreshOneAndNotCopied) {
  EXPECT_EQ(upgraded(anAccount("", kMailAccountType, "IMAPAccount").with("Sync Identifier", "S")),
            anAccount("00000000-0000-0000-0000-000000000001", kMailAccountType, "IMAPAccount")
                .with("Sync Identifier", "S"));
}

TEST_F(IdentifiersStepTest, AnOutgoingAccountGetsNoSyncIdentifier) {
  EXPECT_EQ(upgraded(anAccount("X", kSMTPAccountType, "SMTPAccount")
                         .with("uniqueId", "Y")
                         .with("Sync Identifier", "S")),
            anAccount("Y", kSMTPAccountType, "SMTPAccount").with("Sync Identifier", "S"));
  EXPECT_EQ(upgraded(anAccount("X", kSMTPAccountType, "SMTPAccount").with("uniqueId", "Y")),
            PropertyDictionary(anAccount("Y", kSMTPAccountType, "SMTPAccount")));
}

TEST_F(IdentifiersStepTest, AccountsOfOtherTypesAreLeft) {
  const AccountDictionary calDAV =
      anAccount("X", kCalDAVAccountType, "MobileCalDAVAccount").with("uniqueId", "Y");

  EXPECT_EQ(upgraded(calDAV), PropertyDictionary(calDAV));
}

TEST_F(IdentifiersStepTest, AccountsAreFoundByTheirNewIdentifiersAfterwards) {
  openStoreWith({anAccount("X", kMailAccountType, "IMAPAccount").with("uniqueId", "Y"),
                 anAccount("C", kCalDAVAccountType, "MobileCalDAVAccount")});

  migrator._migrateAccountsFrom7A150(*store);

  ASSERT_NE(store->accountWithIdentifier("Y"), nullptr);
  EXPECT_EQ(store->accountWithIdentifier("X"), nullptr);
  EXPECT_NE(store->accountWithIdentifier("C"), nullptr);
}

TEST_F(IdentifiersStepTest, EveryAccountIsKeptInItsPlace) {
  openStoreWith({anAccount("S", kSMTPAccountType, "SMTPAccount").with("uniqueId", "S2"),
                 anAccount("C", kCalDAVAccountType, "MobileCalDAVAccount"),
                 anAccount("E", kExchangeAccountType, "ASAccount"),
                 anAccount("M", kMailAccountType, "IMAPAccount").with("uniqueId", "M2")});

  migrator._migrateAccountsFrom7A150(*store);

  EXPECT_EQ(identifiers(), (TextList{"S2", "C", "E", "M2"}));
}

}  // namespace
}  // namespace accounts
