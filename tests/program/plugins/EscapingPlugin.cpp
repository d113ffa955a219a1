#include <cstdio>
#include <string>

#include "platform/FrameworkLoader.h"
#include "platform/MigrationPluginBase.h"
#include "platform/Platform.h"
#include "tests/program/plugins/Attempts.h"

// A plug-in that tries to do what a migration never does.

namespace accounts {
namespace {

bool isRefusedAFramework(Platform& platform) {
  const Result loaded = platform.frameworkLoader.loadFramework("/framework.so");
  std::puts(loaded.error().text.c_str());
  return !loaded;
}

class EscapingPlugin : public MigrationPluginBase {
 public:
  explicit EscapingPlugin(Platform& platform) : platform_(platform) {}

  std::string dataClassName() override { return "escape"; }
  bool performMigration() override {
    return chosenAttempt() == "framework" ? isRefusedAFramework(platform_) : makeAttempt();
  }

 private:
  Platform& platform_;
};

}  // namespace
}  // namespace accounts

extern "C" accounts::MigrationPluginBase* CreateMigrationPlugin(accounts::Platform& platform) {
  return new accounts::EscapingPlugin(platform);
}
