#include "platform/linux/OwnerNames.h"

#include <gtest/gtest.h>
#include <nss.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>

#include "platform/linux/LinuxFileSystem.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

TEST(IdentifierInDatabaseTest, TheThirdFieldOfTheNamesLineIsTheNumber) {
  const std::string_view users =
      "root:*:0:0:Superuser:/root:/bin/sh\n"
      "mobile:*:501:502:Mobile User:/var/mobile:/bin/sh\n";
  EXPECT_EQ(identifierInDatabase(users, "mobile"), 501u);
  EXPECT_EQ(identifierInDatabase(users, "root"), 0u);
}

TEST(IdentifierInDatabaseTest, AGroupLineIsReadTheSameWay) {
  EXPECT_EQ(identifierInDatabase("wheel:*:0:root\nmobile:*:501:\n", "mobile"), 501u);
}

TEST(IdentifierInDatabaseTest, TheLastLineNeedsNoLineEnd) {
  EXPECT_EQ(identifierInDatabase("mobile:*:501", "mobile"), 501u);
}

TEST(IdentifierInDatabaseTest, NamesAreComparedWhole) {
  const std::string_view users = "mobileuser:*:501:501\n#mobile:*:502:502\nmob:*:503:503\n";
  EXPECT_EQ(identifierInDatabase(users, "mobile"), std::nullopt);
  EXPECT_EQ(identifierInDatabase(users, ""), std::nullopt);
}

TEST(IdentifierInDatabaseTest, TheFirstUsableLineOfANameHolds) {
  EXPECT_EQ(identifierInDatabase("mobile\nmobile:*:x:1\nmobile:*:501:1\nmobile:*:7:1\n", "mobile"),
            501u);
}

TEST(IdentifierInDatabaseTest, NumbersThatNoFileCanCarryAreNotUsable) {
  for (const std::string_view number : {"", "-1", "5x", " 5", "4294967295", "4294967296"}) {
    const std::string users = "mobile:*:" + std::string(number) + ":1\n";
    EXPECT_EQ(identifierInDatabase(users, "mobile"), std::nullopt) << number;
  }
}

class OwnerNamesTest : public DeviceFixture {
 protected:
  DeviceRoot root = openImage();
  OwnerNames names{root};
};

TEST_F(OwnerNamesTest, NamesComeFromTheRootsOwnDatabases) {
  makeFile("/etc/passwd", "mobile:*:4711:1:::\n");
  makeFile("/etc/group", "mobile:*:4712:\n");
  EXPECT_EQ(names.userIdentifier("mobile"), 4711u);
  EXPECT_EQ(names.groupIdentifier("mobile"), 4712u);
}

TEST_F(OwnerNamesTest, TheRunningSystemsUsersAreNotTheImages) {
  makeFile("/etc/passwd", "mobile:*:501:501:::\n");
  EXPECT_EQ(failureOf(names.userIdentifier("root")).text,
            "Cannot find \"root\" in /etc/passwd: There is no usable entry");
}

TEST_F(OwnerNamesTest, AMissingDatabaseIsAnError) {
  EXPECT_EQ(failureOf(names.groupIdentifier("mobile")).text,
            "Cannot open /etc/group: No such file or directory");
}

TEST_F(OwnerNamesTest, ANumberThatWasFoundIsKept) {
  makeFile("/etc/passwd", "mobile:*:4711:1:::\n");
  makeFile("/etc/group", "mobile:*:4712:\n");
  ASSERT_TRUE(names.userIdentifier("mobile") && names.groupIdentifier("mobile"));

  std::filesystem::remove(onHost("/etc/passwd"));
  std::filesystem::remove(onHost("/etc/group"));

  EXPECT_EQ(names.userIdentifier("mobile"), 4711u);
  EXPECT_EQ(names.groupIdentifier("mobile"), 4712u);
}

TEST_F(OwnerNamesTest, ANameThatWasNotFoundIsLookedForAgain) {
  ASSERT_FALSE(names.userIdentifier("mobile"));

  makeFile("/etc/passwd", "mobile:*:4711:1:::\n");

  EXPECT_EQ(names.userIdentifier("mobile"), 4711u);
}

TEST_F(OwnerNamesTest, DatabasesThatWereReadAheadAreNotOpenedAgain) {
  makeFile("/etc/passwd", "mobile:*:4711:1:::\n");
  names.readAhead("mobile");
  std::filesystem::remove(onHost("/etc/passwd"));
  makeFile("/etc/group", "mobile:*:4712:\n");

  EXPECT_EQ(names.userIdentifier("mobile"), 4711u);
  EXPECT_EQ(failureOf(names.groupIdentifier("mobile")).text,
            "Cannot open /etc/group: No such file or directory");
}

