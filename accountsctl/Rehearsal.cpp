#include "accountsctl/Rehearsal.h"

#include <cerrno>
#include <memory>
#include <stdexcept>

#include "commandline/PlatformError.h"
#include "migrator/AccountsDataMigrator.h"
#include "platform/linux/LinuxDevicePlaces.h"
#include "platform/linux/LinuxPreferenceDomain.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/value/Description.h"
#include "report/LedgerJSON.h"
#include "safetynet/MigrationInMemory.h"
#include "safetynet/PlaceErrors.h"
#include "transaction/TransactionPlatform.h"

namespace accounts {
namespace {

/// Lets everybody have a file: who looks at an image is not who will migrate it.
class AnyOwner final : public OwnershipRule {
 public:
  std::variant<FileOwner, Failure> ownerNamed(std::string_view, std::string_view) override {
    return FileOwner();
  }
};

class SilentConsole final : public ConsoleLog {
 public:
  void writeLine(std::string_view) override {}
};

class OwnedBytes final : public ReadableBytes {
 public:
  explicit OwnedBytes(std::string bytes) : bytes_(std::move(bytes)) {}
  std::optional<Failure> giveTo(const Taker& take) const override {
    static_cast<void>(take(bytes_));
    return std::nullopt;
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

Rehearsed rehearse(LinuxPlatform& linux, const DeviceSnapshot& snapshot) {
  MigrationInMemory migration(snapshot, linux.platform().homeDirectory.path());
  AnyOwner owners;
  TransactionPlatform inMemory(
      migration.transaction(), linux.platform(), owners, MigrationLockState::Available,
      [](std::string_view path) {
        throw std::logic_error("A path that no migration has: " + std::string(path));
      });
  LinuxPreferenceDomain preferences(inMemory.propertyLists(), linux.platform().homeDirectory);
  SilentConsole console;
  Platform platform =
      platformWith(inMemory.platform(preferences),
                   {.consoleLog = &console, .migrationObserver = &migration.told()});
  const Process process(platform);
  const bool succeeded = AccountsDataMigrator().performMigration();
  migration.verify(succeeded ? PluginResult::GaveTrue : PluginResult::GaveFalse, factsOf(platform));
  return migration.error() ? Rehearsed(*migration.error()) : Rehearsed(migration.ledger());
}

}  // namespace

Rehearsed rehearseDevice(DevicePlatform& device) {
  LinuxPlatform& linux = device.linuxPlatform();
  LinuxDevicePlaces places(linux.root(), linux.fileSystem(), linux.platform().homeDirectory.path());
  const auto snapshot = places.takeSnapshot();
  if (const auto* failure = std::get_if<Failure>(&snapshot)) {
    return readingError(*failure);
  }
  return rehearse(linux, std::get<DeviceSnapshot>(snapshot));
}

Rehearsed rehearseFile(DevicePlatform& device, FileKind kind, const PropertyValue& content,
                       const std::string& name) {
  PropertyListError error;
  std::optional<std::string> bytes = writeBinaryPropertyList(content, error);
  if (!bytes) {
    return ProgramError{ExitStatus::MalformedInput, error.text};
  }
  LinuxPlatform& linux = device.linuxPlatform();
  const DevicePlace place = placeOf(kind);
  Rehearsed rehearsed =
      rehearse(linux, snapshotOf(place, *std::move(bytes), linux.platform().homeDirectory.path()));
  if (auto* ledger = std::get_if<AccountLedger>(&rehearsed)) {
    ledger->paths[indexOf(place)] = name;
  }
  return rehearsed;
}

JSON ledgerObject(const Rehearsed& rehearsed) {
  const auto* ledger = std::get_if<AccountLedger>(&rehearsed);
  return ledger != nullptr ? ledgerObject(*ledger, LedgerDetail::LossesAlone) : JSON(nullptr);
}

std::string linesOf(const Rehearsed& rehearsed) {
  if (const auto* error = std::get_if<ProgramError>(&rehearsed)) {
    return "A migration would fail: " + escapedText(error->message) + "\n";
  }
  std::string lines;
  for (const std::string& loss : std::get<AccountLedger>(rehearsed).losses()) {
    lines += "Not carried over: " + escapedText(loss) + "\n";
  }
  return lines;
}

}  // namespace accounts
