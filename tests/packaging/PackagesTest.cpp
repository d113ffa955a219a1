#include <fstream>
#include <iostream>
#include <iterator>

#include "tests/packaging/InstalledPackages.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

TEST_F(InstalledPackages, NeedTheLibrariesOfTheProgramsAndNothingElse) {
  const std::string depends = field("accounts-migration", "Depends");
  for (const char* library :
       {"libc6 (>= ", "libexpat1 (>= ", "libseccomp2 (>= ", "libstdc++6 (>= ", "libuuid1 (>= "}) {
    EXPECT_NE(depends.find(library), std::string::npos) << depends;
  }
  EXPECT_EQ(depends.find("-dev"), std::string::npos) << depends;
  // Loaded only on request, so that a small machine need not have it.
  EXPECT_EQ(depends.find("libsystemd"), std::string::npos) << depends;
  EXPECT_NE(field("accounts-migration", "Suggests").find("libsystemd0"), std::string::npos);
}

TEST_F(InstalledPackages, HoldWhatAnInstallationHolds) {
  install();
  const fs::path installation = directory() / "installation";
  succeed({.program = "cmake",
           .arguments = {"--install", BUILD_DIRECTORY, "--prefix", "/usr"},
           .environment = {{"DESTDIR", installation.string()}}});
  std::set<std::string> packaged = tree(machine());
  EXPECT_EQ(packaged, tree(installation));
  EXPECT_TRUE(packaged.contains("usr/bin/migration-host"));
}

TEST_F(InstalledPackages, HoldTheNoticesOfTheLibrariesThatAreCompiledIn) {
  install();
  for (const char* library : {"libcli11-dev", "libfmt-dev", "nlohmann-json3-dev"}) {
    std::ifstream notice(prefix() / "share/doc/accounts-migration/licences" / library);
    const std::string text(std::istreambuf_iterator<char>(notice), {});
    EXPECT_NE(text.find("Copyright: "), std::string::npos) << library;
  }
}

TEST_F(InstalledPackages, PassTheEndToEndTestsOfTheBuild) {
  install();
  const ProgramResult result =
      succeed({.program = PROGRAM_TESTS,
               .arguments = {},
               // Generated devices show nothing new here: a few do.
               .environment = {{"ACCOUNTS_INSTALLED_PREFIX", prefix().string()},
                               {"GENERATED_DEVICES", "20"}},
               .timeLimit = std::chrono::seconds(240)});
  for (const std::string& line : result.outputLines()) {
    if (line.starts_with("[  PASSED  ]")) {
      std::cout << line << "\n";
    }
  }
}

TEST_F(InstalledPackages, LeaveNothingWhenTheyAreRemoved) {
  install();
  ASSERT_FALSE(tree(machine()).empty());
  remove("accounts-migration");
  remove("accounts-migration-dev");
  EXPECT_EQ(tree(machine()), std::set<std::string>{});
}

TEST_F(InstalledPackages, LeaveWhatIsNotTheirsWhenTheyAreRemoved) {
  install();
  fs::create_directories(prefix() / "lib/accounts/other");
  remove("accounts-migration");
  remove("accounts-migration-dev");
  EXPECT_EQ(tree(machine()), (std::set<std::string>{"usr", "usr/lib", "usr/lib/accounts",
                                                    "usr/lib/accounts/other"}));
}

}  // namespace
}  // namespace accounts
