#include "inspection/DifferenceText.h"

#include <fmt/format.h>

#include "propertylist/value/Description.h"

namespace accounts {
namespace {

constexpr std::string_view kIndentation = "    ";

/// A text as it is, anything else as JSON.
std::string described(const JSON& value) {
  return value.is_string() ? escapedText(value.get_ref<const std::string&>()) : lineOf(value);
}

std::string textOr(const JSON& value, const char* otherwise) {
  return value.is_string() ? value.get<std::string>() : otherwise;
}

/// "3 Mail 'Post' (IDENTIFIER)".
std::string lineFor(const JSON& account, const JSON& place) {
  return escapedText(fmt::format("{} {} ({})", textOr(place["place"], ""),
                                 textOr(account["title"], ""),
                                 textOr(account["identifier"], "none")));
}

std::string whereMoved(const JSON& place) {
  // A child has a place such as "3.1".
  const bool isChild = textOr(place["place"], "").find('.') != std::string::npos;
  return isChild ? "now a child of " + escapedText(textOr(place["parent"], "none"))
                 : "now a top-level account";
}

/// Writes the lines of one difference.
class DifferenceLines {
 public:
  DifferenceLines(const Terminal& terminal, std::string_view indentation)
      : terminal_(terminal), indentation_(indentation) {}

  void addAccount(const JSON& account) {
    const std::string change = textOr(account["change"], "");
    if (change == "added") {
      addLine(Emphasis::Added, "+ " + lineFor(account, account["after"]));
    } else if (change == "removed") {
      addLine(Emphasis::Removed, "- " + lineFor(account, account["before"]));
    } else {
      const JSON& place = account["after"];
      addLine(Emphasis::Heading,
              "* " + lineFor(account, place) + (change == "moved" ? ", " + whereMoved(place) : ""));
      for (const JSON& property : account["properties"]) {
        addProperty(property, kIndentation);
      }
    }
  }

  void addProperty(const JSON& change, std::string_view indentation) {
    const std::string path = escapedText(textOr(change["path"], "")) + ": ";
    if (const auto before = change.find("before"); before != change.end()) {
      addLine(Emphasis::Removed, fmt::format("{}- {}{}", indentation, path, described(*before)));
    }
    if (const auto after = change.find("after"); after != change.end()) {
      addLine(Emphasis::Added, fmt::format("{}+ {}{}", indentation, path, described(*after)));
    }
  }

  void addLine(Emphasis emphasis, std::string_view line) {
    text_.append(indentation_).append(emphasized(terminal_, emphasis, line)).append("\n");
  }

  std::string take() { return std::move(text_); }

 private:
  const Terminal& terminal_;
  std::string_view indentation_;
  std::string text_;
};

}  // namespace

std::string differenceText(const JSON& difference, const Terminal& terminal,
                           std::string_view indentation) {
  DifferenceLines lines(terminal, indentation);
  for (const JSON& property : difference["properties"]) {
    lines.addProperty(property, "");
  }
  for (const JSON& account : difference["accounts"]) {
    lines.addAccount(account);
  }
  if (difference.value("otherOrder", false)) {
    lines.addLine(Emphasis::Heading, "The accounts stand in another order");
  }
  return lines.take();
}

}  // namespace accounts
