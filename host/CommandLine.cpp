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

std::string requireBus(const std::string& value) {
  return value == "dbus" ? "" : "must be dbus";
}

/// The arguments of every subcommand; those of the one that is chosen are filled.
struct Arguments {
  RunOptions run;
  RunOptions plan;
  RestoreOptions restore;
  ReportFiles reports;
  bool wantsJSON = false;
  bool showsSecrets = false;

  [[nodiscard]] Secrets secrets() const { return showsSecrets ? Secrets::Show : Secrets::Hide; }
};

using Asked = decltype(CommandLine::asked);

void addLockTimeout(CLI::App& command, std::optional<std::chrono::seconds>& timeout) {
  command
      .add_option_function<unsigned>(
          "--lock-timeout",
          [&timeout](unsigned seconds) { timeout = std::chrono::seconds(seconds); },
          "How long each lock is waited for that another process has (default: as long as it "
          "takes)")
      ->option_text("SECONDS")
      ->check(requireCount);
}

void addDeviceOptions(CLI::App& command, DeviceOptions& options) {
  addDevice(command, options.root, options.home);
  addPath(command, "--device", options.deviceDescription, "FILE",
          "The device description, - for standard input (default: the root's /etc/device.plist, if "
          "there is one)");
  addPath(command, "--plugin", options.plugin, "BUNDLE",
          "The plug-in bundle (default: that of the program)");
  addPath(
      command, "--temporary-directory", options.temporaryDirectory, "DIR",
      "Where the temporary files of --bare go, a device path (default: tmp in the home directory)")
      ->check(requireDevicePath);
  addPath(command, "--channel", options.channel, "FILE",
          "Append the log channel to FILE, - for standard error, journal for the system's journal "
          "(default: off)");
  addLockTimeout(command, options.lockTimeout);
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

CLI::Option* addJSON(CLI::App& command, Arguments& arguments) {
  return command.add_flag("--json", arguments.wantsJSON,
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
      ->check(requireBus);
  command.add_flag_callback(
      "--keep", [&arguments] { arguments.run.keep = KeepFiles::Always; },
      "Keep the files as they were after a clean run, too");
  command.add_flag(
      "--bare", arguments.run.bare,
      "Run the plug-in on the device itself, save by save, without verifying anything");
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
  CLI::Option* const json = addJSON(command, arguments);
  command
      .add_option("--account", arguments.plan.account,
                  "Tell of one account alone, by an identifier that it has or had: where it comes\n"
                  "from, what each stage does to it, and where it ends")
      ->option_text("IDENTIFIER")
      ->check(requireText)
      ->excludes(json);
}

Asked planAsked(Arguments& arguments) {
  arguments.plan.purpose = RunPurpose::Plan;
  arguments.plan.recorded = arguments.secrets();
  return arguments.plan;
}

void addRestore(CLI::App& command, Arguments& arguments) {
  addDevice(command, arguments.restore.root, arguments.restore.home);
  addPath(command, "--from", arguments.restore.folder, "FOLDER",
          "The folder of kept files, by its name or device path (default: the only one)");
  const auto asks = [&arguments](RestoreAction action) {
    return [&arguments, action] { arguments.restore.action = action; };
  };
  CLI::Option* const list = command.add_flag_callback(
      "--list", asks(RestoreAction::List), "Show the folders of kept files with what is in them");
  command
      .add_flag_callback("--discard", asks(RestoreAction::Discard),
                         "Remove a folder of kept files; nothing is put back")
      ->excludes(list);
  addLockTimeout(command, arguments.restore.lockTimeout);
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
          .root = valueOfOption(argumentCount, arguments, "--root"),
          .reports = std::move(parsed.reports)};
}

}  // namespace accounts
