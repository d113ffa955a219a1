#pragma once

#include <chrono>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "platform/CloudTabService.h"
#include "platform/PreferencesBroadcast.h"
#include "platform/Result.h"

namespace accounts {

/// How a D-Bus is reached.
struct DBusOptions {
  /// The bus's address, such as "unix:path=/run/dbus/system_bus_socket".
  std::string address;
  /// How long delivering may take altogether.
  std::chrono::milliseconds timeLimit = std::chrono::seconds(2);
  /// The library that speaks D-Bus; loaded when the first announcement is to be delivered.
  std::string library = "libsystemd.so.0";
};

/// The address of the system's bus: DBUS_SYSTEM_BUS_ADDRESS of the environment, else the usual one.
std::string systemBusAddress();

/// Announces as signals on a D-Bus. All are of the interface "com.quarx.accountsettings" of the
/// object "/com/quarx/accountsettings":
/// - PreferencesChanged(s application, s key)
/// - CloudTabsSwitched(b on)
///
/// Announcements are kept until deliver(), so that announcing never waits.
class DBusBroadcast final : public PreferencesBroadcast, public CloudTabService {
 public:
  explicit DBusBroadcast(DBusOptions options);
  ~DBusBroadcast() override;

  void announceChange(std::string_view application, std::string_view key) override;
  void announce(CloudTabs state) override;

  /// Sends what was announced, in order, and waits until the bus has it, but no longer than the
  /// time limit; where nothing was announced, the bus is not asked for. A failure says why the bus
  /// does not have them; whether it has some of them is not known then.
  [[nodiscard]] Result deliver();

 private:
  struct Signal;
  class Connection;

  const DBusOptions options_;
  std::vector<Signal> signals_;
};

}  // namespace accounts
