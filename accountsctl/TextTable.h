#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "commandline/Terminal.h"

namespace accounts {

/// How many columns of a terminal a text takes. The text must be well-formed UTF-8 without control
/// characters.
std::size_t displayWidth(std::string_view text);

/// A text in lines of at most `width` columns each, broken behind a blank or a mark where there is
/// one. A single character that is wider stands alone. At least one line.
std::vector<std::string> wrapped(std::string_view text, std::size_t width);

/// A table for people. Its cells are texts of files: they are escaped here.
class TextTable {
 public:
  /// Without headings (all empty) the table has no line for them.
  explicit TextTable(std::vector<std::string> headings) : headings_(std::move(headings)) {}

  /// Adds a row; it must have as many cells as there are headings.
  void addRow(const std::vector<std::string>& cells);

  /// The lines of the table, each with its end. Where the table would be wider than the terminal,
  /// the widest columns get narrower and their cells go over several lines.
  [[nodiscard]] std::string text(const Terminal& terminal) const;

 private:
  [[nodiscard]] std::vector<std::size_t> columnWidths(std::size_t tableWidth) const;

  std::vector<std::string> headings_;
  std::vector<std::vector<std::string>> rows_;
};

}  // namespace accounts
