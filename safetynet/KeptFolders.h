#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "platform/FileSystem.h"
#include "platform/Result.h"

namespace accounts {

/// Why files are kept.
enum class KeptFor {
  /// A run of the plug-in; the folder is called "Kept-TIME".
  Migration,
  /// Other files were put in their place; the folder is called "Replaced-TIME".
  Restoration
};

/// The folders of kept files on one device. A folder has its name only while it is whole: it is
/// filled and emptied under the name "Unfinished-TIME". Whoever changes anything here holds the
/// host's lock.
class KeptFolders {
 public:
  /// `fileSystem` must outlive this.
  explicit KeptFolders(FileSystem& fileSystem) : files_(fileSystem) {}

  /// The paths of all folders that were kept for a migration, oldest first.
  [[nodiscard]] std::vector<std::string> ofMigrations() const;

  /// Whether there is a folder of kept files with this name.
  [[nodiscard]] bool contains(std::string_view name) const;
  /// The path of the folder with a name.
  [[nodiscard]] static std::string pathOf(std::string_view name);

  /// Gives files second names in a new folder, durably, and writes the folder's path to `folder`.
  /// `time` is sortable text; a folder that exists is never touched. A failure leaves no folder and
  /// `folder` as it was.
  Result keep(const std::vector<std::string>& paths, KeptFor purpose, std::string_view time,
              std::string& folder);

  /// Removes a folder, and the directory of all of them if this made it and it is empty. A failure
  /// leaves it whole; once it has lost its name it is gone, though parts may stay under the
  /// unfinished one.
  Result discard(std::string_view folder);

  /// Removes what killed runs left unfinished; nothing in it is needed. Failures are left to the
  /// next run.
  void removeUnfinished();

 private:
  Result makeDirectory();
  Result fill(const std::string& unfinished, const std::vector<std::string>& paths);
  void removeWithContents(const std::string& folder);

  FileSystem& files_;
  bool madeDirectory_ = false;
};

}  // namespace accounts
