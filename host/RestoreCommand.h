#pragma once

#include <optional>
#include <string>

#include "safetynet/Restoration.h"

namespace accounts {

/// Kept files are to be put back.
struct RestoreOptions {
  /// The directory that holds the device, on the machine that the host runs on.
  std::string root;
  /// A device path; none for the platform's own.
  std::optional<std::string> home;
  /// The name or the device path of the folder of kept files; none for the only one.
  std::optional<std::string> folder;
};

/// Puts kept files back on one device root and tells what came of it; also every error, for this
/// never fails in another way.
Restoration runRestoration(const RestoreOptions& options);

/// How the program ends after that.
ExitStatus exitStatusOf(const Restoration& restoration);

/// The outcome as one JSON object on one line, without a line end. `root` is the root as the person
/// named it.
std::string jsonText(const Restoration& restoration, const std::string& root);

/// The outcome in a few lines for a person, each with its line end; errors are no part of it.
std::string summaryText(const Restoration& restoration);

}  // namespace accounts
