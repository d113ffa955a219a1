#include "platform/linux/LinuxHomeDirectory.h"

#include "platform/linux/DevicePath.h"

namespace accounts {

LinuxHomeDirectory::LinuxHomeDirectory(std::string_view path)
    : path_(withoutTrailingSeparators(path)) {}

}  // namespace accounts
