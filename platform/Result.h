#pragma once

#include <optional>
#include <string>
#include <utility>

namespace accounts {

/// Whether doing the same again may help without anybody changing anything: there may be room
/// again, or a medium may answer again.
enum class FailureKind { Lasting, MayPass };

/// What an operation of the platform that can fail gives back: success, or an error text for an
/// engineer.
class [[nodiscard]] Result {
 public:
  static Result success() { return Result(std::nullopt); }
  /// `error` says in words what went wrong, with the path or name concerned.
  static Result failure(std::string error, FailureKind kind = FailureKind::Lasting) {
    return Result(std::move(error), kind);
  }

  explicit operator bool() const { return !error_.has_value(); }
  /// The error text; only a failure has one.
  [[nodiscard]] const std::string& error() const { return *error_; }
  /// Of which kind a failure is.
  [[nodiscard]] FailureKind kind() const { return kind_; }

 private:
  explicit Result(std::optional<std::string> error, FailureKind kind = FailureKind::Lasting)
      : error_(std::move(error)), kind_(kind) {}
  std::optional<std::string> error_;
  FailureKind kind_;
};

}  // namespace accounts
