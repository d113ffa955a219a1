#pragma once

#include <cerrno>
#include <cstdint>
#include <string>

namespace accounts {

enum class FailureKind : std::uint8_t {
  Lasting,
  /// The same again may help without anybody changing anything: there may be room again, or what
  /// the system had too little of.
  MayPass,
  /// A medium does not answer.
  OfTheMedium
};

/// Why an operation of the platform failed.
struct Failure {
  /// The system's error number (errno); 0 when the reason is not the system's.
  int number = 0;
  /// What could not be done, with the path or name concerned, and why, for an engineer.
  std::string text;

  /// Whether the reason is that nothing exists at the path.
  [[nodiscard]] bool isMissing() const { return number == ENOENT || number == ENOTDIR; }
  [[nodiscard]] FailureKind kind() const {
    switch (number) {
      case EIO:
        return FailureKind::OfTheMedium;
      case EAGAIN:
      case EDQUOT:
      case EMFILE:
      case ENFILE:
      case ENOMEM:
      case ENOSPC:
      case ESTALE:
      case ETIMEDOUT:
        return FailureKind::MayPass;
      default:
        return FailureKind::Lasting;
    }
  }
};

}  // namespace accounts