// The name service is set to one that knows nobody, which cannot be undone.
TEST_F(OwnerNamesTest, TheRunningSystemIsAskedAheadForTheNameAlone) {
  const auto systemRoot = DeviceRoot::openRoot("/");
  ASSERT_TRUE(systemRoot);
  EXPECT_EXIT(
      {
        OwnerNames known(*systemRoot);
        OwnerNames unknown(*systemRoot);
        known.readAhead("root");
        ::__nss_configure_lookup("passwd", "none");
        unknown.readAhead("root");
        ::__nss_configure_lookup("passwd", "files");
        std::_Exit((known.userIdentifier("root") == 0u ? 0 : 1) +
                   (unknown.userIdentifier("root") ? 2 : 0));
      },
      testing::ExitedWithCode(0), "");
}

TEST_F(OwnerNamesTest, TheRunningSystemAsksItsNameService) {
  const auto systemRoot = DeviceRoot::openRoot("/");
  ASSERT_TRUE(systemRoot);
  OwnerNames systemNames(*systemRoot);
  EXPECT_EQ(systemNames.userIdentifier("root"), 0u);
  EXPECT_EQ(systemNames.groupIdentifier("root"), 0u);
  EXPECT_EQ(failureOf(systemNames.userIdentifier("no such user here")).text,
            "Cannot find \"no such user here\" in /etc/passwd: There is no usable entry");
}

// The name service is set to one that knows nobody, which cannot be undone.
TEST_F(OwnerNamesTest, TheRunningSystemAsksItsNameServiceAndNotItsFiles) {
  const auto systemRoot = DeviceRoot::openRoot("/");
  ASSERT_TRUE(systemRoot);
  EXPECT_EXIT(
      {
        ::__nss_configure_lookup("passwd", "none");
        ::__nss_configure_lookup("group", "none");
        OwnerNames systemNames(*systemRoot);
        const auto user = systemNames.userIdentifier("root");
        const auto group = systemNames.groupIdentifier("root");
        std::_Exit((user ? 1 : 0) + (group ? 2 : 0));
      },
      testing::ExitedWithCode(0), "");
}

class SetOwnerTest : public DeviceFixture {
 protected:
  // The superuser may give files to anyone, others only to themselves.
  SetOwnerTest() {
    makeFile("/etc/passwd", "mobile:*:" + std::to_string(user) + ":1:::\n");
    makeFile("/etc/group", "mobile:*:" + std::to_string(group) + ":\n");
    makeFile("/file", "contents");
  }

  const uid_t user = ::geteuid() == 0 ? 501 : ::geteuid();
  const gid_t group = ::geteuid() == 0 ? 502 : ::getegid();
  DeviceRoot root = openImage();
  LinuxFileSystem files{root, "/tmp"};
};

TEST_F(SetOwnerTest, AFileIsGivenToTheUserAndTheGroupOfTheNames) {
  ASSERT_TRUE(files.setOwnerAndGroup("/file", "mobile", "mobile"));
  EXPECT_EQ(statusOf("/file").st_uid, user);
  EXPECT_EQ(statusOf("/file").st_gid, group);
}

TEST_F(SetOwnerTest, AnUnknownUserOrGroupFailsWithItsName) {
  const auto before = statusOf("/file").st_uid;
  const Result unknownUser = files.setOwnerAndGroup("/file", "nobody", "mobile");
  ASSERT_FALSE(unknownUser);
  EXPECT_EQ(unknownUser.error().text,
            "Cannot find \"nobody\" in /etc/passwd: There is no usable entry");
  const Result unknownGroup = files.setOwnerAndGroup("/file", "mobile", "staff");
  ASSERT_FALSE(unknownGroup);
  EXPECT_EQ(unknownGroup.error().text,
            "Cannot find \"staff\" in /etc/group: There is no usable entry");
  EXPECT_EQ(statusOf("/file").st_uid, before);
}

TEST_F(SetOwnerTest, ALinkInPlaceOfTheFileDoesNotGiveItsTargetAway) {
  makeLink("/link", "/file");
  const auto before = statusOf("/file").st_uid;
  EXPECT_FALSE(files.setOwnerAndGroup("/link", "mobile", "mobile"));
  EXPECT_EQ(statusOf("/file").st_uid, before);
}

TEST_F(SetOwnerTest, WithoutTheRightToGiveFilesAwayItFails) {
  const std::filesystem::path file = onHost("/file");
  makeFile("/etc/passwd", "mobile:*:4711:1:::\n");
  std::filesystem::permissions(file, std::filesystem::perms(0666));
  const WithoutPrivileges restricted;
  const Result result = files.setOwnerAndGroup("/file", "mobile", "mobile");
  ASSERT_FALSE(result);
  EXPECT_EQ(result.error().text, "Cannot set the owner of /file: Operation not permitted");
}

}  // namespace
}  // namespace accounts
