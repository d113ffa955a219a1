#include "platform/linux/LinuxMailDirectory.h"

#include "vocabulary/DevicePath.h"

namespace accounts {

std::string LinuxMailDirectory::path() {
  return joinedPath(home_.path(), "Library/Mail");
}

}  // namespace accounts
