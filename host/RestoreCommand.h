#pragma once

#include <chrono>
#include <optional>
#include <string>

#include "safetynet/Restoration.h"

namespace accounts {

/// What is to be done with kept files.
enum class RestoreAction : std::uint8_t { PutBack, List, Discard };

/// Kept files are to be put back, shown or removed.
struct RestoreOptions {
  RestoreAction action = RestoreAction::PutBack;
  /// The directory that holds the device, on the machine that the host runs on.
  std::string root;
  /// A device path; none for the platform's own.
  std::optional<std::string> home;
  /// The name or the device path of the folder of kept files; none for the only one, or for all of
  /// those to be shown.
  std::optional<std::string> folder;
  /// How long each lock is waited for; none for as long as it takes.
  std::optional<std::chrono::seconds> lockTimeout;
};

/// A folder of kept files, for people.
struct ListedFolder {
  std::string path;
  /// Empty when it cannot be read.
  KeptList list;
};

/// What the program has to say of kept files.
struct RestoreResult {
  Restoration restoration;
  /// Of those that were asked for.
  std::vector<ListedFolder> folders;
  /// The folder that was removed on request; none when none was.
  std::optional<std::string> discarded;
};

/// Puts kept files back on one device root, shows or removes them, and tells what came of it; also
/// every error, for this never fails in another way.
RestoreResult runRestoration(const RestoreOptions& options);

/// How the program ends after that.
ExitStatus exitStatusOf(const RestoreResult& result);

/// The outcome as one JSON object on one line, without a line end.
std::string jsonText(const RestoreResult& result, const RestoreOptions& options);

/// The outcome in a few lines for a person, each with its line end; errors are no part of it.
std::string summaryText(const RestoreResult& result, const RestoreOptions& options);

}  // namespace accounts
