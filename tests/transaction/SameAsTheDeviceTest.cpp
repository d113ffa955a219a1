#include "tests/transaction/SameAsTheDeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

TEST_F(SameAsTheDeviceTest, RemovingAFile) {
  makeFile(path(DevicePlace::LegacyMail), "store");
  expectSame(removing(DevicePlace::LegacyMail), "success");
}

TEST_F(SameAsTheDeviceTest, RemovingNothing) {
  expectSame(removing(DevicePlace::LegacyMail),
             "Cannot remove /var/mobile/Library/Mail/Accounts.plist: No such file or directory");
}

TEST_F(SameAsTheDeviceTest, RemovingADirectory) {
  makeDirectory(path(DevicePlace::LegacyMail));
  expectSame(removing(DevicePlace::LegacyMail),
             "Cannot remove /var/mobile/Library/Mail/Accounts.plist: Is a directory");
}

TEST_F(SameAsTheDeviceTest, RemovingALinkToADirectory) {
  makeLink(path(DevicePlace::LegacyMail), "/var");
  expectSame(removing(DevicePlace::LegacyMail), "success");
}

TEST_F(SameAsTheDeviceTest, RemovingWhereThereIsNoDirectory) {
  fs::remove(onHost("/var/mobile/Library/Mail"));
  expectSame(removing(DevicePlace::LegacyMail),
             "Cannot open /var/mobile/Library/Mail: No such file or directory");
}

TEST_F(SameAsTheDeviceTest, RemovingFromADirectoryThatMayNotBeWritten) {
  makeFile(path(DevicePlace::LegacyMail), "store");
  takeRights("/var/mobile/Library/Mail", 0555);
  const WithoutPrivileges everyone;
  expectSame(removing(DevicePlace::LegacyMail),
             "Cannot remove /var/mobile/Library/Mail/Accounts.plist: Permission denied");
}

TEST_F(SameAsTheDeviceTest, RemovingAnotherUsersFileFromASharedDirectory) {
  makeFile(path(DevicePlace::AutoFetchEnabled), "");
  takeRights("/var/mobile/Library/Mail", 01777);
  const WithoutPrivileges everyone;
  expectSame(removing(DevicePlace::AutoFetchEnabled),
             "Cannot remove /var/mobile/Library/Mail/AutoFetchEnabled: Operation not permitted");
}

TEST_F(SameAsTheDeviceTest, CreatingAFile) {
  expectSame(creating(DevicePlace::RemovalSentinel), "success");
}

TEST_F(SameAsTheDeviceTest, CreatingWhereADirectoryStands) {
  makeDirectory(path(DevicePlace::RemovalSentinel));
  expectBothRefuse(creating(DevicePlace::RemovalSentinel));
}

TEST_F(SameAsTheDeviceTest, CreatingInADirectoryThatMayNotBeWritten) {
  takeRights("/var/mobile/Library/Preferences", 0555);
  const WithoutPrivileges everyone;
  expectBothRefuse(creating(DevicePlace::RemovalSentinel));
}

TEST_F(SameAsTheDeviceTest, CreatingWhereThereIsNoDirectory) {
  fs::remove(onHost("/var/mobile/Library/Preferences"));
  expectSame(creating(DevicePlace::RemovalSentinel),
             "Cannot open /var/mobile/Library/Preferences: No such file or directory");
}

TEST_F(SameAsTheDeviceTest, CopyingAside) {
  makeFile(path(DevicePlace::Settings), "settings");
  expectSame(copyAside, "success");
}

TEST_F(SameAsTheDeviceTest, CopyingThroughALink) {
  makeFile("/var/settings", "settings");
  makeLink(path(DevicePlace::Settings), "/var/settings");
  expectSame(copyAside, "success");
}

TEST_F(SameAsTheDeviceTest, CopyingNothing) {
  expectSame(copyAside,
             "Cannot open " + path(DevicePlace::Settings) + ": No such file or directory");
}

TEST_F(SameAsTheDeviceTest, CopyingWhereTheSettingsHaveNoDirectory) {
  fs::remove(onHost("/var/mobile/Library/Preferences"));
  expectSame(copyAside,
             "Cannot open " + path(DevicePlace::Settings) + ": No such file or directory");
}

TEST_F(SameAsTheDeviceTest, CopyingADirectory) {
  makeDirectory(path(DevicePlace::Settings));
  expectSame(copyAside, "Cannot open " + path(DevicePlace::Settings) +
                            ": It is a directory, not a regular file");
}

TEST_F(SameAsTheDeviceTest, CopyingANamedPipe) {
  makeNamedPipe(path(DevicePlace::Settings));
  expectSame(copyAside, "Cannot open " + path(DevicePlace::Settings) +
                            ": It is a named pipe, not a regular file");
}

TEST_F(SameAsTheDeviceTest, CopyingOverWhatIsThere) {
  makeFile(path(DevicePlace::Settings), "settings");
  makeFile(path(DevicePlace::CopyAside), "older");
  expectSame(copyAside, "Cannot create " + path(DevicePlace::CopyAside) + ": File exists");
}

