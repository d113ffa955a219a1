#include "accountsctl/TextTable.h"

#include <utf8proc.h>

#include <algorithm>

#include "propertylist/Description.h"
#include "propertylist/GeneralisedUTF8.h"

namespace accounts {
namespace {

constexpr std::string_view kGap = "  ";
/// No column gets narrower, however narrow the terminal.
constexpr std::size_t kNarrowestColumn = 6;
/// Behind these a text may be broken.
constexpr std::string_view kBreakers = " -,;/@&?._";

std::size_t widthOf(char32_t codePoint) {
  const int width = utf8proc_charwidth(static_cast<utf8proc_int32_t>(codePoint));
  return width > 0 ? static_cast<std::size_t>(width) : 0;
}

/// How many bytes of a text a line of a width takes.
std::size_t lengthOfLine(std::string_view text, std::size_t width) {
  std::size_t column = 0;
  std::size_t length = 0;
  std::size_t afterBreaker = 0;
  while (length < text.size()) {
    const DecodedCodePoint next = decodeCodePoint(text.substr(length));
    column += widthOf(next.value);
    if (column > width && length > 0) {
      // A blank at the end of a line is not seen.
      if (next.value == ' ') {
        return length + next.length;
      }
      return afterBreaker > 0 ? afterBreaker : length;
    }
    length += std::max<std::size_t>(next.length, 1);
    if (next.value < 0x80 && kBreakers.find(static_cast<char>(next.value)) != kBreakers.npos) {
      afterBreaker = length;
    }
  }
  return length;
}

std::string_view withoutBlanksAtEnd(std::string_view text) {
  return text.substr(0, text.find_last_not_of(' ') + 1);
}

/// The largest width that columns may have for all of them together to fit.
std::size_t widestThatFits(const std::vector<std::size_t>& widths, std::size_t available) {
  std::vector<std::size_t> sorted = widths;
  std::sort(sorted.begin(), sorted.end());
  std::size_t columnsLeft = sorted.size();
  for (const std::size_t width : sorted) {
    const std::size_t share = available / columnsLeft;
    if (width > share) {
      return share;
    }
    available -= width;
    --columnsLeft;
  }
  return sorted.empty() ? 0 : sorted.back();
}

/// One row as lines, its cells beside each other.
void appendRow(std::string& text, const std::vector<std::string>& cells,
               const std::vector<std::size_t>& widths, const Terminal& terminal,
               const Emphasis* emphasis) {
  std::vector<std::vector<std::string>> lines;
  std::size_t height = 1;
  for (std::size_t column = 0; column < cells.size(); ++column) {
    lines.push_back(wrapped(cells[column], widths[column]));
    height = std::max(height, lines.back().size());
  }
  for (std::size_t row = 0; row < height; ++row) {
    std::string line;
    std::size_t blanks = 0;
    for (std::size_t column = 0; column < cells.size(); ++column) {
      const std::string& part = row < lines[column].size() ? lines[column][row] : std::string();
      if (!part.empty()) {
        line.append(blanks, ' ');
        line += emphasis != nullptr ? emphasized(terminal, *emphasis, part) : part;
        blanks = 0;
      }
      const std::size_t width = displayWidth(part);
      blanks += kGap.size() + (width < widths[column] ? widths[column] - width : 0);
    }
    text += line + "\n";
  }
}

}  // namespace

std::size_t displayWidth(std::string_view text) {
  std::size_t width = 0;
  while (!text.empty()) {
    const DecodedCodePoint next = decodeCodePoint(text);
    width += widthOf(next.value);
    text.remove_prefix(std::max<std::size_t>(next.length, 1));
  }
  return width;
}

std::vector<std::string> wrapped(std::string_view text, std::size_t width) {
  std::vector<std::string> lines;
  do {
    const std::size_t length = lengthOfLine(text, width);
    lines.emplace_back(withoutBlanksAtEnd(text.substr(0, length)));
    text.remove_prefix(length);
  } while (!text.empty());
  return lines;
}

void TextTable::addRow(const std::vector<std::string>& cells) {
  std::vector<std::string> escaped;
  for (const std::string& cell : cells) {
    appendEscapedText(escaped.emplace_back(), cell);
  }
  rows_.push_back(std::move(escaped));
}

std::vector<std::size_t> TextTable::columnWidths(std::size_t tableWidth) const {
  std::vector<std::size_t> widths;
  for (std::size_t column = 0; column < headings_.size(); ++column) {
    std::size_t width = displayWidth(headings_[column]);
    for (const std::vector<std::string>& row : rows_) {
      width = std::max(width, displayWidth(row[column]));
    }
    widths.push_back(width);
  }
  const std::size_t gaps = kGap.size() * (widths.empty() ? 0 : widths.size() - 1);
  const std::size_t widest = widestThatFits(widths, tableWidth > gaps ? tableWidth - gaps : 0);
  for (std::size_t& width : widths) {
    width = std::min(width, std::max(widest, kNarrowestColumn));
  }
  return widths;
}

std::string TextTable::text(const Terminal& terminal) const {
  const std::vector<std::size_t> widths = columnWidths(terminal.width);
  std::string text;
  const bool hasHeadings = std::any_of(headings_.begin(), headings_.end(),
                                       [](const std::string& heading) { return !heading.empty(); });
  if (hasHeadings) {
    const Emphasis heading = Emphasis::Heading;
    appendRow(text, headings_, widths, terminal, &heading);
  }
  for (const std::vector<std::string>& row : rows_) {
    appendRow(text, row, widths, terminal, nullptr);
  }
  return text;
}

}  // namespace accounts
