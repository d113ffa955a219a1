#pragma once

#include <optional>
#include <string>

namespace accounts {

/// Makes random UUIDs.
class UUIDGenerator {
 public:
  virtual ~UUIDGenerator() = default;

  /// A fresh random UUID as 36 characters, upper case, grouped 8-4-4-4-12; none when none can be
  /// made.
  virtual std::optional<std::string> randomUUID() = 0;
};

}  // namespace accounts
