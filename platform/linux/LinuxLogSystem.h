#pragma once

#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/LogSystem.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/PathFailure.h"

namespace accounts {

/// A log whose lines go to one open file, or nowhere. A line is "[SUBSYSTEM:CATEGORY] " and then
/// the text as it was given.
class LinuxLogSystem final : public LogSystem {
 public:
  /// Without an open file the log is off: its channels are not enabled.
  explicit LinuxLogSystem(std::optional<FileDescriptor> output = std::nullopt)
      : output_(std::move(output)) {}

  LogChannel& makeChannel(std::string_view subsystem, std::string_view category) override;

 private:
  class Channel;
  void writeLine(std::string_view prefix, std::string_view line);

  const std::optional<FileDescriptor> output_;
  std::mutex mutex_;
  std::vector<std::unique_ptr<LogChannel>> channels_;
};

/// Opens the file that channel lines are appended to, by its path on the host; it is made, readable
/// by its owner alone, if missing. "-" stands for standard error.
OrFailure<FileDescriptor> openLogOutput(const std::string& path);

}  // namespace accounts
