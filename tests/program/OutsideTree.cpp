#include "tests/program/OutsideTree.h"

#include <dirent.h>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <fstream>
#include <sstream>
#include <vector>

#include "propertylist/binary/BinaryPropertyList.h"
#include "tests/program/DeviceRootFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

// Older than the times of last change, so that "relatime" mounts tell of the first access.
constexpr timespec kLastAccess = {1'000'000'000, 0};
constexpr timespec kLastChange = {1'100'000'000, 0};

constexpr const char* kOutsideDirectories[] = {
    "/tmp", "/var/mobile/tmp", "/var/mobile/Library/Logs/CrashReporter/AccountMigration"};

PropertyDictionary account(const char* identifierKey) {
  return {{"Type", "CalDAV"},
          {"Class", "MobileCalDAVAccount"},
          {"AccountType", "SMTPAccount"},
          {"DAAccountConfigurationClass", "ASAccount"},
          {identifierKey, kOutsideMark}};
}

/// What a device holds, under its paths. Each value would be seen if it was used.
std::map<const char*, PropertyValue> deviceFiles() {
  return {
      {kSettingsPath, accountSettings(3, {account("Identifier")})},
      {kSettingsCopyPath, accountSettings(3, {account("Identifier")})},
      {kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{account("uniqueId")}}}},
      {kLegacyExchangePath,
       PropertyDictionary{
           {"DAAccountsKey", PropertyArray{account("DAAccountConfigurationAccountID")}}}},
      {kLoggingPreferencesPath,
       PropertyDictionary{{"ASSaveMigrationInformation", true}, {"Mark", kOutsideMark}}},
      {kDevicePropertyListPath,
       PropertyDictionary{{"DeviceInfo", PropertyDictionary{{"CPUArchitecture", kOutsideMark}}}}}};
}

constexpr std::pair<const char*, const char*> kTextFiles[] = {
    {"/etc/passwd", "mobile:*:4242:4242:from outside the root:/var/mobile:/bin/sh\n"},
    {"/etc/group", "mobile:*:4242:\nfrom outside the root:*:4243:\n"},
    {kLockPath, kOutsideMark},
    {kSentinelPath, kOutsideMark},
    {kAutoFetchPath, kOutsideMark},
};

std::string allOf(const fs::path& file) {
  // Without O_NOATIME looking would itself be an access.
  const int descriptor = open(file.c_str(), O_RDONLY | O_NOATIME | O_CLOEXEC);
  EXPECT_GE(descriptor, 0) << file;
  std::string text;
  std::array<char, 4096> part{};
  for (ssize_t count = 0; (count = read(descriptor, part.data(), part.size())) > 0;) {
    text.append(part.data(), static_cast<std::size_t>(count));
  }
  close(descriptor);
  return text;
}

std::ostream& operator<<(std::ostream& stream, const timespec& time) {
  return stream << time.tv_sec << "." << time.tv_nsec;
}

std::string description(const fs::path& path) {
  struct stat status {};
  EXPECT_EQ(lstat(path.c_str(), &status), 0) << path;
  std::ostringstream text;
  text << "mode " << std::oct << status.st_mode << std::dec << ", owner " << status.st_uid << ":"
       << status.st_gid << ", links " << status.st_nlink << ", size " << status.st_size
       << ", accessed " << status.st_atim << ", changed " << status.st_mtim << " and "
       << status.st_ctim;
  if (S_ISREG(status.st_mode)) {
    text << ", holds " << allOf(path);
  }
  return text.str();
}

void writeFile(const fs::path& path, std::string_view text) {
  fs::create_directories(path.parent_path());
  std::ofstream stream(path, std::ios::binary);
  stream << text;
  ASSERT_TRUE(stream.flush().good()) << path;
}

/// The names in a directory. Listed without O_NOATIME, it would count as accessed.
std::vector<std::string> namesIn(const fs::path& directory) {
  const int descriptor =
      open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_NOATIME | O_CLOEXEC);
  DIR* const stream = fdopendir(descriptor);
  EXPECT_NE(stream, nullptr) << directory;
  std::vector<std::string> names;
  while (const dirent* entry = stream != nullptr ? readdir(stream) : nullptr) {
    const std::string name = entry->d_name;
    if (name != "." && name != "..") {
      names.push_back(name);
    }
  }
  closedir(stream);
  return names;
}

/// A directory and everything beneath it, parents first.
std::vector<fs::path> everythingIn(const fs::path& directory) {
  std::vector<fs::path> paths = {directory};
  for (std::size_t next = 0; next < paths.size(); ++next) {
    const fs::path current = paths[next];
    if (!fs::is_directory(fs::symlink_status(current))) {
      continue;
    }
    for (const std::string& name : namesIn(current)) {
      paths.push_back(current / name);
    }
  }
  return paths;
}

}  // namespace

OutsideTree::OutsideTree() : directory_(makeTemporaryDirectory(Medium::Memory, "outside")) {
  for (const char* directory : kOutsideDirectories) {
    fs::create_directories(this->path(directory));
  }
  for (const auto& [devicePath, value] : deviceFiles()) {
    writeFile(this->path(devicePath), writeBinaryPropertyList(value).value_or(""));
  }
  for (const auto& [devicePath, text] : kTextFiles) {
    writeFile(this->path(devicePath), text);
  }
  for (const fs::path& each : everythingIn(directory_)) {
    // Open to all: what stays as it is does so because nobody comes here.
    fs::permissions(each, fs::perms(0777));
    const timespec times[] = {kLastAccess, kLastChange};
    EXPECT_EQ(utimensat(AT_FDCWD, each.c_str(), times, 0), 0) << each;
  }
}

OutsideTree::~OutsideTree() {
  std::error_code error;
  fs::remove_all(directory_, error);
}

fs::path OutsideTree::path(std::string_view devicePath) const {
  return directory_ / fs::path(devicePath).relative_path();
}

std::map<std::string, std::string> OutsideTree::contents() const {
  std::map<std::string, std::string> result;
  for (const fs::path& each : everythingIn(directory_)) {
    result.emplace("/" + each.lexically_relative(directory_).string(), description(each));
  }
  return result;
}

}  // namespace accounts
