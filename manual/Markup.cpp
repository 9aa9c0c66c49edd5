#include "manual/Markup.h"

#include <algorithm>
#include <utility>

namespace zorva::manual {

namespace {

enum class Style { Roman, Bold, Italic };

/// Calls take(style, text) for each piece of one style.
template <typename Take>
void forEachPiece(std::string_view marked, const Take& take) {
  while (!marked.empty()) {
    const std::size_t begin = marked.find_first_of("`<");
    if (begin > 0) take(Style::Roman, marked.substr(0, begin));
    if (begin == std::string_view::npos) return;
    const bool isBold = marked[begin] == '`';
    const std::size_t end = std::min(marked.find(isBold ? '`' : '>', begin + 1), marked.size());
    take(isBold ? Style::Bold : Style::Italic, marked.substr(begin + 1, end - begin - 1));
    marked.remove_prefix(std::min(end + 1, marked.size()));
  }
}

/// `hyphen` is what "-" becomes.
std::string escaped(std::string_view text, std::string_view hyphen) {
  std::string out;
  for (const char c : text) {
    switch (c) {
      case '\\':
        out += "\\e";
        break;
      case '-':
        out += hyphen;
        break;
      case '\'':
        out += "\\(aq";
        break;
      case '`':
        out += "\\(ga";
        break;
      case '^':
        out += "\\(ha";
        break;
      case '~':
        out += "\\(ti";
        break;
      default:
        out += c;
    }
  }
  return out;
}

/// A line that begins with a control character of roff would be a request.
std::string guarded(std::string text) {
  if (text.starts_with('.')) text.insert(0, "\\&");
  return text;
}

}  // namespace

std::string plain(std::string_view marked) {
  std::string out;
  forEachPiece(marked, [&out](Style, std::string_view text) { out += text; });
  return out;
}

std::string roff(std::string_view marked) {
  std::string out;
  forEachPiece(marked, [&out](Style style, std::string_view text) {
    if (style == Style::Roman) {
      out += escaped(text, "-");
    } else {
      out += (style == Style::Bold ? "\\fB" : "\\fI") + escaped(text, "\\-") + "\\fR";
    }
  });
  return guarded(std::move(out));
}

std::string roffLiteral(std::string_view text) { return guarded(escaped(text, "\\-")); }

std::string filled(std::string_view text, std::size_t width, std::string_view prefix) {
  std::string out;
  std::size_t column = 0;
  for (std::size_t from = text.find_first_not_of(" \n"); from < text.size();) {
    const std::size_t end = std::min(text.find_first_of(" \n", from), text.size());
    const std::string_view word = text.substr(from, end - from);
    const bool isFirst = column == 0;
    if (isFirst || column + 1 + word.size() > width) {
      out.append(isFirst ? "" : "\n").append(prefix);
      column = prefix.size();
    } else {
      out += ' ';
      ++column;
    }
    out += word;
    column += word.size();
    from = text.find_first_not_of(" \n", end);
  }
  return out + "\n";
}

std::string sentence(std::string_view text) {
  const bool isEnded = text.empty() || std::string_view(".:;!?").find(text.back()) != std::string_view::npos;
  return std::string(text) + (isEnded ? "" : ".");
}

}  // namespace zorva::manual
