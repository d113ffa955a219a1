#include <fcntl.h>
#include <sys/file.h>

#include <fstream>
#include <sstream>

#include "tests/fleet/FleetFixture.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/SmallDisk.h"

// How examples/fleet/migrate-fleet is used, and what it leaves.

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr int kMissingProgram = 69;

class FleetProgram : public FleetFixture {
 protected:
  [[nodiscard]] std::string roots() const { return directory() / "roots.txt"; }
  [[nodiscard]] std::string results() const { return directory() / "results"; }
  [[nodiscard]] ProgramResult run(const std::vector<std::string>& arguments) const {
    return runProgram(call(example("migrate-fleet"), arguments));
  }
  [[nodiscard]] ProgramResult migrateFleet() const { return run({roots(), results()}); }
  /// The files in one of the directories, those that are hidden included.
  [[nodiscard]] std::vector<fs::path> filesIn(const std::string& name) const {
    std::vector<fs::path> files;
    for (const auto& entry : fs::directory_iterator(fs::path(results()) / name)) {
      files.push_back(entry.path());
    }
    std::sort(files.begin(), files.end());
    return files;
  }
  static std::string textOf(const fs::path& path) {
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
  }

  void expectRefused(const std::vector<std::string>& arguments, int exitStatus,
                     const std::string& naming) const {
    const ProgramResult result = run(arguments);
    EXPECT_EQ(result.exitStatus, exitStatus) << result.output;
    EXPECT_EQ(result.output, "");
    EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
    EXPECT_TRUE(result.errors.starts_with("migrate-fleet: ")) << result.errors;
    EXPECT_NE(result.errors.find(naming), std::string::npos) << result.errors;
  }
};

TEST_F(FleetProgram, TellsHowItIsUsed) {
  const ProgramResult result = run({"--help"});

  EXPECT_EQ(result.exitStatus, 0);
  for (const char* word :
       {"Usage: ", "--jobs", "--reports", "--again", "--summary", "Exit status"}) {
    EXPECT_NE(result.output.find(word), std::string::npos) << word;
  }
  EXPECT_NE(runProgram(call(example("migrate-image"), {"--help"})).output.find("Usage: "),
            std::string::npos);
}

TEST_F(FleetProgram, RefusesArgumentsThatItCannotUse) {
  (void)makeImages(1);
  std::ofstream(directory() / "blank") << "\n  \r\n\t\n";

  expectRefused({}, kUnusableArguments, "A file with roots and a directory are needed");
  expectRefused({roots()}, kUnusableArguments, "A file with roots and a directory are needed");
  expectRefused({"--rot13", roots(), results()}, kUnusableArguments, "--rot13");
  expectRefused({"--jobs", "many", roots(), results()}, kUnusableArguments, "--jobs");
  expectRefused({"--jobs"}, kUnusableArguments, "--jobs");
  expectRefused({roots(), results(), "--root=/"}, kUnusableArguments,
                "--root=/ is not for a fleet");
  expectRefused({directory() / "none", results()}, kMissingInput, "none");
  expectRefused({directory() / "blank", results()}, kMissingInput, "names no image");
  expectRefused({roots(), roots() + "/results"}, kCannotCreate, "roots.txt/results");
  EXPECT_EQ(versionOf(1), 11);
}

TEST_F(FleetProgram, NamesAProgramThatIsMissing) {
  (void)makeImages(1);
  fs::create_directory(directory() / "bin");
  for (const char* program : {"bash", "sed", "awk", "readlink", "dirname", "flock", "parallel"}) {
    const ProgramResult found =
        runProgram(call("sh", {"-c", "command -v " + std::string(program)}));
    fs::create_symlink(found.outputLines().at(0), directory() / "bin" / program);
  }
  environment["PATH"] = (directory() / "bin").string();

  expectRefused({roots(), results()}, kMissingProgram, "The program migration-host is missing");
}

TEST_F(FleetProgram, ReadsListsAsEditorsLeaveThem) {
  (void)makeImages(3);
  std::ofstream(roots()) << "\n"
                         << image(1).string() << "\r\n  \r\n"
                         << image(2).string() << "\n\n"
                         << image(1).string() << "\n"
                         << image(3).string();

  const ProgramResult result = migrateFleet();

  EXPECT_EQ(result.exitStatus, 0) << result.output << result.errors;
  EXPECT_NE(result.output.find("3\t0\tmigrated\n"), std::string::npos) << result.output;
  EXPECT_EQ(versionOf(3), 12);
}

TEST_F(FleetProgram, KeepsAResultAndALogOfEachImage) {
  (void)makeImages(2);

  EXPECT_EQ(migrateFleet().exitStatus, 0);

  ASSERT_EQ(filesIn("results").size(), 2U);
  ASSERT_EQ(filesIn("logs").size(), 2U);
  EXPECT_EQ(textOf(filesIn("logs")[1]), "Migrating accounts\n");
  EXPECT_EQ(nlohmann::json::parse(textOf(filesIn("results")[1]))["root"], image(2).string());
  EXPECT_EQ(filesIn("logs")[1].stem(), filesIn("results")[1].stem());
  EXPECT_FALSE(fs::exists(fs::path(results()) / "reports") && !filesIn("reports").empty());
}

