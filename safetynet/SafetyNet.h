#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "commandline/ExitStatus.h"
#include "platform/FileSystem.h"
#include "platform/PropertyLists.h"
#include "platform/Result.h"
#include "safetynet/AccountFiles.h"
#include "safetynet/KeptFolders.h"
#include "safetynet/SettingsSaves.h"

namespace accounts {

/// How a run of the plug-in ended.
enum class PluginEnd : std::uint8_t {
  GaveTrue,
  GaveFalse,
  /// By an assertion, a signal or an exit of its own: what it did to the settings file is not
  /// known.
  Died
};

/// What the safety net has to say after a run.
struct Settlement {
  /// Set when the plug-in gave true and its result could not be verified.
  std::optional<ProgramError> error;
  /// One sentence each without a full stop.
  std::vector<std::string> warnings;
  /// The folders of kept files that are there now, oldest first.
  std::vector<std::string> keptFolders;
};

/// Keeps what a person's accounts are in around one run of the plug-in, whose own rules let an
/// unreadable settings file be replaced and legacy stores be removed although a save failed.
/// Whoever uses it holds the host's lock from keepInputs() until settle() has ended.
class SafetyNet {
 public:
  /// `restoreCommand` is what a person types to put kept files back, without the folder.
  SafetyNet(FileSystem& fileSystem, PropertyLists& propertyLists, AccountFiles accountFiles,
            std::string restoreCommand);

  /// Before the run: keeps the settings file and the legacy stores that are there, durably, in a
  /// folder of their own; none is made when there is nothing to keep. `time` is sortable text for
  /// its name. After a failure, with nothing changed, the plug-in must not run.
  Result keepInputs(std::string_view time);

  /// After the run: verifies its result, puts the inputs back when it gave true and cannot be
  /// verified, puts legacy stores back that are gone without a migrated settings file, and removes
  /// the kept files that are needed no more. `saves` counts unless the plug-in died.
  Settlement settle(PluginEnd end, const SettingsSaves& saves);

 private:
  void settleVerified(Settlement& settlement);
  void settleUnverified(Settlement& settlement, const std::string& reason,
                        const SettingsSaves& saves);
  void settleFailed(Settlement& settlement, PluginEnd end, const SettingsSaves& saves);
  Result putInputsBack(const SettingsSaves& saves);
  Result putLegacyStoresBack();
  [[nodiscard]] bool inputsAreAsTheyWere();
  void discardFolder(Settlement& settlement);
  [[nodiscard]] std::string howToRestore() const;

  FileSystem& files_;
  PropertyLists& propertyLists_;
  AccountFiles accountFiles_;
  std::string restoreCommand_;
  KeptFolders folders_;

  std::vector<std::string> earlierFolders_;
  std::vector<std::string> keptInputs_;
  /// The folder of this run; none when there was nothing to keep, or when it is gone again.
  std::optional<std::string> folder_;
};

}  // namespace accounts
