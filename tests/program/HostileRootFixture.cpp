#include "tests/program/HostileRootFixture.h"

#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>
#include <sstream>

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr std::string_view kHostsOwnLine = "migration-host: ";
constexpr std::uintmax_t kLargestSearchedFile = 1U << 20;

bool hasControlCharacters(std::string_view text) {
  return std::any_of(text.begin(), text.end(), [](char character) {
    const auto code = static_cast<unsigned char>(character);
    return code < 0x20 || code == 0x7f;
  });
}

bool holdsMark(const fs::path& file) {
  std::ifstream stream(file, std::ios::binary);
  std::ostringstream text;
  text << stream.rdbuf();
  return text.str().find(kOutsideMark) != std::string::npos;
}

}  // namespace

HostileRootFixture::HostileRootFixture() : DeviceRootFixture(Medium::Memory) {
  write(kSettingsPath, accountSettings(11, {PropertyDictionary{{"Type", "CalDAV"},
                                                               {"Class", "MobileCalDAVAccount"},
                                                               {"Identifier", "SETTINGS"}}}));
  write(kLegacyMailPath, PropertyDictionary{{"MailAccounts", PropertyArray{PropertyDictionary{
                                                                 {"AccountType", "IMAPAccount"},
                                                                 {"uniqueId", "MAIL"}}}}});
  write(kLegacyExchangePath,
        PropertyDictionary{
            {"DAAccountsKey",
             PropertyArray{PropertyDictionary{{"DAAccountConfigurationClass", "ASAccount"},
                                              {"DAAccountConfigurationAccountID", "EXCHANGE"}}}}});
  write(kLoggingPreferencesPath, PropertyDictionary{{"ASSaveMigrationInformation", true}});
  write(kDevicePropertyListPath, PropertyDictionary{});
  writeText(kAutoFetchPath, "");
  fs::create_directory(onThisMachine("/var/mobile/tmp"));
  fs::create_directory(onThisMachine(kInformationDirectory));
}

HostileRootFixture::~HostileRootFixture() {
  std::for_each(immutable_.begin(), immutable_.end(), makeRemovable);
}

void HostileRootFixture::put(const HostileKind& kind, const char* devicePath) {
  const fs::path place = onThisMachine(devicePath);
  if (kind.toOtherUsersOnly) {
    const ProgramResult result =
        runProgram({.program = migrationHost(), .arguments = {"--version"}, .user = kSomebody});
    if (getuid() != 0 || result.exitStatus != 0) {
      GTEST_SKIP() << "The test cannot run " << migrationHost() << " as another user.";
    }
    giveTo(kSomebody);
  }
  outsideBefore_ = outside_.contents();
  immutable_.push_back(place);
  if (const std::optional<std::string> reason = kind.put(place, outside_.path(devicePath))) {
    GTEST_SKIP() << *reason;
  }
}

ProgramResult HostileRootFixture::migrateWith(const HostileKind& kind,
                                              std::vector<std::string> arguments) {
  arguments.insert(arguments.end(), {"--json", "--channel", "-"});
  ProgramCall call = migrationCall(arguments);
  if (kind.toOtherUsersOnly) {
    call.user = kSomebody;
  }
  return runProgram(call);
}

void HostileRootFixture::expectNothingCrossedTheBorder() const {
  EXPECT_EQ(outside_.contents(), outsideBefore_);
  for (const std::string& file : files()) {
    const fs::path path = onThisMachine(file);
    if (fs::is_regular_file(fs::symlink_status(path)) &&
        fs::file_size(path) < kLargestSearchedFile) {
      EXPECT_FALSE(holdsMark(path)) << file;
    }
  }
}

void expectClearReport(const ProgramResult& result) {
  const std::vector<std::string> lines = result.errorLines();
  for (const std::string& line : lines) {
    EXPECT_FALSE(hasControlCharacters(line)) << line;
  }
  const auto ownLines = std::count_if(lines.begin(), lines.end(), [](const std::string& line) {
    return line.starts_with(kHostsOwnLine);
  });
  if (result.exitStatus != 0) {
    EXPECT_EQ(ownLines, 1) << result.errors;
  }
  const nlohmann::json object = onlyObject(result);
  EXPECT_EQ(object["exitStatus"], result.exitStatus);
  const bool isMigrated = result.exitStatus == 0 || result.exitStatus == kNotAllCarriedOver;
  EXPECT_EQ(object.contains("error"), !isMigrated) << object;
}

}  // namespace accounts
