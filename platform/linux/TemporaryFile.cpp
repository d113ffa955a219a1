#include "platform/linux/TemporaryFile.h"

#include <sys/file.h>
#include <sys/random.h>
#include <sys/stat.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <utility>

#include "platform/linux/DevicePath.h"

namespace accounts {
namespace {

// With 64 random bits a name is never taken by chance; a few attempts are more than enough.
constexpr int kMostNames = 16;

std::optional<std::string> uniqueName() {
  std::array<std::uint8_t, 8> bytes;
  if (::getrandom(bytes.data(), bytes.size(), 0) != static_cast<ssize_t>(bytes.size())) {
    return std::nullopt;
  }
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::string name(kTemporaryFilePrefix);
  for (const std::uint8_t byte : bytes) {
    name += kDigits[byte >> 4];
    name += kDigits[byte & 0x0f];
  }
  return name;
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

std::optional<TemporaryFile> makeTemporaryFileIn(const DeviceRoot& root, std::string_view directory,
                                                 PathError& error) {
  for (int attempt = 0; attempt < kMostNames; ++attempt) {
    const auto name = uniqueName();
    if (!name) {
      error = pathError("make a temporary name in", directory, errno);
      return std::nullopt;
    }
    auto entry = root.locate(joinedPath(directory, *name), error);
    if (!entry) {
      return std::nullopt;
    }
    auto file = entry->createFile(kOwnerOnlyFile, error);
    if (file && isOurs(*file)) {
      return TemporaryFile{std::move(*entry), std::move(*file)};
    }
    if (!file && error.number != EEXIST) {
      return std::nullopt;
    }
  }
  return std::nullopt;
}

}  // namespace accounts
