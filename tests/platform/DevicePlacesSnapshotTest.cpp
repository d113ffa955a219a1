#include <linux/fs.h>
#include <sys/ioctl.h>

#include "tests/platform/DevicePlacesFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

class DevicePlacesSnapshotTest : public DevicePlacesTest {};

TEST_F(DevicePlacesSnapshotTest, AnEmptyDeviceHasNothingAndCanHaveEverything) {
  const DeviceSnapshot taken = snapshot();
  for (const ListedPlace& each : kDevicePlaces) {
    const PlaceState& state = taken.at(each.place);
    EXPECT_EQ(state.path, path(each.place));
    EXPECT_EQ(state.identity, FileIdentity()) << state.path;
    EXPECT_EQ(state.target, EntryKind::Nothing) << state.path;
    EXPECT_EQ(state.contents, nullptr);
    EXPECT_EQ(textOf(state.whyNotReplaced), "(none)");
    EXPECT_EQ(textOf(state.whyNotMade), "(none)");
    EXPECT_EQ(textOf(state.whyNotRemoved),
              "Cannot remove " + state.path + ": No such file or directory");
  }
  EXPECT_FALSE(taken.isReadOnly);
}

TEST_F(DevicePlacesSnapshotTest, AFileThatAMigrationReadsHasItsContents) {
  for (const DevicePlace place :
       {DevicePlace::Settings, DevicePlace::LegacyExchange, DevicePlace::LegacyMail,
        DevicePlace::LoggingPreferences, DevicePlace::CommitRecord}) {
    makeFile(path(place), "contents of " + path(place));
  }
  fs::permissions(hostPath(DevicePlace::Settings), fs::perms(0640));

  const DeviceSnapshot taken = snapshot();

  EXPECT_EQ(bytesOf(taken.at(DevicePlace::Settings)), "contents of " + path(DevicePlace::Settings));
  EXPECT_EQ(bytesOf(taken.at(DevicePlace::CommitRecord)),
            "contents of " + path(DevicePlace::CommitRecord));
  EXPECT_EQ(bytesOf(taken.at(DevicePlace::LoggingPreferences)),
            "contents of " + path(DevicePlace::LoggingPreferences));
  EXPECT_EQ(taken.at(DevicePlace::Settings).permissions, 0640u);
  EXPECT_EQ(textOf(taken.at(DevicePlace::Settings).whyNotRead), "(none)");
  EXPECT_EQ(textOf(taken.at(DevicePlace::Settings).whyNotRemoved), "(none)");
}

TEST_F(DevicePlacesSnapshotTest, ContentsAreThoseOfTheFileThatWasFoundWhateverTakesItsPlace) {
  makeFile(path(DevicePlace::Settings), "found");
  const DeviceSnapshot taken = snapshot();
  writeAsAnotherProgram(DevicePlace::Settings, "written meanwhile");
  EXPECT_EQ(bytesOf(taken.at(DevicePlace::Settings)), "found");
  EXPECT_EQ(bytesOf(taken.at(DevicePlace::Settings)), "found") << "as often as is asked for";
}

TEST_F(DevicePlacesSnapshotTest, AnIdentityTellsAFileFromAnotherOne) {
  makeFile(path(DevicePlace::Settings), "found");
  const FileIdentity found = snapshot().at(DevicePlace::Settings).identity;
  const struct stat status = statusOf(path(DevicePlace::Settings));
  EXPECT_EQ(found.kind, EntryKind::RegularFile);
  EXPECT_EQ(found.inode, status.st_ino);
  EXPECT_EQ(found.device, status.st_dev);
  EXPECT_EQ(found.size, 5u);
  EXPECT_EQ(found.mode, status.st_mode);
  EXPECT_EQ(found.modified, (FileTime{status.st_mtim.tv_sec, status.st_mtim.tv_nsec}));
  EXPECT_EQ(identity(DevicePlace::Settings), found);

  writeAsAnotherProgram(DevicePlace::Settings, "found");

  EXPECT_FALSE(identity(DevicePlace::Settings).isSameFileAs(found));
}

