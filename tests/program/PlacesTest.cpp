// What stands in a place that a migration reads or changes, and what becomes of the device: with
// the plug-in alone at work on it (`run --bare`), and in a run. What else can be in the way is in
// ObstaclesTest.cpp.

#include <cstring>

#include "tests/program/PlacesFixture.h"

namespace accounts {
namespace {

using enum DevicePlace;

constexpr const char* kALinkToAFile = "ALinkToAFile";

struct Thing {
  /// Of HostileKind.h, or a link to a regular file.
  const char* kind;
  DevicePlace place;
  PlacesOutcome alone;
  PlacesOutcome inARun = kTheSame;
};

const Thing kThings[] = {
    // A directory.
    {"ADirectory",
     Settings,
     {0, "all but ~Settings(SEM) +CopyAside",
      "Cannot open /var/mobile/Library/Preferences/com.quarx.accountsettings.plist: It is a "
      "directory, not a regular file"},
     {2, "nothing",
      "was not written: Cannot create "
      "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist: Is a directory; nothing is "
      "changed"}},
    {"ADirectory",
     LegacyExchange,
     {0, "all but ~Settings(SEM) -LegacyExchange; ~Settings(SM)"},
     {3, "all but ~Settings(SEM) -LegacyExchange; ~Settings(SM) +Kept",
      "/var/mobile/Library/Preferences/com.quarx.DataAccess.plist could not be read as a property "
      "list"}},
    {"ADirectory", LegacyExchangeOriginal, {0, "all but -LegacyExchangeOriginal"}},
    {"ADirectory",
     LegacyMail,
     {0, "all but ~Settings(SEM) -LegacyMail; ~Settings(SE)"},
     {3, "all but ~Settings(SEM) -LegacyMail; ~Settings(SE) +Kept",
      "/var/mobile/Library/Mail/Accounts.plist could not be read as a property list"}},
    {"ADirectory", LegacyMailOriginal, {0, "all but -LegacyMailOriginal"}},
    {"ADirectory",
     RemovalSentinel,
     {0, "-LegacyExchange -LegacyMail +CopyAside",
      "Cannot remove /var/mobile/Library/Preferences/.removingOldAccounts: Is a directory"},
     {2, "nothing", "has not the current version"}},
    {"ADirectory",
     CopyAside,
     {0, "all but +CopyAside",
      "Couldn't remove existing accountsettings copy at "
      "/var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist"}},
    {"ADirectory", AutoFetchEnabled, {0, "all but -AutoFetchEnabled"}},
    {"ADirectory", InformationDirectory, {0, "all but +InformationDirectory+File; +File"}},
    {"ADirectory", LoggingPreferences, {0, "all but +InformationDirectory+File"}},
    {"ADirectory",
     CommitRecord,
     {0, "all"},
     {73, "nothing",
      "The commit record cannot be written: Cannot replace "
      "/var/mobile/Library/AccountMigration/CommitRecord: Is a directory"}},
    // A link that leads to nothing on the device.
    {"ALinkToNothing",
     Settings,
     {0, "all but ~Settings(SEM) +CopyAside; ~Settings(EMDeviceLocalAccount)",
      "Cannot open /var/mobile/Library/Preferences/com.quarx.accountsettings.plist: No such file "
      "or directory"}},
    {"ALinkToNothing",
     LegacyExchange,
     {0, "all but ~Settings(SEM) -LegacyExchangeOriginal; ~Settings(SM)"}},
    {"ALinkToNothing", LegacyExchangeOriginal, {0, "all"}},
    {"ALinkToNothing",
     LegacyMail,
     {0, "all but ~Settings(SEM) -LegacyMailOriginal; ~Settings(SE)"}},
    {"ALinkToNothing", LegacyMailOriginal, {0, "all"}},
    {"ALinkToNothing", RemovalSentinel, {0, "all; -RemovalSentinel"}},
    {"ALinkToNothing",
     CopyAside,
     {0, "all but +CopyAside",
      "Cannot create /var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist: File "
      "exists"}},
    {"ALinkToNothing", AutoFetchEnabled, {0, "all"}},
    {"ALinkToNothing",
     InformationDirectory,
     {0, "all but +InformationDirectory+File",
      "Cannot create the directory /var/mobile/Library/Logs/CrashReporter/AccountMigration: File "
      "exists]"}},
    {"ALinkToNothing", LoggingPreferences, {0, "all but +InformationDirectory+File"}},
    {"ALinkToNothing", CommitRecord, {0, "all"}, {0, "all; -CommitRecord"}},
    // A named pipe.
    {"ANamedPipe",
     Settings,
     {0, "all but ~Settings(SEM) +CopyAside; ~Settings(EMDeviceLocalAccount)",
      "Cannot open /var/mobile/Library/Preferences/com.quarx.accountsettings.plist: It is a named "
      "pipe, not a regular file"},
     {3, "all but ~Settings(SEM) +CopyAside; ~Settings(EMDeviceLocalAccount) +Kept",
      "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist could not be read as a "
      "property list"}},
    {"ANamedPipe",
     LegacyExchange,
     {0, "all but ~Settings(SEM); ~Settings(SM)"},
     {3, "all but ~Settings(SEM); ~Settings(SM) +Kept",
      "/var/mobile/Library/Preferences/com.quarx.DataAccess.plist could not be read as a property "
      "list"}},
    {"ANamedPipe", LegacyExchangeOriginal, {0, "all"}},
    {"ANamedPipe",
     LegacyMail,
     {0, "all but ~Settings(SEM); ~Settings(SE)"},
     {3, "all but ~Settings(SEM); ~Settings(SE) +Kept",
      "/var/mobile/Library/Mail/Accounts.plist could not be read as a property list"}},
    {"ANamedPipe", LegacyMailOriginal, {0, "all"}},
    {"ANamedPipe",
     RemovalSentinel,
     {0, "-LegacyExchange -LegacyMail -RemovalSentinel +CopyAside",
      "Detected that a removal old accounts info was in progress. Early return!."},
     {2, "nothing", "has not the current version"}},
    {"ANamedPipe", CopyAside, {0, "all but +CopyAside; ~CopyAside"}},
    {"ANamedPipe", AutoFetchEnabled, {0, "all"}},
    {"ANamedPipe",
     InformationDirectory,
     {0, "all but +InformationDirectory+File",
      "/var/mobile/Library/Logs/CrashReporter/AccountMigration already exists and is not a "
      "directory"}},
    {"ANamedPipe", LoggingPreferences, {0, "all but +InformationDirectory+File"}},
    {"ANamedPipe", CommitRecord, {0, "all; -CommitRecord"}},
    // A file that nobody may change, rename or remove.
    {"AnImmutableFile",
     Settings,
     {0, "all but ~Settings(SEM)", "Failed to save accounts to filesystem."},
     {2, "nothing",
      "was not written: Cannot create "
      "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist: Operation not permitted; "
      "nothing is changed"}},
    {"AnImmutableFile",
     LegacyExchange,
     {0, "all but -LegacyExchange -LegacyMail",
      "Cannot remove /var/mobile/Library/Preferences/com.quarx.DataAccess.plist: Operation not "
      "permitted"},
     {0, "all but -LegacyExchange -LegacyMail; +CommitRecord",
      "/var/mobile/Library/Preferences/com.quarx.DataAccess.plist stays, although it is carried "
      "over; a later run removes it: Cannot remove "
      "/var/mobile/Library/Preferences/com.quarx.DataAccess.plist: Operation not permitted"}},
    {"AnImmutableFile", LegacyExchangeOriginal, {0, "all but -LegacyExchangeOriginal"}},
    {"AnImmutableFile",
     LegacyMail,
     {0, "all but -LegacyMail",
      "Cannot remove /var/mobile/Library/Mail/Accounts.plist: Operation not permitted"},
     {0, "all but -LegacyMail; +CommitRecord",
      "/var/mobile/Library/Mail/Accounts.plist stays, although it is carried over; a later run "
      "removes it: Cannot remove /var/mobile/Library/Mail/Accounts.plist: Operation not "
      "permitted"}},
    {"AnImmutableFile", LegacyMailOriginal, {0, "all but -LegacyMailOriginal"}},
    {"AnImmutableFile",
     RemovalSentinel,
     {0, "-LegacyExchange -LegacyMail +CopyAside",
      "Cannot remove /var/mobile/Library/Preferences/.removingOldAccounts: Operation not "
      "permitted"},
     {2, "nothing", "has not the current version"}},
    {"AnImmutableFile",
     CopyAside,
     {0, "all but +CopyAside",
      "Couldn't remove existing accountsettings copy at "
      "/var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist"}},
    {"AnImmutableFile", AutoFetchEnabled, {0, "all but -AutoFetchEnabled"}},
    {"AnImmutableFile",
     InformationDirectory,
     {0, "all but +InformationDirectory+File",
      "/var/mobile/Library/Logs/CrashReporter/AccountMigration already exists and is not a "
      "directory"}},
    {"AnImmutableFile", LoggingPreferences, {0, "all"}},
    {"AnImmutableFile",
     CommitRecord,
     {0, "all"},
     {73, "nothing",
      "The commit record cannot be written: Cannot exchange a file with "
      "/var/mobile/Library/AccountMigration/CommitRecord: Operation not permitted"}},
    // A link to a regular file.
    {kALinkToAFile, Settings, {0, "all"}},
    {kALinkToAFile, LegacyExchange, {0, "all"}},
    {kALinkToAFile, LegacyExchangeOriginal, {0, "all"}},
    {kALinkToAFile, LegacyMail, {0, "all"}},
    {kALinkToAFile, LegacyMailOriginal, {0, "all"}},
    {kALinkToAFile,
     RemovalSentinel,
     {0, "-LegacyExchange -LegacyMail -RemovalSentinel +CopyAside",
      "Detected that a removal old accounts info was in progress. Early return!."},
     {2, "nothing", "has not the current version"}},
    {kALinkToAFile, CopyAside, {0, "all but +CopyAside; ~CopyAside"}},
    {kALinkToAFile, AutoFetchEnabled, {0, "all"}},
    {kALinkToAFile,
     InformationDirectory,
     {0, "all but +InformationDirectory+File",
      "/var/mobile/Library/Logs/CrashReporter/AccountMigration already exists and is not a "
      "directory"}},
    {kALinkToAFile, LoggingPreferences, {0, "all"}},
    {kALinkToAFile, CommitRecord, {0, "all; -CommitRecord"}},
};

std::ostream& operator<<(std::ostream& stream, const Thing& thing) {
  return stream << thing.kind << " at " << listed(thing.place).name;
}

class Places : public PlacesFixture, public testing::WithParamInterface<Thing> {
 protected:
  void SetUp() override {
    if (std::strcmp(GetParam().kind, kALinkToAFile) == 0) {
      moveBehindLink(at(GetParam().place));
    } else {
      put(GetParam().kind, at(GetParam().place));
    }
    if (reason()) {
      GTEST_SKIP() << *reason();
    }
  }
};

TEST_P(Places, HoldAThingThatThePluginAloneMeets) {
  expectAlone(GetParam().alone);
}

TEST_P(Places, HoldAThingThatARunMeets) {
  expectInARun(GetParam().inARun.isTheSame() ? GetParam().alone : GetParam().inARun);
}

INSTANTIATE_TEST_SUITE_P(Thing, Places, testing::ValuesIn(kThings), [](const auto& information) {
  return std::string(information.param.kind) + "At" +
         std::string(listed(information.param.place).name);
});

}  // namespace
}  // namespace accounts
