#include "cli/output/Table.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <string_view>
#include <utility>

#include "cli/output/Text.h"

namespace zorva::cli {

namespace {

constexpr std::size_t kGap = 2;        // blanks between columns
constexpr std::size_t kNarrowest = 8;  // no column is made narrower than this

// The escape sequence of each Style, in the order of their declaration.
constexpr std::array kEscapes = {"", "\033[1m", "\033[32m", "\033[33m", "\033[31m", "\033[2m"};
static_assert(kEscapes.size() == static_cast<std::size_t>(Style::Faint) + 1, "one for each Style");

const char* escapeOf(Style style) noexcept { return kEscapes[static_cast<std::size_t>(style)]; }

std::size_t terminalWidth() noexcept {
  winsize size{};
  return ::ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 ? size.ws_col : 0;
}

bool isSet(const char* variable) noexcept {
  const char* value = std::getenv(variable);
  return value != nullptr && *value != '\0';
}

/// A list on one line is not wider than this where nothing limits the line.
constexpr std::size_t kWidestList = 60;

/// Narrows the widest columns until the line fits.
void narrowWidest(std::vector<std::size_t>& widths, std::size_t total, std::size_t wanted) {
  while (total > wanted) {
    const auto widest = std::max_element(widths.begin(), widths.end());
    if (*widest <= kNarrowest) break;
    // Down to the next widest column at once, so that even a text of a megabyte takes few rounds.
    std::size_t next = kNarrowest;
    for (auto width = widths.begin(); width != widths.end(); ++width) {
      if (width != widest && *width < *widest) next = std::max(next, *width);
    }
    const std::size_t cut = std::min(total - wanted, std::max<std::size_t>(*widest - next, 1));
    *widest -= cut;
    total -= cut;
  }
}

std::vector<std::string> onOneLine(const Cell& cell, std::size_t width) {
  return {cell.elements.empty() ? cutTo(cell.text, width) : firstOf(cell.elements, width)};
}

}  // namespace

Layout Layout::ofStandardOutput() {
  Layout layout;
  if (::isatty(STDOUT_FILENO) == 0) return layout;
  layout.width = terminalWidth();
  const char* terminal = std::getenv("TERM");
  layout.colours = !isSet("NO_COLOR") && terminal != nullptr && std::string_view(terminal) != "dumb";
  return layout;
}

std::string styled(std::string_view text, Style style, const Layout& layout) {
  if (!layout.colours || style == Style::Plain || text.empty()) return std::string(text);
  return escapeOf(style) + std::string(text) + "\033[0m";
}

Table::Table(std::vector<std::string> headings, std::size_t indent) : indent_(indent) {
  for (std::string& heading : headings) headings_.emplace_back(std::move(heading), Style::Heading);
}

Cell Cell::list(std::vector<std::string> elements, Style look) {
  Cell cell(elements.empty() ? "-" : joined(elements, " "), look);
  cell.elements = std::move(elements);
  return cell;
}

void Table::add(std::vector<Cell> row) {
  for (Cell& cell : row) {
    cell.text = printable(cell.text);
    for (std::string& element : cell.elements) element = printable(element);
  }
  rows_.push_back(std::move(row));
}

void Table::append(const Table& other, const std::string& heading, const std::string& field) {
  if (headings_.empty()) {
    headings_.emplace_back(heading, Style::Heading);
    headings_.insert(headings_.end(), other.headings_.begin(), other.headings_.end());
    isOneLine_ = other.isOneLine_;
    for (const Narrowing& each : other.narrowing_) narrowing_.push_back({each.column + 1, each.least});
  }
  for (const std::vector<Cell>& row : other.rows_) {
    rows_.push_back({printable(field)});
    rows_.back().insert(rows_.back().end(), row.begin(), row.end());
  }
}

void Table::keepRowsOnOneLine(std::vector<Narrowing> order) {
  isOneLine_ = true;
  narrowing_ = std::move(order);
}

std::size_t Table::naturalWidth(const Cell& cell, const Layout& layout) const {
  const std::size_t width = displayWidth(cell.text);
  const bool isLimited = isOneLine_ && layout.width == 0 && !cell.elements.empty();
  return isLimited ? std::min(width, kWidestList) : width;
}

std::vector<std::size_t> Table::columnWidths(const Layout& layout) const {
  std::vector<std::size_t> widths;
  const auto widen = [&](const std::vector<Cell>& row) {
    if (widths.size() < row.size()) widths.resize(row.size());
    for (std::size_t i = 0; i < row.size(); ++i) widths[i] = std::max(widths[i], naturalWidth(row[i], layout));
  };
  widen(headings_);
  for (const std::vector<Cell>& row : rows_) widen(row);
  if (layout.width == 0 || widths.empty()) return widths;

  std::size_t total = indent_ + kGap * (widths.size() - 1);
  for (const std::size_t width : widths) total += width;
  for (const Narrowing& each : narrowing_) {
    if (total <= layout.width || each.column >= widths.size() || widths[each.column] <= each.least) continue;
    const std::size_t cut = std::min(total - layout.width, widths[each.column] - each.least);
    widths[each.column] -= cut;
    total -= cut;
  }
  narrowWidest(widths, total, layout.width);
  return widths;
}

/// The lines of one row.
void Table::appendRow(std::string& out, const std::vector<Cell>& row, const std::vector<std::size_t>& widths,
                      const Layout& layout) const {
  std::vector<std::vector<std::string>> columns;
  std::size_t height = 1;
  for (std::size_t i = 0; i < row.size(); ++i) {
    columns.push_back(isOneLine_ ? onOneLine(row[i], widths[i]) : wrapped(row[i].text, widths[i]));
    height = std::max(height, columns.back().size());
  }
  for (std::size_t line = 0; line < height; ++line) {
    std::string blanks(indent_, ' ');
    for (std::size_t i = 0; i < columns.size(); ++i) {
      std::string_view piece = line < columns[i].size() ? std::string_view(columns[i][line]) : std::string_view();
      piece = piece.substr(0, piece.find_last_not_of(' ') + 1);
      // Blanks are written only before the next text, so that no line ends in them.
      if (!piece.empty()) out += blanks + styled(piece, row[i].style, layout);
      if (!piece.empty()) blanks.clear();
      blanks.append(widths[i] + kGap - std::min(widths[i], displayWidth(piece)), ' ');
    }
    out += '\n';
  }
}

std::string Table::text(const Layout& layout) const {
  const std::vector<std::size_t> widths = columnWidths(layout);
  std::string out;
  if (!headings_.empty()) appendRow(out, headings_, widths, layout);
  for (const std::vector<Cell>& row : rows_) appendRow(out, row, widths, layout);
  return out;
}

}  // namespace zorva::cli
