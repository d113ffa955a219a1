#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/DeviceSnapshot.h"
#include "transaction/Transaction.h"

namespace accounts {

/// A legacy store and the copy of it that goes with it.
struct LegacyStore {
  DevicePlace store;
  DevicePlace original;
};

/// All of them, in the order in which they are removed.
inline constexpr std::array kLegacyStores = {
    LegacyStore{DevicePlace::LegacyExchange, DevicePlace::LegacyExchangeOriginal},
    LegacyStore{DevicePlace::LegacyMail, DevicePlace::LegacyMailOriginal}};

/// What a commit leaves while it removes legacy stores: which stores it carried over, and what
/// shows that a settings file has their accounts. The next run knows by it that a store that is
/// still there, or that came back, was converted already; and, since another program may write the
/// settings file at any time, that one that was to be converted was not.
struct CommitRecord {
  /// As much of a file as another program that only copies it keeps.
  struct Trace {
    bool exists = false;
    std::uint64_t size = 0;
    FileTime modified;
    bool operator==(const Trace&) const = default;
  };
  /// What shows that a settings file comes from the one that the commit put in place.
  struct Proof {
    /// The size of the latter, which counts where there are no such accounts.
    std::uint64_t settingsSize = 0;
    /// The identifiers of some accounts that only the migration brought: any of them will do.
    std::vector<std::string> accounts = {};
    bool operator==(const Proof&) const = default;
  };
  struct Store {
    DevicePlace place = DevicePlace::LegacyMail;
    Trace store;
    /// None when the settings file had the store's accounts before, so that any one counts.
    std::optional<Proof> proof;
    bool operator==(const Store&) const = default;
  };
  std::vector<Store> stores;

  [[nodiscard]] std::string text() const;
  /// What a text says; a record without stores when it is none of text().
  static CommitRecord parse(std::string_view text);
  static Trace traceOf(const FileIdentity& identity);
};

/// Begins a migration in memory with the record of an interrupted one, if there is one: the stores
/// that it vouches for count as removed with their copies, and the removal sentinel and the record
/// go. Returns the part of it that is still needed, the stores that are there, or are gone for now,
/// and must not be converted again.
CommitRecord finishInterruptedCommit(Transaction& transaction);

}  // namespace accounts
