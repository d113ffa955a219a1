#include "propertylist/value/Description.h"

#include <algorithm>
#include <charconv>
#include <chrono>
#include <cmath>

#include "propertylist/value/GeneralisedUTF8.h"

namespace accounts {

namespace {

constexpr std::string_view kHexDigits = "0123456789abcdef";

enum class Quoting { None, JSON };

void appendHex(std::string& line, std::uint32_t number, int digits) {
  for (int shift = 4 * (digits - 1); shift >= 0; shift -= 4) {
    line.push_back(kHexDigits[number >> shift & 0xF]);
  }
}

/// The letter of a two-character escape, 0 when the character has none.
char letterOfEscape(char character, Quoting quoting) {
  switch (character) {
    case '\n':
      return 'n';
    case '\r':
      return 'r';
    case '\t':
      return 't';
    case '"':
    case '\\':
      return quoting == Quoting::JSON ? character : '\0';
    default:
      return '\0';
  }
}

/// Of surrogates, too, which are no characters in UTF-8.
bool needsNumericEscape(char32_t codePoint) {
  return isControlOrReordering(codePoint) || isSurrogate(codePoint);
}

bool isPlain(char character, Quoting quoting) {
  return character >= 0x20 && character < 0x7F && letterOfEscape(character, quoting) == '\0';
}

void appendText(std::string& line, std::string_view text, Quoting quoting) {
  while (!text.empty()) {
    std::size_t plainCount = 0;
    while (plainCount < text.size() && isPlain(text[plainCount], quoting)) {
      ++plainCount;
    }
    line.append(text.substr(0, plainCount));
    text.remove_prefix(plainCount);
    if (text.empty()) {
      return;
    }
    const DecodedCodePoint decoded = decodeCodePoint(text);
    if (decoded.length == 0) {
      // No file yields such a byte: readers refuse it. JSON has no escape for it.
      line.append("\\x");
      appendHex(line, static_cast<unsigned char>(text.front()), 2);
      text.remove_prefix(1);
      continue;
    }
    if (const char letter = letterOfEscape(text.front(), quoting)) {
      line.push_back('\\');
      line.push_back(letter);
    } else if (needsNumericEscape(decoded.value)) {
      line.append("\\u");
      appendHex(line, decoded.value, 4);
    } else {
      line.append(text.substr(0, decoded.length));
    }
    text.remove_prefix(decoded.length);
  }
}

void appendQuoted(std::string& line, std::string_view text) {
  line.push_back('"');
  appendText(line, text, Quoting::JSON);
  line.push_back('"');
}

template <class Number>
void appendNumber(std::string& line, Number number) {
  char digits[32];
  const auto result = std::to_chars(std::begin(digits), std::end(digits), number);
  line.append(digits, result.ptr);
}

void appendReal(std::string& line, double real) {
  if (std::isnan(real)) {
    line.append("\"NaN\"");
    return;
  }
  if (std::isinf(real)) {
    line.append(real < 0 ? "\"-Infinity\"" : "\"Infinity\"");
    return;
  }
  const std::size_t start = line.size();
  appendNumber(line, real);
  // Different values look different: the real 1 is not the integer 1.
  if (line.find_first_of(".e", start) == std::string::npos) {
    line.append(".0");
  }
}

void appendPadded(std::string& line, std::int64_t number, std::size_t width) {
  char digits[32];
  const auto result = std::to_chars(std::begin(digits), std::end(digits), number);
  const auto count = static_cast<std::size_t>(result.ptr - digits);
  line.append(width - std::min(count, width), '0');
  line.append(digits, count);
}

void appendDate(std::string& line, double secondsSinceReferenceDate) {
  using namespace std::chrono;
  constexpr sys_seconds kReference = sys_days(year(2001) / January / 1);
  constexpr double kEarliest =
      static_cast<double>((sys_seconds(sys_days(year(0) / January / 1)) - kReference).count());
  constexpr double kPastLatest =
      static_cast<double>((sys_seconds(sys_days(year(10000) / January / 1)) - kReference).count());
  line.push_back('"');
  // Written so that NaN takes this way too.
  if (!(secondsSinceReferenceDate >= kEarliest && secondsSinceReferenceDate < kPastLatest)) {
    if (std::isnan(secondsSinceReferenceDate)) {
      line.append("date NaN");
    } else if (std::isinf(secondsSinceReferenceDate)) {
      line.append(secondsSinceReferenceDate < 0 ? "date -Infinity" : "date Infinity");
    } else {
      line.append("date ");
      appendNumber(line, secondsSinceReferenceDate);
    }
    line.push_back('"');
    return;
  }
  // A date of our century is exact to about a tenth of a microsecond.
  constexpr std::int64_t kMicroseconds = 1'000'000;
  const double floorOfSeconds = std::floor(secondsSinceReferenceDate);
  auto wholeSeconds = static_cast<std::int64_t>(floorOfSeconds);
  std::int64_t fraction = std::llround((secondsSinceReferenceDate - floorOfSeconds) *
                                       static_cast<double>(kMicroseconds));
  if (fraction == kMicroseconds) {
    ++wholeSeconds;
    fraction = 0;
  }
  const sys_seconds time = kReference + seconds(wholeSeconds);
  const sys_days day = floor<days>(time);
  const year_month_day date(day);
  const hh_mm_ss timeOfDay(time - day);
  appendPadded(line, static_cast<int>(date.year()), 4);
  line.push_back('-');
  appendPadded(line, static_cast<unsigned>(date.month()), 2);
  line.push_back('-');
  appendPadded(line, static_cast<unsigned>(date.day()), 2);
  line.push_back('T');
  appendPadded(line, timeOfDay.hours().count(), 2);
  line.push_back(':');
  appendPadded(line, timeOfDay.minutes().count(), 2);
  line.push_back(':');
  appendPadded(line, timeOfDay.seconds().count(), 2);
  if (fraction != 0) {
    line.push_back('.');
    appendPadded(line, fraction, 6);
    line.erase(line.find_last_not_of('0') + 1);
  }
  line.append("Z\"");
}

void appendData(std::string& line, std::string_view bytes) {
  line.append("\"<");
  for (const char byte : bytes) {
    appendHex(line, static_cast<unsigned char>(byte), 2);
  }
  line.append(">\"");
}

void appendJSON(std::string& line, const PropertyValue& value);

void appendArray(std::string& line, const PropertyArray& array) {
  line.push_back('[');
  for (const PropertyValue& element : array) {
    if (&element != array.begin()) {
      line.push_back(',');
    }
    appendJSON(line, element);
  }
  line.push_back(']');
}

void appendDictionary(std::string& line, const PropertyDictionary& dictionary) {
  line.push_back('{');
  for (const PropertyEntry& entry : dictionary) {
    if (&entry.value != dictionary.values().data()) {
      line.push_back(',');
    }
    appendQuoted(line, entry.key);
    line.push_back(':');
    appendJSON(line, entry.value);
  }
  line.push_back('}');
}

void appendInteger(std::string& line, const PropertyValue& value) {
  if (const std::int64_t* integer = value.asSigned()) {
    appendNumber(line, *integer);
  } else {
    appendNumber(line, *value.asLargeUnsigned());
  }
}

void appendJSON(std::string& line, const PropertyValue& value) {
  switch (value.kind()) {
    case PropertyKind::Dictionary:
      return appendDictionary(line, *value.asDictionary());
    case PropertyKind::Array:
      return appendArray(line, *value.asArray());
    case PropertyKind::String:
      return appendQuoted(line, *value.asText());
    case PropertyKind::Integer:
      return appendInteger(line, value);
    case PropertyKind::Real:
      return appendReal(line, *value.asReal());
    case PropertyKind::Boolean:
      line.append(*value.asBoolean() ? "true" : "false");
      return;
    case PropertyKind::Date:
      return appendDate(line, value.asDate()->secondsSinceReferenceDate);
    case PropertyKind::Data:
      return appendData(line, value.asData()->bytes.view());
  }
}

}  // namespace

void appendDescription(std::string& line, const PropertyValue& value) {
  if (const Text* text = value.asText()) {
    appendEscapedText(line, *text);
  } else {
    appendJSON(line, value);
  }
}

std::string describe(const PropertyValue& value) {
  std::string line;
  appendDescription(line, value);
  return line;
}

void appendEscapedText(std::string& line, std::string_view text) {
  appendText(line, text, Quoting::None);
}

std::string escapedJSON(std::string json) {
  constexpr std::string_view kBeginnings = "\x7F\xC2\xE2";
  std::string_view rest = json;
  std::string line;
  for (std::size_t place = 0;
       (place = rest.find_first_of(kBeginnings)) != std::string_view::npos;) {
    line.append(rest.substr(0, place));
    rest.remove_prefix(place);
    const DecodedCodePoint decoded = decodeCodePoint(rest);
    const std::size_t length = std::max<std::size_t>(decoded.length, 1);
    if (isControlOrReordering(decoded.value) && decoded.length > 0) {
      line.append("\\u");
      appendHex(line, decoded.value, 4);
    } else {
      line.append(rest.substr(0, length));
    }
    rest.remove_prefix(length);
  }
  return line.empty() ? json : line.append(rest);
}

std::string escapedText(std::string_view text) {
  std::string line;
  appendEscapedText(line, text);
  return line;
}

}  // namespace accounts