TEST_F(DevicePlacesSnapshotTest, ASecondNameChangesNothingButTheTimeOfTheChange) {
  makeFile(path(DevicePlace::Settings), "found");
  const FileIdentity found = snapshot().at(DevicePlace::Settings).identity;
  fs::create_hard_link(hostPath(DevicePlace::Settings), onHost("/second"));
  EXPECT_TRUE(identity(DevicePlace::Settings).isSameFileAs(found));
}

TEST_F(DevicePlacesSnapshotTest, ALinkInAFilesPlaceIsReadThrough) {
  makeFile("/var/elsewhere", "contents");
  makeLink(path(DevicePlace::Settings), "/var/elsewhere");

  const PlaceState state = snapshot().at(DevicePlace::Settings);

  EXPECT_EQ(state.identity.kind, EntryKind::Other);
  EXPECT_EQ(state.target, EntryKind::RegularFile);
  EXPECT_EQ(bytesOf(state), "contents");
}

TEST_F(DevicePlacesSnapshotTest, ALinkLeadsNowhereButToTheDevice) {
  makeHostFile(outside() / "secret", "of the host");
  makeLink(path(DevicePlace::Settings), outside() / "secret");
  const PlaceState state = snapshot().at(DevicePlace::Settings);
  EXPECT_EQ(state.target, EntryKind::Nothing);
  EXPECT_EQ(state.contents, nullptr);
}

TEST_F(DevicePlacesSnapshotTest, LinksInThePathAreFollowed) {
  fs::remove(onHost(kMail));
  makeDirectory("/private/mail");
  makeLink(kMail, "/private/mail");
  makeFile("/private/mail/Accounts.plist", "store");
  EXPECT_EQ(bytesOf(snapshot().at(DevicePlace::LegacyMail)), "store");
}

TEST_F(DevicePlacesSnapshotTest, AMissingDirectoryIsNoFailure) {
  fs::remove(onHost(kMail));
  const PlaceState state = snapshot().at(DevicePlace::LegacyMail);
  EXPECT_FALSE(state.identity.exists());
  EXPECT_EQ(textOf(state.whyNotReplaced),
            "Cannot open " + std::string(kMail) + ": No such file or directory");
  EXPECT_FALSE(identity(DevicePlace::LegacyMail).exists());
}

TEST_F(DevicePlacesSnapshotTest, ADirectoryInAFilesPlaceIsNeitherReadNorReplacedNorRemoved) {
  makeDirectory(path(DevicePlace::LegacyMail));
  const PlaceState state = snapshot().at(DevicePlace::LegacyMail);
  EXPECT_EQ(state.target, EntryKind::Directory);
  EXPECT_EQ(state.whyNotReplaced.value().number, EISDIR);
  EXPECT_EQ(state.whyNotRemoved.value().number, EISDIR);
  EXPECT_EQ(textOf(state.whyNotRead),
            "Cannot open " + state.path + ": It is a directory, not a regular file");
}

TEST_F(DevicePlacesSnapshotTest, ANamedPipeIsNotWaitedFor) {
  makeNamedPipe(path(DevicePlace::Settings));
  const PlaceState state = snapshot().at(DevicePlace::Settings);
  EXPECT_EQ(state.target, EntryKind::Other);
  EXPECT_EQ(textOf(state.whyNotRead),
            "Cannot open " + state.path + ": It is a named pipe, not a regular file");
  EXPECT_EQ(textOf(state.whyNotReplaced), "(none)");
}