TEST_F(FleetProgram, WritesAReportAndAPageOfEachImageIfWanted) {
  (void)makeImages(2);

  EXPECT_EQ(run({"--reports", roots(), results()}).exitStatus, 0);

  ASSERT_EQ(filesIn("reports").size(), 4U);
  for (const fs::path& file : filesIn("reports")) {
    EXPECT_TRUE(textOf(file).starts_with(file.extension() == ".html" ? "<!" : "{")) << file;
  }
  // As a browser reads the link: %25 is what %2F begins with in the file's name.
  std::string link = "reports/" + filesIn("reports")[0].filename().string();
  for (std::size_t place = link.find('%'); place != std::string::npos;
       place = link.find('%', place + 3)) {
    link.replace(place, 1, "%25");
  }
  for (std::size_t place = link.find(' '); place != std::string::npos; place = link.find(' ')) {
    link.replace(place, 1, "%20");
  }
  EXPECT_NE(textOf(fs::path(results()) / "images.html").find("<a href=\"" + link + "\">"),
            std::string::npos)
      << link;
}

TEST_F(FleetProgram, GivesOptionsToEachRun) {
  (void)makeImages(1);

  EXPECT_EQ(run({roots(), results(), "--channel", directory() / "channel of all"}).exitStatus, 0);

  EXPECT_NE(textOf(directory() / "channel of all"), "");
  expectRefused({roots(), results(), "--report", "x"}, kUnusableArguments, "not for a fleet");
}

TEST_F(FleetProgram, RunsAgainWhatHasNoWholeResult) {
  (void)makeImages(3);
  EXPECT_EQ(migrateFleet().exitStatus, 0);
  const std::vector<fs::path> files = filesIn("results");
  const std::string whole = textOf(files[0]);
  const auto time = fs::last_write_time(files[2]);
  std::ofstream(files[0]) << whole.substr(0, whole.size() / 2);
  std::ofstream(files[1]).flush();

  const ProgramResult resumed = migrateFleet();

  EXPECT_EQ(resumed.exitStatus, 0) << resumed.output << resumed.errors;
  EXPECT_EQ(nlohmann::json::parse(textOf(files[0]))["exitStatus"], 0);
  EXPECT_EQ(nlohmann::json::parse(textOf(files[1]))["exitStatus"], 0);
  EXPECT_EQ(fs::last_write_time(files[2]), time);
}

TEST_F(FleetProgram, TellsHowFarTheResultsAreWithoutRunning) {
  (void)makeImages(2);

  const ProgramResult result = run({"--summary", roots(), results()});

  EXPECT_EQ(result.exitStatus, 1);
  EXPECT_NE(result.output.find("2\t\tno result yet\n"), std::string::npos) << result.output;
  EXPECT_EQ(versionOf(1), 11);
}

TEST_F(FleetProgram, SwallowsNothingWhereTheDiskWithTheResultsIsFull) {
  (void)makeImages(6);
  fs::create_directory(results());
  const SmallDisk disk(SmallDisk::Kind::Memory, results());
  if (disk.reason()) {
    GTEST_SKIP() << *disk.reason();
  }
  fs::create_directory(results() + "/results");
  fs::create_directory(results() + "/logs");
  fs::create_directory(results() + "/reports");
  // Room for the result of one image and for its log, but not for those of six.
  disk.leaveBlocks(3);

  const ProgramResult full = migrateFleet();

  EXPECT_NE(full.exitStatus, 0) << full.output;
  EXPECT_NE(full.output.find("no result yet\n"), std::string::npos) << full.output;
  EXPECT_NE(full.errors.find("No space left on device"), std::string::npos) << full.errors;
  disk.makeRoom();
  const ProgramResult resumed = migrateFleet();
  EXPECT_EQ(resumed.exitStatus, 0) << resumed.output << resumed.errors;
  EXPECT_NE(resumed.output.find("6\t0\tmigrated\n"), std::string::npos) << resumed.output;
  for (const fs::path& file : filesIn("results")) {
    EXPECT_FALSE(file.filename().string().starts_with('.')) << file;
  }
}

TEST_F(FleetProgram, OneFleetAtATimeUsesADirectory) {
  (void)makeImages(1);
  fs::create_directory(results());
  const int lock = open((results() + "/lock").c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
  ASSERT_EQ(flock(lock, LOCK_EX), 0);

  expectRefused({roots(), results()}, kMayPass, "Another fleet uses the directory");

  close(lock);
  EXPECT_EQ(migrateFleet().exitStatus, 0);
}

TEST_F(FleetProgram, ShowsABarOnATerminal) {
  (void)makeImages(3);
  std::string command = example("migrate-fleet");
  for (const std::string& argument : {roots(), results()}) {
    command += " '" + argument + "'";
  }
  // script(1) gives the program a terminal.
  const ProgramResult result =
      runProgram(call("script", {"--quiet", "--return", "--command", command, "/dev/null"}));

  EXPECT_EQ(result.exitStatus, 0) << result.output;
  EXPECT_NE(result.output.find("100% 3:0=0s"), std::string::npos) << result.output;
  EXPECT_EQ(migrateFleet().errors, "");
}

}  // namespace
}  // namespace accounts
