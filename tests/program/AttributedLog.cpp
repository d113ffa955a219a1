#include "tests/program/AttributedLog.h"

#include <gtest/gtest.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <cstring>
#include <utility>

namespace accounts {
namespace {

constexpr std::size_t kLongestLine = std::size_t{256} << 10;

pid_t senderOf(const msghdr& message) {
  for (cmsghdr* header = CMSG_FIRSTHDR(&message); header != nullptr;
       header = CMSG_NXTHDR(const_cast<msghdr*>(&message), header)) {
    if (header->cmsg_level == SOL_SOCKET && header->cmsg_type == SCM_CREDENTIALS) {
      ucred credentials = {};
      std::memcpy(&credentials, CMSG_DATA(header), sizeof credentials);
      return credentials.pid;
    }
  }
  ADD_FAILURE() << "a line without its sender";
  return 0;
}

}  // namespace

AttributedLog::AttributedLog() : buffer_(kLongestLine) {
  // Each write is a packet of its own, and the system itself says who sent it.
  int ends[2];
  EXPECT_EQ(socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, ends), 0);
  reader_ = ends[0];
  writer_ = ends[1];
  const int on = 1;
  EXPECT_EQ(setsockopt(reader_, SOL_SOCKET, SO_PASSCRED, &on, sizeof on), 0);
}

AttributedLog::~AttributedLog() {
  closeWriter();
  close(reader_);
}

void AttributedLog::closeWriter() {
  if (const int writer = std::exchange(writer_, -1); writer >= 0) {
    close(writer);
  }
}

std::optional<AttributedLog::Line> AttributedLog::next(std::chrono::seconds timeLimit) {
  pollfd readable = {reader_, POLLIN, 0};
  const auto milliseconds = std::chrono::milliseconds(timeLimit).count();
  if (poll(&readable, 1, static_cast<int>(milliseconds)) == 0) {
    ADD_FAILURE() << "nothing happened for " << timeLimit.count() << " seconds";
    return {};
  }
  std::array<char, CMSG_SPACE(sizeof(ucred))> control{};
  iovec part = {buffer_.data(), buffer_.size()};
  msghdr message = {};
  message.msg_iov = &part;
  message.msg_iovlen = 1;
  message.msg_control = control.data();
  message.msg_controllen = control.size();
  const ssize_t size = recvmsg(reader_, &message, 0);
  if (size <= 0) {
    return {};
  }
  return Line{senderOf(message), std::string(buffer_.data(), static_cast<std::size_t>(size))};
}

}  // namespace accounts
