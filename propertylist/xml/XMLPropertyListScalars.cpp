#include "propertylist/xml/XMLPropertyListScalars.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <chrono>
#include <limits>
#include <string>

namespace accounts::xmlplist {

namespace {

std::string_view withoutBlanksAround(std::string_view text) {
  while (!text.empty() && isBlank(text.front())) {
    text.remove_prefix(1);
  }
  while (!text.empty() && isBlank(text.back())) {
    text.remove_suffix(1);
  }
  return text;
}

/// Takes a sign from the front of a text; true for a minus.
bool takeSign(std::string_view& text) {
  if (text.empty() || (text.front() != '-' && text.front() != '+')) {
    return false;
  }
  const bool isNegative = text.front() == '-';
  text.remove_prefix(1);
  return isNegative;
}

/// The number that the whole text is; `from_chars` takes no plus and, for unsigned numbers, no
/// minus.
template <class Number, class... Format>
std::optional<Number> wholeNumber(std::string_view text, Format... format) {
  Number number{};
  const char* const end = text.data() + text.size();
  const auto result = std::from_chars(text.data(), end, number, format...);
  return result.ec == std::errc() && result.ptr == end ? std::optional(number) : std::nullopt;
}

std::optional<double> namedReal(std::string_view text) {
  struct NamedReal {
    std::string_view name;
    double value;
  };
  constexpr NamedReal kNamedReals[] = {{"nan", std::numeric_limits<double>::quiet_NaN()},
                                       {"inf", std::numeric_limits<double>::infinity()},
                                       {"infinity", std::numeric_limits<double>::infinity()}};
  for (const NamedReal& named : kNamedReals) {
    if (std::equal(text.begin(), text.end(), named.name.begin(), named.name.end(),
                   [](char left, char right) { return (left | 0x20) == right; })) {
      return named.value;
    }
  }
  return std::nullopt;
}

bool isDigit(char character) {
  return character >= '0' && character <= '9';
}

/// The value of each base64 digit; kNoDigit for every other character.
constexpr unsigned char kNoDigit = 0xFF;
constexpr std::array<unsigned char, 256> kBase64Values = [] {
  constexpr std::string_view kDigits =
      "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
  std::array<unsigned char, 256> values{};
  values.fill(kNoDigit);
  for (std::size_t value = 0; value < kDigits.size(); ++value) {
    values[static_cast<unsigned char>(kDigits[value])] = static_cast<unsigned char>(value);
  }
  return values;
}();

}  // namespace

std::optional<PropertyValue> parseInteger(std::string_view text) {
  constexpr std::uint64_t kTwoToThe63 = std::uint64_t{1} << 63;
  text = withoutBlanksAround(text);
  const bool isNegative = takeSign(text);
  const bool isHexadecimal = text.starts_with("0x") || text.starts_with("0X");
  if (isHexadecimal) {
    text.remove_prefix(2);
  }
  const std::optional<std::uint64_t> magnitude =
      wholeNumber<std::uint64_t>(text, isHexadecimal ? 16 : 10);
  if (!magnitude || (isNegative && *magnitude > kTwoToThe63)) {
    return std::nullopt;
  }
  if (isNegative) {
    return static_cast<std::int64_t>(0 - *magnitude);
  }
  return *magnitude;
}

std::optional<PropertyValue> parseReal(std::string_view text) {
  text = withoutBlanksAround(text);
  const bool isNegative = takeSign(text);
  // Further signs and the other names that from_chars knows end here.
  const bool isNumber = !text.empty() && (isDigit(text.front()) || text.front() == '.');
  const std::optional<double> magnitude =
      isNumber ? wholeNumber<double>(text, std::chars_format::general) : namedReal(text);
  if (!magnitude) {
    return std::nullopt;
  }
  return isNegative ? -*magnitude : *magnitude;
}

std::optional<PropertyValue> parseDate(std::string_view text) {
  using namespace std::chrono;
  constexpr std::string_view kForm = "dddd-dd-ddTdd:dd:ddZ";
  text = withoutBlanksAround(text);
  const bool hasForm = std::equal(
      text.begin(), text.end(), kForm.begin(), kForm.end(), [](char character, char expected) {
        return expected == 'd' ? isDigit(character) : character == expected;
      });
  if (!hasForm) {
    return std::nullopt;
  }
  const auto number = [&](std::size_t position, std::size_t count) {
    return *wholeNumber<int>(text.substr(position, count));
  };
  const year_month_day date(year(number(0, 4)), month(static_cast<unsigned>(number(5, 2))),
                            day(static_cast<unsigned>(number(8, 2))));
  const int hour = number(11, 2);
  const int minute = number(14, 2);
  const int second = number(17, 2);
  if (!date.ok() || hour > 23 || minute > 59 || second > 59) {
    return std::nullopt;
  }
  constexpr sys_days kReference = year(2001) / January / 1;
  const auto sinceReference =
      (sys_days(date) - kReference) + hours(hour) + minutes(minute) + seconds(second);
  return PropertyDate{static_cast<double>(sinceReference.count())};
}

std::optional<PropertyValue> parseData(std::string_view text) {
  std::string bytes;
  bytes.reserve(text.size() / 4 * 3);
  std::uint32_t group = 0;
  std::size_t digitCount = 0;
  std::size_t paddingCount = 0;
  for (const char character : text) {
    if (isBlank(character)) {
      continue;
    }
    if (character == '=') {
      ++paddingCount;
      continue;
    }
    const unsigned char value = kBase64Values[static_cast<unsigned char>(character)];
    if (value == kNoDigit || paddingCount != 0) {
      return std::nullopt;
    }
    group = group << 6 | value;
    if (++digitCount % 4 == 0) {
      bytes.push_back(static_cast<char>(group >> 16 & 0xFF));
      bytes.push_back(static_cast<char>(group >> 8 & 0xFF));
      bytes.push_back(static_cast<char>(group & 0xFF));
    }
  }
  // A last group of two digits stands for one byte, one of three digits for two.
  const std::size_t digitsLeft = digitCount % 4;
  if (digitsLeft == 1 || paddingCount != (digitsLeft == 0 ? 0 : 4 - digitsLeft)) {
    return std::nullopt;
  }
  if (digitsLeft == 2) {
    bytes.push_back(static_cast<char>(group >> 4 & 0xFF));
  } else if (digitsLeft == 3) {
    bytes.push_back(static_cast<char>(group >> 10 & 0xFF));
    bytes.push_back(static_cast<char>(group >> 2 & 0xFF));
  }
  return PropertyData(bytes);
}

}  // namespace accounts::xmlplist
