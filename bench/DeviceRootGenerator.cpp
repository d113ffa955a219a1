#include "bench/DeviceRootGenerator.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <fstream>
#include <string_view>
#include <system_error>

#include "bench/AccountGenerator.h"
#include "propertylist/binary/BinaryPropertyList.h"

namespace accounts {

namespace {

namespace fs = std::filesystem;

using Failure = std::optional<std::string>;

struct Directory {
  const char* path;
  fs::perms permissions;
};

constexpr fs::perms kUsual = fs::perms::owner_all | fs::perms::group_read | fs::perms::group_exec |
                             fs::perms::others_read | fs::perms::others_exec;

constexpr std::array<Directory, 6> directories = {{
    {"etc", kUsual},
    {"tmp", fs::perms::all | fs::perms::sticky_bit},
    {"var/mobile/Library/Logs/CrashReporter", kUsual},
    {"var/mobile/Library/Mail", kUsual},
    {"var/mobile/Library/Preferences", kUsual},
    {"var/mobile/tmp", fs::perms::owner_all},
}};

Failure writeFile(const fs::path& path, std::string_view contents) {
  std::ofstream stream(path, std::ios::binary | std::ios::trunc);
  stream << contents;
  stream.close();
  return stream.good() ? Failure() : Failure("Could not write " + path.string());
}

Failure writePropertyList(const fs::path& path, const PropertyDictionary& contents) {
  const auto bytes = writeBinaryPropertyList(contents);
  return bytes ? writeFile(path, *bytes)
               : Failure("No bytes for " + path.string() + ": " + bytes.error().text);
}

Failure makeDirectories(const fs::path& root) {
  for (const Directory& directory : directories) {
    const fs::path path = root / directory.path;
    std::error_code error;
    fs::create_directories(path, error);
    if (!error) {
      fs::permissions(path, directory.permissions, error);
    }
    if (error) {
      return "Could not make " + path.string() + ": " + error.message();
    }
  }
  return std::nullopt;
}

/// Answers under which the steps that ask a service change something: notes move on the oldest
/// processor, and one kind of data comes over the cable.
PropertyDictionary deviceAnswers() {
  const PropertyDictionary denied = {{"Sources", PropertyArray{"DenyTethered"}}};
  return {{"DeviceInfo", PropertyDictionary{{"CPUArchitecture", "armv6"},
                                            {"DeviceClass", "Handra"},
                                            {"RegionalBehaviorGoogleMail", true}}},
          {"ProfileRestrictions", PropertyDictionary{{"allowSharedPhotoStreams", 2}}},
          {"ExternalSyncSources", PropertyDictionary{{"Calendars", denied}}},
          {"CloudAccount", PropertyDictionary{{"StatusKey", "status"},
                                              {"PrimaryAccountKey", "primaryAccount"},
                                              {"DisplayName", "Stratix"}}}};
}

std::string passwordFile() {
  return "mobile:*:" + std::to_string(getuid()) + ":" + std::to_string(getgid()) +
         ":Mobile User:/var/mobile:/bin/sh\n";
}

std::string groupFile() {
  return "mobile:*:" + std::to_string(getgid()) + ":\n";
}

Failure writeLegacyStores(const fs::path& library, const DeviceRootDescription& description) {
  const std::size_t accountCount = std::max<std::size_t>(description.accountCount / 4, 1);
  const LegacyStores stores = description.legacyStores;
  Failure failure;
  if (stores == LegacyStores::Mail || stores == LegacyStores::Both) {
    failure = writePropertyList(library / "Mail/Accounts.plist",
                                generatedLegacyMailAccounts(accountCount));
  }
  if (!failure && (stores == LegacyStores::Exchange || stores == LegacyStores::Both)) {
    failure = writePropertyList(library / "Preferences/com.quarx.DataAccess.plist",
                                generatedLegacyExchangeAccounts(accountCount));
  }
  return failure;
}

}  // namespace

std::optional<std::string> writeDeviceRoot(const DeviceRootDescription& description) {
  const fs::path& root = description.root;
  const fs::path library = root / "var/mobile/Library";
  Failure failure = makeDirectories(root);
  if (!failure) {
    failure = writeFile(root / "etc/passwd", passwordFile());
  }
  if (!failure) {
    failure = writeFile(root / "etc/group", groupFile());
  }
  if (!failure) {
    failure = writePropertyList(root / "etc/device.plist", deviceAnswers());
  }
  if (!failure) {
    failure =
        writePropertyList(library / "Preferences/com.quarx.accountsettings.plist",
                          generatedAccountSettings(description.accountCount, description.version));
  }
  return failure ? failure : writeLegacyStores(library, description);
}

}  // namespace accounts
