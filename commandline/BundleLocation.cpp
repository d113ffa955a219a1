#include "commandline/BundleLocation.h"

#include <system_error>

namespace accounts {
namespace {

constexpr const char* kBundleName = "accounts.migrator";
constexpr const char* kResourcesDirectory = "Resources";

}  // namespace

std::filesystem::path bundleBesideProgram() {
  std::error_code error;
  return std::filesystem::read_symlink("/proc/self/exe", error).parent_path() / kBundleName;
}

std::filesystem::path resourcesOfBundle(const std::filesystem::path& bundle) {
  return bundle / kResourcesDirectory;
}

}  // namespace accounts
