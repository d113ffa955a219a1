#include <gtest/gtest.h>

#include "platform/linux/LinuxFileSystem.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

class FileSystemExistenceTest : public DeviceFixture {
 protected:
  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/tmp"};
};

TEST_F(FileSystemExistenceTest, AFileExistsAndIsNoDirectory) {
  makeFile("/file", "");
  EXPECT_TRUE(files.fileExists("/file"));
  EXPECT_FALSE(files.isDirectory("/file"));
}

TEST_F(FileSystemExistenceTest, ADirectoryExistsAndIsOne) {
  makeDirectory("/directory");
  EXPECT_TRUE(files.fileExists("/directory"));
  EXPECT_TRUE(files.isDirectory("/directory"));
}

TEST_F(FileSystemExistenceTest, NothingExistsAtAMissingPath) {
  EXPECT_FALSE(files.fileExists("/none"));
  EXPECT_FALSE(files.isDirectory("/none"));
}

TEST_F(FileSystemExistenceTest, ALinkToADirectoryIsADirectory) {
  makeDirectory("/directory");
  makeLink("/link", "/directory");
  EXPECT_TRUE(files.isDirectory("/link"));
}

TEST_F(FileSystemExistenceTest, ALinkToNothingDoesNotExist) {
  makeLink("/link", "none");
  EXPECT_FALSE(files.fileExists("/link"));
}

TEST_F(FileSystemExistenceTest, ALinkOutOfTheRootDoesNotMakeWhatIsOutsideExist) {
  makeLink("/link", outside());
  EXPECT_FALSE(files.fileExists("/link"));
  EXPECT_FALSE(files.isDirectory("/link"));
}

TEST_F(FileSystemExistenceTest, ANamedPipeExists) {
  makeNamedPipe("/pipe");
  EXPECT_TRUE(files.fileExists("/pipe"));
}

}  // namespace
}  // namespace accounts
