#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "platform/DeviceSnapshot.h"
#include "transaction/Transaction.h"

namespace accounts {

/// What a commit leaves while it removes legacy stores: which stores it carried over, and what the
/// settings file was before. The next run knows by it that a store that is still there, or that
/// came back, was converted already.
struct CommitRecord {
  /// As much of a file as another program that only copies it keeps.
  struct Trace {
    bool exists = false;
    std::uint64_t size = 0;
    FileTime modified;
    bool operator==(const Trace&) const = default;
  };
  struct Store {
    DevicePlace place = DevicePlace::LegacyMail;
    Trace store;
    /// The settings file that did not have the store's accounts yet.
    Trace settingsBefore;
    /// Whether the store was carried over by an earlier run, as a removal sentinel said: then the
    /// settings file tells nothing.
    bool isOfEarlierRun = false;
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
