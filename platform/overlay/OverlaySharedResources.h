#pragma once

#include "platform/SharedResources.h"
#include "platform/overlay/OverlayFileSystem.h"

namespace accounts {

/// The shared places of a device whose locks nobody takes: an overlay changes nothing that another
/// process could disturb or be disturbed by.
class OverlaySharedResources final : public SharedResources {
 public:
  /// The arguments must outlive this. `lockDirectory` is where the files of locks would be made.
  OverlaySharedResources(OverlayFileSystem& files, SharedResources& beneath,
                         std::string lockDirectory)
      : files_(files), beneath_(beneath), lockDirectory_(std::move(lockDirectory)) {}

  std::string systemRootDirectory() override { return beneath_.systemRootDirectory(); }
  std::string sharedResourcesDirectory() override { return beneath_.sharedResourcesDirectory(); }
  /// Null where a lock's file could not be made: its directory is missing, or something else than
  /// a regular file is in its place.
  std::unique_ptr<NamedLock> makeLock(std::string_view name) override;

 private:
  OverlayFileSystem& files_;
  SharedResources& beneath_;
  std::string lockDirectory_;
};

}  // namespace accounts
