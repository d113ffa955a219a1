#include "safetynet/SaveObserver.h"

namespace accounts {

std::optional<std::string> SaveObserver::makeTemporaryFile() {
  // A save has begun; unless the rename comes, it failed.
  saves_.last = LastSave::Failed;
  return ForwardingFileSystem::makeTemporaryFile();
}

Result SaveObserver::renameFile(std::string_view source, std::string_view destination) {
  const Result result = ForwardingFileSystem::renameFile(source, destination);
  if (destination == settingsPath_) {
    saves_.replacedFile = true;
    saves_.last = result ? LastSave::Written : LastSave::Failed;
  }
  return result;
}

}  // namespace accounts
