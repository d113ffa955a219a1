#include "accountsettings/DataclassOrder.h"

#include <algorithm>
#include <set>
#include <vector>

namespace accounts {

namespace {

/// The index of a text in a short list; the list's size when it is not there.
std::size_t indexOfText(const PropertyArray& list, const Text& text) {
  const auto* place = std::find_if(list.begin(), list.end(), [&](const PropertyValue& member) {
    return member.asText() != nullptr && *member.asText() == text;
  });
  return static_cast<std::size_t>(place - list.begin());
}

}  // namespace

PropertyArray orderedDataclasses(const PropertyArray& list, const PropertyArray& canonicalOrder) {
  std::vector<PropertyValue> others;
  for (const PropertyValue& member : list) {
    const Text* text = member.asText();
    if (text != nullptr && indexOfText(canonicalOrder, *text) == canonicalOrder.size()) {
      others.push_back(member);
    }
  }
  const PropertyArray canonical = dataclassesInBoth(canonicalOrder, list);
  std::vector<PropertyValue> ordered(canonical.begin(), canonical.end());
  ordered.insert(ordered.end(), others.begin(), others.end());
  return PropertyArray(std::move(ordered));
}

PropertyArray dataclassesInBoth(const PropertyArray& allowed, const PropertyArray& list) {
  std::vector<bool> isInBoth(allowed.size() + 1, false);
  for (const PropertyValue& member : list) {
    if (const Text* text = member.asText()) {
      isInBoth[indexOfText(allowed, *text)] = true;
    }
  }
  std::vector<PropertyValue> result;
  for (std::size_t index = 0; index < allowed.size(); ++index) {
    if (isInBoth[index]) {
      result.push_back(allowed.at(index));
    }
  }
  return PropertyArray(std::move(result));
}

PropertyArray dataclassesWithout(PropertyArray list, const PropertyArray& hidden) {
  for (const PropertyValue& member : hidden) {
    if (const Text* text = member.asText()) {
      list.removeText(*text);
    }
  }
  return list;
}

PropertyArray dataclassSetWith(const PropertyArray& list, std::string_view dataclass,
                               DataclassSwitch state) {
  std::vector<PropertyValue> members;
  std::set<std::string_view> texts;
  for (const PropertyValue& member : list) {
    const Text* text = member.asText();
    const bool isSwitchedOff =
        text != nullptr && *text == dataclass && state == DataclassSwitch::Off;
    if (!isSwitchedOff && (text == nullptr || texts.insert(*text).second)) {
      members.push_back(member);
    }
  }
  if (state == DataclassSwitch::On && !texts.contains(dataclass)) {
    members.emplace_back(dataclass);
  }
  return PropertyArray(std::move(members));
}

}  // namespace accounts
