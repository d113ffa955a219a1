#include "platform/linux/JournalLogSystem.h"

#include <sys/socket.h>
#include <sys/time.h>
#include <sys/un.h>

#include <cerrno>
#include <cstring>
#include <utility>

#include "platform/linux/JournalEntry.h"

namespace accounts {
namespace {

constexpr std::string_view kOpenOperation = "open the log channel";
constexpr std::string_view kInformational = "6";
constexpr timeval kLongestWait = {.tv_sec = 1, .tv_usec = 0};

}  // namespace

class JournalLogSystem::Channel final : public LogChannel {
 public:
  Channel(JournalLogSystem& journal, std::string_view subsystem, std::string_view category)
      : journal_(journal) {
    appendJournalField(commonFields_, "PRIORITY", kInformational);
    appendJournalField(commonFields_, "SYSLOG_IDENTIFIER", program_invocation_short_name);
    appendJournalField(commonFields_, "SUBSYSTEM", subsystem);
    appendJournalField(commonFields_, "CATEGORY", category);
  }

  [[nodiscard]] bool isEnabled() const override { return journal_.takesEntries_; }
  void write(const LogLine& line) override {
    std::string entry = commonFields_;
    appendJournalField(entry, "MESSAGE", line.text);
    appendJournalField(entry, "CODE_FUNC", line.operation);
    appendJournalField(entry, "CODE_LINE", std::to_string(line.sourceLine));
    journal_.send(entry);
  }

 private:
  JournalLogSystem& journal_;
  std::string commonFields_;
};

OrFailure<std::unique_ptr<JournalLogSystem>> JournalLogSystem::connect(
    const std::string& socketPath) {
  sockaddr_un address = {};
  address.sun_family = AF_UNIX;
  if (socketPath.size() >= sizeof(address.sun_path)) {
    return pathFailure(kOpenOperation, socketPath, ENAMETOOLONG);
  }
  std::memcpy(address.sun_path, socketPath.data(), socketPath.size());
  FileDescriptor socket(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (socket.number() < 0 ||
      ::setsockopt(socket.number(), SOL_SOCKET, SO_SNDTIMEO, &kLongestWait, sizeof(kLongestWait)) !=
          0 ||
      ::connect(socket.number(), reinterpret_cast<const sockaddr*>(&address), sizeof(address)) !=
          0) {
    return pathFailure(kOpenOperation, socketPath, errno);
  }
  return std::unique_ptr<JournalLogSystem>(new JournalLogSystem(std::move(socket)));
}

LogChannel& JournalLogSystem::makeChannel(std::string_view subsystem, std::string_view category) {
  const std::lock_guard guard(mutex_);
  channels_.push_back(std::make_unique<Channel>(*this, subsystem, category));
  return *channels_.back();
}

void JournalLogSystem::send(const std::string& entry) {
  // A log that cannot be written must not stop the work that it tells of.
  if (takesEntries_ && sendJournalEntry(socket_.number(), entry) != 0) {
    takesEntries_ = false;
  }
}

}  // namespace accounts
