#pragma once

#include <filesystem>
#include <functional>
#include <string>
#include <string_view>

#include "platform/linux/LinuxDevicePlaces.h"
#include "platform/linux/LinuxFileSystem.h"
#include "tests/platform/DeviceFixture.h"
#include "tests/transaction/TransactionFixture.h"

namespace accounts {

/// An operation on a file system, first in memory over a snapshot of a device and then on the
/// device itself: the outcome is the same.
class SameAsTheDeviceTest : public DeviceFixture {
 protected:
  SameAsTheDeviceTest() {
    for (const char* directory : {"/var/mobile/Library/Preferences", "/var/mobile/Library/Mail",
                                  "/var/mobile/Library/Logs/CrashReporter", "/var/mobile/tmp"}) {
      makeDirectory(directory);
    }
  }

  using Operation = std::function<Result(FileSystem&)>;

  static std::string path(DevicePlace place) { return pathOfPlace(place, kHome); }

  /// What an operation says: nothing, or why it failed.
  static std::string outcomeOf(FileSystem& files, const Operation& operation) {
    const Result result = operation(files);
    return result ? "success" : result.error().text;
  }
  [[nodiscard]] std::string inMemory(const Operation& operation) {
    auto taken = LinuxDevicePlaces(root, files, std::string(kHome)).takeSnapshot();
    if (!taken) {
      return "no snapshot: " + taken.error().text;
    }
    Transaction transaction(*taken, kHome);
    MobileAlone ownership;
    TransactionFileSystem memory(transaction, ownership, [](std::string_view path) {
      throw MetForeignPath{std::string(path)};
    });
    return outcomeOf(memory, operation);
  }
  void expectSame(const Operation& operation, const std::string& outcome) {
    EXPECT_EQ(inMemory(operation), outcome);
    EXPECT_EQ(outcomeOf(files, operation), outcome);
  }
  /// For what says more on the device than it can say in memory, such as a temporary file's name.
  void expectBothRefuse(const Operation& operation) {
    EXPECT_NE(inMemory(operation), "success");
    EXPECT_NE(outcomeOf(files, operation), "success");
  }
  void takeRights(std::string_view directory, unsigned permissions) {
    std::filesystem::permissions(onHost(directory), std::filesystem::perms(permissions));
  }

  static Operation removing(DevicePlace place) {
    return [place](FileSystem& files) { return files.removeFile(path(place)); };
  }
  static Operation creating(DevicePlace place) {
    return [place](FileSystem& files) { return files.createFile(path(place), "contents"); };
  }
  static Result makeInformationFile(FileSystem& files) {
    const std::string directory = path(DevicePlace::InformationDirectory);
    if (!files.fileExists(directory)) {
      Result made = files.createDirectoryWithIntermediates(directory, 0777);
      if (!made) {
        return made;
      }
    }
    return files.writeFileAtomically(directory + "/AccountMigrationInformation-1.txt",
                                     serialized(PropertyDictionary()));
  }
  static Result copyAside(FileSystem& files) {
    return files.copyFile(path(DevicePlace::Settings), path(DevicePlace::CopyAside));
  }

  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/var/mobile/tmp"};
};

}  // namespace accounts
