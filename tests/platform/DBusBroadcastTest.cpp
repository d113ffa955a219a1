#include "platform/linux/DBusBroadcast.h"

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <cstring>
#include <memory>

#include "platform/linux/FileDescriptor.h"
#include "tests/platform/DBusDaemon.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

constexpr const char* kObject = "/com/quarx/accountsettings com.quarx.accountsettings.";

TEST(DBusBroadcastTest, AnnouncementsAreSignalsInTheirOrder) {
  const DBusDaemon daemon;
  DBusListener listener(daemon.address());
  DBusBroadcast broadcast({.address = daemon.address()});

  broadcast.announceChange("com.quarx.mobilemail", "MailAccounts");
  broadcast.announce(CloudTabs::On);
  broadcast.announce(CloudTabs::Off);
  broadcast.announceChange("", "ключ");
  const Result delivered = broadcast.deliver();

  ASSERT_TRUE(delivered) << delivered.error().text;
  EXPECT_EQ(listener.next(),
            kObject + std::string("PreferencesChanged com.quarx.mobilemail MailAccounts"));
  EXPECT_EQ(listener.next(), kObject + std::string("CloudTabsSwitched 1"));
  EXPECT_EQ(listener.next(), kObject + std::string("CloudTabsSwitched 0"));
  EXPECT_EQ(listener.next(), kObject + std::string("PreferencesChanged  ключ"));
}

TEST(DBusBroadcastTest, WhatWasDeliveredIsNotDeliveredAgain) {
  const DBusDaemon daemon;
  DBusListener listener(daemon.address());
  DBusBroadcast broadcast({.address = daemon.address()});
  broadcast.announceChange("one", "key");
  EXPECT_TRUE(broadcast.deliver());
  broadcast.announceChange("two", "key");
  EXPECT_TRUE(broadcast.deliver());
  EXPECT_EQ(listener.next(), kObject + std::string("PreferencesChanged one key"));
  EXPECT_EQ(listener.next(), kObject + std::string("PreferencesChanged two key"));
}

TEST(DBusBroadcastTest, WithNothingToTellNoBusIsNeeded) {
  DBusBroadcast broadcast({.address = "unix:path=/nowhere", .library = "missing.so"});
  EXPECT_TRUE(broadcast.deliver());
}

TEST(DBusBroadcastTest, AMissingBusIsAFailureWithItsAddress) {
  DBusBroadcast broadcast({.address = "unix:path=/nowhere/bus"});
  broadcast.announceChange("application", "key");
  const Result delivered = broadcast.deliver();
  ASSERT_FALSE(delivered);
  EXPECT_EQ(delivered.error().text,
            "Cannot announce on the bus at unix:path=/nowhere/bus: No such file or directory");
}

TEST(DBusBroadcastTest, ATextThatIsNoAddressIsAFailure) {
  DBusBroadcast broadcast({.address = "somewhere"});
  broadcast.announceChange("application", "key");
  EXPECT_FALSE(broadcast.deliver());
}

TEST(DBusBroadcastTest, ATextThatDBusCannotCarryIsAFailure) {
  const DBusDaemon daemon;
  DBusBroadcast broadcast({.address = daemon.address()});
  broadcast.announceChange("application", "\xff");
  EXPECT_FALSE(broadcast.deliver());
}

TEST(DBusBroadcastTest, ABusThatEndedIsAFailure) {
  auto daemon = std::make_unique<DBusDaemon>();
  DBusBroadcast broadcast({.address = daemon->address()});
  daemon.reset();
  broadcast.announceChange("application", "key");
  EXPECT_FALSE(broadcast.deliver());
}

class SilentBus : public DeviceFixture {};

TEST_F(SilentBus, IsWaitedForNoLongerThanTheTimeLimit) {
  const std::string path = (outside() / "bus").string();
  const FileDescriptor listening(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
  sockaddr_un address = {};
  address.sun_family = AF_UNIX;
  std::strcpy(address.sun_path, path.c_str());
  ASSERT_EQ(::bind(listening.number(), reinterpret_cast<sockaddr*>(&address), sizeof(address)), 0);
  ASSERT_EQ(::listen(listening.number(), 1), 0);
  DBusBroadcast broadcast(
      {.address = "unix:path=" + path, .timeLimit = std::chrono::milliseconds(50)});
  broadcast.announceChange("application", "key");

  const Result delivered = broadcast.deliver();

  ASSERT_FALSE(delivered);
  EXPECT_TRUE(delivered.error().text.ends_with("Connection timed out")) << delivered.error().text;
}

TEST(DBusBroadcastTest, AMissingLibraryIsAFailureWithTheLoadersWords) {
  DBusBroadcast broadcast({.address = "unix:path=/nowhere", .library = "missing-library.so"});
  broadcast.announceChange("application", "key");
  const Result delivered = broadcast.deliver();
  ASSERT_FALSE(delivered);
  EXPECT_TRUE(delivered.error().text.starts_with("Cannot load missing-library.so: "))
      << delivered.error().text;
}

}  // namespace
}  // namespace accounts
