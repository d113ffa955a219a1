#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace accounts {

/// What one line that `migration-host run --json` wrote says of its run.
struct RunResult {
  /// The root as it was named; none when the arguments did not say.
  std::optional<std::string> root;
  int exitStatus = 0;
  /// The stages that the migration went through.
  std::vector<std::string> steps;
  /// What went wrong, "ROOT" standing for the root's name, so that the same error on many images is
  /// one error; none when nothing did.
  std::optional<std::string> error;
  std::vector<std::string> warnings;
  /// What was not carried over, "ROOT" standing for the root's name.
  std::vector<std::string> losses;
  /// How long its stages took together; none where the line is no report, which alone tells.
  std::optional<double> seconds;
  /// The page of its report, a file of this machine; none where none is known.
  std::optional<std::string> page;
};

/// The result in a line; none when the line is no result, such as one that a killed program left
/// incomplete.
std::optional<RunResult> runResultFrom(std::string_view line);

/// What may be done about a run that ended in a way.
enum class Remedy {
  /// Nothing: the image is migrated.
  None,
  /// A person looks at what was not carried over; the image is migrated.
  Losses,
  /// To run it again may help.
  Retry,
  /// To run it again helps only after something was changed.
  Attention
};

/// A way for a run to end.
struct Outcome {
  int exitStatus;
  /// For programs, and what that means for people.
  std::string_view name;
  std::string_view words;
  Remedy remedy;
};

/// The outcome with an exit status; an exit status that the host does not have is one of its own.
Outcome outcomeOf(int exitStatus);

}  // namespace accounts
