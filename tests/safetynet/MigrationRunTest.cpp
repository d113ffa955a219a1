#include "safetynet/MigrationRun.h"

#include "tests/safetynet/RunFixture.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

using MigrationRunTest = RunTest;

TEST_F(MigrationRunTest, AMigrationIsCommitted) {
  const RunConclusion conclusion = run();
  EXPECT_EQ(conclusion.exitStatus, ExitStatus::Success);
  EXPECT_FALSE(conclusion.error);
  EXPECT_TRUE(conclusion.isCommitted);
  EXPECT_THAT(conclusion.warnings, IsEmpty());
  EXPECT_THAT(accountsOn(device), ElementsAre("one", "mail"));
  EXPECT_FALSE(device.exists(DevicePlace::LegacyMail));
  EXPECT_FALSE(device.exists(DevicePlace::CommitRecord));
}

TEST_F(MigrationRunTest, BothLocksAreTakenInTheirOrderAndTheMigrationsIsGivenBack) {
  run();
  EXPECT_THAT(locks.calls, ElementsAre("takeRoot 7", "takeMigration 7", "giveMigrationBack"));
}

TEST_F(MigrationRunTest, APlanChangesNothingAndTakesNoMigrationLock) {
  const auto before = device.contents();
  const RunConclusion conclusion = run(RunPurpose::Plan);
  EXPECT_EQ(conclusion.exitStatus, ExitStatus::Success);
  EXPECT_FALSE(conclusion.isCommitted);
  EXPECT_EQ(device.contents(), before);
  EXPECT_THAT(device.journal, IsEmpty());
  EXPECT_THAT(locks.calls, ElementsAre("takeRoot 7", "canTakeMigration", "giveMigrationBack"));
}

TEST_F(MigrationRunTest, WhatKilledRunsLeftIsDealtWithFirst) {
  device.leftovers = {"One could not be dealt with"};
  const RunConclusion conclusion = run();
  EXPECT_EQ(device.journal.at(0), "settleLeftovers");
  EXPECT_THAT(conclusion.warnings, ElementsAre("One could not be dealt with"));
}

TEST_F(MigrationRunTest, KeptFoldersAreNamed) {
  const std::string earlier = std::string(kAccountMigrationDirectory) + "/Kept-20250101T000000Z";
  device.write(kAccountMigrationDirectory, "", EntryKind::Directory);
  device.write(earlier, "", EntryKind::Directory);
  const RunConclusion conclusion = run(RunPurpose::Migration, KeepFiles::Always);
  EXPECT_THAT(conclusion.earlierFolders, ElementsAre(earlier));
  EXPECT_EQ(conclusion.keptFolder,
            std::string(kAccountMigrationDirectory) + "/Kept-20260102T030405Z");
}

TEST_F(MigrationRunTest, AWorkerGetsItsTask) {
  std::vector<WorkerTask> tasks;
  useWorker([&](const WorkerTask& task) {
    tasks.push_back(task);
    return HandedOver{bytesOf(Proposal()), 0};
  });
  locks.migration = LockEnd::Impossible;
  run(RunPurpose::FinishingAlone, KeepFiles::Always);
  ASSERT_EQ(tasks.size(), 1u);
  EXPECT_EQ(tasks[0].purpose, RunPurpose::FinishingAlone);
  EXPECT_EQ(tasks[0].keep, KeepFiles::Always);
  EXPECT_EQ(tasks[0].lock, MigrationLockState::Impossible);
}

TEST_F(MigrationRunTest, APlanSaysWhetherTheMigrationLockCouldBeMade) {
  std::vector<MigrationLockState> states;
  useWorker([&](const WorkerTask& task) {
    states.push_back(task.lock);
    return HandedOver{bytesOf(Proposal()), 0};
  });
  run(RunPurpose::Plan);
  locks.isMigrationPossible = false;
  run(RunPurpose::Plan);
  EXPECT_THAT(states, ElementsAre(MigrationLockState::Available, MigrationLockState::Impossible));
}

