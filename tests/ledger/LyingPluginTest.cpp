// A plug-in that says what is not so, or does what it does not say: the ledger believes values
// alone.

#include "tests/ledger/LedgerFixture.h"

namespace accounts {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;

AccountDictionary ldap(std::string_view identifier) {
  return accountWithHost(identifier, kLDAPAccountType, "LDAPAccount");
}
const DeviceFiles kTwoAccounts = {.settings = accountSettings(12, {ldap("A"), ldap("B")})};

/// Says another fate of every account that it is told of.
class OtherFates final : public Liar {
 public:
  explicit OtherFates(std::function<void(AccountEvent&)> change) : change_(std::move(change)) {}
  void accountFared(const AccountEvent& event) override {
    AccountEvent told = event;
    change_(told);
    Liar::accountFared(told);
  }

 private:
  std::function<void(AccountEvent&)> change_;
};

/// Says another order of the saved accounts.
class OtherOrder final : public Liar {
 public:
  explicit OtherOrder(std::function<void(std::vector<AccountOrigin>&)> change)
      : change_(std::move(change)) {}
  void accountsSaved(const std::vector<AccountOrigin>& accounts) override {
    std::vector<AccountOrigin> told = accounts;
    change_(told);
    Liar::accountsSaved(told);
  }

 private:
  std::function<void(std::vector<AccountOrigin>&)> change_;
};

TEST(LyingPlugin, AccountsThatAreSaidToStandInEachOthersPlacesAreLost) {
  OtherOrder liar([](auto& accounts) { std::swap(accounts[0], accounts[1]); });
  EXPECT_THAT(MigratedInMemory(kTwoAccounts, &liar).lost(),
              ElementsAre("Accounts[0]", "Accounts[1]"));
}

TEST(LyingPlugin, AnOrderThatIsTooShortSaysNothing) {
  OtherOrder liar([](auto& accounts) { accounts.pop_back(); });
  EXPECT_THAT(MigratedInMemory(kTwoAccounts, &liar).losses(),
              ElementsAre(EndsWith("nothing says what became of it"),
                          EndsWith("nothing says what became of it")));
}

TEST(LyingPlugin, AnAccountThatIsSaidToComeFromNowhereIsNamed) {
  OtherOrder liar([](auto& accounts) { accounts[0] = {}; });
  EXPECT_THAT(MigratedInMemory(kTwoAccounts, &liar).losses(),
              Contains(HasSubstr("nothing says where it comes from")));
}

TEST(LyingPlugin, AnAccountThatIsSaidToComeFromAPlaceThatTheFileHasNotIsNamed) {
  OtherOrder liar([](auto& accounts) { accounts[0].number = 77; });
  EXPECT_THAT(MigratedInMemory(kTwoAccounts, &liar).losses(),
              Contains(HasSubstr("nothing says where it comes from")));
}

TEST(LyingPlugin, ARefusalThatIsNotToldIsALossAllTheSame) {
  OtherFates liar([](AccountEvent& event) { event.account.number = 5; });
  EXPECT_THAT(MigratedInMemory(
                  {.settings = accountSettings(12, {ldap("A").with(kAccountType, "No")})}, &liar)
                  .losses(),
              ElementsAre(EndsWith("nothing says what became of it")));
}

TEST(LyingPlugin, AnAccountIsNotJoinedIntoOneWithoutCalendars) {
  OtherFates liar([](AccountEvent& event) {
    event.fate = ToldFate::Joined;
    event.other = {AccountOrigin::Kind::Settings, 1};
  });
  EXPECT_THAT(
      MigratedInMemory(
          {.settings = accountSettings(4, {ldap("A").with(kAccountType, "No"), ldap("B")})}, &liar)
          .losses(),
      ElementsAre(EndsWith("it was deleted, and the account that it was joined into has no "
                           "calendars")));
}

TEST(LyingPlugin, AnAccountIsNotBelowAParentThatHasItNot) {
  OtherFates liar([](AccountEvent& event) {
    event.fate = ToldFate::MovedBelow;
    event.other = {AccountOrigin::Kind::Settings, 1};
  });
  EXPECT_THAT(
      MigratedInMemory(
          {.settings = accountSettings(12, {ldap("A").with(kAccountType, "No"), ldap("B")})}, &liar)
          .losses(),
      ElementsAre(EndsWith("it is not below the parent account that was made from it")));
}

TEST(LyingPlugin, AnAccountIsNotMadeAnewAsOneWithOtherValues) {
  OtherFates liar([](AccountEvent& event) {
    event.fate = ToldFate::Overwritten;
    event.other = {AccountOrigin::Kind::Settings, 1};
  });
  EXPECT_THAT(
      MigratedInMemory(
          {.settings = accountSettings(12, {ldap("A").with(kAccountType, "No"), ldap("B")})}, &liar)
          .losses(),
      ElementsAre(HasSubstr(": another account with its identifier took its place: its \"")));
}

TEST(LyingPlugin, AnAccountIsComparedWithTheLastOfThoseThatTookItsPlace) {
  OtherFates liar([](AccountEvent& event) {
    event.fate = ToldFate::Overwritten;
    event.other = {AccountOrigin::Kind::Settings, event.account.number + 1};
  });
  const PropertyDictionary refused = ldap("A").with(kAccountType, "No");
  EXPECT_THAT(
      MigratedInMemory({.settings = accountSettings(12, {refused, refused, ldap("A")})}, &liar)
          .losses(),
      ElementsAre(EndsWith("took its place: its \"Type\" gave way to another value"),
                  EndsWith("took its place: its \"Type\" gave way to another value")));
}

TEST(LyingPlugin, AnAccountWhoseParentIsNowhereIsLost) {
  OtherFates liar([](AccountEvent& event) {
    event.fate = ToldFate::MovedBelow;
    event.other = {AccountOrigin::Kind::Settings, 77};
  });
  EXPECT_THAT(MigratedInMemory(
                  {.settings = accountSettings(12, {ldap("A").with(kAccountType, "No")})}, &liar)
                  .losses(),
              ElementsAre(EndsWith("the parent account that it was moved below is gone")));
}

TEST(LyingPlugin, AValueThatAnAccountGivesToItsParentMustBeThere) {
  const PropertyDictionary hosted =
      accountWithHost("A", kVelmoraAccountType, kVelmoraAccountClass)
          .with(kCalendarsAccountSubscribedCalendars, PropertyArray{"a calendar"});
  const MigratedInMemory migrated(
      {.settings = accountSettings(6, {hosted})}, nullptr, [](PropertyArray& accounts) {
        accounts.replace(0,
                         AccountDictionary(accounts.at(0))
                             .with(kCalendarsAccountSubscribedCalendars, PropertyArray{"another"}));
      });
  EXPECT_THAT(migrated.losses(),
              ElementsAre(EndsWith("its \"" + std::string(kCalendarsAccountSubscribedCalendars) +
                                   "\" did not go to the parent account made from it")));
}

TEST(LyingPlugin, AccountsThatAreSaidToOverwriteEachOtherInACircleAreLost) {
  OtherFates liar([](AccountEvent& event) {
    event.fate = ToldFate::Overwritten;
    event.other = {AccountOrigin::Kind::Settings, 1 - event.account.number};
  });
  const PropertyDictionary refused = ldap("A").with(kAccountType, "No");
  EXPECT_THAT(
      MigratedInMemory({.settings = accountSettings(12, {refused, refused})}, &liar).losses(),
      ElementsAre(EndsWith(": another account with its identifier took its place"),
                  EndsWith(": another account with its identifier took its place")));
}

TEST(LyingPlugin, AValueThatIsGoneIsALoss) {
  const MigratedInMemory migrated(kTwoAccounts, nullptr, [](PropertyArray& accounts) {
    accounts.replace(0, AccountDictionary(accounts.at(0)).without("Hostname"));
  });
  EXPECT_THAT(migrated.losses(), ElementsAre(EndsWith("its \"Hostname\" is gone")));
}

TEST(LyingPlugin, AnotherValueIsALoss) {
  const MigratedInMemory migrated(kTwoAccounts, nullptr, [](PropertyArray& accounts) {
    accounts.replace(1, AccountDictionary(accounts.at(1)).with("Hostname", "other"));
  });
  EXPECT_THAT(migrated.losses(),
              ElementsAre(EndsWith("its \"Hostname\" gave way to another value")));
}

TEST(LyingPlugin, AValueThatNobodyGaveIsALoss) {
  const MigratedInMemory migrated(kTwoAccounts, nullptr, [](PropertyArray& accounts) {
    accounts.replace(1, AccountDictionary(accounts.at(1)).with("New", 1));
  });
  EXPECT_THAT(migrated.losses(), ElementsAre(EndsWith("it has a \"New\" that it did not have")));
}

TEST(LyingPlugin, AKeyOfAStepMayDifferOnlyWhereTheStepRan) {
  const auto tamper = [](PropertyArray& accounts) {
    accounts.replace(0,
                     AccountDictionary(accounts.at(0))
                         .with(kAccountEnabledDataclasses, PropertyArray{kAccountDataclassMail}));
  };
  EXPECT_THAT(MigratedInMemory(kTwoAccounts, nullptr, tamper).lost(), ElementsAre("Accounts[0]"));
  EXPECT_THAT(
      MigratedInMemory({.settings = accountSettings(9, {ldap("A")})}, nullptr, tamper).lost(),
      IsEmpty());
}

TEST(LyingPlugin, AKeyOfAStepMayDifferOnlyInAccountsOfItsTypeOrClass) {
  const auto tamper = [](PropertyArray& accounts) {
    accounts.replace(0, AccountDictionary(accounts.at(0)).with("status", 7));
  };
  const PropertyDictionary cloud = accountWithHost("Q", kQuarxAccountType, kCloudAccountClass);
  EXPECT_THAT(
      MigratedInMemory({.settings = accountSettings(9, {ldap("A")})}, nullptr, tamper).lost(),
      ElementsAre("Accounts[0]"));
  EXPECT_THAT(MigratedInMemory({.settings = accountSettings(9, {cloud})}, nullptr, tamper).lost(),
              IsEmpty());
}

TEST(LyingPlugin, WhatAConversionSetsMayNotDifferWhereNoDescriptionTookAPlace) {
  OtherOrder liar([&liar](auto& accounts) {
    liar.listener->accountFared({accounts[0], ToldFate::Overwritten, accounts[1]});
    accounts[0] = accounts[1];
  });
  const MigratedInMemory migrated(
      {.settings = accountSettings(12, {ldap("A"), ldap("A")})}, &liar,
      [](PropertyArray& accounts) {
        accounts.replace(0, AccountDictionary(accounts.at(0)).with(kAccountSyncIdentifier, "x"));
      });
  EXPECT_THAT(migrated.lost(), ElementsAre("Accounts[0]", "Accounts[1]"));
}

/// An account or a description, a value that it has in the result, and whether that is a loss.
struct Tampered {
  const char* what;
  DeviceFiles files;
  std::string_view key;
  PropertyValue value;
  bool isLoss;
};

TEST(LyingPlugin, AKeyThatAConversionSetsMayDifferWhereItDoesAlone) {
  const auto mail = [](std::string_view accountClass) {
    return DeviceFiles{
        .mail = mailStore({mailDescription("A", accountClass).with(kAccountUsername, "jo@x")})};
  };
  const DeviceFiles exchange = {.exchange = exchangeStore({exchangeDescription("A")})};
  for (const Tampered& each : {
           Tampered{"a hosted account's user name", mail(kVelmoraAccountClass), kAccountUsername,
                    "jo", false},
           Tampered{"another one's", mail(kIMAPAccountClass), kAccountUsername, "jo", true},
           Tampered{"a hosted account's password", mail(kVelmoraAccountClass), "Password", "x",
                    true},
           Tampered{"a type's text", mail(kIMAPAccountClass), kAccountTypeString, "x", false},
           Tampered{"an Exchange account's", exchange, kAccountShortTypeString, "x", false},
           Tampered{"its password", exchange, "Password", "x", true},
       }) {
    const MigratedInMemory migrated(each.files, nullptr, [&](PropertyArray& accounts) {
      PropertyDictionary account = *accounts.at(0).asDictionary();
      if (each.files.mail && account.contains(kAccountChildAccounts)) {
        // A step has put it below a parent.
        PropertyDictionary child =
            *account.arrayForKey(kAccountChildAccounts)->at(0).asDictionary();
        child.set(each.key, each.value);
        account.set(kAccountChildAccounts, PropertyArray{child});
      } else {
        account.set(each.key, each.value);
      }
      accounts.replace(0, account);
    });
    EXPECT_EQ(!migrated.lost().empty(), each.isLoss) << each.what;
  }
}

TEST(LyingPlugin, AKeyOfAChildMayDifferWhereAStepTouchesChildrenAlone) {
  const PropertyDictionary hosted = accountWithHost("K", kVelmoraAccountType, kVelmoraAccountClass)
                                        .with(kAccountDisplayName, "name");
  const PropertyDictionary other = ldap("K").with(kAccountDisplayName, "name");
  const PropertyDictionary nameless = AccountDictionary(hosted).without(kAccountIdentifier);
  const auto below = [](const PropertyDictionary& parent, const PropertyDictionary& child) {
    return DeviceFiles{.settings =
                           accountSettings(7, {AccountDictionary(parent).withChildren({child})})};
  };
  const PropertyDictionary cloud = accountWithHost("Q", kQuarxAccountType, kCloudAccountClass);
  for (const Tampered& each : {
           Tampered{"the name of a hosted child", below(cloud, hosted), kAccountDisplayName, "x",
                    false},
           Tampered{"another child's", below(cloud, other), kAccountDisplayName, "x", true},
           Tampered{"that of another parent's child", below(ldap("P"), hosted), kAccountDisplayName,
                    "x", true},
           Tampered{"its identifier", below(cloud, hosted), kAccountIdentifier, "x", true},
           Tampered{"one that it had not", below(cloud, nameless), kAccountIdentifier, "x", false},
           Tampered{"another key of that one", below(cloud, nameless), "Hostname", "x", true},
       }) {
    const MigratedInMemory migrated(each.files, nullptr, [&](PropertyArray& accounts) {
      const PropertyDictionary& parent = *accounts.at(0).asDictionary();
      const PropertyArray children = parent.arrayForKey(kAccountChildAccounts).value();
      accounts.replace(0, AccountDictionary(parent).withChildren(
                              {AccountDictionary(children.at(0)).with(each.key, each.value)}));
    });
    EXPECT_EQ(!migrated.lost().empty(), each.isLoss) << each.what;
  }
}

TEST(LyingPlugin, AValueOfAnAccountThatWasMovedMustBeBelowItsParent) {
  const MigratedInMemory migrated(
      {.settings =
           accountSettings(6, {accountWithHost("A", kVelmoraAccountType, kVelmoraAccountClass)})},
      nullptr, [](PropertyArray& accounts) {
        const PropertyDictionary& parent = *accounts.at(0).asDictionary();
        const PropertyArray children = parent.arrayForKey(kAccountChildAccounts).value();
        accounts.replace(0, AccountDictionary(parent).withChildren(
                                {AccountDictionary(children.at(0)).without("Hostname")}));
      });
  EXPECT_THAT(migrated.losses(), ElementsAre(EndsWith(": its \"Hostname\" is gone")));
}

TEST(LyingPlugin, AChildThatIsGoneIsALoss) {
  const PropertyDictionary parent =
      accountWithHost("Q", kQuarxAccountType, kCloudAccountClass).withChildren({ldap("K")});
  const MigratedInMemory migrated(
      {.settings = accountSettings(12, {parent})}, nullptr, [](PropertyArray& accounts) {
        accounts.replace(0, AccountDictionary(accounts.at(0)).withChildren({}));
      });
  EXPECT_THAT(migrated.losses(),
              ElementsAre(EndsWith("it is not among the children of its parent any more")));
}

/// What is lost of an account with the child K where the plug-in leaves another dictionary for it.
std::vector<std::string> lossesWhereAParentBecomes(
    const std::function<PropertyDictionary(const PropertyDictionary&)>& changed) {
  const PropertyDictionary parent =
      accountWithHost("Q", kQuarxAccountType, kCloudAccountClass).withChildren({ldap("K")});
  return MigratedInMemory({.settings = accountSettings(12, {parent})}, nullptr,
                          [&](PropertyArray& accounts) {
                            accounts.replace(0, changed(*accounts.at(0).asDictionary()));
                          })
      .losses();
}

TEST(LyingPlugin, AValueOfAParentThatIsGoneIsALossWhateverItsChildrenAre) {
  EXPECT_THAT(lossesWhereAParentBecomes([](const PropertyDictionary& parent) {
                return AccountDictionary(parent).without("Hostname");
              }),
              ElementsAre(EndsWith(": its \"Hostname\" is gone")));
}

TEST(LyingPlugin, AValueOfAChildThatIsGoneIsALoss) {
  EXPECT_THAT(lossesWhereAParentBecomes([](const PropertyDictionary& parent) {
                return AccountDictionary(parent).withChildren({ldap("K").without("Hostname")});
              }),
              ElementsAre(EndsWith(": its \"Hostname\" is gone")));
}

TEST(LyingPlugin, SomethingElseInAChildsPlaceIsALoss) {
  EXPECT_THAT(lossesWhereAParentBecomes([](const PropertyDictionary& parent) {
                return AccountDictionary(parent).withChildren({"no account"});
              }),
              ElementsAre(EndsWith(": something else stands in its place")));
}

TEST(LyingPlugin, AChildThatNobodyGaveIsALossOfItsParent) {
  EXPECT_THAT(lossesWhereAParentBecomes([](const PropertyDictionary& parent) {
                return AccountDictionary(parent).withChildren({ldap("K"), ldap("L")});
              }),
              ElementsAre(EndsWith(": it has children that it did not have")));
}

TEST(LyingPlugin, AnIdentifierThatAChildHasTooIsNamedWithWhatIsGone) {
  const PropertyDictionary parent =
      accountWithHost("Q", kQuarxAccountType, kCloudAccountClass).withChildren({ldap("A")});
  const MigratedInMemory migrated(
      {.settings = accountSettings(12, {ldap("A"), parent})}, nullptr, [](PropertyArray& accounts) {
        accounts.replace(0, AccountDictionary(accounts.at(0)).without("Hostname"));
      });
  EXPECT_THAT(migrated.losses(), ElementsAre(EndsWith(": its \"Hostname\" is gone; another account "
                                                      "has its identifier")));
}

TEST(LyingPlugin, ARefusalWithoutAReasonIsALossAllTheSame) {
  OtherFates withoutReason([](AccountEvent& event) { event.reason = {}; });
  const MigratedInMemory migrated({.settings = accountSettings(12, {"no account"})},
                                  &withoutReason);
  EXPECT_THAT(migrated.losses(), ElementsAre(EndsWith(": it was refused")));
}

}  // namespace
}  // namespace accounts
