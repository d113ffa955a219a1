#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "commandline/ExitStatus.h"
#include "safetynet/AccountLedger.h"
#include "safetynet/ChangedKeys.h"
#include "safetynet/CommitRecord.h"
#include "safetynet/Proposal.h"
#include "safetynet/ToldFates.h"
#include "transaction/Transaction.h"

namespace accounts {

/// Whether a clean run keeps the files, too.
enum class KeepFiles : std::uint8_t { WhenNeeded, Always };

/// What became of the plug-in.
enum class PluginResult : std::uint8_t {
  GaveTrue,
  GaveFalse,
  /// It was not asked: only an interrupted commit is finished.
  NotAsked
};

/// One migration in memory, from the snapshot to what is proposed of it. The plug-in runs between
/// its making and the verdict.
class MigrationInMemory {
 public:
  /// Begins it, with what an interrupted commit left to be finished. `snapshot` must outlive this.
  MigrationInMemory(const DeviceSnapshot& snapshot, std::string_view home);

  [[nodiscard]] Transaction& transaction() { return transaction_; }

  /// Is to observe the plug-in.
  [[nodiscard]] ToldFates& told() { return told_; }

  /// Verifies what the plug-in did; before proposal().
  void verify(PluginResult result, const DeviceFacts& facts);
  /// Why nothing of it may be committed; none when all may.
  [[nodiscard]] const std::optional<ProgramError>& error() const { return error_; }
  /// What became of every account; empty when nothing may be committed.
  [[nodiscard]] const AccountLedger& ledger() const { return ledger_; }
  /// What is foreseen to stay although it was to be removed, one sentence each.
  [[nodiscard]] const std::vector<std::string>& warnings() const { return warnings_; }

  /// Takes bytes for the memory file, one after the other; false when it cannot.
  using TakeBytes = std::function<bool(std::string_view)>;
  /// What is to be committed, with new contents passed to `take`. None when `take` gave false.
  [[nodiscard]] std::optional<Proposal> proposal(KeepFiles keep, const TakeBytes& take) const;

 private:
  /// The legacy stores that must not be converted by another run, as far as they were there.
  [[nodiscard]] CommitRecord recordOfThisRun();
  /// The record for a settings file of a size.
  [[nodiscard]] std::string recordText(std::uint64_t settingsSize) const;

  Transaction transaction_;
  ToldFates told_;
  /// The stores that an earlier run carried over.
  CommitRecord carriedOver_;
  /// The bytes of an earlier run's record.
  std::string recordBefore_;
  /// What the plug-in finds, the settings file last.
  std::vector<DevicePlace> inputs_;
  std::optional<ProgramError> error_;
  AccountLedger ledger_;
  std::vector<std::string> warnings_;
  CommitRecord record_;
  bool recordStays_ = false;
};

}  // namespace accounts
