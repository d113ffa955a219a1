#include "tests/propertylist/PropertyListTesting.h"

#include <bit>
#include <cctype>
#include <limits>

namespace accounts {

PropertyValue valueOfEveryKind() {
  using namespace std::string_literals;
  return PropertyDictionary{
      {"", "value under an empty key"},
      {"array", PropertyArray{1, "two", 3.5, PropertyArray{}}},
      {"data", PropertyData("\x00\x01\xFE\xFF"s)},
      {"data, empty", PropertyData()},
      {"data, like a text", PropertyData("text")},
      {"date", PropertyDate{326'000'000}},
      {"date, before the reference", PropertyDate{-0.25}},
      {"dictionary", PropertyDictionary{{"inner", PropertyDictionary{}}}},
      {"false", false},
      {"integer, largest signed", std::numeric_limits<std::int64_t>::max()},
      {"integer, largest unsigned", std::numeric_limits<std::uint64_t>::max()},
      {"integer, of one byte", 255},
      {"integer, of two bytes", 65535},
      {"integer, of four bytes", 4294967295U},
      {"integer, smallest", std::numeric_limits<std::int64_t>::min()},
      {"integer, zero", 0},
      {"real", -12.75},
      {"real, one", 1.0},
      {"real, smallest", std::numeric_limits<double>::denorm_min()},
      {"text", "text"},
      {"text, beyond the basic plane", "\xF0\x9F\x98\x80"},
      {"text, empty", ""},
      {"text, long", std::string(70'000, 'x')},
      {"text, not ASCII", "B\xC3\xBCro \xE2\x82\xAC"},
      {"text, of fifteen characters", "123456789012345"},
      {"text, with a NUL", "a\0b"s},
      {"true", true}};
}

PropertyValue valueOfEveryKindInXML() {
  PropertyDictionary values = *valueOfEveryKind().asDictionary();
  for (const char* key : {"date, before the reference", "text, with a NUL"}) {
    values.remove(key);
  }
  return values;
}

PropertyValue nestedArrays(std::size_t depth) {
  PropertyArray array;
  for (std::size_t level = 1; level < depth; ++level) {
    array = PropertyArray{PropertyValue(array)};
  }
  return array;
}

testing::AssertionResult contains(std::string_view text, std::string_view part) {
  const auto isOfAWord = [](char each) {
    return std::isalnum(static_cast<unsigned char>(each)) != 0;
  };
  for (std::size_t at = text.find(part); at != text.npos; at = text.find(part, at + 1)) {
    const std::size_t end = at + part.size();
    if (end == text.size() || !isOfAWord(part.back()) || !isOfAWord(text[end])) {
      return testing::AssertionSuccess();
    }
  }
  return testing::AssertionFailure() << "\"" << text << "\" does not contain \"" << part << "\"";
}

}  // namespace accounts
