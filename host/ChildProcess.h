#pragma once

#include <functional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "commandline/ExitStatus.h"
#include "host/StopSignals.h"

namespace accounts {

/// What a child process left.
struct ChildOutcome {
  /// The lines that it wrote while it ran, in order, also when it ended before its time.
  std::vector<std::string> lines;
  /// The text that its function gave; an error of the host's own when the child could not be
  /// started, or ended in another way than by giving one.
  std::variant<std::string, ProgramError> result;
};

/// Takes a line, without its end, that the parent process gets whatever becomes of the child.
using WriteLine = std::function<void(std::string_view line)>;
/// Runs in the child. Neither a line nor the text that it gives may have a line end in it.
using ChildFunction = std::function<std::string(const WriteLine& writeLine)>;

/// Runs a function in a child process of its own and waits for its end. The child's standard output
/// is its standard error, so that nothing that runs there can spoil what the host writes; it is
/// killed when the host ends first. A host that is asked to stop gives it five seconds to end by
/// itself and then kills it: an error that may pass.
ChildOutcome runInChildProcess(const ChildFunction& function, StopSignals& stop);

}  // namespace accounts
