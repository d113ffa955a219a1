#include "tests/migrator/MigratorFixture.h"

// The step of 7A242: web-mail accounts and their calendars.

namespace accounts {
namespace {

class WebMailCalendarsStepTest : public StepTest {
 protected:
  void runStep() { EXPECT_TRUE(migrator._migrateAccountsFrom7A242(*store)); }
  /// The identifiers in the channel's lines about deletions, one for each line.
  [[nodiscard]] TextList deletions() const {
    constexpr std::string_view kBefore = R"("Identifier":")";
    TextList result;
    for (const std::string& line : device.logSystem.channel.lines) {
      if (line.starts_with("-[AccountsManager deleteAccount:]")) {
        const std::size_t start = line.find(kBefore) + kBefore.size();
        result.push_back(line.substr(start, line.find('"', start) - start));
      }
    }
    return result;
  }
  std::optional<TextList> enabledAfterTheStep(const AccountDictionary& builder) {
    openStoreWith({builder});
    runStep();
    return texts(account(0).enabledDataclasses());
  }
};

AccountDictionary gmail(std::string_view identifier, std::string_view username) {
  return anAccount(identifier, kMailAccountType, "GmailAccount").with(kAccountUsername, username);
}
AccountDictionary calDAV(std::string_view identifier, std::string_view server,
                         std::string_view login, std::string_view path) {
  return anAccount(identifier, kCalDAVAccountType, "MobileCalDAVAccount")
      .with("CalDAVPrincipalConfiguration",
            PropertyDictionary{{"CalDAV_Server_Key", server}, {"Login_Key", login}})
      .with("CalDAVAccountConfiguration", PropertyDictionary{{"CalDAV_PrincipalPath_Key", path}});
}
AccountDictionary googleCalendar(std::string_view identifier, std::string_view username) {
  return calDAV(identifier, "www.google.com", username,
                "/calendar/dav/" + std::string(username) + "/user");
}

TEST_F(WebMailCalendarsStepTest, MailAndNotesAreSwitchedOnForWebMailClasses) {
  for (const std::string_view accountClass :
       {"IMAPAccount", "GmailAccount", "YahooAccount", "AOLAccount", "VelmoraAccount"}) {
    SCOPED_TRACE(accountClass);
    EXPECT_EQ(enabledAfterTheStep(anAccount("A", kMailAccountType, accountClass)),
              dataclasses({kAccountDataclassMail, kAccountDataclassNotes}));
  }
}

TEST_F(WebMailCalendarsStepTest, OtherClassesAreLeft) {
  EXPECT_EQ(enabledAfterTheStep(anAccount("A", kMailAccountType, "POPAccount")), std::nullopt);
  EXPECT_EQ(enabledAfterTheStep(anAccount("A", kVelmoraAccountType, "MarrowAccount")),
            std::nullopt);
  EXPECT_EQ(enabledAfterTheStep(anAccount("A", kTolvaneIMAPAccountType, "imapaccount")),
            std::nullopt);
}

TEST_F(WebMailCalendarsStepTest, AnInactiveAccountIsLeft) {
  EXPECT_EQ(
      enabledAfterTheStep(anAccount("A", kMailAccountType, "IMAPAccount").with("IsActive", false)),
      std::nullopt);
}

TEST_F(WebMailCalendarsStepTest, AnAccountThatSaysItIsActiveGetsMailAndNotes) {
  EXPECT_EQ(
      enabledAfterTheStep(anAccount("A", kMailAccountType, "IMAPAccount").with("IsActive", true)),
      dataclasses({kAccountDataclassMail, kAccountDataclassNotes}));
}

TEST_F(WebMailCalendarsStepTest, ActivityWithoutABooleanValueReadsAsAbsent) {
  EXPECT_EQ(
      enabledAfterTheStep(
          anAccount("A", kMailAccountType, "IMAPAccount").with("IsActive", PropertyDictionary())),
      dataclasses({kAccountDataclassMail, kAccountDataclassNotes}));
}

TEST_F(WebMailCalendarsStepTest, GmailAndYahooAccountsGetTypesOfTheirOwn) {
  openStoreWith({gmail("G", "jdoe"), anAccount("Y", kMailAccountType, "YahooAccount"),
                 anAccount("A", kMailAccountType, "AOLAccount")});

  runStep();

  EXPECT_EQ(account(0).type(), kGmailAccountType);
  EXPECT_EQ(account(1).type(), kYahooAccountType);
  EXPECT_EQ(account(2).type(), kMailAccountType);
}

TEST_F(WebMailCalendarsStepTest, AMatchingCalDAVAccountIsFoldedIntoItsGmailAccount) {
  openStoreWith({gmail("G", "jdoe"), googleCalendar("C", "jdoe")});

  runStep();

  EXPECT_EQ(identifiers(), TextList{"G"});
  EXPECT_EQ(account(0).type(), kGmailAccountType);
  EXPECT_EQ(
      texts(account(0).enabledDataclasses()),
      dataclasses({kAccountDataclassMail, kAccountDataclassCalendars, kAccountDataclassNotes}));
}

TEST_F(WebMailCalendarsStepTest, AMatchingCalDAVAccountIsFoldedIntoItsYahooAccount) {
  openStoreWith({calDAV("C", "caldav.calendar.yahoo.com", "jdoe", "/principals/users/jdoe"),
                 anAccount("Y", kMailAccountType, "YahooAccount")
                     .with(kAccountUsername, "jdoe@yahoo.example")});

  runStep();

  EXPECT_EQ(identifiers(), TextList{"Y"});
  EXPECT_TRUE(account(0).isEnabledForDataclass(kAccountDataclassCalendars));
}

TEST_F(WebMailCalendarsStepTest, ACalDAVAccountThatMatchesNothingStays) {
  openStoreWith({gmail("G", "jdoe"), googleCalendar("C", "roe")});

  runStep();

  EXPECT_EQ(identifiers(), (TextList{"G", "C"}));
  EXPECT_FALSE(account(0).isEnabledForDataclass(kAccountDataclassCalendars));
}

TEST_F(WebMailCalendarsStepTest, AMatchingAccountOfAnotherClassStays) {
  openStoreWith({gmail("G", "jdoe"), googleCalendar("C", "jdoe").with(kAccountClass, "Other")});

  runStep();

  EXPECT_EQ(identifiers(), (TextList{"G", "C"}));
}

TEST_F(WebMailCalendarsStepTest, AMatchingAccountOfAnotherTypeIsFoldedByItsClass) {
  openStoreWith(
      {gmail("G", "jdoe"), googleCalendar("C", "jdoe").with(kAccountType, kCardDAVAccountType)});
  ASSERT_EQ(identifiers(), (TextList{"G", "C"}));

  runStep();

  EXPECT_EQ(identifiers(), TextList{"G"});
}

TEST_F(WebMailCalendarsStepTest, AnInactiveAccountTakesItsCalendarsInAsWell) {
  openStoreWith({gmail("G", "jdoe").with("IsActive", false), googleCalendar("C", "jdoe")});

  runStep();

  EXPECT_EQ(identifiers(), TextList{"G"});
  EXPECT_EQ(texts(account(0).enabledDataclasses()), dataclasses({kAccountDataclassCalendars}));
}

TEST_F(WebMailCalendarsStepTest, ACalDAVAccountOfTwoUmbrellaAccountsIsOnWithBothAndDeletedOnce) {
  openStoreWith({gmail("G1", "jdoe"), googleCalendar("C", "jdoe"), gmail("G2", "jdoe@host")});

  runStep();

  EXPECT_EQ(identifiers(), (TextList{"G1", "G2"}));
  EXPECT_TRUE(account(0).isEnabledForDataclass(kAccountDataclassCalendars));
  EXPECT_TRUE(account(1).isEnabledForDataclass(kAccountDataclassCalendars));
}

TEST_F(WebMailCalendarsStepTest, TwoMatchingCalDAVAccountsAreBothDeleted) {
  openStoreWith({googleCalendar("C1", "jdoe"), gmail("G", "jdoe"), googleCalendar("C2", "jdoe")});

  runStep();

  EXPECT_EQ(identifiers(), TextList{"G"});
}

// A deletion removes the last account with an identifier, whichever account it is. So each further
// umbrella account that matches removes one more account that shares the identifier.
TEST_F(WebMailCalendarsStepTest, EachMatchDeletesOneAccountOfASharedIdentifier) {
  openStoreWith({gmail("G1", "jdoe"), googleCalendar("C", "jdoe"),
                 anAccount("C", kMailAccountType, "POPAccount")});
  runStep();
  EXPECT_EQ(identifiers(), (TextList{"G1", "C"}));
  EXPECT_EQ(account(1).accountClass(), "MobileCalDAVAccount");

  openStoreWith({gmail("G1", "jdoe"), googleCalendar("C", "jdoe"),
                 anAccount("C", kMailAccountType, "POPAccount"), gmail("G2", "jdoe")});
  runStep();
  EXPECT_EQ(identifiers(), (TextList{"G1", "G2"}));
}

TEST_F(WebMailCalendarsStepTest, EachOfThreeWebMailAccountsWritesALineAboutTheirOneCalDAVAccount) {
  openStoreWith(
      {gmail("G1", "jdoe"), gmail("G2", "jdoe"), googleCalendar("C", "jdoe"), gmail("G3", "jdoe")});

  runStep();

  EXPECT_EQ(deletions(), (TextList{"C", "C", "C"}));
  EXPECT_EQ(identifiers(), (TextList{"G1", "G2", "G3"}));
}

TEST_F(WebMailCalendarsStepTest, DeletionsAreInTheOrderOfTheWebMailAccounts) {
  openStoreWith({googleCalendar("K1", "one"), googleCalendar("K2", "two"), gmail("G1", "two"),
                 gmail("G2", "one")});

  runStep();

  EXPECT_EQ(deletions(), (TextList{"K2", "K1"}));
}

TEST_F(WebMailCalendarsStepTest, DeletionsForOneWebMailAccountAreInStoreOrder) {
  const auto calendarAt = [](std::string_view identifier, std::string_view login,
                             std::string_view pathName) {
    return calDAV(identifier, "www.google.com", login,
                  "/calendar/dav/" + std::string(pathName) + "/user");
  };
  openStoreWith({calendarAt("K1", "jdoe", "jdoe"), gmail("G", "jdoe@host"),
                 calendarAt("K2", "jdoe@host", "jdoe%40host"), calendarAt("K3", "jdoe", "jdoe"),
                 calendarAt("K4", "jdoe@host", "jdoe")});

  runStep();

  EXPECT_EQ(deletions(), (TextList{"K1", "K2", "K3", "K4"}));
}

TEST_F(WebMailCalendarsStepTest, EveryPairOfManyWebMailAndCalDAVAccountsWritesItsLine) {
  constexpr std::size_t kCount = 50;
  std::vector<PropertyValue> accounts;
  TextList calendars;
  for (std::size_t number = 0; number < kCount; ++number) {
    accounts.emplace_back(gmail("G" + std::to_string(number), "jdoe"));
    calendars.push_back("C" + std::to_string(number));
    accounts.emplace_back(googleCalendar(calendars.back(), "jdoe"));
  }
  store = AccountsManager::initWithAccounsInfoArray(PropertyArray(accounts));

  runStep();

  EXPECT_EQ(store->count(), kCount);
  TextList expected;
  for (std::size_t number = 0; number < kCount; ++number) {
    expected.insert(expected.end(), calendars.begin(), calendars.end());
  }
  EXPECT_EQ(deletions(), expected);
}

// Nothing is timed: with a walk through the store for each deletion this would take a minute.
TEST_F(WebMailCalendarsStepTest, ADeletionThatNobodyReadsAboutCostsNoWalkThroughTheStore) {
  constexpr std::size_t kCount = 2'000;
  std::vector<PropertyValue> accounts;
  for (std::size_t number = 0; number < kCount; ++number) {
    accounts.emplace_back(gmail("G" + std::to_string(number), "jdoe"));
    accounts.emplace_back(googleCalendar("C" + std::to_string(number), "jdoe"));
  }
  device.logSystem.channel.enabled = false;
  store = AccountsManager::initWithAccounsInfoArray(PropertyArray(accounts));

  runStep();

  EXPECT_EQ(store->count(), kCount);
}

}  // namespace
}  // namespace accounts
