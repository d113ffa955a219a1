#include "safetynet/MigrationRun.h"

#include <utility>

#include "safetynet/Commit.h"
#include "safetynet/PlaceErrors.h"

namespace accounts {
namespace {

// A program that writes one of the files of a migration at each of these is one to look for.
constexpr int kMostAttempts = 5;

}  // namespace

ProgramError lockErrorOf(LockEnd end, const HostLocks& locks) {
  switch (end) {
    case LockEnd::TimeIsUp:
    case LockEnd::Wanting:
      return {ExitStatus::TemporaryFailure, locks.reason()};
    case LockEnd::Stopped:
      return {ExitStatus::TemporaryFailure, kStopped};
    case LockEnd::Taken:
    case LockEnd::Impossible:
      break;
  }
  return {ExitStatus::CannotCreate, locks.reason()};
}

RunConclusion MigrationRun::run(RunPurpose purpose, KeepFiles keep) {
  if (auto taken = takeLocks(purpose); !taken) {
    fail(std::move(taken).error());
    return std::move(conclusion_);
  }
  if (purpose != RunPurpose::Plan) {
    folders_.removeUnfinished();
    conclusion_.warnings = means_.places.settleLeftovers();
  }
  // They are only told of.
  conclusion_.earlierFolders =
      folders_.keptFor(KeptFor::Migration).value_or(std::vector<std::string>());
  Attempt result = Attempt::GivenUp;
  for (int number = 1; number <= kMostAttempts && result == Attempt::GivenUp; ++number) {
    result = attempt(purpose, keep);
  }
  if (result == Attempt::GivenUp) {
    fail({ExitStatus::TemporaryFailure,
          "Another program wrote the files of the migration again and again; nothing is changed"});
  }
  means_.locks.giveMigrationBack();
  return std::move(conclusion_);
}

OrProgramError<void> MigrationRun::takeLocks(RunPurpose purpose) {
  HostLocks& locks = means_.locks;
  if (const LockEnd end = locks.takeRoot(means_.lockTimeout); end != LockEnd::Taken) {
    return lockErrorOf(end, locks);
  }
  if (purpose == RunPurpose::Plan) {
    lock_ =
        locks.canTakeMigration() ? MigrationLockState::Available : MigrationLockState::Impossible;
    return {};
  }
  const LockEnd end = locks.takeMigration(means_.lockTimeout);
  // Without a lock the plug-in says for itself that it cannot migrate.
  lock_ = end == LockEnd::Taken ? MigrationLockState::Available : MigrationLockState::Impossible;
  const bool goesOn = end == LockEnd::Taken || end == LockEnd::Impossible;
  return goesOn ? OrProgramError<void>() : lockErrorOf(end, locks);
}

MigrationRun::Attempt MigrationRun::attempt(RunPurpose purpose, KeepFiles keep) {
  const auto taken = means_.places.takeSnapshot();
  if (!taken) {
    return fail(readingError(taken.error()));
  }
  const DeviceSnapshot& snapshot = *taken;
  worker_.reset();
  worker_ = means_.makeWorker();
  const auto worked = worker_->work(snapshot, {.purpose = purpose, .lock = lock_, .keep = keep});
  if (!worked) {
    return fail(worked.error());
  }
  const std::optional<Proposal> proposal = proposalFrom(worked->proposal, worked->memoryFileSize);
  if (!proposal) {
    return fail({ExitStatus::PluginEnded, "The migration handed over no usable list of changes"});
  }
  conclusion_.exitStatus = proposal->status;
  if (proposal->status == ExitStatus::MigrationFailed && lock_ == MigrationLockState::Impossible) {
    return fail({ExitStatus::MigrationFailed,
                 "The plug-in reported that it failed: no migration lock can be made: " +
                     means_.locks.reason()});
  }
  if (!proposal->isToBeCommitted() || purpose == RunPurpose::Plan) {
    return Attempt::Over;
  }
  return means_.isStopped() ? fail({ExitStatus::TemporaryFailure,
                                    std::string(kStopped) + " before anything was changed"})
                            : commit(snapshot, *proposal);
}

MigrationRun::Attempt MigrationRun::commit(const DeviceSnapshot& snapshot,
                                           const Proposal& proposal) {
  Commit commit(
      means_.places, folders_, snapshot, proposal,
      [this](const ProposedChange& change) { return worker_->contentsOf(change); }, means_.time);
  CommitOutcome outcome = commit.run();
  if (outcome.kind == CommitOutcome::Kind::Disturbed) {
    means_.tell("Another program wrote a file of the migration meanwhile: it begins anew");
    return Attempt::GivenUp;
  }
  if (outcome.kind == CommitOutcome::Kind::Failed) {
    return fail(std::move(outcome.error));
  }
  conclusion_.isCommitted = true;
  conclusion_.keptFolder = std::move(outcome.keptFolder);
  for (std::string& warning : outcome.warnings) {
    conclusion_.warnings.push_back(std::move(warning));
  }
  return Attempt::Over;
}

MigrationRun::Attempt MigrationRun::fail(ProgramError error) {
  conclusion_.exitStatus = error.exitStatus;
  conclusion_.error = std::move(error);
  return Attempt::Over;
}

}  // namespace accounts
