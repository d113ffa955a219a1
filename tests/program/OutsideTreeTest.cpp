#include "tests/program/OutsideTree.h"

#include <gtest/gtest.h>

#include <sys/stat.h>

#include <fstream>
#include <sstream>

#include "tests/program/DeviceRootFixture.h"

// What the tests of hostile roots rely on: that nothing done to the tree outside stays unseen.

namespace accounts {
namespace {

namespace fs = std::filesystem;

void read(const fs::path& file) {
  std::ostringstream text;
  text << std::ifstream(file).rdbuf();
  ASSERT_NE(text.str(), "");
}

/// Whether this file system keeps times of access; some are mounted without.
bool keepsTimesOfAccess(const fs::path& file) {
  struct stat before {};
  struct stat after {};
  stat(file.c_str(), &before);
  read(file);
  stat(file.c_str(), &after);
  return before.st_atim.tv_sec != after.st_atim.tv_sec;
}

TEST(OutsideTree, LookingAtItChangesNothing) {
  const OutsideTree tree;

  EXPECT_EQ(tree.contents(), tree.contents());
}

TEST(OutsideTree, ReadingAFileIsSeen) {
  const OutsideTree tree;
  if (!keepsTimesOfAccess(tree.path(kLegacyMailPath))) {
    GTEST_SKIP() << "This file system keeps no times of access.";
  }
  const auto before = tree.contents();

  read(tree.path(kSettingsPath));

  EXPECT_NE(tree.contents(), before);
}

TEST(OutsideTree, ListingADirectoryIsSeen) {
  const OutsideTree tree;
  if (!keepsTimesOfAccess(tree.path(kLegacyMailPath))) {
    GTEST_SKIP() << "This file system keeps no times of access.";
  }
  const auto before = tree.contents();

  EXPECT_NE(fs::directory_iterator(tree.path("/etc")), fs::directory_iterator());

  EXPECT_NE(tree.contents(), before);
}

TEST(OutsideTree, WritingToAFileIsSeen) {
  const OutsideTree tree;
  const auto before = tree.contents();

  std::ofstream(tree.path(kSettingsPath)) << "changed";

  EXPECT_NE(tree.contents(), before);
}

TEST(OutsideTree, MakingAFileIsSeen) {
  const OutsideTree tree;
  const auto before = tree.contents();

  std::ofstream(tree.path("/tmp/new")).close();

  EXPECT_NE(tree.contents(), before);
}

TEST(OutsideTree, RemovingAFileIsSeen) {
  const OutsideTree tree;
  const auto before = tree.contents();

  fs::remove(tree.path(kSentinelPath));

  EXPECT_NE(tree.contents(), before);
}

TEST(OutsideTree, ChangingPermissionsIsSeen) {
  const OutsideTree tree;
  const auto before = tree.contents();

  fs::permissions(tree.path("/var/mobile"), fs::perms(0700));

  EXPECT_NE(tree.contents(), before);
}

}  // namespace
}  // namespace accounts
