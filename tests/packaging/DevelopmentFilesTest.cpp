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
    use("frameworks");
  }
  /// Makes a copy of an example the source.
  void use(const std::string& example) const {
    fs::remove_all(source());
    fs::copy(prefix() / "share/doc/accounts-migration-dev/examples" / example, source(),
             fs::copy_options::recursive);
  }

  [[nodiscard]] fs::path source() const { return directory() / "source"; }
  [[nodiscard]] fs::path build() const { return directory() / "build"; }
  void configure() const {
    succeed({.program = "cmake",
             .arguments = {"-S", source().string(), "-B", build().string(),
                           "-DCMAKE_PREFIX_PATH=" + prefix().string()}});
  }
  void buildTarget(const std::string& target) const {
    succeed({.program = "cmake",
             .arguments = {"--build", build().string(), "--target", target},
             .timeLimit = std::chrono::seconds(240)});
  }
};

TEST_F(DevelopmentFiles, MakeAFrameworkThatExportsItsEntryPointAndFindsTheLibraryBesideIt) {
  // A library with a name of the vocabulary, and a record that is asked all that one answers.
  std::ofstream(source() / "CMakeLists.txt") << R"(
cmake_minimum_required(VERSION 3.25)
project(Mine LANGUAGES CXX)
find_package(AccountsFramework REQUIRED)
add_library(protocol SHARED protocol.cpp)
add_accounts_framework(Mine Mine.cpp)
set_target_properties(protocol PROPERTIES
  LIBRARY_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/frameworks/Mine.framework)
target_link_libraries(Mine PRIVATE protocol)
# As it is put on a device: nothing names the directory of the build.
set_target_properties(Mine PROPERTIES BUILD_WITH_INSTALL_RPATH ON)
)";
  std::ofstream(source() / "protocol.cpp")
      << "const char* protocolName() { return \"MyNotifier\"; }";
  std::ofstream(source() / "Mine.cpp") << R"(
#include "platform/AccountFramework.h"
#include "vocabulary/AccountVocabulary.h"
const char* protocolName();
std::string mine(const accounts::AccountRecordReference& record) {
  const bool hasMail = record->parentRecord() && record->enabledDataclasses() &&
                       record->accountPropertyForKey(kAccountDataclassMail);
  return hasMail ? protocolName() : "";
}
void RegisterClasses(accounts::ClassRegistry& registry) {
  accounts::AccountClass notifier;
  notifier.noteAccountChanges = [](const accounts::PropertyArray& changes) {
    for (const accounts::PropertyValue& change : changes) {
      (void)(*change.asDictionary()->find(kASChangeAccountChangeTypeKey) ==
             accounts::PropertyValue(static_cast<std::int32_t>(accounts::AccountChangeType::Deleted)));
    }
  };
  registry.registerClass(protocolName(), std::move(notifier));
}
)";
  configure();
  buildTarget("Mine");

  const fs::path framework = build() / "frameworks/Mine.framework/Mine.so";
  EXPECT_EQ(
      succeed({.program = "nm",
               .arguments = {"-D", "--defined-only", "--format=just-symbols", framework.string()}})
          .output,
      "AccountsInterfaceVersion\nRegisterClasses\n");
  // Moved: what is found is what stands beside it.
  fs::rename(build() / "frameworks", directory() / "device");
  const auto device = DeviceRoot::openRoot((directory() / "device").string());
  ASSERT_TRUE(device) << device.error().text;
  LinuxConsoleLog log;
  LinuxFrameworkLoader loader(*device, log);
  const Result loaded = loader.loadFramework("/Mine.framework/Mine.so");
  ASSERT_TRUE(loaded) << loaded.error().text;
  EXPECT_NE(loader.classes().classNamed("MyNotifier"), nullptr);
}

TEST_F(DevelopmentFiles, AreAllThatAProgramThatOpensTheStoreIsBuiltFrom) {
  configure();
  buildTarget("all");
  const fs::path device = directory() / "device";
  fs::copy(prefix() / "share/doc/accounts-migration/examples/sample-device", device,
           fs::copy_options::recursive);
  fs::create_directories(device / "System/Library");
  fs::rename(build() / "frameworks", device / "System/Library/PrivateFrameworks");
  use("notify");
  fs::remove_all(build());
  configure();
  buildTarget("notify");

  const ProgramResult told = succeed(
      {.program = (build() / "notify").string(),
       .arguments = {device.string(), (prefix() / "lib/accounts/accounts.migrator").string()}});
  EXPECT_NE(
      told.output.find("MailAccountNotifier noteAccountChanges: [{\"AccountID\":\"NOTIFY-NEW\""),
      std::string::npos)
      << told.output;
}

TEST_F(DevelopmentFiles, NameThePlaceOfTheCreationMap) {
  std::ofstream(source() / "CMakeLists.txt") << R"(
cmake_minimum_required(VERSION 3.25)
project(Map LANGUAGES CXX)
find_package(AccountsFramework REQUIRED)
file(READ ${AccountsFramework_BUNDLE}/Resources/AccountCreators.plist map)
if(NOT map MATCHES "MailAccountNotifier")
  message(FATAL_ERROR "no map")
endif()
)";
  configure();
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
