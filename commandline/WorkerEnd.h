#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "commandline/ExitStatus.h"
#include "commandline/WorkerChannel.h"
#include "platform/linux/Confinement.h"
#include "platform/linux/FileDescriptor.h"

namespace accounts {

/// Lets this process tell its keeper, before it ends, that it made a system call that it may not
/// make or that it had no memory. `socket` must live as long as the process.
void tellHowThisWorkerEnds(const FileDescriptor& socket);

/// Ends this process where rights could not be given up, for the reason given; its keeper is told.
void endUnlessGivenUp(const Result& givenUp, const FileDescriptor& socket);

/// What a keeper says of a worker's end. `who` worked there: "The plug-in".
class WorkerEnd {
 public:
  /// `limits` are those of the worker, none for one without limits of its own.
  WorkerEnd(std::string_view who, std::optional<ProcessLimits> limits)
      : who_(who), limits_(limits) {}

  /// Of one that told of such an end, by the frame.
  [[nodiscard]] std::optional<ProgramError> toldBy(const Frame& frame) const;
  /// Of one that ended without a word, by what waitpid() gave.
  [[nodiscard]] ProgramError withStatus(int status) const;

 private:
  [[nodiscard]] ProgramError error(std::string_view what) const;
  [[nodiscard]] ProgramError outOfMemory() const;

  std::string who_;
  std::optional<ProcessLimits> limits_;
};

}  // namespace accounts
