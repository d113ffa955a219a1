#include <filesystem>

#include "tests/program/HostileRootFixture.h"
#include "tests/program/Programs.h"

// A program that loads the frameworks of an untrusted device: what it loads is the device's own
// file or nothing.

namespace accounts {
namespace {

constexpr const char* kFrameworks = "/System/Library/PrivateFrameworks";
constexpr const char* kFramework = "/System/Library/PrivateFrameworks/MailAccounts.framework";
constexpr const char* kLibrary =
    "/System/Library/PrivateFrameworks/MailAccounts.framework/MailAccounts.so";

/// A device with the example frameworks, the same outside, and a mail account to tell them of.
class HostileFramework : public HostileRootFixture,
                         public testing::WithParamInterface<HostileKind> {
 protected:
  void SetUp() override {
    for (const std::filesystem::path& directory :
         {onThisMachine(kFrameworks), outside_.path(kFrameworks)}) {
      std::filesystem::create_directories(directory.parent_path());
      std::filesystem::copy(EXAMPLE_FRAMEWORKS_DIRECTORY, directory,
                            std::filesystem::copy_options::recursive);
    }
    write(kSettingsPath, accountSettings(12, {PropertyDictionary{{"Type", "Yahoo"},
                                                                 {"Class", "YahooAccount"},
                                                                 {"Identifier", "YAHOO"}}}));
  }

  /// Whether the notifier of the framework was told of the account.
  [[nodiscard]] bool isNotified() const {
    ProgramCall call = {.program = NOTIFY_PROGRAM,
                        .arguments = {"--root", root(), "--bundle", pluginBundle()}};
    if (GetParam().toOtherUsersOnly) {
      call.user = kSomebody;
    }
    return runProgram(call).output.find("MailAccountNotifier") != std::string::npos;
  }
};

class HostileLibrary : public HostileFramework {
 protected:
  void SetUp() override {
    HostileFramework::SetUp();
    put(GetParam(), kLibrary);
  }
};

class HostileFrameworkDirectory : public HostileFramework {
 protected:
  void SetUp() override {
    HostileFramework::SetUp();
    put(GetParam(), kFramework);
  }
};

TEST_P(HostileLibrary, IsLoadedOnlyIfItIsTheDevicesOwnFile) {
  // Huge ones included: the dynamic loader maps what it needs.
  EXPECT_EQ(isNotified(), GetParam().opened == Finding::Usable);
  expectNothingCrossedTheBorder();
}

TEST_P(HostileFrameworkDirectory, HoldsNothingToLoadUnlessItIsTheDevicesOwn) {
  EXPECT_EQ(isNotified(), GetParam().finding == Finding::Usable);
  expectNothingCrossedTheBorder();
}

std::string nameOfKind(const testing::TestParamInfo<HostileKind>& information) {
  return information.param.name;
}

INSTANTIATE_TEST_SUITE_P(Kinds, HostileLibrary, testing::ValuesIn(hostileFileKinds()), nameOfKind);
INSTANTIATE_TEST_SUITE_P(Kinds, HostileFrameworkDirectory,
                         testing::ValuesIn(hostileDirectoryKinds()), nameOfKind);

}  // namespace
}  // namespace accounts
