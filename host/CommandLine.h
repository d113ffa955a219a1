#pragma once

#include <optional>
#include <string>
#include <variant>

namespace accounts {

/// What the program writes to standard output when it is done.
enum class OutputForm { Summary, JSON };

/// One run of the plug-in. Paths belong to the machine that the host runs on, except those called
/// device paths, which start at the root of the device.
struct RunOptions {
  std::string root;
  /// A device path; none for the platform's own.
  std::optional<std::string> home;
  /// None for the root's own description.
  std::optional<std::string> deviceDescription;
  /// None for the bundle beside the program.
  std::optional<std::string> plugin;
  /// A device path; none for the one in the home directory.
  std::optional<std::string> temporaryDirectory;
  /// Where the log channel goes, "-" for standard error; none keeps the channel off.
  std::optional<std::string> channel;
  /// Runs the plug-in without the safety net.
  bool bare = false;
  OutputForm output = OutputForm::Summary;
};

/// Kept files are to be put back.
struct RestoreOptions {
  std::string root;
  /// A device path; none for the platform's own.
  std::optional<std::string> home;
  /// The name or the device path of the folder of kept files; none for the only one.
  std::optional<std::string> folder;
  OutputForm output = OutputForm::Summary;
};

/// The person asked for this text, and for nothing else.
struct RequestedText {
  std::string text;
};

/// The arguments cannot be used.
struct UsageError {
  /// One line that says which argument is wrong.
  std::string message;
  OutputForm output = OutputForm::Summary;
};

using CommandLine = std::variant<RunOptions, RestoreOptions, RequestedText, UsageError>;

/// What the arguments of the program ask for. Touches no file.
CommandLine parseCommandLine(int argumentCount, const char* const* arguments);

}  // namespace accounts