TEST_F(SameAsTheDeviceTest, CopyingOverALinkToNothing) {
  makeFile(path(DevicePlace::Settings), "settings");
  makeLink(path(DevicePlace::CopyAside), "/nowhere");
  expectSame(copyAside, "Cannot create " + path(DevicePlace::CopyAside) + ": File exists");
}

TEST_F(SameAsTheDeviceTest, CopyingWhereThereIsNoDirectory) {
  makeFile(path(DevicePlace::Settings), "settings");
  fs::remove_all(onHost("/var/mobile/Library/Logs"));
  expectSame(copyAside,
             "Cannot open /var/mobile/Library/Logs/CrashReporter: No such file or directory");
}

TEST_F(SameAsTheDeviceTest, CopyingToADirectoryThatMayNotBeWritten) {
  makeFile(path(DevicePlace::Settings), "settings");
  takeRights("/var/mobile/Library/Logs/CrashReporter", 0555);
  const WithoutPrivileges everyone;
  expectSame(copyAside, "Cannot create " + path(DevicePlace::CopyAside) + ": Permission denied");
}

TEST_F(SameAsTheDeviceTest, CopyingToADirectoryThatMayNotBeSearched) {
  makeFile(path(DevicePlace::Settings), "settings");
  takeRights("/var/mobile/Library/Logs/CrashReporter", 0);
  const WithoutPrivileges everyone;
  expectSame(copyAside, "Cannot create " + path(DevicePlace::CopyAside) + ": Permission denied");
}

TEST_F(SameAsTheDeviceTest, CopyingBeneathADirectoryThatMayNotBeSearched) {
  makeFile(path(DevicePlace::Settings), "settings");
  takeRights("/var/mobile/Library/Logs", 0);
  const WithoutPrivileges everyone;
  expectSame(copyAside, "Cannot open /var/mobile/Library/Logs/CrashReporter: Permission denied");
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFile) {
  expectSame(makeInformationFile, "success");
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFileWithItsDirectoryAndTheParentsOfThat) {
  fs::remove_all(onHost("/var/mobile/Library/Logs"));
  expectSame(makeInformationFile, "success");
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFileInADirectoryThatIsThere) {
  makeDirectory(path(DevicePlace::InformationDirectory));
  takeRights("/var/mobile/Library/Logs/CrashReporter", 0555);
  takeRights(path(DevicePlace::InformationDirectory), 0777);
  const WithoutPrivileges everyone;
  expectSame(makeInformationFile, "success");
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFileWhereItsDirectoryMayNotBeMade) {
  takeRights("/var/mobile/Library/Logs/CrashReporter", 0555);
  const WithoutPrivileges everyone;
  expectSame(makeInformationFile, "Cannot create the directory " +
                                      path(DevicePlace::InformationDirectory) +
                                      ": Permission denied");
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFileWhereAParentMayNotBeMade) {
  fs::remove_all(onHost("/var/mobile/Library/Logs"));
  takeRights("/var/mobile/Library", 0555);
  const WithoutPrivileges everyone;
  expectSame(makeInformationFile,
             "Cannot create the directory /var/mobile/Library/Logs: Permission denied");
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFileBeneathAParentThatMayNotBeSearched) {
  takeRights("/var/mobile/Library/Logs", 0);
  const WithoutPrivileges everyone;
  expectSame(makeInformationFile,
             "Cannot create the directory /var/mobile/Library/Logs/CrashReporter: "
             "Permission denied");
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFileWhereAParentIsAFile) {
  fs::remove_all(onHost("/var/mobile/Library/Logs"));
  makeFile("/var/mobile/Library/Logs", "a file");
  expectSame(makeInformationFile,
             "Cannot create the directory /var/mobile/Library/Logs: File exists");
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFileWhereAParentIsALinkToNothing) {
  fs::remove_all(onHost("/var/mobile/Library/Logs"));
  makeLink("/var/mobile/Library/Logs", "/nowhere");
  expectSame(makeInformationFile,
             "Cannot create the directory /var/mobile/Library/Logs: File exists");
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFileInADirectoryThatMayNotBeWritten) {
  makeDirectory(path(DevicePlace::InformationDirectory));
  takeRights(path(DevicePlace::InformationDirectory), 0555);
  const WithoutPrivileges everyone;
  expectBothRefuse(makeInformationFile);
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFileWhereItsDirectoryIsAFile) {
  makeFile(path(DevicePlace::InformationDirectory), "a file");
  expectBothRefuse(makeInformationFile);
}

TEST_F(SameAsTheDeviceTest, MakingAnInformationFileWhereItsDirectoryIsALinkToNothing) {
  makeLink(path(DevicePlace::InformationDirectory), "/nowhere");
  expectSame(makeInformationFile, "Cannot create the directory " +
                                      path(DevicePlace::InformationDirectory) + ": File exists");
}

}  // namespace
}  // namespace accounts
