#include "report/AccountStory.h"

#include <charconv>
#include <set>
#include <vector>

#include "inspection/DifferenceText.h"
#include "propertylist/value/Description.h"
#include "propertylist/value/GeneralisedUTF8.h"

namespace accounts {
namespace {

constexpr std::size_t kLongestValue = 60;

const JSON& memberOf(const JSON& object, const char* key) {
  static const JSON none;
  const auto found = object.is_object() ? object.find(key) : object.end();
  return found != object.end() ? *found : none;
}

std::string wordIn(const JSON& object, const char* key) {
  const JSON& text = memberOf(object, key);
  return text.is_string() ? text.get<std::string>() : "";
}

/// The account at a place such as "Accounts[2].ChildAccounts[0]"; null for none.
const JSON& accountAt(const JSON& accounts, const JSON& place) {
  static const JSON none;
  const JSON* found = &none;
  const JSON* level = &accounts;
  const std::string text = place.is_string() ? place.get<std::string>() : "";
  for (std::size_t at = text.find('['); at != std::string::npos; at = text.find('[', at + 1)) {
    std::size_t index = 0;
    const auto [end, error] =
        std::from_chars(text.data() + at + 1, text.data() + text.size(), index);
    if (error != std::errc() || !level->is_array() || index >= level->size()) {
      return none;
    }
    found = &(*level)[index];
    level = &memberOf(*found, "children");
  }
  return *found;
}

/// What tells an account in a report: where it, or its namesakes, stood before, and the identifiers
/// that they had and have.
struct Traces {
  std::set<std::string, std::less<>> elements;
  std::set<std::string, std::less<>> identifiers;

  /// Whether a change of a stage is one of it. Children are told by their identifiers alone.
  [[nodiscard]] bool areOf(const JSON& change) const {
    const JSON& element = memberOf(change, "account");
    return element.is_string() ? elements.contains(element.get<std::string>())
                               : identifiers.contains(wordIn(change, "identifier"));
  }
};

Traces tracesOf(const JSON& report, std::string_view identifier) {
  Traces traces;
  traces.identifiers.emplace(identifier);
  for (const JSON& account : memberOf(memberOf(report, "ledger"), "accounts")) {
    std::set<std::string, std::less<>> names = {wordIn(account, "identifier")};
    // What was joined into others has not become them.
    if (wordIn(account, "fate") != "joined") {
      for (const JSON& place : memberOf(account, "now")) {
        names.insert(wordIn(accountAt(memberOf(report, "accountsAfter"), place), "identifier"));
      }
    }
    if (names.contains(identifier)) {
      traces.elements.insert(wordIn(account, "place"));
      traces.identifiers.merge(names);
    }
  }
  traces.identifiers.erase("");
  return traces;
}

std::string valueText(const JSON& property, const char* key) {
  const JSON& value = memberOf(property, key);
  if (value.is_null()) {
    return "none";
  }
  const std::string text =
      escapedText(value.is_string() ? value.get<std::string>() : lineOf(value));
  const std::string_view beginning = wholeCodePoints(text, kLongestValue);
  return std::string(beginning) + (beginning.size() < text.size() ? "…" : "");
}

std::string originLine(const JSON& account) {
  std::string line = escapedText(wordIn(account, "place")) + " of " +
                     escapedText(wordIn(account, "file")) + ": " +
                     escapedText(wordIn(account, "words"));
  if (const std::string reason = wordIn(account, "reason"); !reason.empty()) {
    line += ", since " + escapedText(reason);
  }
  for (const JSON& now : memberOf(account, "now")) {
    line += ", now " + escapedText(now.is_string() ? now.get<std::string>() : "");
  }
  return line + "\n";
}

std::string changeLines(const JSON& stage, const JSON& change) {
  std::string text = escapedText(wordIn(stage, "title")) + " (" +
                     escapedText(wordIn(stage, "name")) +
                     "): " + escapedText(wordIn(change, "change")) + "\n";
  for (const JSON& property : memberOf(change, "properties")) {
    text += "    " + escapedText(wordIn(property, "path")) + ": " + valueText(property, "before") +
            " → " + valueText(property, "after") + "\n";
  }
  return text;
}

/// The lines of the accounts of the result that have one of the identifiers; empty for none.
/// Children have no children that count.
std::string resultLines(const JSON& accounts, const Traces& traces, bool areChildren = false) {
  std::string text;
  for (const JSON& account : accounts) {
    if (traces.identifiers.contains(wordIn(account, "identifier"))) {
      text += "Afterwards: " + escapedText(wordIn(account, "title")) + ", account " +
              escapedText(wordIn(account, "place")) + ", identifier " +
              escapedText(wordIn(account, "identifier")) + "\n";
    }
    text += areChildren ? "" : resultLines(memberOf(account, "children"), traces, true);
  }
  return text;
}

}  // namespace

std::optional<std::string> accountStory(const JSON& report, std::string_view identifier) {
  const Traces traces = tracesOf(report, identifier);
  std::string story;
  for (const JSON& account : memberOf(memberOf(report, "ledger"), "accounts")) {
    if (traces.elements.contains(wordIn(account, "place"))) {
      story += originLine(account);
    }
  }
  for (const JSON& stage : memberOf(report, "stages")) {
    for (const JSON& change : memberOf(stage, "accounts")) {
      if (traces.areOf(change)) {
        story += changeLines(stage, change);
      }
    }
  }
  const std::string result = resultLines(memberOf(report, "accountsAfter"), traces);
  if (story.empty() && result.empty()) {
    return std::nullopt;
  }
  return story + (result.empty() ? "Afterwards: not in the settings file\n" : result);
}

}  // namespace accounts
