#include "tests/program/StoredVersionsComparison.h"

#include <algorithm>
#include <cctype>
#include <map>
#include <optional>

#include "propertylist/value/Description.h"

namespace accounts {
namespace {

bool isGeneratedIdentifier(std::string_view text) {
  constexpr std::string_view kForm = "XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX";
  const auto fits = [](char formCharacter, char character) {
    const bool isUpperCaseHexadecimal = std::isdigit(static_cast<unsigned char>(character)) != 0 ||
                                        (character >= 'A' && character <= 'F');
    return formCharacter == '-' ? character == '-' : isUpperCaseHexadecimal;
  };
  return std::equal(kForm.begin(), kForm.end(), text.begin(), text.end(), fits);
}

/// Gives names to made-up identifiers in the order in which it meets them.
class IdentifierNames {
 public:
  explicit IdentifierNames(const std::set<std::string>& knownTexts) : knownTexts_(knownTexts) {}

  PropertyValue named(const PropertyValue& value) {
    if (const PropertyDictionary* dictionary = value.asDictionary()) {
      PropertyDictionary result;
      for (const PropertyEntry& entry : *dictionary) {
        result.set(entry.key, named(entry.value));
      }
      return result;
    }
    if (const PropertyArray* array = value.asArray()) {
      PropertyArray result;
      for (const PropertyValue& element : *array) {
        result.append(named(element));
      }
      return result;
    }
    const Text* text = value.asText();
    return text && isGeneratedIdentifier(*text) ? PropertyValue(nameOf(std::string(*text))) : value;
  }

 private:
  std::string nameOf(const std::string& text) {
    if (knownTexts_.contains(text)) {
      return text;
    }
    std::string& name = names_[text];
    while (name.empty()) {
      const std::string candidate = "NEW-" + std::to_string(++lastNumber_);
      if (!knownTexts_.contains(candidate)) {
        name = candidate;
      }
    }
    return name;
  }

  const std::set<std::string>& knownTexts_;
  std::map<std::string, std::string> names_;
  int lastNumber_ = 0;
};

std::string describe(const PropertyValue* value) {
  if (value == nullptr) {
    return "nothing";
  }
  std::string line;
  appendDescription(line, *value);
  return line;
}

std::string elementName(std::size_t index, const PropertyValue* element) {
  std::string name = "[" + std::to_string(index + 1);
  const PropertyDictionary* account = element ? element->asDictionary() : nullptr;
  if (const std::optional<Text> identifier =
          account ? account->textForKey("Identifier") : std::nullopt) {
    name += " " + std::string(*identifier);
  }
  return name + "]";
}

bool isArrayOfDictionaries(const PropertyArray& array) {
  return std::ranges::any_of(
      array, [](const PropertyValue& element) { return element.asDictionary() != nullptr; });
}

void addDifferences(std::vector<std::string>& lines, const std::string& place,
                    const PropertyValue* expected, const PropertyValue* found);

void addDictionaryDifferences(std::vector<std::string>& lines, const std::string& place,
                              const PropertyDictionary& expected, const PropertyDictionary& found) {
  std::set<std::string> keys;
  for (const PropertyDictionary* dictionary : {&expected, &found}) {
    for (const PropertyEntry& entry : *dictionary) {
      keys.emplace(entry.key);
    }
  }
  for (const std::string& key : keys) {
    addDifferences(lines, place + " \"" + key + "\"", expected.find(key), found.find(key));
  }
}

void addArrayDifferences(std::vector<std::string>& lines, const std::string& place,
                         const PropertyArray& expected, const PropertyArray& found) {
  for (std::size_t index = 0; index < std::max(expected.size(), found.size()); ++index) {
    const PropertyValue* expectedElement = index < expected.size() ? &expected.at(index) : nullptr;
    const PropertyValue* foundElement = index < found.size() ? &found.at(index) : nullptr;
    const std::string name = elementName(index, expectedElement ? expectedElement : foundElement);
    addDifferences(lines, place + name, expectedElement, foundElement);
  }
}

void addDifferences(std::vector<std::string>& lines, const std::string& place,
                    const PropertyValue* expected, const PropertyValue* found) {
  if (expected && found && *expected == *found) {
    return;
  }
  const PropertyDictionary* expectedDictionary = expected ? expected->asDictionary() : nullptr;
  const PropertyDictionary* foundDictionary = found ? found->asDictionary() : nullptr;
  if (expectedDictionary && foundDictionary) {
    addDictionaryDifferences(lines, place, *expectedDictionary, *foundDictionary);
    return;
  }
  // Lists of accounts are compared one by one; short lists are easier to read whole.
  const PropertyArray* expectedArray = expected ? expected->asArray() : nullptr;
  const PropertyArray* foundArray = found ? found->asArray() : nullptr;
  if (expectedArray && foundArray &&
      (isArrayOfDictionaries(*expectedArray) || isArrayOfDictionaries(*foundArray))) {
    addArrayDifferences(lines, place, *expectedArray, *foundArray);
    return;
  }
  lines.push_back(place + ": expected " + describe(expected) + ", found " + describe(found));
}

}  // namespace

void collectTexts(std::set<std::string>& texts, const PropertyValue& value) {
  if (const PropertyDictionary* dictionary = value.asDictionary()) {
    for (const PropertyEntry& entry : *dictionary) {
      collectTexts(texts, entry.value);
    }
  } else if (const PropertyArray* array = value.asArray()) {
    for (const PropertyValue& element : *array) {
      collectTexts(texts, element);
    }
  } else if (const Text* text = value.asText()) {
    texts.emplace(*text);
  }
}

PropertyValue withNamedIdentifiers(const PropertyValue& value,
                                   const std::set<std::string>& knownTexts) {
  return IdentifierNames(knownTexts).named(value);
}

std::vector<std::string> differences(const PropertyValue& expected, const PropertyValue& found) {
  std::vector<std::string> lines;
  addDifferences(lines, "settings", &expected, &found);
  return lines;
}

}  // namespace accounts
