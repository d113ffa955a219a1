#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

#include "tests/campaign/SimulatedDisk.h"

namespace accounts {

/// Another program of the device that knows nothing of migrations. What it does to a path whose
/// directory is not there is nothing.
class OtherProgram {
 public:
  /// Looks at `disk`, which stays, and has its changes made by `make`.
  OtherProgram(const SimulatedDisk& disk, std::function<void(DiskChange)> make)
      : disk_(disk), make_(std::move(make)) {}
  /// Changes `disk` itself, which stays.
  explicit OtherProgram(SimulatedDisk& disk)
      : OtherProgram(disk, [&disk](DiskChange change) { disk.make(change); }) {}
  OtherProgram(const OtherProgram&) = delete;
  OtherProgram& operator=(const OtherProgram&) = delete;

  /// What it sees.
  [[nodiscard]] const SimulatedDisk& disk() const { return disk_; }

  /// Writes a file in place, and makes it if it is missing.
  void writeInPlace(std::string_view path, std::string contents);
  /// Puts a new file in the place of what is there.
  void replace(std::string_view path, std::string contents);
  /// Takes a file's name away, if it is there.
  void remove(std::string_view path);
  /// Puts a copy of the file that another disk has there in the place of what is there, if it has
  /// one. The copy says that it was modified when the file was, as one from a backup does.
  void bringBack(std::string_view path, const SimulatedDisk& backup);

 private:
  const SimulatedDisk& disk_;
  std::function<void(DiskChange)> make_;
};

}  // namespace accounts
