#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "platform/HostLocks.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/FileDescriptor.h"

namespace accounts {

/// The locks of a device root: an exclusive flock on the root's directory itself, which leaves no
/// file behind, and one on the file of the migration lock. `root` must outlive this. A process that
/// was forked from this one must call `closeInChild`, or it goes on holding them.
class LinuxHostLocks final : public HostLocks {
 public:
  /// `isStopped` ends waiting; `tell` takes one line, without its end, once a wait takes longer
  /// than a second.
  LinuxHostLocks(const DeviceRoot& root, std::function<bool()> isStopped,
                 std::function<void(std::string_view)> tell)
      : root_(root), isStopped_(std::move(isStopped)), tell_(std::move(tell)) {}
  ~LinuxHostLocks() override;
  LinuxHostLocks(const LinuxHostLocks&) = delete;
  LinuxHostLocks& operator=(const LinuxHostLocks&) = delete;

  LockEnd takeRoot(std::optional<std::chrono::seconds> timeLimit) override;
  LockEnd takeMigration(std::optional<std::chrono::seconds> timeLimit) override;
  bool canTakeMigration() override;
  void giveMigrationBack() override;
  [[nodiscard]] std::string reason() const override { return reason_; }

  /// Forgets the locks without giving them back: they are the parent's.
  void closeInChild();

 private:
  LockEnd wait(const FileDescriptor& file, std::string_view what,
               std::optional<std::chrono::seconds> timeLimit);

  const DeviceRoot& root_;
  std::function<bool()> isStopped_;
  std::function<void(std::string_view)> tell_;
  std::optional<FileDescriptor> directory_;
  std::optional<FileDescriptor> migration_;
  std::string reason_;
};

}  // namespace accounts
