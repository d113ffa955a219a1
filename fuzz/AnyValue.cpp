#include "fuzz/AnyValue.h"

#include <array>
#include <bit>
#include <string>

namespace accounts {

namespace {

constexpr std::size_t kDeepestNesting = 3;
constexpr std::size_t kMostElements = 4;

const std::array<std::string_view, 40> texts = {
    "", "A", "B", "C", "user", "user@gmail.com", "user@marrow.example", "DeviceLocalAccount", "0",
    "1", "-1", "12", "99999999999999999999", "yes", "no", "armv6", "Velmora", "Mail", "CalDAV",
    "IMAPAccount", "MailAccount", "GmailAccount", "VelmoraAccount", "ZQAccount", "/calendar/dav/",
    "www.google.com", "Mail/IMAP-user", "Mail/POP-user@host", "com.quarx.Dataclass.Mail",
    "com.quarx.Dataclass.Notes", "com.quarx.Dataclass.Calendars", "com.quarx.Dataclass.Ubiquity",
    "DenyTethered", "%41 #[", "line\nbreak", "Yahoo!\xE2\x80\x8E", "\xF0\x9F\x98\x80",
    // An unpaired unit of UTF-16, as a reader hands it on.
    "\xED\xA0\x80", "Identifier", "ChildAccounts"};

/// Numbers at the borders of what is held differently.
const std::array<std::uint64_t, 8> numbers = {
    0, 1, 2, 11, 12, 0x7fffffffffffffff, 0x8000000000000000, 0xffffffffffffffff};

PropertyValue valueUpTo(FuzzInput& input, std::size_t depth);

PropertyArray anyArray(FuzzInput& input, std::size_t depth) {
  PropertyArray array;
  for (std::size_t count = input.below(kMostElements + 1); count > 0; --count) {
    array.append(valueUpTo(input, depth));
  }
  return array;
}

PropertyDictionary anyDictionary(FuzzInput& input, std::size_t depth) {
  PropertyDictionary dictionary;
  for (std::size_t count = input.below(kMostElements + 1); count > 0; --count) {
    Text key = anyText(input);
    dictionary.set(std::move(key), valueUpTo(input, depth));
  }
  return dictionary;
}

PropertyValue anyNumber(FuzzInput& input) {
  const std::size_t choice = input.below(numbers.size() + 1);
  return choice < numbers.size() ? numbers[choice] : input.number();
}

PropertyValue valueUpTo(FuzzInput& input, std::size_t depth) {
  enum Choice : std::uint8_t { AText, ANumber, ASigned, ABoolean, AReal, ADate, SomeData };
  constexpr std::size_t kScalarChoices = 7;
  constexpr std::size_t kContainerChoices = 2;
  const std::size_t choice = input.below(kScalarChoices + (depth > 0 ? kContainerChoices : 0));
  switch (choice) {
    case AText:
      return anyText(input);
    case ANumber:
      return anyNumber(input);
    case ASigned:
      return static_cast<std::int8_t>(input.byte());
    case ABoolean:
      return input.flag();
    case AReal:
      return std::bit_cast<double>(input.number());
    case ADate:
      return PropertyDate{std::bit_cast<double>(input.number())};
    case SomeData:
      return PropertyData(input.bytes(input.below(8)));
    case kScalarChoices:
      return anyArray(input, depth - 1);
    default:
      return anyDictionary(input, depth - 1);
  }
}

}  // namespace

Text anyText(FuzzInput& input) {
  const std::size_t choice = input.byte();
  if (choice < texts.size()) {
    return texts[choice];
  }
  // A letter alone: the rest of the bytes are the most frequent choice of a random input.
  return std::string(1, static_cast<char>('a' + choice % 26));
}

PropertyValue anyValue(FuzzInput& input) {
  return valueUpTo(input, kDeepestNesting);
}

}  // namespace accounts
