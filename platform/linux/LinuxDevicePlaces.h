#pragma once

#include <array>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "platform/DevicePlaces.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/DirectoryEntry.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/PathFailure.h"

namespace accounts {

/// Whether a snapshot says that nothing can be changed on a mount that may only be read.
enum class ReadOnlyMounts : std::uint8_t { Refuse, Overlook };

/// The places of a device beneath a root. A file that is made or moved away has a name beside its
/// place that tells the next run what it is, see StagedName.
class LinuxDevicePlaces final : public DevicePlaces {
 public:
  /// `root` and `files` must outlive this; `home` is the home directory, a device path.
  LinuxDevicePlaces(const DeviceRoot& root, LinuxFileSystem& files, std::string home,
                    ReadOnlyMounts readOnlyMounts = ReadOnlyMounts::Refuse);

  OrFailure<DeviceSnapshot> takeSnapshot() override;
  OrFailure<FileIdentity> identityAt(DevicePlace place) override;
  OrFailure<std::unique_ptr<StagedFile>> stage(DevicePlace place, const NewFile& file) override;
  OrFailure<std::unique_ptr<StagedFile>> stageKept(DevicePlace place,
                                                   std::string_view keptPath) override;
  PlaceOutcome put(DevicePlace place, StagedFile& file, const FileIdentity& expected) override;
  PlaceOutcome remove(DevicePlace place, const FileIdentity& expected) override;
  PlaceOutcome keep(DevicePlace place, std::string_view keptPath,
                    const FileIdentity& expected) override;
  Result flush(DevicePlace place) override;
  Result makeInformationDirectory() override;
  Result writeInformationFile(std::string_view name, const ReadableBytes& contents) override;
  std::vector<std::string> settleLeftovers() override;
  /// Only removes the temporary files of killed runs that no commit knows of, as those of a plug-in
  /// that works on the device itself. Needs no lock. What cannot be removed stays for the next
  /// time.
  void removeAbandonedTemporaryFiles();

 private:
  /// An error number of a change, or 0 where it is that of a mount that is overlooked.
  [[nodiscard]] int numberThatCounts(int number) const;
  /// A directory that places are in, as the snapshot found it.
  struct Directory {
    std::shared_ptr<const FileDescriptor> descriptor;
    struct stat status = {};
    /// The system's error number for changing its names; 0 for none.
    int whyNotChanged = 0;
  };

  [[nodiscard]] std::string pathOf(DevicePlace place) const { return pathOfPlace(place, home_); }
  /// The directory of a path.
  OrFailure<std::shared_ptr<const Directory>> directoryOf(const std::string& path);
  /// The directory of a place of the snapshot; null for one that could not be opened.
  [[nodiscard]] const Directory* directoryAt(DevicePlace place) const {
    return directories_[indexOf(place)].get();
  }
  /// The directory of a place, opened now where it was missing.
  OrFailure<std::shared_ptr<const Directory>> openDirectoryAt(DevicePlace place);
  /// Looks at one place. A failure when what stands there cannot be told or opened and the
  /// migration would read it.
  Result look(DevicePlace place, PlaceState& state);
  Result lookAtTarget(DevicePlace place, PlaceState& state);
  Result lookThroughLink(DevicePlace place, PlaceState& state);
  void foresee(DevicePlace place, const Directory& directory, const struct stat& status,
               PlaceState& state) const;
  void foreseeInformationDirectory(PlaceState& state);
  [[nodiscard]] Result checkThatNoTwoAreOne() const;

  const DeviceRoot& root_;
  LinuxFileSystem& files_;
  std::string home_;
  ReadOnlyMounts readOnlyMounts_;
  bool metReadOnlyMount_ = false;
  std::array<std::shared_ptr<const Directory>, kDevicePlaceCount> directories_;
  /// Those of this snapshot by their paths.
  std::map<std::string, std::shared_ptr<const Directory>, std::less<>> opened_;
};

}  // namespace accounts
