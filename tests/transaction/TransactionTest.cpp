#include "transaction/Transaction.h"

#include "tests/transaction/TransactionFixture.h"

namespace accounts {
namespace {

using Lines = std::vector<std::string>;

const PropertyDictionary kListBefore = {{"Version", 11}};
const PropertyDictionary kListAfter = {{"Version", 12}};

TEST_F(TransactionTest, EveryPlaceIsFoundByItsPath) {
  for (const ListedPlace& each : kDevicePlaces) {
    EXPECT_EQ(transaction.placeOf(path(each.place)), each.place);
  }
}

TEST_F(TransactionTest, APathThatIsNotListedIsNoPlace) {
  for (const char* other : {"", "/", "/var/mobile/Library/Mail", "/etc/passwd",
                            "/var/mobile/Library/Mail/../Mail/Accounts.plist"}) {
    EXPECT_EQ(transaction.placeOf(other), std::nullopt) << other;
  }
}

TEST_F(TransactionTest, PlacesFollowTheHomeDirectory) {
  const Transaction elsewhere(snapshot, "/private/home/");
  EXPECT_EQ(elsewhere.placeOf("/private/home/Library/Mail/Accounts.plist"),
            DevicePlace::LegacyMail);
  EXPECT_EQ(elsewhere.placeOf(path(DevicePlace::Settings)), DevicePlace::Settings);
  EXPECT_EQ(elsewhere.placeOf(path(DevicePlace::LegacyMail)), std::nullopt);
}

TEST_F(TransactionTest, APlaceExistsWhenItsPathLeadsToSomething) {
  snapshot.addFile(DevicePlace::Settings, "");
  snapshot.addEntry(DevicePlace::LegacyMail, EntryKind::Other);
  snapshot[DevicePlace::LegacyMail].target = EntryKind::Nothing;

  EXPECT_TRUE(transaction.exists(DevicePlace::Settings));
  EXPECT_FALSE(transaction.exists(DevicePlace::LegacyMail)) << "a link to nothing";
  EXPECT_FALSE(transaction.exists(DevicePlace::CopyAside));
}

TEST_F(TransactionTest, ADictionaryIsReadAsTheSnapshotHasIt) {
  snapshot.addPropertyList(DevicePlace::Settings, kListBefore);
  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), kListBefore);
}

TEST_F(TransactionTest, AFileIsReadOnce) {
  const auto bytes = std::make_shared<const FakeBytes>(*writeBinaryPropertyList(kListBefore));
  snapshot.addFile(DevicePlace::Settings, "");
  snapshot[DevicePlace::Settings].contents = bytes;

  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), kListBefore);
  EXPECT_EQ(transaction.dictionaryBefore(DevicePlace::Settings), kListBefore);

  EXPECT_EQ(bytes->readings, 1);
}

TEST_F(TransactionTest, WhatIsMissingOrMalformedHoldsNoDictionaryAndIsNoFailure) {
  snapshot.addFile(DevicePlace::Settings, "no property list");
  snapshot.addPropertyList(DevicePlace::LegacyMail, PropertyArray{kListBefore});

  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), std::nullopt);
  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::LegacyMail), std::nullopt);
  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::LegacyExchange), std::nullopt);
  EXPECT_FALSE(transaction.readFailure());
}

TEST_F(TransactionTest, AFileThatCannotBeReadIsRememberedAndNotTakenForMissing) {
  snapshot.addFailingFile(DevicePlace::LegacyMail);
  snapshot.addFailingFile(DevicePlace::Settings);

  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::LegacyMail), std::nullopt);
  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), std::nullopt);

  ASSERT_TRUE(transaction.readFailure());
  EXPECT_EQ(transaction.readFailure()->number, EIO);
  EXPECT_EQ(transaction.readFailure()->text,
            "Cannot read /var/mobile/Library/Mail/Accounts.plist: Input/output error");
  EXPECT_TRUE(transaction.exists(DevicePlace::LegacyMail));
}

TEST_F(TransactionTest, AFailureStaysRememberedWhenTheFileIsWrittenAnew) {
  snapshot.addFailingFile(DevicePlace::Settings);
  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), std::nullopt);

  ASSERT_TRUE(save(kListAfter));

  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), kListAfter);
  EXPECT_TRUE(transaction.readFailure());
}

TEST_F(TransactionTest, TheSnapshotStaysReadableBesideWhatIsWritten) {
  snapshot.addPropertyList(DevicePlace::Settings, kListBefore);
  ASSERT_TRUE(save(kListAfter));

  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), kListAfter);
  EXPECT_EQ(transaction.dictionaryBefore(DevicePlace::Settings), kListBefore);
}

