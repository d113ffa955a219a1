#pragma once

#include <optional>
#include <string>
#include <utility>

namespace accounts {

/// What an operation of the platform that can fail gives back: success, or an error text for an
/// engineer.
class [[nodiscard]] Result {
 public:
  static Result success() { return Result(std::nullopt); }
  /// `error` says in words what went wrong, with the path or name concerned.
  static Result failure(std::string error) { return Result(std::move(error)); }

  explicit operator bool() const { return !error_.has_value(); }
  /// The error text; only a failure has one.
  [[nodiscard]] const std::string& error() const { return *error_; }

 private:
  explicit Result(std::optional<std::string> error) : error_(std::move(error)) {}
  std::optional<std::string> error_;
};

}  // namespace accounts
