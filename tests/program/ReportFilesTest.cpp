#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>
#include <fstream>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/JSONSchema.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

/// The files that `run --report` and `--html` write.
class ReportFilesOfARun : public DeviceRootFixture {
 protected:
  ReportFilesOfARun() : outside_(makeTemporaryDirectory(Medium::Disk, "reports-")) {
    write(kSettingsPath, accountSettings(1, {PropertyDictionary{{"Identifier", "A"},
                                                                {"Type", "SMTP"},
                                                                {"Class", "SMTPAccount"},
                                                                {"uniqueId", "B"}}}));
  }
  ~ReportFilesOfARun() override { fs::remove_all(outside_); }

  [[nodiscard]] std::string path(const std::string& name) const {
    return (outside_ / name).string();
  }
  [[nodiscard]] nlohmann::json reportIn(const std::string& name) const {
    std::ifstream stream(path(name));
    nlohmann::json report = nlohmann::json::parse(stream);
    EXPECT_EQ(problemWithSchema(report), "");
    return report;
  }

 private:
  fs::path outside_;
};

TEST_F(ReportFilesOfARun, TellEachStageAndWhatBecameOfTheAccounts) {
  const ProgramResult result = migrate({"--report", path("report.json")});

  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  const nlohmann::json report = reportIn("report.json");
  EXPECT_EQ(report["command"], "run");
  EXPECT_EQ(report["result"], true);
  EXPECT_EQ(report["versions"], (nlohmann::json{{"before", 1}, {"after", 12}}));
  EXPECT_EQ(report["accountsBefore"][0]["identifier"], "A");
  EXPECT_EQ(report["accountsAfter"][0]["identifier"], "B");
  EXPECT_EQ(report["stages"][1]["name"], "initInsideOfMigration");
}

TEST_F(ReportFilesOfARun, HoldTheConsoleLinesAtTheirStage) {
  migrate({"--report", path("report.json")});

  const nlohmann::json report = reportIn("report.json");

  EXPECT_EQ(report["stages"][2]["log"],
            (nlohmann::json{{{"to", "console"}, {"text", "Migrating accounts"}}}));
}

TEST_F(ReportFilesOfARun, HoldTheChannelsLinesWhereTheChannelIsOn) {
  migrate({"--report", path("report.json"), "--channel", path("channel.log")});

  EXPECT_EQ(reportIn("report.json")["stages"][1]["log"][0]["to"], "channel");
}

TEST_F(ReportFilesOfARun, ChangeNothingOfTheMigration) {
  const std::string settings = readText(kSettingsPath);
  migrate();
  const PropertyDictionary expected = readDictionary(kSettingsPath);
  writeText(kSettingsPath, settings);

  migrate({"--report", path("report.json"), "--html", path("report.html")});

  EXPECT_EQ(readDictionary(kSettingsPath), expected);
}

TEST_F(ReportFilesOfARun, AreAlsoAPage) {
  migrate({"--html", path("report.html")});

  std::ifstream stream(path("report.html"));
  const std::string page(std::istreambuf_iterator<char>(stream), {});
  EXPECT_TRUE(page.starts_with("<!DOCTYPE html>") || page.starts_with("<!doctype html>"));
  EXPECT_NE(page.find("_migrateAccountsFrom7A150:"), std::string::npos);
}

TEST_F(ReportFilesOfARun, CanBeReadByTheirOwnerAlone) {
  migrate({"--report", path("report.json")});

  struct stat status = {};
  ASSERT_EQ(stat(path("report.json").c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777U, 0600U);
}

TEST_F(ReportFilesOfARun, ThatCannotBeWrittenKeepTheMigrationFromRunning) {
  const std::string settings = readText(kSettingsPath);

  const ProgramResult result = migrate({"--report", path("no/such/directory.json"), "--json"});

  EXPECT_EQ(result.exitStatus, 73);
  EXPECT_EQ(onlyObject(result)["exitStatus"], 73);
  EXPECT_EQ(readText(kSettingsPath), settings);
}

TEST_F(ReportFilesOfARun, ThatAreNotEmptyPathsAreNeeded) {
  EXPECT_EQ(migrate({"--report", ""}).exitStatus, 64);
}

TEST_F(ReportFilesOfARun, TellHowFarAPluginCameThatEndedTheProcess) {
  // The plug-in cannot go on without the account types that its resources list.
  fs::copy(pluginBundle(), onThisMachine("/bundle.migrator"), fs::copy_options::recursive);
  fs::remove(onThisMachine("/bundle.migrator/Resources/AccountTypesProperties.plist"));

  const ProgramResult result = migrate(
      {"--plugin", onThisMachine("/bundle.migrator").string(), "--report", path("report.json")});

  EXPECT_EQ(result.exitStatus, 70);
  const nlohmann::json report = reportIn("report.json");
  EXPECT_EQ(report["exitStatus"], 70);
  EXPECT_EQ(report["versions"]["before"], 1);
  ASSERT_FALSE(report["stages"].empty());
  const nlohmann::json& last = report["stages"].back();
  EXPECT_FALSE(last.contains("succeeded")) << last;
  EXPECT_NE(last["log"].dump().find("AccountTypesProperties"), std::string::npos) << last;
}

}  // namespace
}  // namespace accounts
