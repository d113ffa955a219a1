#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "platform/FileSystem.h"
#include "transaction/Transaction.h"

namespace accounts {

/// Tells who may be given a file, so that a file system that changes nothing can still say what
/// would be refused.
class OwnershipRule {
 public:
  virtual ~OwnershipRule() = default;

  /// The numbers of a user and a group with these account names; a failure with the reason when
  /// the device does not know them or a file could not be given to them.
  virtual OrFailure<FileOwner> ownerNamed(std::string_view ownerName,
                                          std::string_view groupName) = 0;
};

/// The file system of a migration in memory. What the device would refuse is refused as the
/// snapshot says; temporary files are in memory alone and need no directory.
class TransactionFileSystem final : public FileSystem {
 public:
  /// Is told of a path that is not listed, and does not return.
  using ForeignPath = std::function<void(std::string_view path)>;

  /// The arguments must outlive this.
  TransactionFileSystem(Transaction& transaction, OwnershipRule& ownership, ForeignPath foreignPath)
      : transaction_(transaction), ownership_(ownership), foreignPath_(std::move(foreignPath)) {}

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
  /// The place with a path; does not return for one that is not listed.
  [[nodiscard]] DevicePlace placeOf(std::string_view path) const;
  /// Why nothing can be put at a place; success when something can.
  [[nodiscard]] Result canPut(DevicePlace place) const;
  /// Passes a failure on, noted when it is one of the save that is made.
  Result ofSave(Result result);

  Transaction& transaction_;
  OwnershipRule& ownership_;
  ForeignPath foreignPath_;
  std::map<std::string, Transaction::List, std::less<>> temporaryFiles_;
  std::size_t temporaryFileCount_ = 0;
};

}  // namespace accounts
