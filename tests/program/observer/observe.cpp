#include <CLI/CLI.hpp>
#include <chrono>
#include <cstdio>
#include <thread>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Process.h"
#include "platform/linux/LinuxPlatform.h"
#include "vocabulary/DevicePath.h"

// Waits for migrations to finish, again and again, and writes what the device holds then: the
// version of the settings, the number of their accounts, and how many legacy stores there are.

namespace {

using namespace accounts;

constexpr std::chrono::milliseconds kPause(1);

void observe(Platform& platform) {
  AccountsManager::waitForMigrationToFinish();
  const PropertyDictionary settings =
      platform.propertyLists.readDictionary(AccountsManager::fullPathToAccountSettingsPlist())
          .value_or(PropertyDictionary());
  const PropertyValue* const version = settings.find(kPlistVersionKey);
  const int legacyStores = static_cast<int>(platform.fileSystem.fileExists(mailAccountsPath())) +
                           static_cast<int>(platform.fileSystem.fileExists(daAccountPath()));
  std::printf("version %d, %zu accounts, %d legacy stores\n",
              version != nullptr ? static_cast<int>(version->integerValue().value_or(-1)) : -1,
              settings.arrayForKey(kPlistAccountsKey).value_or(PropertyArray()).size(),
              legacyStores);
  std::fflush(stdout);
}

}  // namespace

int main(int argc, char** argv) {
  CLI::App program("Shows the account settings of a device whenever no migration runs.");
  LinuxPlatformOptions options;
  std::string bundle;
  int times = 1;
  program.add_option("--root", options.rootDirectory, "The device root")->required();
  program.add_option("--bundle", bundle, "The plug-in's bundle, for its resources")->required();
  program.add_option("--times", times, "How often to look");
  CLI11_PARSE(program, argc, argv);
  options.bundleResourcesDirectory = bundle + "/Resources";

  const auto made = LinuxPlatform::create(options);
  if (!made) {
    std::fprintf(stderr, "observe: %s\n", made.error().failure.text.c_str());
    return 1;
  }
  Platform& platform = (*made)->platform();
  Process process(platform);
  for (int time = 0; time < times; ++time) {
    observe(platform);
    std::this_thread::sleep_for(kPause);
  }
  return 0;
}
