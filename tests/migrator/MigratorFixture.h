#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <initializer_list>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "accountsettings/AccountsManager.h"
#include "migrator/AccountsDataMigrator.h"
#include "propertylist/value/Description.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/StoreContents.h"

namespace accounts {

inline void PrintTo(const PropertyValue& value, std::ostream* output) {
  *output << describe(value);
}
inline void PrintTo(const PropertyDictionary& dictionary, std::ostream* output) {
  PrintTo(PropertyValue(dictionary), output);
}

/// Where a migration leaves a copy of the settings file as it found it.
inline const std::string copyAside =
    "/var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist";

using Migrator = AccountsDataMigrator;

/// A migrator whose upgrade fails, as no step of today does: its chain has no step for any version.
class FailingUpgrade : public AccountsDataMigrator {
 public:
  FailingUpgrade() : AccountsDataMigrator(std::span<const UpgradeStep>()) {}
};

using Lines = std::vector<std::string>;
using TextList = std::vector<std::string>;

/// The texts of a list; none for none.
inline std::optional<TextList> texts(const std::optional<PropertyArray>& list) {
  if (!list) {
    return std::nullopt;
  }
  TextList result;
  for (const PropertyValue& value : *list) {
    result.push_back(value.asText() != nullptr ? value.asText()->string() : "(no text)");
  }
  return result;
}

/// Dataclasses by their constants, as a list of texts.
inline std::optional<TextList> dataclasses(std::initializer_list<std::string_view> names) {
  return TextList(names.begin(), names.end());
}

/// A calendar account as a cloud account has it for a child.
inline AccountDictionary calendarChild() {
  return anAccount("K", kCalDAVAccountType, "MobileCalDAVAccount");
}

/// A device, a migrator and a store that a test fills. Notifications are on, as in any process that
/// starts.
class MigratorTest : public testing::Test {
 protected:
  MigratorTest() { device.consoleLog.alsoStandardError = false; }

  /// Puts accounts into the store, in order; no file is involved.
  void openStoreWith(PropertyArray accounts) {
    store = AccountsManager::initWithAccounsInfoArray(std::move(accounts));
  }
  /// Writes an account settings file.
  void addSettingsFile(PropertyValue version, PropertyArray accounts) {
    device.addPropertyList(kSettingsPath, accountSettings(std::move(version), std::move(accounts)));
  }
  void setMigrationInformationPreference(PropertyValue value) {
    device.preferenceDomain.values.insert_or_assign(
        {"com.quarx.accountsettings-logging", "ASSaveMigrationInformation"}, std::move(value));
  }
  void switchMigrationInformationOn() { setMigrationInformationPreference(true); }

  /// The account at a position of the store.
  BasicAccount& account(std::size_t position) { return *store->allBasicAccounts().at(position); }
  /// The identifiers of the store's accounts, in order.
  TextList identifiers() const {
    TextList result;
    for (const BasicAccountReference& each : store->allBasicAccounts()) {
      result.push_back(each->identifier().value_or(Text("(none)")).string());
    }
    return result;
  }
  /// The enabled dataclasses as they are stored, whatever the type supports.
  std::optional<TextList> storedEnabled(std::size_t position) {
    return texts(account(position).properties().arrayForKey(kAccountEnabledDataclasses));
  }
  /// The children's dictionaries of the account at a position.
  PropertyArray children(std::size_t position) {
    return account(position)
        .properties()
        .arrayForKey(kAccountChildAccounts)
        .value_or(PropertyArray());
  }

  [[nodiscard]] const Lines& console() const { return device.consoleLog.lines; }
  /// How often the account settings file was written.
  [[nodiscard]] std::ptrdiff_t saves() const {
    return std::ranges::count_if(device.journal, [](const std::string& line) {
      return line.starts_with("rename ") && line.ends_with(kSettingsPath);
    });
  }
  [[nodiscard]] std::optional<PropertyDictionary> settingsFile() const {
    return device.dictionaryAt(kSettingsPath);
  }
  [[nodiscard]] bool exists(std::string_view path) const {
    return device.fileSystem.files.contains(path);
  }

  FakeProcess device;
  AccountsDataMigrator migrator;
  std::unique_ptr<AccountsManager> store =
      AccountsManager::initWithAccounsInfoArray(PropertyArray());
};

/// The same for a step of the upgrade chain, which a migration runs with notifications switched
/// off.
class StepTest : public MigratorTest {
 protected:
  StepTest() { AccountsManager::_setShouldSkipNotifications(true); }
};

}  // namespace accounts
