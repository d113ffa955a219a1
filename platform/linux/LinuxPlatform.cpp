#include "platform/linux/LinuxPlatform.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <utility>

#include "platform/linux/DescribedCloudAccountService.h"
#include "platform/linux/DescribedDeviceInfoService.h"
#include "platform/linux/DescribedExternalSyncSources.h"
#include "platform/linux/DescribedPairingValueStore.h"
#include "platform/linux/DescribedProfileRestrictions.h"
#include "platform/linux/DeviceDescription.h"
#include "platform/linux/LinuxBundleResources.h"
#include "platform/linux/LinuxConsoleLog.h"
#include "platform/linux/LinuxDateFormatter.h"
#include "platform/linux/LinuxFrameworkLoader.h"
#include "platform/linux/LinuxHomeDirectory.h"
#include "platform/linux/LinuxLocalizedStrings.h"
#include "platform/linux/LinuxLogSystem.h"
#include "platform/linux/LinuxMailDirectory.h"
#include "platform/linux/LinuxPreferenceDomain.h"
#include "platform/linux/LinuxSharedResources.h"
#include "platform/linux/LinuxUUIDGenerator.h"
#include "platform/linux/UserLanguages.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

using Kind = LinuxPlatformError::Kind;

constexpr std::string_view kTemporaryDirectoryInHome = "tmp";
constexpr std::string_view kJournal = "journal";

bool fail(LinuxPlatformError& error, Kind kind, std::string text) {
  error = {.kind = kind, .text = std::move(text)};
  return false;
}

bool fail(LinuxPlatformError& error, Kind kind, const PathError& reason) {
  error = {.kind = kind, .failure = failureKind(reason.number), .text = reason.text};
  return false;
}

bool checkDevicePath(std::string_view option, const std::string& path, LinuxPlatformError& error) {
  if (path.starts_with('/')) {
    return true;
  }
  std::string text = "The ";
  text.append(option).append(" \"").append(path).append("\" is not an absolute path of the device");
  return fail(error, Kind::UnusableOption, std::move(text));
}

bool checkResources(const std::string& directory, LinuxPlatformError& error) {
  const int number = ::open(directory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
  if (number < 0) {
    return fail(error, Kind::MissingInput,
                pathError("open the bundle's resources", directory, errno));
  }
  ::close(number);
  return true;
}

/// Null, with `error` set, when the channel cannot be opened.
std::unique_ptr<LogSystem> makeLogSystem(const LinuxPlatformOptions& options, PathError& error) {
  if (!options.channel) {
    return std::make_unique<LinuxLogSystem>();
  }
  if (*options.channel == kJournal) {
    return JournalLogSystem::connect(options.journalSocket, error);
  }
  std::optional<FileDescriptor> output = openLogOutput(*options.channel, error);
  return output ? std::make_unique<LinuxLogSystem>(std::move(output)) : nullptr;
}

}  // namespace

// Declared in the order in which they need each other.
struct LinuxPlatform::Parts {
  Parts(const LinuxPlatformOptions& options, DeviceRoot openedRoot, DeviceDescription read,
        std::unique_ptr<LogSystem> madeLogSystem)
      : root(std::move(openedRoot)),
        description(std::move(read)),
        fileSystem(root, options.temporaryDirectory.value_or(
                             joinedPath(options.homeDirectory, kTemporaryDirectoryInHome))),
        propertyLists(root),
        frameworkLoader(root),
        homeDirectory(options.homeDirectory),
        mailDirectory(homeDirectory),
        preferenceDomain(propertyLists, homeDirectory),
        sharedResources(root),
        bundleResources(options.bundleResourcesDirectory),
        localizedStrings(options.bundleResourcesDirectory, userLanguages(::getenv)),
        logSystem(std::move(madeLogSystem)),
        cloudAccountService(description),
        deviceInfoService(description),
        externalSyncSources(description),
        pairingValueStore(description),
        profileRestrictions(description) {}

