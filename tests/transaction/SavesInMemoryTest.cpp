#include "tests/transaction/TransactionFixture.h"

namespace accounts {
namespace {

using SavesInMemoryTest = TransactionTest;

const PropertyDictionary kOld = {{"Version", 11}};
const PropertyDictionary kNew = {{"Version", 12}};

TEST_F(SavesInMemoryTest, WithoutASaveThereIsNone) {
  EXPECT_EQ(transaction.lastSave(), LastSave::None);
  EXPECT_EQ(transaction.saveFailure(), std::nullopt);
}

TEST_F(SavesInMemoryTest, ASaveIsWrittenWhenItHasItsPlace) {
  ASSERT_TRUE(save(kNew));
  EXPECT_EQ(transaction.lastSave(), LastSave::Written);
  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), kNew);
}

TEST_F(SavesInMemoryTest, ASaveThatHasNotGotItsPlaceFailed) {
  ASSERT_TRUE(files.makeTemporaryFile());
  EXPECT_EQ(transaction.lastSave(), LastSave::Failed);
}

TEST_F(SavesInMemoryTest, ASaveThatFailsAfterOneThatWasWrittenCounts) {
  ASSERT_TRUE(save(kOld));
  const std::string temporary = files.makeTemporaryFile().value();
  ASSERT_FALSE(files.setOwnerAndGroup(temporary, "root", "wheel"));
  ASSERT_TRUE(files.removeFile(temporary));

  EXPECT_EQ(transaction.lastSave(), LastSave::Failed);
  EXPECT_EQ(transaction.saveFailure(), "Not to root");
  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), kOld);
}

TEST_F(SavesInMemoryTest, ASaveThatIsWrittenAfterOneThatFailedCounts) {
  ASSERT_TRUE(files.makeTemporaryFile());
  ASSERT_TRUE(save(kNew));
  EXPECT_EQ(transaction.lastSave(), LastSave::Written);
}

TEST_F(SavesInMemoryTest, ASettingsFileThatCannotBeReplacedSaysWhyTheSaveFailed) {
  snapshot.addPropertyList(DevicePlace::Settings, kOld);
  snapshot[DevicePlace::Settings].whyNotReplaced = Failure{EROFS, "Cannot create it: why"};

  const Result result = save(kNew);

  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot create it: why");
  EXPECT_EQ(transaction.lastSave(), LastSave::Failed);
  EXPECT_EQ(transaction.saveFailure(), "Cannot create it: why");
  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), kOld);
}

TEST_F(SavesInMemoryTest, OnlyWhatIsAboutToBePutInPlaceIsGivenAway) {
  snapshot.addFile(DevicePlace::Settings, "");
  EXPECT_EQ(
      files.setOwnerAndGroup(path(DevicePlace::Settings), "mobile", "mobile").error().text,
      "Cannot set the owner of " + path(DevicePlace::Settings) + ": No such file or directory");
}

TEST_F(SavesInMemoryTest, AListThatIsWrittenToAPlaceAtOnceStandsThere) {
  ASSERT_TRUE(files.writeFileAtomically(path(DevicePlace::Settings), serialized(kNew)));
  EXPECT_EQ(transaction.dictionaryAt(DevicePlace::Settings), kNew);
}

TEST_F(SavesInMemoryTest, AWrittenListStaysTheValueThatItWas) {
  PropertyDictionary value = kNew;
  const SerializedPropertyList list = serialized(value);
  const std::string temporary = files.makeTemporaryFile().value();
  ASSERT_TRUE(files.writeFile(temporary, list));
  value.set("Version", 13);
  ASSERT_TRUE(files.renameFile(temporary, path(DevicePlace::Settings)));

  const auto read = transaction.dictionaryAt(DevicePlace::Settings);
  ASSERT_TRUE(read);
  EXPECT_TRUE(read->isSameAs(*list.value()->asDictionary())) << "read without bytes";
  EXPECT_EQ(*read, kNew);
}

TEST_F(SavesInMemoryTest, TheBytesOfAChangeAreMadeWheneverTheyAreAskedFor) {
  ASSERT_TRUE(save(kNew));
  const SerializedPropertyList list =
      std::get<SerializedPropertyList>(transaction.changes().at(0).contents);
  ASSERT_TRUE(save(kOld));

  EXPECT_EQ(bytesOf(list), writeBinaryPropertyList(kNew));
  EXPECT_EQ(bytesOf(list), bytesOf(list));
}

}  // namespace
}  // namespace accounts
