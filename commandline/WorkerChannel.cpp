#include "commandline/WorkerChannel.h"

#include <sys/socket.h>

#include <array>
#include <cerrno>
#include <cstring>

namespace accounts {
namespace {

/// A document of the largest file is the largest there is.
constexpr std::uint64_t kLargestFrame = std::uint64_t{1} << 32;
constexpr std::size_t kHeaderSize = 1 + sizeof(std::uint64_t);

bool sendAll(int socket, std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t count = ::send(socket, bytes.data(), bytes.size(), MSG_NOSIGNAL);
    if (count < 0 && errno != EINTR) {
      return false;
    }
    bytes.remove_prefix(static_cast<std::size_t>(count < 0 ? 0 : count));
  }
  return true;
}

bool receiveAll(int socket, char* bytes, std::size_t count) {
  while (count > 0) {
    const ssize_t got = ::recv(socket, bytes, count, 0);
    if (got == 0 || (got < 0 && errno != EINTR)) {
      return false;
    }
    if (got > 0) {
      bytes += got;
      count -= static_cast<std::size_t>(got);
    }
  }
  return true;
}

}  // namespace

bool sendFrame(const FileDescriptor& socket, FrameKind kind, std::string_view bytes) {
  std::array<char, kHeaderSize> header{};
  header[0] = static_cast<char>(kind);
  const std::uint64_t size = bytes.size();
  std::memcpy(header.data() + 1, &size, sizeof size);
  return sendAll(socket.number(), {header.data(), header.size()}) &&
         sendAll(socket.number(), bytes);
}

std::optional<Frame> receiveFrame(const FileDescriptor& socket) {
  std::array<char, kHeaderSize> header{};
  if (!receiveAll(socket.number(), header.data(), header.size())) {
    return std::nullopt;
  }
  std::uint64_t size = 0;
  std::memcpy(&size, header.data() + 1, sizeof size);
  if (size > kLargestFrame) {
    return std::nullopt;
  }
  Frame frame{static_cast<FrameKind>(header[0]), {}};
  // Grows with what arrives: a size alone makes no memory needed.
  constexpr std::size_t kPiece = std::size_t{1} << 20;
  while (frame.bytes.size() < size) {
    const std::size_t begin = frame.bytes.size();
    frame.bytes.resize(begin + std::min<std::size_t>(kPiece, size - begin));
    if (!receiveAll(socket.number(), frame.bytes.data() + begin, frame.bytes.size() - begin)) {
      return std::nullopt;
    }
  }
  return frame;
}

}  // namespace accounts
