#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "commandline/ExitStatus.h"
#include "inspection/PropertyListJSON.h"
#include "platform/linux/RecordingPreferencesBroadcast.h"
#include "report/LedgerJSON.h"
#include "safetynet/AccountLedger.h"
#include "transaction/Transaction.h"

namespace accounts {

/// Everything that the host reports of one run.
struct RunReport {
  /// The root as the person named it; none when the arguments did not say.
  std::optional<std::string> root;
  /// None when the plug-in was not asked.
  std::optional<std::string> dataClassName;
  /// What the migration gave; false when it gave nothing.
  bool result = false;
  /// The operations of the stages that the migration went through, in order.
  std::vector<std::string> steps;
  std::vector<PreferencesChange> broadcasts;
  /// How often cloud tabs were announced to be on.
  std::size_t cloudTabAnnouncements = 0;
  /// What became of the plug-in's newest save, and whether the settings file was replaced by it;
  /// none where nobody looked, as with a plug-in that works on the device.
  struct SettingsSaves {
    LastSave last = LastSave::None;
    bool replacedFile = false;
  };
  std::optional<SettingsSaves> settingsSaves;
  /// The folder in which this run kept the files as they were; none when it kept none.
  std::optional<std::string> keptFolder;
  /// The folders of kept files that are there after the run, device paths, oldest first.
  std::vector<std::string> keptInputs;
  /// What became of every account; none where nothing was changed, or nobody looked.
  std::optional<AccountLedger> ledger;
  /// What a person should know, one sentence each.
  std::vector<std::string> warnings;
  ExitStatus exitStatus = ExitStatus::Success;
  /// What went wrong, one line for a person; none when nothing did.
  std::optional<std::string> error;
};

/// Notes an error of the host's own in a report.
void setError(RunReport& report, const ProgramError& error);

/// Notes that a report of the run could not be written: an error of a run that otherwise succeeded,
/// else a warning.
void noteReportError(RunReport& report, const ProgramError& error);

/// What the run came to, in one line without a full stop: the cause of a failure, or what was
/// migrated.
std::string outcomeOf(const RunReport& report);

/// A report as a JSON object.
JSON objectOf(const RunReport& report, LedgerDetail detail);
/// A report as one JSON object on one line, without a line end. Bytes that are no UTF-8 are
/// replaced.
std::string jsonText(const RunReport& report);
/// A report in a few lines for a person, each with its line end. Errors are not part of it: they
/// belong on standard error.
std::string summaryText(const RunReport& report);

}  // namespace accounts
