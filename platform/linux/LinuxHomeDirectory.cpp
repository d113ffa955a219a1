#include "platform/linux/LinuxHomeDirectory.h"

#include "vocabulary/DevicePath.h"

namespace accounts {

LinuxHomeDirectory::LinuxHomeDirectory(std::string_view path)
    : path_(withoutTrailingSeparators(path)) {}

}  // namespace accounts
