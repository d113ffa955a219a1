#include <gmock/gmock.h>

#include <cstdint>
#include <tuple>

#include "tests/program/HostileRootFixture.h"

// A device root is untrusted. Each test puts one hostile thing in one place that a migration reads,
// writes, removes or locks. Further kinds of things are rows in HostileKind.cpp, further places
// rows below.

namespace accounts {
namespace {

/// What depends on a place.
enum class Role : std::uint8_t {
  /// A migration goes on without it.
  Other,
  /// Without it there is no lock, and the migration fails.
  Lock,
  /// It may be missing but not unreadable.
  DeviceDescription
};

struct Place {
  const char* name;
  const char* path;
  Role role = Role::Other;
};

std::ostream& operator<<(std::ostream& stream, const Place& place) {
  return stream << place.path;
}

constexpr Place kFiles[] = {
    {"Settings", kSettingsPath},
    {"SettingsCopy", kSettingsCopyPath},
    {"LegacyMail", kLegacyMailPath},
    {"LegacyExchange", kLegacyExchangePath},
    {"Lock", kLockPath, Role::Lock},
    {"Sentinel", kSentinelPath},
    {"AutoFetch", kAutoFetchPath},
    {"LoggingPreferences", kLoggingPreferencesPath},
    {"DeviceDescription", kDevicePropertyListPath, Role::DeviceDescription},
    {"Users", "/etc/passwd"},
    {"Groups", "/etc/group"},
};

constexpr Place kDirectories[] = {
    {"LockDirectory", "/tmp", Role::Lock},
    {"Configuration", "/etc", Role::DeviceDescription},
    {"Variable", "/var"},
    {"Home", "/var/mobile"},
    {"Temporary", "/var/mobile/tmp"},
    {"Library", "/var/mobile/Library"},
    {"Preferences", "/var/mobile/Library/Preferences"},
    {"Mail", "/var/mobile/Library/Mail"},
    {"Logs", "/var/mobile/Library/Logs"},
    {"CrashReporter", "/var/mobile/Library/Logs/CrashReporter"},
    {"Information", kInformationDirectory},
};

int expectedStatus(const Place& place, const HostileKind& kind) {
  if (place.role == Role::Lock && kind.opened == Finding::Refused) {
    return kMigrationFailed;
  }
  if (place.role == Role::DeviceDescription && kind.finding == Finding::Refused) {
    return kMissingInput;
  }
  return 0;
}

class HostileRoot : public HostileRootFixture,
                    public testing::WithParamInterface<std::tuple<Place, HostileKind>> {
 protected:
  void SetUp() override { put(kind(), place().path); }

  [[nodiscard]] static const Place& place() { return std::get<0>(GetParam()); }
  [[nodiscard]] static const HostileKind& kind() { return std::get<1>(GetParam()); }
};

TEST_P(HostileRoot, IsMigratedOrRefusedWithoutTouchingAnythingOutside) {
  const ProgramResult result = migrateWith(kind(), {"--bare"});

  EXPECT_EQ(result.exitStatus, expectedStatus(place(), kind())) << result.errors;
  expectClearReport(result);
  expectNothingCrossedTheBorder();
}

TEST_P(HostileRoot, IsSafeWithTheSafetyNetToo) {
  const ProgramResult result = migrateWith(kind(), {});

  EXPECT_THAT(result.exitStatus,
              testing::AnyOf(0, kMigrationFailed, kVerificationFailed, kNotAllCarriedOver,
                             kMissingInput, kCannotCreate, kInputOutputError))
      << result.errors;
  expectClearReport(result);
  expectNothingCrossedTheBorder();
}

std::string nameOfPlace(const testing::TestParamInfo<std::tuple<Place, HostileKind>>& information) {
  const auto& [place, kind] = information.param;
  return std::string(kind.name) + "InPlaceOf" + place.name;
}

INSTANTIATE_TEST_SUITE_P(Files, HostileRoot,
                         testing::Combine(testing::ValuesIn(kFiles),
                                          testing::ValuesIn(hostileFileKinds())),
                         nameOfPlace);
INSTANTIATE_TEST_SUITE_P(Directories, HostileRoot,
                         testing::Combine(testing::ValuesIn(kDirectories),
                                          testing::ValuesIn(hostileDirectoryKinds())),
                         nameOfPlace);

}  // namespace
}  // namespace accounts
