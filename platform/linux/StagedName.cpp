#include "platform/linux/StagedName.h"

#include <charconv>

#include "platform/linux/TemporaryFile.h"

namespace accounts {
namespace {

constexpr char kSeparator = '-';

/// Takes what stands before the next separator, and the separator; none without one.
std::optional<std::string_view> takeField(std::string_view& rest) {
  const std::size_t end = rest.find(kSeparator);
  if (end == std::string_view::npos) {
    return std::nullopt;
  }
  const std::string_view field = rest.substr(0, end);
  rest.remove_prefix(end + 1);
  return field;
}

std::optional<std::uint64_t> takeNumber(std::string_view& rest) {
  const auto field = takeField(rest);
  std::uint64_t number = 0;
  if (!field) {
    return std::nullopt;
  }
  const char* const end = field->data() + field->size();
  const auto [stop, error] = std::from_chars(field->data(), end, number);
  return error == std::errc() && stop == end && !field->empty() ? std::optional(number)
                                                                : std::nullopt;
}

}  // namespace

std::uint64_t markOf(const FileIdentity& file) {
  if (!file.exists()) {
    return 0;
  }
  // FNV-1a, which every build of this program computes alike.
  std::uint64_t mark = 0xcbf29ce484222325U;
  for (std::uint64_t number : {file.inode, file.size, std::uint64_t{file.mode},
                               static_cast<std::uint64_t>(file.modified.seconds),
                               static_cast<std::uint64_t>(file.modified.nanoseconds)}) {
    for (int byte = 0; byte < 8; ++byte, number >>= 8U) {
      mark = (mark ^ (number & 0xffU)) * 0x100000001b3U;
    }
  }
  return mark;
}

std::optional<std::string> StagedName::text() const {
  const auto random = randomDigits();
  if (!random) {
    return std::nullopt;
  }
  std::string name(kTemporaryFilePrefix);
  name.append(listed(place).name).append(1, kSeparator);
  name.append(std::to_string(made)).append(1, kSeparator);
  name.append(std::to_string(replaced)).append(1, kSeparator);
  name.append(std::to_string(returned)).append(1, kSeparator);
  return name.append(*random);
}

std::optional<StagedName> StagedName::parse(std::string_view name) {
  if (!name.starts_with(kTemporaryFilePrefix)) {
    return std::nullopt;
  }
  name.remove_prefix(kTemporaryFilePrefix.size());
  const auto placeName = takeField(name);
  const auto place = placeName ? placeNamed(*placeName) : std::nullopt;
  const auto made = place ? takeNumber(name) : std::nullopt;
  const auto replaced = made ? takeNumber(name) : std::nullopt;
  const auto returned = replaced ? takeNumber(name) : std::nullopt;
  return returned ? std::optional(StagedName{*place, *made, *replaced, *returned}) : std::nullopt;
}

}  // namespace accounts
