#include "host/Broadcasting.h"

#include "platform/linux/DBusBroadcast.h"

namespace accounts {

void broadcastOnDBus(RunReport& report) {
  DBusBroadcast bus({.address = systemBusAddress()});
  for (const PreferencesChange& change : report.broadcasts) {
    bus.announceChange(change.application, change.key);
  }
  for (std::size_t count = 0; count < report.cloudTabAnnouncements; ++count) {
    bus.announce(CloudTabs::On);
  }
  if (const Result delivered = bus.deliver(); !delivered) {
    report.warnings.push_back("Nobody was told of the changes: " + delivered.error());
  }
}

}  // namespace accounts
