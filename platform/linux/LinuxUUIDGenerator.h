#pragma once

#include <optional>
#include <string>

#include "platform/UUIDGenerator.h"

namespace accounts {

/// UUIDs from the kernel's random numbers, by libuuid.
class LinuxUUIDGenerator final : public UUIDGenerator {
 public:
  std::optional<std::string> randomUUID() override;
};

}  // namespace accounts
