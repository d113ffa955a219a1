#include <fstream>
#include <iostream>
#include <iterator>
#include <regex>

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
  for (const char* library :
       {"libcli11-dev", "libexpected-dev", "libfmt-dev", "nlohmann-json3-dev"}) {
    std::ifstream notice(prefix() / "share/doc/accounts-migration/licences" / library);
    const std::string text(std::istreambuf_iterator<char>(notice), {});
    EXPECT_NE(text.find("Copyright: "), std::string::npos) << library;
  }
}

TEST_F(InstalledPackages, HoldDirectoriesThatAllMayReadWhateverTheMaskOfWhoeverBuildsThem) {
  for (const char* const package : {"accounts-migration", "accounts-migration-dev"}) {
    const ProgramResult contents =
        succeed({.program = "dpkg-deb", .arguments = {"--contents", packageFile(package)}});
    for (const std::string& line : contents.outputLines()) {
      EXPECT_TRUE(line.starts_with("drwxr-xr-x ") || line.starts_with("-rw-r--r-- ") ||
                  line.starts_with("-rwxr-xr-x "))
          << line;
    }
  }
}

TEST_F(InstalledPackages, LackNothingThatDebianAsksForButALicence) {
  const ProgramResult result = runProgram(
      {.program = "lintian",
       .arguments = {"--suppress-tags", "no-copyright-file", packageFile("accounts-migration"),
                     packageFile("accounts-migration-dev")},
       .timeLimit = std::chrono::seconds(120)});
  EXPECT_EQ(result.output, "");
  EXPECT_EQ(result.exitStatus, 0) << result.errors;
}

TEST_F(InstalledPackages, BringASampleDeviceThatTheirProgramsMigrate) {
  install();
  const fs::path examples = prefix() / "share/doc/accounts-migration/examples";
  const std::string device = (directory() / "device").string();
  fs::copy(examples / "sample-device", device, fs::copy_options::recursive);
  succeed({.program = (examples / "complete-device-root").string(), .arguments = {device}});

  succeed({.program = (prefix() / "bin/migration-host").string(),
           .arguments = {"run", "--root", device}});

  const ProgramResult shown =
      succeed({.program = (examples / "show-accounts").string(), .arguments = {device}});
  EXPECT_NE(shown.output.find("version 12"), std::string::npos) << shown.output;
}

TEST_F(InstalledPackages, HoldDocumentsWhoseLinksLeadSomewhere) {
  install();
  const std::regex link("\\]\\(([^)#: ]+[.]md)");
  std::size_t links = 0;
  for (const fs::directory_entry& entry :
       fs::recursive_directory_iterator(prefix() / "share/doc/accounts-migration")) {
    if (entry.path().extension() != ".md") {
      continue;
    }
    std::ifstream document(entry.path());
    const std::string text(std::istreambuf_iterator<char>(document), {});
    for (std::sregex_iterator found(text.begin(), text.end(), link), end; found != end; ++found) {
      ++links;
      EXPECT_TRUE(fs::exists(entry.path().parent_path() / (*found)[1].str()))
          << entry.path() << ": " << (*found)[1];
    }
  }
  EXPECT_GT(links, 20u);
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
  remove("accounts-migration-dev");
  remove("accounts-migration");
  EXPECT_EQ(tree(machine()), std::set<std::string>{});
}

TEST_F(InstalledPackages, LeaveWhatIsNotTheirsWhenTheyAreRemoved) {
  install();
  fs::create_directories(prefix() / "lib/accounts/other");
  remove("accounts-migration-dev");
  remove("accounts-migration");
  EXPECT_EQ(tree(machine()), (std::set<std::string>{"usr", "usr/lib", "usr/lib/accounts",
                                                    "usr/lib/accounts/other"}));
}

}  // namespace
}  // namespace accounts
