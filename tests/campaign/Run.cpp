#include "tests/campaign/Run.h"

#include <cstdio>
#include <new>
#include <stdexcept>
#include <utility>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Process.h"
#include "host/HeldLock.h"
#include "host/RootLock.h"
#include "migrator/AccountsDataMigrator.h"
#include "platform/linux/DescribedCloudAccountService.h"
#include "platform/linux/DescribedDeviceInfoService.h"
#include "platform/linux/DescribedExternalSyncSources.h"
#include "platform/linux/DescribedPairingValueStore.h"
#include "platform/linux/DescribedProfileRestrictions.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/LinuxHomeDirectory.h"
#include "platform/linux/LinuxMailDirectory.h"
#include "platform/linux/LinuxPreferenceDomain.h"
#include "platform/linux/LinuxPropertyLists.h"
#include "platform/linux/LinuxSharedResources.h"
#include "safetynet/Restoration.h"
#include "safetynet/SafetyNet.h"
#include "safetynet/SaveObserver.h"
#include "tests/campaign/AllocationFailures.h"
#include "tests/fakes/FakeServices.h"

namespace accounts {

namespace {

constexpr std::string_view kHome = "/var/mobile";
constexpr std::string_view kNotifier = "CampaignNotifier";

DeviceRoot openDevice() {
  PathError error;
  std::optional<DeviceRoot> root =
      DeviceRoot::openRoot(std::string(SimulatedKernel::kDeviceDirectory), error);
  if (!root) {
    throw std::logic_error(error.text);
  }
  return std::move(*root);
}

/// Remembers what is turned into an account settings file.
class ObservedPropertyLists : public PropertyLists {
 public:
  explicit ObservedPropertyLists(PropertyLists& real) : real_(real) {}
  std::vector<std::string> settingsWritten;

  std::optional<PropertyDictionary> readDictionary(std::string_view path) override {
    return real_.readDictionary(path);
  }
  Result serializeBinary(const PropertyValue& value, SerializedPropertyList& serialized) override {
    Result result = real_.serializeBinary(value, serialized);
    const AllocationsSucceed whileObserving;
    const PropertyDictionary* root = value.asDictionary();
    if (result && root != nullptr && root->contains(kPlistAccountsKey)) {
      settingsWritten.push_back(bytesOf(serialized));
    }
    return result;
  }

 private:
  PropertyLists& real_;
};

/// UUIDs that count up and differ from run to run.
class CountingUUIDs : public UUIDGenerator {
 public:
  explicit CountingUUIDs(unsigned run) : run_(run) {}

  std::optional<std::string> randomUUID() override {
    char text[37];
    std::snprintf(text, sizeof text, "%08X-0000-4000-8000-%012X", run_, ++count_);
    return std::string(text);
  }

 private:
  unsigned run_;
  unsigned count_ = 0;
};

/// The bundle's resources, read once: every run needs them.
const FakeBundleResources& resources() {
  static const FakeBundleResources read = [] {
    FakeBundleResources bundle;
    for (const char* name :
         {"AccountTypesProperties", "DataclassesProperties", "AccountCreators", "MailServices"}) {
      bundle.replaced[name] = bundle.readPropertyList(name);
    }
    return bundle;
  }();
  return read;
}

/// The Linux platform on the simulated device: all that works with files is the real thing.
struct DeviceProcess {
  DeviceProcess(const DeviceDescription& description, unsigned run)
      : root(openDevice()),
        cloudAccountService(description),
        deviceInfoService(description),
        externalSyncSources(description),
        pairingValueStore(description),
        profileRestrictions(description),
        uuidGenerator(run) {
    consoleLog.alsoStandardError = false;
    logSystem.channel.enabled = false;
  }

