#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>

#include "platform/linux/LinuxFileSystem.h"
#include "platform/linux/TemporaryFile.h"
#include "tests/fakes/PlainContents.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

using Names = std::vector<std::string>;

class AbandonedTemporaryFilesTest : public DeviceFixture {
 protected:
  AbandonedTemporaryFilesTest() {
    makeDirectory("/home/tmp");
    makeDirectory("/home/Preferences");
  }

  /// The path of a temporary file whose name tells that this program made it.
  static std::string named(const std::string& directory, const std::string& name) {
    return directory + "/" + std::string(kTemporaryFilePrefix) + name;
  }
  void clean(LinuxFileSystem& by) const {
    by.removeAbandonedTemporaryFiles({"/home/Preferences", "/home/missing"});
  }

  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/home/tmp"};
};

TEST_F(AbandonedTemporaryFilesTest, AFileWhoseMakerWasKilledIsRemoved) {
  const pid_t maker = fork();
  if (maker == 0) {
    (void)files.makeTemporaryFile();
    (void)raise(SIGKILL);
  }
  ASSERT_EQ(waitpid(maker, nullptr, 0), maker);
  ASSERT_EQ(namesIn("/home/tmp").size(), 1u);

  clean(files);

  EXPECT_TRUE(namesIn("/home/tmp").empty());
}

TEST_F(AbandonedTemporaryFilesTest, AFileOfALivingMakerStays) {
  LinuxFileSystem living(root, "/home/tmp");
  const auto path = living.makeTemporaryFile();
  ASSERT_TRUE(path);

  clean(files);

  ASSERT_TRUE(living.writeFile(*path, plainContents("contents")));
  EXPECT_EQ(contentsOf(*path), "contents");
}

TEST_F(AbandonedTemporaryFilesTest, AFileOfOnesOwnStaysUntilItIsRemoved) {
  const auto path = files.makeTemporaryFile();
  ASSERT_TRUE(path);
  clean(files);
  EXPECT_EQ(namesIn("/home/tmp").size(), 1u);
  EXPECT_TRUE(files.removeFile(*path));
  EXPECT_TRUE(namesIn("/home/tmp").empty());
}

TEST_F(AbandonedTemporaryFilesTest, ARenamedFileCanBeTakenForAnAbandonedOneAgain) {
  // What a caller moves to such a name is its own affair; the lock must not stay behind for ever.
  const auto path = files.makeTemporaryFile();
  ASSERT_TRUE(path && files.renameFile(*path, named("/home/Preferences", "renamed")));
  clean(files);
  EXPECT_TRUE(namesIn("/home/Preferences").empty());
}

TEST_F(AbandonedTemporaryFilesTest, AbandonedFilesAreRemovedFromTheFurtherDirectoriesToo) {
  makeFile(named("/home/Preferences", "0123"), "half a sentinel");
  clean(files);
  EXPECT_TRUE(namesIn("/home/Preferences").empty());
}

TEST_F(AbandonedTemporaryFilesTest, NothingElseIsTouched) {
  makeFile("/home/tmp/other", "contents");
  makeFile("/home/Preferences/com.quarx.accountsettings.plist", "contents");
  makeFile(named("/home", "elsewhere"), "contents");
  makeDirectory(named("/home/tmp", "directory"));
  makeLink(named("/home/tmp", "link"), "other");
  makeNamedPipe(named("/home/tmp", "pipe"));

  clean(files);

  EXPECT_EQ(namesIn("/home/tmp").size(), 4u);
  EXPECT_EQ(namesIn("/home/Preferences").size(), 1u);
  EXPECT_EQ(contentsOf(named("/home", "elsewhere")), "contents");
}

TEST_F(AbandonedTemporaryFilesTest, NothingIsRemovedOutsideTheRoot) {
  makeHostFile(outside() / (std::string(kTemporaryFilePrefix) + "0123"), "contents");
  makeLink("/home/missing", outside());
  clean(files);
  EXPECT_FALSE(std::filesystem::is_empty(outside()));
}

}  // namespace
}  // namespace accounts
