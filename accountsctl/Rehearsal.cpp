#include "accountsctl/Rehearsal.h"

#include <cerrno>
#include <memory>

#include "accountsctl/PlatformInMemory.h"
#include "migrator/AccountsDataMigrator.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/value/Description.h"
#include "report/LedgerJSON.h"
#include "safetynet/MigrationInMemory.h"

namespace accounts {
namespace {

class OwnedBytes final : public ReadableBytes {
 public:
  explicit OwnedBytes(std::string bytes) : bytes_(std::move(bytes)) {}
  Result giveTo(const Taker& take) const override {
    static_cast<void>(take(bytes_));
    return {};
  }

 private:
  std::string bytes_;
};

DevicePlace placeOf(FileKind kind) {
  switch (kind) {
    case FileKind::MailStore:
      return DevicePlace::LegacyMail;
    case FileKind::ExchangeStore:
      return DevicePlace::LegacyExchange;
    default:
      return DevicePlace::Settings;
  }
}

/// A device that has every directory and one file.
DeviceSnapshot snapshotOf(DevicePlace place, std::string bytes, std::string_view home) {
  DeviceSnapshot snapshot;
  for (const ListedPlace& each : kDevicePlaces) {
    PlaceState& state = snapshot.places[indexOf(each.place)];
    state.path = pathOfPlace(each.place, home);
    state.whyNotRead = Failure{ENOENT, "There is no " + state.path};
    state.whyNotRemoved = state.whyNotRead;
  }
  PlaceState& state = snapshot.places[indexOf(place)];
  state.identity.kind = state.target = EntryKind::RegularFile;
  state.identity.size = bytes.size();
  state.contents = std::make_shared<const OwnedBytes>(std::move(bytes));
  state.whyNotRead.reset();
  state.whyNotRemoved.reset();
  return snapshot;
}

}  // namespace

Rehearsed rehearse(LinuxPlatform& linux, const DeviceSnapshot& snapshot) {
  MigrationInMemory migration(snapshot, linux.platform().homeDirectory.path());
  const PlatformInMemory inMemory(linux, migration.transaction(), &migration.told());
  const bool succeeded = AccountsDataMigrator().performMigration();
  migration.verify(succeeded ? PluginResult::GaveTrue : PluginResult::GaveFalse,
                   factsOf(inMemory.platform()));
  return migration.error() ? Rehearsed(*migration.error()) : Rehearsed(migration.ledger());
}

Rehearsed rehearseFile(DevicePlatform& device, FileKind kind, const PropertyValue& content,
                       const std::string& name) {
  auto bytes = writeBinaryPropertyList(content);
  if (!bytes) {
    return ProgramError{ExitStatus::MalformedInput, bytes.error().text};
  }
  LinuxPlatform& linux = device.linuxPlatform();
  const DevicePlace place = placeOf(kind);
  Rehearsed rehearsed =
      rehearse(linux, snapshotOf(place, *std::move(bytes), linux.platform().homeDirectory.path()));
  if (rehearsed) {
    rehearsed->paths[indexOf(place)] = name;
  }
  return rehearsed;
}

JSON ledgerObject(const Rehearsed& rehearsed) {
  return rehearsed ? ledgerObject(*rehearsed, LedgerDetail::LossesAlone) : JSON(nullptr);
}

std::string linesOf(const Rehearsed& rehearsed) {
  if (!rehearsed) {
    return "A migration would fail: " + escapedText(rehearsed.error().message) + "\n";
  }
  std::string lines;
  for (const std::string& loss : rehearsed->losses()) {
    lines += "Not carried over: " + escapedText(loss) + "\n";
  }
  return lines;
}

}  // namespace accounts
