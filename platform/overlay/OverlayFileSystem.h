#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "platform/FileSystem.h"

namespace accounts {

/// Tells who may be given a file, so that a file system that changes nothing can still say what
/// would be refused.
class OwnershipRule {
 public:
  virtual ~OwnershipRule() = default;

  /// Whether a file could be given to a user and a group with these account names.
  virtual Result canGive(std::string_view ownerName, std::string_view groupName) = 0;
};

/// Another file system with changes that are in memory alone: what is made, written, moved or
/// removed is so for whoever looks through this, and the file system beneath is only read. Paths
/// count as they are written: what is reached under a second path, through a symbolic link, is not
/// changed there. Whether the medium has room and its directories may be written is not foreseen.
class OverlayFileSystem final : public FileSystem {
 public:
  /// The bytes of a file in memory, or the path of a file beneath that it has the contents of.
  struct InMemory {
    std::shared_ptr<const std::string> bytes;
  };
  struct Beneath {
    std::string path;
  };
  struct Missing {};
  using Contents = std::variant<Missing, Beneath, InMemory>;

  /// The arguments must outlive this. `temporaryDirectory` is where temporary files would be.
  OverlayFileSystem(FileSystem& beneath, OwnershipRule& ownership, std::string temporaryDirectory);

  /// Where the contents of the file at a path are; missing when no file can be there.
  [[nodiscard]] Contents contentsOf(std::string_view path) const;

  bool fileExists(std::string_view path) override;
  bool isDirectory(std::string_view path) override;
  std::optional<EntryKind> kindOfEntry(std::string_view path) override;
  std::optional<std::vector<std::string>> directoryEntries(std::string_view path) override;
  /// True only for files that are known to be the same without being read.
  bool haveSameContents(std::string_view first, std::string_view second) override;
  Result copyFile(std::string_view source, std::string_view destination) override;
  Result linkFile(std::string_view source, std::string_view destination) override;
  Result removeFile(std::string_view path) override;
  Result createFile(std::string_view path, std::string_view contents) override;
  Result createDirectoryWithIntermediates(std::string_view path, unsigned permissions) override;
  Result removeDirectory(std::string_view path) override;
  /// Always a failure: no directory is moved.
  Result renameDirectory(std::string_view source, std::string_view destination) override;
  Result synchronizeDirectory(std::string_view path) override;
  std::optional<std::string> makeTemporaryFile() override;
  /// Does nothing: what is abandoned is not known without a look at other processes' locks.
  void removeAbandonedTemporaryFiles(const std::vector<std::string>& furtherDirectories) override;
  Result writeFile(std::string_view path, const SerializedPropertyList& contents) override;
  Result writeFileAtomically(std::string_view path,
                             const SerializedPropertyList& contents) override;
  Result setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                          std::string_view groupName) override;
  Result renameFile(std::string_view source, std::string_view destination) override;

 private:
  struct Removed {};
  struct Directory {};
  /// What was done to a path; Beneath and InMemory are regular files.
  using Change = std::variant<Removed, Directory, Beneath, InMemory>;

  [[nodiscard]] const Change* changeOf(std::string_view path) const;
  Result put(std::string_view operation, std::string_view path, Change change);

  FileSystem& beneath_;
  OwnershipRule& ownership_;
  std::string temporaryDirectory_;
  std::map<std::string, Change, std::less<>> changes_;
  std::size_t temporaryFileCount_ = 0;
};

}  // namespace accounts