TEST_F(MigrationRunTest, WithoutTheRootsLockNothingIsDone) {
  locks.root = LockEnd::TimeIsUp;
  const RunConclusion conclusion = run();
  EXPECT_EQ(conclusion.exitStatus, ExitStatus::TemporaryFailure);
  EXPECT_EQ(conclusion.error->message, "why there is no lock");
  EXPECT_THAT(device.journal, IsEmpty());
  locks.root = LockEnd::Impossible;
  EXPECT_EQ(run().exitStatus, ExitStatus::CannotCreate);
}

TEST_F(MigrationRunTest, AMigrationLockThatIsNotGivenUpInTimeEndsTheRun) {
  locks.migration = LockEnd::TimeIsUp;
  EXPECT_EQ(run().exitStatus, ExitStatus::TemporaryFailure);
  EXPECT_THAT(device.journal, IsEmpty());
}

TEST_F(MigrationRunTest, AHostThatIsStoppedWhileItWaitsSaysSo) {
  locks.migration = LockEnd::Stopped;
  const RunConclusion conclusion = run();
  EXPECT_EQ(conclusion.exitStatus, ExitStatus::TemporaryFailure);
  EXPECT_EQ(conclusion.error->message, "The host was asked to stop");
}

TEST_F(MigrationRunTest, AStopBeforeTheCommitChangesNothing) {
  means.isStopped = [] { return true; };
  const auto before = device.contents();
  const RunConclusion conclusion = run();
  EXPECT_EQ(conclusion.exitStatus, ExitStatus::TemporaryFailure);
  EXPECT_EQ(conclusion.error->message, "The host was asked to stop before anything was changed");
  EXPECT_EQ(device.contents(), before);
  EXPECT_FALSE(conclusion.isCommitted);
}

TEST_F(MigrationRunTest, ADeviceOfWhichNoSnapshotCanBeTakenIsAnError) {
  device.failWhenLineBegins("takeSnapshot", EACCES);
  EXPECT_EQ(run().exitStatus, ExitStatus::MissingInput);
  device.removeFaults();
  device.failWhenLineBegins("takeSnapshot", EIO);
  EXPECT_EQ(run().exitStatus, ExitStatus::InputOutputError);
  device.removeFaults();
  device.failWhenLineBegins("takeSnapshot", EMFILE);
  EXPECT_EQ(run().exitStatus, ExitStatus::TemporaryFailure);
  device.removeFaults();
  device.failWhenLineBegins("takeSnapshot", 0);
  EXPECT_EQ(run().exitStatus, ExitStatus::CannotCreate) << "two places are one";
}

TEST_F(MigrationRunTest, AWorkerThatEndsEarlyChangesNothing) {
  useWorker([](const WorkerTask&) -> OrProgramError<HandedOver> {
    return ProgramError{ExitStatus::PluginEnded, "The plug-in ended"};
  });
  const auto before = device.contents();
  const RunConclusion conclusion = run();
  EXPECT_EQ(conclusion.exitStatus, ExitStatus::PluginEnded);
  EXPECT_EQ(conclusion.error->message, "The plug-in ended");
  EXPECT_EQ(device.contents(), before);
  EXPECT_EQ(locks.calls.back(), "giveMigrationBack");
}

TEST_F(MigrationRunTest, AWorkerThatHandsOverRubbishChangesNothing) {
  const auto before = device.contents();
  for (const std::string& rubbish : {std::string(), std::string("rubbish"),
                                     bytesOf(Proposal()).substr(1), bytesOf(Proposal()) + "x"}) {
    useWorker([&](const WorkerTask&) { return HandedOver{rubbish, 0}; });
    const RunConclusion conclusion = run();
    EXPECT_EQ(conclusion.exitStatus, ExitStatus::PluginEnded);
    ASSERT_TRUE(conclusion.error);
    EXPECT_EQ(conclusion.error->message, "The migration handed over no usable list of changes");
    EXPECT_EQ(device.contents(), before);
  }
}

TEST_F(MigrationRunTest, ContentsThatAreNotInTheMemoryFileAreRubbishToo) {
  useWorker([](const WorkerTask&) {
    Proposal proposal;
    proposal.changes = {{.action = ProposedChange::Action::Write, .offset = 0, .length = 8}};
    return HandedOver{bytesOf(proposal), 7};
  });
  EXPECT_EQ(run().exitStatus, ExitStatus::PluginEnded);
}

