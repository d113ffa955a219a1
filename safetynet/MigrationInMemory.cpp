#include "safetynet/MigrationInMemory.h"

#include <algorithm>
#include <array>
#include <utility>

#include "safetynet/LedgerMaking.h"
#include "safetynet/MigrationCheck.h"
#include "safetynet/PlaceErrors.h"

namespace accounts {
namespace {

constexpr std::array kInputs = {DevicePlace::LegacyMail, DevicePlace::LegacyExchange,
                                DevicePlace::Settings};

/// So many accounts of all that a migration brought are named in a commit record.
constexpr std::size_t kMostProvingAccounts = 16;

}  // namespace

MigrationInMemory::MigrationInMemory(const DeviceSnapshot& snapshot, std::string_view home)
    : transaction_(snapshot, home),
      carriedOver_(finishInterruptedCommit(transaction_)),
      recordBefore_(transaction_.bytesBefore(DevicePlace::CommitRecord).value_or("")) {
  for (const DevicePlace place : kInputs) {
    if (transaction_.exists(place)) {
      inputs_.push_back(place);
    }
  }
}

void MigrationInMemory::verify(PluginResult result, const DeviceFacts& facts) {
  if (result == PluginResult::GaveFalse) {
    error_ = ProgramError{ExitStatus::MigrationFailed, "The plug-in reported that it failed"};
  } else if (result == PluginResult::GaveTrue) {
    if (const auto reason = whyNotMigrated(transaction_)) {
      error_ = ProgramError{ExitStatus::NotVerified,
                            "The plug-in reported success but " + *reason + "; nothing is changed"};
    }
  }
  if (!error_) {
    // Where the plug-in was not asked the files that it would have found are left as they are.
    ledger_ = makeLedger(transaction_,
                         result == PluginResult::NotAsked ? std::vector<DevicePlace>() : inputs_,
                         carriedOver_, told_, facts);
  }
  // Last, since the check may be the first to read a file.
  if (transaction_.readFailure()) {
    error_ = readingError(*transaction_.readFailure());
    ledger_ = {};
  }
  if (error_) {
    return;
  }
  const PlaceState& sentinel = transaction_.snapshot().at(DevicePlace::RemovalSentinel);
  if (sentinel.whyNotRemoved && transaction_.exists(DevicePlace::RemovalSentinel)) {
    warnings_.push_back(
        sentinel.path +
        " stays; while it does, legacy stores are removed without being converted: " +
        sentinel.whyNotRemoved->text);
  }
  record_ = result == PluginResult::NotAsked ? carriedOver_ : recordOfThisRun();
  for (const CommitRecord::Store& each : record_.stores) {
    const PlaceState& state = transaction_.snapshot().at(each.place);
    if (state.identity.exists() && (transaction_.exists(each.place) || state.whyNotRemoved)) {
      recordStays_ = true;
      warnings_.push_back(state.path +
                          " stays, although it is carried over; a later run removes it" +
                          (state.whyNotRemoved ? ": " + state.whyNotRemoved->text : ""));
    }
  }
}

CommitRecord MigrationInMemory::recordOfThisRun() {
  CommitRecord record = carriedOver_;
  for (const DevicePlace place : inputs_) {
    const PlaceState& state = transaction_.snapshot().at(place);
    // What is no file holds no accounts that could be converted twice.
    if (place != DevicePlace::Settings && state.contents != nullptr) {
      record.stores.push_back({place, CommitRecord::traceOf(state.identity), std::nullopt});
    }
  }
  // Without a save this was the end of an interrupted removal: what the stores held was in the
  // settings file before.
  const bool hasNewStores = record.stores.size() > carriedOver_.stores.size();
  if (hasNewStores && transaction_.lastSave() == LastSave::Written) {
    const CommitRecord::Proof proof = {
        .accounts = accountsBrought(transaction_.dictionaryBefore(DevicePlace::Settings),
                                    transaction_.dictionaryAt(DevicePlace::Settings),
                                    kMostProvingAccounts)};
    for (std::size_t index = carriedOver_.stores.size(); index < record.stores.size(); ++index) {
      record.stores[index].proof = proof;
    }
  }
  return record;
}

std::string MigrationInMemory::recordText(std::uint64_t settingsSize) const {
  CommitRecord record = record_;
  for (std::size_t index = carriedOver_.stores.size(); index < record.stores.size(); ++index) {
    if (auto& proof = record.stores[index].proof) {
      proof->settingsSize = settingsSize;
    }
  }
  return record.text();
}

std::optional<Proposal> MigrationInMemory::proposal(KeepFiles keep, const TakeBytes& take) const {
  Proposal proposal;
  if (error_) {
    proposal.status = error_->exitStatus;
    return proposal;
  }
  if (!ledger_.isClean()) {
    proposal.status = ExitStatus::NotAllCarriedOver;
  }
  proposal.keepsFiles = !ledger_.isClean() || keep == KeepFiles::Always;
  proposal.recordStays = recordStays_;
  std::uint64_t position = 0;
  const auto takeCounted = [&](std::string_view bytes) {
    position += bytes.size();
    return take(bytes);
  };
  for (const PlaceChange& each : transaction_.changes()) {
    const bool isRemoved = std::holds_alternative<PlaceChange::Removed>(each.contents);
    const bool isToldOf = each.place == DevicePlace::LegacyExchange ||
                          each.place == DevicePlace::LegacyMail ||
                          each.place == DevicePlace::RemovalSentinel;
    if (isRemoved && isToldOf && transaction_.snapshot().at(each.place).whyNotRemoved) {
      // Foreseen to stay, and there is a warning of it.
      continue;
    }
    ProposedChange change = {.place = each.place, .offset = position, .owner = each.owner};
    if (const auto* list = std::get_if<SerializedPropertyList>(&each.contents)) {
      change.action = ProposedChange::Action::Write;
      if (!list->giveTo(takeCounted)) {
        return std::nullopt;
      }
    } else if (isRemoved) {
      change.action = ProposedChange::Action::Remove;
    } else if (std::holds_alternative<PlaceChange::EmptyDirectory>(each.contents)) {
      change.action = ProposedChange::Action::MakeDirectory;
    } else {
      change.action = ProposedChange::Action::CopySettings;
    }
    change.length = position - change.offset;
    if (each.place == DevicePlace::InformationDirectory) {
      proposal.informationFileName = each.fileName;
    }
    proposal.changes.push_back(change);
  }
  const ProposedChange* const settings = proposal.changeOf(DevicePlace::Settings);
  const std::string text = recordText(
      settings != nullptr ? settings->length
                          : transaction_.snapshot().at(DevicePlace::Settings).identity.size);
  // One that says the same already stays until the end.
  if (!record_.stores.empty() && text != recordBefore_) {
    std::erase_if(proposal.changes, [](const ProposedChange& each) {
      return each.place == DevicePlace::CommitRecord;
    });
    proposal.changes.push_back({.place = DevicePlace::CommitRecord,
                                .action = ProposedChange::Action::Write,
                                .offset = position,
                                .length = text.size()});
    if (!takeCounted(text)) {
      return std::nullopt;
    }
  }
  return proposal;
}

}  // namespace accounts
