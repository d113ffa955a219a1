#include <unistd.h>

#include <atomic>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <stdexcept>
#include <string>

#include "platform/MigrationPluginBase.h"
#include "platform/Platform.h"

namespace accounts {
namespace {

constexpr const char* kSettings = "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist";
constexpr const char* kLegacyMail = "/var/mobile/Library/Mail/Accounts.plist";

// The ways to misbehave, chosen by the environment variable MISBEHAVIOUR.
const std::map<std::string, bool (*)(Platform&)> behaviours = {
    {"abort",
     [](Platform&) {
       std::abort();
       return false;
     }},
    {"kill", [](Platform&) { return std::raise(SIGKILL) == 0; }},
    {"throw", [](Platform&) -> bool { throw std::runtime_error("thrown by the plug-in"); }},
    {"exit",
     [](Platform&) {
       std::exit(0);
       return false;
     }},
    {"fail", [](Platform&) { return false; }},
    {"print", [](Platform&) { return std::puts("printed by the plug-in") >= 0; }},
    {"break the settings",
     [](Platform& platform) {
       return static_cast<bool>(platform.fileSystem.createFile(kSettings, "half a file"));
     }},
    {"lose mail and fail",
     [](Platform& platform) {
       (void)platform.fileSystem.removeFile(kLegacyMail);
       return false;
     }},
    {"lose mail and die",
     [](Platform& platform) {
       (void)platform.fileSystem.removeFile(kLegacyMail);
       std::abort();
       return false;
     }},
    {"lose mail and wait",
     [](Platform& platform) {
       (void)platform.fileSystem.removeFile(kLegacyMail);
       std::puts("waiting");
       const std::atomic<bool> isEnough = false;
       isEnough.wait(false);
       return false;
     }},
};

std::string chosenBehaviour() {
  const char* const behaviour = std::getenv("MISBEHAVIOUR");
  return behaviour != nullptr ? behaviour : "";
}

class MisbehavingPlugin : public MigrationPluginBase {
 public:
  explicit MisbehavingPlugin(Platform& platform) : platform_(platform) {}

  std::string dataClassName() override { return "misbehaviour"; }
  bool performMigration() override { return behaviours.at(chosenBehaviour())(platform_); }

 private:
  Platform& platform_;
};

}  // namespace
}  // namespace accounts

extern "C" accounts::MigrationPluginBase* CreateMigrationPlugin(accounts::Platform& platform) {
  return accounts::chosenBehaviour() == "no instance" ? nullptr
                                                      : new accounts::MisbehavingPlugin(platform);
}
