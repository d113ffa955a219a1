#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/FileDescriptor.h"

namespace accounts {

/// What a frame between a keeper and its worker is.
enum class FrameKind : std::uint8_t {
  /// From the worker: its list of changes; what is to be announced; why it cannot go on, as text,
  /// as the number of a system call, or because there is no memory.
  Proposal = 1,
  Announcements,
  Fault,
  ForbiddenCall,
  OutOfMemory,
  /// From the host: what the run came to; what became of the reports.
  Conclusion,
  ReportErrors,
  /// From the worker: the report and the page; what standard error and standard output get.
  Report,
  Page,
  ToldResult,
  /// To a worker of accountsctl: a piece of a file. From it: what it may use.
  Piece,
  Limits
};

struct Frame {
  FrameKind kind = FrameKind::Fault;
  std::string bytes;
};

/// Sends a frame. False when the other side does not take it any more.
bool sendFrame(const FileDescriptor& socket, FrameKind kind, std::string_view bytes);

/// Waits for a frame. None when the other side has ended, or sent something else.
std::optional<Frame> receiveFrame(const FileDescriptor& socket);

}  // namespace accounts
