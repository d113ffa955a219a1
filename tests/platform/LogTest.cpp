#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>

#include "platform/linux/LinuxConsoleLog.h"
#include "platform/linux/LinuxLogSystem.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

// A pipe whose writing end keeps each write apart from the next.
class PacketPipe {
 public:
  PacketPipe() : PacketPipe(makeEnds()) {}
  [[nodiscard]] int writingEnd() const { return writing_.number(); }
  // The bytes of the next write; empty when there was none.
  [[nodiscard]] std::string nextWrite() const {
    std::string bytes(4096, '\0');
    const ssize_t count = ::read(reading_.number(), bytes.data(), bytes.size());
    bytes.resize(count < 0 ? 0 : static_cast<std::size_t>(count));
    return bytes;
  }

 private:
  struct Ends {
    int numbers[2];
  };
  explicit PacketPipe(Ends ends) : reading_(ends.numbers[0]), writing_(ends.numbers[1]) {}
  static Ends makeEnds() {
    Ends ends = {};
    EXPECT_EQ(::pipe2(ends.numbers, O_DIRECT | O_NONBLOCK | O_CLOEXEC), 0);
    return ends;
  }
  FileDescriptor reading_;
  FileDescriptor writing_;
};

TEST(ConsoleLogTest, ALineIsWrittenVerbatimInOneWrite) {
  const PacketPipe pipe;
  LinuxConsoleLog log(pipe.writingEnd());
  log.writeLine("50% \"done\" %s");
  log.writeLine("");
  EXPECT_EQ(pipe.nextWrite(), "50% \"done\" %s\n");
  EXPECT_EQ(pipe.nextWrite(), "\n");
  EXPECT_EQ(pipe.nextWrite(), "");
}

TEST(ConsoleLogTest, LinesGoToStandardErrorUnlessToldOtherwise) {
  testing::internal::CaptureStderr();
  LinuxConsoleLog().writeLine("Migrating accounts");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "Migrating accounts\n");
}

TEST(ConsoleLogTest, AClosedOutputIsNoFailure) {
  // In a process of its own, which such a write may not end.
  EXPECT_EXIT(
      {
        LinuxConsoleLog(-1).writeLine("unheard");
        std::_Exit(EXIT_SUCCESS);
      },
      testing::ExitedWithCode(EXIT_SUCCESS), "");
}

class LogSystemTest : public DeviceFixture {
 protected:
  static FileDescriptor open(const std::string& file) { return openLogOutput(file).value(); }

  const std::string path = (outside() / "channel.log").string();
};

TEST_F(LogSystemTest, WithoutAnOutputNoChannelIsEnabled) {
  LinuxLogSystem log;
  EXPECT_FALSE(log.makeChannel("com.quarx.accountsettings", "log").isEnabled());
}

TEST_F(LogSystemTest, EachLineBeginsWithTheChannelsSubsystemAndCategory) {
  LinuxLogSystem log(open(path));
  LogChannel& channel = log.makeChannel("com.quarx.accountsettings", "log");
  LogChannel& other = log.makeChannel("other", "category");
  EXPECT_TRUE(channel.isEnabled());
  channel.write({"-[Class operation] (7) \"Saving all accounts\"", "-[Class operation]", 7});
  other.write({.text = "line"});
  EXPECT_EQ(hostFileContents(path),
            "[com.quarx.accountsettings:log] -[Class operation] (7) \"Saving all accounts\"\n"
            "[other:category] line\n");
}

TEST_F(LogSystemTest, ALineIsOneWrite) {
  const PacketPipe pipe;
  LinuxLogSystem log(FileDescriptor(::dup(pipe.writingEnd())));
  log.makeChannel("one", "two").write({.text = "line"});
  EXPECT_EQ(pipe.nextWrite(), "[one:two] line\n");
}

TEST_F(LogSystemTest, LinesAreAppendedToAnExistingFile) {
  makeHostFile(path, "before\n");
  LinuxLogSystem(open(path)).makeChannel("one", "two").write({.text = "line"});
  EXPECT_EQ(hostFileContents(path), "before\n[one:two] line\n");
}

TEST_F(LogSystemTest, ANewFileIsForItsOwnerAlone) {
  ASSERT_TRUE(openLogOutput(path));
  EXPECT_EQ(fs::status(path).permissions(), fs::perms(0600));
}

TEST_F(LogSystemTest, AHyphenStandsForStandardError) {
  testing::internal::CaptureStderr();
  LinuxLogSystem(open("-")).makeChannel("one", "two").write({.text = "line"});
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "[one:two] line\n");
}

TEST_F(LogSystemTest, AFileThatCannotBeMadeIsAnErrorWithItsPath) {
  const std::string missing = (outside() / "none" / "channel.log").string();
  EXPECT_EQ(failureOf(openLogOutput(missing)).text,
            "Cannot open the log channel " + missing + ": No such file or directory");
}

TEST_F(LogSystemTest, ANamedPipeThatNobodyReadsIsAnErrorAtOnce) {
  makeNamedPipe("/pipe");
  EXPECT_FALSE(openLogOutput(onHost("/pipe").string()));
}

}  // namespace
}  // namespace accounts
