#pragma once

#include <cstddef>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "commandline/Terminal.h"

namespace accounts {

/// How many columns of a terminal a text takes. The text must be well-formed UTF-8 without control
/// characters.
std::size_t displayWidth(std::string_view text);

/// A text in one line of at most `width` columns, with a mark at its end where it was cut.
std::string cut(std::string_view text, std::size_t width);

/// A text in lines of at most `width` columns each, broken behind a blank or a mark where there is
/// one. A single character that is wider stands alone. At least one line.
std::vector<std::string> wrapped(std::string_view text, std::size_t width);

/// What becomes of a cell that is wider than its column: it goes over several lines, or is cut with
/// a mark at its end.
enum class LongCells { Wrapped, Cut };

/// A table for people and, where nobody looks at a terminal, for programs. Its cells are texts of
/// files: they are escaped here.
class TextTable {
 public:
  /// Without headings (all empty) the table has no line for them.
  explicit TextTable(std::vector<std::string> headings, LongCells longCells = LongCells::Wrapped)
      : headings_(std::move(headings)), longCells_(longCells) {}

  /// Lets a column have the width of its cells, however narrow the terminal, for texts that are of
  /// use as a whole alone.
  void keepWhole(std::size_t column) { wholeColumns_.insert(column); }

  /// Adds a row; it must have as many cells as there are headings.
  void addRow(const std::vector<std::string>& cells);

  /// The lines of the table, each with its end. Where the table would be wider than the terminal,
  /// the widest columns get narrower. Without a terminal each row is one line, its cells whole and
  /// separated by tabs, which no cell has.
  [[nodiscard]] std::string text(const Terminal& terminal) const;

 private:
  [[nodiscard]] std::vector<std::size_t> columnWidths(std::size_t tableWidth) const;

  std::vector<std::string> headings_;
  LongCells longCells_;
  std::set<std::size_t> wholeColumns_;
  std::vector<std::vector<std::string>> rows_;
};

}  // namespace accounts
