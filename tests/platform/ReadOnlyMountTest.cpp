#include <sched.h>
#include <sys/mount.h>
#include <sys/wait.h>

#include <cstdlib>
#include <functional>

#include "tests/platform/DevicePlacesFixture.h"

namespace accounts {
namespace {

constexpr int kCannotMount = 77;

class ReadOnlyMountTest : public DevicePlacesTest {
 protected:
  /// Runs a check in a process in which the whole device can only be read; what it gives is the
  /// exit status, 0 for right.
  int onReadOnlyDevice(const std::function<int()>& check) {
    const pid_t child = ::fork();
    if (child == 0) {
      const std::string device = image().string();
      const char* const path = device.c_str();
      const bool isMounted =
          ::unshare(CLONE_NEWNS) == 0 &&
          ::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
          ::mount(path, path, nullptr, MS_BIND, nullptr) == 0 &&
          ::mount(nullptr, path, nullptr, MS_REMOUNT | MS_BIND | MS_RDONLY, nullptr) == 0;
      std::_Exit(isMounted ? check() : kCannotMount);
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    return WEXITSTATUS(status);
  }
  /// Takes a snapshot with a view of the mounts of its own.
  static DeviceSnapshot taken(const std::string& directory, ReadOnlyMounts mounts) {
    const DeviceRoot device = DeviceRoot::openRoot(directory).value();
    LinuxFileSystem system(device, "/var/mobile/tmp");
    return LinuxDevicePlaces(device, system, "/var/mobile", mounts).takeSnapshot().value();
  }
};

TEST_F(ReadOnlyMountTest, ASnapshotSaysThatNothingCanBeChanged) {
  makeFile(path(DevicePlace::LegacyMail), "store");
  const int status = onReadOnlyDevice([&] {
    const DeviceSnapshot snapshot = taken(image().string(), ReadOnlyMounts::Refuse);
    const PlaceState& store = snapshot.at(DevicePlace::LegacyMail);
    const bool isRight =
        snapshot.isReadOnly && store.whyNotRemoved.value().number == EROFS &&
        // What is missing, too: the kernel does not look.
        snapshot.at(DevicePlace::RemovalSentinel).whyNotRemoved.value().number == EROFS &&
        snapshot.at(DevicePlace::Settings).whyNotReplaced.value().number == EROFS &&
        snapshot.at(DevicePlace::InformationDirectory).whyNotMade.value().number == EROFS;
    return isRight ? 0 : 1;
  });
  if (status == kCannotMount) {
    GTEST_SKIP() << "This system lets the test mount nothing.";
  }
  EXPECT_EQ(status, 0);
}

TEST_F(ReadOnlyMountTest, APlanOverlooksItAndSaysSo) {
  makeFile(path(DevicePlace::LegacyMail), "store");
  makeDirectory(path(DevicePlace::InformationDirectory));
  const int status = onReadOnlyDevice([&] {
    const DeviceSnapshot snapshot = taken(image().string(), ReadOnlyMounts::Overlook);
    const bool isRight = snapshot.isReadOnly &&
                         !snapshot.at(DevicePlace::LegacyMail).whyNotRemoved &&
                         !snapshot.at(DevicePlace::LegacyMail).whyNotReplaced &&
                         !snapshot.at(DevicePlace::Settings).whyNotReplaced &&
                         !snapshot.at(DevicePlace::InformationDirectory).whyNotReplaced;
    return isRight ? 0 : 1;
  });
  if (status == kCannotMount) {
    GTEST_SKIP() << "This system lets the test mount nothing.";
  }
  EXPECT_EQ(status, 0);
}

}  // namespace
}  // namespace accounts
