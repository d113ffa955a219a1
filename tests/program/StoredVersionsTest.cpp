// Devices as builds of every stored version left them, migrated by the real host and compared with
// ends that a person derived from the rules. The devices are in tests/fixtures/versions, each with
// notes on what happens to it; the README there says how to read and add one.

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <sstream>

#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/SafetyNetFixture.h"
#include "tests/program/StoredVersionsComparison.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr int kCurrentVersion = 12;
constexpr const char* kMailAutoFetchPath = "/var/mobile/Library/Mail/AutoFetchEnabled";

fs::path versionsDirectory() {
  return fs::path(SOURCE_DIRECTORY) / "tests" / "fixtures" / "versions";
}

std::string textOfFile(const fs::path& path) {
  std::ifstream stream(path, std::ios::binary);
  EXPECT_TRUE(stream.good()) << path;
  std::ostringstream text;
  text << stream.rdbuf();
  return text.str();
}

PropertyDictionary dictionaryOfFile(const fs::path& path) {
  const auto value = readPropertyList(textOfFile(path));
  EXPECT_TRUE(value && value->asDictionary()) << path;
  return value && value->asDictionary() ? *value->asDictionary() : PropertyDictionary();
}

PropertyDictionary expectedSettings(const std::string& device) {
  return dictionaryOfFile(versionsDirectory() / device / "after" /
                          "com.quarx.accountsettings.plist");
}

std::string joined(const std::vector<std::string>& lines) {
  std::string text;
  for (const std::string& line : lines) {
    text += line + "\n";
  }
  return text;
}

/// Whether a line is as a fixture gives it. A fixture's line that ends with "…" leaves the rest,
/// which the operating system words, open.
bool isLine(const std::string& expected, const std::string& found) {
  constexpr std::string_view kOpenEnd = "…";
  return expected.ends_with(kOpenEnd)
             ? found.starts_with(expected.substr(0, expected.size() - kOpenEnd.size()))
             : found == expected;
}

/// One device of the fixtures, named by the test's parameter.
class StoredVersions : public DeviceRootFixture, public testing::WithParamInterface<const char*> {
 protected:
  StoredVersions() {
    copyOverRoot(directory() / "before");
    writeText(kMailAutoFetchPath, "");
    for (const fs::directory_entry& entry :
         fs::recursive_directory_iterator(directory() / "before")) {
      if (entry.is_regular_file()) {
        collectTexts(textsBefore_, dictionaryOfFile(entry.path()));
      }
    }
  }

  [[nodiscard]] static fs::path directory() { return versionsDirectory() / GetParam(); }

  [[nodiscard]] ProgramCall migrationCallInEnglish(
      const std::vector<std::string>& arguments) const {
    ProgramCall call = migrationCall(arguments);
    call.environment = {{"LC_ALL", "C"}, {"LANGUAGE", "en"}};
    return call;
  }
  [[nodiscard]] ProgramResult migrateInEnglish() const {
    return runProgram(migrationCallInEnglish({"--json"}));
  }

  /// On the devices of version 12 something is lost: an account that other software damaged, and
  /// accounts that legacy ones replace.
  [[nodiscard]] static int expectedStatus() {
    return std::string_view(GetParam()).starts_with("12") ? kNotAllCarriedOver : 0;
  }

  /// A part of a report as text, without what differs from run to run: how long the stages took,
  /// and identifiers that the migration made up, which are numbered.
  [[nodiscard]] std::string comparable(nlohmann::json part) const {
    if (part.is_array()) {
      for (nlohmann::json& element : part) {
        if (element.is_object()) {
          element.erase("seconds");
        }
      }
    }
    std::string text = part.dump(2);
    static const std::regex form("[0-9A-F]{8}(-[0-9A-F]{4}){3}-[0-9A-F]{12}");
    std::map<std::string, std::string> names;
    for (std::sregex_iterator found(text.begin(), text.end(), form), end; found != end; ++found) {
      if (!textsBefore_.contains(found->str())) {
        names.try_emplace(found->str(), "NEW-" + std::to_string(names.size()));
      }
    }
    for (const auto& [identifier, name] : names) {
      for (std::size_t at = text.find(identifier); at != std::string::npos;
           at = text.find(identifier)) {
        text.replace(at, identifier.size(), name);
      }
    }
    return text;
  }

  /// The account settings, with names for the identifiers that the migration made up.
  [[nodiscard]] PropertyValue settingsFound() const {
    return withNamedIdentifiers(readDictionary(kSettingsPath), textsBefore_);
  }

 private:
  std::set<std::string> textsBefore_;
};

TEST_P(StoredVersions, EndWithTheAccountsThatAPersonDerived) {
  const ProgramResult result = migrateInEnglish();

  ASSERT_EQ(result.exitStatus, expectedStatus()) << result.errors;
  const std::vector<std::string> found = differences(expectedSettings(GetParam()), settingsFound());
  EXPECT_TRUE(found.empty()) << joined(found);
}

TEST_P(StoredVersions, ArePlannedAsTheyAreThenMigrated) {
  ProgramCall call = migrationCallInEnglish({"--json"});
  call.arguments.front() = "plan";
  const nlohmann::json planned = onlyObject(runProgram(call));
  const std::string reportFile = onThisMachine("/report.json").string();

  ASSERT_EQ(runProgram(migrationCallInEnglish({"--report", reportFile})).exitStatus,
            expectedStatus());

  const nlohmann::json done = nlohmann::json::parse(readText("/report.json"));
  EXPECT_EQ(comparable(planned["stages"]), comparable(done["stages"]));
  for (const char* key :
       {"versions", "accountsBefore", "accountsAfter", "broadcasts", "cloudTabAnnouncements"}) {
    EXPECT_EQ(comparable(planned[key]), comparable(done[key])) << key;
  }
}

