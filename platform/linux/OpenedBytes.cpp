#include "platform/linux/OpenedBytes.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>

#include "platform/linux/EntryIdentity.h"
#include "platform/linux/FileContents.h"

namespace accounts {
namespace {

constexpr std::size_t kBlockSize = std::size_t{128} << 10;

}  // namespace

Result OpenedBytes::giveTo(const Taker& take) const {
  // A file that grows is read as far as no reader would take it.
  return PartOfOpenedBytes(file_, 0, kLargestFileSize + 1, path_).giveTo(take);
}

Result PartOfOpenedBytes::giveTo(const Taker& take) const {
  std::string block(static_cast<std::size_t>(std::min<std::uint64_t>(kBlockSize, length_)), '\0');
  for (std::uint64_t done = 0; done < length_;) {
    const std::size_t wanted =
        static_cast<std::size_t>(std::min<std::uint64_t>(block.size(), length_ - done));
    const ssize_t count =
        ::pread(file_.number(), block.data(), wanted, static_cast<off_t>(offset_ + done));
    if (count < 0 && errno == EINTR) {
      continue;
    }
    if (count < 0) {
      return pathFailure("read", path_, errno);
    }
    const auto given = static_cast<std::size_t>(count);
    if (count == 0 || !take(std::string_view(block.data(), given))) {
      break;
    }
    done += given;
  }
  return {};
}

}  // namespace accounts
