#include <fstream>
#include <sstream>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

/// The demo, with the programs of this build.
class Demo : public testing::Test {
 protected:
  static ProgramResult run(const std::string& line) {
    return runProgram({.program = "/bin/bash",
                       .arguments = {"-c", line},
                       .environment = {{"DEMO_BUILD", fs::path(NOTIFY_PROGRAM).parent_path()}},
                       .directory = SOURCE_DIRECTORY});
  }
};

TEST_F(Demo, EndsWithCommandsThatWork) {
  const ProgramResult demo = run("./demo");

  ASSERT_EQ(demo.exitStatus, 0) << demo.output << demo.errors;
  const std::string heading = "== What you can do next\n";
  ASSERT_NE(demo.output.find(heading), std::string::npos) << demo.output;
  std::istringstream next(demo.output.substr(demo.output.find(heading) + heading.size()));
  std::vector<std::string> commands;
  for (std::string line; std::getline(next, line);) {
    if (line.starts_with("  ")) {
      commands.push_back(line.substr(2));
    }
  }
  ASSERT_EQ(commands.size(), 5U) << demo.output;
  const std::string page = "file://";
  ASSERT_TRUE(commands[0].starts_with(page)) << commands[0];
  EXPECT_GT(fs::file_size(commands[0].substr(page.size())), 10'000U);
  const std::pair<std::string, int> expected[] = {
      {"plan", 0}, {"check", 0}, {"diff", kAttention}, {"restore", 0}};
  for (std::size_t number = 1; number < commands.size(); ++number) {
    const auto& [subcommand, exitStatus] = expected[number - 1];
    EXPECT_NE(commands[number].find(" " + subcommand + " "), std::string::npos);
    EXPECT_EQ(run(commands[number]).exitStatus, exitStatus) << commands[number];
  }
}

/// tools/install-dependencies on a machine where nothing is installed, with programs in the place
/// of Debian's that write down what they are asked to do.
class InstalledDependencies : public testing::Test {
 protected:
  InstalledDependencies() : directory_(makeTemporaryDirectory(Medium::Disk, "dependencies-")) {
    for (const char* program : {"dpkg-query", "apt-get", "sudo"}) {
      std::ofstream(directory_ / program) << "#!/bin/sh\n[ ${0##*/} = sudo ] && exec \"$@\"\n"
                                             "[ ${0##*/} = apt-get ] && echo \"asked: $*\"\n";
      fs::permissions(directory_ / program, fs::perms(0755));
    }
  }
  ~InstalledDependencies() override { fs::remove_all(directory_); }

  [[nodiscard]] ProgramResult install(const std::vector<std::string>& arguments) const {
    return runProgram({.program = SOURCE_DIRECTORY "/tools/install-dependencies",
                       .arguments = arguments,
                       .environment = {{"PATH", directory_.string() + ":/usr/bin:/bin"}}});
  }
  /// What apt-get is asked for, a blank before and behind each word.
  [[nodiscard]] std::string asked(const std::vector<std::string>& arguments) const {
    const ProgramResult result = install(arguments);
    EXPECT_EQ(result.exitStatus, 0) << result.errors;
    for (const std::string& line : result.outputLines()) {
      if (line.starts_with("asked: ")) {
        return line.substr(6) + " ";
      }
    }
    ADD_FAILURE() << result.output;
    return "";
  }

 private:
  fs::path directory_;
};

TEST_F(InstalledDependencies, AreFewForABuild) {
  const std::string words = asked({"--to-build"});

  EXPECT_TRUE(words.starts_with(" install --yes --no-install-recommends --no-upgrade ")) << words;
  for (const char* needed : {" g++ ", " cmake ", " libexpat1-dev ", " python3 "}) {
    EXPECT_NE(words.find(needed), std::string::npos) << words;
  }
  for (const char* other : {"clang", "lld", "chromium", "gtest", "benchmark", "slurm", "munge",
                            "parallel", "shellcheck"}) {
    EXPECT_EQ(words.find(other), std::string::npos) << words;
  }
}

TEST_F(InstalledDependencies, AreThoseOfTheTestsAsWellForACheck) {
  const std::string words = asked({});

  for (const char* needed : {" g++ ", " clang-19 ", " chromium ", " libgtest-dev ", " slurmd "}) {
    EXPECT_NE(words.find(needed), std::string::npos) << words;
  }
}

TEST_F(InstalledDependencies, AreToldByTheHelpAndByNothingElse) {
  EXPECT_NE(install({"--help"}).output.find("chromium"), std::string::npos);
  EXPECT_EQ(install({"--all"}).exitStatus, kUnusableArguments);
  EXPECT_EQ(install({"--to-build", "more"}).exitStatus, kUnusableArguments);
}

}  // namespace
}  // namespace accounts
