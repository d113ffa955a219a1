#pragma once

#include <optional>
#include <string>
#include <utility>

#include "platform/Failure.h"

namespace accounts {

/// What an operation of the platform that can fail gives back: success, or the failure.
class [[nodiscard]] Result {
 public:
  static Result success() { return Result(); }
  /// A failure whose reason is not the system's.
  static Result failure(std::string text) { return Failure{0, std::move(text)}; }
  Result(Failure failure) : failure_(std::move(failure)) {}

  explicit operator bool() const { return !failure_.has_value(); }
  /// Only of a failure.
  [[nodiscard]] const Failure& failure() const { return *failure_; }
  [[nodiscard]] const std::string& error() const { return failure_->text; }

 private:
  Result() = default;
  std::optional<Failure> failure_;
};

}  // namespace accounts
