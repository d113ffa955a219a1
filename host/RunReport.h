#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "commandline/ExitStatus.h"
#include "inspection/PropertyListJSON.h"
#include "platform/linux/RecordingPreferencesBroadcast.h"
#include "safetynet/SettingsSaves.h"

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
  /// What the plug-in did to the settings file, as far as that was looked at.
  SettingsSaves settingsSaves;
  /// The folders of kept files that are there after the run, device paths, oldest first.
  std::vector<std::string> keptInputs;
  /// What a person should know, one sentence each.
  std::vector<std::string> warnings;
  ExitStatus exitStatus = ExitStatus::Success;
  /// What went wrong, one line for a person; none when nothing did.
  std::optional<std::string> error;
};

/// Notes an error of the host's own in a report.
void setError(RunReport& report, const ProgramError& error);

/// A report as a JSON object.
JSON objectOf(const RunReport& report);
/// A report as one JSON object on one line, without a line end. Bytes that are no UTF-8 are
/// replaced.
std::string jsonText(const RunReport& report);
/// The report that a text of jsonText() stands for; none when the text is no such report.
std::optional<RunReport> reportFromJSONText(const std::string& text);

/// A report in a few lines for a person, each with its line end. Errors are not part of it: they
/// belong on standard error.
std::string summaryText(const RunReport& report);

}  // namespace accounts
