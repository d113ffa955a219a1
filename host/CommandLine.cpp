#include "host/CommandLine.h"

#include <CLI/CLI.hpp>
#include <utility>

#include "commandline/OptionDeclarations.h"
#include "commandline/Subcommands.h"
#include "host/HelpTexts.h"
#include "platform/linux/FileContents.h"

namespace accounts {
namespace {

constexpr const char* kVersion = "migration-host " MIGRATION_HOST_VERSION;

// A month, which is as good as no limit.
constexpr unsigned kLongestLockTimeout = 31 * 24 * 60 * 60;

/// The arguments of every subcommand; those of the one that is chosen are filled.
struct Arguments {
  RunOptions run;
  PlanOptions plan;
  RestoreOptions restore;
  ReportFiles reports;
  bool wantsJSON = false;
  bool showsSecrets = false;

  [[nodiscard]] Secrets secrets() const { return showsSecrets ? Secrets::Show : Secrets::Hide; }
};

using Asked = decltype(CommandLine::asked);

void addDeviceOptions(CLI::App& command, DeviceOptions& options) {
  addDevice(command, options.root, options.home);
  addPath(command, "--device", options.deviceDescription, "FILE",
          "The device description, - for standard input (default: the root's /etc/device.plist, if "
          "there is one)");
  addPath(command, "--plugin", options.plugin, "BUNDLE",
          "The plug-in bundle (default: that of the program)");
  addPath(command, "--temporary-directory", options.temporaryDirectory, "DIR",
          "Where temporary files go, a device path (default: tmp in the home directory)")
      ->check(requireDevicePath);
  addPath(command, "--channel", options.channel, "FILE",
          "Append the log channel to FILE, - for standard error, journal for the system's journal "
          "(default: off)");
  command
      .add_option_function<unsigned>(
          "--lock-timeout",
          [&options](unsigned seconds) { options.lockTimeout = std::chrono::seconds(seconds); },
          "How long another host on the root is waited for (default: as long as it takes)")
      ->option_text("SECONDS")
      ->check(CLI::Range(0U, kLongestLockTimeout));
}

/// What is wrong with a report's file; empty when nothing is.
std::string requireNamedFile(const std::string& value) {
  return value == kStandardStream ? "must be a file, since standard output carries the summary"
                                  : "";
}

void addReports(CLI::App& command, Arguments& arguments) {
  addPath(command, "--report", arguments.reports.json, "FILE",
          "Write each stage and every change to FILE, as one JSON object")
      ->check(requireNamedFile);
  addPath(command, "--html", arguments.reports.html, "FILE",
          "Write the same to FILE, as one page for a browser")
      ->check(requireNamedFile);
  command.add_flag("--show-secrets", arguments.showsSecrets,
                   "Show passwords, tokens and the like in reports as well");
}

void addJSON(CLI::App& command, Arguments& arguments) {
  command.add_flag("--json", arguments.wantsJSON,
                   "Write one JSON object on one line to standard output");
}

void addRun(CLI::App& command, Arguments& arguments) {
  addDeviceOptions(command, arguments.run.device);
  addReports(command, arguments);
  command
      .add_option_function<std::string>(
          "--broadcast",
          [&arguments](const std::string&) { arguments.run.broadcastsOnDBus = true; },
          "Announce changed preferences and cloud tabs on BUS, which is dbus (default: not at all)")
      ->option_text("BUS")
      ->check(CLI::IsMember({"dbus"}));
  command.add_flag("--bare", arguments.run.bare,
                   "Run the plug-in without keeping or verifying anything");
  addJSON(command, arguments);
}

Asked runAsked(Arguments& arguments) {
  if (arguments.reports.areWanted()) {
    arguments.run.recorded = arguments.secrets();
  }
  return arguments.run;
}

void addPlan(CLI::App& command, Arguments& arguments) {
  addDeviceOptions(command, arguments.plan.device);
  addReports(command, arguments);
  addJSON(command, arguments);
}

Asked planAsked(Arguments& arguments) {
  arguments.plan.secrets = arguments.secrets();
  return arguments.plan;
}

void addRestore(CLI::App& command, Arguments& arguments) {
  addDevice(command, arguments.restore.root, arguments.restore.home);
  addPath(command, "--from", arguments.restore.folder, "FOLDER",
          "The folder of kept files, by its name or device path (default: the only one)");
  addJSON(command, arguments);
}

Asked restoreAsked(Arguments& arguments) {
  return arguments.restore;
}

constexpr ProgramTexts kProgram = {kProgramName, kVersion, help::kProgram, help::kProgramExamples,
                                   help::kErrors};

constexpr Subcommand<Arguments, Asked> kSubcommands[] = {
    {{"run", help::kRun, help::kRunStatuses, help::kRunErrors, help::kRunExamples},
     addRun,
     runAsked},
    {{"plan", help::kPlan, help::kPlanStatuses, help::kRunErrors, help::kPlanExamples},
     addPlan,
     planAsked},
    {{"restore", help::kRestore, help::kRestoreStatuses, help::kRestoreErrors,
      help::kRestoreExamples},
     addRestore,
     restoreAsked},
};

}  // namespace

CommandLine parseCommandLine(int argumentCount, const char* const* arguments) {
  Arguments parsed;
  Asked asked =
      parseSubcommands<Arguments, Asked>(kProgram, kSubcommands, argumentCount, arguments, parsed)
          .asked;
  return {.asked = std::move(asked),
          .wantsJSON = hasArgument(argumentCount, arguments, "--json"),
          .reports = std::move(parsed.reports)};
}

}  // namespace accounts
