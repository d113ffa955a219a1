#include "safetynet/Restoration.h"

#include <array>
#include <memory>
#include <utility>

#include "safetynet/PlaceErrors.h"

namespace accounts {
namespace {

/// The order in which places are put back: the settings file last, for as long as a legacy store is
/// there, the next migration converts it.
constexpr std::array kOrder = {DevicePlace::CopyAside,
                               DevicePlace::AutoFetchEnabled,
                               DevicePlace::LegacyMailOriginal,
                               DevicePlace::LegacyExchangeOriginal,
                               DevicePlace::LegacyMail,
                               DevicePlace::LegacyExchange,
                               DevicePlace::Settings};

ProgramError missing(std::string message) {
  return ProgramError{ExitStatus::MissingInput, std::move(message)};
}

/// A place that is not as it was.
struct Difference {
  DevicePlace place = DevicePlace::Settings;
  EntryKind before = EntryKind::Nothing;
  FileIdentity now;
};

class Restorer {
 public:
  Restorer(DevicePlaces& places, KeptFolders& folders, std::string_view home,
           Restoration& restoration)
      : places_(places), folders_(folders), home_(home), restoration_(restoration) {}

  OrProgramError<void> run(std::string_view time) {
    const auto list = folders_.listOf(*restoration_.folder);
    if (!list) {
      return readingError(list.error());
    }
    if (!*list || (*list)->places.empty()) {
      return missing("No kept files in " + *restoration_.folder);
    }
    folders_.removeUnfinished();
    static_cast<void>(places_.settleLeftovers());
    OrProgramError<void> done = findDifferences((*list)->places);
    if (done) {
      done = keepReplaced(time);
    }
    for (const DevicePlace place : {DevicePlace::CommitRecord, DevicePlace::RemovalSentinel}) {
      if (done) {
        done = end(place);
      }
    }
    for (const Difference& each : differences_) {
      if (done) {
        done = putBack(each);
      }
    }
    return done;
  }

 private:
  [[nodiscard]] std::string pathOf(DevicePlace place) const { return pathOfPlace(place, home_); }

  OrProgramError<void> findDifferences(const KeptPlaces& list) {
    for (const DevicePlace place : kOrder) {
      const auto listed = list.find(place);
      // Of a directory nothing is kept, and nothing was done to it.
      if (listed == list.end() || listed->second == EntryKind::Directory) {
        continue;
      }
      const auto now = places_.identityAt(place);
      if (!now) {
        return writingError(kOperation, now.error());
      }
      if (now->kind == EntryKind::Directory) {
        return ProgramError{ExitStatus::CannotCreate,
                            pathOf(place) + " is a directory, so it is not replaced"};
      }
      if (listed->second != EntryKind::Nothing || now->exists()) {
        differences_.push_back({place, listed->second, *now});
      }
    }
    return {};
  }

  OrProgramError<void> keepReplaced(std::string_view time) {
    std::vector<PlaceToKeep> replaced;
    bool isAny = false;
    for (const Difference& each : differences_) {
      replaced.push_back({each.place, each.now});
      isAny = isAny || each.now.exists();
    }
    if (!isAny) {
      return {};
    }
    std::string folder;
    const PlaceOutcome kept = folders_.keep(replaced, KeptFor::Restoration, time, folder);
    if (!kept.isDone()) {
      return writingError("What would be replaced cannot be kept", failureOf(kept));
    }
    restoration_.replaced = std::move(folder);
    return {};
  }

  OrProgramError<void> end(DevicePlace place) {
    const auto now = places_.identityAt(place);
    PlaceOutcome outcome;
    if (!now) {
      outcome = PlaceOutcome::failed(now.error());
    } else if (now->exists()) {
      outcome = places_.remove(place, *now);
      if (outcome.isDone()) {
        flush(place, outcome);
      }
    }
    return outcome.isDone() ? OrProgramError<void>() : wholeStill(outcome);
  }

  OrProgramError<void> putBack(const Difference& difference) {
    PlaceOutcome outcome;
    if (difference.before == EntryKind::Nothing) {
      outcome = places_.remove(difference.place, difference.now);
    } else {
      auto staged = places_.stageKept(difference.place,
                                      KeptFolders::pathIn(*restoration_.folder, difference.place));
      outcome = staged ? places_.put(difference.place, **staged, difference.now)
                       : PlaceOutcome::failed(staged.error());
    }
    if (outcome.isDone()) {
      flush(difference.place, outcome);
    }
    if (!outcome.isDone()) {
      return wholeStill(outcome);
    }
    (difference.before == EntryKind::Nothing ? restoration_.removed : restoration_.restored)
        .push_back(pathOf(difference.place));
    return {};
  }

  void flush(DevicePlace place, PlaceOutcome& outcome) {
    if (const Result flushed = places_.flush(place); !flushed) {
      outcome = PlaceOutcome::failed(flushed.error());
    }
  }

  static Failure failureOf(const PlaceOutcome& outcome) {
    constexpr int kNoNumber = 0;
    return outcome.kind == PlaceOutcome::Kind::Disturbed
               ? Failure{kNoNumber, "Another program wrote meanwhile"}
               : outcome.failure;
  }

  [[nodiscard]] ProgramError wholeStill(const PlaceOutcome& outcome) const {
    return {ExitStatus::InputOutputError, "Not everything could be put back, " +
                                              *restoration_.folder +
                                              " is still whole: " + failureOf(outcome).text};
  }

  static constexpr const char* kOperation = "The kept files cannot be put back";

  DevicePlaces& places_;
  KeptFolders& folders_;
  std::string_view home_;
  Restoration& restoration_;
  std::vector<Difference> differences_;
};

}  // namespace

OrProgramError<std::string> chosenFolder(const KeptFolders& folders,
                                         const std::optional<std::string>& asked) {
  if (asked) {
    const std::string name = asked->substr(asked->rfind('/') + 1);
    const bool isElsewhere = *asked != name && *asked != KeptFolders::pathOf(name);
    const auto isKept = isElsewhere ? false : folders.contains(name);
    if (!isKept) {
      return readingError(isKept.error());
    }
    if (!*isKept) {
      return missing("No folder of kept files: " + *asked);
    }
    return KeptFolders::pathOf(name);
  }
  const auto kept = folders.keptFor(KeptFor::Migration);
  if (!kept) {
    return readingError(kept.error());
  }
  if (kept->empty()) {
    return missing("No files are kept in " + std::string(kAccountMigrationDirectory));
  }
  if (kept->size() > 1) {
    std::string message = "Several folders hold kept files, --from must name one:";
    for (const std::string& folder : *kept) {
      message.append(" ").append(folder.substr(folder.rfind('/') + 1));
    }
    return ProgramError{ExitStatus::UnusableArguments, std::move(message)};
  }
  return kept->front();
}

Restoration restoreKeptFiles(DevicePlaces& places, KeptFolders& folders, std::string_view home,
                             const std::optional<std::string>& folder, std::string_view time) {
  Restoration restoration;
  auto chosen = chosenFolder(folders, folder);
  if (!chosen) {
    restoration.error = chosen.error();
    return restoration;
  }
  restoration.folder = *std::move(chosen);
  if (auto done = Restorer(places, folders, home, restoration).run(time); !done) {
    restoration.error = std::move(done).error();
    return restoration;
  }
  if (const Result discarded = folders.discard(*restoration.folder); !discarded) {
    restoration.error = ProgramError{
        ExitStatus::InputOutputError,
        "Everything is put back, but the folder cannot be removed: " + discarded.error().text};
  }
  return restoration;
}

}  // namespace accounts
