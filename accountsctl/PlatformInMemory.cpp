#include "accountsctl/PlatformInMemory.h"

#include <stdexcept>
#include <string>

#include "platform/ReplacedParts.h"

namespace accounts {

PlatformInMemory::PlatformInMemory(LinuxPlatform& linux, Transaction& transaction,
                                   MigrationObserver* observer)
    : inMemory_(transaction, linux.platform(), owners_, MigrationLockState::Available,
                [](std::string_view path) {
                  throw std::logic_error("A path that no migration has: " + std::string(path));
                }),
      preferences_(inMemory_.propertyLists(), linux.platform().homeDirectory),
      platform_(platformWith(inMemory_.platform(preferences_),
                             {.consoleLog = &console_, .migrationObserver = observer})),
      process_(platform_) {}

}  // namespace accounts