  const DeviceRoot root;
  const DeviceDescription description;
  LinuxFileSystem fileSystem;
  LinuxPropertyLists propertyLists;
  LinuxFrameworkLoader frameworkLoader;
  LinuxHomeDirectory homeDirectory;
  LinuxMailDirectory mailDirectory;
  LinuxPreferenceDomain preferenceDomain;
  LinuxSharedResources sharedResources;
  LinuxBundleResources bundleResources;
  LinuxLocalizedStrings localizedStrings;
  LinuxConsoleLog consoleLog;
  const std::unique_ptr<LogSystem> logSystem;
  LinuxDateFormatter dateFormatter;
  LinuxUUIDGenerator uuidGenerator;
  DescribedCloudAccountService cloudAccountService;
  DescribedDeviceInfoService deviceInfoService;
  DescribedExternalSyncSources externalSyncSources;
  DescribedPairingValueStore pairingValueStore;
  DescribedProfileRestrictions profileRestrictions;
  RecordingCloudTabService cloudTabService;
  RecordingPreferencesBroadcast preferencesBroadcast;
  Platform platform = {.bundleResources = bundleResources,
                       .cloudAccountService = cloudAccountService,
                       .cloudTabService = cloudTabService,
                       .consoleLog = consoleLog,
                       .dateFormatter = dateFormatter,
                       .deviceInfoService = deviceInfoService,
                       .externalSyncSources = externalSyncSources,
                       .fileSystem = fileSystem,
                       .frameworkLoader = frameworkLoader,
                       .homeDirectory = homeDirectory,
                       .localizedStrings = localizedStrings,
                       .logSystem = *logSystem,
                       .mailDirectory = mailDirectory,
                       .pairingValueStore = pairingValueStore,
                       .preferenceDomain = preferenceDomain,
                       .preferencesBroadcast = preferencesBroadcast,
                       .profileRestrictions = profileRestrictions,
                       .propertyLists = propertyLists,
                       .sharedResources = sharedResources,
                       .uuidGenerator = uuidGenerator};
};

std::unique_ptr<LinuxPlatform> LinuxPlatform::create(const LinuxPlatformOptions& options,
                                                     LinuxPlatformError& error) {
  if (!checkDevicePath("home directory", options.homeDirectory, error) ||
      (options.temporaryDirectory &&
       !checkDevicePath("temporary directory", *options.temporaryDirectory, error)) ||
      !checkResources(options.bundleResourcesDirectory, error)) {
    return nullptr;
  }
  PathError failure;
  auto root = DeviceRoot::openRoot(options.rootDirectory, failure);
  if (!root) {
    fail(error, failure.number == ENOSYS ? Kind::InputOutput : Kind::MissingInput, failure);
    return nullptr;
  }
  auto description = options.deviceDescriptionFile
                         ? readHostDeviceDescription(*options.deviceDescriptionFile, failure)
                         : readDeviceDescription(*root, failure);
  if (!description) {
    fail(error, Kind::MissingInput, failure);
    return nullptr;
  }
  std::unique_ptr<LogSystem> logSystem = makeLogSystem(options, failure);
  if (logSystem == nullptr) {
    fail(error, Kind::CannotCreate, failure);
    return nullptr;
  }
  return std::unique_ptr<LinuxPlatform>(new LinuxPlatform(std::make_unique<Parts>(
      options, std::move(*root), std::move(*description), std::move(logSystem))));
}

LinuxPlatform::LinuxPlatform(std::unique_ptr<Parts> parts) : parts_(std::move(parts)) {}

LinuxPlatform::~LinuxPlatform() = default;

Platform& LinuxPlatform::platform() {
  return parts_->platform;
}

const RecordingPreferencesBroadcast& LinuxPlatform::preferencesBroadcast() const {
  return parts_->preferencesBroadcast;
}

const RecordingCloudTabService& LinuxPlatform::cloudTabService() const {
  return parts_->cloudTabService;
}

const DeviceRoot& LinuxPlatform::root() const {
  return parts_->root;
}

LinuxFileSystem& LinuxPlatform::fileSystem() {
  return parts_->fileSystem;
}

LinuxPropertyLists& LinuxPlatform::propertyLists() {
  return parts_->propertyLists;
}

}  // namespace accounts
