#include "host/RunCommand.h"

#include <sys/mman.h>

#include <memory>
#include <string>
#include <utility>

#include "commandline/MemoryReserve.h"
#include "commandline/StandardStreams.h"
#include "host/Announcements.h"
#include "host/CommandLine.h"
#include "host/CurrentTime.h"
#include "host/PluginWork.h"
#include "host/StopSignals.h"
#include "host/ToldResult.h"
#include "host/WorkerProcess.h"
#include "platform/linux/LinuxDevicePlaces.h"
#include "platform/linux/LinuxHostLocks.h"
#include "propertylist/value/Description.h"
#include "report/HTMLReport.h"

namespace accounts {
namespace {

/// Writes a result where people and programs look for it.
ExitStatus print(const ToldResult& told, ExitStatus exitStatus) {
  for (const std::string& warning : told.warnings) {
    printWarning(kProgramName, warning);
  }
  if (told.error) {
    printError(kProgramName, *told.error);
  }
  return printResult(kProgramName, told.result, exitStatus);
}

/// Tells of a run without a worker: none could be made, or it ended before its time.
ExitStatus tellAlone(const RunOptions& options, const RunConclusion& conclusion) {
  RunReport report;
  note(report, conclusion, options);
  const std::string text = lineOf(fullReport(commandOf(options), report, {}));
  if (const auto written =
          writeReport(options.reports, text + "\n", options.reports.html ? htmlReport(text) : "");
      !written) {
    noteReportError(report, written.error());
  }
  return print(toldResult(options, report, {}), report.exitStatus);
}

/// Lets the worker tell of a run, which it knows best.
ExitStatus tell(const RunOptions& options, const RunConclusion& conclusion, WorkerProcess* worker) {
  const auto reports =
      worker != nullptr
          ? worker->ask(FrameKind::Conclusion, bytesOf(conclusion),
                        options.reports.areWanted()
                            ? std::vector<FrameKind>{FrameKind::Report, FrameKind::Page}
                            : std::vector<FrameKind>())
          : std::nullopt;
  if (!reports) {
    return tellAlone(options, conclusion);
  }
  ExitStatus exitStatus = conclusion.exitStatus;
  OrProgramError<void> written;
  if (options.reports.areWanted()) {
    written = writeReport(options.reports, reports->at(0), reports->at(1));
  }
  if (!written && exitStatus == ExitStatus::Success) {
    // A report that is missing is an error of a program that otherwise succeeded.
    exitStatus = written.error().exitStatus;
  }
  const auto answer =
      worker->ask(FrameKind::ReportErrors, bytesOfWriting(written), {FrameKind::ToldResult});
  const auto told = answer ? toldResultFrom(answer->front()) : std::nullopt;
  return told ? print(*told, exitStatus) : tellAlone(options, conclusion);
}

RunConclusion conclusionOf(ProgramError error) {
  RunConclusion conclusion;
  conclusion.exitStatus = error.exitStatus;
  conclusion.error = std::move(error);
  return conclusion;
}

/// One run on an opened device.
class OpenedRun {
 public:
  OpenedRun(const RunOptions& options, const OpenedDevice& device, StopSignals& stop)
      : options_(options),
        stop_(stop),
        linux_(*device.platform),
        locks_(
            linux_.root(), [&stop] { return stop.haveArrived(); }, &OpenedRun::say),
        places_(linux_.root(), linux_.fileSystem(), linux_.platform().homeDirectory.path(),
                options.purpose == RunPurpose::Plan ? ReadOnlyMounts::Overlook
                                                    : ReadOnlyMounts::Refuse),
        work_{.options = options,
              .device = device,
              .home = linux_.platform().homeDirectory.path(),
              .leaveHost = [this] { locks_.closeInChild(); },
              .recording = recording_} {}

  ExitStatus run() { return options_.bare ? runBare() : runInMemory(options_.purpose); }

 private:
  static void say(std::string_view line) { printError(kProgramName, line); }

  std::unique_ptr<WorkerProcess> makeWorker() {
    return std::make_unique<WorkerProcess>(
        [this](const WorkerSide& side, const DeviceSnapshot& snapshot, const WorkerTask& task) {
          workInMemory(work_, side, snapshot, task);
        },
        stop_, WorkerRights::GivenUp);
  }

  RunMeans means() {
    return {.locks = locks_,
            .places = places_,
            .files = linux_.fileSystem(),
            .makeWorker = [this] { return makeWorker(); },
            .isStopped = [this] { return isStoppedBeforeCommit(); },
            .tell = [this](std::string_view line) { tellOfAttempt(line); },
            .time = currentTimeText(),
            .lockTimeout = options_.device.lockTimeout};
  }

