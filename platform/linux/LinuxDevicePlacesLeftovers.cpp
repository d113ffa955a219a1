#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <set>

#include "platform/linux/EntryIdentity.h"
#include "platform/linux/LinuxDevicePlaces.h"
#include "platform/linux/RenameToNothing.h"
#include "platform/linux/StagedName.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

/// What keeps a file under a staged name from being dealt with; 0 for nothing.
int settle(int directory, const StagedName& staged, const char* own, const char* name) {
  const auto found = entryIn(directory, own);
  const auto standing = found ? entryIn(directory, name) : std::nullopt;
  if (!standing) {
    return errno;
  }
  const std::uint64_t mark = markOf(*found);
  if (mark != staged.made && mark != staged.replaced) {
    const std::uint64_t other = markOf(*standing);
    if (other == 0) {
      return renameToNothing(directory, own, name);
    }
    if (other != staged.made && other != staged.returned) {
      // Another program wrote after this one. Whether it had read it, a person must find out.
      return EEXIST;
    }
    // The run was killed between taking it out and giving it its place back.
    if (::renameat2(directory, own, directory, name, RENAME_EXCHANGE) != 0) {
      return errno;
    }
  }
  return ::unlinkat(directory, own, 0) == 0 ? 0 : errno;
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
      const std::string name(splitPath(standing).name);
      const auto entry = root_.locate(joinedPath(directory, own));
      const int number = entry ? settle(entry->directory(), *staged, own.c_str(), name.c_str())
                               : entry.error().number;
      if (number != 0) {
        sentences.push_back(pathFailure("settle what an interrupted run left at",
                                        joinedPath(directory, own), number)
                                .text);
      }
    }
  }
  removeAbandonedTemporaryFiles();
  return sentences;
}

void LinuxDevicePlaces::removeAbandonedTemporaryFiles() {
  // An information file is made beside others of its directory, which is a place itself.
  std::set<std::string, std::less<>> directories = {pathOf(DevicePlace::InformationDirectory)};
  for (const ListedPlace& each : kDevicePlaces) {
    directories.emplace(splitPath(pathOf(each.place)).directory);
  }
  files_.removeAbandonedTemporaryFiles({directories.begin(), directories.end()});
}

}  // namespace accounts
