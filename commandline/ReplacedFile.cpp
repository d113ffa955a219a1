#include "commandline/ReplacedFile.h"

#include <sys/stat.h>

#include <cerrno>
#include <filesystem>
#include <variant>

#include "platform/linux/DevicePath.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/FileContents.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/TemporaryFile.h"

namespace accounts {
namespace {

constexpr mode_t kPermissionBits = 07777;

ProgramError cannotCreate(const PathError& error) {
  return ProgramError{ExitStatus::CannotCreate, error.text};
}

ProgramError cannotWrite(const std::string& text) {
  return ProgramError{ExitStatus::InputOutputError, text};
}

/// What stat says of the file to replace; a mode of 0 when there is none.
std::optional<ProgramError> examine(const std::string& path, struct stat& status) {
  if (::stat(path.c_str(), &status) != 0) {
    const int number = errno;
    struct stat link = {};
    status = {};
    const bool isDanglingLink = number == ENOENT && ::lstat(path.c_str(), &link) == 0;
    return number == ENOENT && !isDanglingLink
               ? std::nullopt
               : std::optional(cannotCreate(pathError("replace", path, number)));
  }
  return S_ISREG(status.st_mode)
             ? std::nullopt
             : std::optional(cannotCreate(notRegularError("replace", path, status.st_mode)));
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

std::variant<Replacement, ProgramError> makeReplacement(const std::string& path) {
  struct stat replaced = {};
  if (std::optional<ProgramError> error = examine(path, replaced)) {
    return *std::move(error);
  }
  std::error_code unresolved;
  std::string target = std::filesystem::weakly_canonical(path, unresolved).string();
  if (unresolved) {
    return cannotCreate(pathError("replace", path, unresolved.value()));
  }
  PathError error;
  std::optional<DeviceRoot> machine = DeviceRoot::openRoot("/", error);
  if (!machine) {
    return cannotWrite(error.text);
  }
  // In the target's own directory, so that both are on one file system.
  std::string directory(splitPath(target).directory);
  std::optional<TemporaryFile> temporary = makeTemporaryFileIn(*machine, directory, error);
  if (!temporary) {
    return cannotCreate(error);
  }
  return Replacement{*std::move(machine), *std::move(temporary), std::move(directory),
                     std::move(target), replaced};
}

}  // namespace

std::optional<ProgramError> replaceFile(const std::string& path, std::string_view contents) {
  const std::variant<Replacement, ProgramError> made = makeReplacement(path);
  if (const auto* error = std::get_if<ProgramError>(&made)) {
    return *error;
  }
  const auto& [machine, temporary, directory, target, replaced] = std::get<Replacement>(made);
  const int number = fill(temporary.file, contents, replaced);
  const Result moved =
      number != 0 ? Result::failure(pathError("write", path, number).text)
                  : LinuxFileSystem(machine, directory).renameFile(temporary.entry.path(), target);
  if (moved) {
    return std::nullopt;
  }
  // Gone already when only the directory could not be flushed; then there is nothing to remove.
  (void)temporary.entry.remove();
  return cannotWrite(moved.error());
}

std::optional<ProgramError> whyNotReplaceable(const std::string& path) {
  const std::variant<Replacement, ProgramError> made = makeReplacement(path);
  if (const auto* error = std::get_if<ProgramError>(&made)) {
    return *error;
  }
  (void)std::get<Replacement>(made).temporary.entry.remove();
  return std::nullopt;
}

}  // namespace accounts
