#include "commandline/WorkerEnd.h"

#include <sys/syscall.h>

#include <csignal>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "commandline/WorkerLimits.h"

namespace accounts {
namespace {

// What waitpid() gives for an exit and for a signal.
constexpr int exited(int status) {
  return status << 8;
}

const WorkerEnd kEnd("The plug-in", std::nullopt);

std::optional<ProgramError> forbidden(std::string bytes) {
  return kEnd.toldBy({FrameKind::ForbiddenCall, std::move(bytes)});
}

TEST(WorkerEnd, AForbiddenCallIsNamed) {
  const int number = SYS_ptrace;
  const auto error = forbidden({reinterpret_cast<const char*>(&number), sizeof number});
  ASSERT_TRUE(error);
  EXPECT_EQ(error->exitStatus, ExitStatus::PluginEnded);
  EXPECT_EQ(error->message, "The plug-in made a system call that it may not make: ptrace");
}

TEST(WorkerEnd, OfACallOnlyAsManyBytesAreTakenAsItsNumberHas) {
  const int number = SYS_ptrace;
  std::string longer(reinterpret_cast<const char*>(&number), sizeof number);
  longer.append(1000, 'x');
  EXPECT_THAT(forbidden(longer)->message, testing::EndsWith(": ptrace"));
  EXPECT_THAT(forbidden("")->message, testing::HasSubstr("may not make: "));
}

TEST(WorkerEnd, AnExitAndASignalAreTold) {
  EXPECT_EQ(kEnd.withStatus(exited(7)).message, "The plug-in ended the process with exit status 7");
  EXPECT_EQ(kEnd.withStatus(SIGSEGV).message,
            "The plug-in ended by signal 11 (Segmentation fault)");
}

TEST(WorkerEnd, TheEndOfItsProcessorTimeIsToldWithHowMuchItHad) {
  EXPECT_EQ(
      WorkerEnd("The plug-in", workerLimitsFor(0)).withStatus(SIGXCPU).message,
      "The plug-in needs more than the 5 s of processor time that files of this size allow it");
  EXPECT_EQ(kEnd.withStatus(SIGXCPU).message,
            "The plug-in ended by signal 24 (CPU time limit exceeded)");
}

TEST(WorkerEnd, WithoutALimitOfItsOwnTheEndOfMemoryMayPass) {
  const auto error = kEnd.toldBy({FrameKind::OutOfMemory, {}});
  ASSERT_TRUE(error);
  EXPECT_EQ(error->exitStatus, ExitStatus::TemporaryFailure);
  EXPECT_EQ(error->message, "No memory");
}

TEST(WorkerEnd, NoOtherFrameTellsOfOne) {
  EXPECT_FALSE(kEnd.toldBy({FrameKind::ToldResult, {}}));
}

TEST(WorkerLimits, GrowWithTheFiles) {
  EXPECT_EQ(workerLimitsFor(0).memory, 256 * kMebibyte);
  EXPECT_EQ(workerLimitsFor(kMebibyte).memory, (256 + 2048) * kMebibyte);
  EXPECT_EQ(workerLimitsFor(0).processorTime, std::chrono::seconds(5));
  EXPECT_EQ(workerLimitsFor(2 * kMebibyte).processorTime, std::chrono::seconds(245));
}

}  // namespace
}  // namespace accounts
