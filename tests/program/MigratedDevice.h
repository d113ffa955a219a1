#pragma once

#include <cstdint>
#include <filesystem>
#include <functional>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "tests/program/DeviceTree.h"

namespace accounts {

/// What a migration, or a plan of one, came to. Identifiers that it made up have the names that
/// FreshIdentifiers gives, and the time in the name of an information file is left out, so that two
/// endings of one device can be compared.
struct Ending {
  /// "exitStatus"; "report" as docs/json.md has it; "console" and "channel", the lines of the two
  /// logs. The host's own lines are left out: they are in the report.
  nlohmann::json told;
  DeviceTree tree;
};

/// What differs between two endings: the lines around the first difference, "" for none.
std::string differencesOf(const Ending& first, const Ending& second);

/// How much the host is to tell; most of its time goes into telling.
enum class Detail : std::uint8_t {
  /// The log channel is off, and of a bare run only the result is told.
  Brief,
  Full
};

/// One device that is migrated in several ways by the real host. Each way begins with a device
/// that was made anew at the same place, so that all that names the place is the same.
class MigratedDevice {
 public:
  /// Makes the device beneath a root, which is there and empty.
  using Make = std::function<void(const std::filesystem::path& root)>;

  MigratedDevice(Make make, Detail detail);
  ~MigratedDevice();
  MigratedDevice(const MigratedDevice&) = delete;
  MigratedDevice& operator=(const MigratedDevice&) = delete;

  /// Makes the device, in the place of what an earlier way left.
  void makeAnew();
  /// The device as it was made.
  [[nodiscard]] const DeviceTree& before() const { return before_; }

  /// Runs `migration-host plan`, `run` or `run --bare`, and looks at the device.
  [[nodiscard]] Ending plan() const;
  [[nodiscard]] Ending run() const;
  [[nodiscard]] Ending runBare() const;

 private:
  [[nodiscard]] std::filesystem::path root() const { return directory_ / "root"; }
  enum class Report : std::uint8_t { InAFile, AsTheResult };
  [[nodiscard]] Ending ended(std::vector<std::string> arguments, Report report) const;

  Make make_;
  Detail detail_;
  std::filesystem::path directory_;
  DeviceTree before_;
};

}  // namespace accounts
