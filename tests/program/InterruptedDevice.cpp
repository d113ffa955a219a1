#include "tests/program/InterruptedDevice.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <filesystem>

namespace accounts {

namespace fs = std::filesystem;

namespace {

// Several pages, so that a write of the settings can end in the middle.
constexpr std::size_t kNotesSize = 20'000;

constexpr std::string_view kKeptInputs = "/var/mobile/Library/AccountMigration/";

std::vector<std::string> withoutKeptInputs(std::vector<std::string> files) {
  std::erase_if(files, [](const std::string& file) { return file.starts_with(kKeptInputs); });
  return files;
}

}  // namespace

InterruptedDevice::InterruptedDevice() : DeviceRootFixture(Medium::Memory) {
  makeDevice();
  EXPECT_EQ(migrate({"--bare"}).exitStatus, 0);
  settingsAfter_ = readDictionary(kSettingsPath);
  filesAfter_ = files();
  EXPECT_EQ(settingsAfter_.arrayForKey("Accounts").value_or(PropertyArray()).size(), 3U);
  EXPECT_FALSE(exists(kLegacyMailPath) || exists(kLegacyExchangePath) || exists(kSentinelPath));
}

PropertyDictionary InterruptedDevice::settingsBefore() {
  return accountSettings(11, {PropertyDictionary{{"Type", "CalDAV"},
                                                 {"Class", "MobileCalDAVAccount"},
                                                 {"Identifier", "SETTINGS"},
                                                 {"Sync Identifier", "SETTINGS"},
                                                 {"Notes", std::string(kNotesSize, 'n')}}});
}

void InterruptedDevice::makeDevice() const {
  for (const char* directory : {"/var/mobile", "/tmp"}) {
    // Not the directory itself, which may be a file system of its own.
    for (const fs::directory_entry& entry : fs::directory_iterator(onThisMachine(directory))) {
      fs::remove_all(entry.path());
    }
  }
  fs::create_directories(onThisMachine("/var/mobile/Library/Logs/CrashReporter"));
  write(kSettingsPath, settingsBefore());
  write(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{PropertyDictionary{
                                                                 {"AccountType", "IMAPAccount"},
                                                                 {"uniqueId", "MAIL"}}}}});
  write(kLegacyExchangePath,
        PropertyDictionary{
            {"DAAccountsKey",
             PropertyArray{PropertyDictionary{{"DAAccountConfigurationClass", "ASAccount"},
                                              {"DAAccountConfigurationAccountID", "EXCHANGE"}}}}});
}

void InterruptedDevice::expectNothingLost() const {
  const PropertyDictionary settings = readDictionary(kSettingsPath);
  const bool isNew = settings == settingsAfter_;
  EXPECT_TRUE(isNew || settings == settingsBefore());
  if (!isNew) {
    EXPECT_TRUE(exists(kLegacyMailPath));
    EXPECT_TRUE(exists(kLegacyExchangePath));
  }
}

void InterruptedDevice::expectLockIsFree() const {
  if (!exists(kLockPath)) {
    return;
  }
  const int lock = open(onThisMachine(kLockPath).c_str(), O_RDWR | O_CLOEXEC);
  EXPECT_EQ(flock(lock, LOCK_EX | LOCK_NB), 0);
  close(lock);
}

void InterruptedDevice::expectMigrated() const {
  EXPECT_EQ(readDictionary(kSettingsPath), settingsAfter_);
  EXPECT_EQ(withoutKeptInputs(files()), filesAfter_);
}

void InterruptedDevice::expectNextRunFinishes(const std::vector<std::string>& arguments) const {
  const ProgramResult result = migrate(arguments);
  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  expectMigrated();
}

}  // namespace accounts
