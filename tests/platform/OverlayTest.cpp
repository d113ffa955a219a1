#include <gtest/gtest.h>

#include "platform/overlay/OverlayFileSystem.h"
#include "platform/overlay/OverlayPropertyLists.h"
#include "platform/overlay/OverlaySharedResources.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/PlainContents.h"

namespace accounts {
namespace {

class AnybodysFiles final : public OwnershipRule {
 public:
  Result canGive(std::string_view /*ownerName*/, std::string_view groupName) override {
    return groupName == "mobile" ? Result::success() : Result::failure("not to them");
  }
};

/// An overlay over a device that holds /var/a with the text "a".
class Overlay : public testing::Test {
 protected:
  Overlay() {
    device.fileSystem.addFile("/var/a", "a");
    device.fileSystem.addDirectory("/tmp");
    before_ = device.fileSystem.files;
  }
  ~Overlay() override {
    // Whatever a test did, it did in memory.
    EXPECT_EQ(device.fileSystem.files.size(), before_.size());
    for (const auto& [path, file] : before_) {
      EXPECT_EQ(device.fileSystem.files[path].contents, file.contents) << path;
    }
  }

  [[nodiscard]] std::string contents(std::string_view path) const {
    const OverlayFileSystem::Contents found = files.contentsOf(path);
    if (const auto* inMemory = std::get_if<OverlayFileSystem::InMemory>(&found)) {
      return *inMemory->bytes;
    }
    const auto* beneath = std::get_if<OverlayFileSystem::Beneath>(&found);
    return beneath != nullptr ? "beneath " + beneath->path : "missing";
  }

  FakePlatform device;
  AnybodysFiles ownership;
  OverlayFileSystem files{device.fileSystem, ownership, "/var/tmp"};

