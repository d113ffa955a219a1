#include "commandline/ReplacedFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <system_error>

#include "commandline/PlatformError.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/FileContents.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/TemporaryFile.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

constexpr mode_t kPermissionBits = 07777;

ProgramError cannotCreate(const Failure& error) {
  return programErrorOf(error, ExitStatus::CannotCreate);
}

ProgramError cannotWrite(const Failure& error) {
  return programErrorOf(error, ExitStatus::InputOutputError);
}

/// What stat says of the file to replace; a mode of 0 when there is none.
OrProgramError<void> examine(const std::string& path, struct stat& status) {
  if (::stat(path.c_str(), &status) != 0) {
    const int number = errno;
    struct stat link = {};
    status = {};
    const bool isDanglingLink = number == ENOENT && ::lstat(path.c_str(), &link) == 0;
    return number == ENOENT && !isDanglingLink ? OrProgramError<void>()
                                               : cannotCreate(pathFailure("write", path, number));
  }
  return S_ISREG(status.st_mode) || S_ISFIFO(status.st_mode)
             ? OrProgramError<void>()
             : cannotCreate(notRegularFailure("write", path, status.st_mode));
}

/// The path from the machine's root, without links, of a file that is there or is to be made; a
/// name without a directory stands for a file in the working directory.
std::string resolved(const std::string& path, bool exists, std::error_code& error) {
  const std::filesystem::path named(path);
  if (exists) {
    return std::filesystem::canonical(named, error).string();
  }
  const std::filesystem::path name = named.filename();
  if (name.empty() || name == "." || name == "..") {
    error = std::make_error_code(std::errc::is_a_directory);
    return {};
  }
  const std::filesystem::path directory = named.has_parent_path() ? named.parent_path() : ".";
  return (std::filesystem::canonical(directory, error) / name).string();
}

/// Writes to a pipe, which somebody must be reading.
OrProgramError<void> writeToPipe(const std::string& path, std::string_view contents) {
  const int opened = ::open(path.c_str(), O_WRONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC);
  if (opened < 0) {
    return cannotCreate(errno == ENXIO ? pathFailure("write", path, "Nobody reads this pipe")
                                       : pathFailure("write", path, errno));
  }
  const FileDescriptor pipe(opened);
  const int number = writeAll(pipe.number(), contents);
  return number == 0 ? OrProgramError<void>() : cannotWrite(pathFailure("write", path, number));
}

/// Fills a temporary file; returns 0 or the error number.
int fill(const FileDescriptor& file, std::string_view contents, const struct stat& replaced) {
  const int number = writeAll(file.number(), contents);
  if (number != 0 || replaced.st_mode == 0) {
    return number;
  }
  const bool isGiven = ::fchown(file.number(), replaced.st_uid, replaced.st_gid) == 0 &&
                       ::fchmod(file.number(), replaced.st_mode & kPermissionBits) == 0;
  return isGiven ? 0 : errno;
}

/// A file that is to take another one's place.
struct Replacement {
  DeviceRoot machine;
  TemporaryFile temporary;
  std::string directory;
  std::string target;
  /// What stat says of the file to replace; a mode of 0 when there is none.
  struct stat replaced = {};
};

OrProgramError<Replacement> makeReplacement(const std::string& path, const struct stat& replaced) {
  std::error_code unresolved;
  std::string target = resolved(path, replaced.st_mode != 0, unresolved);
  if (unresolved) {
    return cannotCreate(pathFailure("write", path, unresolved.value()));
  }
  auto machine = DeviceRoot::openRoot("/");
  if (!machine) {
    return cannotWrite(machine.error());
  }
  // In the target's own directory, so that both are on one file system.
  std::string directory(splitPath(target).directory);
  auto temporary = makeTemporaryFileIn(*machine, directory);
  if (!temporary) {
    return cannotCreate(temporary.error());
  }
  return Replacement{*std::move(machine), *std::move(temporary), std::move(directory),
                     std::move(target), replaced};
}

}  // namespace

OrProgramError<void> replaceFile(const std::string& path, std::string_view contents) {
  struct stat status = {};
  if (auto examined = examine(path, status); !examined) {
    return examined;
  }
  if (S_ISFIFO(status.st_mode)) {
    return writeToPipe(path, contents);
  }
  const auto made = makeReplacement(path, status);
  if (!made) {
    return made.error();
  }
  const auto& [machine, temporary, directory, target, replaced] = *made;
  const int number = fill(temporary.file, contents, replaced);
  const Result moved =
      number != 0 ? pathFailure("write", path, number)
                  : LinuxFileSystem(machine, directory).renameFile(temporary.entry.path(), target);
  if (moved) {
    return {};
  }
  // Gone already when only the directory could not be flushed; then there is nothing to remove.
  (void)temporary.entry.remove();
  return programErrorOf(moved.error(), ExitStatus::InputOutputError);
}

OrProgramError<void> checkReplaceable(const std::string& path) {
  struct stat status = {};
  if (auto examined = examine(path, status); !examined) {
    return examined;
  }
  if (S_ISFIFO(status.st_mode)) {
    // Not opened: closing it again would be the end for whoever reads it.
    return ::access(path.c_str(), W_OK) == 0 ? OrProgramError<void>()
                                             : cannotCreate(pathFailure("write", path, errno));
  }
  const auto made = makeReplacement(path, status);
  if (!made) {
    return made.error();
  }
  (void)made->temporary.entry.remove();
  return {};
}

}  // namespace accounts
