#include "host/RestoreCommand.h"

#include <algorithm>
#include <utility>

#include "commandline/PlatformError.h"
#include "commandline/StandardStreams.h"
#include "host/CommandLine.h"
#include "host/CurrentTime.h"
#include "host/StopSignals.h"
#include "inspection/PropertyListJSON.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/LinuxDevicePlaces.h"
#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/LinuxHostLocks.h"
#include "platform/linux/LinuxPlatform.h"
#include "propertylist/value/Description.h"
#include "safetynet/MigrationRun.h"
#include "safetynet/PlaceErrors.h"

namespace accounts {
namespace {

struct ReasonText {
  KeptFor reason;
  const char* text;
};
constexpr ReasonText kReasonTexts[] = {
    {KeptFor::Migration, "kept before a migration, on request"},
    {KeptFor::MigrationWithLosses, "kept before a migration that did not carry over everything"},
    {KeptFor::Restoration, "kept when other files were put back"}};

struct KindText {
  EntryKind kind;
  const char* text;
};
constexpr KindText kKindTexts[] = {{EntryKind::Nothing, "nothing"},
                                   {EntryKind::RegularFile, "file"},
                                   {EntryKind::Directory, "directory"},
                                   {EntryKind::Other, "other"}};

const char* textOf(EntryKind kind) {
  return std::ranges::find(kKindTexts, kind, &KindText::kind)->text;
}

std::optional<std::string> textOf(const std::optional<KeptFor>& reason) {
  const auto* const found = std::ranges::find(kReasonTexts, reason, &ReasonText::reason);
  return found != std::end(kReasonTexts) ? std::optional<std::string>(found->text) : std::nullopt;
}

std::string nameOf(const std::string& folder) {
  return folder.substr(folder.rfind('/') + 1);
}

std::string homeOf(const RestoreOptions& options) {
  return options.home.value_or(LinuxPlatformOptions().homeDirectory);
}

RestoreResult failed(ProgramError error) {
  RestoreResult result;
  result.restoration.error = std::move(error);
  return result;
}

RestoreResult listFolders(const KeptFolders& folders, const RestoreOptions& options) {
  RestoreResult result;
  std::vector<std::string> paths;
  if (options.folder) {
    auto chosen = chosenFolder(folders, options.folder);
    if (!chosen) {
      return failed(chosen.error());
    }
    paths.push_back(*std::move(chosen));
  } else {
    for (const KeptFor purpose : {KeptFor::Migration, KeptFor::Restoration}) {
      auto kept = folders.keptFor(purpose);
      if (!kept) {
        return failed(readingError(kept.error()));
      }
      std::ranges::move(*kept, std::back_inserter(paths));
    }
  }
  for (std::string& path : paths) {
    auto list = folders.listOf(path);
    if (!list) {
      return failed(readingError(list.error()));
    }
    result.folders.push_back({std::move(path), std::move(*list).value_or(KeptList())});
  }
  return result;
}

RestoreResult discardFolder(KeptFolders& folders, const RestoreOptions& options) {
  auto chosen = chosenFolder(folders, options.folder);
  if (!chosen) {
    return failed(chosen.error());
  }
  RestoreResult result;
  std::string& folder = *chosen;
  if (const Result discarded = folders.discard(folder); !discarded) {
    return failed({programErrorOf(discarded.error(), ExitStatus::InputOutputError).exitStatus,
                   "The folder cannot be removed and is still whole: " + discarded.error().text});
  }
  result.discarded = std::move(folder);
  return result;
}

}  // namespace

RestoreResult runRestoration(const RestoreOptions& options) {
  const auto root = DeviceRoot::openRoot(options.root);
  if (!root) {
    return failed(programErrorOf(root.error(), ExitStatus::MissingInput));
  }
  // No temporary file is made; the directory is only named.
  const std::string home = homeOf(options);
  LinuxFileSystem files(*root, home + "/tmp");
  LinuxDevicePlaces places(*root, files, home);
  KeptFolders folders(files, places);
  if (options.action == RestoreAction::List) {
    return listFolders(folders, options);
  }
  StopSignals stop;
  LinuxHostLocks locks(
      *root, [&stop] { return stop.haveArrived(); },
      [](std::string_view line) { printError(kProgramName, line); });
  LockEnd end = locks.takeRoot(options.lockTimeout);
  if (end == LockEnd::Taken && options.action == RestoreAction::PutBack) {
    end = locks.takeMigration(options.lockTimeout);
  }
  if (end != LockEnd::Taken) {
    return failed(lockErrorOf(end, locks));
  }
  if (options.action == RestoreAction::Discard) {
    return discardFolder(folders, options);
  }
  RestoreResult result;
  result.restoration = restoreKeptFiles(places, folders, home, options.folder, currentTimeText());
  return result;
}

ExitStatus exitStatusOf(const RestoreResult& result) {
  const auto& error = result.restoration.error;
  return error ? error->exitStatus : ExitStatus::Success;
}

std::string jsonText(const RestoreResult& result, const RestoreOptions& options) {
  JSON object = {{"root", options.root}};
  if (options.action == RestoreAction::PutBack) {
    object["from"] = textOrNull(result.restoration.folder);
    object["restored"] = result.restoration.restored;
    object["removed"] = result.restoration.removed;
    object["replaced"] = textOrNull(result.restoration.replaced);
  } else if (options.action == RestoreAction::Discard) {
    object["discarded"] = textOrNull(result.discarded);
  } else {
    JSON folders = JSON::array();
    for (const ListedFolder& each : result.folders) {
      JSON places = JSON::array();
      for (const auto& [place, kind] : each.list.places) {
        places.push_back({{"place", listed(place).name},
                          {"path", pathOfPlace(place, homeOf(options))},
                          {"stood", textOf(kind)}});
      }
      folders.push_back({{"name", nameOf(each.path)},
                         {"path", each.path},
                         {"reason", textOrNull(textOf(each.list.reason))},
                         {"places", std::move(places)}});
    }
    object["folders"] = std::move(folders);
  }
  object["exitStatus"] = static_cast<int>(exitStatusOf(result));
  if (result.restoration.error) {
    object["error"] = result.restoration.error->message;
  }
  return lineOf(object);
}

std::string summaryText(const RestoreResult& result, const RestoreOptions& options) {
  std::string summary;
  for (const std::string& path : result.restoration.restored) {
    summary += "Put back " + escapedText(path) + "\n";
  }
  for (const std::string& path : result.restoration.removed) {
    summary += "Removed " + escapedText(path) + ", where nothing was before\n";
  }
  if (result.restoration.replaced) {
    summary += "What was there is kept in " + escapedText(*result.restoration.replaced) + "\n";
  }
  if (result.discarded) {
    summary += "Removed " + escapedText(*result.discarded) + "\n";
  }
  for (const ListedFolder& each : result.folders) {
    summary += escapedText(nameOf(each.path)) + "  " +
               textOf(each.list.reason).value_or("its list cannot be read") + "\n";
    for (const auto& [place, kind] : each.list.places) {
      if (kind != EntryKind::Nothing) {
        summary += std::string("  ") + textOf(kind) + "  " +
                   escapedText(pathOfPlace(place, homeOf(options))) + "\n";
      }
    }
  }
  const bool isNone =
      options.action == RestoreAction::List && result.folders.empty() && !result.restoration.error;
  return isNone ? "No files are kept.\n" : summary;
}

}  // namespace accounts
