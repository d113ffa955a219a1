#include "platform/linux/LinuxDateFormatter.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdlib>
#include <ctime>
#include <utility>

namespace accounts {
namespace {

using std::chrono::system_clock;

constexpr int kKeepValue = 0;
constexpr char kFractionLetter = 'S';

struct Field {
  char letter;
  const char* conversion;  // strftime's
};

// The letters of the pattern's own standard against the conversions that give the same number.
constexpr Field kFields[] = {{'Y', "%G"}, {'M', "%m"}, {'d', "%d"}, {'H', "%H"}};

const Field* fieldForLetter(char letter) {
  for (const Field& field : kFields) {
    if (field.letter == letter) {
      return &field;
    }
  }
  return nullptr;
}

std::string padded(std::string digits, std::size_t length) {
  return digits.size() < length ? std::string(length - digits.size(), '0') + digits : digits;
}

std::string fieldText(const Field& field, std::size_t length, const std::tm& time) {
  std::array<char, 32> text;
  const std::size_t size = std::strftime(text.data(), text.size(), field.conversion, &time);
  int number = 0;
  std::from_chars(text.data(), text.data() + size, number);
  return padded(std::to_string(number), length);
}

// Digits of the fraction are cut off, not rounded: a rounded one could reach the next second.
std::string fractionText(std::chrono::nanoseconds fraction, std::size_t length) {
  constexpr std::size_t kNanosecondDigits = 9;
  std::string digits = padded(std::to_string(fraction.count()), kNanosecondDigits);
  digits.resize(length, '0');
  return digits;
}

}  // namespace

void readLocalTimeZoneAhead() {
  // Without a name the C library looks for a changed zone before every date.
  ::setenv("TZ", ":/etc/localtime", kKeepValue);
  ::tzset();
}

LinuxDateFormatter::LinuxDateFormatter(Clock clock) : clock_(std::move(clock)) {}

std::string LinuxDateFormatter::currentDate(std::string_view pattern) {
  const auto now = clock_();
  const auto second = std::chrono::floor<std::chrono::seconds>(now);
  const std::time_t seconds = system_clock::to_time_t(second);
  std::tm time = {};
  ::tzset();
  ::localtime_r(&seconds, &time);

  std::string text;
  while (!pattern.empty()) {
    const char letter = pattern.front();
    const std::size_t length = std::min(pattern.find_first_not_of(letter), pattern.size());
    if (letter == kFractionLetter) {
      text += fractionText(now - second, length);
    } else if (const Field* field = fieldForLetter(letter)) {
      text += fieldText(*field, length, time);
    } else {
      text += pattern.substr(0, length);
    }
    pattern.remove_prefix(length);
  }
  return text;
}

}  // namespace accounts
