#pragma once

#include <sys/types.h>

#include <array>
#include <cstdint>
#include <filesystem>

namespace accounts {

/// The name of a system call that a process is about to make, if it touches a file beneath a
/// directory; null otherwise. `arguments` are those of the call.
const char* fileCallBeneath(const std::filesystem::path& directory, pid_t process,
                            std::uint64_t number, const std::array<std::uint64_t, 6>& arguments);

}  // namespace accounts
