#include "host/CommandLine.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <string_view>

#include "propertylist/Description.h"

namespace accounts {
namespace {

constexpr const char* kVersion = "migration-host " MIGRATION_HOST_VERSION;

constexpr const char* kProgramExamples =
    "Examples:\n"
    "  migration-host run --root /mnt/image\n"
    "  migration-host restore --root /mnt/image\n"
    "  migration-host run --help\n";

constexpr const char* kRunDescription =
    "Run the account-settings migration on one device root.\n\n"
    "The settings file and the legacy stores are kept until the result is verified, and put back\n"
    "if it cannot be; with --bare the plug-in's result is reported as it stands. Standard error\n"
    "carries the plug-in's console lines, standard output a short summary or, with --json, one\n"
    "object on one line.";

constexpr const char* kRunExamples =
    "Exit status:\n"
    "  0   the plug-in reported success, which was verified unless --bare is given\n"
    "  1   the plug-in reported failure\n"
    "  2   the plug-in reported success, which was not verified: the files are put back\n"
    "  64  the arguments cannot be used\n"
    "  66  no such root, device description or bundle\n"
    "  70  the plug-in ended by an assertion or a signal\n"
    "  73  a file of the host's own cannot be created\n"
    "  74  a file or stream of the host's own cannot be written or read\n"
    "\n"
    "Examples:\n"
    "  migration-host run --root /                             the running device\n"
    "  migration-host run --root /mnt/image --json             an image, for a program to read\n"
    "  migration-host run --root /mnt/image --channel -        the log channel as well\n"
    "  migration-host run --root image --device other.plist    answers of another device\n";

constexpr const char* kRestoreDescription =
    "Put back the settings file and the legacy stores that a run kept.\n\n"
    "A run that was killed, or that may not have carried over everything, leaves them in\n"
    "/var/mobile/Library/AccountMigration/Kept-TIME on the device. What is replaced is itself\n"
    "kept, in Replaced-TIME beside it, and the folder whose files are back is removed.";

constexpr const char* kRestoreExamples =
    "Exit status:\n"
    "  0   the files are back\n"
    "  64  the arguments cannot be used, or --from is needed to choose among several folders\n"
    "  66  no such root or folder, or nothing is kept\n"
    "  73  what would be replaced cannot be kept; nothing was changed\n"
    "  74  the files cannot be put back; the folder is still whole\n"
    "\n"
    "Examples:\n"
    "  migration-host restore --root /mnt/image\n"
    "  migration-host restore --root /mnt/image --from Kept-20260102T030405Z\n";

std::string requireText(const std::string& value) {
  return value.empty() ? "must not be empty" : "";
}

std::string requireDevicePath(const std::string& value) {
  return value.starts_with('/') ? "" : "must be an absolute device path, such as /var/mobile";
}

CLI::Option* addPath(CLI::App& command, const std::string& name,
                     std::optional<std::string>& destination, const std::string& placeholder,
                     const std::string& description) {
  return command
      .add_option_function<std::string>(
          name, [&destination](const std::string& value) { destination = value; }, description)
      ->option_text(placeholder);
}

/// Whether the person wants JSON, also when the arguments as a whole cannot be used.
OutputForm requestedOutput(int argumentCount, const char* const* arguments) {
  const bool json = std::any_of(arguments, arguments + argumentCount,
                                [](std::string_view word) { return word == "--json"; });
  return json ? OutputForm::JSON : OutputForm::Summary;
}

void addCommonOptions(CLI::App& command, std::string& root, std::optional<std::string>& home,
                      OutputForm& output) {
  command.set_version_flag("--version", kVersion, "Print the version and exit");
  command.set_help_flag("-h,--help", "Print this help and exit");
  command.add_option("--root", root, "The device root: / or the directory of an image")
      ->option_text("DIR")
      ->required()
      ->check(requireText);
  addPath(command, "--home", home, "DIR",
          "The mobile user's home directory, a device path (default /var/mobile)")
      ->check(requireDevicePath);
  command.add_flag_callback(
      "--json", [&output] { output = OutputForm::JSON; },
      "Write one JSON object on one line to standard output");
}

void addRunCommand(CLI::App& program, RunOptions& options) {
  CLI::App& run = *program.add_subcommand("run", kRunDescription);
  run.footer(kRunExamples);
  addCommonOptions(run, options.root, options.home, options.output);
  addPath(run, "--device", options.deviceDescription, "FILE",
          "The device description (default: the root's /etc/device.plist, if there is one)")
      ->check(requireText);
  addPath(run, "--plugin", options.plugin, "BUNDLE",
          "The plug-in bundle (default: accounts.migrator beside the program)")
      ->check(requireText);
  addPath(run, "--temporary-directory", options.temporaryDirectory, "DIR",
          "Where temporary files go, a device path (default: tmp in the home directory)")
      ->check(requireDevicePath);
  addPath(run, "--channel", options.channel, "FILE",
          "Append the log channel to FILE, - for standard error (default: off)")
      ->check(requireText);
  run.add_flag("--bare", options.bare, "Run the plug-in without keeping or verifying anything");
}

void addRestoreCommand(CLI::App& program, RestoreOptions& options) {
  CLI::App& restore = *program.add_subcommand("restore", kRestoreDescription);
  restore.footer(kRestoreExamples);
  addCommonOptions(restore, options.root, options.home, options.output);
  addPath(restore, "--from", options.folder, "FOLDER",
          "The folder of kept files, by its name or device path (default: the only one)")
      ->check(requireText);
}

UsageError usageError(const std::string& reason, int argumentCount, const char* const* arguments) {
  std::string message;
  appendEscapedText(message, reason);
  return UsageError{message + " (--help explains)", requestedOutput(argumentCount, arguments)};
}

}  // namespace

CommandLine parseCommandLine(int argumentCount, const char* const* arguments) {
  RunOptions options;
  CLI::App program("Runs the account-settings migration plug-in.", "migration-host");
  program.set_help_flag("-h,--help", "Print this help and exit");
  program.set_version_flag("--version", kVersion, "Print the version and exit");
  program.footer(kProgramExamples);
  program.require_subcommand(0, 1);
  RestoreOptions restoreOptions;
  addRunCommand(program, options);
  addRestoreCommand(program, restoreOptions);

  try {
    program.parse(argumentCount, arguments);
  } catch (const CLI::CallForHelp&) {
    return RequestedText{program.help()};
  } catch (const CLI::CallForVersion& request) {
    return RequestedText{std::string(request.what()) + "\n"};
  } catch (const CLI::Error& error) {
    return usageError(error.what(), argumentCount, arguments);
  }
  // Asked only now, so that an unknown word is named rather than found to be missing.
  if (program.get_subcommands().empty()) {
    return usageError("A subcommand is required, such as run", argumentCount, arguments);
  }
  return program.got_subcommand("restore") ? CommandLine(restoreOptions) : CommandLine(options);
}

}  // namespace accounts
