#include "platform/linux/TemporaryFile.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/random.h>
#include <sys/stat.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <utility>

#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

// With 64 random bits a name is never taken by chance; a few attempts are more than enough.
constexpr int kMostNames = 16;

std::optional<std::string> uniqueName() {
  const auto digits = randomDigits();
  return digits ? std::optional(std::string(kTemporaryFilePrefix) + *digits) : std::nullopt;
}

// Locks a new file, so that nobody takes it for an abandoned one, and tells whether nobody did
// before it was locked. Where the file system has no such locks, nobody can.
bool isOurs(const FileDescriptor& file) {
  while (::flock(file.number(), LOCK_EX) != 0 && errno == EINTR) {
  }
  struct stat status = {};
  return ::fstat(file.number(), &status) != 0 || status.st_nlink > 0;
}

}  // namespace

std::optional<std::string> randomDigits() {
  std::array<std::uint8_t, 8> bytes;
  if (::getrandom(bytes.data(), bytes.size(), 0) != static_cast<ssize_t>(bytes.size())) {
    return std::nullopt;
  }
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::string digits;
  for (const std::uint8_t byte : bytes) {
    digits += kDigits[byte >> 4];
    digits += kDigits[byte & 0x0f];
  }
  return digits;
}

OrFailure<DirectoryEntry> freeEntryIn(const std::shared_ptr<const FileDescriptor>& directory,
                                      std::string_view directoryPath) {
  auto name = uniqueName();
  if (!name) {
    return pathFailure("make a temporary name in", directoryPath, errno);
  }
  std::string path = joinedPath(directoryPath, *name);
  return DirectoryEntry(directory, *std::move(name), std::move(path));
}

OrFailure<TemporaryFile> makeTemporaryFileIn(const std::shared_ptr<const FileDescriptor>& directory,
                                             std::string_view directoryPath) {
  Failure error;
  for (int attempt = 0; attempt < kMostNames; ++attempt) {
    auto entry = freeEntryIn(directory, directoryPath);
    if (!entry) {
      return entry.error();
    }
    auto file = entry->createFile(kOwnerOnlyFile);
    // The process's mask applies to open but not to fchmod.
    if (file && ::fchmod(file->number(), kOwnerOnlyFile) != 0) {
      error = pathFailure("set the permissions of", entry->path(), errno);
      (void)entry->remove();
      return error;
    }
    if (file && isOurs(*file)) {
      return TemporaryFile{std::move(*entry), std::move(*file)};
    }
    if (!file) {
      error = file.error();
      if (error.number != EEXIST) {
        break;
      }
    }
  }
  return error;
}

OrFailure<TemporaryFile> makeTemporaryFileIn(const DeviceRoot& root, std::string_view directory) {
  auto opened = root.open(directory, O_PATH | O_DIRECTORY);
  return opened ? makeTemporaryFileIn(std::make_shared<const FileDescriptor>(*std::move(opened)),
                                      directory)
                : opened.error();
}

}  // namespace accounts
