#include "accountsettings/Process.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <vector>

#include "tests/fakes/FakePlatform.h"

namespace accounts {
namespace {

TEST(Process, TheNewestOneAliveIsTheCurrentOne) {
  FakeProcess outer;
  {
    FakeProcess inner;
    EXPECT_EQ(&Process::current(), &inner.process);
  }
  EXPECT_EQ(&Process::current(), &outer.process);
}

TEST(Process, ItsPlatformIsTheOneItWasMadeWith) {
  FakeProcess device;
  EXPECT_EQ(&Process::current().platform, &device.platform);
}

TEST(Process, ANewOneKnowsNothingOfTheOneBefore) {
  FakeProcess outer;
  outer.process.shouldSkipNotifications = true;
  outer.process.identifierChanges = 3;

  FakeProcess inner;

  EXPECT_FALSE(Process::current().shouldSkipNotifications);
  EXPECT_EQ(Process::current().identifierChanges, 0U);
}

TEST(ProcessDeathTest, AskingForItBeforeItIsMadeEndsTheProgram) {
  EXPECT_EXIT(Process::current(), testing::KilledBySignal(SIGABRT), "");
}

TEST(Once, TheValueIsComputedOnFirstUseOnly) {
  Once<int> once;
  int computations = 0;
  const auto compute = [&] { return ++computations; };

  EXPECT_EQ(once.get(compute), 1);
  EXPECT_EQ(once.get(compute), 1);
}

TEST(Once, EveryUseGivesTheSameObject) {
  Once<int> once;
  const int& first = once.get([] { return 7; });
  const int& second = once.get([] { return 8; });
  EXPECT_EQ(&first, &second);
}

TEST(Once, ConcurrentFirstUsersShareOneComputation) {
  Once<int> once;
  std::atomic<int> computations = 0;
  std::vector<std::thread> users;
  for (int user = 0; user < 8; ++user) {
    users.emplace_back([&] { once.get([&] { return ++computations; }); });
  }
  for (std::thread& user : users) {
    user.join();
  }
  EXPECT_EQ(computations, 1);
}

}  // namespace
}  // namespace accounts
