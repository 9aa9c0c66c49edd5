#pragma once

// Tables with aligned columns, for terminals of any width.

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace zorva::cli {

/// The look of a text if colours are shown.
enum class Style { Plain, Heading, Good, Warning, Bad, Faint };

/// How text is laid out.
struct Layout {
  std::size_t width = 0;  ///< columns of the terminal; 0: no terminal, so no limit
  bool colours = false;
  bool rowsAlone = false;  ///< a result is rows of tables with headings, to be put together with those of other hosts

  /// The layout of standard output: colours and a width only if it is a terminal; no colours if NO_COLOR is set and not
  /// empty, or the terminal is a dumb one.
  static Layout ofStandardOutput();
};

/// `text` between the terminal's escape sequences for `style`; unchanged if the layout has no colours.
std::string styled(std::string_view text, Style style, const Layout& layout);

/// One field of a table. The text is made printable by the table.
struct Cell {
  std::string text;
  Style style = Style::Plain;
  std::vector<std::string> elements;  ///< of a list, which the text then is

  Cell(std::string content = {}, Style look = Style::Plain)  // NOLINT(google-explicit-constructor)
      : text(std::move(content)), style(look) {}
  Cell(const char* content) : text(content) {}  // NOLINT(google-explicit-constructor)

  /// A list with blanks between its elements; a dash if it is empty. Where a row must fit on a line, it ends in "and 3
  /// more".
  static Cell list(std::vector<std::string> elements, Style look = Style::Plain);
};

/// How far a column may be narrowed.
struct Narrowing {
  std::size_t column;
  std::size_t least;
};

/// Rows of fields below headings. Columns are as wide as their widest field. If that is too much for the terminal, the
/// widest columns are narrowed and their fields wrapped, so no text is lost.
class Table {
 public:
  /// Without headings there is no line for them.
  explicit Table(std::vector<std::string> headings = {}, std::size_t indent = 0);

  /// A row may have fewer fields than the table has columns.
  void add(std::vector<Cell> row);

  bool empty() const noexcept { return rows_.empty(); }

  /// Adds the rows of another table, with this first field and all else as that table has it; `heading` is that of the
  /// field.
  void append(const Table& other, const std::string& heading, const std::string& field);

  /// Puts each row on one line: a field that is too wide is cut, also a list where there is no terminal. These columns
  /// are narrowed first, in this order.
  void keepRowsOnOneLine(std::vector<Narrowing> order);

  /// The lines, each ended by a line feed and without blanks at its end.
  std::string text(const Layout& layout) const;

 private:
  std::vector<std::size_t> columnWidths(const Layout& layout) const;
  std::size_t naturalWidth(const Cell& cell, const Layout& layout) const;
  void appendRow(std::string& out, const std::vector<Cell>& row, const std::vector<std::size_t>& widths,
                 const Layout& layout) const;

  std::vector<Cell> headings_;
  std::size_t indent_;
  std::vector<std::vector<Cell>> rows_;
  bool isOneLine_ = false;
  std::vector<Narrowing> narrowing_;
};

}  // namespace zorva::cli
