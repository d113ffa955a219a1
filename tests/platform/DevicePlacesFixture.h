#pragma once

#include <fcntl.h>
#include <unistd.h>

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/LinuxDevicePlaces.h"
#include "platform/linux/LinuxFileSystem.h"
#include "tests/fakes/FakeSnapshot.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {

/// The places of a device that has all of their directories and nothing in them.
class DevicePlacesTest : public DeviceFixture {
 protected:
  DevicePlacesTest() {
    for (const char* directory :
         {kPreferences, kMail, kCrashReporter, "/var/mobile/Library/AccountMigration"}) {
      makeDirectory(directory);
    }
  }

  static constexpr const char* kPreferences = "/var/mobile/Library/Preferences";
  static constexpr const char* kMail = "/var/mobile/Library/Mail";
  static constexpr const char* kCrashReporter = "/var/mobile/Library/Logs/CrashReporter";

  static std::string path(DevicePlace place) { return pathOfPlace(place, "/var/mobile"); }
  /// The file of a place on the host.
  [[nodiscard]] std::filesystem::path hostPath(DevicePlace place) const {
    return onHost(path(place));
  }

  /// The snapshot; a failure of the test and an empty one where none can be taken.
  DeviceSnapshot snapshot() {
    auto taken = places.takeSnapshot();
    EXPECT_EQ(textOf(taken), "(none)");
    return std::move(taken).value_or(DeviceSnapshot());
  }
  /// Why no snapshot can be taken.
  std::string whyNoSnapshot() {
    const auto taken = places.takeSnapshot();
    return taken ? "(there is one)" : taken.error().text;
  }
  FileIdentity identity(DevicePlace place) {
    const auto now = places.identityAt(place);
    EXPECT_TRUE(now);
    return now.value_or(FileIdentity());
  }
  /// A file staged for a place.
  std::unique_ptr<StagedFile> stage(DevicePlace place, const std::string& text,
                                    unsigned permissions = 0600,
                                    std::optional<FileOwner> owner = std::nullopt) {
    const FakeBytes contents(text);
    auto staged =
        places.stage(place, {.contents = &contents, .permissions = permissions, .owner = owner});
    EXPECT_EQ(textOf(staged), "(none)");
    return std::move(staged).value_or(nullptr);
  }
  /// Another program gives a place new contents, by a file of its own.
  void writeAsAnotherProgram(DevicePlace place, std::string_view text) const {
    const std::filesystem::path own = hostPath(place).parent_path() / "of-another-program";
    makeHostFile(own, text);
    std::filesystem::rename(own, hostPath(place));
  }

  static std::string wordOf(const PlaceOutcome& outcome) {
    switch (outcome.kind) {
      case PlaceOutcome::Kind::Done:
        return "done";
      case PlaceOutcome::Kind::Disturbed:
        return "disturbed";
      case PlaceOutcome::Kind::Failed:
        return outcome.failure.text;
    }
    return "";
  }
  static std::string textOf(const std::optional<Failure>& failure) {
    return failure ? failure->text : "(none)";
  }
  template <class Value>
  static std::string textOf(const OrFailure<Value>& result) {
    return result ? "(none)" : result.error().text;
  }
  static std::string bytesOf(const PlaceState& state) {
    std::string bytes;
    if (state.contents == nullptr) {
      return "(none)";
    }
    EXPECT_TRUE(state.contents->giveTo([&](std::string_view piece) {
      bytes.append(piece);
      return true;
    }));
    return bytes;
  }

  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/var/mobile/tmp"};
  LinuxDevicePlaces places{root, files, "/var/mobile"};
};

}  // namespace accounts
