#include <algorithm>
#include <filesystem>

#include "tests/program/ExitStatuses.h"
#include "tests/program/HostileRootFixture.h"
#include "tests/program/Programs.h"

// Names and texts with line breaks and control characters: a log of one line for each thing that
// happened must stay one, and a terminal must not be told to do anything.

namespace accounts {
namespace {

constexpr const char* kHostileName = "/a\nmigration-host: b\x1b[31m\x7f\r";
constexpr const char* kEscapedName = "a\\nmigration-host: b\\u001b[31m\\u007f\\r";

class HostileNames : public HostileRootFixture {
 protected:
  [[nodiscard]] std::string hostileRoot() const { return root() + kHostileName; }

  [[nodiscard]] static ProgramResult migrateRoot(const std::string& path) {
    return runProgram(
        {.program = migrationHost(), .arguments = {"run", "--root", path, "--json", "--bare"}});
  }
};

TEST_F(HostileNames, OfAMissingRootAreEscaped) {
  const ProgramResult result = migrateRoot(hostileRoot());

  EXPECT_EQ(result.exitStatus, kMissingInput);
  EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
  EXPECT_NE(result.errors.find(kEscapedName), std::string::npos) << result.errors;
  expectClearReport(result);
}

TEST_F(HostileNames, OfARootAreReportedAsTheyAre) {
  std::filesystem::create_directories(hostileRoot() + "/tmp");

  const ProgramResult result = migrateRoot(hostileRoot());

  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  EXPECT_EQ(onlyObject(result)["root"], hostileRoot());
  expectClearReport(result);
}

TEST_F(HostileNames, ThatAreNoTextLeaveTheReportReadable) {
  const ProgramResult result = migrateRoot(root() + "/\xff\xfe");

  EXPECT_EQ(result.exitStatus, kMissingInput);
  EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
  expectClearReport(result);
}

TEST_F(HostileNames, OfAHomeAreEscapedInEveryLine) {
  const ProgramResult result = migrate({"--home", kHostileName, "--json", "--channel", "-"});

  expectClearReport(result);
  const std::vector<std::string> lines = result.errorLines();
  EXPECT_TRUE(std::none_of(lines.begin(), lines.end(), [](const std::string& line) {
    return line.starts_with("migration-host: b");
  })) << result.errors;
}

TEST_F(HostileNames, OfADeviceDescriptionAreEscaped) {
  const ProgramResult result = migrate({"--device", hostileRoot(), "--json"});

  EXPECT_EQ(result.exitStatus, kMissingInput);
  EXPECT_NE(result.errors.find(kEscapedName), std::string::npos) << result.errors;
  expectClearReport(result);
}

TEST_F(HostileNames, OfAChannelAreEscaped) {
  const ProgramResult result = migrate({"--channel", hostileRoot() + "/log", "--json"});

  EXPECT_EQ(result.exitStatus, kCannotCreate);
  EXPECT_NE(result.errors.find(kEscapedName), std::string::npos) << result.errors;
  expectClearReport(result);
}

TEST_F(HostileNames, OfABundleAreEscaped) {
  const ProgramResult result = migrate({"--plugin", hostileRoot(), "--json"});

  EXPECT_EQ(result.exitStatus, kMissingInput);
  EXPECT_NE(result.errors.find(kEscapedName), std::string::npos) << result.errors;
  expectClearReport(result);
}

TEST_F(HostileNames, InAccountsAreEscapedInEveryLine) {
  PropertyDictionary account;
  for (const char* key : {"Identifier", "Type", "Class", "DisplayName", "Username", "AccountType",
                          "uniqueId", "DAAccountConfigurationClass", "Hostname", kHostileName}) {
    account.set(key, kHostileName);
  }
  PropertyDictionary ofKnownType = account;
  ofKnownType.set("Type", "CalDAV");
  write(kSettingsPath, accountSettings(1, {account, ofKnownType}));
  write(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{account}},
                                            {"DeliveryAccounts", PropertyArray{account}}});
  write(kLegacyExchangePath, PropertyDictionary{{"DAAccountsKey", PropertyArray{account}}});

  const ProgramResult result = migrate({"--json", "--channel", "-"});

  EXPECT_EQ(result.exitStatus, kNotAllCarriedOver);
  EXPECT_NE(result.errors.find(kEscapedName), std::string::npos) << result.errors;
  expectClearReport(result);
}

}  // namespace
}  // namespace accounts
