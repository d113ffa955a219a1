#pragma once

#include <optional>
#include <tl/expected.hpp>
#include <utility>

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

/// What there is, for whom the error makes no difference.
template <class Value, class Error>
std::optional<Value> valueOrNone(OrError<Value, Error> result) {
  return result ? std::optional(*std::move(result)) : std::nullopt;
}

}  // namespace accounts
