#include "commandline/BundleLocation.h"

#include <gtest/gtest.h>
#include <stdlib.h>

#include <filesystem>
#include <string>

namespace accounts {
namespace {

namespace fs = std::filesystem;

/// A prefix in a temporary directory, with a directory of programs in it.
class BundleLocation : public testing::Test {
 protected:
  BundleLocation() {
    std::string path = (fs::temp_directory_path() / "prefix-XXXXXX").string();
    EXPECT_NE(mkdtemp(path.data()), nullptr);
    prefix = path;
    fs::create_directories(programs());
  }
  ~BundleLocation() override { fs::remove_all(prefix); }

  [[nodiscard]] fs::path programs() const { return prefix / "bin"; }
  [[nodiscard]] fs::path besidePrograms() const { return programs() / "accounts.migrator"; }
  [[nodiscard]] fs::path installed() const { return prefix / "lib/accounts/accounts.migrator"; }

  fs::path prefix;
};

TEST_F(BundleLocation, ABuildHasItsBundleBesideTheProgram) {
  fs::create_directories(besidePrograms());
  fs::create_directories(installed());
  EXPECT_EQ(bundleOfProgramIn(programs()), besidePrograms());
}

TEST_F(BundleLocation, AnInstalledSystemHasItWithItsLibraries) {
  fs::create_directories(installed());
  EXPECT_EQ(bundleOfProgramIn(programs()), installed());
}

TEST_F(BundleLocation, WithoutAnyItIsMissedBesideTheProgram) {
  EXPECT_EQ(bundleOfProgramIn(programs()), besidePrograms());
}

}  // namespace
}  // namespace accounts
