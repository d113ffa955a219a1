#pragma once

#include <cstddef>
#include <filesystem>

namespace accounts {

/// Whether the system's list of file locks says that somebody holds the lock on a file.
bool isLockListed(const std::filesystem::path& file);

/// How many processes wait for the lock on a file, as that list says.
std::size_t listedLockWaiters(const std::filesystem::path& file);

}  // namespace accounts