  std::vector<std::string> journal;
  const DeviceRoot root;
  LinuxFileSystem fileSystem{root, std::string(kHome) + "/tmp"};
  LinuxPropertyLists realPropertyLists{root};
  ObservedPropertyLists propertyLists{realPropertyLists};
  SaveObserver saves{fileSystem, std::string(kSettingsPath)};
  LinuxHomeDirectory homeDirectory{kHome};
  LinuxMailDirectory mailDirectory{homeDirectory};
  LinuxPreferenceDomain preferenceDomain{realPropertyLists, homeDirectory};
  LinuxSharedResources sharedResources{root};
  DescribedCloudAccountService cloudAccountService;
  DescribedDeviceInfoService deviceInfoService;
  DescribedExternalSyncSources externalSyncSources;
  DescribedPairingValueStore pairingValueStore;
  DescribedProfileRestrictions profileRestrictions;
  CountingUUIDs uuidGenerator;
  FakeBundleResources bundleResources = resources();
  FakeCloudTabService cloudTabService{journal};
  FakeConsoleLog consoleLog{journal};
  FakeDateFormatter dateFormatter;
  FakeFrameworkLoader frameworkLoader;
  FakeLocalizedStrings localizedStrings;
  FakeLogSystem logSystem;
  FakePreferencesBroadcast preferencesBroadcast{journal};
  Platform platform = {.bundleResources = bundleResources,
                       .cloudAccountService = cloudAccountService,
                       .cloudTabService = cloudTabService,
                       .consoleLog = consoleLog,
                       .dateFormatter = dateFormatter,
                       .deviceInfoService = deviceInfoService,
                       .externalSyncSources = externalSyncSources,
                       .fileSystem = saves,
                       .frameworkLoader = frameworkLoader,
                       .homeDirectory = homeDirectory,
                       .localizedStrings = localizedStrings,
                       .logSystem = logSystem,
                       .mailDirectory = mailDirectory,
                       .pairingValueStore = pairingValueStore,
                       .preferenceDomain = preferenceDomain,
                       .preferencesBroadcast = preferencesBroadcast,
                       .profileRestrictions = profileRestrictions,
                       .propertyLists = propertyLists,
                       .sharedResources = sharedResources,
                       .uuidGenerator = uuidGenerator};
  Process process{platform};
};

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

/// The plug-in's end, as the host sees it: a plug-in that runs out of memory dies in a process of
/// its own.
PluginEnd runPlugin(Run& run) {
  PluginEnd end = PluginEnd::Died;
  try {
    end = AccountsDataMigrator().performMigration() ? PluginEnd::GaveTrue : PluginEnd::GaveFalse;
  } catch (const std::bad_alloc&) {
    run.ranOutOfMemory = true;
  }
  return SimulatedKernel::current()->endPlugin() ? PluginEnd::Died : end;
}

/// What the host does around the plug-in (host/RunCommand.cpp).
void migrateSafely(DeviceProcess& device, unsigned number, Run& run) {
  ProgramError error;
  const std::optional<RootLock> rootLock =
      RootLock::take(device.root, std::nullopt, nullptr, error);
  SafetyNet safetyNet(device.fileSystem, device.propertyLists, accountFilesInHome(kHome),
                      "restore");
  if (!rootLock || !safetyNet.keepInputs(timeText(number))) {
    run.wasRefused = true;
    return;
  }
  const PluginEnd end = runPlugin(run);
  const HeldLock migrationLock(device.sharedResources, kMigrationLockName);
  const Settlement settlement = safetyNet.settle(end, device.saves.saves());
  run.succeeded = end == PluginEnd::GaveTrue && !settlement.error;
}

/// What the host does to put kept files back (host/RestoreCommand.cpp).
void restore(DeviceProcess& device, unsigned number, Run& run) {
  ProgramError error;
  const std::optional<RootLock> rootLock =
      RootLock::take(device.root, std::nullopt, nullptr, error);
  const HeldLock migrationLock(device.sharedResources, kMigrationLockName);
  run.wasRefused = !rootLock || !migrationLock.isHeld();
  run.succeeded = !run.wasRefused && !restoreKeptFiles(device.fileSystem, accountFilesInHome(kHome),
                                                       std::nullopt, timeText(number))
                                          .error;
}

void act(DeviceProcess& device, const Scenario& scenario, unsigned number, Run& run) {
  switch (scenario.action) {
    case Scenario::Action::SaveOutsideMigration:
      run.succeeded = saveOutsideMigration(device, run.notifications);
      break;
    case Scenario::Action::Restoration:
      restore(device, number, run);
      break;
    case Scenario::Action::Migration:
      if (scenario.host == Scenario::Host::SafetyNet) {
        migrateSafely(device, number, run);
      } else {
        run.succeeded = AccountsDataMigrator().performMigration();
      }
      break;
  }
}

}  // namespace

Run runOn(const SimulatedDisk& disk, const Scenario& scenario, const RunOptions& options) {
  SimulatedKernel kernel(disk, options.number);
  Run run;
  std::size_t descriptorsBefore = 0;
  {
    DeviceProcess device(scenario.description, options.number);
    descriptorsBefore = kernel.openDescriptors();
    kernel.start(options.fault, options.recording);
    const AllocationFailure allocations(options.failingAllocation);
    try {
      act(device, scenario, options.number, run);
    } catch (const std::bad_alloc&) {
      run.ranOutOfMemory = true;
    }
    run.allocations = AllocationFailure::count();
    run.settingsWritten = std::move(device.propertyLists.settingsWritten);
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
