#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <string_view>
#include <vector>

#include "propertylist/binary/BinaryPropertyListSerializer.h"
#include "safetynet/MigrationInMemory.h"
#include "tests/fakes/FakeSnapshot.h"
#include "tests/fakes/StoreContents.h"

namespace accounts {

inline PropertyArray accountsNamed(std::string_view key,
                                   const std::vector<std::string>& identifiers) {
  std::vector<PropertyValue> accounts;
  for (const std::string& identifier : identifiers) {
    accounts.emplace_back(PropertyDictionary{{std::string(key), identifier}});
  }
  return PropertyArray(std::move(accounts));
}

/// A settings file with one account for each identifier, and legacy stores with the same.
inline PropertyDictionary settingsWith(int version,
                                       const std::vector<std::string>& identifiers = {}) {
  return accountSettings(version, accountsNamed(kAccountIdentifier, identifiers));
}
inline PropertyDictionary mailStoreWith(const std::vector<std::string>& identifiers) {
  return mailStore(accountsNamed(kLegacyMailIdentifier, identifiers));
}
inline PropertyDictionary exchangeStoreWith(const std::vector<std::string>& identifiers) {
  return exchangeStore(accountsNamed(kLegacyExchangeIdentifier, identifiers));
}

/// A migration in memory over a snapshot that a test makes, and what a plug-in does in it.
class MigrationTest : public testing::Test {
 protected:
  MigrationInMemory& begin() {
    migration_.emplace(snapshot, "/var/mobile");
    return *migration_;
  }
  Transaction& transaction() { return migration_->transaction(); }

  void save(const PropertyDictionary& settings) {
    transaction().put(DevicePlace::Settings,
                      Transaction::List{BinaryPropertyListSerializer().serialize(settings).value(),
                                        std::nullopt});
    transaction().noteSave(LastSave::Written);
  }
  void remove(DevicePlace place) { transaction().put(place, Transaction::Removed{}); }
  /// The proposal; the memory file's bytes go to `memoryFile`.
  Proposal proposal(KeepFiles keep = KeepFiles::WhenNeeded) {
    memoryFile.clear();
    return migration_
        ->proposal(keep,
                   [this](std::string_view bytes) {
                     memoryFile.append(bytes);
                     return true;
                   })
        .value();
  }
  /// What a change of a proposal puts in place.
  [[nodiscard]] std::string contentsOf(const ProposedChange* change) const {
    return change != nullptr ? memoryFile.substr(change->offset, change->length) : "(no change)";
  }

  FakeSnapshot snapshot;
  std::string memoryFile;

 private:
  std::optional<MigrationInMemory> migration_;
};

}  // namespace accounts
