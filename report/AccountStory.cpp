#include "report/AccountStory.h"

#include <charconv>
#include <set>
#include <vector>

#include "inspection/DifferenceText.h"
#include "propertylist/value/Description.h"

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

/// The identifiers that one account had, one after the other.
class Names {
 public:
  explicit Names(std::string_view first) : names_{std::string(first)} {}

  [[nodiscard]] bool contains(const std::string& name) const { return names_.contains(name); }

  /// Whether a change is one of this account; learns its other name if it renames it.
  bool learnFrom(const JSON& change) {
    bool isOne = contains(wordIn(change, "identifier"));
    for (const JSON& property : memberOf(change, "properties")) {
      if (wordIn(property, "path") == "Identifier") {
        const std::string before = wordIn(property, "before");
        const std::string after = wordIn(property, "after");
        isOne = isOne || contains(before) || contains(after);
        if (isOne && !before.empty() && !after.empty()) {
          names_.insert(before);
          names_.insert(after);
        }
      }
    }
    return isOne;
  }
  /// Learns the name that an account of the ledger has where it is now, or had where it was.
  void learnFrom(const JSON& account, const JSON& accountsAfter) {
    // What was joined into others has not become them.
    if (wordIn(account, "fate") == "joined") {
      return;
    }
    const std::string before = wordIn(account, "identifier");
    for (const JSON& place : memberOf(account, "now")) {
      const std::string after = wordIn(accountAt(accountsAfter, place), "identifier");
      if ((contains(before) || contains(after)) && !before.empty() && !after.empty()) {
        names_.insert(before);
        names_.insert(after);
      }
    }
  }
  [[nodiscard]] std::size_t size() const { return names_.size(); }

 private:
  std::set<std::string, std::less<>> names_;
};

std::string valueText(const JSON& property, const char* key) {
  const JSON& value = memberOf(property, key);
  if (value.is_null()) {
    return "none";
  }
  std::string text = escapedText(value.is_string() ? value.get<std::string>() : lineOf(value));
  if (text.size() > kLongestValue) {
    text.resize(kLongestValue);
    // Not in the middle of a character.
    while (!text.empty() && (static_cast<unsigned char>(text.back()) & 0xc0U) == 0x80U) {
      text.pop_back();
    }
    text += "…";
  }
  return text;
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

/// The line of an account of the result that has one of the names; empty for none. Children have no
/// children that count.
std::string resultLines(const JSON& accounts, const Names& names, bool areChildren = false) {
  std::string text;
  for (const JSON& account : accounts) {
    if (names.contains(wordIn(account, "identifier"))) {
      text += "Afterwards: " + escapedText(wordIn(account, "title")) + ", account " +
              escapedText(wordIn(account, "place")) + ", identifier " +
              escapedText(wordIn(account, "identifier")) + "\n";
    }
    text += areChildren ? "" : resultLines(memberOf(account, "children"), names, true);
  }
  return text;
}

}  // namespace

std::optional<std::string> accountStory(const JSON& report, std::string_view identifier) {
  Names names(identifier);
  const JSON& stages = memberOf(report, "stages");
  const JSON& accounts = memberOf(memberOf(report, "ledger"), "accounts");
  // Twice as long as names are found: a later stage may tell of an earlier name.
  for (std::size_t known = 0; known != names.size();) {
    known = names.size();
    for (const JSON& account : accounts) {
      names.learnFrom(account, memberOf(report, "accountsAfter"));
    }
    for (const JSON& stage : stages) {
      for (const JSON& change : memberOf(stage, "accounts")) {
        names.learnFrom(change);
      }
    }
  }
  std::string story;
  for (const JSON& account : accounts) {
    if (names.contains(wordIn(account, "identifier"))) {
      story += originLine(account);
    }
  }
  for (const JSON& stage : stages) {
    for (const JSON& change : memberOf(stage, "accounts")) {
      if (names.learnFrom(change)) {
        story += changeLines(stage, change);
      }
    }
  }
  const std::string result = resultLines(memberOf(report, "accountsAfter"), names);
  if (story.empty() && result.empty()) {
    return std::nullopt;
  }
  return story + (result.empty() ? "Afterwards: not in the settings file\n" : result);
}

}  // namespace accounts
