#include <gtest/gtest.h>
#include <sys/mount.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <map>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"
#include "tests/program/SmallDisk.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

PropertyArray oneOutgoingAccount() {
  return {PropertyDictionary{{"Identifier", "A"},
                             {"Type", "SMTP"},
                             {"Class", "SMTPAccount"},
                             {"Password", "very secret"},
                             {"uniqueId", "B"}}};
}

/// What `migration-host plan` shows, and that it only shows it.
class Plan : public DeviceRootFixture {
 protected:
  [[nodiscard]] ProgramResult plan(const std::vector<std::string>& arguments = {}) const {
    ProgramCall call = migrationCall(arguments);
    call.arguments.front() = "plan";
    return runProgram(call);
  }
  [[nodiscard]] nlohmann::json planned(const std::vector<std::string>& arguments = {}) const {
    std::vector<std::string> all = arguments;
    all.emplace_back("--json");
    return onlyObject(plan(all));
  }

  /// Every file with its contents and the time of its last change, every directory with that time.
  [[nodiscard]] std::map<std::string, std::string> tree() const {
    std::map<std::string, std::string> result;
    for (const fs::directory_entry& entry : fs::recursive_directory_iterator(root())) {
      const std::string path = entry.path().string();
      result[path] =
          std::to_string(entry.last_write_time().time_since_epoch().count()) + " " +
          (entry.is_regular_file() ? readText("/" + fs::relative(path, root()).string()) : "");
    }
    return result;
  }
};

nlohmann::json stageNamed(const nlohmann::json& report, const std::string& name) {
  for (const nlohmann::json& stage : report["stages"]) {
    if (stage["name"] == name) {
      return stage;
    }
  }
  ADD_FAILURE() << "no stage " << name;
  return {};
}

TEST_F(Plan, ChangesNothingBeneathTheRoot) {
  write(kSettingsPath, accountSettings(1, oneOutgoingAccount()));
  write(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{}}});
  const auto before = tree();

  EXPECT_EQ(plan().exitStatus, kNotAllCarriedOver);

  EXPECT_EQ(tree(), before);
}

TEST_F(Plan, ShowsEachPropertyOfAnAccountBeforeAndAfterAStep) {
  write(kSettingsPath,
        accountSettings(8, {PropertyDictionary{{"Identifier", "A"},
                                               {"Type", "QuarxAccount"},
                                               {"Class", "ZQAccount"},
                                               {"primaryAccount", true},
                                               {"Provisioned Dataclasses",
                                                PropertyArray{"com.quarx.Dataclass.Ubiquity"}}}}));

  const nlohmann::json stage = stageNamed(planned(), "_migrateAccountsFrom9B176:");

  ASSERT_EQ(stage["accounts"].size(), 1U) << stage;
  EXPECT_EQ(stage["accounts"][0]["identifier"], "A");
  EXPECT_EQ(stage["accounts"][0]["change"], "changed");
  const nlohmann::json expected = {
      {{"path", "Provisioned Dataclasses"},
       {"before", {"com.quarx.Dataclass.Ubiquity"}},
       {"after", {"com.quarx.Dataclass.Ubiquity", "com.quarx.Dataclass.Shoebox"}}}};
  EXPECT_EQ(stage["accounts"][0]["properties"], expected);
}

TEST_F(Plan, ShowsWhichFilesAreWrittenAndRemoved) {
  write(kLegacyExchangePath, PropertyDictionary{{"DAAccountsKey", PropertyArray{}}});

  const nlohmann::json report = planned();

  EXPECT_EQ(stageNamed(report, "saveAllAccounts")["files"],
            (nlohmann::json{{{"action", "written"}, {"path", kSettingsPath}}}));
  EXPECT_EQ(stageNamed(report, "_removeOldAccountsInfo")["files"],
            (nlohmann::json{{{"action", "created"}, {"path", kSentinelPath}},
                            {{"action", "removed"}, {"path", kLegacyExchangePath}},
                            {{"action", "removed"}, {"path", kSentinelPath}}}));
}

TEST_F(Plan, ShowsTheAccountsOfEveryStoreBefore) {
  write(kSettingsPath, accountSettings(1, oneOutgoingAccount()));
  write(kLegacyExchangePath,
        PropertyDictionary{{"DAAccountsKey", PropertyArray{PropertyDictionary{
                                                 {"DAAccountConfigurationClass", "ASAccount"},
                                                 {"DAAccountConfigurationAccountID", "E"}}}}});

  const nlohmann::json report = planned();

  ASSERT_EQ(report["accountsBefore"].size(), 2U);
  EXPECT_EQ(report["accountsBefore"][0]["source"], "accountSettings");
  EXPECT_EQ(report["accountsBefore"][1]["source"], "exchangeStore");
  EXPECT_EQ(report["accountsBefore"][1]["identifier"], "E");
  EXPECT_EQ(report["versions"], (nlohmann::json{{"before", 1}, {"after", 12}}));
}

