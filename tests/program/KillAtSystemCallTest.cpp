#include <iostream>

#include "tests/fakes/Sanitizers.h"
#include "tests/program/InterruptedDevice.h"
#include "tests/program/TracedProgram.h"

// The real program and its child, killed before and after every single system call with which they
// touch a file of the device.

namespace accounts {
namespace {

// With sanitizers every fifth stop has to do, each run being so much slower.
constexpr int kStep = kWithSanitizers ? 5 : 1;

/// With the host's safety net, and without.
using Arguments = std::vector<std::string>;

class KillAtSystemCall : public InterruptedDevice, public testing::WithParamInterface<Arguments> {
 protected:
  void SetUp() override {
    if (!TracedProgram::isPossible()) {
      GTEST_SKIP() << "This system lets the test trace no programs.";
    }
    makeDevice();
  }

  /// Runs a migration up to the n-th stop and kills it there. False when it ended before.
  bool killAtStop(int number, std::string& place) const {
    TracedProgram program(migrationCall(GetParam()), root());
    for (int stop = 1; stop <= number; ++stop) {
      if (!program.runToNextStop()) {
        return false;
      }
    }
    place = program.place();
    program.kill();
    return true;
  }
};

TEST_P(KillAtSystemCall, OfAnyFileLosesNothingAndIsFinishedByTheNextRun) {
  int kills = 0;
  std::string place;
  for (int stop = 1; killAtStop(stop, place); stop += kStep) {
    SCOPED_TRACE("killed at stop " + std::to_string(stop) + ", " + place);
    ++kills;
    expectLockIsFree();
    expectNothingLost();
    expectNextRunFinishes(GetParam());
    if (HasFailure()) {
      break;
    }
    makeDevice();
  }

  EXPECT_GT(kills, 100 / kStep);
  std::cout << kills << " kills, " << (kStep == 1 ? "one" : "one of every five")
            << " before and after each system call that touches a file of the device\n";
}

TEST_P(KillAtSystemCall, IsNothingWhenTheProgramIsOnlyTraced) {
  TracedProgram program(migrationCall(GetParam()), root());

  EXPECT_EQ(program.runToEnd(), 0);

  expectMigrated();
}

INSTANTIATE_TEST_SUITE_P(Hosts, KillAtSystemCall, testing::Values(Arguments(), Arguments{"--bare"}),
                         [](const testing::TestParamInfo<Arguments>& information) {
                           return information.param.empty() ? "WithSafetyNet" : "Bare";
                         });

}  // namespace
}  // namespace accounts
