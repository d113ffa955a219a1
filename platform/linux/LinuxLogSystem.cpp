#include "platform/linux/LinuxLogSystem.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

#include "platform/linux/FileContents.h"

namespace accounts {
namespace {

constexpr std::string_view kStandardError = "-";

// Lines hold the properties of accounts.
constexpr mode_t kOwnerReadsAndWrites = 0600;

}  // namespace

class LinuxLogSystem::Channel final : public LogChannel {
 public:
  Channel(LinuxLogSystem& log, std::string prefix) : log_(log), prefix_(std::move(prefix)) {}

  [[nodiscard]] bool isEnabled() const override { return log_.output_.has_value(); }
  void write(const LogLine& line) override { log_.writeLine(prefix_, line.text); }

 private:
  LinuxLogSystem& log_;
  const std::string prefix_;
};

LogChannel& LinuxLogSystem::makeChannel(std::string_view subsystem, std::string_view category) {
  std::string prefix = "[";
  prefix.append(subsystem).append(":").append(category).append("] ");
  const std::lock_guard guard(mutex_);
  channels_.push_back(std::make_unique<Channel>(*this, std::move(prefix)));
  return *channels_.back();
}

void LinuxLogSystem::writeLine(std::string_view prefix, std::string_view line) {
  if (!output_) {
    return;
  }
  std::string text(prefix);
  text.append(line).append("\n");
  const std::lock_guard guard(mutex_);
  // A log that cannot be written must not stop the work that it tells of.
  (void)writeAll(output_->number(), text);
}

OrFailure<FileDescriptor> openLogOutput(const std::string& path) {
  if (path == kStandardError) {
    const int duplicate = ::fcntl(STDERR_FILENO, F_DUPFD_CLOEXEC, 0);
    if (duplicate < 0) {
      return pathFailure("open", "standard error", errno);
    }
    return FileDescriptor(duplicate);
  }
  // Without O_NONBLOCK a named pipe that nobody reads would be waited for without end.
  const int flags = O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC | O_NOCTTY | O_NONBLOCK;
  const int number = ::open(path.c_str(), flags, kOwnerReadsAndWrites);
  if (number < 0) {
    return pathFailure("open the log channel", path, errno);
  }
  return FileDescriptor(number);
}

}  // namespace accounts
