#include <unistd.h>

#include <algorithm>
#include <optional>

#include "tests/fakes/Sanitizers.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

/// The sample device, migrated end to end by the real program.
class SampleDevice : public DeviceRootFixture {
 protected:
  SampleDevice() { copyOverRoot(SOURCE_DIRECTORY "/examples/sample-device"); }

  /// The migrated top-level account with a display name; a failure of the test when there is none.
  [[nodiscard]] PropertyDictionary account(std::string_view displayName) const {
    const std::optional<PropertyDictionary> found = findAccount(displayName);
    EXPECT_TRUE(found.has_value()) << "no account " << displayName;
    return found.value_or(PropertyDictionary{});
  }

  [[nodiscard]] std::optional<PropertyDictionary> findAccount(std::string_view displayName) const {
    const PropertyArray accounts = readDictionary(kSettingsPath).arrayForKey("Accounts").value();
    for (const PropertyValue& value : accounts) {
      if (value.asDictionary()->textForKey("DisplayName") == Text(displayName)) {
        return *value.asDictionary();
      }
    }
    return std::nullopt;
  }

  static std::string textOf(const PropertyDictionary& account, std::string_view key) {
    return account.textForKey(key).value_or(Text("(none)")).string();
  }

  static bool isOnFor(const PropertyDictionary& account, const std::string& dataclass) {
    return account.arrayForKey("Enabled Dataclasses")
        .value_or(PropertyArray{})
        .containsText("com.quarx.Dataclass." + dataclass);
  }
};

TEST_F(SampleDevice, IsMigratedToACurrentBinarySettingsFile) {
  const ProgramResult result = migrate({"--json"});

  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  EXPECT_EQ(onlyObject(result)["result"], true);
  EXPECT_TRUE(readText(kSettingsPath).starts_with("bplist00"));
  EXPECT_EQ(readDictionary(kSettingsPath).find("Version")->integerValue(), 12);
}

TEST_F(SampleDevice, IsMigratedWhereNoProcIsMounted) {
  if (kWithSanitizers) {
    GTEST_SKIP() << "Sanitizers look into /proc.";
  }
  constexpr int kCannotUnmount = 99;

  const ProgramResult result =
      runProgram({.program = "unshare",
                  .arguments = {"-m", "sh", "-c",
                                "umount -l /proc && ! test -e /proc/self || exit 99\n"
                                "\"$0\" run --root \"$1\"",
                                migrationHost(), root()}});

  if (getuid() != 0 || result.exitStatus == kCannotUnmount) {
    GTEST_SKIP() << "This system lets the test unmount nothing.";
  }
  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  EXPECT_EQ(readDictionary(kSettingsPath).find("Version")->integerValue(), 12);
}

TEST_F(SampleDevice, LosesItsLegacyStoresAndKeepsACopyOfItsOldSettings) {
  const std::string oldSettings = readText(kSettingsPath);

  ASSERT_EQ(migrate().exitStatus, 0);

  EXPECT_EQ(files(), (std::vector<std::string>{"/etc/device.plist", "/etc/group", "/etc/passwd",
                                               kLockPath, kSettingsCopyPath, kSettingsPath}));
  EXPECT_EQ(readText(kSettingsCopyPath), oldSettings);
}

TEST_F(SampleDevice, GetsItsGmailAccountWithTheCalendarsFoldedIn) {
  ASSERT_EQ(migrate().exitStatus, 0);

  const PropertyDictionary gmail = account("Ada's Gmail");
  EXPECT_EQ(textOf(gmail, "Type"), "Gmail");
  EXPECT_EQ(textOf(gmail, "Type String"), "Google Mail");
  EXPECT_EQ(textOf(gmail, "Identifier"), "1A7B0001-9C3D-4E2F-8B5A-6D4C3B2A1F01");
  EXPECT_TRUE(isOnFor(gmail, "Mail"));
  EXPECT_TRUE(isOnFor(gmail, "Notes"));
  EXPECT_TRUE(isOnFor(gmail, "Calendars"));
  EXPECT_FALSE(findAccount("Ada's calendars").has_value());
}

TEST_F(SampleDevice, KeepsTheOtherCalendarsAndGivesThemReminders) {
  ASSERT_EQ(migrate().exitStatus, 0);

  const PropertyDictionary work = account("Work");
  EXPECT_EQ(textOf(work, "Type"), "CalDAV");
  EXPECT_TRUE(isOnFor(work, "Calendars"));
  EXPECT_TRUE(isOnFor(work, "Reminders"));
}

