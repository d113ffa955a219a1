#include "platform/linux/LinuxUUIDGenerator.h"

#include <uuid.h>

#include <array>

namespace accounts {

std::optional<std::string> LinuxUUIDGenerator::randomUUID() {
  uuid_t uuid;
  uuid_generate_random(uuid);
  std::array<char, UUID_STR_LEN> text;
  uuid_unparse_upper(uuid, text.data());
  return std::string(text.data());
}

}  // namespace accounts
