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

Result checkDevicePath(std::string_view option, const std::string& path) {
  if (path.starts_with('/')) {
    return {};
  }
  std::string text = "The ";
  text.append(option).append(" \"").append(path).append("\" is not an absolute path of the device");
  return Failure{.text = std::move(text)};
}

Result checkResources(const std::string& directory) {
  const FileDescriptor opened(::open(directory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
  return asResult("open the bundle's resources", directory, opened.number() < 0 ? errno : 0);
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

OrError<std::unique_ptr<LinuxPlatform>, LinuxPlatformError> LinuxPlatform::create(
    const LinuxPlatformOptions& options) {
  Result usable = checkDevicePath("home directory", options.homeDirectory);
  if (usable && options.temporaryDirectory) {
    usable = checkDevicePath("temporary directory", *options.temporaryDirectory);
  }
  if (!usable) {
    return LinuxPlatformError{Kind::UnusableOption, usable.error()};
  }
  if (const Result there = checkResources(options.bundleResourcesDirectory); !there) {
    return LinuxPlatformError{Kind::MissingInput, there.error()};
  }
  auto root = DeviceRoot::openRoot(options.rootDirectory);
  if (!root) {
    const Kind kind = root.error().number == ENOSYS ? Kind::InputOutput : Kind::MissingInput;
    return LinuxPlatformError{kind, root.error()};
  }
  auto description = readDescription(options, *root);
  if (!description) {
    return LinuxPlatformError{Kind::MissingInput, description.error()};
  }
  auto log = openLog(options);
  if (!log) {
    return LinuxPlatformError{Kind::CannotCreate, log.error()};
  }
  std::unique_ptr<LinuxPlatform> platform(new LinuxPlatform(std::make_unique<Parts>(
      options, std::move(*root), *std::move(description), *std::move(log))));
  const Result decoded = options.descriptionDecoding == DescriptionDecoding::AtOnce
                             ? platform->decodeDescription()
                             : Result();
  if (!decoded) {
    return LinuxPlatformError{Kind::MissingInput, decoded.error()};
  }
  return platform;
}

Result LinuxPlatform::decodeDescription() {
  auto description = decodeDeviceDescription(parts_->descriptionBytes);
  if (!description) {
    return description.error();
  }
  parts_->description = *std::move(description);
  return {};
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