TEST_P(StoredVersions, SayOnTheConsoleWhatHappened) {
  std::istringstream expectedText(textOfFile(directory() / "after" / "console.txt"));
  std::vector<std::string> expected;
  for (std::string line; std::getline(expectedText, line);) {
    expected.push_back(line);
  }

  const std::vector<std::string> found = migrateInEnglish().errorLines();

  EXPECT_TRUE(std::equal(expected.begin(), expected.end(), found.begin(), found.end(), isLine))
      << "expected:\n"
      << joined(expected) << "found:\n"
      << joined(found);
}

TEST_P(StoredVersions, ReportTheAnnouncementsThatWereMade) {
  const nlohmann::json expected =
      nlohmann::json::parse(textOfFile(directory() / "after" / "result.json"));

  const nlohmann::json found = onlyObject(migrateInEnglish());

  for (const auto& [key, value] : expected.items()) {
    EXPECT_EQ(found.value(key, nlohmann::json()), value) << key;
  }
}

TEST_P(StoredVersions, EndWithABinaryFileOfTheCurrentVersion) {
  ASSERT_EQ(migrateInEnglish().exitStatus, expectedStatus());

  EXPECT_TRUE(isBinaryPropertyList(readText(kSettingsPath)));
  const PropertyDictionary settings = readDictionary(kSettingsPath);
  ASSERT_TRUE(settings.contains("Version"));
  EXPECT_EQ(*settings.find("Version"), PropertyValue(kCurrentVersion));
  EXPECT_EQ(settings.size(), 2U) << "\"Version\" and \"Accounts\", nothing else";
}

TEST_P(StoredVersions, LeaveNoLegacyStoreNoSentinelAndNothingTemporary) {
  std::vector<std::string> expected = {"/etc/device.plist", "/etc/group", "/etc/passwd", kLockPath,
                                       kSettingsPath};
  if (exists(kSettingsPath)) {
    expected.emplace_back(kSettingsCopyPath);
  }
  std::ranges::sort(expected);

  ASSERT_EQ(migrateInEnglish().exitStatus, expectedStatus());

  std::vector<std::string> found = files();
  std::erase_if(found, [](const std::string& path) {
    return expectedStatus() == kNotAllCarriedOver && path.starts_with(kAccountMigration);
  });
  EXPECT_EQ(found, expected);
}

TEST_P(StoredVersions, KeepACopyOfTheFileAsItWas) {
  const bool hasSettings = exists(kSettingsPath);
  const std::string before = hasSettings ? readText(kSettingsPath) : "";

  ASSERT_EQ(migrateInEnglish().exitStatus, expectedStatus());

  ASSERT_EQ(exists(kSettingsCopyPath), hasSettings);
  if (hasSettings) {
    EXPECT_EQ(readText(kSettingsCopyPath), before);
  }
}

TEST_P(StoredVersions, StayByteForByteInASecondMigration) {
  ASSERT_EQ(migrateInEnglish().exitStatus, expectedStatus());
  const std::string afterFirst = readText(kSettingsPath);

  const ProgramResult second = migrateInEnglish();

  EXPECT_EQ(second.exitStatus, 0);
  if (expectedStatus() == 0) {
    EXPECT_EQ(second.errors, "") << "nothing needs migrating any more";
  }
  EXPECT_EQ(readText(kSettingsPath), afterFirst);
}

std::string testName(const testing::TestParamInfo<const char*>& info) {
  std::string name = info.param;
  std::ranges::replace(name, '-', '_');
  return name;
}

INSTANTIATE_TEST_SUITE_P(Device, StoredVersions,
                         testing::Values("0", "1", "2", "3", "4", "5", "6", "7", "8", "9", "10",
                                         "11", "12", "none", "3-newer-processor",
                                         "12-with-legacy-mail"),
                         testName);

// Anna's device is there once for every version. Since each of its ends is what the migration gives
// (EndWithTheAccountsThatAPersonDerived), equal ends say that all versions converge.
TEST(StoredVersionsOfOneDevice, AllHaveTheSameEnd) {
  const PropertyDictionary endOfCurrent = expectedSettings(std::to_string(kCurrentVersion));
  for (int version = 0; version < kCurrentVersion; ++version) {
    const std::vector<std::string> found =
        differences(endOfCurrent, expectedSettings(std::to_string(version)));
    EXPECT_TRUE(found.empty()) << "version " << version << ":\n" << joined(found);
  }
}

TEST(StoredVersionsOfOneDevice, AreStoredUnderTheirVersion) {
  for (int version = 0; version <= kCurrentVersion; ++version) {
    const fs::path file = versionsDirectory() / std::to_string(version) / "before" /
                          fs::path(kSettingsPath).relative_path();
    const PropertyDictionary settings = dictionaryOfFile(file);
    ASSERT_TRUE(settings.contains("Version")) << file;
    EXPECT_EQ(*settings.find("Version"), PropertyValue(version)) << file;
  }
}

}  // namespace
}  // namespace accounts
