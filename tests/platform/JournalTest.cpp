#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "platform/linux/JournalEntry.h"
#include "platform/linux/JournalLogSystem.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

/// A datagram socket in the place of the journal's.
class Journal : public DeviceFixture {
 protected:
  Journal() {
    sockaddr_un address = {};
    address.sun_family = AF_UNIX;
    std::strcpy(address.sun_path, path.c_str());
    EXPECT_EQ(::bind(receiver.number(), reinterpret_cast<sockaddr*>(&address), sizeof(address)), 0);
  }

  [[nodiscard]] std::unique_ptr<JournalLogSystem> connect() {
    return JournalLogSystem::connect(path).value();
  }
  /// The next entry: a datagram's bytes, or those of the file that came in its place. Empty when
  /// there is none.
  [[nodiscard]] std::string nextEntry() const {
    std::string bytes(size_t{1} << 20, '\0');
    iovec part = {bytes.data(), bytes.size()};
    alignas(cmsghdr) std::array<char, CMSG_SPACE(sizeof(int))> control{};
    msghdr message = {};
    message.msg_iov = &part;
    message.msg_iovlen = 1;
    message.msg_control = control.data();
    message.msg_controllen = control.size();
    const ssize_t count = ::recvmsg(receiver.number(), &message, MSG_CMSG_CLOEXEC);
    const cmsghdr* const header = CMSG_FIRSTHDR(&message);
    if (count == 0 && header != nullptr) {
      int number = -1;
      std::memcpy(&number, CMSG_DATA(header), sizeof(number));
      const FileDescriptor file(number);
      EXPECT_NE(::fcntl(number, F_GET_SEALS) & F_SEAL_WRITE, 0);
      const ssize_t length = ::pread(number, bytes.data(), bytes.size(), 0);
      return bytes.substr(0, static_cast<std::size_t>(length));
    }
    return bytes.substr(0, count < 0 ? 0 : static_cast<std::size_t>(count));
  }

  const std::string path = (outside() / "journal").string();
  FileDescriptor receiver{::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0)};
};

TEST_F(Journal, ALineIsOneEntryWithWhatItIsMadeOfInFieldsOfTheirOwn) {
  const auto journal = connect();
  LogChannel& channel = journal->makeChannel("com.quarx.accountsettings", "log");
  EXPECT_TRUE(channel.isEnabled());

  channel.write({"-[Class operation] (7) \"Saving all accounts\"", "-[Class operation]", 7});

  EXPECT_EQ(nextEntry(),
            "PRIORITY=6\nSYSLOG_IDENTIFIER=platform_tests\nSUBSYSTEM=com.quarx.accountsettings\n"
            "CATEGORY=log\nMESSAGE=-[Class operation] (7) \"Saving all accounts\"\n"
            "CODE_FUNC=-[Class operation]\nCODE_LINE=7\n");
  EXPECT_EQ(nextEntry(), "");
}

TEST_F(Journal, AValueOfSeveralLinesCarriesItsLength) {
  std::string entry;
  appendJournalField(entry, "MESSAGE", "one\ntwo");
  EXPECT_EQ(entry, std::string("MESSAGE\n\x07\0\0\0\0\0\0\0one\ntwo\n", 24));
}

TEST_F(Journal, AnEntryThatIsTooLargeForADatagramArrivesWhole) {
  const auto journal = connect();
  const std::string text(500000, 'x');
  journal->makeChannel("one", "two").write({.text = text});
  EXPECT_NE(nextEntry().find("MESSAGE=" + text + "\n"), std::string::npos);
}

TEST_F(Journal, WhereNothingListensTheChannelCannotBeOpened) {
  const std::string missing = (outside() / "none").string();
  EXPECT_EQ(failureOf(JournalLogSystem::connect(missing)).text,
            "Cannot open the log channel " + missing + ": No such file or directory");
}

TEST_F(Journal, APathThatIsNoSocketsIsAnError) {
  EXPECT_EQ(failureOf(JournalLogSystem::connect(std::string(200, 'x'))).number, ENAMETOOLONG);
}

TEST_F(Journal, OneThatGoesAwayGetsNoMoreLines) {
  const auto journal = connect();
  LogChannel& channel = journal->makeChannel("one", "two");
  receiver = FileDescriptor(::open("/dev/null", O_RDONLY | O_CLOEXEC));

  channel.write({.text = "line"});

  EXPECT_FALSE(channel.isEnabled());
  channel.write({.text = "line"});
}

TEST_F(Journal, OneThatTakesNothingIsGivenUpRatherThanWaitedFor) {
  const auto journal = connect();
  LogChannel& channel = journal->makeChannel("one", "two");
  // A socket holds a few hundred entries that nobody has read.
  for (int line = 0; line < 100000 && channel.isEnabled(); ++line) {
    channel.write({.text = "line"});
  }
  EXPECT_FALSE(channel.isEnabled());
}

}  // namespace
}  // namespace accounts