TEST_F(TransactionTest, NothingDoneIsNoChange) {
  for (const ListedPlace& each : kDevicePlaces) {
    snapshot.addFile(each.place, "");
  }
  EXPECT_EQ(changes(), Lines{});
}

TEST_F(TransactionTest, ChangesComeInTheOrderOfThePlacesWhateverTheOrderOfDoing) {
  snapshot.addPropertyList(DevicePlace::Settings, kListBefore);
  snapshot.addFile(DevicePlace::LegacyMail, "");
  snapshot.addFile(DevicePlace::AutoFetchEnabled, "");
  snapshot.addEntry(DevicePlace::InformationDirectory, EntryKind::Directory);
  snapshot[DevicePlace::InformationDirectory].whyNotReplaced.reset();

  EXPECT_TRUE(files.removeFile(path(DevicePlace::AutoFetchEnabled)));
  EXPECT_TRUE(files.writeFileAtomically(path(DevicePlace::InformationDirectory) + "/file.txt",
                                        serialized(kListBefore)));
  EXPECT_TRUE(files.removeFile(path(DevicePlace::LegacyMail)));
  EXPECT_TRUE(files.copyFile(path(DevicePlace::Settings), path(DevicePlace::CopyAside)));
  EXPECT_TRUE(save(kListAfter));

  EXPECT_EQ(changes(), (Lines{"write Settings", "remove LegacyMail", "copy CopyAside",
                              "remove AutoFetchEnabled", "write InformationDirectory"}));
}

TEST_F(TransactionTest, WhatCameAndWentInMemoryIsNoChange) {
  EXPECT_TRUE(files.createFile(path(DevicePlace::RemovalSentinel), "removing"));
  EXPECT_TRUE(files.removeFile(path(DevicePlace::RemovalSentinel)));
  EXPECT_EQ(changes(), Lines{});
}

TEST_F(TransactionTest, ASentinelThatStoodThereIsRemoved) {
  snapshot.addFile(DevicePlace::RemovalSentinel, "of an interrupted removal");
  EXPECT_TRUE(files.createFile(path(DevicePlace::RemovalSentinel), "removing"));
  EXPECT_TRUE(files.removeFile(path(DevicePlace::RemovalSentinel)));
  EXPECT_EQ(changes(), Lines{"remove RemovalSentinel"});
}

TEST_F(TransactionTest, ASentinelIsForWhoeverCommitsToMake) {
  EXPECT_TRUE(files.createFile(path(DevicePlace::RemovalSentinel), "removing"));
  EXPECT_EQ(changes(), Lines{});
}

TEST_F(TransactionTest, OfSeveralSavesTheLastIsTheChange) {
  ASSERT_TRUE(save(kListBefore));
  ASSERT_TRUE(save(kListAfter));

  const std::vector<PlaceChange> all = transaction.changes();
  ASSERT_EQ(all.size(), 1u);
  EXPECT_EQ(*std::get<SerializedPropertyList>(all[0].contents).value(), PropertyValue(kListAfter));
}

TEST_F(TransactionTest, AChangeSaysWhoTheFileIsToBelongTo) {
  const std::string temporary = files.makeTemporaryFile().value();
  ASSERT_TRUE(files.writeFile(temporary, serialized(kListAfter)));
  ASSERT_TRUE(files.setOwnerAndGroup(temporary, "mobile", "mobile"));
  ASSERT_TRUE(files.renameFile(temporary, path(DevicePlace::Settings)));

  EXPECT_EQ(transaction.changes().at(0).owner, (FileOwner{501, 502}));
}

TEST_F(TransactionTest, AnInformationDirectoryWithoutAFileIsAChangeToo) {
  ASSERT_TRUE(
      files.createDirectoryWithIntermediates(path(DevicePlace::InformationDirectory), 0777));

  EXPECT_EQ(changes(), Lines{"make InformationDirectory"});
}

TEST_F(TransactionTest, AChangeOfTheInformationDirectoryNamesItsFile) {
  ASSERT_TRUE(
      files.createDirectoryWithIntermediates(path(DevicePlace::InformationDirectory), 0777));
  ASSERT_TRUE(files.writeFileAtomically(path(DevicePlace::InformationDirectory) + "/name.txt",
                                        serialized(kListBefore)));

  EXPECT_EQ(transaction.changes().at(0).fileName, "name.txt");
  EXPECT_EQ(changes(), Lines{"write InformationDirectory"});
}

}  // namespace
}  // namespace accounts
