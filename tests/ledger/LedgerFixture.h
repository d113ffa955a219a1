#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "migrator/AccountsDataMigrator.h"
#include "propertylist/binary/BinaryPropertyListSerializer.h"
#include "safetynet/MigrationInMemory.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/FakeSnapshot.h"
#include "tests/fakes/StoreContents.h"
#include "transaction/TransactionPlatform.h"
#include "vocabulary/AccountClasses.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {

/// A rule that lets everybody be given a file.
class AnyOwner final : public OwnershipRule {
 public:
  OrFailure<FileOwner> ownerNamed(std::string_view, std::string_view) override {
    return FileOwner{501, 501};
  }
};

/// An observer between the plug-in and the ledger, which passes on what it likes.
class Liar : public MigrationObserver {
 public:
  MigrationObserver* listener = nullptr;

  [[nodiscard]] bool wantsAccounts() const override { return false; }
  void stageBegan(std::string_view operation, std::string_view purpose) override {
    listener->stageBegan(operation, purpose);
  }
  void stageEnded(bool succeeded, const std::optional<AccountsInMemory>& accounts) override {
    listener->stageEnded(succeeded, accounts);
  }
  void accountFared(const AccountEvent& event) override { listener->accountFared(event); }
  void accountsSaved(const std::vector<AccountOrigin>& accounts) override {
    listener->accountsSaved(accounts);
  }
};

/// An account with a value that it can lose.
inline AccountDictionary accountWithHost(std::string_view identifier, std::string_view type,
                                         std::string_view accountClass) {
  return anAccount(identifier, type, accountClass)
      .with("Hostname", std::string(identifier) + ".example");
}
/// A legacy description whose values are its own.
inline AccountDictionary mailDescription(std::string_view identifier,
                                         std::string_view accountClass) {
  return aMailDescription(identifier, accountClass)
      .with(kLegacyMailDisplayName, "Name of " + std::string(identifier))
      .with("Password", "of " + std::string(identifier));
}
inline AccountDictionary exchangeDescription(std::string_view identifier) {
  return anExchangeDescription(identifier).with("Password", "of " + std::string(identifier));
}

/// The files of a device before a migration.
struct DeviceFiles {
  std::optional<PropertyDictionary> settings = {};
  std::optional<PropertyDictionary> mail = {};
  std::optional<PropertyDictionary> exchange = {};
  bool hasSentinel = false;
};

/// The plug-in on a device in memory, with the ledger of what it did.
class MigratedInMemory {
 public:
  /// `tamper` changes the settings file that the plug-in made.
  explicit MigratedInMemory(const DeviceFiles& files, Liar* liar = nullptr,
                            const std::function<void(PropertyArray&)>& tamper = nullptr) {
    device.consoleLog.alsoStandardError = false;
    add(DevicePlace::Settings, files.settings);
    add(DevicePlace::LegacyMail, files.mail);
    add(DevicePlace::LegacyExchange, files.exchange);
    if (files.hasSentinel) {
      snapshot.addFile(DevicePlace::RemovalSentinel, std::string(kRemovalSentinelContents));
    }
    migrate(liar, tamper);
  }

  [[nodiscard]] const AccountLedger& ledger() const { return migration_->ledger(); }
  [[nodiscard]] const MigrationInMemory& migration() const { return *migration_; }
  [[nodiscard]] std::vector<std::string> losses() const { return ledger().losses(); }
  /// The fate of each account, as "Accounts[0] kept".
  [[nodiscard]] std::vector<std::string> fates() const {
    std::vector<std::string> lines;
    for (const LedgerEntry& each : ledger().entries) {
      lines.push_back(AccountLedger::placeOf(each) + " " + std::string(identifierOf(each.fate)));
    }
    return lines;
  }
  /// The accounts that were not carried over.
  [[nodiscard]] std::vector<std::string> lost() const {
    std::vector<std::string> places;
    for (const LedgerEntry& each : ledger().entries) {
      if (each.fate == AccountFate::NotCarriedOver) {
        places.push_back(AccountLedger::placeOf(each));
      }
    }
    return places;
  }

  FakePlatform device;
  FakeSnapshot snapshot;

 private:
  void add(DevicePlace place, const std::optional<PropertyDictionary>& contents) {
    if (contents) {
      snapshot.addPropertyList(place, *contents);
    }
  }

  void tamperWith(const std::function<void(PropertyArray&)>& tamper) {
    Transaction& transaction = migration_->transaction();
    PropertyDictionary root = transaction.dictionaryAt(DevicePlace::Settings).value();
    PropertyArray accounts = root.arrayForKey(kPlistAccountsKey).value();
    tamper(accounts);
    root.set(kPlistAccountsKey, accounts);
    transaction.put(
        DevicePlace::Settings,
        Transaction::List{BinaryPropertyListSerializer().serialize(root).value(), std::nullopt});
  }

  void migrate(Liar* liar, const std::function<void(PropertyArray&)>& tamper) {
    migration_.emplace(snapshot, "/var/mobile");
    TransactionPlatform inMemory(
        migration_->transaction(), device.platform, owners_, MigrationLockState::Available,
        [](std::string_view path) { FAIL() << "a path that no migration has: " << path; });
    MigrationObserver* observer = &migration_->told();
    if (liar != nullptr) {
      liar->listener = observer;
      observer = liar;
    }
    Platform platform = inMemory.platform(device.preferenceDomain);
    platform.migrationObserver = observer;
    const Process process(platform);
    const bool result = AccountsDataMigrator().performMigration();
    if (tamper) {
      tamperWith(tamper);
    }
    migration_->verify(result ? PluginResult::GaveTrue : PluginResult::GaveFalse,
                       factsOf(platform));
    EXPECT_EQ(migration_->error(), std::nullopt)
        << (migration_->error() ? migration_->error()->message : "");
  }

  AnyOwner owners_;
  std::optional<MigrationInMemory> migration_;
};

}  // namespace accounts