TEST_F(DevicePlacesSnapshotTest, AFileThatMayNotBeReadIsAFailureAndNotAMissingOne) {
  makeFile(path(DevicePlace::LegacyMail), "store");
  fs::permissions(hostPath(DevicePlace::LegacyMail), fs::perms::none);
  const WithoutPrivileges everyone;
  EXPECT_EQ(whyNoSnapshot(),
            "Cannot open " + path(DevicePlace::LegacyMail) + ": Permission denied");
}

TEST_F(DevicePlacesSnapshotTest, ADirectoryThatMayNotBeSearchedIsAFailureWhereItDecides) {
  fs::permissions(onHost(kMail), fs::perms::none);
  const WithoutPrivileges everyone;
  EXPECT_EQ(whyNoSnapshot(),
            "Cannot examine " + path(DevicePlace::LegacyMail) + ": Permission denied");
}

TEST_F(DevicePlacesSnapshotTest, ADirectoryForEngineersThatMayNotBeSearchedIsNone) {
  fs::permissions(onHost(kCrashReporter), fs::perms::none);
  const WithoutPrivileges everyone;
  EXPECT_EQ(textOf(snapshot().at(DevicePlace::CopyAside).whyNotReplaced),
            "Cannot create " + path(DevicePlace::CopyAside) + ": Permission denied");
  EXPECT_FALSE(places.identityAt(DevicePlace::CopyAside))
      << "nothing can be told of it, which a restoration has to know";
}

TEST_F(DevicePlacesSnapshotTest, LinksThatLeadToOneAnotherAreAFailure) {
  makeLink(path(DevicePlace::Settings), path(DevicePlace::Settings));
  EXPECT_EQ(whyNoSnapshot(),
            "Cannot open " + path(DevicePlace::Settings) + ": Too many levels of symbolic links");
}

TEST_F(DevicePlacesSnapshotTest, AFileThatIsTooLargeIsAFailure) {
  makeFile(path(DevicePlace::Settings), "");
  fs::resize_file(hostPath(DevicePlace::Settings), (std::uintmax_t{1} << 30) + 1);
  EXPECT_EQ(whyNoSnapshot(), "Cannot read " + path(DevicePlace::Settings) + ": File too large");
}

TEST_F(DevicePlacesSnapshotTest, WhatIsNotReadNeedNotBeReadable) {
  makeFile(path(DevicePlace::CopyAside), "older");
  fs::permissions(hostPath(DevicePlace::CopyAside), fs::perms::none);
  const WithoutPrivileges everyone;
  EXPECT_EQ(snapshot().at(DevicePlace::CopyAside).target, EntryKind::RegularFile);
}

TEST_F(DevicePlacesSnapshotTest, TwoPlacesThatAreOneFileAreAFailure) {
  fs::remove_all(onHost(kCrashReporter));
  makeLink(kCrashReporter, kPreferences);
  EXPECT_EQ(whyNoSnapshot(), path(DevicePlace::Settings) + " and " + path(DevicePlace::CopyAside) +
                                 " are one file: their directories lead to one another");
}

TEST_F(DevicePlacesSnapshotTest, OneDirectoryForPlacesWithDifferentNamesIsNoFailure) {
  fs::remove_all(onHost(kMail));
  makeLink(kMail, kPreferences);
  EXPECT_EQ(whyNoSnapshot(), "(there is one)");
}

TEST_F(DevicePlacesSnapshotTest, ADirectoryThatMayNotBeWrittenRefusesAllChanges) {
  makeFile(path(DevicePlace::LegacyMail), "store");
  fs::permissions(hostPath(DevicePlace::LegacyMail), fs::perms(0644));
  fs::permissions(onHost(kMail), fs::perms(0555));
  const WithoutPrivileges everyone;
  const DeviceSnapshot taken = snapshot();
  EXPECT_EQ(taken.at(DevicePlace::LegacyMail).whyNotRemoved.value().number, EACCES);
  EXPECT_EQ(taken.at(DevicePlace::LegacyMail).whyNotReplaced.value().number, EACCES);
  EXPECT_EQ(taken.at(DevicePlace::AutoFetchEnabled).whyNotReplaced.value().number, EACCES);
}

