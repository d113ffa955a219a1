#include "tests/platform/DBusDaemon.h"
#include "tests/program/DeviceRootFixture.h"

namespace accounts {
namespace {

/// What the host announces on a bus that stands in for the system's.
class Broadcast : public DeviceRootFixture {
 protected:
  Broadcast() { write(kSettingsPath, accountSettings(11)); }

  [[nodiscard]] ProgramResult migrateWithBus(const std::string& address,
                                             const std::vector<std::string>& arguments) const {
    ProgramCall call = migrationCall(arguments);
    call.environment["DBUS_SYSTEM_BUS_ADDRESS"] = address;
    return runProgram(call);
  }
};

TEST_F(Broadcast, TellsTheBusWhatThePluginAnnounced) {
  const DBusDaemon daemon;
  DBusListener listener(daemon.address());

  const ProgramResult result = migrateWithBus(daemon.address(), {"--json", "--broadcast", "dbus"});

  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  EXPECT_EQ(onlyObject(result)["warnings"], nlohmann::json::array());
  EXPECT_EQ(listener.next(),
            "/com/quarx/accountsettings com.quarx.accountsettings.PreferencesChanged "
            "com.quarx.mobilemail MailAccounts");
}

TEST_F(Broadcast, WithoutABusIsAWarningOfAMigrationThatSucceeded) {
  const ProgramResult result =
      migrateWithBus("unix:path=/nowhere/bus", {"--json", "--broadcast", "dbus"});

  EXPECT_EQ(result.exitStatus, 0);
  const nlohmann::json object = onlyObject(result);
  EXPECT_EQ(object["result"], true);
  EXPECT_EQ(object["warnings"],
            nlohmann::json::array({"Nobody was told of the changes: Cannot announce on the bus at "
                                   "unix:path=/nowhere/bus: No such file or directory"}));
}

TEST_F(Broadcast, IsNotMadeUnlessAskedFor) {
  const nlohmann::json object = onlyObject(migrateWithBus("unix:path=/nowhere/bus", {"--json"}));
  EXPECT_EQ(object["warnings"], nlohmann::json::array());
}

TEST_F(Broadcast, GoesToNothingButDBus) {
  const ProgramResult result = migrate({"--broadcast", "radio"});
  EXPECT_EQ(result.exitStatus, 64);
  EXPECT_NE(result.errors.find("--broadcast: must be dbus"), std::string::npos) << result.errors;
}

}  // namespace
}  // namespace accounts
