#include "commandline/BundleLocation.h"

#include <sys/auxv.h>

#include <bit>
#include <system_error>

namespace accounts {
namespace {

constexpr const char* kBundleName = "accounts.migrator";
// From the programs of an installed system to what they alone use.
constexpr const char* kInstalledLibraryDirectory = "../lib/accounts";
constexpr const char* kResourcesDirectory = "Resources";

}  // namespace

std::filesystem::path bundleOfProgram() {
  std::error_code unknown;
  std::filesystem::path program = std::filesystem::read_symlink("/proc/self/exe", unknown);
  if (unknown) {
    // Where images are made there is not always a /proc; the program's name as it was started is
    // left.
    const auto* const name = std::bit_cast<const char*>(::getauxval(AT_EXECFN));
    program = std::filesystem::canonical(name != nullptr ? name : "", unknown);
  }
  return bundleOfProgramIn(program.parent_path());
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
