#include "transaction/TransactionFileSystem.h"

#include "tests/transaction/TransactionFixture.h"

namespace accounts {
namespace {

using TransactionFileSystemTest = TransactionTest;

const PropertyDictionary kOldVersion = {{"Version", 11}};
const PropertyDictionary kNewVersion = {{"Version", 12}};

TEST_F(TransactionFileSystemTest, APathThatIsNotListedIsAnErrorOfTheProgram) {
  const std::string foreign = "/etc/passwd";
  const std::string settings = path(DevicePlace::Settings);
  EXPECT_THROW(static_cast<void>(files.fileExists(foreign)), MetForeignPath);
  EXPECT_THROW(static_cast<void>(files.isDirectory(foreign)), MetForeignPath);
  EXPECT_THROW(static_cast<void>(files.copyFile(foreign, settings)), MetForeignPath);
  EXPECT_THROW(static_cast<void>(files.copyFile(settings, foreign)), MetForeignPath);
  EXPECT_THROW(static_cast<void>(files.removeFile(foreign)), MetForeignPath);
  EXPECT_THROW(static_cast<void>(files.createFile(foreign, "")), MetForeignPath);
  EXPECT_THROW(static_cast<void>(files.createDirectoryWithIntermediates(foreign, 0777)),
               MetForeignPath);
  EXPECT_THROW(static_cast<void>(files.writeFile(foreign, serialized(kOldVersion))),
               MetForeignPath);
  EXPECT_THROW(static_cast<void>(files.renameFile(files.makeTemporaryFile().value(), foreign)),
               MetForeignPath);
}

TEST_F(TransactionFileSystemTest, AnErrorOfTheProgramIsToldWithThePath) {
  try {
    static_cast<void>(files.fileExists("/etc/passwd"));
    FAIL();
  } catch (const MetForeignPath& met) {
    EXPECT_EQ(met.path, "/etc/passwd");
  }
}

TEST_F(TransactionFileSystemTest, AFileThatIsRemovedIsGone) {
  snapshot.addFile(DevicePlace::LegacyMail, "store");
  EXPECT_TRUE(files.removeFile(path(DevicePlace::LegacyMail)));

  EXPECT_FALSE(files.fileExists(path(DevicePlace::LegacyMail)));
  const Result again = files.removeFile(path(DevicePlace::LegacyMail));
  ASSERT_FALSE(again);
  EXPECT_EQ(again.error().text,
            "Cannot remove /var/mobile/Library/Mail/Accounts.plist: "
            "No such file or directory");
}

TEST_F(TransactionFileSystemTest, WhatTheDeviceWouldNotRemoveStays) {
  snapshot.addFile(DevicePlace::LegacyMail, "store");
  snapshot[DevicePlace::LegacyMail].whyNotRemoved = Failure{EPERM, "Cannot remove it: why"};

  const Result result = files.removeFile(path(DevicePlace::LegacyMail));

  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot remove it: why");
  EXPECT_TRUE(files.fileExists(path(DevicePlace::LegacyMail)));
}

TEST_F(TransactionFileSystemTest, WhatTheDeviceWouldNotReplaceIsNotMade) {
  snapshot[DevicePlace::RemovalSentinel].whyNotReplaced = Failure{EACCES, "why"};

  const Result result = files.createFile(path(DevicePlace::RemovalSentinel), "removing");

  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "why");
  EXPECT_FALSE(files.fileExists(path(DevicePlace::RemovalSentinel)));
}

TEST_F(TransactionFileSystemTest, ACopyHoldsWhatTheSettingsFileHeldThen) {
  snapshot.addPropertyList(DevicePlace::Settings, kOldVersion);
  ASSERT_TRUE(files.copyFile(path(DevicePlace::Settings), path(DevicePlace::CopyAside)));
  ASSERT_TRUE(save(kNewVersion));

  EXPECT_TRUE(files.fileExists(path(DevicePlace::CopyAside)));
  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::CopyAside), kOldVersion);
}

TEST_F(TransactionFileSystemTest, NothingIsCopiedFromNothing) {
  const Result result = files.copyFile(path(DevicePlace::Settings), path(DevicePlace::CopyAside));
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, snapshot.at(DevicePlace::Settings).whyNotRead->text);
  EXPECT_FALSE(files.fileExists(path(DevicePlace::CopyAside)));
}

TEST_F(TransactionFileSystemTest, NothingIsCopiedFromWhatWasRemoved) {
  snapshot.addPropertyList(DevicePlace::Settings, kOldVersion);
  ASSERT_TRUE(files.removeFile(path(DevicePlace::Settings)));
  EXPECT_FALSE(files.copyFile(path(DevicePlace::Settings), path(DevicePlace::CopyAside)));
}

TEST_F(TransactionFileSystemTest, NothingIsCopiedOverWhatIsThere) {
  snapshot.addPropertyList(DevicePlace::Settings, kOldVersion);
  snapshot.addFile(DevicePlace::CopyAside, "older");

  const Result result = files.copyFile(path(DevicePlace::Settings), path(DevicePlace::CopyAside));

  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text,
            "Cannot create /var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist: "
            "File exists");
}

