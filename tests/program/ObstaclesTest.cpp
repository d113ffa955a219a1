// What is in the way of a migration beside things in its places (PlacesTest.cpp): directories,
// locks, permissions, the device as a whole. What becomes of the device with the plug-in alone at
// work on it (`run --bare`), and in a run.

#include "tests/program/PlacesFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;
using enum DevicePlace;

constexpr const char* kPreferences = "/var/mobile/Library/Preferences";
constexpr const char* kMail = "/var/mobile/Library/Mail";
constexpr const char* kCrashReporter = "/var/mobile/Library/Logs/CrashReporter";

struct Obstacle {
  const char* name;
  void (*put)(PlacesFixture& device);
  PlacesOutcome alone;
  PlacesOutcome inARun = kTheSame;
  ForetoldLogs logs = ForetoldLogs::AreTheSame;
};

const Obstacle kObstacles[] = {
    {"Nothing", [](PlacesFixture&) {}, {0, "all"}},
    // Files that are one another.
    {"ACopyAsideThatIsTheSettingsFile",
     [](PlacesFixture& device) { fs::create_hard_link(device.at(Settings), device.at(CopyAside)); },
     {0, "all but +CopyAside"}},
    {"ACopyAsideThatLeadsToTheSettingsFile",
     [](PlacesFixture& device) { fs::create_symlink(kSettingsPath, device.at(CopyAside)); },
     {0, "all but +CopyAside; ~CopyAside"}},
    // The plug-in removes what was copied aside before, and so the accounts; a run has read them.
    {"SettingsThatLeadToTheCopyAside",
     [](PlacesFixture& device) {
       fs::rename(device.at(Settings), device.at(CopyAside));
       fs::create_symlink(kSettingsCopyPath, device.at(Settings));
     },
     {0, "all but ~Settings(SEM) +CopyAside; ~Settings(EMDeviceLocalAccount) -CopyAside",
      "Cannot open /var/mobile/Library/Preferences/com.quarx.accountsettings.plist: No such file "
      "or directory"},
     {0, "all but +CopyAside"},
     ForetoldLogs::Differ},
    // Directories that lead to one another, or elsewhere.
    {"CrashReporterLeadsToPreferences",
     [](PlacesFixture& device) { device.linkDirectory(kCrashReporter, kPreferences); },
     {0,
      "all but ~Settings(SEM) +CopyAside +InformationDirectory+File; "
      "~Settings(EMDeviceLocalAccount) +/var/mobile/Library/Preferences/AccountMigration "
      "+/var/mobile/Library/Preferences/AccountMigration/AccountMigrationInformation-TIME.txt",
      "Cannot open /var/mobile/Library/Preferences/com.quarx.accountsettings.plist: No such file "
      "or directory"},
     {73, "nothing",
      "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist and "
      "/var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist are one file: their "
      "directories lead to one another"}},
    {"PreferencesLeadToCrashReporter",
     [](PlacesFixture& device) {
       fs::remove(device.here(kCrashReporter));
       device.moveDirectory(kPreferences, kCrashReporter);
     },
     {0,
      "all but ~Settings(SEM) -LegacyExchange -LegacyExchangeOriginal +CopyAside; ~CopyAside "
      "-/var/mobile/Library/Logs/CrashReporter/com.quarx.DataAccess.plist "
      "-/var/mobile/Library/Logs/CrashReporter/com.quarx.DataAccess.plist.original",
      "Cannot open /var/mobile/Library/Preferences/com.quarx.accountsettings.plist: No such file "
      "or directory"},
     {73, "nothing",
      "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist and "
      "/var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist are one file: their "
      "directories lead to one another"}},
    {"MailLeadsToPreferences",
     [](PlacesFixture& device) { device.linkDirectory(kMail, kPreferences); },
     {0,
      "all but ~Settings(SEM) -LegacyMail -LegacyMailOriginal -AutoFetchEnabled; ~Settings(SE)"}},
    {"MailLeadsElsewhere",
     [](PlacesFixture& device) { device.moveDirectory(kMail, "/var/mail"); },
     {0,
      "all but -LegacyMail -LegacyMailOriginal -AutoFetchEnabled; -/var/mail/Accounts.plist "
      "-/var/mail/Accounts.plist.original -/var/mail/AutoFetchEnabled"}},
    {"PreferencesLeadElsewhere",
     [](PlacesFixture& device) { device.moveDirectory(kPreferences, "/var/preferences"); },
     {0,
      "all but ~Settings(SEM) -LegacyExchange -LegacyExchangeOriginal; "
      "-/var/preferences/com.quarx.DataAccess.plist "
      "-/var/preferences/com.quarx.DataAccess.plist.original "
      "~/var/preferences/com.quarx.accountsettings.plist"}},
    {"NoPreferences",
     [](PlacesFixture& device) { fs::remove_all(device.here(kPreferences)); },
     {0, "-LegacyMail -LegacyMailOriginal -AutoFetchEnabled",
      "Cannot open /var/mobile/Library/Preferences: No such file or directory"},
     {2, "nothing",
      "was not written: Cannot open /var/mobile/Library/Preferences: No such file or directory; "
      "nothing is changed"}},
    {"NoMail",
     [](PlacesFixture& device) { fs::remove_all(device.here(kMail)); },
     {0,
      "all but ~Settings(SEM) -LegacyMail -LegacyMailOriginal -AutoFetchEnabled; ~Settings(SE)"}},
    {"NoCrashReporter",
     [](PlacesFixture& device) { fs::remove_all(device.here(kCrashReporter)); },
     {0, "all but +CopyAside; +/var/mobile/Library/Logs/CrashReporter",
      "Cannot open /var/mobile/Library/Logs/CrashReporter: No such file or directory"}},
    {"ImmutablePreferences",
     [](PlacesFixture& device) { device.makeImmutable(kPreferences); },
     {0, "all but ~Settings(SEM) -LegacyExchange -LegacyExchangeOriginal -LegacyMail",
      "Cannot remove /var/mobile/Library/Preferences/com.quarx.DataAccess.plist: Operation not "
      "permitted"},
     {2, "nothing",
      "was not written: Cannot create "
      "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist: Operation not permitted; "
      "nothing is changed"}},
    {"ImmutableMail",
     [](PlacesFixture& device) { device.makeImmutable(kMail); },
     {0, "all but -LegacyMail -LegacyMailOriginal -AutoFetchEnabled",
      "Cannot remove /var/mobile/Library/Mail/Accounts.plist: Operation not permitted"},
     {0, "all but -LegacyMail -LegacyMailOriginal -AutoFetchEnabled; +CommitRecord",
      "/var/mobile/Library/Mail/Accounts.plist stays, although it is carried over; a later run "
      "removes it: Cannot remove /var/mobile/Library/Mail/Accounts.plist: Operation not "
      "permitted"}},
    {"ImmutableCrashReporter",
     [](PlacesFixture& device) { device.makeImmutable(kCrashReporter); },
     {0, "all but +CopyAside +InformationDirectory+File",
      "Cannot create /var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist: "
      "Operation not permitted"}},
    // The lock.
    {"NoLockDirectory",
     [](PlacesFixture& device) { fs::remove(device.here("/tmp")); },
     {1, "nothing", "The plug-in reported that it failed"},
     {1, "nothing", "no migration lock can be made: Cannot open /tmp: No such file or directory"}},
    {"AForeignLockFile",
     [](PlacesFixture& device) { device.writeText(kLockPath, "of somebody"); },
     {0, "all"}},
    {"ALinkForALock",
     [](PlacesFixture& device) { device.moveBehindLink(device.here(kLockPath)); },
     {1, "nothing", "The plug-in reported that it failed"},
     {1, "nothing",
      "no migration lock can be made: Cannot open /tmp/AccountMigrationInProgress: It is a "
      "symbolic link, not a regular file"}},
    {"ADirectoryForALock",
     [](PlacesFixture& device) { device.put("ADirectory", device.here(kLockPath)); },
     {1, "nothing", "The plug-in reported that it failed"},
     {1, "nothing",
      "no migration lock can be made: Cannot open /tmp/AccountMigrationInProgress: It is a "
      "directory, not a regular file"}},
    {"APipeForALock",
     [](PlacesFixture& device) { device.put("ANamedPipe", device.here(kLockPath)); },
     {1, "nothing", "The plug-in reported that it failed"},
     {1, "nothing",
      "no migration lock can be made: Cannot open /tmp/AccountMigrationInProgress: It is a named "
      "pipe, not a regular file"}},
    // The device as a whole.
    {"NoMobileUser",
     [](PlacesFixture& device) { device.writeText("/etc/passwd", "root:x:0:0::/:/bin/sh\n"); },
     {0, "all but ~Settings(SEM)",
      "Cannot find \"mobile\" in /etc/passwd: There is no usable entry"},
     {2, "nothing",
      "was not written: Cannot find \"mobile\" in /etc/passwd: There is no usable entry; nothing "
      "is changed"}},
    // A plan overlooks that nothing can be written.
    {"AReadOnlyMount",
     [](PlacesFixture& device) { device.mountReadOnly(); },
     {1, "nothing", "The plug-in reported that it failed"},
     {1, "nothing",
      "no migration lock can be made: Cannot create /tmp/AccountMigrationInProgress: Read-only "
      "file system"},
     ForetoldLogs::Differ},
    {"AReadOnlyMountWithALockFile",
     [](PlacesFixture& device) {
       device.writeText(kLockPath, "");
       device.mountReadOnly();
     },
     {0, "nothing",
      "Cannot remove /var/mobile/Library/Preferences/com.quarx.DataAccess.plist: Read-only file "
      "system"},
     {2, "nothing",
      "was not written: Cannot create "
      "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist: Read-only file system; "
      "nothing is changed"},
     ForetoldLogs::Differ},
    {"AHomeElsewhere", [](PlacesFixture& device) { device.moveHome("/var/anna"); }, {0, "all"}},
    // Permissions that an ordinary user has not.
    {"AnOrdinaryUserOfAnOwnDevice",
     [](PlacesFixture& device) { device.becomeOrdinaryUser(); },
     {0, "all"}},
    {"NotToReadSettings",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.at(Settings), 0);
     },
     {0, "all but ~Settings(SEM) +CopyAside; ~Settings(EMDeviceLocalAccount)",
      "Cannot open /var/mobile/Library/Preferences/com.quarx.accountsettings.plist: Permission "
      "denied"},
     {66, "nothing",
      "Cannot open /var/mobile/Library/Preferences/com.quarx.accountsettings.plist: Permission "
      "denied"}},
    {"NotToReadLegacyExchange",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.at(LegacyExchange), 0);
     },
     {0, "all but ~Settings(SEM); ~Settings(SM)"},
     {66, "nothing",
      "Cannot open /var/mobile/Library/Preferences/com.quarx.DataAccess.plist: Permission denied"}},
    {"NotToReadLegacyMail",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.at(LegacyMail), 0);
     },
     {0, "all but ~Settings(SEM); ~Settings(SE)"},
     {66, "nothing", "Cannot open /var/mobile/Library/Mail/Accounts.plist: Permission denied"}},
    {"NotToReadLoggingPreferences",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.at(LoggingPreferences), 0);
     },
     {0, "all but +InformationDirectory+File"},
     {66, "nothing",
      "Cannot open /var/mobile/Library/Preferences/com.quarx.accountsettings-logging.plist: "
      "Permission denied"}},
    {"NotToEnterMail",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.here(kMail), 0700);
     },
     {0, "all but ~Settings(SEM) -LegacyMail -LegacyMailOriginal -AutoFetchEnabled; ~Settings(SE)"},
     {66, "nothing", "Cannot examine /var/mobile/Library/Mail/Accounts.plist: Permission denied"}},
    {"NotToWriteInPreferences",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.here(kPreferences), 0755);
     },
     {0, "all but ~Settings(SEM) -LegacyExchange -LegacyExchangeOriginal -LegacyMail",
      "Cannot remove /var/mobile/Library/Preferences/com.quarx.DataAccess.plist: Permission "
      "denied"},
     {2, "nothing",
      "was not written: Cannot create "
      "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist: Permission denied; nothing "
      "is changed"}},
    {"NotToWriteInMail",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.here(kMail), 0755);
     },
     {0, "all but -LegacyMail -LegacyMailOriginal -AutoFetchEnabled",
      "Cannot remove /var/mobile/Library/Mail/Accounts.plist: Permission denied"},
     {0, "all but -LegacyMail -LegacyMailOriginal -AutoFetchEnabled; +CommitRecord",
      "/var/mobile/Library/Mail/Accounts.plist stays, although it is carried over; a later run "
      "removes it: Cannot remove /var/mobile/Library/Mail/Accounts.plist: Permission denied"}},
    {"NotToWriteInCrashReporter",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.here(kCrashReporter), 0755);
     },
     {0, "all but +CopyAside +InformationDirectory+File",
      "Cannot create /var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist: "
      "Permission denied"}},
    {"NotToWriteInInformationDirectory",
     [](PlacesFixture& device) {
       fs::create_directory(device.here(kInformationDirectory));
       device.becomeOrdinaryUser();
       device.giveToRoot(device.here(kInformationDirectory), 0755);
     },
     {0, "all but +InformationDirectory+File"}},
    {"NotToWriteInLibrary",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.here("/var/mobile/Library"), 0755);
     },
     {0, "all"},
     {73, "nothing",
      "The commit record cannot be written: Cannot create the directory "
      "/var/mobile/Library/AccountMigration: Permission denied"}},
    {"NotToRemoveWhatIsRoots",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.here(kMail), 01777);
       device.giveToRoot(device.at(LegacyMail), 0644);
     },
     {0, "all but -LegacyMail",
      "Cannot remove /var/mobile/Library/Mail/Accounts.plist: Operation not permitted"},
     {0, "all but -LegacyMail; +CommitRecord",
      "/var/mobile/Library/Mail/Accounts.plist stays, although it is carried over; a later run "
      "removes it: Cannot remove /var/mobile/Library/Mail/Accounts.plist: Operation not "
      "permitted"}},
    {"NotToMakeTheLock",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.here("/tmp"), 0755);
     },
     {1, "nothing", "The plug-in reported that it failed"},
     {1, "nothing",
      "no migration lock can be made: Cannot create /tmp/AccountMigrationInProgress: Permission "
      "denied"}},
    {"NotToOpenTheLock",
     [](PlacesFixture& device) {
       device.writeText(kLockPath, "");
       device.becomeOrdinaryUser();
       device.giveToRoot(device.here(kLockPath), 0600);
     },
     {1, "nothing", "The plug-in reported that it failed"},
     {1, "nothing",
      "no migration lock can be made: Cannot open /tmp/AccountMigrationInProgress: Permission "
      "denied"}},
    {"ASettingsFileOfRoot",
     [](PlacesFixture& device) {
       device.becomeOrdinaryUser();
       device.giveToRoot(device.at(Settings), 0644);
     },
     {0, "all"}},
};

std::ostream& operator<<(std::ostream& stream, const Obstacle& obstacle) {
  return stream << obstacle.name;
}

class Obstacles : public PlacesFixture, public testing::WithParamInterface<Obstacle> {
 protected:
  void SetUp() override {
    GetParam().put(*this);
    if (reason()) {
      GTEST_SKIP() << *reason();
    }
  }
};

TEST_P(Obstacles, AreMetByThePluginAlone) {
  expectAlone(GetParam().alone, GetParam().logs);
}

TEST_P(Obstacles, AreMetByARun) {
  expectInARun(GetParam().inARun.isTheSame() ? GetParam().alone : GetParam().inARun);
}

INSTANTIATE_TEST_SUITE_P(Obstacle, Obstacles, testing::ValuesIn(kObstacles),
                         [](const auto& information) {
                           return std::string(information.param.name);
                         });

}  // namespace
}  // namespace accounts
