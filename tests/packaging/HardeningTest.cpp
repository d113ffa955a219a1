#include <algorithm>
#include <cctype>
#include <fstream>
#include <iterator>
#include <string>
#include <string_view>

#include "tests/packaging/InstalledPackages.h"

namespace accounts {
namespace {

/// What is shipped, file by file.
class Hardening : public InstalledPackages, public testing::WithParamInterface<const char*> {
 protected:
  void SetUp() override { install(); }

  /// What readelf says of the file.
  [[nodiscard]] std::string readelf(const std::string& what) const {
    return succeed({.program = "readelf",
                    .arguments = {"--wide", what, (prefix() / GetParam()).string()}})
        .output;
  }
};

TEST_P(Hardening, GuardsTheStack) {
  EXPECT_NE(readelf("--dyn-syms").find("__stack_chk_fail"), std::string::npos);
}

TEST_P(Hardening, ChecksTheSizesThatTheCLibraryIsGiven) {
  if (std::string(GetParam()).ends_with(".so")) {
    GTEST_SKIP() << "The plug-in gives the C library no size that is not known to fit.";
  }
  EXPECT_NE(readelf("--dyn-syms").find("_chk@GLIBC"), std::string::npos);
}

TEST_P(Hardening, FindsAllSymbolsAtOnceAndWritesTheirPlacesNeverAgain) {
  EXPECT_NE(readelf("--segments").find("GNU_RELRO"), std::string::npos);
  const std::string dynamic = readelf("--dynamic");
  EXPECT_TRUE(dynamic.find("BIND_NOW") != std::string::npos ||
              dynamic.find("Flags: NOW") != std::string::npos)
      << dynamic;
}

TEST_P(Hardening, HasNoStackThatIsCode) {
  const std::string segments = readelf("--segments");
  const std::size_t stack = segments.find("GNU_STACK");
  ASSERT_NE(stack, std::string::npos);
  const std::string line = segments.substr(stack, segments.find('\n', stack) - stack);
  EXPECT_EQ(line.find('E'), std::string::npos) << line;
}

TEST_P(Hardening, CanBePutAnywhereInMemory) {
  EXPECT_NE(readelf("--file-header").find("DYN ("), std::string::npos);
}

#if defined(__x86_64__)
TEST_P(Hardening, LetsTheProcessorCheckWhereJumpsEnd) {
  // Every function that is called by its address begins with this instruction. That the note which
  // says so is in the file, too, is up to the system's own start files.
  constexpr std::string_view kEndOfJump = "\xf3\x0f\x1e\xfa";
  constexpr int kFewest = 100;
  std::ifstream file(prefix() / GetParam(), std::ios::binary);
  const std::string bytes(std::istreambuf_iterator<char>(file), {});
  int count = 0;
  for (std::size_t place = 0; (place = bytes.find(kEndOfJump, place)) != std::string::npos;
       ++place) {
    ++count;
  }
  EXPECT_GT(count, kFewest);
}
#endif

INSTANTIATE_TEST_SUITE_P(Shipped, Hardening,
                         testing::Values("bin/migration-host", "bin/accountsctl",
                                         "lib/accounts/accounts.migrator/AccountsDataMigrator.so"),
                         [](const auto& information) {
                           std::string name = information.param;
                           name = name.substr(name.rfind('/') + 1);
                           std::erase_if(name, [](char each) { return !std::isalnum(each); });
                           return name;
                         });

// No file shows it: how the files were built does.
TEST(HardeningOfTheBuild, GivesEveryVariableAValue) {
  std::ifstream file(BUILD_DIRECTORY "/compile_commands.json");
  int commands = 0;
  for (std::string line; std::getline(file, line);) {
    if (line.find("\"command\":") != std::string::npos) {
      ++commands;
      EXPECT_NE(line.find("-ftrivial-auto-var-init=zero"), std::string::npos) << line;
    }
  }
  EXPECT_GT(commands, 0);
}

}  // namespace
}  // namespace accounts
