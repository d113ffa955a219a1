#include "tests/migrator/MigratorFixture.h"

namespace accounts {
namespace {

const std::string googleHost = "www.google.com";
const std::string yahooHost = "caldav.calendar.yahoo.com";

class CalDAVMatchingTest : public MigratorTest {
 protected:
  static BasicAccountReference umbrella(std::string_view accountClass, std::string_view username) {
    return BasicAccount::initWithProperties(
        anAccount("U", kMailAccountType, accountClass).with(kAccountUsername, username));
  }
  static BasicAccountReference calDAV(std::string_view server, std::string_view login,
                                      std::string_view path) {
    return BasicAccount::initWithProperties(
        anAccount("C", kCalDAVAccountType, "MobileCalDAVAccount")
            .with("CalDAVPrincipalConfiguration",
                  PropertyDictionary{{"CalDAV_Server_Key", server}, {"Login_Key", login}})
            .with("CalDAVAccountConfiguration",
                  PropertyDictionary{{"CalDAV_PrincipalPath_Key", path}}));
  }
  static bool matches(const BasicAccountReference& calDAVAccount,
                      const BasicAccountReference& umbrellaAccount) {
    return Migrator::_calDAVAccount_matchesUmbrellaAccount(*calDAVAccount, *umbrellaAccount);
  }
};

TEST_F(CalDAVMatchingTest, AnAddressIsExpectedInFullAndWithoutItsDomain) {
  const auto account = umbrella("GmailAccount", "jdoe@host");

  EXPECT_EQ(Migrator::_expectedCalDAVUsernamesForAccount(*account),
            (TextList{"jdoe@host", "jdoe"}));
  EXPECT_EQ(Migrator::_expectedCalDAVPrincipalURLsForAccount(*account),
            (TextList{"/calendar/dav/jdoe%40host/user", "/calendar/dav/jdoe/user"}));
}

TEST_F(CalDAVMatchingTest, AUserNameWithoutADomainIsExpectedAsItIs) {
  const auto account = umbrella("YahooAccount", "a b");

  EXPECT_EQ(Migrator::_expectedCalDAVUsernamesForAccount(*account), TextList{"a b"});
  EXPECT_EQ(Migrator::_expectedCalDAVPrincipalURLsForAccount(*account),
            TextList{"/principals/users/a%20b"});
}

TEST_F(CalDAVMatchingTest, OnlyTheFirstAtSignEndsTheUserName) {
  EXPECT_EQ(Migrator::_expectedCalDAVUsernamesForAccount(*umbrella("GmailAccount", "a@b@c")),
            (TextList{"a@b@c", "a"}));
  EXPECT_EQ(Migrator::_expectedCalDAVUsernamesForAccount(*umbrella("GmailAccount", "@host")),
            (TextList{"@host", ""}));
}

TEST_F(CalDAVMatchingTest, UserNamesAreMadeSafeForAURL) {
  EXPECT_EQ(Migrator::_urlSafeUsername("a b"), "a%20b");
  EXPECT_EQ(Migrator::_urlSafeUsername("a/b"), "a%2Fb");
  EXPECT_EQ(Migrator::_urlSafeUsername("j\u00F6rg@h?"), "j%C3%B6rg%40h%3F");
}

TEST_F(CalDAVMatchingTest, EachServiceHasItsHost) {
  EXPECT_EQ(Migrator::_expectedCalDAVHostnameForAccount(*umbrella("GmailAccount", "u")),
            googleHost);
  EXPECT_EQ(Migrator::_expectedCalDAVHostnameForAccount(*umbrella("YahooAccount", "u")), yahooHost);
}

TEST_F(CalDAVMatchingTest, AnyOtherClassExpectsNoCalendars) {
  const auto account = umbrella("IMAPAccount", "jdoe");

  EXPECT_EQ(Migrator::_expectedCalDAVHostnameForAccount(*account), std::nullopt);
  EXPECT_TRUE(Migrator::_expectedCalDAVPrincipalURLsForAccount(*account).empty());
  EXPECT_FALSE(matches(calDAV(googleHost, "jdoe", "/calendar/dav/jdoe/user"), account));
}

TEST_F(CalDAVMatchingTest, AYahooAccountMatchesItsCalendarsByTheBareUserName) {
  EXPECT_TRUE(matches(calDAV(yahooHost, "jdoe", "/principals/users/jdoe"),
                      umbrella("YahooAccount", "jdoe@yahoo.example")));
}

TEST_F(CalDAVMatchingTest, AServerInOtherLetterCaseIsNoMatch) {
  EXPECT_FALSE(matches(calDAV("CalDAV.calendar.yahoo.com", "jdoe", "/principals/users/jdoe"),
                       umbrella("YahooAccount", "jdoe@yahoo.example")));
}

TEST_F(CalDAVMatchingTest, AGmailAccountMatchesItsCalendarsByTheFullAddress) {
  EXPECT_TRUE(matches(calDAV(googleHost, "jdoe@host", "/calendar/dav/jdoe%40host/user"),
                      umbrella("GmailAccount", "jdoe@host")));
}

TEST_F(CalDAVMatchingTest, APathOfTheOtherServiceIsNoMatch) {
  EXPECT_FALSE(matches(calDAV(googleHost, "jdoe", "/principals/users/jdoe"),
                       umbrella("GmailAccount", "jdoe")));
}

TEST_F(CalDAVMatchingTest, AnotherUsersLoginIsNoMatch) {
  EXPECT_FALSE(matches(calDAV(googleHost, "roe", "/calendar/dav/jdoe/user"),
                       umbrella("GmailAccount", "jdoe")));
}

TEST_F(CalDAVMatchingTest, AnUmbrellaAccountWithoutAUserNameMatchesNothing) {
  const BasicAccountReference nameless =
      BasicAccount::initWithProperties(anAccount("U", kMailAccountType, "GmailAccount"));

  EXPECT_TRUE(Migrator::_expectedCalDAVUsernamesForAccount(*nameless).empty());
  EXPECT_FALSE(matches(calDAV(googleHost, "", "/calendar/dav//user"), nameless));
}

TEST_F(CalDAVMatchingTest, ACalDAVAccountWithoutItsConfigurationMatchesNothing) {
  const BasicAccountReference bare =
      BasicAccount::initWithProperties(anAccount("C", kCalDAVAccountType, "MobileCalDAVAccount"));

  EXPECT_FALSE(matches(bare, umbrella("GmailAccount", "jdoe")));
}

TEST_F(CalDAVMatchingTest, ConfigurationOfTheWrongKindReadsAsAbsent) {
  const BasicAccountReference wrong = BasicAccount::initWithProperties(
      anAccount("C", kCalDAVAccountType, "MobileCalDAVAccount")
          .with("CalDAVPrincipalConfiguration", "no dictionary")
          .with("CalDAVAccountConfiguration", PropertyDictionary{{"CalDAV_PrincipalPath_Key", 5}}));

  EXPECT_FALSE(matches(wrong, umbrella("GmailAccount", "jdoe")));
}

}  // namespace
}  // namespace accounts
