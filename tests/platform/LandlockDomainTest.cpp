#include "platform/linux/LandlockDomain.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <linux/landlock.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <filesystem>

#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

class LandlockDomainTest : public DeviceFixture {
 protected:
  void SetUp() override {
    if (::syscall(SYS_landlock_create_ruleset, nullptr, 0, LANDLOCK_CREATE_RULESET_VERSION) < 0) {
      GTEST_SKIP() << "This kernel has no Landlock.";
    }
    makeFile("/file", "contents");
  }

  /// Enters a domain, which cannot be left: for a process of its own.
  static void enter() {
    ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0);
    if (enterLandlockDomain() != 0) {
      std::_Exit(EXIT_FAILURE);
    }
  }

  /// Expects that something fails in a domain for want of a right.
  template <class Attempt>
  static void expectRefused(Attempt attempt) {
    EXPECT_EXIT(
        {
          enter();
          std::_Exit(attempt() < 0 ? errno : EXIT_SUCCESS);
        },
        testing::ExitedWithCode(EACCES), "");
  }

  std::string file = onHost("/file").string();
};

TEST_F(LandlockDomainTest, NoFileCanBeOpened) {
  expectRefused([&] { return ::open(file.c_str(), O_RDONLY); });
  expectRefused([&] { return ::open(file.c_str(), O_WRONLY); });
}

TEST_F(LandlockDomainTest, NothingCanBeMadeOrRemoved) {
  expectRefused([&] { return ::unlink(file.c_str()); });
  expectRefused([&] { return ::mkdir((file + ".new").c_str(), 0700); });
  EXPECT_EQ(contentsOf("/file"), "contents");
}

TEST_F(LandlockDomainTest, WhatIsOpenStaysOpen) {
  const int opened = ::open(file.c_str(), O_RDONLY | O_CLOEXEC);
  EXPECT_EXIT(
      {
        enter();
        char byte = 0;
        std::_Exit(::pread(opened, &byte, 1, 0) == 1 ? EXIT_SUCCESS : EXIT_FAILURE);
      },
      testing::ExitedWithCode(EXIT_SUCCESS), "");
  ::close(opened);
}

TEST_F(LandlockDomainTest, OfADirectoryFilesAreChangedBeneathItAloneAndReadAnywhere) {
  constexpr long kFirstVersionThatIsUsed = 2;
  if (::syscall(SYS_landlock_create_ruleset, nullptr, 0, LANDLOCK_CREATE_RULESET_VERSION) <
      kFirstVersionThatIsUsed) {
    GTEST_SKIP() << "This kernel's Landlock is too old.";
  }
  const std::string inside = onHost("/inside").string();
  ASSERT_EQ(::mkdir(inside.c_str(), 0700), 0);
  const int directory = ::open(inside.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
  EXPECT_EXIT(
      {
        ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0);
        const bool isEntered = enterLandlockDomainOf(directory) == 0;
        const bool isMadeInside =
            ::open((inside + "/file").c_str(), O_CREAT | O_RDWR, 0600) >= 0 &&
            ::mkdir((inside + "/folder").c_str(), 0700) == 0 &&
            ::rename((inside + "/file").c_str(), (inside + "/folder/file").c_str()) == 0;
        const bool isReadOutside = ::open(file.c_str(), O_RDONLY) >= 0;
        const bool isKeptOutside = ::unlink(file.c_str()) != 0 && errno == EACCES &&
                                   ::open(file.c_str(), O_RDWR) < 0 && errno == EACCES &&
                                   ::mkdir((file + ".new").c_str(), 0700) != 0 && errno == EACCES;
        std::_Exit(isEntered && isMadeInside && isReadOutside && isKeptOutside ? EXIT_SUCCESS
                                                                               : EXIT_FAILURE);
      },
      testing::ExitedWithCode(EXIT_SUCCESS), "");
  ::close(directory);
  EXPECT_TRUE(std::filesystem::exists(inside + "/folder/file"));
  EXPECT_EQ(contentsOf("/file"), "contents");
}

}  // namespace
}  // namespace accounts
