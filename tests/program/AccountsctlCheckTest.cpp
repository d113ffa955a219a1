#include "tests/program/AccountsctlFixture.h"

namespace accounts {
namespace {

class AccountsctlCheck : public AccountsctlFixture {
 protected:
  [[nodiscard]] std::string settingsWith(const PropertyDictionary& account) const {
    return write("settings",
                 PropertyDictionary{{"Version", 12}, {"Accounts", PropertyArray{account}}});
  }
  static PropertyDictionary cloudAccount() {
    return {{"Type", "QuarxAccount"},
            {"Class", "ZQAccount"},
            {"Identifier", "Q"},
            {"Enabled Dataclasses", PropertyArray{"com.quarx.Dataclass.Backup"}}};
  }
};

TEST_F(AccountsctlCheck, AFileAsItShouldBeGivesZero) {
  const ProgramResult result = run({"check", settingsWith(cloudAccount())});

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(result.output, "Nothing found\n");
  EXPECT_EQ(result.errors, "");
}

TEST_F(AccountsctlCheck, FindingsAreATableAndGiveOne) {
  const std::string file =
      settingsWith({{"Type", "Pigeon"}, {"Class", "C"}, {"DisplayName", "Loft"}});

  const ProgramResult result = run({"check", file});

  EXPECT_EQ(result.exitStatus, kAttention);
  EXPECT_EQ(result.output,
            "Place\tAccount\tEffect\tFinding\n"
            "1\tPigeon 'Loft'\tdropped\tThe type 'Pigeon' is unknown\n"
            "Not carried over: Accounts[0] \"Loft\" of " +
                file + ": its type is unknown\n");
  EXPECT_EQ(result.errors, "");
}

TEST_F(AccountsctlCheck, WithJSONFindingsAreOneObject) {
  const ProgramResult result = run(
      {"check", "--json", settingsWith({{"Type", "Pigeon"}, {"Class", "C"}, {"Identifier", "P"}})});

  EXPECT_EQ(result.exitStatus, kAttention);
  EXPECT_EQ(onlyObject(result)["findings"],
            nlohmann::json::array({{{"effect", "dropped"},
                                    {"code", "unknownType"},
                                    {"place", "1"},
                                    {"title", "Pigeon"},
                                    {"identifier", "P"},
                                    {"text", "The type 'Pigeon' is unknown"}}}));
}

TEST_F(AccountsctlCheck, WhatAMigrationOfTheFileWouldNotCarryOverIsNamed) {
  const std::string file = write(
      "mail", PropertyDictionary{
                  {"MailAccounts", PropertyArray{PropertyDictionary{{"AccountType", "IMAPAccount"},
                                                                    {"uniqueId", "M"}},
                                                 PropertyDictionary{}}}});
  const std::string first = "MailAccounts[0] (identifier M) of " + file +
                            ": another account of its store was refused, so the store stays out as "
                            "a whole";
  const std::string second = "MailAccounts[1] of " + file + ": it has no class";

  EXPECT_EQ(run({"check", file}).output,
            "Place\tAccount\tEffect\tFinding\n"
            "MailAccounts 2\tMail\trefused\tIt has no class\n"
            "Not carried over: " +
                first + "\nNot carried over: " + second + "\n");
  EXPECT_EQ(onlyObject(run({"check", "--json", file}))["ledger"]["losses"],
            nlohmann::json::array({first, second}));
}

TEST_F(AccountsctlCheck, TheProfilesOfTheDeviceDescriptionCount) {
  const std::string device = write(
      "device",
      PropertyDictionary{{"ProfileRestrictions", PropertyDictionary{{"allowCloudBackup", 2}}}});

  const ProgramResult result = run({"check", "--device", device, settingsWith(cloudAccount())});

  EXPECT_EQ(result.exitStatus, kAttention);
  EXPECT_NE(result.output.find("a profile does"), std::string::npos) << result.output;
}

TEST_F(AccountsctlCheck, LegacyStoresAreCheckedToo) {
  const std::string file =
      write("mail", PropertyDictionary{{"MailAccounts", PropertyArray{PropertyDictionary{}}}});

  const ProgramResult result = run({"check", file});

  EXPECT_EQ(result.exitStatus, kAttention);
  EXPECT_NE(result.output.find("refused"), std::string::npos) << result.output;
}

TEST_F(AccountsctlCheck, OtherKindsOfFilesAreRefused) {
  expectRefused(
      run({"check", write("file", PropertyDictionary{{"DeviceInfo", PropertyDictionary{}}})}),
      kMalformedInput, "device description");
  expectRefused(run({"check", write("file", "text")}), kMalformedInput, "of another kind");
}

TEST_F(AccountsctlCheck, AMissingBundleOrDeviceDescriptionIsMissingInput) {
  const std::string file = settingsWith(cloudAccount());

  expectRefused(run({"check", "--plugin", path("none"), file}), kMissingInput, "none");
  expectRefused(run({"check", "--device", path("none"), file}), kMissingInput, "none");
}

TEST_F(AccountsctlCheck, ABundleWithoutItsResourcesIsMissingInput) {
  std::filesystem::create_directories(path("bundle/Resources"));

  expectRefused(run({"check", "--plugin", path("bundle"), settingsWith(cloudAccount())}),
                kMissingInput, "AccountTypesProperties");
}

}  // namespace
}  // namespace accounts
