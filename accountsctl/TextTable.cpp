#include "accountsctl/TextTable.h"

#include <utf8proc.h>

#include <algorithm>

#include "propertylist/value/Description.h"
#include "propertylist/value/GeneralisedUTF8.h"

namespace accounts {
namespace {

constexpr std::string_view kGap = "  ";
constexpr std::string_view kMarkOfACut = "\u2026";
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
    if (next.value < 0x80 &&
        kBreakers.find(static_cast<char>(next.value)) != std::string_view::npos) {
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
               const std::vector<std::size_t>& widths, LongCells longCells,
               const Terminal& terminal, const Emphasis* emphasis) {
  std::vector<std::vector<std::string>> lines;
  std::size_t height = 1;
  for (std::size_t column = 0; column < cells.size(); ++column) {
    lines.push_back(longCells == LongCells::Cut
                        ? std::vector<std::string>{cut(cells[column], widths[column])}
                        : wrapped(cells[column], widths[column]));
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

/// One row for programs.
void appendLine(std::string& text, const std::vector<std::string>& cells) {
  for (std::size_t column = 0; column < cells.size(); ++column) {
    text += (column > 0 ? "\t" : "") + cells[column];
  }
  text += "\n";
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

std::string cut(std::string_view text, std::size_t width) {
  if (displayWidth(text) <= width) {
    return std::string(text);
  }
  const std::size_t room = width - std::min(width, displayWidth(kMarkOfACut));
  std::size_t length = 0;
  for (std::size_t taken = 0; length < text.size();) {
    const DecodedCodePoint next = decodeCodePoint(text.substr(length));
    taken += widthOf(next.value);
    if (taken > room) {
      break;
    }
    length += std::max<std::size_t>(next.length, 1);
  }
  return std::string(text.substr(0, length)).append(kMarkOfACut);
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
  std::size_t taken = kGap.size() * (widths.empty() ? 0 : widths.size() - 1);
  std::vector<std::size_t> narrowing;
  for (std::size_t column = 0; column < widths.size(); ++column) {
    if (wholeColumns_.contains(column)) {
      taken += widths[column];
    } else {
      narrowing.push_back(widths[column]);
    }
  }
  const std::size_t widest = widestThatFits(narrowing, tableWidth > taken ? tableWidth - taken : 0);
  for (std::size_t column = 0; column < widths.size(); ++column) {
    if (!wholeColumns_.contains(column)) {
      widths[column] = std::min(widths[column], std::max(widest, kNarrowestColumn));
    }
  }
  return widths;
}

std::string TextTable::text(const Terminal& terminal) const {
  std::string text;
  const bool hasHeadings = std::any_of(headings_.begin(), headings_.end(),
                                       [](const std::string& heading) { return !heading.empty(); });
  if (!terminal.isInteractive) {
    if (hasHeadings) {
      appendLine(text, headings_);
    }
    for (const std::vector<std::string>& row : rows_) {
      appendLine(text, row);
    }
    return text;
  }
  const std::vector<std::size_t> widths = columnWidths(terminal.width);
  if (hasHeadings) {
    const Emphasis heading = Emphasis::Heading;
    appendRow(text, headings_, widths, longCells_, terminal, &heading);
  }
  for (const std::vector<std::string>& row : rows_) {
    appendRow(text, row, widths, longCells_, terminal, nullptr);
  }
  return text;
}

}  // namespace accounts
