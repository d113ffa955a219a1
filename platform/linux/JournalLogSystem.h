#pragma once

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "platform/LogSystem.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/PathFailure.h"

namespace accounts {

/// Where the system's journal takes entries.
inline constexpr const char* kJournalSocket = "/run/systemd/journal/socket";

/// A log whose lines are entries of the system's journal. An entry's MESSAGE is the line as it
/// stands; SUBSYSTEM and CATEGORY are the channel's, CODE_FUNC is the operation, CODE_LINE the line
/// of its source, SYSLOG_IDENTIFIER the program's name, and PRIORITY 6, informational.
///
/// No work waits for the journal longer than a second: one that takes no entry for so long, or that
/// went away, gets no more.
class JournalLogSystem final : public LogSystem {
 public:
  /// A log to the journal whose socket is at a path of the host. A failure when nothing
  /// takes entries there.
  static OrFailure<std::unique_ptr<JournalLogSystem>> connect(const std::string& socketPath);

  /// The journal's socket.
  [[nodiscard]] int descriptor() const { return socket_.number(); }

  LogChannel& makeChannel(std::string_view subsystem, std::string_view category) override;

 private:
  class Channel;
  explicit JournalLogSystem(FileDescriptor socket) : socket_(std::move(socket)) {}
  /// Sends one entry in the journal's own form.
  void send(const std::string& entry);

  const FileDescriptor socket_;
  std::atomic<bool> takesEntries_ = true;
  std::mutex mutex_;
  std::vector<std::unique_ptr<LogChannel>> channels_;
};

}  // namespace accounts
