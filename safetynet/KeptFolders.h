#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "platform/DevicePlaces.h"
#include "platform/FileKeeping.h"

namespace accounts {

/// Why files are kept.
enum class KeptFor : std::uint8_t {
  /// A migration, because somebody asked for it; the folder is called "Kept-TIME".
  Migration,
  /// The same, because the migration may not have carried over everything.
  MigrationWithLosses,
  /// Other files were put in their place; the folder is called "Replaced-TIME".
  Restoration
};

/// What stood at each place of a folder of kept files.
using KeptPlaces = std::map<DevicePlace, EntryKind>;

/// What a folder of kept files says of itself.
struct KeptList {
  /// Why it was kept; none when the list does not say.
  std::optional<KeptFor> reason;
  KeptPlaces places;
};

/// A place to be kept, with what stands there.
struct PlaceToKeep {
  DevicePlace place = DevicePlace::Settings;
  FileIdentity identity;
};

/// The folders of kept files on one device. A folder has its name only while it is whole: it is
/// filled and emptied under the name "Unfinished-TIME". Each file in it has the name of its place;
/// a list says what stood at every one, nothing included. Whoever changes anything here holds the
/// host's lock.
class KeptFolders {
 public:
  /// The arguments must outlive this.
  KeptFolders(FileKeeping& files, DevicePlaces& places) : files_(files), places_(places) {}

  /// The paths of all folders that were kept for a migration, or for a restoration, oldest first.
  /// An error when they cannot be looked at, which is not the same as none.
  [[nodiscard]] OrFailure<std::vector<std::string>> keptFor(KeptFor purpose) const;
  /// Whether there is a folder of kept files with this name, of either purpose. An error when that
  /// cannot be told.
  [[nodiscard]] OrFailure<bool> contains(std::string_view name) const;
  /// The path of the folder with a name.
  [[nodiscard]] static std::string pathOf(std::string_view name);
  /// Where a folder has what stood at a place.
  [[nodiscard]] static std::string pathIn(std::string_view folder, DevicePlace place);
  /// What a folder says of itself; none when its list is missing or is no such list. An error when
  /// it cannot be read at the moment.
  [[nodiscard]] OrFailure<std::optional<KeptList>> listOf(std::string_view folder) const;

  /// Gives what stands at places second names in a new folder, durably, and writes the folder's
  /// path to `folder`. `time` is sortable text; a folder that exists is never touched. Whatever is
  /// not done leaves no folder and `folder` as it was. Of a directory the list alone tells.
  PlaceOutcome keep(const std::vector<PlaceToKeep>& places, KeptFor purpose, std::string_view time,
                    std::string& folder);

  /// Removes a folder, and the directory of all of them if this made it and it is empty. A failure
  /// leaves it whole; once it has lost its name it is gone, though parts may stay under the
  /// unfinished one.
  Result discard(std::string_view folder);

  /// Removes what killed runs left unfinished; nothing in it is needed. Failures are left to the
  /// next run.
  void removeUnfinished();

  /// Makes the directory of all folders if it is missing, and sees to it that it is on the medium.
  Result makeDirectory();
  /// Removes it if this made it and it is empty.
  void removeDirectoryIfMade();

 private:
  PlaceOutcome fill(const std::string& unfinished, KeptFor purpose,
                    const std::vector<PlaceToKeep>& places);
  void removeWithContents(const std::string& folder);

  FileKeeping& files_;
  DevicePlaces& places_;
  bool madeDirectory_ = false;
};

}  // namespace accounts