TEST_F(SampleDevice, GetsItsMailAccountsAndLeavesTheInactiveOneOff) {
  ASSERT_EQ(migrate().exitStatus, 0);

  EXPECT_EQ(textOf(account("Outgoing mail"), "Type"), "SMTP");
  EXPECT_EQ(textOf(account("Work mail"), "Type"), "Mail");
  EXPECT_TRUE(isOnFor(account("Work mail"), "Mail"));
  EXPECT_EQ(textOf(account("Old mail"), "Class"), "POPAccount");
  EXPECT_FALSE(isOnFor(account("Old mail"), "Mail"));
}

TEST_F(SampleDevice, GetsItsExchangeAccountWithoutTheSwitchedOffMail) {
  ASSERT_EQ(migrate().exitStatus, 0);

  const PropertyDictionary company = account("Company");
  EXPECT_EQ(textOf(company, "Type"), "Exchange");
  EXPECT_TRUE(isOnFor(company, "Contacts"));
  EXPECT_TRUE(isOnFor(company, "Calendars"));
  EXPECT_FALSE(isOnFor(company, "Mail"));
  EXPECT_EQ(textOf(company, "DAAccountHost"), "exchange.example.org");
}

TEST_F(SampleDevice, HasItsHostedAccountWrappedIntoAParent) {
  ASSERT_EQ(migrate().exitStatus, 0);

  const PropertyDictionary parent = account("Ada at Velmora");
  EXPECT_EQ(textOf(parent, "Type"), "QuarxAccount");
  EXPECT_EQ(textOf(parent, "Username"), "ada@velmora.example");
  EXPECT_TRUE(isOnFor(parent, "Mail"));
  EXPECT_TRUE(isOnFor(parent, "Contacts"));
  const PropertyArray children = parent.arrayForKey("ChildAccounts").value_or(PropertyArray{});
  ASSERT_EQ(children.size(), 1U);
  const PropertyDictionary& child = *children.at(0).asDictionary();
  EXPECT_EQ(textOf(child, "Type"), "Velmora");
  EXPECT_EQ(textOf(child, "Identifier"), "9E1F3B52-0D4C-4D5B-8A6E-1C7B4F200001");
  EXPECT_EQ(textOf(child, "Sync Identifier"), "2B6D7C1E-77A3-4C0F-9D58-6F5E2A900001");
  EXPECT_FALSE(child.contains("Enabled Dataclasses"));
}

TEST_F(SampleDevice, HasItsCloudAccountMadeThePrimaryOne) {
  const ProgramResult result = migrate({"--json"});

  const PropertyDictionary cloud = account("Stratix");
  EXPECT_EQ(textOf(cloud, "Class"), "ZQAccount");
  ASSERT_TRUE(cloud.contains("primaryAccount"));
  EXPECT_EQ(cloud.find("primaryAccount")->booleanValue(), true);
  EXPECT_TRUE(isOnFor(cloud, "Ubiquity"));
  EXPECT_TRUE(isOnFor(cloud, "KeyValue"));
  EXPECT_TRUE(isOnFor(cloud, "Shoebox"));
  EXPECT_EQ(onlyObject(result)["cloudTabAnnouncements"], 1);
}

TEST_F(SampleDevice, KeepsItsSubscribedCalendarAsItWas) {
  const PropertyDictionary before = account("Public holidays");

  ASSERT_EQ(migrate().exitStatus, 0);

  PropertyDictionary after = account("Public holidays");
  EXPECT_EQ(after, before);
}

TEST_F(SampleDevice, HasItsOnDeviceAccountRebuiltFromTheSyncSources) {
  ASSERT_EQ(migrate().exitStatus, 0);

  const PropertyArray accounts = readDictionary(kSettingsPath).arrayForKey("Accounts").value();
  const auto* const local =
      std::find_if(accounts.begin(), accounts.end(), [](const PropertyValue& value) {
        return value.asDictionary()->textForKey("Type") == Text("OnMyDevice");
      });
  ASSERT_NE(local, accounts.end());
  EXPECT_TRUE(isOnFor(*local->asDictionary(), "Contacts"));
  EXPECT_FALSE(isOnFor(*local->asDictionary(), "Calendars"));
}

TEST_F(SampleDevice, IsNotChangedByASecondMigration) {
  ASSERT_EQ(migrate().exitStatus, 0);
  const std::string migrated = readText(kSettingsPath);

  EXPECT_EQ(migrate().exitStatus, 0);

  EXPECT_EQ(readText(kSettingsPath), migrated);
}

}  // namespace
}  // namespace accounts
