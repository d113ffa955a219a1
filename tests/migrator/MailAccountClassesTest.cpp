#include "migrator/HasClass.h"

#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

using MailAccountClassesTest = MigratorTest;

TEST_F(MailAccountClassesTest, AnAccountHasItsOwnClassComparedExactly) {
  openStoreWith({anAccount("A", kMailAccountType, "IMAPAccount")});

  EXPECT_TRUE(hasClass(account(0), "IMAPAccount"));
  EXPECT_FALSE(hasClass(account(0), "imapaccount"));
}

TEST_F(MailAccountClassesTest, AnAccountWhoseClassWasTakenAwayHasNone) {
  openStoreWith({anAccount("A", kMailAccountType, "IMAPAccount")});
  account(0)._forcedSetAccountProperty_forKey(std::nullopt, kAccountClass);

  EXPECT_FALSE(hasClass(account(0), "IMAPAccount"));
  EXPECT_FALSE(hasClass(account(0), ""));
}

}  // namespace
}  // namespace accounts
