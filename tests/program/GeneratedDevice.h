#pragma once

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace accounts {

/// A file or directory of a device.
struct GeneratedEntry {
  /// Its device path.
  std::string path;
  /// None for a directory.
  std::optional<std::string> contents;
  mode_t mode = 0755;
  /// Owner and group; a test that is not run by root leaves them its own.
  uid_t owner = 0;
};

/// The user "mobile" of a generated device: where the test is run by root, a user who is not.
uid_t mobileOfGeneratedDevices();

/// A small device that a seed decides: the files that a migration reads, writes and removes, each
/// one there or not, right or wrong; each directory before what is in it.
std::vector<GeneratedEntry> generatedDevice(std::uint64_t seed);

/// Makes a device beneath a directory. A failure of the test when it cannot.
void makeDevice(const std::vector<GeneratedEntry>& device, const std::filesystem::path& root);

/// The files of a device with what they hold, a line each, for people.
std::string description(const std::vector<GeneratedEntry>& device);

}  // namespace accounts
