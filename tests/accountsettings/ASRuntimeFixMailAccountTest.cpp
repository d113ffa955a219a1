#include "accountsettings/ASRuntimeFixMailAccount.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "tests/accountsettings/TestRecords.h"

namespace accounts {
namespace {

using Lines = std::vector<std::string>;

BasicAccountReference accountAt(std::string_view path,
                                std::string_view accountClass = "MailAccount") {
  return mailAccount({{kAccountClass, accountClass}, {"AccountPath", path}});
}

FixResult fix(BasicAccount& account) {
  return ASRuntimeFixMailAccount().fixBasicAccountIfNeeded_loggingMessage(account,
                                                                          "loading accounts");
}

class SupportedMailClasses : public testing::TestWithParam<const char*> {};

TEST_P(SupportedMailClasses, AnAccountOfOneIsLeftAsItIs) {
  FakeProcess device;
  const auto account = accountAt("Mail/POP-x", GetParam());
  const PropertyDictionary before = account->properties();

  EXPECT_EQ(fix(*account), FixResult::Unchanged);

  EXPECT_EQ(account->properties(), before);
  EXPECT_TRUE(device.logSystem.channel.lines.empty());
}

INSTANTIATE_TEST_SUITE_P(EachClass, SupportedMailClasses,
                         testing::Values("MarrowAccount", "VelmoraAccount", "POPAccount",
                                         "IMAPAccount", "AOLAccount", "LocalAccount",
                                         "GmailAccount", "YahooAccount"));

class MailDirectoryPaths : public testing::TestWithParam<std::pair<const char*, const char*>> {};

TEST_P(MailDirectoryPaths, EachTellsItsClass) {
  FakeProcess device;
  const auto account = accountAt(GetParam().first);
  EXPECT_EQ(fix(*account), FixResult::Changed);
  EXPECT_EQ(account->accountClass(), GetParam().second);
}

INSTANTIATE_TEST_SUITE_P(
    EachMarker, MailDirectoryPaths,
    testing::Values(
        std::pair("/var/mobile/Library/Mail/Dorsa-jdoe", "MarrowAccount"),
        std::pair("/var/mobile/Library/Mail/Velmora-jdoe", "VelmoraAccount"),
        std::pair("/var/mobile/Library/Mail/AOL-jdoe", "AOLAccount"),
        std::pair("/var/mobile/Library/Mail/Mailboxes", "LocalAccount"),
        std::pair("/var/mobile/Library/Mail/IMAP-jdoe@gmail.com@imap.gmail.com", "GmailAccount"),
        std::pair("/var/mobile/Library/Mail/IMAP-jdoe@imap.mail.yahoo.com", "YahooAccount"),
        std::pair("/var/mobile/Library/Mail/POP-jdoe@mail.example", "POPAccount"),
        std::pair("/var/mobile/Library/Mail/IMAP-jdoe@mail.example", "IMAPAccount")));

TEST(MailAccountFix, MarkersAreTestedInTableOrderNotByTheirPlaceInThePath) {
  FakeProcess device;
  const auto account = accountAt("/Mail/IMAP-old/Mail/AOL-jdoe");
  fix(*account);
  EXPECT_EQ(account->accountClass(), "AOLAccount");
}

TEST(MailAccountFix, AServicesMarkerDecidesBeforeTheProtocols) {
  FakeProcess device;
  const auto gmail = accountAt("Mail/POP-jdoe@gmail.com@imap.gmail.com");
  const auto yahoo = accountAt("Mail/POP-jdoe@imap.mail.yahoo.com");
  fix(*gmail);
  fix(*yahoo);
  EXPECT_EQ(gmail->accountClass(), "GmailAccount");
  EXPECT_EQ(yahoo->accountClass(), "YahooAccount");
}

TEST(MailAccountFix, AServicesHostAloneIsNotItsMarker) {
  FakeProcess device;
  for (const std::string_view path :
       {"Mail/IMAP-jdoe@host.example@imap.gmail.com", "Mail/IMAP-jdoe@imap.gmail.com",
        "Mail/IMAP-jdoe@gmail.com", "Mail/IMAP-jdoe.imap.mail.yahoo.com"}) {
    const auto account = accountAt(path);
    fix(*account);
    EXPECT_EQ(account->accountClass(), "IMAPAccount") << path;
  }
}

TEST(MailAccountFix, AnAccountOfTheHostedServiceIsFixedToo) {
  FakeProcess device;
  const auto account = accountAt("Mail/Velmora-jdoe");
  account->_forcedSetAccountProperty_forKey(kVelmoraAccountType, kAccountType);
  EXPECT_EQ(fix(*account), FixResult::Changed);
}

TEST(MailAccountFix, AnAccountOfAnotherTypeIsNeverTouched) {
  FakeProcess device;
  const auto account = accountAt("Mail/POP-jdoe");
  account->_forcedSetAccountProperty_forKey(kExchangeAccountType, kAccountType);
  EXPECT_EQ(fix(*account), FixResult::Unchanged);
  EXPECT_EQ(account->accountClass(), "MailAccount");
}

TEST(MailAccountFix, AnAccountThatLostItsClassIsFixed) {
  FakeProcess device;
  const auto account = accountAt("Mail/POP-jdoe");
  account->_forcedSetAccountProperty_forKey(std::nullopt, kAccountClass);
  EXPECT_EQ(fix(*account), FixResult::Changed);
  EXPECT_EQ(account->accountClass(), "POPAccount");
}

class UnusablePaths : public testing::TestWithParam<std::optional<PropertyValue>> {};

TEST_P(UnusablePaths, TheAccountCannotBeKeptAndIsReported) {
  FakeProcess device;
  const auto account = mailAccount({{kAccountClass, "MailAccount"}});
  account->setAccountProperty_forKey(GetParam(), "AccountPath");

  EXPECT_EQ(fix(*account), FixResult::CannotBeKept);

  EXPECT_EQ(account->accountClass(), "MailAccount");
  EXPECT_EQ(device.logSystem.channel.linesWithoutNumbers(),
            Lines{"-[ASRuntimeFixMailAccount(Internal) _cleanupAccountClass:] (N) "
                  "\"Could not fix the class of the mail account: " +
                  described(account->properties()) + "\""});
}

INSTANTIATE_TEST_SUITE_P(MissingEmptyWrongOrUntelling, UnusablePaths,
                         testing::Values(std::nullopt, "", 7, "/var/mobile/Library/Mail/x"));

TEST(MailAccountFix, TheAccountTypesAreAlwaysTheSameObject) {
  EXPECT_EQ(&ASRuntimeFixMailAccount::supportedAccountTypes(),
            &ASRuntimeFixMailAccount::supportedAccountTypes());
}

TEST(MailAccountFix, TheMarkersAreMadeOnceAProcess) {
  FakeProcess device;
  fix(*accountAt("Mail/POP-jdoe"));
  fix(*accountAt("Mail/POP-jdoe"));
  const std::vector<std::string>& reads = device.bundleResources.reads;
  EXPECT_EQ(std::count(reads.begin(), reads.end(), "MailServices"), 1);
}

class FixerNotification : public testing::Test {
 protected:
  FakeProcess device;
  ASRuntimeFixMailAccount fixer;
};

TEST_F(FixerNotification, AFixThatWasSavedIsAnnouncedOnce) {
  fixer.fixBasicAccountIfNeeded_loggingMessage(*accountAt("Mail/POP-jdoe"), "saving accounts");
  fixer.accountsHaveBeenSaved(true);
  fixer.accountsHaveBeenSaved(true);
  EXPECT_EQ(
      device.preferencesBroadcast.announcements,
      (std::vector<std::pair<std::string, std::string>>{{"com.quarx.mobilemail", "MailAccounts"}}));
}

TEST_F(FixerNotification, AFixThatWasLoadedIsForgottenWithoutAnAnnouncement) {
  fixer.fixBasicAccountIfNeeded_loggingMessage(*accountAt("Mail/POP-jdoe"), "loading accounts");
  fixer.accountsHaveBeenSaved(false);
  fixer.accountsHaveBeenSaved(true);
  EXPECT_TRUE(device.preferencesBroadcast.announcements.empty());
}

TEST_F(FixerNotification, AnAccountThatCannotBeKeptIsAnnouncedToo) {
  fixer.fixBasicAccountIfNeeded_loggingMessage(*accountAt("x"), "saving accounts");
  fixer.accountsHaveBeenSaved(true);
  EXPECT_EQ(device.preferencesBroadcast.announcements.size(), 1U);
}

TEST_F(FixerNotification, AnAccountThatNeededNoFixIsNotAnnounced) {
  fixer.fixBasicAccountIfNeeded_loggingMessage(*mailAccount(), "saving accounts");
  fixer.accountsHaveBeenSaved(true);
  EXPECT_TRUE(device.preferencesBroadcast.announcements.empty());
}

}  // namespace
}  // namespace accounts
