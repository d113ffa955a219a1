#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "platform/Platform.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/JournalLogSystem.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/LinuxPropertyLists.h"
#include "platform/linux/RecordingCloudTabService.h"
#include "platform/linux/RecordingPreferencesBroadcast.h"

namespace accounts {

/// When the device description, which is the device's own, is looked into.
enum class DescriptionDecoding : std::uint8_t {
  AtOnce,
  /// With `decodeDescription`; no service has an answer before.
  Later
};

/// What a Linux platform is made from. Paths belong to the machine that the program runs on, except
/// those called device paths, which start at the root of the device.
struct LinuxPlatformOptions {
  /// The directory that holds the device; "/" for the running one.
  std::string rootDirectory;
  /// An absolute device path.
  std::string homeDirectory = "/var/mobile";
  /// An absolute device path; none for "tmp" in the home directory.
  std::optional<std::string> temporaryDirectory;
  /// The Resources directory of the plug-in's bundle.
  std::string bundleResourcesDirectory;
  /// The device description; none for the device's own, if it has one.
  std::optional<std::string> deviceDescriptionFile;
  DescriptionDecoding descriptionDecoding = DescriptionDecoding::AtOnce;
  /// The file that lines of log channels are appended to, "-" for standard error, "journal" for the
  /// system's journal; none keeps them off.
  std::optional<std::string> channel;
  /// The socket of the system's journal.
  std::string journalSocket = kJournalSocket;
};

/// What stands in the way of a platform.
struct LinuxPlatformError {
  enum class Kind : std::uint8_t {
    /// An option cannot be used, such as a home directory that is no absolute path.
    UnusableOption,
    /// The root, the device description or the bundle's resources are missing or unreadable.
    MissingInput,
    /// The channel cannot be opened.
    CannotCreate,
    /// The system lacks what the platform needs.
    InputOutput
  };
  Kind kind = Kind::InputOutput;
  /// Its text is one line for a person, without a full stop.
  Failure failure = {};
};

/// One Linux implementation of each interface of the platform, on one device root. Making it
/// changes nothing beneath the root.
class LinuxPlatform {
 public:
  /// An error when an option cannot be used, an input is missing or malformed, or the log cannot be
  /// made; nothing is changed beneath the root.
  static OrError<std::unique_ptr<LinuxPlatform>, LinuxPlatformError> create(
      const LinuxPlatformOptions& options);
  ~LinuxPlatform();

  /// Looks into the device description, which was read when this was made. An error, with the
  /// description of before, when it is malformed.
  Result decodeDescription();

  /// Opens and reads what else the plug-in may ask for outside the root: the bundle's resources and
  /// the local time zone. Nothing needs to be opened for them from then on. An error when this
  /// machine's want or its medium keeps something from being read.
  Result readAhead();

  /// Valid as long as this object.
  [[nodiscard]] Platform& platform();

  [[nodiscard]] const RecordingPreferencesBroadcast& preferencesBroadcast() const;
  [[nodiscard]] const RecordingCloudTabService& cloudTabService() const;

  /// What a program needs beneath the root beyond the interfaces of the platform.
  [[nodiscard]] const DeviceRoot& root() const;
  /// What the lines of log channels are written to; none when they are off.
  [[nodiscard]] std::optional<int> channelDescriptor() const;
  [[nodiscard]] bool logsToJournal() const;
  [[nodiscard]] LinuxFileSystem& fileSystem();

 private:
  struct Parts;
  explicit LinuxPlatform(std::unique_ptr<Parts> parts);

  std::unique_ptr<Parts> parts_;
};

}  // namespace accounts
