#include "platform/linux/JournalEntry.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/socket.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>

#include "platform/linux/FileContents.h"
#include "platform/linux/FileDescriptor.h"

namespace accounts {
namespace {

int sendMessage(int socket, const msghdr& message) {
  while (::sendmsg(socket, &message, MSG_NOSIGNAL) < 0) {
    if (errno != EINTR) {
      return errno;
    }
  }
  return 0;
}

/// Sends an open file in the place of a datagram's bytes.
int sendFile(int socket, const FileDescriptor& file) {
  alignas(cmsghdr) std::array<char, CMSG_SPACE(sizeof(int))> control{};
  msghdr message = {};
  message.msg_control = control.data();
  message.msg_controllen = control.size();
  cmsghdr* const header = CMSG_FIRSTHDR(&message);
  header->cmsg_level = SOL_SOCKET;
  header->cmsg_type = SCM_RIGHTS;
  header->cmsg_len = CMSG_LEN(sizeof(int));
  const int number = file.number();
  std::memcpy(CMSG_DATA(header), &number, sizeof(number));
  return sendMessage(socket, message);
}

int sendInMemoryFile(int socket, const std::string& entry) {
  const FileDescriptor file(::memfd_create("journal-entry", MFD_CLOEXEC | MFD_ALLOW_SEALING));
  if (file.number() < 0) {
    return errno;
  }
  if (const int error = writeAll(file.number(), entry); error != 0) {
    return error;
  }
  // The journal reads only what cannot change any more.
  if (::fcntl(file.number(), F_ADD_SEALS,
              F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_WRITE | F_SEAL_SEAL) != 0) {
    return errno;
  }
  return sendFile(socket, file);
}

}  // namespace

void appendJournalField(std::string& entry, std::string_view name, std::string_view value) {
  entry += name;
  if (value.find('\n') == std::string_view::npos) {
    entry += '=';
  } else {
    entry += '\n';
    const std::uint64_t length = value.size();
    for (unsigned byte = 0; byte < sizeof(length); ++byte) {
      entry += static_cast<char>((length >> (8 * byte)) & 0xff);
    }
  }
  entry.append(value).append("\n");
}

int sendJournalEntry(int socket, const std::string& entry) {
  iovec bytes = {const_cast<char*>(entry.data()), entry.size()};
  msghdr message = {};
  message.msg_iov = &bytes;
  message.msg_iovlen = 1;
  const int error = sendMessage(socket, message);
  return error == EMSGSIZE || error == ENOBUFS ? sendInMemoryFile(socket, entry) : error;
}

}  // namespace accounts