TEST_F(TransactionFileSystemTest, NothingIsCopiedOverALinkToNothing) {
  snapshot.addPropertyList(DevicePlace::Settings, kOldVersion);
  snapshot.addEntry(DevicePlace::CopyAside, EntryKind::Other);
  snapshot[DevicePlace::CopyAside].target = EntryKind::Nothing;
  EXPECT_FALSE(files.copyFile(path(DevicePlace::Settings), path(DevicePlace::CopyAside)));
}

TEST_F(TransactionFileSystemTest, ACopyTakesThePlaceOfWhatWasRemoved) {
  snapshot.addPropertyList(DevicePlace::Settings, kOldVersion);
  snapshot.addFile(DevicePlace::CopyAside, "older");
  ASSERT_TRUE(files.removeFile(path(DevicePlace::CopyAside)));
  EXPECT_TRUE(files.copyFile(path(DevicePlace::Settings), path(DevicePlace::CopyAside)));
  EXPECT_EQ(changes(), std::vector<std::string>{"copy CopyAside"});
}

TEST_F(TransactionFileSystemTest, OnlyTheSettingsFileIsCopied) {
  snapshot.addFile(DevicePlace::LegacyMail, "store");
  EXPECT_EQ(
      files.copyFile(path(DevicePlace::LegacyMail), path(DevicePlace::CopyAside)).error().text,
      "Cannot copy " + path(DevicePlace::LegacyMail) + ": Operation not supported");
  EXPECT_EQ(changes(), std::vector<std::string>{});
}

TEST_F(TransactionFileSystemTest, TheInformationDirectoryIsMadeOnce) {
  const std::string directory = path(DevicePlace::InformationDirectory);
  EXPECT_FALSE(files.fileExists(directory));
  EXPECT_FALSE(files.isDirectory(directory));

  EXPECT_TRUE(files.createDirectoryWithIntermediates(directory, 0777));

  EXPECT_TRUE(files.fileExists(directory));
  EXPECT_TRUE(files.isDirectory(directory));
  const Result again = files.createDirectoryWithIntermediates(directory, 0777);
  ASSERT_FALSE(again);
  EXPECT_EQ(again.error().text, "Cannot create the directory " + directory + ": File exists");
}

TEST_F(TransactionFileSystemTest, AnInformationDirectoryThatCannotBeMadeSaysWhy) {
  snapshot[DevicePlace::InformationDirectory].whyNotMade = Failure{EACCES, "why"};
  const Result result =
      files.createDirectoryWithIntermediates(path(DevicePlace::InformationDirectory), 0777);
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "why");
  EXPECT_FALSE(files.isDirectory(path(DevicePlace::InformationDirectory)));
}

TEST_F(TransactionFileSystemTest, NoInformationFileIsMadeWithoutItsDirectory) {
  const std::string directory = path(DevicePlace::InformationDirectory);
  const Result result = files.writeFileAtomically(directory + "/name.txt", serialized(kOldVersion));
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot open " + directory + ": No such file or directory");
  EXPECT_EQ(changes(), std::vector<std::string>{});
}

TEST_F(TransactionFileSystemTest, NoInformationFileIsMadeInADirectoryThatMayNotBeWritten) {
  snapshot.addEntry(DevicePlace::InformationDirectory, EntryKind::Directory);
  snapshot[DevicePlace::InformationDirectory].whyNotReplaced = Failure{EACCES, "why"};
  const Result result = files.writeFileAtomically(
      path(DevicePlace::InformationDirectory) + "/name.txt", serialized(kOldVersion));
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "why");
}

TEST_F(TransactionFileSystemTest, ADirectoryInAFilesPlaceIsOne) {
  snapshot.addEntry(DevicePlace::Settings, EntryKind::Directory);
  EXPECT_TRUE(files.isDirectory(path(DevicePlace::Settings)));
  EXPECT_TRUE(files.fileExists(path(DevicePlace::Settings)));
  EXPECT_FALSE(files.removeFile(path(DevicePlace::Settings)));
  EXPECT_FALSE(save(kNewVersion));
}

TEST_F(TransactionFileSystemTest, TemporaryFilesHaveNamesOfTheirOwn) {
  const std::string first = files.makeTemporaryFile().value();
  EXPECT_NE(files.makeTemporaryFile(), first);
  EXPECT_TRUE(files.fileExists(first));
  EXPECT_TRUE(files.removeFile(first));
  EXPECT_THROW(static_cast<void>(files.fileExists(first)), MetForeignPath);
  EXPECT_EQ(changes(), std::vector<std::string>{});
}

TEST_F(TransactionFileSystemTest, ATemporaryFileTakesItsPlaceOnce) {
  const std::string temporary = files.makeTemporaryFile().value();
  ASSERT_TRUE(files.writeFile(temporary, serialized(kNewVersion)));
  ASSERT_TRUE(files.renameFile(temporary, path(DevicePlace::Settings)));
  const Result again = files.renameFile(temporary, path(DevicePlace::Settings));
  ASSERT_FALSE(again);
  EXPECT_EQ(again.error().text, "Cannot open " + temporary + ": No such file or directory");
}

}  // namespace
}  // namespace accounts
