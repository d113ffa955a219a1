#pragma once

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include "platform/linux/DeviceRoot.h"

namespace accounts {

/// Why there is no value; a failure without words for one that is there.
template <class Value>
Failure failureOf(const OrFailure<Value>& result) {
  return result ? Failure() : result.error();
}

/// A small device image in a temporary directory of the host, and a directory beside it that
/// nothing may reach from the device. Device paths given to its helpers start with "/".
class DeviceFixture : public testing::Test {
 protected:
  DeviceFixture();
  ~DeviceFixture() override;

  /// The image's directory on the host.
  [[nodiscard]] std::filesystem::path image() const { return base_ / "image"; }
  /// A directory on the host that is not part of the device.
  [[nodiscard]] std::filesystem::path outside() const { return base_ / "outside"; }
  /// Where a device path lies on the host, symbolic links not regarded.
  [[nodiscard]] std::filesystem::path onHost(std::string_view devicePath) const;

  /// Makes directories, with their parents, on the device.
  void makeDirectory(std::string_view devicePath) const;
  /// Makes a file, with its parent directories, on the device.
  void makeFile(std::string_view devicePath, std::string_view contents) const;
  void makeLink(std::string_view devicePath, const std::filesystem::path& target) const;
  void makeNamedPipe(std::string_view devicePath) const;

  /// The contents of a file of the device, symbolic links not regarded.
  [[nodiscard]] std::string contentsOf(std::string_view devicePath) const;
  [[nodiscard]] struct stat statusOf(std::string_view devicePath) const;
  /// The permission bits of something on the device.
  [[nodiscard]] unsigned permissionsOf(std::string_view devicePath) const;
  /// The names in a directory of the device, sorted.
  [[nodiscard]] std::vector<std::string> namesIn(std::string_view devicePath) const;

  /// The image opened as a device root.
  [[nodiscard]] DeviceRoot openImage() const;

 private:
  std::filesystem::path base_;
};

/// The text of a file of the host, and a file of the host with a text.
std::string hostFileContents(const std::filesystem::path& path);
void makeHostFile(const std::filesystem::path& path, std::string_view contents);

/// An XML property list around one value's element, or around a dictionary's entries.
std::string xmlPropertyList(std::string_view element);
std::string xmlDictionary(std::string_view entries);

/// While this lives the process has no rights beyond those of everyone: where it runs as the
/// superuser, whom no permission bits stop, it acts as another user.
class WithoutPrivileges {
 public:
  WithoutPrivileges();
  ~WithoutPrivileges();
  WithoutPrivileges(const WithoutPrivileges&) = delete;
  WithoutPrivileges& operator=(const WithoutPrivileges&) = delete;

 private:
  bool changed_;
};

/// Makes a system call fail with an error number from now on, as it may on another kernel or a
/// broken disk. It cannot be undone: only for a process that is about to end, in a death test.
void makeSystemCallFail(long systemCall, int number);

/// While this lives the process can write no file beyond a size: writing more fails, as it does on
/// a full disk.
class WithLargestWrittenFile {
 public:
  explicit WithLargestWrittenFile(std::size_t size);
  ~WithLargestWrittenFile();
  WithLargestWrittenFile(const WithLargestWrittenFile&) = delete;
  WithLargestWrittenFile& operator=(const WithLargestWrittenFile&) = delete;

 private:
  struct rlimit previous_ = {};
};

/// Sets the process's file mode mask for a scope.
class WithMask {
 public:
  explicit WithMask(mode_t mask) : previous_(::umask(mask)) {}
  ~WithMask() { ::umask(previous_); }
  WithMask(const WithMask&) = delete;
  WithMask& operator=(const WithMask&) = delete;

 private:
  mode_t previous_;
};

}  // namespace accounts
