#include "safetynet/SafetyNet.h"

#include <algorithm>
#include <utility>

#include "safetynet/MigrationCheck.h"
#include "safetynet/PutBack.h"

namespace accounts {

SafetyNet::SafetyNet(FileSystem& fileSystem, PropertyLists& propertyLists,
                     AccountFiles accountFiles, std::string restoreCommand)
    : files_(fileSystem),
      propertyLists_(propertyLists),
      accountFiles_(std::move(accountFiles)),
      restoreCommand_(std::move(restoreCommand)),
      folders_(fileSystem) {}

Result SafetyNet::keepInputs(std::string_view time) {
  folders_.removeUnfinished();
  removePutBackLeftovers(files_, accountFiles_);
  earlierFolders_ = folders_.ofMigrations();
  for (const std::string& path : accountFiles_.inputs()) {
    const std::optional<EntryKind> kind = files_.kindOfEntry(path);
    if (kind == EntryKind::RegularFile) {
      keptInputs_.push_back(path);
    } else if (kind != EntryKind::Nothing) {
      // Neither can be kept, and the plug-in might replace or remove either.
      return Result::failure(path +
                             (kind ? " is no regular file" : " cannot be told to be there or not"));
    }
  }
  if (keptInputs_.empty()) {
    return Result::success();
  }
  std::string folder;
  Result kept = folders_.keep(keptInputs_, KeptFor::Migration, time, folder);
  if (kept) {
    folder_ = std::move(folder);
  }
  return kept;
}

Settlement SafetyNet::settle(PluginEnd end, const SettingsSaves& saves) {
  Settlement settlement;
  if (end != PluginEnd::GaveTrue) {
    settleFailed(settlement, end, saves);
  } else if (const std::optional<std::string> reason =
                 whyNotMigrated(propertyLists_, accountFiles_.settings, saves.last)) {
    settleUnverified(settlement, *reason, saves);
  } else {
    settleVerified(settlement);
  }
  for (const std::string& folder : earlierFolders_) {
    settlement.warnings.push_back("An earlier run left files in " + folder + "; \"" +
                                  restoreCommand_ + " --from " + std::string(nameOf(folder)) +
                                  "\" puts them back");
  }
  settlement.keptFolders = earlierFolders_;
  if (folder_) {
    settlement.keptFolders.push_back(*folder_);
  }
  return settlement;
}

void SafetyNet::settleVerified(Settlement& settlement) {
  if (!folder_) {
    return;
  }
  settlement.warnings =
      whatMayBeMissing(propertyLists_, accountFiles_, keptInputs_, [this](const std::string& path) {
        return propertyLists_.readDictionary(keptPath(*folder_, path));
      });
  if (settlement.warnings.empty()) {
    discardFolder(settlement);
    return;
  }
  for (std::string& warning : settlement.warnings) {
    warning += "; " + howToRestore();
  }
}

void SafetyNet::settleUnverified(Settlement& settlement, const std::string& reason,
                                 const SettingsSaves& saves) {
  const std::string summary = "The plug-in reported success but " + reason;
  if (const Result back = putInputsBack(saves); !back) {
    settlement.error =
        ProgramError{ExitStatus::InputOutputError,
                     summary + ", and the files cannot be put back: " + back.error() +
                         (folder_ ? "; " + howToRestore() : "")};
    return;
  }
  settlement.error =
      ProgramError{ExitStatus::NotVerified, summary + "; the files are put back as they were"};
  discardFolder(settlement);
}

void SafetyNet::settleFailed(Settlement& settlement, PluginEnd end, const SettingsSaves& saves) {
  if (!folder_) {
    return;
  }
  LastSave lastSave = saves.last;
  if (end == PluginEnd::Died) {
    // What it did is not known, but a save that was written leaves another file.
    const bool isWritten = !files_.haveSameContents(keptPath(*folder_, accountFiles_.settings),
                                                    accountFiles_.settings);
    lastSave = isWritten ? LastSave::Written : LastSave::Failed;
  }
  if (whyNotMigrated(propertyLists_, accountFiles_.settings, lastSave)) {
    if (const Result back = putLegacyStoresBack(); !back) {
      settlement.warnings.push_back("A legacy store cannot be put back: " + back.error());
    }
  }
  if (inputsAreAsTheyWere()) {
    discardFolder(settlement);
  } else {
    settlement.warnings.push_back("The migration stopped halfway; " + howToRestore());
  }
}

Result SafetyNet::putInputsBack(const SettingsSaves& saves) {
  // A sentinel would have the next migration remove the legacy stores without converting them.
  Result result = removeDurably(files_, accountFiles_.removalSentinel);
  for (const std::string& path : keptInputs_) {
    if (result) {
      result = putBack(files_, *folder_, path);
    }
  }
  const bool wasThere = std::ranges::find(keptInputs_, accountFiles_.settings) != keptInputs_.end();
  return result && !wasThere && saves.replacedFile ? removeDurably(files_, accountFiles_.settings)
                                                   : result;
}

Result SafetyNet::putLegacyStoresBack() {
  for (const std::string& path : keptInputs_) {
    if (path == accountFiles_.settings || files_.kindOfEntry(path) != EntryKind::Nothing) {
      continue;
    }
    // As above.
    Result result = removeDurably(files_, accountFiles_.removalSentinel);
    if (result) {
      result = putBack(files_, *folder_, path);
    }
    if (!result) {
      return result;
    }
  }
  return Result::success();
}

bool SafetyNet::inputsAreAsTheyWere() {
  return std::ranges::all_of(keptInputs_, [&](const std::string& path) {
    return files_.haveSameContents(keptPath(*folder_, path), path);
  });
}

void SafetyNet::discardFolder(Settlement& settlement) {
  if (!folder_) {
    return;
  }
  if (const Result discarded = folders_.discard(*folder_); !discarded) {
    settlement.warnings.push_back("The kept files are needed no more but cannot be removed: " +
                                  discarded.error());
    return;
  }
  folder_.reset();
}

std::string SafetyNet::howToRestore() const {
  return "the files as they were are kept in " + *folder_ + ", and \"" + restoreCommand_ +
         " --from " + std::string(nameOf(*folder_)) + "\" puts them back";
}

}  // namespace accounts
