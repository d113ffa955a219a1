#include "commandline/BundleLocation.h"

#include <system_error>

namespace accounts {
namespace {

constexpr const char* kBundleName = "accounts.migrator";
// From the programs of an installed system to what they alone use.
constexpr const char* kInstalledLibraryDirectory = "../lib/accounts";
constexpr const char* kResourcesDirectory = "Resources";

}  // namespace

std::filesystem::path bundleOfProgram() {
  std::error_code error;
  return bundleOfProgramIn(std::filesystem::read_symlink("/proc/self/exe", error).parent_path());
}

std::filesystem::path bundleOfProgramIn(const std::filesystem::path& directory) {
  std::error_code error;
  const std::filesystem::path installed =
      (directory / kInstalledLibraryDirectory / kBundleName).lexically_normal();
  const std::filesystem::path beside = directory / kBundleName;
  const bool isInstalled = !std::filesystem::is_directory(beside, error) &&
                           std::filesystem::is_directory(installed, error);
  return isInstalled ? installed : beside;
}

std::filesystem::path resourcesOfBundle(const std::filesystem::path& bundle) {
  return bundle / kResourcesDirectory;
}

}  // namespace accounts
