#include "tests/campaign/Ending.h"

#include <vector>

#include "tests/campaign/DeviceProcess.h"
#include "tests/campaign/SettingsContents.h"
#include "tests/program/StoredVersionsComparison.h"

namespace accounts {

Ending endingOf(const SimulatedDisk& disk, ExitStatus exitStatus,
                const std::set<std::string>& textsBefore) {
  Ending ending;
  // Which of two runs tells that something was not carried over depends on where the first ended.
  ending.exitStatus =
      exitStatus == ExitStatus::NotAllCarriedOver ? ExitStatus::Success : exitStatus;
  if (const auto settings = disk.contentsOf(pathOf(DevicePlace::Settings))) {
    // What is no property list compares by its bytes.
    const auto dictionary = dictionaryIn(*settings);
    ending.settings = dictionary ? withNamedIdentifiers(*dictionary, textsBefore)
                                 : PropertyValue(PropertyData{*settings});
  }
  for (const ListedPlace& each : kDevicePlaces) {
    // What is for engineers tells of the newest run, whatever there was to do for it.
    const bool isForEngineers =
        each.place == DevicePlace::CopyAside || each.place == DevicePlace::InformationDirectory;
    if (each.place != DevicePlace::Settings && !isForEngineers && disk.exists(pathOf(each.place))) {
      ending.places.insert(each.place);
    }
  }
  return ending;
}

std::optional<std::string> differenceOf(const Ending& expected, const Ending& found) {
  if (found.exitStatus != expected.exitStatus) {
    return "exit status " + std::to_string(static_cast<int>(found.exitStatus));
  }
  if (found.settings != expected.settings && found.settings != expected.settingsLater) {
    const std::vector<std::string> lines =
        differences(expected.settings.value_or(PropertyDictionary()),
                    found.settings.value_or(PropertyDictionary()));
    return "other settings" + (lines.empty() ? "" : ": " + lines.front());
  }
  for (const ListedPlace& each : kDevicePlaces) {
    const bool isExpected = expected.places.contains(each.place);
    if (found.places.contains(each.place) != isExpected) {
      return (isExpected ? "missing: " : "left: ") + pathOf(each.place);
    }
  }
  return std::nullopt;
}

}  // namespace accounts
