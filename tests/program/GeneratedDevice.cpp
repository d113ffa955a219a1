#include "tests/program/GeneratedDevice.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <iomanip>
#include <sstream>

#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/value/Description.h"
#include "propertylist/xml/XMLPropertyList.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/GeneratedAccounts.h"

namespace accounts {
namespace {

constexpr uid_t kMobile = 501;
constexpr mode_t kModes[] = {0644, 0644, 0600, 0640, 0444, 0666};

/// A property list in the binary format, or now and then in XML if that can hold it.
std::string bytesOf(Choices& choices, const PropertyValue& value) {
  auto bytes = choices.oneIn(4) ? writeXMLPropertyList(value) : writeBinaryPropertyList(value);
  if (!bytes) {
    bytes = writeBinaryPropertyList(value);
  }
  EXPECT_TRUE(bytes) << bytes.error().text;
  return bytes.value_or("");
}

/// What is no dictionary: nothing, half a file, text, or another value.
std::string malformed(Choices& choices, const PropertyDictionary& dictionary) {
  const std::string bytes = bytesOf(choices, dictionary);
  switch (choices.below(4)) {
    case 0:
      return "";
    case 1:
      return bytes.substr(0, bytes.size() / 2);
    case 2:
      return "bplist00 but not quite";
    default:
      return bytesOf(choices, PropertyArray{dictionary});
  }
}

/// What a device's services answer.
PropertyDictionary deviceDescription(Choices& choices) {
  PropertyDictionary description;
  const auto maybe = [&](std::string_view key, const PropertyValue& value) {
    if (!choices.oneIn(3)) {
      description.set(key, choices.oneIn(24) ? anyValue(choices) : value);
    }
  };
  maybe("DeviceInfo", PropertyDictionary{{"CPUArchitecture", choices.flag() ? "armv6" : "armv7"},
                                         {"DeviceClass", "Handra"},
                                         {"RegionalBehaviorGoogleMail", choices.flag()}});
  PropertyDictionary restrictions;
  for (const char* key : {"allowCloudDocumentSync", "allowPhotoStream", "allowSharedPhotoStreams",
                          "allowCloudBackup", "allowCardsAndPassesWhileLocked"}) {
    restrictions.set(key, choices.below(3));
  }
  maybe("ProfileRestrictions", restrictions);
  PropertyDictionary sources;
  for (const char* key : {"Bookmarks", "Calendars", "Contacts", "Notes"}) {
    PropertyDictionary source;
    if (choices.flag()) {
      source.set("Sources", PropertyArray{choices.flag() ? "DenyTethered" : "Windows"});
    }
    if (choices.oneIn(4)) {
      source.set("Error", "the computer does not answer");
    }
    sources.set(key, source);
  }
  maybe("ExternalSyncSources", sources);
  maybe("PairingValues",
        PropertyDictionary{
            {"com.quarx.mobile.tethered_sync",
             PropertyDictionary{{"Contacts", PropertyDictionary{{"SyncingOS", "Windows"}}}}}});
  if (choices.oneIn(3)) {
    description.set("CloudAccount",
                    PropertyDictionary{{"StatusKey", "status"}, {"DisplayName", "Stratix"}});
  }
  return description;
}

/// Makes the entries of one device.
class DeviceMaker {
 public:
  explicit DeviceMaker(std::uint64_t seed) : choices_(seed) {}

  std::vector<GeneratedEntry> made() {
    addDirectories();
    addUsers();
    addSettings();
    addLegacyStore(kLegacyMailPath, generatedLegacyMail);
    addLegacyStore(kLegacyExchangePath, generatedLegacyExchange);
    addOthers();
    return std::move(entries_);
  }

 private:
  void addDirectories() {
    for (const char* path : {"/etc", "/var", "/var/mobile", "/var/mobile/Library",
                             "/var/mobile/Library/Preferences"}) {
      addDirectory(path);
    }
    if (!choices_.oneIn(60)) {
      addDirectory("/tmp", 01777);
    }
    hasMail_ = !choices_.oneIn(12);
    if (hasMail_) {
      addDirectory("/var/mobile/Library/Mail");
    }
    hasLogs_ = !choices_.oneIn(12);
    if (hasLogs_) {
      addDirectory("/var/mobile/Library/Logs");
      addDirectory("/var/mobile/Library/Logs/CrashReporter");
    }
    if (choices_.oneIn(4)) {
      addDirectory("/var/mobile/tmp", 0700);
    }
  }

  void addUsers() {
    const std::string number = std::to_string(mobileOfGeneratedDevices());
    const bool hasMobile = !choices_.oneIn(50);
    add("/etc/passwd",
        "root:*:0:0::/:\n" +
            (hasMobile ? "mobile:*:" + number + ":" + number + "::/var/mobile:\n" : std::string()));
    add("/etc/group", "mobile:*:" + number + ":\n");
    if (!choices_.oneIn(3)) {
      add(kDevicePropertyListPath, bytesOf(choices_, deviceDescription(choices_)));
    }
  }

