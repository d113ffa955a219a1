#pragma once

#include "platform/ReplacedParts.h"
#include "transaction/TransactionFileSystem.h"
#include "transaction/TransactionFrameworkLoader.h"
#include "transaction/TransactionPropertyLists.h"
#include "transaction/TransactionSharedResources.h"

namespace accounts {

/// The parts of a platform whose changes stay in memory, beside a device's own for all else.
class TransactionPlatform {
 public:
  /// The arguments must outlive this. `foreignPath` is told of a path that no migration has.
  TransactionPlatform(Transaction& transaction, const Platform& device, OwnershipRule& ownership,
                      MigrationLockState lock, TransactionFileSystem::ForeignPath foreignPath)
      : device_(device),
        files_(transaction, ownership, std::move(foreignPath)),
        propertyLists_(transaction, device.propertyLists),
        sharedResources_(device.sharedResources, lock),
        frameworks_(device.frameworkLoader) {}

  [[nodiscard]] PropertyLists& propertyLists() { return propertyLists_; }

  /// All of it, with `preferences`, which are to read what propertyLists() gives.
  [[nodiscard]] Platform platform(PreferenceDomain& preferences) {
    return platformWith(device_, {.fileSystem = &files_,
                                  .frameworkLoader = &frameworks_,
                                  .preferenceDomain = &preferences,
                                  .propertyLists = &propertyLists_,
                                  .sharedResources = &sharedResources_});
  }

 private:
  const Platform& device_;
  TransactionFileSystem files_;
  TransactionPropertyLists propertyLists_;
  TransactionSharedResources sharedResources_;
  TransactionFrameworkLoader frameworks_;
};

}  // namespace accounts
