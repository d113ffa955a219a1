#include <csignal>
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
    ProgramCall call = {.program = NOTIFY_PROGRAM, .arguments = {root(), pluginBundle()}};
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

/// A framework of the device's own that throws.
class ThrowingFramework : public HostileRootFixture {
 protected:
  ThrowingFramework() {
    std::filesystem::create_directories(onThisMachine(kFrameworks).parent_path());
    std::filesystem::copy(EXAMPLE_FRAMEWORKS_DIRECTORY, onThisMachine(kFrameworks),
                          std::filesystem::copy_options::recursive);
    std::filesystem::copy_file(FAULTY_FRAMEWORKS_DIRECTORY "/Throwing.so", onThisMachine(kLibrary),
                               std::filesystem::copy_options::overwrite_existing);
    write(kSettingsPath,
          accountSettings(12, {PropertyDictionary{{"Type", "Yahoo"},
                                                  {"Class", "YahooAccount"},
                                                  {"Identifier", "YAHOO"},
                                                  {"Enabled Dataclasses",
                                                   PropertyArray{"com.quarx.Dataclass.Mail"}}}}));
  }

  [[nodiscard]] ProgramResult notifyWhereItThrows(const std::string& when) const {
    return runProgram({.program = NOTIFY_PROGRAM,
                       .arguments = {root(), pluginBundle()},
                       .environment = {{"THROWS_WHILE", when}}});
  }

  static void expectEnded(const ProgramResult& result, const std::string& text) {
    EXPECT_EQ(result.exitStatus, -SIGABRT);
    ASSERT_EQ(result.errorLines().size(), 1U) << result.errors;
    EXPECT_TRUE(result.errorLines().front().starts_with("*** Assertion failure in "))
        << result.errors;
    EXPECT_TRUE(result.errorLines().front().ends_with(text)) << result.errors;
  }
};

TEST_F(ThrowingFramework, WhileItRegistersEndsTheProcessWithItsWords) {
  expectEnded(notifyWhereItThrows("registering"),
              ": Could not load the account creator framework " + std::string(kLibrary) +
                  ". Error It threw an exception: no\\nservice");
}

TEST_F(ThrowingFramework, WhileItIsNotifiedEndsTheProcessWithItsWords) {
  const std::string words = ": The class MailAccountNotifier threw an exception: ";
  expectEnded(notifyWhereItThrows("announced"), words + "no\\nservice");
  expectEnded(notifyWhereItThrows("notified"), words + "no\\nservice");
}

TEST_F(ThrowingFramework, SomethingThatHasNoWordsEndsTheProcess) {
  expectEnded(notifyWhereItThrows("without words"),
              ": Could not load the account creator framework " + std::string(kLibrary) +
                  ". Error It threw an exception without words");
}

TEST_F(ThrowingFramework, ThatDoesNotThrowIsNotified) {
  const ProgramResult result = notifyWhereItThrows("");
  EXPECT_EQ(result.exitStatus, 0) << result.errors;
}

std::string nameOfKind(const testing::TestParamInfo<HostileKind>& information) {
  return information.param.name;
}

INSTANTIATE_TEST_SUITE_P(Kinds, HostileLibrary, testing::ValuesIn(hostileFileKinds()), nameOfKind);
INSTANTIATE_TEST_SUITE_P(Kinds, HostileFrameworkDirectory,
                         testing::ValuesIn(hostileDirectoryKinds()), nameOfKind);

}  // namespace
}  // namespace accounts