 private:
  std::map<std::string, FakeFile, std::less<>> before_;
};

TEST_F(Overlay, ShowsWhatIsBeneath) {
  EXPECT_TRUE(files.fileExists("/var/a"));
  EXPECT_FALSE(files.fileExists("/var/b"));
  EXPECT_TRUE(files.isDirectory("/var"));
  EXPECT_EQ(files.kindOfEntry("/var/a"), EntryKind::RegularFile);
  EXPECT_EQ(contents("/var/a"), "beneath /var/a");
}

TEST_F(Overlay, AFileThatIsRemovedIsGone) {
  EXPECT_TRUE(files.removeFile("/var/a"));
  EXPECT_FALSE(files.fileExists("/var/a"));
  EXPECT_EQ(files.kindOfEntry("/var/a"), EntryKind::Nothing);
  EXPECT_EQ(contents("/var/a"), "missing");
  EXPECT_FALSE(files.removeFile("/var/a"));
}

TEST_F(Overlay, ADirectoryIsNotRemovedAsAFile) {
  EXPECT_FALSE(files.removeFile("/tmp"));
  EXPECT_TRUE(files.isDirectory("/tmp"));
}

TEST_F(Overlay, AFileThatIsWrittenHoldsWhatWasWritten) {
  EXPECT_TRUE(files.writeFile("/var/a", plainContents("new")));
  EXPECT_EQ(contents("/var/a"), "new");
  EXPECT_TRUE(files.writeFileAtomically("/var/b", plainContents("b")));
  EXPECT_EQ(contents("/var/b"), "b");
}

TEST_F(Overlay, AFileCannotBeMadeWithoutItsDirectoryOrInItsPlace) {
  EXPECT_FALSE(files.createFile("/none/a", ""));
  EXPECT_FALSE(files.createFile("/tmp", ""));
}

TEST_F(Overlay, ACopyHoldsWhatItsSourceHeldThen) {
  EXPECT_TRUE(files.copyFile("/var/a", "/var/b"));
  EXPECT_TRUE(files.writeFile("/var/a", plainContents("new")));
  EXPECT_EQ(contents("/var/b"), "beneath /var/a");
}

TEST_F(Overlay, NothingIsCopiedOverAFileOrFromNothing) {
  EXPECT_TRUE(files.writeFile("/var/b", plainContents("b")));
  EXPECT_FALSE(files.copyFile("/var/a", "/var/b"));
  EXPECT_FALSE(files.copyFile("/var/none", "/var/c"));
}

TEST_F(Overlay, ATemporaryFileTakesAnotherOnesPlace) {
  const std::optional<std::string> temporary = files.makeTemporaryFile();
  ASSERT_TRUE(temporary);
  EXPECT_TRUE(files.writeFile(*temporary, plainContents("new")));
  EXPECT_TRUE(files.renameFile(*temporary, "/var/a"));
  EXPECT_EQ(contents("/var/a"), "new");
  EXPECT_FALSE(files.fileExists(*temporary));
}

TEST_F(Overlay, MakesNoTemporaryFileWhereItsDirectoryHasNoParent) {
  OverlayFileSystem elsewhere(device.fileSystem, ownership, "/none/at/all");
  EXPECT_FALSE(elsewhere.makeTemporaryFile());
}

TEST_F(Overlay, TwoTemporaryFilesHaveTwoNames) {
  EXPECT_NE(files.makeTemporaryFile(), files.makeTemporaryFile());
}

TEST_F(Overlay, DirectoriesAreMadeWithTheirParents) {
  EXPECT_TRUE(files.createDirectoryWithIntermediates("/var/x/y", 0777));
  EXPECT_TRUE(files.isDirectory("/var/x"));
  EXPECT_TRUE(files.createFile("/var/x/y/z", "z"));
  EXPECT_FALSE(files.createDirectoryWithIntermediates("/var/x", 0777));
  EXPECT_FALSE(files.createDirectoryWithIntermediates("/var/a/b", 0777));
}

TEST_F(Overlay, ADirectoryListsWhatIsInItNow) {
  static_cast<void>(files.createFile("/var/b", ""));
  static_cast<void>(files.removeFile("/var/a"));
  const auto names = files.directoryEntries("/var");
  ASSERT_TRUE(names);
  EXPECT_EQ(std::count(names->begin(), names->end(), "a"), 0);
  EXPECT_EQ(std::count(names->begin(), names->end(), "b"), 1);
  EXPECT_FALSE(files.directoryEntries("/none"));
}

TEST_F(Overlay, OnlyAnEmptyDirectoryIsRemoved) {
  static_cast<void>(files.createDirectoryWithIntermediates("/var/x/y", 0777));
  EXPECT_FALSE(files.removeDirectory("/var/x"));
  EXPECT_TRUE(files.removeDirectory("/var/x/y"));
  EXPECT_TRUE(files.removeDirectory("/var/x"));
}

TEST_F(Overlay, NoDirectoryIsMoved) {
  EXPECT_FALSE(files.renameDirectory("/tmp", "/var/tmp"));
}

TEST_F(Overlay, AFileIsGivenToWhoeverMayHaveIt) {
  EXPECT_TRUE(files.setOwnerAndGroup("/var/a", "mobile", "mobile"));
  EXPECT_FALSE(files.setOwnerAndGroup("/var/a", "mobile", "wheel"));
  EXPECT_FALSE(files.setOwnerAndGroup("/var/none", "mobile", "mobile"));
}

TEST_F(Overlay, FilesThatAreTheSameBeneathAreTheSame) {
  static_cast<void>(files.linkFile("/var/a", "/var/b"));
  EXPECT_TRUE(files.haveSameContents("/var/a", "/var/b"));
  static_cast<void>(files.writeFile("/var/b", plainContents("b")));
  EXPECT_FALSE(files.haveSameContents("/var/a", "/var/b"));
}

TEST_F(Overlay, PropertyListsAreReadAsTheyAreInMemory) {
  OverlayPropertyLists propertyLists(files, device.propertyLists);
  const PropertyDictionary written = {{"key", "value"}};
  SerializedPropertyList contents;
  ASSERT_TRUE(propertyLists.serializeBinary(written, contents));
  ASSERT_TRUE(files.writeFile("/var/b", contents));

  EXPECT_EQ(propertyLists.readDictionary("/var/b"), written);
  static_cast<void>(files.removeFile("/var/b"));
  EXPECT_FALSE(propertyLists.readDictionary("/var/b"));
  static_cast<void>(files.writeFile("/var/b", plainContents("no property list")));
  EXPECT_FALSE(propertyLists.readDictionary("/var/b"));
}

TEST_F(Overlay, ALockIsMadeWhereItsFileCouldBe) {
  OverlaySharedResources shared(files, device.sharedResources, "/tmp");
  OverlaySharedResources nowhere(files, device.sharedResources, "/none");
  EXPECT_NE(shared.makeLock("Lock"), nullptr);
  EXPECT_EQ(nowhere.makeLock("Lock"), nullptr);
  static_cast<void>(files.createDirectoryWithIntermediates("/tmp/Lock", 0777));
  EXPECT_EQ(shared.makeLock("Lock"), nullptr);
}

}  // namespace
}  // namespace accounts
