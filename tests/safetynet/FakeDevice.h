#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "platform/DevicePlaces.h"
#include "platform/FileKeeping.h"
#include "tests/fakes/FakeFileSystem.h"
#include "tests/fakes/FakeSnapshot.h"

namespace accounts {

/// The places and directories of a device in memory. Every operation is numbered from 0; those that
/// change or flush something are recorded as lines such as "put Settings". A test can make any of
/// them fail, stop the world before it, or let another program act before it.
class FakeDevice final : public DevicePlaces, public FileKeeping {
 public:
  FakeDevice();

  /// What stands under a name; several names can share it.
  struct Entry {
    FileIdentity identity;
    std::string contents;
    std::optional<FileOwner> owner;
  };
  std::map<std::string, std::shared_ptr<Entry>, std::less<>> entries;
  std::vector<std::string> journal;
  /// What each place cannot be told of, or removed for, as the snapshot foresees it.
  std::map<DevicePlace, Failure> unremovable;
  /// Where another program's file takes the place as soon as a new one stands there.
  std::optional<DevicePlace> overtakesPut;
  /// The sentences that settling leftovers gives.
  std::vector<std::string> leftovers;
  /// Called before each operation with its line, those that only look included.
  std::function<void(const std::string& line)> before;

  static std::string pathOf(DevicePlace place) { return pathOfPlace(place, "/var/mobile"); }

  // What a test sets up and looks at; another program would do it the same way.
  void write(std::string_view path, std::string contents, EntryKind kind = EntryKind::RegularFile);
  void write(DevicePlace place, std::string contents) { write(pathOf(place), std::move(contents)); }
  void writePropertyList(DevicePlace place, const PropertyValue& value);
  void erase(DevicePlace place) { entries.erase(pathOf(place)); }
  /// The contents of a file; "(nothing)" for none.
  [[nodiscard]] std::string at(std::string_view path) const;
  [[nodiscard]] std::string at(DevicePlace place) const { return at(pathOf(place)); }
  [[nodiscard]] bool exists(DevicePlace place) const { return entries.contains(pathOf(place)); }
  /// The files and their contents, without directories.
  [[nodiscard]] std::map<std::string, std::string> contents() const;
  /// The names in the directory of kept folders.
  [[nodiscard]] std::vector<std::string> keptNames() const;
  /// A device that has the same entries and nothing else.
  [[nodiscard]] FakeDevice copy() const;

  // Faults
  void failWhenLineBegins(std::string beginning, int number = EIO) {
    failing_[std::move(beginning)] = number;
  }
  void failAt(std::size_t operation) { failAt_ = operation; }
  void stopBefore(std::size_t operation) { stopBefore_ = operation; }
  void removeFaults();
  [[nodiscard]] std::size_t operationCount() const { return operationCount_; }

  OrFailure<DeviceSnapshot> takeSnapshot() override;
  OrFailure<FileIdentity> identityAt(DevicePlace place) override;
  OrFailure<std::unique_ptr<StagedFile>> stage(DevicePlace place, const NewFile& file) override;
  OrFailure<std::unique_ptr<StagedFile>> stageKept(DevicePlace place,
                                                   std::string_view keptPath) override;
  PlaceOutcome put(DevicePlace place, StagedFile& staged, const FileIdentity& expected) override;
  PlaceOutcome remove(DevicePlace place, const FileIdentity& expected) override;
  PlaceOutcome keep(DevicePlace place, std::string_view keptPath,
                    const FileIdentity& expected) override;
  Result flush(DevicePlace place) override;
  Result makeInformationDirectory() override;
  Result writeInformationFile(std::string_view name, const ReadableBytes& contents) override;
  std::vector<std::string> settleLeftovers() override;

  OrFailure<EntryKind> kindOfEntry(std::string_view path) override;
  OrFailure<std::vector<std::string>> directoryEntries(std::string_view path) override;
  OrFailure<std::string> shortContents(std::string_view path, std::size_t most) override;
  Result createFile(std::string_view path, std::string_view contents) override;
  Result createDirectoryWithIntermediates(std::string_view path, unsigned permissions) override;
  Result removeFile(std::string_view path) override;
  Result removeDirectory(std::string_view path) override;
  Result renameDirectory(std::string_view source, std::string_view destination) override;
  Result synchronizeDirectory(std::string_view path) override;

 private:
  enum class Recorded { Yes, No };
  /// The failure of an operation that a fault hits.
  std::optional<Failure> begin(const std::string& line, Recorded recorded = Recorded::Yes);
  [[nodiscard]] FileIdentity identityOf(std::string_view path) const;
  std::shared_ptr<Entry> make(EntryKind kind, std::string contents);

  std::map<std::string, int> failing_;
  std::optional<std::size_t> failAt_, stopBefore_;
  std::size_t operationCount_ = 0;
  std::uint64_t clock_ = 0;
};

}  // namespace accounts
