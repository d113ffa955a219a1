#include <algorithm>

#include "platform/AccountFramework.h"
#include "tests/program/AccountsctlFixture.h"
#include "tests/program/Programs.h"

// What the author of a framework is told of it before any device is.

namespace accounts {
namespace {

class AccountsctlFramework : public AccountsctlFixture {
 protected:
  [[nodiscard]] ProgramResult check(const std::string& framework,
                                    std::vector<std::string> further = {}) const {
    std::vector<std::string> arguments = {"check", "--framework", framework};
    arguments.insert(arguments.end(), further.begin(), further.end());
    return run(arguments);
  }
  static std::string example(const std::string& name) {
    return std::string(EXAMPLE_FRAMEWORKS_DIRECTORY) + "/" + name + ".framework/" + name + ".so";
  }
};

std::string faulty(const std::string& name) {
  return std::string(FAULTY_FRAMEWORKS_DIRECTORY) + "/" + name + ".so";
}

TEST_F(AccountsctlFramework, ItsClassesAreListedWithWhatTheyAnswer) {
  const ProgramResult result = check(example("DeviceAndCloudAccounts"));

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(result.errors, "");
  EXPECT_EQ(result.output,
            "Class\tAnswers\n"
            "CloudAccountNotifier\tnoteAccountChanges\n"
            "CloudFullAccount\taccountWithBasicAccount\n"
            "CloudSyncAccount\taccountToRefreshForBasicAccount\n"
            "Built for version " +
                std::to_string(kInterfaceVersion) +
                " of the interface\n"
                "Nothing found\n");
}

TEST_F(AccountsctlFramework, EveryExampleIsAsItShouldBe) {
  for (const char* const name : {"MailAccounts", "GroupwareAccounts", "DeviceAndCloudAccounts"}) {
    const ProgramResult result = check(example(name), {"--json"});
    EXPECT_EQ(result.exitStatus, 0) << result.output << result.errors;
    EXPECT_EQ(onlyObject(result)["exports"],
              nlohmann::json::array({"AccountsInterfaceVersion", "RegisterClasses"}));
  }
}

TEST_F(AccountsctlFramework, WhatWouldTurnOutLaterIsFound) {
  const ProgramResult result = check(faulty("Careless"));

  EXPECT_EQ(result.exitStatus, kAttention);
  EXPECT_EQ(result.errors, "on standard output\n");
  EXPECT_NE(result.output.find("Notifier\tnoteAccountChanges\n"), std::string::npos);
  EXPECT_NE(result.output.find("The class Notifier of the framework " + faulty("Careless") +
                               " is not taken: " + faulty("Careless") + " has one of that name\n"),
            std::string::npos)
      << result.output;
  EXPECT_NE(result.output.find(" of its symbols can meet those of another framework, "),
            std::string::npos);
  EXPECT_NE(result.output.find("The class Idle answers nothing\n"), std::string::npos);
  EXPECT_EQ(result.output.find("Nothing found"), std::string::npos);
}

TEST_F(AccountsctlFramework, WithJSONFindingsHaveCodes) {
  const nlohmann::json object = onlyObject(check(faulty("Careless"), {"--json"}));

  std::vector<std::string> codes;
  for (const nlohmann::json& finding : object["findings"]) {
    codes.push_back(finding["code"]);
  }
  EXPECT_EQ(codes, (std::vector<std::string>{"doubledClass", "furtherExports", "emptyClass"}));
  const auto exports = object["exports"].get<std::vector<std::string>>();
  EXPECT_NE(std::find(exports.begin(), exports.end(), "anotherSymbol"), exports.end());
  EXPECT_EQ(
      object["classes"],
      nlohmann::json::array({{{"name", "Idle"}, {"operations", nlohmann::json::array()}},
                             {{"name", "Notifier"}, {"operations", {"noteAccountChanges"}}}}));
}

TEST_F(AccountsctlFramework, OneWithoutAClassIsFound) {
  const ProgramResult result = check(faulty("WithoutClass"));

  EXPECT_EQ(result.exitStatus, kAttention);
  EXPECT_NE(result.output.find("It registers no class\n"), std::string::npos);
}

TEST_F(AccountsctlFramework, WhatNoDeviceLoadsIsRefusedWithTheReason) {
  const std::pair<const char*, const char*> refused[] = {
      {"WithoutEntryPoint", "RegisterClasses"},
      {"WithUnresolvedSymbol", "functionThatNobodyDefines"},
      {"OfOtherHeaders", "its interface has version 999, which is "},
      {"OfNoVersion", "it names no version of its interface"},
  };
  for (const auto& [name, reason] : refused) {
    const ProgramResult result = check(faulty(name));
    expectRefused(result, kMalformedInput, "No device loads " + faulty(name));
    EXPECT_NE(result.errors.find(reason), std::string::npos) << result.errors;
  }
  expectRefused(check(writeText("no.so", "no framework")), kMalformedInput, "No device loads ");
  expectRefused(check(path("missing.so")), kMissingInput, path("missing.so"));
}

TEST_F(AccountsctlFramework, OneThatEndsTheProcessIsSaidToHaveDoneSo) {
  const ProgramResult result =
      runProgram({.program = accountsctl(),
                  .arguments = {"check", "--framework", faulty("Careless")},
                  .environment = {{"ENDS_THE_PROCESS", "1"}}});

  EXPECT_EQ(result.exitStatus, kPluginEnded);
  EXPECT_NE(result.errors.find("accountsctl: The framework ended by signal 6"), std::string::npos)
      << result.errors;
}

TEST_F(AccountsctlFramework, IsNamedByAFileAndAlone) {
  expectRefused(check("-"), kUnusableArguments, "standard input cannot be loaded");
  expectRefused(check(example("MailAccounts"), {path("a.plist")}), kUnusableArguments,
                "--framework");
  expectRefused(check(example("MailAccounts"), {"--device", path("a.plist")}), kUnusableArguments,
                "--framework");
  expectRefused(run({"check"}), kUnusableArguments, "FILE is required, or --framework");
}

}  // namespace
}  // namespace accounts
