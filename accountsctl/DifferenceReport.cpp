#include "accountsctl/DifferenceReport.h"

#include <fmt/format.h>

#include "propertylist/Description.h"

namespace accounts {
namespace {

constexpr std::string_view kIndentation = "    ";

std::string escaped(std::string_view text) {
  std::string line;
  appendEscapedText(line, text);
  return line;
}

std::string described(const PropertyValue& value) {
  std::string description;
  appendDescription(description, value);
  return description;
}

/// "3 Mail 'Post' (IDENTIFIER)".
std::string lineFor(const ListedAccount& account, const StoreLayout& layout) {
  const std::string identifier = account.identifier ? account.identifier->string() : "none";
  return escaped(fmt::format("{} {} ({})", account.place, titleOf(account, layout), identifier));
}

std::string whereMoved(const ListedAccount& account) {
  if (!account.isChild) {
    return "now a top-level account";
  }
  const std::string parent = account.parentIdentifier ? account.parentIdentifier->string() : "none";
  return "now a child of " + escaped(parent);
}

/// Writes the lines of one difference.
class DifferenceLines {
 public:
  DifferenceLines(const StoreLayout& layout, const Terminal& terminal)
      : layout_(layout), terminal_(terminal) {}

  void add(const AccountChange& change) {
    if (!change.before) {
      addLine(Emphasis::Added, "+ " + lineFor(*change.after, layout_));
    } else if (!change.after) {
      addLine(Emphasis::Removed, "- " + lineFor(*change.before, layout_));
    } else {
      std::string line = "* " + lineFor(*change.after, layout_);
      if (change.hasMoved) {
        line += ", " + whereMoved(*change.after);
      }
      addLine(Emphasis::Heading, line);
      for (const PropertyChange& property : change.properties) {
        add(property, kIndentation);
      }
    }
  }

  void add(const PropertyChange& change, std::string_view indentation) {
    const std::string path = escaped(change.path) + ": ";
    if (change.before) {
      addLine(Emphasis::Removed,
              std::string(indentation) + "- " + path + described(*change.before));
    }
    if (change.after) {
      addLine(Emphasis::Added, std::string(indentation) + "+ " + path + described(*change.after));
    }
  }

  void addLine(Emphasis emphasis, std::string_view line) {
    text_ += emphasized(terminal_, emphasis, line) + "\n";
  }

  std::string take() { return std::move(text_); }

 private:
  const StoreLayout& layout_;
  const Terminal& terminal_;
  std::string text_;
};

}  // namespace

std::string differenceText(const StoreDifference& difference, const StoreLayout& layout,
                           const Terminal& terminal) {
  DifferenceLines lines(layout, terminal);
  for (const PropertyChange& change : difference.properties) {
    lines.add(change, "");
  }
  for (const AccountChange& change : difference.accounts) {
    lines.add(change);
  }
  if (difference.hasOtherOrder) {
    lines.addLine(Emphasis::Heading, "The accounts stand in another order");
  }
  return lines.take();
}

}  // namespace accounts
