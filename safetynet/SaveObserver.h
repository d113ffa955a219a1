#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/FileSystem.h"
#include "safetynet/SettingsSaves.h"

namespace accounts {

/// Another file system, seen through something that notices the plug-in's saves. A save reports its
/// outcome to nobody, but it has a form of its own: it alone makes a temporary file, and what it
/// wrote replaces the settings file by a rename.
class SaveObserver final : public FileSystem {
 public:
  /// `files` must outlive this.
  SaveObserver(FileSystem& files, std::string settingsPath)
      : files_(files), settingsPath_(std::move(settingsPath)) {}

  [[nodiscard]] const SettingsSaves& saves() const { return saves_; }

  std::optional<std::string> makeTemporaryFile() override;
  Result renameFile(std::string_view source, std::string_view destination) override;

  bool fileExists(std::string_view path) override { return files_.fileExists(path); }
  bool isDirectory(std::string_view path) override { return files_.isDirectory(path); }
  std::optional<EntryKind> kindOfEntry(std::string_view path) override {
    return files_.kindOfEntry(path);
  }
  std::optional<std::vector<std::string>> directoryEntries(std::string_view path) override {
    return files_.directoryEntries(path);
  }
  bool haveSameContents(std::string_view first, std::string_view second) override {
    return files_.haveSameContents(first, second);
  }
  Result copyFile(std::string_view source, std::string_view destination) override {
    return files_.copyFile(source, destination);
  }
  Result linkFile(std::string_view source, std::string_view destination) override {
    return files_.linkFile(source, destination);
  }
  Result removeFile(std::string_view path) override { return files_.removeFile(path); }
  Result createFile(std::string_view path, std::string_view contents) override {
    return files_.createFile(path, contents);
  }
  Result createDirectoryWithIntermediates(std::string_view path, unsigned permissions) override {
    return files_.createDirectoryWithIntermediates(path, permissions);
  }
  Result removeDirectory(std::string_view path) override { return files_.removeDirectory(path); }
  Result renameDirectory(std::string_view source, std::string_view destination) override {
    return files_.renameDirectory(source, destination);
  }
  Result synchronizeDirectory(std::string_view path) override {
    return files_.synchronizeDirectory(path);
  }
  Result writeFile(std::string_view path, std::string_view contents) override {
    return files_.writeFile(path, contents);
  }
  Result writeFileAtomically(std::string_view path, std::string_view contents) override {
    return files_.writeFileAtomically(path, contents);
  }
  Result setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                          std::string_view groupName) override {
    return files_.setOwnerAndGroup(path, ownerName, groupName);
  }
  void removeAbandonedTemporaryFiles(const std::vector<std::string>& furtherDirectories) override {
    files_.removeAbandonedTemporaryFiles(furtherDirectories);
  }

 private:
  FileSystem& files_;
  std::string settingsPath_;
  SettingsSaves saves_;
};

}  // namespace accounts
