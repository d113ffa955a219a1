#include "host/RunReport.h"

#include "inspection/PropertyListJSON.h"
#include "propertylist/value/Description.h"

namespace accounts {
namespace {

constexpr const char* kRootKey = "root";
constexpr const char* kDataClassNameKey = "dataClassName";
constexpr const char* kResultKey = "result";
constexpr const char* kStepsKey = "steps";
constexpr const char* kBroadcastsKey = "broadcasts";
constexpr const char* kApplicationKey = "application";
constexpr const char* kPreferenceKey = "key";
constexpr const char* kCloudTabAnnouncementsKey = "cloudTabAnnouncements";
constexpr const char* kSettingsSavesKey = "settingsSaves";
constexpr const char* kLastWrittenKey = "lastWritten";
constexpr const char* kReplacedFileKey = "replacedFile";
constexpr const char* kKeptInputsKey = "keptInputs";
constexpr const char* kOutcomeKey = "outcome";
constexpr const char* kLedgerKey = "ledger";
constexpr const char* kWarningsKey = "warnings";
constexpr const char* kExitStatusKey = "exitStatus";
constexpr const char* kErrorKey = "error";

JSON jsonOf(const std::optional<RunReport::SettingsSaves>& saves) {
  if (!saves) {
    return nullptr;
  }
  return {{kLastWrittenKey,
           saves->last == LastSave::None ? JSON(nullptr) : JSON(saves->last == LastSave::Written)},
          {kReplacedFileKey, saves->replacedFile}};
}

}  // namespace

void setError(RunReport& report, const ProgramError& error) {
  report.exitStatus = error.exitStatus;
  report.error = error.message;
}

void noteReportError(RunReport& report, const ProgramError& error) {
  if (report.error || report.exitStatus != ExitStatus::Success) {
    report.warnings.push_back(error.message);
  } else {
    setError(report, error);
  }
}

std::string outcomeOf(const RunReport& report) {
  if (report.error) {
    return *report.error;
  }
  const std::string losses = report.ledger ? lossesWithTheFirst(*report.ledger) : "";
  return losses.empty() ? "Migrated" : "Migrated, but " + losses;
}

JSON objectOf(const RunReport& report, LedgerDetail detail) {
  JSON broadcasts = JSON::array();
  for (const PreferencesChange& broadcast : report.broadcasts) {
    broadcasts.push_back(
        {{kApplicationKey, broadcast.application}, {kPreferenceKey, broadcast.key}});
  }
  JSON object = {{kRootKey, textOrNull(report.root)},
                 {kDataClassNameKey, textOrNull(report.dataClassName)},
                 {kResultKey, report.result},
                 {kStepsKey, report.steps},
                 {kBroadcastsKey, std::move(broadcasts)},
                 {kCloudTabAnnouncementsKey, report.cloudTabAnnouncements},
                 {kSettingsSavesKey, jsonOf(report.settingsSaves)},
                 {kKeptInputsKey, report.keptInputs},
                 {kOutcomeKey, outcomeOf(report)},
                 {kLedgerKey, report.ledger ? ledgerObject(*report.ledger, detail) : JSON(nullptr)},
                 {kWarningsKey, report.warnings},
                 {kExitStatusKey, static_cast<int>(report.exitStatus)}};
  if (report.error) {
    object[kErrorKey] = *report.error;
  }
  return object;
}

std::string jsonText(const RunReport& report) {
  return lineOf(objectOf(report, LedgerDetail::LossesAlone));
}

std::string summaryText(const RunReport& report) {
  if (!report.dataClassName) {
    return "";
  }
  std::string summary =
      (report.result && !report.error ? "Migrated the " : "Failed to migrate the ") +
      escapedText(*report.dataClassName) + " of " + escapedText(report.root.value_or(""));
  if (const std::string losses = report.ledger ? lossesInWords(*report.ledger) : "";
      losses.empty()) {
    summary += ".\n";
  } else {
    summary += ", but " + losses + ":\n";
    for (const std::string& loss : report.ledger->losses()) {
      summary += "  Not carried over: " + escapedText(loss) + ".\n";
    }
  }
  for (const PreferencesChange& broadcast : report.broadcasts) {
    summary += "  Told " + escapedText(broadcast.application) + " that its " +
               escapedText(broadcast.key) + " changed.\n";
  }
  if (report.cloudTabAnnouncements > 0) {
    summary += "  Announced cloud tabs, " + std::to_string(report.cloudTabAnnouncements) +
               (report.cloudTabAnnouncements == 1 ? " time.\n" : " times.\n");
  }
  if (report.keptFolder) {
    summary += "  Kept the files as they were in " + escapedText(*report.keptFolder) + ".\n";
  }
  for (const std::string& warning : report.warnings) {
    summary += "  Warning: " + escapedText(warning) + ".\n";
  }
  return summary;
}

}  // namespace accounts
