#pragma once

#include <optional>
#include <tl/expected.hpp>
#include <utility>

#include "platform/Failure.h"

namespace accounts {

/// A value, or the error for which there is none. An error is returned as it is; what gives no
/// value, only success or an error, has the value void and returns {} for success.
template <class Value, class Error>
class [[nodiscard]] OrError : public tl::expected<Value, Error> {
 public:
  using tl::expected<Value, Error>::expected;
  OrError() = default;
  OrError(Error error) : tl::expected<Value, Error>(tl::unexpect, std::move(error)) {}
};

/// What an operation of the platform that can fail gives back.
template <class Value>
using OrFailure = OrError<Value, Failure>;
using Result = OrFailure<void>;

/// What there is, for whom the error makes no difference.
template <class Value>
std::optional<Value> valueOrNone(OrFailure<Value> result) {
  return result ? std::optional(*std::move(result)) : std::nullopt;
}

}  // namespace accounts
