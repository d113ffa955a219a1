#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>

namespace accounts {

/// How waiting for a lock ended.
enum class LockEnd : std::uint8_t {
  Taken,
  /// No lock can be made.
  Impossible,
  /// What it takes, such as a descriptor, is wanting at the moment.
  Wanting,
  TimeIsUp,
  /// The process was asked to stop.
  Stopped
};

/// The locks of one device root that a host takes, in this order. Both are given back when this
/// goes.
class HostLocks {
 public:
  virtual ~HostLocks() = default;

  /// The lock that hosts take turns by. Waits for as long as `timeLimit` says; none is without end.
  virtual LockEnd takeRoot(std::optional<std::chrono::seconds> timeLimit) = 0;
  /// The migration's own lock, for which readers of the settings file wait as well. The same.
  virtual LockEnd takeMigration(std::optional<std::chrono::seconds> timeLimit) = 0;
  /// Whether the migration's lock could be made, without making it; `reason` says why not.
  virtual bool canTakeMigration() = 0;
  /// Gives the migration's lock back, if it was taken.
  virtual void giveMigrationBack() = 0;
  /// Why the last lock was not taken, after `Impossible`, `Wanting` or `TimeIsUp`, or could not be.
  [[nodiscard]] virtual std::string reason() const = 0;
};

}  // namespace accounts
