#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/DeviceTree.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

/// What became of a device.
struct PlacesOutcome {
  int exitStatus = 0;
  /// The places that changed: "+" made, "-" removed, "~" replaced; the settings file with the
  /// identifiers of its accounts, the information directory with whether a file was made in it.
  /// "+Kept" for files that the host keeps; and whatever else changed. "all" stands for what a
  /// migration changes where nothing is in its way.
  std::string_view changes;
  /// In standard error; empty where nothing is said of the obstacle.
  std::string_view said = "";

  /// Whether it stands for the outcome before it in a table.
  [[nodiscard]] bool isTheSame() const { return changes == "the same"; }
};
inline constexpr PlacesOutcome kTheSame = {.changes = "the same"};

/// How the logs of a plan are to those of the plug-in alone.
enum class ForetoldLogs : std::uint8_t { AreTheSame, Differ };

/// A device that a migration changes at every place, something in its way, and what became of it.
/// The identifiers of its accounts are "S" of the settings file, "E" and "M" of the legacy stores.
class PlacesFixture : public DeviceRootFixture {
 public:
  /// Where a place is on this machine.
  [[nodiscard]] std::filesystem::path at(DevicePlace place) const;
  /// Where a device path lies on this machine.
  [[nodiscard]] std::filesystem::path here(std::string_view devicePath) const {
    return onThisMachine(devicePath);
  }

  // What gets in the way of a migration.

  /// Puts a thing of HostileKind.h at a path of this machine.
  void put(const char* hostileKind, const std::filesystem::path& path);
  /// Moves what is at a path of this machine, and leaves a link that leads to it.
  void moveBehindLink(const std::filesystem::path& path);
  /// Puts a link to a directory in the place of one, which goes with what is in it; or moves it to
  /// where the link leads. Device paths.
  void linkDirectory(const char* devicePath, const char* target);
  void moveDirectory(const char* devicePath, const char* target);
  /// Lets nobody change the names in a directory.
  void makeImmutable(const char* devicePath);
  /// Writes a text file, its directories included.
  using DeviceRootFixture::writeText;
  /// From here on the whole device may only be read.
  void mountReadOnly();
  /// Makes the device an ordinary user's, who runs the host.
  void becomeOrdinaryUser();
  /// Gives what is at a path of this machine back to root, with these permissions.
  void giveToRoot(const std::filesystem::path& path, unsigned permissions) const;
  /// Has the mobile user's home directory elsewhere.
  void moveHome(const std::string& devicePath);

 protected:
  PlacesFixture();
  ~PlacesFixture() override;

  /// Migrates with this subcommand and option, both logs being on standard error, and with a umask
  /// that leaves others nothing.
  ProgramResult migrateObstructed(std::vector<std::string> arguments);
  /// Migrates alone and expects this outcome; and that a plan before, unless it was refused,
  /// foretold the lines of both logs, or did not.
  void expectAlone(const PlacesOutcome& expected, ForetoldLogs logs = ForetoldLogs::AreTheSame);
  /// Migrates in a run and expects this outcome.
  void expectInARun(const PlacesOutcome& expected);
  /// Why this machine cannot have what the test needs.
  [[nodiscard]] const std::optional<std::string>& reason() const { return reason_; }

 private:
  void addPlaces() const;
  [[nodiscard]] std::string changes() const;
  void expectOutcome(const PlacesOutcome& expected, const ProgramResult& result) const;
  [[nodiscard]] std::vector<std::string> changedPlaces() const;
  [[nodiscard]] std::string savedIdentifiers() const;

  std::string home_ = "/var/mobile";
  std::optional<uid_t> user_;
  std::optional<std::string> reason_;
  std::vector<std::filesystem::path> immutable_;
  bool isMounted_ = false;
  DeviceTree before_;
};

}  // namespace accounts
