#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <string_view>
#include <vector>

#include "safetynet/SafetyNet.h"
#include "tests/fakes/FakePlatform.h"

namespace accounts {

inline constexpr SettingsSaves kNoSave = {LastSave::None, false};
inline constexpr SettingsSaves kFailedSave = {LastSave::Failed, false};
inline constexpr SettingsSaves kWrittenSave = {LastSave::Written, true};

inline constexpr std::string_view kTime = "20260102T030405Z";

/// A device in memory and a safety net around what a test lets a plug-in do to it.
class SafetyNetTest : public testing::Test {
 protected:
  static std::string folderPath(std::string_view name) {
    return "/var/mobile/Library/AccountMigration/" + std::string(name);
  }
  inline static const std::string folder = folderPath("Kept-20260102T030405Z");
  static std::string kept(std::string_view path) {
    return folder + "/" + std::string(nameOf(path));
  }

  /// Writes a settings file with one account for each identifier.
  void addSettings(int version, const std::vector<std::string>& identifiers = {}) {
    device.addPropertyList(
        kSettingsPath, PropertyDictionary{{"Version", version},
                                          {"Accounts", accountsNamed("Identifier", identifiers)}});
  }
  void addLegacyMail(const std::vector<std::string>& identifiers = {}) {
    device.addPropertyList(
        kLegacyMailPath,
        PropertyDictionary{{"MailAccounts", accountsNamed("uniqueId", identifiers)}});
  }
  void addLegacyExchange(const std::vector<std::string>& identifiers = {}) {
    device.addPropertyList(
        kLegacyExchangePath,
        PropertyDictionary{
            {"DAAccountsKey", accountsNamed("DAAccountConfigurationAccountID", identifiers)}});
  }
  void remove(std::string_view path) { device.fileSystem.files.erase(std::string(path)); }

  /// Keeps the inputs; a failure of the test when that fails.
  void keep() {
    const Result result = net.keepInputs(kTime);
    ASSERT_TRUE(result) << result.error();
  }
  [[nodiscard]] bool exists(std::string_view path) const {
    return device.fileSystem.files.contains(path);
  }
  [[nodiscard]] bool isKept() const { return device.fileSystem.directories.contains(folder); }
  [[nodiscard]] std::string contentsOf(std::string_view path) const {
    return device.fileSystem.contentsOf(path).value_or("(missing)");
  }
  /// Everything in the directory of kept files, folders without files included.
  [[nodiscard]] std::vector<std::string> entriesOfTheHost() const {
    std::vector<std::string> entries;
    for (const auto& [path, permissions] : device.fileSystem.directories) {
      if (path.starts_with(folderPath(""))) {
        entries.push_back(path);
      }
    }
    return entries;
  }

  FakePlatform device;
  SafetyNet net{device.fileSystem, device.propertyLists, accountFilesInHome("/var/mobile"),
                "migration-host restore --root /mnt/image"};

 private:
  static PropertyArray accountsNamed(std::string_view key,
                                     const std::vector<std::string>& identifiers) {
    std::vector<PropertyValue> accounts;
    for (const std::string& identifier : identifiers) {
      accounts.emplace_back(PropertyDictionary{{std::string(key), identifier}});
    }
    return PropertyArray(std::move(accounts));
  }
};

}  // namespace accounts
