#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/FileKeeping.h"
#include "platform/FileSystem.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/OwnerNames.h"
#include "platform/linux/TemporaryFile.h"

namespace accounts {

/// The files beneath a device root. Symbolic links in the directories of a path are followed
/// beneath the root; a link in the place of the file itself is followed only where a file is looked
/// at or copied from. Files that are made can be read by their owner alone. Only regular files are
/// read, written, moved and given away; nothing else is waited for.
class LinuxFileSystem final : public FileSystem, public FileKeeping {
 public:
  /// Temporary files go to `temporaryDirectory`, a device path; it is made when first needed, its
  /// parent must exist. `root` must outlive this.
  LinuxFileSystem(const DeviceRoot& root, std::string temporaryDirectory);

  /// A device path.
  [[nodiscard]] const std::string& temporaryDirectory() const { return temporaryDirectory_; }

  bool fileExists(std::string_view path) override;
  bool isDirectory(std::string_view path) override;
  OrFailure<EntryKind> kindOfEntry(std::string_view path) override;
  OrFailure<std::vector<std::string>> directoryEntries(std::string_view path) override;
  OrFailure<std::string> shortContents(std::string_view path, std::size_t most) override;

  /// The copy gets the permission bits of its source. Files above kLargestFileSize are not copied.
  Result copyFile(std::string_view source, std::string_view destination) override;
  Result removeFile(std::string_view path) override;
  Result createFile(std::string_view path, std::string_view contents) override;
  Result createDirectoryWithIntermediates(std::string_view path, unsigned permissions) override;
  Result removeDirectory(std::string_view path) override;
  /// As with renameFile, the directory can have its new name after a failure.
  Result renameDirectory(std::string_view source, std::string_view destination) override;
  Result synchronizeDirectory(std::string_view path) override;

  std::optional<std::string> makeTemporaryFile() override;
  /// Removes temporary files whose makers ended without removing them, from the default temporary
  /// directory and from further directories, where writeFileAtomically() puts its own. A maker
  /// holds a lock (flock) on its file until it renames or removes it, or ends; where the file
  /// system has no such locks, no file counts as abandoned. Failures leave a file for the next
  /// time.
  void removeAbandonedTemporaryFiles(const std::vector<std::string>& furtherDirectories);
  Result writeFile(std::string_view path, const SerializedPropertyList& contents) override;
  Result writeFileAtomically(std::string_view path,
                             const SerializedPropertyList& contents) override;
  Result setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                          std::string_view groupName) override;
  /// When only flushing the destination's directory fails, the file has been moved although the
  /// result is a failure: the move may not outlive a power cut.
  Result renameFile(std::string_view source, std::string_view destination) override;

 private:
  template <class Contents>
  Result replaceFile(std::string_view path, const Contents& contents);
  void removeAbandonedTemporaryFilesIn(const std::string& directory);
  /// As `DeviceRoot::locate`, but a temporary file is found in the directory in which it was made,
  /// without looking the directory up again.
  [[nodiscard]] OrFailure<DirectoryEntry> entryOf(std::string_view path) const;

  const DeviceRoot& root_;
  OwnerNames ownerNames_;
  std::string temporaryDirectory_;
  /// By their paths, the temporary files that are neither renamed nor removed yet.
  std::map<std::string, TemporaryFile, std::less<>> temporaryFiles_;
};

}  // namespace accounts