TEST_F(MigrationRunTest, AProposalWithAnotherStatusChangesNothingAndIsForTheWorkerToTell) {
  useWorker([](const WorkerTask&) {
    Proposal proposal;
    proposal.status = ExitStatus::NotVerified;
    proposal.changes = {{.place = DevicePlace::LegacyMail}};
    return HandedOver{bytesOf(proposal), 0};
  });
  const RunConclusion conclusion = run();
  EXPECT_EQ(conclusion.exitStatus, ExitStatus::NotVerified);
  EXPECT_FALSE(conclusion.error);
  EXPECT_FALSE(conclusion.isCommitted);
  EXPECT_TRUE(device.exists(DevicePlace::LegacyMail));
}

TEST_F(MigrationRunTest, AFailureIsBlamedOnTheMigrationLockWhereThereIsNoneAlone) {
  useWorker([](const WorkerTask&) {
    Proposal proposal;
    proposal.status = ExitStatus::MigrationFailed;
    return HandedOver{bytesOf(proposal), 0};
  });
  EXPECT_EQ(run().exitStatus, ExitStatus::MigrationFailed);
  EXPECT_FALSE(run().error);

  locks.migration = LockEnd::Impossible;
  const RunConclusion conclusion = run();
  ASSERT_TRUE(conclusion.error);
  EXPECT_EQ(conclusion.error->exitStatus, ExitStatus::MigrationFailed);
  EXPECT_EQ(conclusion.error->message,
            "The plug-in reported that it failed: no migration lock can be made: why there is no "
            "lock");
}

/// Another program that writes the settings file just before a commit would, so many times.
class DisturbedRunTest : public RunTest {
 protected:
  DisturbedRunTest() {
    device.before = [this](const std::string& line) {
      if (line == "put Settings" && remaining > 0) {
        --remaining;
        device.writePropertyList(DevicePlace::Settings, settingsWith(11, {"one", "another"}));
      }
    };
    means.tell = [this](std::string_view line) { told.emplace_back(line); };
    means.makeWorker = [this] {
      ++workers;
      return std::make_unique<FakeWorker>();
    };
  }

  int remaining = 0;
  int workers = 0;
  std::vector<std::string> told;
};

TEST_F(DisturbedRunTest, AMigrationBeginsAnewWithWhatWasWritten) {
  remaining = 1;
  const RunConclusion conclusion = run();
  EXPECT_EQ(conclusion.exitStatus, ExitStatus::Success);
  EXPECT_TRUE(conclusion.isCommitted);
  EXPECT_THAT(accountsOn(device), ElementsAre("one", "another", "mail"));
  EXPECT_EQ(workers, 2);
  EXPECT_THAT(told, ElementsAre("Another program wrote a file of the migration meanwhile: it "
                                "begins anew"));
}

TEST_F(DisturbedRunTest, TheFifthAttemptMaySucceed) {
  remaining = 4;
  EXPECT_EQ(run().exitStatus, ExitStatus::Success);
  EXPECT_EQ(workers, 5);
}

TEST_F(DisturbedRunTest, AfterFiveAttemptsNothingIsChanged) {
  remaining = 1000;
  const RunConclusion conclusion = run(RunPurpose::Migration, KeepFiles::Always);
  EXPECT_EQ(conclusion.exitStatus, ExitStatus::TemporaryFailure);
  EXPECT_EQ(conclusion.error->message,
            "Another program wrote the files of the migration again and again; nothing is changed");
  EXPECT_EQ(workers, 5);
  EXPECT_FALSE(conclusion.isCommitted);
  EXPECT_THAT(accountsOn(device), ElementsAre("one", "another"));
  EXPECT_TRUE(device.exists(DevicePlace::LegacyMail));
  EXPECT_THAT(device.keptNames(), IsEmpty());
  EXPECT_EQ(locks.calls.back(), "giveMigrationBack");
}

}  // namespace
}  // namespace accounts
