#include "host/CommandLine.h"

#include <CLI/CLI.hpp>
#include <utility>

#include "commandline/OptionDeclarations.h"
#include "host/HelpTexts.h"

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
          "The device description (default: the root's /etc/device.plist, if there is one)");
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

void addReports(CLI::App& command, Arguments& arguments) {
  addPath(command, "--report", arguments.reports.json, "FILE",
          "Write each stage and every change to FILE, as one JSON object");
  addPath(command, "--html", arguments.reports.html, "FILE",
          "Write the same to FILE, as one page for a browser");
  command.add_flag("--show-secrets", arguments.showsSecrets,
                   "Show passwords, tokens and the like in reports as well");
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
}

Asked planAsked(Arguments& arguments) {
  arguments.plan.secrets = arguments.secrets();
  return arguments.plan;
}

void addRestore(CLI::App& command, Arguments& arguments) {
  addDevice(command, arguments.restore.root, arguments.restore.home);
  addPath(command, "--from", arguments.restore.folder, "FOLDER",
          "The folder of kept files, by its name or device path (default: the only one)");
}

Asked restoreAsked(Arguments& arguments) {
  return arguments.restore;
}

/// A subcommand: how its arguments are declared, and what they ask for once they are parsed.
struct Subcommand {
  const char* name;
  const char* description;
  const char* exitStatuses;
  const char* errors;
  const char* examples;
  void (*add)(CLI::App& command, Arguments& arguments);
  Asked (*asked)(Arguments& arguments);
};

constexpr Subcommand kSubcommands[] = {
    {"run", help::kRun, help::kRunStatuses, help::kRunErrors, help::kRunExamples, addRun, runAsked},
    {"plan", help::kPlan, help::kPlanStatuses, help::kRunErrors, help::kPlanExamples, addPlan,
     planAsked},
    {"restore", help::kRestore, help::kRestoreStatuses, help::kRestoreErrors,
     help::kRestoreExamples, addRestore, restoreAsked},
};

void addSubcommand(CLI::App& program, const Subcommand& subcommand, Arguments& arguments) {
  CLI::App& command = *program.add_subcommand(subcommand.name, subcommand.description);
  addHelpAndVersion(command, kVersion);
  command.footer(std::string("Exit status:\n") + subcommand.exitStatuses + help::kErrors +
                 subcommand.errors + "\nExamples:\n" + subcommand.examples);
  subcommand.add(command, arguments);
  command.add_flag("--json", arguments.wantsJSON,
                   "Write one JSON object on one line to standard output");
}

/// What the chosen subcommand asks for.
Asked askedBy(const CLI::App& program, Arguments& arguments) {
  for (const Subcommand& subcommand : kSubcommands) {
    if (program.got_subcommand(subcommand.name)) {
      return subcommand.asked(arguments);
    }
  }
  return UnusableArguments{"A subcommand is required"};
}

}  // namespace

CommandLine parseCommandLine(int argumentCount, const char* const* arguments) {
  Arguments parsed;
  CLI::App program(help::kProgram, kProgramName);
  addHelpAndVersion(program, kVersion);
  program.footer(help::kProgramExamples);
  for (const Subcommand& subcommand : kSubcommands) {
    addSubcommand(program, subcommand, parsed);
  }
  ArgumentParsing parsing = parseArguments(program, argumentCount, arguments);
  CommandLine commandLine;
  commandLine.wantsJSON = hasArgument(argumentCount, arguments, "--json");
  if (auto* text = std::get_if<RequestedText>(&parsing)) {
    commandLine.asked = std::move(*text);
  } else if (auto* problem = std::get_if<UnusableArguments>(&parsing)) {
    commandLine.asked = std::move(*problem);
  } else {
    commandLine.reports = parsed.reports;
    commandLine.asked = askedBy(program, parsed);
  }
  return commandLine;
}

}  // namespace accounts
