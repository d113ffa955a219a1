#include <filesystem>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

constexpr const char* kMobileMail = "com.quarx.mobilemail";

/// What the host writes of a run that did what it should.
class HostReport : public DeviceRootFixture {};

TEST_F(HostReport, TheObjectTellsEverythingInTheAgreedKeys) {
  write(kSettingsPath, accountSettings(12));

  const nlohmann::json object = onlyObject(migrate({"--json"}));

  const nlohmann::json expected = {
      {"root", root()},
      {"dataClassName", "accounts"},
      {"result", true},
      {"steps", object["steps"]},
      {"broadcasts", {{{"application", kMobileMail}, {"key", "MailAccounts"}}}},
      {"cloudTabAnnouncements", 0},
      {"settingsSaves", {{"lastWritten", true}, {"replacedFile", true}}},
      {"keptInputs", nlohmann::json::array()},
      {"outcome", "Migrated"},
      {"ledger",
       {{"counts", object["ledger"]["counts"]},
        {"losses", nlohmann::json::array()},
        {"leftBehind", nlohmann::json::array()}}},
      {"warnings", nlohmann::json::array()},
      {"exitStatus", 0}};
  EXPECT_EQ(object, expected);
}

TEST_F(HostReport, TheSummaryTellsThePersonWhatWasAnnounced) {
  write(kSettingsPath, accountSettings(12));

  const ProgramResult result = migrate();

  EXPECT_EQ(
      result.outputLines(),
      (std::vector<std::string>{"Migrated the accounts of " + root() + ".",
                                "  Told com.quarx.mobilemail that its MailAccounts changed."}));
}

TEST_F(HostReport, TheConsoleLogGoesToStandardErrorAsItStands) {
  write(kSettingsPath, accountSettings(11));

  const ProgramResult result = migrate();

  EXPECT_EQ(result.errors, "Migrating accounts\n");
}

TEST_F(HostReport, TheChannelIsOffUnlessAskedFor) {
  write(kSettingsPath, accountSettings(11));

  EXPECT_EQ(migrate().errors.find("[com.quarx.accountsettings:log]"), std::string::npos);
}

TEST_F(HostReport, TheChannelCanGoToAFile) {
  write(kSettingsPath, accountSettings(11));

  const ProgramResult result = migrate({"--channel", onThisMachine("/channel.log").string()});

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_TRUE(readText("/channel.log").starts_with("[com.quarx.accountsettings:log] "));
  EXPECT_EQ(result.errors, "Migrating accounts\n");
}

TEST_F(HostReport, TheChannelCanJoinTheConsoleLog) {
  write(kSettingsPath, accountSettings(11));

  const ProgramResult result = migrate({"--channel", "-"});

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_NE(result.errors.find("[com.quarx.accountsettings:log] "), std::string::npos);
}

TEST_F(HostReport, BareIsAccepted) {
  write(kSettingsPath, accountSettings(11));

  EXPECT_EQ(migrate({"--bare"}).exitStatus, 0);
  EXPECT_EQ(readDictionary(kSettingsPath), accountSettings(12));
}

TEST_F(HostReport, TheRootIsReportedAsItWasNamed) {
  const std::filesystem::path parent = onThisMachine("/").parent_path().parent_path();
  const std::string named =
      parent.string() + "/./" + onThisMachine("/").parent_path().filename().string();

  const ProgramResult result =
      runProgram({.program = migrationHost(), .arguments = {"run", "--json", "--root", named}});

  EXPECT_EQ(onlyObject(result)["root"], named);
}

TEST_F(HostReport, ANamedDeviceDescriptionAnswersInsteadOfTheRootsOwn) {
  write(kSettingsPath, accountSettings(12));
  write(kDevicePropertyListPath, PropertyDictionary{});
  write(
      "/other.plist",
      PropertyDictionary{{"DeviceInfo", PropertyDictionary{{"RegionalBehaviorGoogleMail", true}}}});
  write(kLegacyMailPath,
        PropertyDictionary{
            {"MailAccounts", PropertyArray{PropertyDictionary{{"AccountType", "GmailAccount"}}}}});

  const ProgramResult result = migrate({"--device", onThisMachine("/other.plist").string()});

  EXPECT_EQ(result.exitStatus, 0);
  const PropertyArray accounts = readDictionary(kSettingsPath).arrayForKey("Accounts").value();
  ASSERT_EQ(accounts.size(), 1U);
  EXPECT_EQ(accounts.at(0).asDictionary()->textForKey("Type String"), "Google Mail");
}

TEST_F(HostReport, AnotherHomeDirectoryIsMigratedOnRequest) {
  write("/home/ada/Library/Mail/Accounts.plist",
        PropertyDictionary{{"MailAccounts", PropertyArray{}}});

  const ProgramResult result = migrate({"--home", "/home/ada"});

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_FALSE(exists("/home/ada/Library/Mail/Accounts.plist"));
}

TEST_F(HostReport, TheTemporaryDirectoryOfABareRunIsMadeForItsOwnerAlone) {
  migrate({"--bare"});

  ASSERT_TRUE(exists("/var/mobile/tmp"));
  EXPECT_EQ(std::filesystem::status(onThisMachine("/var/mobile/tmp")).permissions(),
            std::filesystem::perms::owner_all);
}

TEST_F(HostReport, ARunNeedsNoTemporaryDirectory) {
  migrate();

  EXPECT_TRUE(exists(kSettingsPath));
  EXPECT_FALSE(exists("/var/mobile/tmp"));
}

TEST_F(HostReport, AnotherTemporaryDirectoryIsUsedOnRequest) {
  std::filesystem::create_directory(onThisMachine("/var/scratch"));

  EXPECT_EQ(migrate({"--bare", "--temporary-directory", "/var/scratch"}).exitStatus, 0);

  EXPECT_TRUE(exists(kSettingsPath));
  EXPECT_FALSE(exists("/var/mobile/tmp"));
}

}  // namespace
}  // namespace accounts
