#include "commandline/Terminal.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <pty.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <map>
#include <string>

namespace accounts {
namespace {

using Environment = std::map<std::string, std::string>;

EnvironmentLookup lookup(const Environment& environment) {
  return [&environment](const char* name) {
    const auto found = environment.find(name);
    return found != environment.end() ? found->second.c_str() : nullptr;
  };
}

/// What standard output is for as long as this lives.
class StandardOutput {
 public:
  explicit StandardOutput(int descriptor) : kept_(dup(STDOUT_FILENO)) {
    dup2(descriptor, STDOUT_FILENO);
  }
  StandardOutput(const StandardOutput&) = delete;
  StandardOutput& operator=(const StandardOutput&) = delete;
  ~StandardOutput() {
    dup2(kept_, STDOUT_FILENO);
    close(kept_);
  }

 private:
  int kept_;
};

Terminal onFile(const Environment& environment) {
  const int file = open("/dev/null", O_WRONLY);
  const StandardOutput output(file);
  close(file);
  return standardOutputTerminal(lookup(environment));
}

/// With a terminal of 123 columns.
Terminal onTerminal(const Environment& environment) {
  int controller = -1;
  int terminal = -1;
  const winsize size = {.ws_row = 40, .ws_col = 123, .ws_xpixel = 0, .ws_ypixel = 0};
  EXPECT_EQ(openpty(&controller, &terminal, nullptr, nullptr, &size), 0);
  Terminal result;
  {
    const StandardOutput output(terminal);
    result = standardOutputTerminal(lookup(environment));
  }
  close(terminal);
  close(controller);
  return result;
}

TEST(Terminal, AFileIsEightyColumnsWideWithoutColours) {
  EXPECT_EQ(onFile({}).width, 80U);
  EXPECT_FALSE(onFile({{"TERM", "xterm"}}).isColoured);
}

TEST(Terminal, ATerminalHasItsOwnWidthAndColours) {
  EXPECT_EQ(onTerminal({}).width, 123U);
  EXPECT_TRUE(onTerminal({{"TERM", "xterm"}}).isColoured);
}

TEST(Terminal, ColumnsOfTheEnvironmentCountMore) {
  EXPECT_EQ(onTerminal({{"COLUMNS", "60"}}).width, 60U);
  EXPECT_EQ(onFile({{"COLUMNS", "60"}}).width, 60U);
}

TEST(Terminal, ColumnsThatAreNoNumberAboveZeroDoNotCount) {
  for (const char* columns : {"", "0", "-5", "wide", "60x", " 60", "99999999999999999999999"}) {
    EXPECT_EQ(onTerminal({{"COLUMNS", columns}}).width, 123U) << columns;
  }
}

TEST(Terminal, ADumbTerminalHasNoColours) {
  EXPECT_FALSE(onTerminal({{"TERM", "dumb"}}).isColoured);
}

TEST(Terminal, NoColourMeansNoneUnlessItIsEmpty) {
  EXPECT_FALSE(onTerminal({{"NO_COLOR", "1"}}).isColoured);
  EXPECT_TRUE(onTerminal({{"NO_COLOR", ""}}).isColoured);
}

TEST(Terminal, OnlyAColouredTerminalGetsEmphasis) {
  EXPECT_EQ(emphasized({.width = 80, .isColoured = true}, Emphasis::Heading, "a"),
            "\033[1ma\033[0m");
  EXPECT_EQ(emphasized({.width = 80, .isColoured = false}, Emphasis::Heading, "a"), "a");
}

}  // namespace
}  // namespace accounts
