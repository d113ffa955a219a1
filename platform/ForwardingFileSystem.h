#pragma once

#include "platform/FileSystem.h"

namespace accounts {

/// Another file system, seen through something that adds to a few of its operations: each one that
/// is not overridden is the other's own.
class ForwardingFileSystem : public FileSystem {
 public:
  /// `files` must outlive this.
  explicit ForwardingFileSystem(FileSystem& files) : files_(files) {}

  bool fileExists(std::string_view path) override { return files_.fileExists(path); }
  bool isDirectory(std::string_view path) override { return files_.isDirectory(path); }
  Result copyFile(std::string_view source, std::string_view destination) override {
    return files_.copyFile(source, destination);
  }
  Result removeFile(std::string_view path) override { return files_.removeFile(path); }
  Result createFile(std::string_view path, std::string_view contents) override {
    return files_.createFile(path, contents);
  }
  Result createDirectoryWithIntermediates(std::string_view path, unsigned permissions) override {
    return files_.createDirectoryWithIntermediates(path, permissions);
  }
  std::optional<std::string> makeTemporaryFile() override { return files_.makeTemporaryFile(); }
  Result writeFile(std::string_view path, const SerializedPropertyList& contents) override {
    return files_.writeFile(path, contents);
  }
  Result writeFileAtomically(std::string_view path,
                             const SerializedPropertyList& contents) override {
    return files_.writeFileAtomically(path, contents);
  }
  Result setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                          std::string_view groupName) override {
    return files_.setOwnerAndGroup(path, ownerName, groupName);
  }
  Result renameFile(std::string_view source, std::string_view destination) override {
    return files_.renameFile(source, destination);
  }

 private:
  FileSystem& files_;
};

}  // namespace accounts
