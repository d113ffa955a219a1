#include "accountsettings/Log.h"

#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "tests/fakes/FakePlatform.h"

namespace accounts {
namespace {

using Lines = std::vector<std::string>;

std::string formatted(std::string_view format, std::vector<LogArgument> arguments) {
  std::string line;
  appendFormatted(line, format, arguments);
  return line;
}

TEST(LogChannel, EveryCallGivesTheSameHandle) {
  FakeProcess device;
  EXPECT_EQ(_ASLogSystem(), _ASLogSystem());
}

TEST(LogChannel, ItIsMadeOnceUnderItsSubsystemAndCategory) {
  FakeProcess device;
  _ASLogSystem();
  _ASLogSystem();
  EXPECT_EQ(
      device.logSystem.channelsMade,
      (std::vector<std::pair<std::string, std::string>>{{"com.quarx.accountsettings", "log"}}));
}

TEST(LogChannel, ConcurrentFirstCallsMakeOneHandle) {
  FakeProcess device;
  std::vector<std::thread> callers;
  for (int caller = 0; caller < 8; ++caller) {
    callers.emplace_back([] { _ASLogSystem(); });
  }
  for (std::thread& caller : callers) {
    caller.join();
  }
  EXPECT_EQ(device.logSystem.channelsMade.size(), 1U);
}

TEST(LogChannel, ALineHoldsOperationSourceLineAndQuotedMessage) {
  FakeProcess device;
  const std::uint32_t line = __LINE__ + 1;
  logToChannel("-[AccountsManager insertAccount:]", "Inserting account: %@",
               [] { return logArguments("mail-1"); });
  EXPECT_EQ(device.logSystem.channel.lines,
            Lines{"-[AccountsManager insertAccount:] (" + std::to_string(line) +
                  ") \"Inserting account: mail-1\""});
}

TEST(LogChannel, SecretsInAValueAreHidden) {
  const PropertyDictionary account = {{"Password", "x"}, {"Username", "u"}};
  const std::string shown = "{\"Password\":\"(hidden)\",\"Username\":\"u\"}";
  EXPECT_EQ(formatted("Inserting account: %@", {account}), "Inserting account: " + shown);
}

TEST(LogChannel, AMessageWithoutArgumentsIsQuotedToo) {
  FakeProcess device;
  logToChannel("-[AccountsManager saveAllAccounts]", "Saving all accounts");
  EXPECT_EQ(device.logSystem.channel.linesWithoutNumbers(),
            Lines{"-[AccountsManager saveAllAccounts] (N) \"Saving all accounts\""});
}

TEST(LogChannel, ADisabledChannelComputesNoArgument) {
  FakeProcess device;
  device.logSystem.channel.enabled = false;
  bool wasComputed = false;

  logToChannel("-[AccountsManager insertAccount:]", "Inserting account: %@", [&] {
    wasComputed = true;
    return logArguments("mail-1");
  });

  EXPECT_FALSE(wasComputed);
}

TEST(LogChannel, ADisabledChannelGetsNoLine) {
  FakeProcess device;
  device.logSystem.channel.enabled = false;
  logToChannel("-[AccountsManager saveAllAccounts]", "Saving all accounts");
  EXPECT_EQ(device.logSystem.channel.lines, Lines{});
}

TEST(LogFormat, ArgumentsFillThePlaceholdersInOrder) {
  EXPECT_EQ(formatted("%s saw %@ %d times of %ld", {"Part", Text("x"), std::int64_t{2}, 10UL}),
            "Part saw x 2 times of 10");
}

TEST(LogFormat, BooleansStandAsNumbers) {
  EXPECT_EQ(formatted("a=%d, b=%d", {true, false}), "a=1, b=0");
}

TEST(LogFormat, AnAbsentObjectIsShownAsNull) {
  EXPECT_EQ(formatted("%@ %@ %@", {std::optional<Text>(), std::optional<PropertyDictionary>(),
                                   std::optional<PropertyArray>()}),
            "(null) (null) (null)");
}

TEST(LogFormat, AnEmptyObjectIsNotShownAsNull) {
  EXPECT_EQ(formatted("%@%@", {std::optional<Text>(""), PropertyDictionary()}), "{}");
}

TEST(LogFormat, DictionariesAreDescribedInKeyOrder) {
  EXPECT_EQ(formatted("%@", {PropertyDictionary{{"b", 1}, {"a", "x"}}}), R"({"a":"x","b":1})");
}

TEST(LogFormat, ATextOfSeveralLinesStaysOneLine) {
  const std::string line = formatted("User %@.", {"first\nsecond"});
  EXPECT_EQ(line.find('\n'), std::string::npos);
  EXPECT_TRUE(line.starts_with("User first")) << line;
  EXPECT_TRUE(line.ends_with("second.")) << line;
}

TEST(LogFormat, APlaceholderInsideAnArgumentIsNotFilled) {
  EXPECT_EQ(formatted("%@ and %@", {"%@", "x"}), "%@ and x");
}

TEST(LogFormat, OtherPercentSignsStand) {
  EXPECT_EQ(formatted("100% of %@ %", {"x"}), "100% of x %");
}

TEST(LogFormat, APlaceholderWithoutAnArgumentIsShownAsNull) {
  EXPECT_EQ(formatted("%@ and %@", {"one"}), "one and (null)");
}

TEST(ConsoleLine, ItIsWrittenWithItsArgumentsAndNothingElse) {
  FakeProcess device;
  logToConsole("%s. Could not delete %@. Error = %@", {"-[A b]", "/tmp/x", "no such file"});
  EXPECT_EQ(device.consoleLog.lines,
            Lines{"-[A b]. Could not delete /tmp/x. Error = no such file"});
}

TEST(ConsoleLine, ItDoesNotGoToTheChannel) {
  FakeProcess device;
  logToConsole("Found Velmora account with status 2");
  EXPECT_EQ(device.logSystem.channel.lines, Lines{});
}

TEST(AssertionDeathTest, ItWritesItsMessageWithOperationAndSourceFileAndAborts) {
  FakeProcess device;
  EXPECT_EXIT(failAssertion("-[BasicAccount init]", "BasicAccount", "No %@", {"init"}),
              testing::KilledBySignal(SIGABRT),
              R"(\*\*\* Assertion failure in -\[BasicAccount init\], BasicAccount: No init)");
}

}  // namespace
}  // namespace accounts
