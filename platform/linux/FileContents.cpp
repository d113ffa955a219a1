#include "platform/linux/FileContents.h"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <utility>

namespace accounts {
namespace {

constexpr std::size_t kBlockSize = std::size_t{64} << 10;

// Passes the bytes of an open file to `take` block by block, with the size that the file says it
// has; a failure of `take` ends it.
template <class Take>
Result readBlocks(const FileDescriptor& file, std::string_view path, Take take) {
  const auto status = fileStatus(file, path);
  if (!status) {
    return status.error();
  }
  // Seen before anything is read; the count below is for files that grow or hide their size.
  if (status->st_size > static_cast<off_t>(kLargestFileSize)) {
    return pathFailure("read", path, EFBIG);
  }
  std::array<char, kBlockSize> block;
  std::size_t total = 0;
  for (;;) {
    const ssize_t count = ::read(file.number(), block.data(), block.size());
    if (count < 0 && errno == EINTR) {
      continue;
    }
    if (count < 0) {
      return pathFailure("read", path, errno);
    }
    if (count == 0) {
      return {};
    }
    total += static_cast<std::size_t>(count);
    if (total > kLargestFileSize) {
      return pathFailure("read", path, EFBIG);
    }
    const Result taken = take(std::string_view(block.data(), static_cast<std::size_t>(count)),
                              static_cast<std::size_t>(status->st_size));
    if (!taken) {
      return taken;
    }
  }
}

}  // namespace

OrFailure<struct stat> fileStatus(const FileDescriptor& file, std::string_view path) {
  struct stat status = {};
  if (::fstat(file.number(), &status) != 0) {
    return pathFailure("examine", path, errno);
  }
  return status;
}

OrFailure<std::string> readContents(const FileDescriptor& file, std::string_view path) {
  std::string bytes;
  const Result read = readBlocks(file, path, [&](std::string_view block, std::size_t size) {
    if (bytes.empty()) {
      bytes.reserve(size);
    }
    bytes.append(block);
    return Result();
  });
  if (!read) {
    return read.error();
  }
  return bytes;
}

OrFailure<std::string> readHostFile(const std::string& path, Pipes pipes) {
  if (path == kStandardStream) {
    // A duplicate, since closing the standard stream itself would free its number.
    const FileDescriptor input(::fcntl(STDIN_FILENO, F_DUPFD_CLOEXEC, 0));
    return readContents(input, nameOfInput(path));
  }
  // A pipe is waited for until somebody writes; opening anything else never waits.
  struct stat named = {};
  const bool isPipe =
      pipes == Pipes::Read && ::stat(path.c_str(), &named) == 0 && S_ISFIFO(named.st_mode);
  const int flags = O_RDONLY | O_CLOEXEC | O_NOCTTY | (isPipe ? 0 : O_NONBLOCK);
  const int number = ::open(path.c_str(), flags);
  if (number < 0) {
    return pathFailure("open", path, errno);
  }
  const FileDescriptor file(number);
  const auto status = fileStatus(file, path);
  if (!status) {
    return status.error();
  }
  if (!S_ISREG(status->st_mode) && !(isPipe && S_ISFIFO(status->st_mode))) {
    return notRegularFailure("read", path, status->st_mode);
  }
  return readContents(file, path);
}

std::string nameOfInput(const std::string& path) {
  return path == kStandardStream ? "standard input" : path;
}

int writeAll(int descriptor, std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t count = ::write(descriptor, bytes.data(), bytes.size());
    if (count >= 0) {
      bytes.remove_prefix(static_cast<std::size_t>(count));
    } else if (errno == EAGAIN) {
      // Standard error may be a pipe that another program made non-blocking.
      pollfd writable = {descriptor, POLLOUT, 0};
      ::poll(&writable, 1, -1);
    } else if (errno != EINTR) {
      return errno;
    }
  }
  return 0;
}

int writeAll(int descriptor, const SerializedPropertyList& contents) {
  int number = 0;
  const bool isWhole = contents.giveTo([&](std::string_view piece) {
    number = writeAll(descriptor, piece);
    return number == 0;
  });
  // Half a file is never taken for a whole one, whatever kept its bytes from being made.
  return isWhole || number != 0 ? number : EIO;
}

Result copyContents(const FileDescriptor& source, std::string_view sourcePath,
                    const FileDescriptor& destination, std::string_view destinationPath) {
  return readBlocks(source, sourcePath, [&](std::string_view block, std::size_t) {
    return asResult("write", destinationPath, writeAll(destination.number(), block));
  });
}

int flush(const FileDescriptor& file) {
  while (::fsync(file.number()) != 0) {
    if (errno != EINTR) {
      return errno;
    }
  }
  return 0;
}

int flushDirectory(const FileDescriptor& directory) {
  const int number = flush(directory);
  return number == EINVAL ? 0 : number;
}

}  // namespace accounts