  void addSettings() {
    const PropertyDictionary settings = generatedSettings(choices_);
    if (choices_.oneIn(10)) {
      return;
    }
    addAsMobileOrRoot(kSettingsPath, choices_.oneIn(12) ? malformed(choices_, settings)
                                                        : bytesOf(choices_, settings));
  }

  void addLegacyStore(const std::string& path, PropertyDictionary (*make)(Choices& choices)) {
    if (path == kLegacyMailPath && !hasMail_) {
      return;
    }
    if (choices_.oneIn(5)) {
      addAsMobileOrRoot(path + ".original", "the store as another program left it");
    }
    const PropertyDictionary store = make(choices_);
    switch (choices_.below(12)) {
      case 0:
        addAsMobileOrRoot(path, malformed(choices_, store));
        return;
      case 1:
        addAsMobileOrRoot(path, bytesOf(choices_, PropertyDictionary{}));
        return;
      case 2:
      case 3:
      case 4:
      case 5:
        addAsMobileOrRoot(path, bytesOf(choices_, store));
        return;
      default:
        return;
    }
  }

  void addOthers() {
    if (hasMail_ && choices_.oneIn(3)) {
      addAsMobileOrRoot(kAutoFetchPath, "");
    }
    if (choices_.oneIn(14)) {
      addAsMobileOrRoot(kSentinelPath, "Old Account Information Removal Sentinel");
    }
    if (hasLogs_ && choices_.oneIn(4)) {
      addAsMobileOrRoot(kSettingsCopyPath, "the settings as they were long ago");
    }
    if (hasLogs_ && choices_.oneIn(6)) {
      addDirectory(kInformationDirectory, 0777);
    }
    if (choices_.oneIn(3)) {
      const PropertyDictionary preferences = {
          {"ASSaveMigrationInformation",
           choices_.oneIn(6) ? anyValue(choices_) : PropertyValue(!choices_.oneIn(5))}};
      add(kLoggingPreferencesPath,
          choices_.oneIn(12) ? malformed(choices_, preferences) : bytesOf(choices_, preferences));
    }
  }

  void addDirectory(const std::string& path, mode_t mode = 0755) {
    const bool isMobiles = path.starts_with("/var/mobile");
    entries_.push_back(
        {path, std::nullopt, mode, isMobiles ? mobileOfGeneratedDevices() : getuid()});
  }
  void add(const std::string& path, std::string contents) {
    entries_.push_back({path, std::move(contents), 0644, getuid()});
  }
  void addAsMobileOrRoot(const std::string& path, std::string contents) {
    entries_.push_back({path, std::move(contents), choices_.of(kModes),
                        choices_.oneIn(3) ? getuid() : mobileOfGeneratedDevices()});
  }

  Choices choices_;
  bool hasMail_ = true;
  bool hasLogs_ = true;
  std::vector<GeneratedEntry> entries_;
};

void makeEntry(const GeneratedEntry& entry, const std::filesystem::path& root) {
  const std::string path = root.string() + entry.path;
  if (entry.contents) {
    const int file = open(path.c_str(), O_CREAT | O_EXCL | O_WRONLY | O_CLOEXEC, 0600);
    const std::string& bytes = *entry.contents;
    EXPECT_EQ(write(file, bytes.data(), bytes.size()), static_cast<ssize_t>(bytes.size())) << path;
    close(file);
  } else {
    EXPECT_EQ(mkdir(path.c_str(), 0700), 0) << path;
  }
  if (getuid() == 0) {
    EXPECT_EQ(chown(path.c_str(), entry.owner, entry.owner), 0) << path;
  }
  EXPECT_EQ(chmod(path.c_str(), entry.mode), 0) << path;
}

/// A file's value if it is a property list, otherwise its bytes.
std::string contentsForPeople(const std::string& bytes) {
  const auto value = readPropertyList(bytes);
  return value ? describe(*value) : "no property list: \"" + escapedText(bytes) + "\"";
}

}  // namespace

uid_t mobileOfGeneratedDevices() {
  return getuid() == 0 ? kMobile : getuid();
}

std::vector<GeneratedEntry> generatedDevice(std::uint64_t seed) {
  return DeviceMaker(seed).made();
}

void makeDevice(const std::vector<GeneratedEntry>& device, const std::filesystem::path& root) {
  for (const GeneratedEntry& each : device) {
    makeEntry(each, root);
  }
}

std::string description(const std::vector<GeneratedEntry>& device) {
  std::ostringstream text;
  for (const GeneratedEntry& each : device) {
    text << each.path << " " << std::oct << each.mode << std::dec << " of " << each.owner;
    if (each.contents) {
      text << ": " << contentsForPeople(*each.contents);
    }
    text << "\n";
  }
  return text.str();
}

}  // namespace accounts
