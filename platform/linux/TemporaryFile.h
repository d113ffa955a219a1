#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/DeviceRoot.h"
#include "platform/linux/DirectoryEntry.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/PathFailure.h"

namespace accounts {

/// How the names of all temporary files begin, so that what a killed run left behind can be told
/// from everything else.
inline constexpr std::string_view kTemporaryFilePrefix = ".accounts-migration-";

/// 64 random bits as text, which no two names have by chance; none when the system has none.
std::optional<std::string> randomDigits();

/// A new, empty file with a unique name, readable and writable by its owner alone. It is locked
/// (flock) as long as it is open, which tells others that its maker still runs.
struct TemporaryFile {
  DirectoryEntry entry;
  FileDescriptor file;
};

/// A temporary name in an open directory that nothing has yet. A failure when the system has no
/// random bytes.
OrFailure<DirectoryEntry> freeEntryIn(const std::shared_ptr<const FileDescriptor>& directory,
                                      std::string_view directoryPath);

/// Makes a temporary file in an open directory.
OrFailure<TemporaryFile> makeTemporaryFileIn(const std::shared_ptr<const FileDescriptor>& directory,
                                             std::string_view directoryPath);
/// Makes a temporary file in a directory that exists.
OrFailure<TemporaryFile> makeTemporaryFileIn(const DeviceRoot& root, std::string_view directory);

}  // namespace accounts
