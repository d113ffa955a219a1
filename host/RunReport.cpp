#include "host/RunReport.h"

#include "inspection/PropertyListJSON.h"
#include "propertylist/Description.h"

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
constexpr const char* kWarningsKey = "warnings";
constexpr const char* kExitStatusKey = "exitStatus";
constexpr const char* kErrorKey = "error";

std::optional<std::string> optionalText(const JSON& object, const char* key) {
  const auto found = object.find(key);
  return found != object.end() && found->is_string() ? std::optional(found->get<std::string>())
                                                     : std::nullopt;
}

JSON jsonOf(const SettingsSaves& saves) {
  return {{kLastWrittenKey,
           saves.last == LastSave::None ? JSON(nullptr) : JSON(saves.last == LastSave::Written)},
          {kReplacedFileKey, saves.replacedFile}};
}

SettingsSaves settingsSavesFrom(const JSON& object) {
  const JSON& written = object.at(kLastWrittenKey);
  SettingsSaves saves;
  if (!written.is_null()) {
    saves.last = written.get<bool>() ? LastSave::Written : LastSave::Failed;
  }
  saves.replacedFile = object.at(kReplacedFileKey).get<bool>();
  return saves;
}

}  // namespace

void setError(RunReport& report, const ProgramError& error) {
  report.exitStatus = error.exitStatus;
  report.error = error.message;
}

JSON objectOf(const RunReport& report) {
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
                 {kWarningsKey, report.warnings},
                 {kExitStatusKey, static_cast<int>(report.exitStatus)}};
  if (report.error) {
    object[kErrorKey] = *report.error;
  }
  return object;
}

std::string jsonText(const RunReport& report) {
  return lineOf(objectOf(report));
}

std::optional<RunReport> reportFromJSONText(const std::string& text) {
  try {
    const JSON object = JSON::parse(text);
    RunReport report;
    report.root = optionalText(object, kRootKey);
    report.dataClassName = optionalText(object, kDataClassNameKey);
    report.result = object.at(kResultKey).get<bool>();
    report.steps = object.at(kStepsKey).get<std::vector<std::string>>();
    for (const JSON& broadcast : object.at(kBroadcastsKey)) {
      report.broadcasts.push_back({broadcast.at(kApplicationKey).get<std::string>(),
                                   broadcast.at(kPreferenceKey).get<std::string>()});
    }
    report.cloudTabAnnouncements = object.at(kCloudTabAnnouncementsKey).get<std::size_t>();
    report.settingsSaves = settingsSavesFrom(object.at(kSettingsSavesKey));
    report.keptInputs = object.at(kKeptInputsKey).get<std::vector<std::string>>();
    report.warnings = object.at(kWarningsKey).get<std::vector<std::string>>();
    report.exitStatus = static_cast<ExitStatus>(object.at(kExitStatusKey).get<int>());
    report.error = optionalText(object, kErrorKey);
    return report;
  } catch (const JSON::exception&) {
    return std::nullopt;
  }
}

std::string summaryText(const RunReport& report) {
  if (!report.dataClassName) {
    return "";
  }
  std::string summary =
      (report.result && !report.error ? "Migrated the " : "Failed to migrate the ") +
      escapedText(*report.dataClassName) + " of " + escapedText(report.root.value_or("")) + ".\n";
  for (const PreferencesChange& broadcast : report.broadcasts) {
    summary += "  Told " + escapedText(broadcast.application) + " that its " +
               escapedText(broadcast.key) + " changed.\n";
  }
  if (report.cloudTabAnnouncements > 0) {
    summary += "  Announced cloud tabs, " + std::to_string(report.cloudTabAnnouncements) +
               (report.cloudTabAnnouncements == 1 ? " time.\n" : " times.\n");
  }
  return summary;
}

}  // namespace accounts