TEST_F(DevicePlacesSnapshotTest, InASharedDirectoryOnlyOnesOwnFilesAreChanged) {
  makeFile(path(DevicePlace::LegacyMail), "store");
  fs::permissions(hostPath(DevicePlace::LegacyMail), fs::perms(0666));
  fs::permissions(onHost(kMail), fs::perms(01777));
  EXPECT_EQ(textOf(snapshot().at(DevicePlace::LegacyMail).whyNotRemoved), "(none)")
      << "the superuser changes all";
  const WithoutPrivileges everyone;
  makeHostFile(hostPath(DevicePlace::AutoFetchEnabled), "");
  const DeviceSnapshot taken = snapshot();
  EXPECT_EQ(taken.at(DevicePlace::LegacyMail).whyNotRemoved.value().number, EPERM);
  EXPECT_EQ(taken.at(DevicePlace::LegacyMail).whyNotReplaced.value().number, EPERM);
  EXPECT_EQ(textOf(taken.at(DevicePlace::AutoFetchEnabled).whyNotRemoved), "(none)");
}

TEST_F(DevicePlacesSnapshotTest, ALinkThatMayNotBeWrittenThroughIsStillReplaced) {
  makeFile("/var/elsewhere", "contents");
  fs::permissions(onHost("/var/elsewhere"), fs::perms(0444));
  makeLink(path(DevicePlace::CopyAside), "/var/elsewhere");
  EXPECT_EQ(textOf(snapshot().at(DevicePlace::CopyAside).whyNotReplaced), "(none)");
}

/// Makes something immutable; does nothing where the file system knows no such thing.
class Immutable {
 public:
  explicit Immutable(const fs::path& path) : file_(::open(path.c_str(), O_RDONLY | O_CLOEXEC)) {
    isSet_ = set(FS_IMMUTABLE_FL);
  }
  ~Immutable() { (void)set(0); }
  Immutable(const Immutable&) = delete;
  Immutable& operator=(const Immutable&) = delete;
  [[nodiscard]] bool isSet() const { return isSet_; }

 private:
  [[nodiscard]] bool set(int flag) const {
    int flags = 0;
    if (::ioctl(file_.number(), FS_IOC_GETFLAGS, &flags) != 0) {
      return false;
    }
    flags = (flags & ~FS_IMMUTABLE_FL) | flag;
    return ::ioctl(file_.number(), FS_IOC_SETFLAGS, &flags) == 0;
  }

  FileDescriptor file_;
  bool isSet_ = false;
};

TEST_F(DevicePlacesSnapshotTest, AnImmutableFileIsNeitherReplacedNorRemoved) {
  makeFile(path(DevicePlace::LegacyMail), "store");
  const Immutable immutable(hostPath(DevicePlace::LegacyMail));
  if (!immutable.isSet()) {
    GTEST_SKIP() << "Nothing can be made immutable here.";
  }
  const PlaceState state = snapshot().at(DevicePlace::LegacyMail);
  EXPECT_EQ(state.whyNotReplaced.value().number, EPERM);
  EXPECT_EQ(state.whyNotRemoved.value().number, EPERM);
  EXPECT_EQ(bytesOf(state), "store");
  EXPECT_EQ(wordOf(places.remove(DevicePlace::LegacyMail, state.identity)),
            textOf(state.whyNotRemoved))
      << "which is what the device says";
}

TEST_F(DevicePlacesSnapshotTest, AnImmutableDirectoryRefusesAllChanges) {
  const Immutable immutable(onHost(kMail));
  if (!immutable.isSet()) {
    GTEST_SKIP() << "Nothing can be made immutable here.";
  }
  EXPECT_EQ(snapshot().at(DevicePlace::LegacyMail).whyNotReplaced.value().number, EPERM);
}

}  // namespace
}  // namespace accounts
