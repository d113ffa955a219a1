#include "migrator/CreateMigrationPlugin.h"

#include <memory>

#include "accountsettings/Process.h"
#include "migrator/AccountsDataMigrator.h"

namespace {

/// Makes the platform's process values current for as long as the plug-in is loaded. They outlive
/// every instance, because class operations have no other way to the platform.
void keepProcessFor(accounts::Platform& platform) {
  static std::unique_ptr<accounts::Process> process;
  if (process == nullptr || &process->platform != &platform) {
    process.reset();
    process = std::make_unique<accounts::Process>(platform);
  }
}

}  // namespace

accounts::MigrationPluginBase* CreateMigrationPlugin(accounts::Platform& platform) {
  keepProcessFor(platform);
  return std::make_unique<accounts::AccountsDataMigrator>().release();
}
