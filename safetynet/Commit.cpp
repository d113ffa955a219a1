#include "safetynet/Commit.h"

#include <algorithm>
#include <array>
#include <utility>

#include "safetynet/CommitRecord.h"
#include "safetynet/PlaceErrors.h"

namespace accounts {
namespace {

using Action = ProposedChange::Action;

/// What is kept: all that a migration may change or remove, but for the sentinel, with which the
/// next migration would remove the legacy stores unconverted, and for what only grows.
constexpr std::array kKeptPlaces = {
    DevicePlace::Settings,        DevicePlace::LegacyExchange,
    DevicePlace::LegacyMail,      DevicePlace::LegacyExchangeOriginal,
    DevicePlace::CopyAside,       DevicePlace::LegacyMailOriginal,
    DevicePlace::AutoFetchEnabled};

/// Text as bytes to read.
class TextBytes final : public ReadableBytes {
 public:
  explicit TextBytes(std::string_view text) : text_(text) {}
  Result giveTo(const Taker& take) const override {
    static_cast<void>(take(text_));
    return {};
  }

 private:
  std::string_view text_;
};

CommitOutcome failed(ProgramError error) {
  return {.kind = CommitOutcome::Kind::Failed, .error = std::move(error)};
}

CommitOutcome disturbed() {
  return {.kind = CommitOutcome::Kind::Disturbed};
}

/// What a step that was not done means before anything is changed.
CommitOutcome refused(std::string_view operation, const PlaceOutcome& outcome) {
  return outcome.kind == PlaceOutcome::Kind::Disturbed
             ? disturbed()
             : failed(writingError(operation, outcome.failure));
}

std::string reasonOf(const PlaceOutcome& outcome) {
  return outcome.kind == PlaceOutcome::Kind::Disturbed ? "Another program wrote it meanwhile"
                                                       : outcome.failure.text;
}

}  // namespace

Commit::Commit(DevicePlaces& places, KeptFolders& folders, const DeviceSnapshot& snapshot,
               const Proposal& proposal, ContentsOf contentsOf, std::string time)
    : places_(places),
      folders_(folders),
      snapshot_(snapshot),
      proposal_(proposal),
      contentsOf_(std::move(contentsOf)),
      time_(std::move(time)) {}

CommitOutcome Commit::run() {
  if (auto refusal = replaceSettings()) {
    return *std::move(refusal);
  }
  removeStores();
  makeCopyAside();
  if (removes(DevicePlace::AutoFetchEnabled)) {
    removeOrWarn(DevicePlace::AutoFetchEnabled);
  }
  writeInformation();
  endRecord();
  return std::move(outcome_);
}

bool Commit::removes(DevicePlace place) const {
  const ProposedChange* const change = proposal_.changeOf(place);
  return change != nullptr && change->action == Action::Remove;
}

std::optional<CommitOutcome> Commit::replaceSettings() {
  const ProposedChange* const change = proposal_.changeOf(DevicePlace::Settings);
  std::unique_ptr<StagedFile> staged;
  if (change != nullptr) {
    const auto contents = contentsOf_(*change);
    auto made = places_.stage(change->place, {.contents = contents.get(), .owner = change->owner});
    if (!made) {
      return failed(writingError("The settings file cannot be written", made.error()));
    }
    staged = *std::move(made);
  }
  std::optional<CommitOutcome> refusal = keepFiles();
  if (!refusal) {
    refusal = writeRecord();
  }
  if (!refusal) {
    refusal = whyNotUndisturbed();
  }
  if (!refusal && staged != nullptr) {
    const PlaceOutcome put =
        places_.put(DevicePlace::Settings, *staged, identity(DevicePlace::Settings));
    if (!put.isDone()) {
      refusal = refused("The settings file cannot be replaced", put);
      // With the record the next attempt tells whether what stands there now comes from the new
      // file.
      recordMayEnd_ = !put.hasStood;
    } else {
      flushOrWarn(DevicePlace::Settings);
    }
  }
  if (refusal) {
    undo();
  }
  return refusal;
}

std::optional<CommitOutcome> Commit::whyNotUndisturbed() {
  for (const ListedPlace& each : kDevicePlaces) {
    if (each.place == DevicePlace::CommitRecord && record_.exists()) {
      continue;
    }
    const auto now = places_.identityAt(each.place);
    if (!now) {
      const PlaceState& state = snapshot_.at(each.place);
      if (!state.identity.exists() && state.whyNotReplaced) {
        // Nothing could be told of it before either, and nothing is done there.
        continue;
      }
      return failed(readingError(now.error()));
    }
    // A directory's own times tell of other files; and a second name moves the time of a change.
    const FileIdentity& standing = *now;
    const FileIdentity& before = identity(each.place);
    const bool isSame = before.kind == EntryKind::Directory ? standing.kind == before.kind
                        : outcome_.keptFolder               ? standing.isSameFileAs(before)
                                                            : standing == before;
    if (!isSame) {
      return disturbed();
    }
  }
  return std::nullopt;
}

std::optional<CommitOutcome> Commit::keepFiles() {
  if (!proposal_.keepsFiles) {
    return std::nullopt;
  }
  std::vector<PlaceToKeep> kept;
  for (const DevicePlace place : kKeptPlaces) {
    kept.push_back({place, identity(place)});
  }
  std::string folder;
  const PlaceOutcome outcome =
      folders_.keep(kept,
                    proposal_.status == ExitStatus::NotAllCarriedOver ? KeptFor::MigrationWithLosses
                                                                      : KeptFor::Migration,
                    time_, folder);
  if (!outcome.isDone()) {
    return refused("The files cannot be kept", outcome);
  }
  outcome_.keptFolder = std::move(folder);
  return std::nullopt;
}

std::optional<CommitOutcome> Commit::writeRecord() {
  const ProposedChange* const change = proposal_.changeOf(DevicePlace::CommitRecord);
  const bool isWritten = change != nullptr && change->action == Action::Write;
  if (!isWritten && !identity(DevicePlace::CommitRecord).exists()) {
    return std::nullopt;
  }
  constexpr std::string_view kOperation = "The commit record cannot be written";
  if (const Result made = folders_.makeDirectory(); !made) {
    return failed(writingError(kOperation, made.error()));
  }
  if (isWritten) {
    const auto contents = contentsOf_(*change);
    const PlaceOutcome written =
        write(change->place, {.contents = contents.get(), .owner = change->owner}, record_);
    if (!written.isDone()) {
      return refused(kOperation, written);
    }
  }
  // That of an earlier run may not be on the medium either, if it was killed.
  const Result flushed = places_.flush(DevicePlace::CommitRecord);
  return flushed ? std::nullopt : std::optional(failed(writingError(kOperation, flushed.error())));
}

PlaceOutcome Commit::write(DevicePlace place, const NewFile& file, FileIdentity& written) {
  auto made = places_.stage(place, file);
  if (!made) {
    return PlaceOutcome::failed(made.error());
  }
  StagedFile& staged = **made;
  PlaceOutcome outcome = places_.put(place, staged, identity(place));
  if (outcome.isDone()) {
    written = staged.identity;
  }
  return outcome;
}

void Commit::undo() {
  if (recordMayEnd_ && record_.exists() && !identity(DevicePlace::CommitRecord).exists()) {
    // One that stays says nothing wrong: the settings file is the one before.
    static_cast<void>(places_.remove(DevicePlace::CommitRecord, record_));
  }
  if (outcome_.keptFolder) {
    static_cast<void>(folders_.discard(*outcome_.keptFolder));
  }
  folders_.removeDirectoryIfMade();
}

void Commit::removeStores() {
  const bool isAny = std::ranges::any_of(
      kLegacyStores, [this](const LegacyStore& each) { return removes(each.store); });
  const FileIdentity& before = identity(DevicePlace::RemovalSentinel);
  FileIdentity sentinel = before;
  if (isAny && !before.exists()) {
    const TextBytes contents(kRemovalSentinelContents);
    const PlaceOutcome made =
        write(DevicePlace::RemovalSentinel, {.contents = &contents}, sentinel);
    if (!made.isDone()) {
      // The removal goes on: the record protects it as well.
      keepRecord("The removal sentinel was not made: " + reasonOf(made));
    }
    flushOrWarn(DevicePlace::RemovalSentinel);
  }
  // What an interrupted run removed may not be on the medium yet.
  const bool followsAnotherRun = before.exists() || identity(DevicePlace::CommitRecord).exists();
  bool storesAreGone = true;
  for (const auto& [store, original] : kLegacyStores) {
    if (storesAreGone && removes(store)) {
      // Like the migration's own removal, this ends at the first store that stays.
      storesAreGone = removeOrWarn(store);
      recordMayEnd_ = recordMayEnd_ && storesAreGone;
    }
    if (removes(original)) {
      recordMayEnd_ = removeOrWarn(original) && recordMayEnd_;
    }
    if (removes(store) || removes(original) || followsAnotherRun) {
      recordMayEnd_ = flushOrWarn(store) && recordMayEnd_;
    }
  }
  const bool endsSentinel = removes(DevicePlace::RemovalSentinel) || (isAny && !before.exists());
  if (endsSentinel && sentinel.exists()) {
    const PlaceOutcome removed = places_.remove(DevicePlace::RemovalSentinel, sentinel);
    if (!removed.isDone()) {
      keepRecord("The removal sentinel stays: " + reasonOf(removed));
    }
    recordMayEnd_ = flushOrWarn(DevicePlace::RemovalSentinel) && recordMayEnd_;
  }
}

void Commit::keepRecord(std::string sentence) {
  warn(std::move(sentence));
  recordMayEnd_ = false;
}

bool Commit::removeOrWarn(DevicePlace place) {
  const PlaceOutcome removed = places_.remove(place, identity(place));
  if (!removed.isDone()) {
    warn(snapshot_.at(place).path + " stays: " + reasonOf(removed));
  }
  return removed.isDone();
}

void Commit::makeCopyAside() {
  const ProposedChange* const change = proposal_.changeOf(DevicePlace::CopyAside);
  const PlaceState& settings = snapshot_.at(DevicePlace::Settings);
  if (change == nullptr) {
    return;
  }
  if (change->action == Action::Remove) {
    removeOrWarn(DevicePlace::CopyAside);
    return;
  }
  if (settings.contents == nullptr) {
    return;
  }
  FileIdentity copy;
  const PlaceOutcome outcome =
      write(DevicePlace::CopyAside,
            {.contents = settings.contents.get(), .permissions = settings.permissions}, copy);
  if (!outcome.isDone()) {
    warn("The settings file was not copied aside: " + reasonOf(outcome));
  }
}

void Commit::writeInformation() {
  const ProposedChange* const change = proposal_.changeOf(DevicePlace::InformationDirectory);
  if (change == nullptr) {
    return;
  }
  if (change->action == Action::MakeDirectory) {
    if (const Result made = places_.makeInformationDirectory(); !made) {
      warn("The migration-information directory was not made: " + made.error().text);
    }
    return;
  }
  const std::unique_ptr<ReadableBytes> contents = contentsOf_(*change);
  const Result written = places_.writeInformationFile(proposal_.informationFileName, *contents);
  if (!written) {
    warn("The migration-information file was not written: " + written.error().text);
  }
}

void Commit::endRecord() {
  const FileIdentity record = record_.exists() ? record_ : identity(DevicePlace::CommitRecord);
  const bool isToGo = record_.exists() || removes(DevicePlace::CommitRecord);
  if (!record.exists() || !isToGo || !recordMayEnd_ || proposal_.recordStays) {
    return;
  }
  const PlaceOutcome removed = places_.remove(DevicePlace::CommitRecord, record);
  if (!removed.isDone()) {
    warn("The commit record stays: " + reasonOf(removed));
  }
  folders_.removeDirectoryIfMade();
}

bool Commit::flushOrWarn(DevicePlace place) {
  const Result flushed = places_.flush(place);
  if (!flushed) {
    warn("A change may not outlive a loss of power: " + flushed.error().text);
  }
  return flushed.has_value();
}

}  // namespace accounts
