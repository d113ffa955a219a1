#include "platform/linux/LinuxPlatform.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <utility>

#include "platform/linux/BundleFiles.h"
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

bool fail(LinuxPlatformError& error, Kind kind, Failure failure) {
  error = {kind, std::move(failure)};
  return false;
}

bool checkDevicePath(std::string_view option, const std::string& path, LinuxPlatformError& error) {
  if (path.starts_with('/')) {
    return true;
  }
  std::string text = "The ";
  text.append(option).append(" \"").append(path).append("\" is not an absolute path of the device");
  return fail(error, Kind::UnusableOption, {0, std::move(text)});
}

bool checkResources(const std::string& directory, LinuxPlatformError& error) {
  const int number = ::open(directory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
  if (number < 0) {
    return fail(error, Kind::MissingInput,
                pathFailure("open the bundle's resources", directory, errno));
  }
  ::close(number);
  return true;
}

/// A log, and what it writes to.
struct OpenedLog {
  std::unique_ptr<LogSystem> log;
  std::optional<int> descriptor = {};
};

OrFailure<OpenedLog> openLog(const LinuxPlatformOptions& options) {
  if (!options.channel) {
    return OpenedLog{std::make_unique<LinuxLogSystem>()};
  }
  if (*options.channel == kJournal) {
    auto journal = JournalLogSystem::connect(options.journalSocket);
    if (!journal) {
      return journal.error();
    }
    const int descriptor = (*journal)->descriptor();
    return OpenedLog{*std::move(journal), descriptor};
  }
  auto output = openLogOutput(*options.channel);
  if (!output) {
    return output.error();
  }
  const int descriptor = output->number();
  return OpenedLog{std::make_unique<LinuxLogSystem>(*std::move(output)), descriptor};
}

/// The device description as it stands in its file.
OrFailure<DescriptionBytes> readDescription(const LinuxPlatformOptions& options,
                                            const DeviceRoot& root) {
  return options.deviceDescriptionFile ? readHostDeviceDescription(*options.deviceDescriptionFile)
                                       : readDeviceDescription(root);
}

}  // namespace

// Declared in the order in which they need each other.
struct LinuxPlatform::Parts {
  Parts(const LinuxPlatformOptions& options, DeviceRoot openedRoot, DescriptionBytes read,
        OpenedLog openedLog)
      : root(std::move(openedRoot)),
        descriptionBytes(std::move(read)),
        bundleFiles(options.bundleResourcesDirectory),
        fileSystem(root, options.temporaryDirectory.value_or(
                             joinedPath(options.homeDirectory, kTemporaryDirectoryInHome))),
        propertyLists(root),
        frameworkLoader(root, consoleLog),
        homeDirectory(options.homeDirectory),
        mailDirectory(homeDirectory),
        preferenceDomain(propertyLists, homeDirectory),
        sharedResources(root),
        bundleResources(bundleFiles),
        localizedStrings(bundleFiles, userLanguages(::getenv)),
        log(std::move(openedLog)),
        logsToJournal(options.channel == kJournal),
        cloudAccountService(description),
        deviceInfoService(description),
        externalSyncSources(description),
        pairingValueStore(description),
        profileRestrictions(description) {}

  const DeviceRoot root;
  const DescriptionBytes descriptionBytes;
  DeviceDescription description;
  BundleFiles bundleFiles;
  LinuxFileSystem fileSystem;
  LinuxPropertyLists propertyLists;
  LinuxConsoleLog consoleLog;
  LinuxFrameworkLoader frameworkLoader;
  LinuxHomeDirectory homeDirectory;
  LinuxMailDirectory mailDirectory;
  LinuxPreferenceDomain preferenceDomain;
  LinuxSharedResources sharedResources;
  LinuxBundleResources bundleResources;
  LinuxLocalizedStrings localizedStrings;
  const OpenedLog log;
  const bool logsToJournal;
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
                       .logSystem = *log.log,
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
  auto root = DeviceRoot::openRoot(options.rootDirectory);
  if (!root) {
    const Kind kind = root.error().number == ENOSYS ? Kind::InputOutput : Kind::MissingInput;
    fail(error, kind, root.error());
    return nullptr;
  }
  auto description = readDescription(options, *root);
  if (!description) {
    fail(error, Kind::MissingInput, description.error());
    return nullptr;
  }
  auto log = openLog(options);
  if (!log) {
    fail(error, Kind::CannotCreate, log.error());
    return nullptr;
  }
  std::unique_ptr<LinuxPlatform> platform(new LinuxPlatform(std::make_unique<Parts>(
      options, std::move(*root), *std::move(description), *std::move(log))));
  const bool isUsable = options.descriptionDecoding == DescriptionDecoding::Later ||
                        platform->decodeDescription(error);
  return isUsable ? std::move(platform) : nullptr;
}

bool LinuxPlatform::decodeDescription(LinuxPlatformError& error) {
  auto description = decodeDeviceDescription(parts_->descriptionBytes);
  if (!description) {
    return fail(error, Kind::MissingInput, description.error());
  }
  parts_->description = *std::move(description);
  return true;
}

Result LinuxPlatform::readAhead() {
  readLocalTimeZoneAhead();
  return parts_->bundleFiles.readAhead();
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

std::optional<int> LinuxPlatform::channelDescriptor() const {
  return parts_->log.descriptor;
}

bool LinuxPlatform::logsToJournal() const {
  return parts_->logsToJournal;
}

LinuxFileSystem& LinuxPlatform::fileSystem() {
  return parts_->fileSystem;
}

}  // namespace accounts
