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

  Cell(std::string content = {}, Style look = Style::Plain)  // NOLINT(google-explicit-constructor)
      : text(std::move(content)), style(look) {}
  Cell(const char* content) : text(content) {}  // NOLINT(google-explicit-constructor)
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

  /// The lines, each ended by a line feed and without blanks at its end.
  std::string text(const Layout& layout) const;

 private:
  std::vector<std::size_t> columnWidths(const Layout& layout) const;

  std::vector<Cell> headings_;
  std::size_t indent_;
  std::vector<std::vector<Cell>> rows_;
};

}  // namespace zorva::cli
