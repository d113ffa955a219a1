#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "accountsctl/CommandResult.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/OpenInputs.h"

namespace accounts {

/// What a command knows of the process that it runs in, which is its own.
class CommandWorker {
 public:
  /// `socket` leads to the keeper and must outlive this.
  explicit CommandWorker(const FileDescriptor& socket) : socket_(socket) {}

  /// Gives up, for good, all that a command does not need that has read or opened its inputs
  /// (Confinement.h). To be called before any of them is decoded.
  void giveUpRights(const OpenInputs& inputs) const;

  /// The next piece of a file that the keeper reads aloud; empty at its end.
  [[nodiscard]] std::string nextPiece() const;

 private:
  const FileDescriptor& socket_;
};

using Command = std::function<CommandResult(const CommandWorker& worker)>;

/// Takes a piece of a file, an empty one for its end; false when nobody listens any more.
using TakePiece = std::function<bool(std::string_view)>;
/// What the keeper reads aloud meanwhile. An error is the command's.
using ReadAloud = std::function<OrProgramError<void>(const TakePiece& take)>;

/// Who works in a command's process, as a message begins.
inline constexpr std::string_view kCommand = "The command";

/// Lets a command run in a process of its own and gives what it came to, or how it ended instead,
/// said of `who`.
CommandResult runInWorker(const Command& command, const ReadAloud& readAloud = {},
                          std::string_view who = kCommand);

}  // namespace accounts
