#include "tests/smallworld/BothWays.h"

#include <memory>
#include <utility>

#include "migrator/AccountsDataMigrator.h"
#include "tests/ledger/LedgerFixture.h"
#include "tests/safetynet/FakeDevice.h"
#include "tests/safetynet/RunFixture.h"
#include "transaction/TransactionSharedResources.h"

namespace accounts {
namespace {

/// More than a migration of a small device makes up.
constexpr unsigned kIdentifiersOfATurn = 32;

/// The resources of the bundle, which are read once for all devices.
const auto& resources() {
  static const auto read = [] {
    std::map<std::string, std::optional<PropertyDictionary>, std::less<>> dictionaries;
    FakeBundleResources repository;
    for (const char* name :
         {"AccountCreators", "AccountTypesProperties", "DataclassesProperties", "MailServices"}) {
      dictionaries[name] = repository.readPropertyList(name);
    }
    return dictionaries;
  }();
  return read;
}

/// The services of a small device; its files are for others to make.
struct Services : FakePlatform {
  Services(const SmallDevice& device, unsigned turn) {
    consoleLog.alsoStandardError = false;
    bundleResources.replaced = resources();
    if (device.runsOneProgram) {
      deviceInfoService.answers.insert_or_assign("CPUArchitecture", "armv6");
    }
    if (device.usesGoogleMail) {
      deviceInfoService.answers.insert_or_assign("RegionalBehaviorGoogleMail", true);
    }
    for (const SyncDataType each : {SyncDataType::Bookmarks, SyncDataType::Calendars,
                                    SyncDataType::Contacts, SyncDataType::Notes}) {
      externalSyncSources.answers[each] = device.syncSources;
    }
    if (device.savesInformation) {
      preferenceDomain.values.insert_or_assign(
          {std::string(kLoggingPreferences), "ASSaveMigrationInformation"}, true);
    }
    for (unsigned count = turn * kIdentifiersOfATurn; count > 0; --count) {
      static_cast<void>(uuidGenerator.randomUUID());
    }
  }

  [[nodiscard]] Told told() const {
    Told said{logSystem.channel.lines, consoleLog.lines, {}};
    for (const auto& [application, key] : preferencesBroadcast.announcements) {
      said.announcements.push_back(application + " " + key);
    }
    said.announcements.resize(said.announcements.size() + cloudTabService.announcements.size(),
                              "cloud tabs");
    return said;
  }
};

/// The plug-in in memory, in this process.
class InMemory final : public Worker {
 public:
  InMemory(const SmallDevice& device, unsigned turn, EndingOfRun& ending)
      : services_(device, turn), ending_(ending) {}

  OrProgramError<HandedOver> work(const DeviceSnapshot& snapshot, const WorkerTask& task) override {
    MigrationInMemory migration(snapshot, "/var/mobile");
    AnyOwner owners;
    TransactionFileSystem files(migration.transaction(), owners, [](std::string_view path) {
      ADD_FAILURE() << "a path that no migration has: " << path;
    });
    TransactionPropertyLists lists(migration.transaction(), services_.propertyLists);
    TransactionSharedResources shared(services_.sharedResources, task.lock);
    Platform platform = platformWith(services_.platform, {.fileSystem = &files,
                                                          .propertyLists = &lists,
                                                          .sharedResources = &shared,
                                                          .migrationObserver = &migration.told()});
    {
      const Process process(platform);
      const bool result = AccountsDataMigrator().performMigration();
      migration.verify(result ? PluginResult::GaveTrue : PluginResult::GaveFalse,
                       factsOf(platform));
    }
    ending_.told = services_.told();
    ending_.ledger = migration.ledger();
    ending_.origins = migration.told().saved().value_or(std::vector<AccountOrigin>());
    ending_.proposal = migration
                           .proposal(task.keep,
                                     [this](std::string_view bytes) {
                                       ending_.memoryFile.append(bytes);
                                       return true;
                                     })
                           .value();
    return HandedOver{accounts::bytesOf(ending_.proposal), ending_.memoryFile.size()};
  }
  std::unique_ptr<ReadableBytes> contentsOf(const ProposedChange& change) override {
    return std::make_unique<FakeBytes>(ending_.memoryFile.substr(change.offset, change.length));
  }

 private:
  Services services_;
  EndingOfRun& ending_;
};

}  // namespace

Files filesOf(const SmallDevice& device) {
  Files files;
  for (const auto& [place, bytes] : device.files) {
    files[FakeDevice::pathOf(place)] = bytes;
  }
  return files;
}

EndingAlone migratedAlone(const SmallDevice& device, const Files& files, unsigned turn) {
  Services services(device, turn);
  for (const auto& [path, bytes] : files) {
    services.fileSystem.addFile(path, bytes);
  }
  EndingAlone ending;
  const Process process(services.platform);
  ending.succeeded = AccountsDataMigrator().performMigration();
  ending.told = services.told();
  for (const auto& [path, file] : services.fileSystem.files) {
    ending.files[path] = file.contents;
  }
  return ending;
}

EndingOfRun migrated(const SmallDevice& device, const Files& files, unsigned turn,
                     RunPurpose purpose) {
  FakeDevice disk;
  for (const auto& [path, bytes] : files) {
    disk.write(path, bytes);
  }
  EndingOfRun ending;
  FakeHostLocks locks;
  RunMeans means = {.locks = locks,
                    .places = disk,
                    .files = disk,
                    .makeWorker = [&] { return std::make_unique<InMemory>(device, turn, ending); },
                    .isStopped = [] { return false; },
                    .tell = [](std::string_view line) { ADD_FAILURE() << line; },
                    .time = "20260102T030405Z",
                    .lockTimeout = {}};
  ending.conclusion = MigrationRun(means).run(purpose, KeepFiles::WhenNeeded);
  for (auto& [path, bytes] : disk.contents()) {
    if (!path.starts_with(kAccountMigrationDirectory)) {
      ending.files[path] = bytes;
    }
  }
  return ending;
}

}  // namespace accounts
