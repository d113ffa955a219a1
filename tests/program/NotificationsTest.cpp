#include <algorithm>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/Programs.h"

// A store opened outside a migration, by the example program, on a device that holds the example
// frameworks: the lines on standard output are those of the frameworks' notifiers.

namespace accounts {
namespace {

class NotificationsTest : public DeviceRootFixture {
 protected:
  void installFrameworks() const {
    std::filesystem::copy(EXAMPLE_FRAMEWORKS_DIRECTORY,
                          onThisMachine("/System/Library/PrivateFrameworks"),
                          std::filesystem::copy_options::recursive);
  }
  [[nodiscard]] ProgramResult runNotify() const {
    return runProgram({.program = NOTIFY_PROGRAM, .arguments = {root(), pluginBundle()}});
  }
  void writeAccounts(PropertyArray accounts) const {
    write(kSettingsPath, accountSettings(12, std::move(accounts)));
  }
};

PropertyDictionary yahooAccount() {
  return {{"Identifier", "YAHOO"},
          {"Type", "Yahoo"},
          {"Class", "YahooAccount"},
          {"DisplayName", "Yahoo!"},
          {"Enabled Dataclasses",
           PropertyArray{"com.quarx.Dataclass.Mail", "com.quarx.Dataclass.Calendars"}}};
}

PropertyDictionary exchangeAccount() {
  return {{"Identifier", "OFFICE"},
          {"Type", "Exchange"},
          {"Class", "ExchangeAccount"},
          {"Enabled Dataclasses", PropertyArray{"com.quarx.Dataclass.Contacts"}}};
}

TEST_F(NotificationsTest, TheNotifiersOfTwoFrameworksReceiveTheirBatches) {
  std::filesystem::create_directories(onThisMachine("/System/Library"));
  installFrameworks();
  writeAccounts({yahooAccount(), exchangeAccount()});

  const ProgramResult result = runNotify();

  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  const std::string yahooChange =
      R"({"AccountID":"YAHOO","AccountType":"Yahoo","ChangeType":1,"OriginalDataclasses":)"
      R"(["com.quarx.Dataclass.Mail","com.quarx.Dataclass.Calendars"]})";
  EXPECT_EQ(
      result.outputLines(),
      (std::vector<std::string>{
          R"(MailAccountNotifier accountWillChange:forDataclass: ["YAHOO","com.quarx.Dataclass.Mail"])",
          R"(MailAccountNotifier accountDidChange:forDataclass: ["YAHOO","com.quarx.Dataclass.Mail"])",
          R"(GroupwareAccountNotifier noteAccountChanges: [{"AccountID":"OFFICE",)"
          R"("AccountType":"Exchange","ChangeType":2,"OriginalDataclasses":)"
          R"(["com.quarx.Dataclass.Contacts"]},)" +
              yahooChange + "]",
          R"(MailAccountNotifier noteAccountChanges: [{"AccountID":"NOTIFY-NEW",)"
          R"("AccountType":"Mail","ChangeType":0,"OriginalDataclasses":[]},)" +
              yahooChange + "]"}));
}

TEST_F(NotificationsTest, AMissingFrameworkEndsTheProcessWithTheAssertionsText) {
  writeAccounts({yahooAccount()});

  const ProgramResult result = runNotify();

  EXPECT_EQ(result.exitStatus, -SIGABRT);
  EXPECT_TRUE(result.hasErrorLine(
      "*** Assertion failure in +[AccountsManager "
      "_notifierClassNamesForAccountType:dataclass:], AccountsManager: Could not load the account "
      "creator framework /System/Library/PrivateFrameworks/MailAccounts.framework/MailAccounts.so. "
      "Error Cannot open "
      "/System/Library/PrivateFrameworks/MailAccounts.framework/MailAccounts.so: No such file or "
      "directory"))
      << result.errors;
}

TEST_F(NotificationsTest, AMigrationLoadsNoFramework) {
  // Broken frameworks would end the process if they were loaded.
  writeText("/System/Library/PrivateFrameworks/MailAccounts.framework/MailAccounts.so", "broken");
  write(kSettingsPath, accountSettings(3, {yahooAccount(), exchangeAccount()}));

  EXPECT_EQ(migrate().exitStatus, 0);
}

}  // namespace
}  // namespace accounts
