#include "host/PluginWork.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <limits>
#include <memory>
#include <utility>

#include "commandline/PlatformError.h"
#include "commandline/WorkerEnd.h"
#include "host/Announcements.h"
#include "host/KernelOwnershipRule.h"
#include "host/ReportFiles.h"
#include "host/ToldResult.h"
#include "platform/ReplacedParts.h"
#include "platform/linux/FileContents.h"
#include "platform/linux/LinuxPreferenceDomain.h"
#include "platform/linux/OpenedBytes.h"
#include "report/HTMLReport.h"
#include "report/MigrationRecorder.h"
#include "report/RecordedPlatform.h"
#include "safetynet/MigrationInMemory.h"
#include "transaction/TransactionPlatform.h"

namespace accounts {
namespace {

/// What the plug-in did, before it is known what becomes of it.
struct PluginOutcome {
  RunReport report;
  RecordedMigration recorded;
};

using Loaded = OrProgramError<LoadedPlugin>;

/// Makes an instance of the plug-in and lets it migrate.
RunReport runPlugin(const LoadedPlugin& loaded, const Platform& platform, ToldFates& told) {
  told.passOnTo(platform.migrationObserver);
  Platform observed = platformWith(platform, {.migrationObserver = &told});
  RunReport report;
  auto made = loaded.makeInstance(observed);
  if (!made) {
    setError(report, made.error());
    return report;
  }
  auto& plugin = *made;
  report.dataClassName = plugin->dataClassName();
  report.result = plugin->performMigration();
  plugin.reset();
  told.passOnTo(nullptr);
  report.steps = told.stages();
  return report;
}

/// The files that hold accounts, those that can be read.
std::vector<StoreFile> storesOf(PropertyLists& propertyLists, std::string_view home) {
  const std::pair<FileKind, DevicePlace> places[] = {
      {FileKind::AccountSettings, DevicePlace::Settings},
      {FileKind::ExchangeStore, DevicePlace::LegacyExchange},
      {FileKind::MailStore, DevicePlace::LegacyMail}};
  std::vector<StoreFile> stores;
  for (const auto& [kind, place] : places) {
    if (std::optional<PropertyDictionary> content =
            propertyLists.readDictionary(pathOfPlace(place, home))) {
      stores.push_back({kind, *std::move(content)});
    }
  }
  return stores;
}

RecordedMigration recordedSoFar(const PluginWork& work) {
  std::string text;
  const PartOfOpenedBytes recording(work.recording, 0, std::numeric_limits<std::int64_t>::max(),
                                    "the recording");
  static_cast<void>(recording.giveTo([&text](std::string_view piece) {
    text.append(piece);
    return true;
  }));
  std::vector<std::string> lines;
  for (std::size_t begin = 0, end = 0; (end = text.find('\n', begin)) != std::string::npos;
       begin = end + 1) {
    lines.push_back(text.substr(begin, end - begin));
  }
  return RecordedMigration::fromLines(lines);
}

/// What came of a plug-in that could not run.
PluginOutcome failedOutcome(const ProgramError& error) {
  PluginOutcome outcome;
  setError(outcome.report, error);
  return outcome;
}

PluginOutcome runRecordedPlugin(const PluginWork& work, const Loaded& loaded,
                                const Platform& platform, ToldFates& told) {
  if (!loaded) {
    return failedOutcome(loaded.error());
  }
  if (const Result decoded = work.device.platform->decodeDescription(); !decoded) {
    return failedOutcome(programErrorOf(decoded.error(), ExitStatus::MissingInput));
  }
  const LoadedPlugin& plugin = *loaded;
  if (!work.options.recorded) {
    return {runPlugin(plugin, platform, told), {}};
  }
  // A line that does not arrive is missed by people alone.
  MigrationRecorder recorder(
      [&work](std::string_view line) {
        static_cast<void>(writeAll(work.recording.number(), std::string(line) + "\n"));
      },
      *work.options.recorded);
  RecordedPlatform recorded(platform, recorder);
  recorder.recordBefore(storesOf(platform.propertyLists, work.home));
  PluginOutcome outcome = {runPlugin(plugin, recorded.platform(), told), {}};
  recorder.recordAfter(
      platform.propertyLists.readDictionary(pathOfPlace(DevicePlace::Settings, work.home)));
  outcome.recorded = recordedSoFar(work);
  return outcome;
}

/// What the plug-in announced, taken from the platform that recorded it.
void noteAnnouncements(const PluginWork& work, RunReport& report) {
  LinuxPlatform& linux = *work.device.platform;
  report.broadcasts = linux.preferencesBroadcast().changes();
  const std::vector<CloudTabs>& announcements = linux.cloudTabService().announcements();
  report.cloudTabAnnouncements = static_cast<std::size_t>(
      std::count(announcements.begin(), announcements.end(), CloudTabs::On));
}

/// Hands over, waits for the outcome, and tells of it. `finish` completes the report once the
/// outcome is known.
void handOverAndTell(const PluginWork& work, const WorkerSide& side, const Proposal& proposal,
                     PluginOutcome& outcome,
                     const std::function<void(RunReport&, const RunConclusion&)>& finish) {
  RunReport& report = outcome.report;
  const Announcements announcements{report.broadcasts, report.cloudTabAnnouncements};
  if (!sendFrame(side.socket, FrameKind::Announcements, bytesOf(announcements)) ||
      !sendFrame(side.socket, FrameKind::Proposal, bytesOf(proposal))) {
    return;
  }
  const std::optional<Frame> frame = receiveFrame(side.socket);
  const auto conclusion =
      frame && frame->kind == FrameKind::Conclusion ? conclusionFrom(frame->bytes) : std::nullopt;
  if (!conclusion) {
    return;
  }
  note(report, *conclusion, work.options);
  finish(report, *conclusion);
  const ReportFiles& reports = work.options.reports;
  if (reports.areWanted()) {
    const std::string text = lineOf(fullReport(commandOf(work.options), report, outcome.recorded));
    if (!sendFrame(side.socket, FrameKind::Report, reports.json ? text + "\n" : "") ||
        !sendFrame(side.socket, FrameKind::Page, reports.html ? htmlReport(text) : "")) {
      return;
    }
  }
  const std::optional<Frame> errors = receiveFrame(side.socket);
  if (!errors || errors->kind != FrameKind::ReportErrors) {
    return;
  }
  if (const auto written = writingFrom(errors->bytes); !written) {
    noteReportError(report, written.error());
  }
  // What the plug-in printed, too, before the host ends.
  std::cout.flush();
  static_cast<void>(std::fflush(nullptr));
  static_cast<void>(sendFrame(side.socket, FrameKind::ToldResult,
                              bytesOf(toldResult(work.options, report, outcome.recorded))));
  // Here rather than by returning: what a large migration holds takes long to be taken apart.
  std::exit(EXIT_SUCCESS);
}

/// Gives up what neither a migration in memory nor telling of it needs; all is open by now. Ends
/// the process when that cannot be done.
void giveUpRights(const PluginWork& work, const WorkerSide& side) {
  const LinuxPlatform& linux = *work.device.platform;
  Confinement kept = {.descriptors = side.inputs, .limits = side.limits};
  kept.descriptors.insert(kept.descriptors.end(), {side.socket.number(), side.memoryFile.number(),
                                                   work.recording.number()});
  if (const auto channel = linux.channelDescriptor()) {
    kept.descriptors.push_back(*channel);
  }
  if (linux.logsToJournal()) {
    kept.journalEntries = JournalEntries::Sent;
  }
  endUnlessGivenUp(accounts::giveUpRights(kept), side.socket);
}

/// Reports a path that no migration has and ends the process.
[[noreturn]] void endOnForeignPath(const WorkerSide& side, std::string_view path) {
  static_cast<void>(
      sendFrame(side.socket, FrameKind::Fault,
                "The plug-in used a path that no migration has: " + std::string(path)));
  _exit(static_cast<int>(ExitStatus::PluginEnded));
}

/// Completes the report of a migration in memory with what only its maker knows.
void finishReport(RunReport& report, const RunConclusion& conclusion, MigrationInMemory& migration,
                  const RunOptions& options) {
  const bool isPlan = options.purpose == RunPurpose::Plan;
  const bool isMade = conclusion.isCommitted || (isPlan && !report.error);
  report.settingsSaves =
      RunReport::SettingsSaves{migration.transaction().lastSave(),
                               isMade && migration.transaction().lastSave() == LastSave::Written};
  if (!isMade) {
    report.broadcasts.clear();
    report.cloudTabAnnouncements = 0;
    return;
  }
  report.ledger = migration.ledger();
  if (!report.ledger->isClean()) {
    report.exitStatus = ExitStatus::NotAllCarriedOver;
    report.warnings.push_back(
        lossesWithTheFirst(*report.ledger) +
        (isPlan
             ? std::string("; a run would keep the files as they were")
             : "; the files as they were are kept in " + *conclusion.keptFolder + ", and \"" +
                   restoreCommand(options.device, *conclusion.keptFolder) + "\" puts them back"));
  }
  report.warnings.insert(report.warnings.end(), migration.warnings().begin(),
                         migration.warnings().end());
  if (isPlan && migration.transaction().snapshot().isReadOnly) {
    report.warnings.emplace_back(
        "The device is mounted read-only: a run could not change it as it is");
  }
}

}  // namespace

void workInMemory(const PluginWork& work, const WorkerSide& side, const DeviceSnapshot& snapshot,
                  const WorkerTask& task) {
  work.leaveHost();
  LinuxPlatform& linux = *work.device.platform;
  // Whatever has to be opened is opened here.
  const Result read = linux.readAhead();
  const Loaded loaded =
      read ? work.device.bundle.load() : programErrorOf(read.error(), ExitStatus::MissingInput);
  KernelOwnershipRule ownership(linux.root());
  ownership.readAhead(std::string(kSettingsFileOwner));
  giveUpRights(work, side);

  MigrationInMemory migration(snapshot, work.home);
  TransactionPlatform inMemory(migration.transaction(), linux.platform(), ownership, task.lock,
                               [&side](std::string_view path) { endOnForeignPath(side, path); });
  LinuxPreferenceDomain preferences(inMemory.propertyLists(), linux.platform().homeDirectory);
  const Platform platform = inMemory.platform(preferences);
  PluginOutcome outcome;
  Proposal proposal;
  if (task.purpose == RunPurpose::FinishingAlone) {
    migration.verify(PluginResult::NotAsked, {});
  } else {
    outcome = runRecordedPlugin(work, loaded, platform, migration.told());
    noteAnnouncements(work, outcome.report);
    migration.verify(outcome.report.result ? PluginResult::GaveTrue : PluginResult::GaveFalse,
                     factsOf(platform));
  }
  RunReport& report = outcome.report;
  if (report.error) {
    // It could not be loaded.
    proposal.status = report.exitStatus;
  } else {
    if (migration.error()) {
      setError(report, *migration.error());
    }
    int number = 0;
    const auto made = migration.proposal(task.keep, [&](std::string_view bytes) {
      number = writeAll(side.memoryFile.number(), bytes);
      return number == 0;
    });
    if (made) {
      proposal = *made;
    } else {
      const ProgramError error =
          number != 0
              ? ProgramError{ExitStatus::TemporaryFailure,
                             pathFailure("write", "the migration's result in memory", number).text}
              : ProgramError{ExitStatus::NotVerified,
                             "The result stands for more values than a file of its size may"};
      proposal.status = error.exitStatus;
      setError(report, error);
    }
  }
  handOverAndTell(work, side, proposal, outcome,
                  [&](RunReport& told, const RunConclusion& conclusion) {
                    finishReport(told, conclusion, migration, work.options);
                  });
}

void tellOfEndedWorker(const PluginWork& work, const WorkerSide& side) {
  work.leaveHost();
  giveUpRights(work, side);
  PluginOutcome outcome = {{}, recordedSoFar(work)};
  handOverAndTell(work, side, {}, outcome, [](RunReport&, const RunConclusion&) {});
}

void workOnDevice(const PluginWork& work, const WorkerSide& side) {
  work.leaveHost();
  const auto root = work.device.platform->root().open("/", O_PATH | O_DIRECTORY);
  endUnlessGivenUp(root ? giveUpForeignRights(root->number()) : root.error(), side.socket);
  ToldFates told;
  PluginOutcome outcome =
      runRecordedPlugin(work, work.device.bundle.load(), work.device.platform->platform(), told);
  RunReport& report = outcome.report;
  noteAnnouncements(work, report);
  if (!report.error && !report.result) {
    setError(report, {ExitStatus::MigrationFailed, "The plug-in reported that it failed"});
  }
  Proposal nothing;
  nothing.status = report.exitStatus;
  handOverAndTell(work, side, nothing, outcome, [](RunReport&, const RunConclusion&) {});
}

}  // namespace accounts
