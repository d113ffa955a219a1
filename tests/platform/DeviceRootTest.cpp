#include "platform/linux/DeviceRoot.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/syscall.h>
#include <sys/un.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>

#include "platform/linux/FileContents.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

using testing::ExitedWithCode;
namespace fs = std::filesystem;

class DeviceRootTest : public DeviceFixture {
 protected:
  OrFailure<std::string> read(std::string_view path) { return root.readFile(path); }

  DeviceRoot root = openImage();
};

TEST_F(DeviceRootTest, AnAbsolutePathStartsAtTheRoot) {
  makeFile("/etc/name", "device");
  EXPECT_EQ(read("/etc/name"), "device");
}

TEST_F(DeviceRootTest, APathOfParentDirectoriesStaysInTheRoot) {
  makeHostFile(outside() / "secret", "secret");
  makeDirectory("/outside");
  EXPECT_FALSE(read("/../outside/secret"));
  makeFile("/outside/secret", "the device's own");
  EXPECT_EQ(read("/../../outside/secret"), "the device's own");
}

TEST_F(DeviceRootTest, AnAbsoluteLinkIsFollowedWithinTheRoot) {
  makeHostFile(outside() / "secret", "secret");
  makeLink("/link", outside() / "secret");
  EXPECT_TRUE(failureOf(read("/link")).isMissing());
}

TEST_F(DeviceRootTest, AnAbsoluteLinkFindsItsTargetInTheRoot) {
  makeFile("/private/etc/name", "device");
  makeLink("/etc", "/private/etc");
  EXPECT_EQ(read("/etc/name"), "device");
}

TEST_F(DeviceRootTest, ARelativeLinkLeadingOutIsFollowedWithinTheRoot) {
  makeHostFile(outside() / "secret", "secret");
  makeLink("/directory/link", "../../outside/secret");
  EXPECT_TRUE(failureOf(read("/directory/link")).isMissing());
}

TEST_F(DeviceRootTest, ALinkedDirectoryLeadingOutDoesNotHoldTheFilesOutside) {
  makeHostFile(outside() / "file", "outside");
  makeLink("/absolute", outside());
  makeLink("/relative", "../outside");
  EXPECT_FALSE(root.locate("/absolute/file"));
  EXPECT_FALSE(root.locate("/relative/file"));
}

TEST_F(DeviceRootTest, LinksThatGoInACircleAreAnError) {
  makeLink("/one", "two");
  makeLink("/two", "one");
  EXPECT_EQ(failureOf(read("/one")).number, ELOOP);
}

TEST_F(DeviceRootTest, ALinkOfTheKernelsOwnIsNotFollowed) {
  const auto systemRoot = DeviceRoot::openRoot("/");
  ASSERT_TRUE(systemRoot);
  for (const std::string_view link : {"/proc/self/exe", "/proc/self/root/etc/passwd"}) {
    EXPECT_EQ(failureOf(systemRoot->readFile(link)).number, ELOOP) << link;
  }
}

TEST_F(DeviceRootTest, AnErrorNamesTheDevicePathAndTheReason) {
  const Failure failure = failureOf(read("/etc/name"));
  EXPECT_EQ(failure.text, "Cannot open /etc/name: No such file or directory");
  EXPECT_TRUE(failure.isMissing());
}

TEST_F(DeviceRootTest, AnUnreadableFileIsAnErrorButNotMissing) {
  makeFile("/secret", "secret");
  fs::permissions(onHost("/secret"), fs::perms::none);
  const WithoutPrivileges restricted;
  const Failure failure = failureOf(read("/secret"));
  EXPECT_EQ(failure.number, EACCES);
  EXPECT_FALSE(failure.isMissing());
}

TEST_F(DeviceRootTest, ANamedPipeInPlaceOfAFileIsRefusedAtOnce) {
  makeNamedPipe("/pipe");
  EXPECT_EQ(failureOf(read("/pipe")).text,
            "Cannot open /pipe: It is a named pipe, not a regular file");
}

TEST_F(DeviceRootTest, ADirectoryInPlaceOfAFileIsRefused) {
  makeDirectory("/directory");
  EXPECT_EQ(failureOf(read("/directory")).text,
            "Cannot open /directory: It is a directory, not a regular file");
}

TEST_F(DeviceRootTest, ASocketInPlaceOfAFileIsRefused) {
  const FileDescriptor socket(::socket(AF_UNIX, SOCK_STREAM, 0));
  sockaddr_un address = {};
  address.sun_family = AF_UNIX;
  onHost("/socket").string().copy(address.sun_path, sizeof address.sun_path - 1);
  ASSERT_EQ(::bind(socket.number(), reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
  EXPECT_EQ(failureOf(read("/socket")).text,
            "Cannot open /socket: It is a socket, not a regular file");
}

TEST_F(DeviceRootTest, AFileAboveTheLargestSizeIsRefused) {
  makeFile("/large", "");
  fs::resize_file(onHost("/large"), kLargestFileSize + 1);
  EXPECT_EQ(failureOf(read("/large")).text, "Cannot read /large: File too large");
}

TEST_F(DeviceRootTest, AnEmptyFileHasEmptyContents) {
  makeFile("/empty", "");
  EXPECT_EQ(read("/empty"), "");
}

TEST_F(DeviceRootTest, APathWithAZeroByteIsRefused) {
  makeFile("/file", "contents");
  EXPECT_FALSE(read(std::string_view("/file\0more", 10)));
  EXPECT_FALSE(root.locate(std::string_view("/file\0more", 10)));
}

TEST_F(DeviceRootTest, APathThatNamesNothingInADirectoryHasNoEntry) {
  makeDirectory("/directory");
  for (const std::string_view path : {"/", "", "/directory/.", "/directory/.."}) {
    EXPECT_FALSE(root.locate(path)) << path;
  }
}

TEST_F(DeviceRootTest, AnEntryIsFoundInALinkedDirectoryOfTheRoot) {
  makeDirectory("/private/var");
  makeLink("/var", "/private/var");
  const auto entry = root.locate("/var/file");
  ASSERT_TRUE(entry);
  ASSERT_TRUE(entry->createFile(0600));
  EXPECT_TRUE(fs::exists(onHost("/private/var/file")));
}

TEST_F(DeviceRootTest, ARootThatDoesNotExistIsAnError) {
  const Failure failure = failureOf(DeviceRoot::openRoot((outside() / "none").string()));
  EXPECT_TRUE(failure.isMissing());
  EXPECT_NE(failure.text.find((outside() / "none").string()), std::string::npos);
}

TEST_F(DeviceRootTest, AFileIsNoRoot) {
  makeHostFile(outside() / "file", "");
  EXPECT_FALSE(DeviceRoot::openRoot((outside() / "file").string()));
}

TEST_F(DeviceRootTest, OnlyTheRunningSystemsRootIsTheSystemRoot) {
  const auto systemRoot = DeviceRoot::openRoot("/");
  ASSERT_TRUE(systemRoot);
  EXPECT_TRUE(systemRoot->isSystemRoot());
  EXPECT_FALSE(root.isSystemRoot());
}

TEST_F(DeviceRootTest, AKernelThatCannotResolveBeneathARootIsAClearError) {
  EXPECT_EXIT(
      {
        makeSystemCallFail(SYS_openat2, ENOSYS);
        const Failure failure = failureOf(DeviceRoot::openRoot(image().string()));
        std::fprintf(stderr, "%s\n", failure.text.c_str());
        std::_Exit(0);
      },
      ExitedWithCode(0),
      "Function not implemented \\(openat2, of Linux 5.6 or later, is needed\\)");
}

}  // namespace
}  // namespace accounts
