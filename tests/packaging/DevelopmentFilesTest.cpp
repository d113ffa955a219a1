#include <fstream>

#include "platform/linux/DeviceRoot.h"
#include "platform/linux/LinuxConsoleLog.h"
#include "platform/linux/LinuxFrameworkLoader.h"
#include "tests/packaging/InstalledPackages.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

/// What the author of a framework has: the installed package and a copy of the examples.
class DevelopmentFiles : public InstalledPackages {
 protected:
  DevelopmentFiles() {
    install();
    fs::copy(prefix() / "share/doc/accounts-migration-dev/examples/frameworks", source(),
             fs::copy_options::recursive);
  }

  [[nodiscard]] fs::path source() const { return directory() / "source"; }
  [[nodiscard]] fs::path build() const { return directory() / "build"; }
  void configure() const {
    succeed({.program = "cmake",
             .arguments = {"-S", source().string(), "-B", build().string(),
                           "-DCMAKE_PREFIX_PATH=" + prefix().string()}});
  }
};

TEST_F(DevelopmentFiles, AreAllThatTheSmallestFrameworkIsBuiltFrom) {
  configure();
  succeed({.program = "cmake",
           .arguments = {"--build", build().string(), "--target", "DeviceAndCloudAccounts"},
           .timeLimit = std::chrono::seconds(240)});

  Failure error;
  const auto device = DeviceRoot::openRoot((build() / "frameworks").string(), error);
  ASSERT_TRUE(device) << error.text;
  LinuxConsoleLog log;
  LinuxFrameworkLoader loader(*device, log);
  const Result loaded =
      loader.loadFramework("/DeviceAndCloudAccounts.framework/DeviceAndCloudAccounts.so");
  ASSERT_TRUE(loaded) << loaded.error();
  EXPECT_NE(loader.classes().classNamed("CloudFullAccount"), nullptr);
  EXPECT_NE(loader.classes().classNamed("CloudAccountNotifier"), nullptr);
}

TEST_F(DevelopmentFiles, AreFoundUnderTheirNameAndVersion) {
  std::ofstream(source() / "CMakeLists.txt") << R"(
cmake_minimum_required(VERSION 3.25)
project(Versions LANGUAGES CXX)
find_package(AccountsFramework 99 QUIET)
message(STATUS "99: ${AccountsFramework_FOUND}")
find_package(AccountsFramework 0.1 REQUIRED)
message(STATUS "0.1: ${AccountsFramework_FOUND}")
)";
  const ProgramResult result =
      succeed({.program = "cmake",
               .arguments = {"-S", source().string(), "-B", build().string(),
                             "-DCMAKE_PREFIX_PATH=" + prefix().string()}});
  EXPECT_NE(result.output.find("-- 99: 0\n"), std::string::npos) << result.output;
  EXPECT_NE(result.output.find("-- 0.1: 1\n"), std::string::npos) << result.output;
}

}  // namespace
}  // namespace accounts
