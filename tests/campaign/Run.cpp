#include "tests/campaign/Run.h"

#include <new>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Process.h"
#include "migrator/AccountsDataMigrator.h"
#include "platform/linux/LinuxDevicePlaces.h"
#include "platform/linux/LinuxHostLocks.h"
#include "safetynet/MigrationRun.h"
#include "safetynet/Restoration.h"
#include "tests/campaign/AllocationFailures.h"
#include "tests/campaign/DeviceProcess.h"

namespace accounts {

namespace {

constexpr std::string_view kNotifier = "CampaignNotifier";

/// What a program of the device does outside a migration: it looks around in the store, adds,
/// changes and removes accounts, and saves.
bool saveOutsideMigration(DeviceProcess& device, std::size_t& notifications) {
  AccountClass notifier;
  notifier.noteAccountChanges = [&](const PropertyArray& changes) {
    notifications += changes.size();
  };
  device.frameworkLoader.registerClass(std::string(kNotifier), notifier);
  device.bundleResources.replaced["AccountCreators"] = PropertyDictionary{
      {kMailAccountType,
       PropertyArray{PropertyDictionary{
           {"Type", "NotifierAccount"},
           {"Description", PropertyDictionary{{"Framework", "Notifier.so"},
                                              {"Class", kNotifier},
                                              {"Supported Dataclasses",
                                               PropertyArray{kAccountDataclassMail}}}}}}}};
  const std::unique_ptr<AccountsManager> store = AccountsManager::init();
  store->insertAccount(BasicAccount::initWithProperties(
      {{kAccountIdentifier, "ADDED"},
       {kAccountType, kMailAccountType},
       {kAccountClass, "IMAPAccount"},
       {kAccountEnabledDataclasses, PropertyArray{kAccountDataclassMail}}}));
  if (const BasicAccountReference account = store->accountWithIdentifier("IMAP-1")) {
    account->setAccountProperty_forKey("New name", kAccountDisplayName);
    store->updateAccount(account);
  }
  if (const BasicAccountReference parent = store->displayAccountWithSyncIdentifier("CALDAV-1")) {
    store->addChild_toAccount(BasicAccount::initWithProperties({{kAccountIdentifier, "CHILD"},
                                                                {kAccountType, kCalDAVAccountType},
                                                                {kAccountClass, "CalDAVAccount"}}),
                              parent);
  }
  for (const BasicAccountReference& account :
       store->basicAccountsWithTypes({kExchangeAccountType})) {
    store->deleteAccount(account);
  }
  store->saveAllAccounts();
  return store->allBasicSyncableAccounts().size() >= store->count();
}

/// The time that a run's folders are named after.
std::string timeText(unsigned run) {
  return "2026010" + std::to_string(run) + "T000000Z";
}

/// A host without command line, console and processes.
class Host {
 public:
  Host(DeviceProcess& device, unsigned number, Run& run)
      : device_(device),
        run_(run),
        means_{.locks = locks_,
               .places = places_,
               .files = device.fileSystem,
               .makeWorker =
                   [this] { return std::make_unique<InProcessWorker>(device_, run_.handover); },
               .isStopped = [] { return false; },
               .tell = [](std::string_view) {},
               .time = timeText(number),
               .lockTimeout = {}} {}

  void migrate(RunPurpose purpose, KeepFiles keep) {
    RunConclusion conclusion = MigrationRun(means_).run(purpose, keep);
    run_.succeeded = conclusion.isCommitted;
    run_.exitStatus = conclusion.exitStatus;
    run_.error = conclusion.error ? conclusion.error->message : run_.handover.error;
    run_.warnings = std::move(conclusion.warnings);
    run_.warnings.insert(run_.warnings.end(), run_.handover.warnings.begin(),
                         run_.handover.warnings.end());
  }

  /// Alone on the device, when what an interrupted commit left is finished.
  void migrateBare() {
    if (device_.fileSystem.fileExists(pathOf(DevicePlace::CommitRecord))) {
      migrate(RunPurpose::FinishingAlone, KeepFiles::WhenNeeded);
      if (run_.exitStatus != ExitStatus::Success) {
        return;
      }
    }
    places_.removeAbandonedTemporaryFiles();
    run_.succeeded = AccountsDataMigrator().performMigration();
  }

  void restore() {
    if (locks_.takeRoot({}) != LockEnd::Taken || locks_.takeMigration({}) != LockEnd::Taken) {
      run_.exitStatus = ExitStatus::CannotCreate;
      return;
    }
    KeptFolders folders(device_.fileSystem, places_);
    const Restoration restoration =
        restoreKeptFiles(places_, folders, kHome, std::nullopt, means_.time);
    run_.succeeded = !restoration.error;
    if (restoration.error) {
      run_.exitStatus = restoration.error->exitStatus;
      run_.error = restoration.error->message;
    }
  }

 private:
  DeviceProcess& device_;
  Run& run_;
  LinuxHostLocks locks_{device_.root, [] { return false; }, [](std::string_view) {}};
  LinuxDevicePlaces places_{device_.root, device_.fileSystem, std::string(kHome)};
  RunMeans means_;
};

void act(DeviceProcess& device, const Scenario& scenario, const RunOptions& options, Run& run) {
  const bool isBare = options.host.value_or(scenario.host) == Scenario::Host::Bare;
  switch (scenario.action) {
    case Scenario::Action::SaveOutsideMigration:
      run.succeeded = saveOutsideMigration(device, run.notifications);
      break;
    case Scenario::Action::Restoration:
      Host(device, options.number, run).restore();
      break;
    case Scenario::Action::Migration:
      if (isBare) {
        Host(device, options.number, run).migrateBare();
      } else {
        Host(device, options.number, run).migrate(RunPurpose::Migration, scenario.keep);
      }
      break;
  }
}

}  // namespace

Run runOn(const SimulatedDisk& disk, const Scenario& scenario, const RunOptions& options) {
  SimulatedKernel kernel(disk, options.number);
  kernel.setAbilities(scenario.abilities);
  Run run;
  run.handover.limit = options.handover;
  std::size_t descriptorsBefore = 0;
  {
    DeviceProcess device(scenario.description, options.number);
    const Process process(device.platform);
    descriptorsBefore = kernel.openDescriptors();
    kernel.start(options.fault, options.recording);
    if (options.intrusion) {
      kernel.intrude(*options.intrusion);
    }
    if (options.otherLock) {
      kernel.lockByAnother(*options.otherLock);
    }
    const AllocationFailure allocations(options.failingAllocation);
    try {
      act(device, scenario, options, run);
    } catch (const std::bad_alloc&) {
      run.ranOutOfMemory = true;
    }
    run.allocations = AllocationFailure::count();
    const bool isBare = options.host.value_or(scenario.host) == Scenario::Host::Bare;
    run.settingsWritten =
        isBare ? std::move(device.propertyLists.settingsWritten) : run.handover.settings;
    run.openDescriptors = kernel.openDescriptors() - descriptorsBefore;
  }
  if (run.ranOutOfMemory) {
    // The file system keeps a temporary file open for a plug-in that may still go on with it.
    run.openDescriptors = kernel.openDescriptors();
  }
  run.disk = kernel.disk();
  run.refusedPaths = kernel.refusedPaths();
  run.operations = kernel.operationCount();
  run.calls = kernel.calls();
  run.changes = kernel.changes();
  return run;
}

}  // namespace accounts