TEST_F(Plan, HidesSecretsUnlessAskedForThem) {
  write(kSettingsPath, accountSettings(1, oneOutgoingAccount()));

  EXPECT_EQ(planned().dump().find("very secret"), std::string::npos);
  EXPECT_NE(planned({"--show-secrets"}).dump().find("very secret"), std::string::npos);
}

TEST_F(Plan, IsReadableForPeople) {
  write(kSettingsPath, accountSettings(11, oneOutgoingAccount()));

  const ProgramResult result = plan();

  const std::vector<std::string> lines = result.outputLines();
  ASSERT_GE(lines.size(), 2U);
  EXPECT_EQ(lines[0], "Would migrate " + root());
  EXPECT_EQ(lines[1], "    version 11 to 12, 1 accounts to 1");
  EXPECT_NE(result.output.find("Save the accounts (saveAllAccounts)\n    written " +
                               std::string(kSettingsPath) + "\n"),
            std::string::npos)
      << result.output;
}

TEST_F(Plan, OfADeviceThatNeedsNothingShowsTheSaveAlone) {
  write(kSettingsPath, accountSettings(12));

  const nlohmann::json report = planned();

  for (const nlohmann::json& stage : report["stages"]) {
    EXPECT_TRUE(stage["accounts"].empty()) << stage;
  }
}

TEST_F(Plan, ForeseesThatNoLockCanBeMade) {
  fs::remove_all(onThisMachine("/tmp"));

  const ProgramResult result = plan();

  EXPECT_EQ(result.exitStatus, 1);
  EXPECT_EQ(result.exitStatus, migrate().exitStatus);
}

TEST_F(Plan, ForeseesThatTheSettingsFileCannotBeGivenToItsOwner) {
  write(kSettingsPath, accountSettings(11));
  writeText("/etc/passwd", "root:x:0:0::/:/bin/sh\n");

  const nlohmann::json report = planned();

  EXPECT_EQ(report["exitStatus"], 2);
  EXPECT_EQ(migrate().exitStatus, 2);
}

TEST_F(Plan, ForeseesThatAnAccountWouldNotBeCarriedOver) {
  write(kLegacyMailPath,
        PropertyDictionary{{"MailAccounts", PropertyArray{PropertyDictionary{
                                                {"uniqueId", "M"}, {"AccountName", "No class"}}}}});

  const nlohmann::json report = planned();

  EXPECT_EQ(report["exitStatus"], kNotAllCarriedOver);
  EXPECT_EQ(report["outcome"],
            "Migrated, but 1 account was not carried over: MailAccounts[0] \"No class\" "
            "(identifier M) of " +
                std::string(kLegacyMailPath) + ": it has no class");
  EXPECT_EQ(report["ledger"]["losses"],
            nlohmann::json::array({"MailAccounts[0] \"No class\" (identifier M) of " +
                                   std::string(kLegacyMailPath) + ": it has no class"}));
  EXPECT_EQ(report["warnings"],
            nlohmann::json::array({"1 account was not carried over: " +
                                   report["ledger"]["losses"][0].get<std::string>() +
                                   "; a run would keep the files as they were"}));
  EXPECT_EQ(stageNamed(report, "_migrateMailAccounts:")["succeeded"], false);
}

TEST_F(Plan, WorksOnARootThatIsMountedReadOnly) {
  const SmallDisk disk(SmallDisk::Kind::Memory, root());
  if (disk.reason()) {
    GTEST_SKIP() << *disk.reason();
  }
  fs::create_directories(onThisMachine("/tmp"));
  fs::create_directories(onThisMachine("/var/mobile"));
  writeText("/etc/passwd", "mobile:x:" + std::to_string(getuid()) + ":0::/:/bin/sh\n");
  writeText("/etc/group", "mobile:x:" + std::to_string(getgid()) + ":\n");
  write(kSettingsPath, accountSettings(1, oneOutgoingAccount()));
  ASSERT_EQ(mount(nullptr, root().c_str(), nullptr, MS_REMOUNT | MS_RDONLY, nullptr), 0);

  const nlohmann::json report = planned();

  EXPECT_EQ(report["exitStatus"], 0) << report["error"];
  EXPECT_EQ(report["versions"]["after"], 12);
}

TEST_F(Plan, OfAMissingRootIsAnErrorWithoutStages) {
  const ProgramResult result = runProgram(
      {.program = migrationHost(), .arguments = {"plan", "--root", root() + "/none", "--json"}});

  EXPECT_EQ(result.exitStatus, 66);
  EXPECT_TRUE(onlyObject(result)["stages"].empty());
}

}  // namespace
}  // namespace accounts
