#pragma once

#include <cstddef>
#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "platform/FileIdentity.h"
#include "platform/FileSystem.h"

namespace accounts {

/// Thrown by a fake at the operation where a test ends the process: nothing after it happens.
struct WorldStopped {};

/// One file of the fake.
struct FakeFile {
  std::string contents;
  std::string owner = "root";
  std::string group = "wheel";
  unsigned permissions = 0644;
};

/// A file system in memory. Every operation is numbered from 0 and recorded as one line, such as
/// "rename /tmp/a -> /b"; a test can make any of them fail, or stop the world before or after it.
class FakeFileSystem : public FileSystem {
 public:
  /// Where the lines of the operations go, shared with the other fakes to show the order of all.
  explicit FakeFileSystem(std::vector<std::string>& journal) : journal_(journal) {}

  // What a test sets up and looks at
  std::map<std::string, FakeFile, std::less<>> files;
  /// Directories with their permission bits.
  std::map<std::string, unsigned, std::less<>> directories = {{"/", 0755}};
  /// Where something stands that is neither a file nor a directory.
  std::set<std::string, std::less<>> otherEntries;
  std::set<std::string, std::less<>> accountNames = {"mobile", "root"};
  std::string temporaryDirectory = "/var/mobile/tmp";

  void addDirectory(std::string_view path);
  /// Adds a file and its missing parent directories.
  void addFile(std::string_view path, std::string_view contents);
  /// The contents of a file; none when it does not exist.
  [[nodiscard]] std::optional<std::string> contentsOf(std::string_view path) const;
  /// The files whose name begins as that of a temporary file does.
  [[nodiscard]] std::vector<std::string> temporaryFiles() const;

  // Faults
  /// Makes every operation whose recorded line begins with a text fail.
  void failWhenLineBegins(std::string lineBeginning) {
    failingBeginnings_.insert(std::move(lineBeginning));
  }
  /// Makes the operation with a number fail, or every one from it on.
  void failAt(std::size_t operation) { failAt_ = operation; }
  void failFrom(std::size_t operation) { failFrom_ = operation; }
  /// Throws WorldStopped before or after the operation with a number.
  void stopBefore(std::size_t operation) { stopBefore_ = operation; }
  void stopAfter(std::size_t operation) { stopAfter_ = operation; }
  void removeFaults();
  /// The number of operations so far.
  [[nodiscard]] std::size_t operationCount() const { return operationCount_; }

  /// Counts a read of a whole file by another fake. None when the file is missing or a fault hits.
  std::optional<std::string> read(std::string_view path);

  bool fileExists(std::string_view path) override;
  bool isDirectory(std::string_view path) override;
  Result copyFile(std::string_view source, std::string_view destination) override;
  Result removeFile(std::string_view path) override;
  Result createFile(std::string_view path, std::string_view contents) override;
  Result createDirectoryWithIntermediates(std::string_view path, unsigned permissions) override;
  std::optional<std::string> makeTemporaryFile() override;
  Result writeFile(std::string_view path, const SerializedPropertyList& contents) override;
  Result writeFileAtomically(std::string_view path,
                             const SerializedPropertyList& contents) override;
  Result setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                          std::string_view groupName) override;
  Result renameFile(std::string_view source, std::string_view destination) override;

 private:
  /// Records an operation and runs it unless a fault hits it.
  Result perform(const std::string& line, const std::function<Result()>& operation);
  [[nodiscard]] bool parentExists(std::string_view path) const;
  [[nodiscard]] EntryKind kindOf(std::string_view path) const;
  [[noreturn]] void stopWorld();
  Result put(std::string_view path, std::string_view contents);

  std::vector<std::string>& journal_;
  std::size_t operationCount_ = 0;
  std::size_t temporaryFileCount_ = 0;
  std::set<std::string> failingBeginnings_;
  std::optional<std::size_t> failAt_, failFrom_, stopBefore_, stopAfter_;
};

}  // namespace accounts