  /// What is begun after this is brought to its end.
  bool isStoppedBeforeCommit() {
    MemoryReserve::requireUntouched();
    return stop_.haveArrived();
  }

  /// In both logs, so that their lines of an attempt that counts for nothing are not taken for
  /// more.
  void tellOfAttempt(std::string_view words) {
    const std::string line = escapedText(words);
    linux_.platform().consoleLog.writeLine(line);
    if (channel_ == nullptr) {
      channel_ = &linux_.platform().logSystem.makeChannel("com.quarx.accountsettings", "log");
    }
    if (channel_->isEnabled()) {
      channel_->write({.text = line});
    }
  }

  ExitStatus runInMemory(RunPurpose purpose) {
    RunMeans given = means();
    MigrationRun run(given);
    RunConclusion conclusion = run.run(purpose, options_.keep);
    auto* const worker = static_cast<WorkerProcess*>(run.worker());
    if (options_.broadcastsOnDBus && conclusion.isCommitted) {
      announce(worker->announcements(), conclusion);
    }
    return worker != nullptr && worker->hasEnded() ? tellOfEndedWorker(conclusion)
                                                   : tell(options_, conclusion, worker);
  }

  ExitStatus tellOfEndedWorker(const RunConclusion& conclusion) {
    if (!options_.recorded) {
      return tell(options_, conclusion, nullptr);
    }
    WorkerProcess teller([this](const WorkerSide& side, const DeviceSnapshot&,
                                const WorkerTask&) { accounts::tellOfEndedWorker(work_, side); },
                         stop_, WorkerRights::GivenUp);
    const bool isThere = teller.work({}, {}).has_value();
    return tell(options_, conclusion, isThere ? &teller : nullptr);
  }

  ExitStatus runBare() {
    // An interrupted commit is finished first, by its own rules.
    if (linux_.fileSystem().fileExists(pathOfPlace(DevicePlace::CommitRecord, work_.home))) {
      RunMeans given = means();
      const RunConclusion finished =
          MigrationRun(given).run(RunPurpose::FinishingAlone, KeepFiles::WhenNeeded);
      if (finished.exitStatus != ExitStatus::Success) {
        return tell(options_, finished, nullptr);
      }
    }
    places_.removeAbandonedTemporaryFiles();
    WorkerProcess worker([this](const WorkerSide& side, const DeviceSnapshot&,
                                const WorkerTask&) { workOnDevice(work_, side); },
                         stop_, WorkerRights::ThoseOfTheHost);
    RunConclusion conclusion;
    const auto worked = worker.work({}, {});
    if (!worked) {
      conclusion = conclusionOf(worked.error());
    } else {
      const auto proposal = proposalFrom(worked->proposal, worked->memoryFileSize);
      conclusion.exitStatus = proposal ? proposal->status : ExitStatus::PluginEnded;
      if (options_.broadcastsOnDBus) {
        announce(worker.announcements(), conclusion);
      }
    }
    return worker.hasEnded() ? tellOfEndedWorker(conclusion) : tell(options_, conclusion, &worker);
  }

  static void announce(const std::string& bytes, RunConclusion& conclusion) {
    if (const auto announcements = announcementsFrom(bytes)) {
      if (auto sentence = broadcastOnDBus(*announcements)) {
        conclusion.warnings.push_back(*std::move(sentence));
      }
    }
  }

  const RunOptions& options_;
  StopSignals& stop_;
  LinuxPlatform& linux_;
  LinuxHostLocks locks_;
  LinuxDevicePlaces places_;
  /// In memory; a descriptor of nothing where there is no memory for it, and then nothing is kept.
  const FileDescriptor recording_{memfd_create("recording", MFD_CLOEXEC)};
  PluginWork work_;
  LogChannel* channel_ = nullptr;
};

}  // namespace

ExitStatus runMigration(const RunOptions& options) {
  if (const auto writable = checkWritable(options.reports); !writable) {
    // There is no file to tell it in either.
    RunOptions withoutReports = options;
    withoutReports.reports = {};
    return tellAlone(withoutReports, conclusionOf(writable.error()));
  }
  StopSignals stop;
  const auto opened = openDevice(options.device);
  if (!opened) {
    return tellAlone(options, conclusionOf(opened.error()));
  }
  return OpenedRun(options, *opened, stop).run();
}

}  // namespace accounts
