#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <set>

#include "platform/linux/LinuxDevicePlaces.h"
#include "platform/linux/PlaceFailures.h"
#include "platform/linux/RenameToNothing.h"
#include "platform/linux/StagedName.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

bool isThere(int directory, const std::string& name, struct stat& status) {
  return ::fstatat(directory, name.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0;
}

/// What keeps a file under a staged name from being dealt with; 0 for nothing.
int settle(int directory, const StagedName& staged, const std::string& own,
           const std::string& name) {
  struct stat status = {};
  if (!isThere(directory, own, status)) {
    return errno == ENOENT ? 0 : errno;
  }
  bool isForeign = status.st_ino != staged.made && status.st_ino != staged.replaced;
  struct stat standing = {};
  if (isForeign && !isThere(directory, name, standing)) {
    return renameToNothing(directory, own.c_str(), name.c_str());
  }
  if (isForeign && standing.st_ino == staged.made) {
    // The run was killed between taking it out and handing it back.
    if (::renameat2(directory, own.c_str(), directory, name.c_str(), RENAME_EXCHANGE) != 0) {
      return errno;
    }
    isForeign = false;
  }
  // A newer one has taken its place: whose it is must be found out by a person.
  return isForeign ? EEXIST : ::unlinkat(directory, own.c_str(), 0) == 0 ? 0 : errno;
}

}  // namespace

std::vector<std::string> LinuxDevicePlaces::settleLeftovers() {
  std::vector<std::string> sentences;
  std::set<std::string, std::less<>> seen;
  for (const ListedPlace& each : kDevicePlaces) {
    const std::string path = pathOf(each.place);
    const std::string directory(splitPath(path).directory);
    if (!seen.insert(directory).second) {
      continue;
    }
    for (const std::string& own :
         files_.directoryEntries(directory).value_or(std::vector<std::string>())) {
      const auto staged = StagedName::parse(own);
      const std::string standing = staged ? pathOf(staged->place) : std::string();
      if (!staged || splitPath(standing).directory != directory) {
        continue;
      }
      PathError error;
      const auto entry = root_.locate(joinedPath(directory, own), error);
      const int number =
          entry ? settle(entry->directory(), *staged, own, std::string(splitPath(standing).name))
                : error.number;
      if (number != 0) {
        sentences.push_back(
            pathError("settle what an interrupted run left at", joinedPath(directory, own), number)
                .text);
      }
    }
  }
  // An information file is made beside others of its directory, which is a place itself.
  seen.insert(pathOf(DevicePlace::InformationDirectory));
  files_.removeAbandonedTemporaryFiles({seen.begin(), seen.end()});
  return sentences;
}

}  // namespace accounts
