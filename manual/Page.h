#pragma once

// A manual page, as roff for man(1) and as text for a terminal.

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace zorva::manual {

/// All texts but literal ones have the markup of Markup.h.
struct Block {
  enum class Kind {
    Paragraph,
    Item,     ///< a term and what it means
    More,     ///< a further paragraph of the item before it
    Literal,  ///< lines that stay as they are
  };
  Kind kind = Kind::Paragraph;
  std::string text;
  std::string term = {};
};

struct Section {
  std::string heading;
  std::vector<Block> blocks;
};

struct Page {
  std::string name;   ///< "zorvactl-show"
  int number = 1;     ///< of the manual's section
  std::string group;  ///< of the header: "User commands"
  std::string summary;
  std::vector<Section> sections = {};

  /// The section of that heading, made at the end if there is none.
  Section& at(const std::string& heading);
};

/// Prose as sections. "## HEADING" begins one; what comes before the first is DESCRIPTION. Blank lines separate
/// paragraphs. "= term" begins an item, whose text are the next lines; a paragraph after "+" is a further one of the
/// item. Lines that begin with four blanks are literal.
std::vector<Section> sectionsOf(std::string_view prose);

/// "zorvactl-show.1".
std::string fileNameOf(const Page& page);

std::string roffOf(const Page& page, const std::string& version);

/// In lines of at most so many columns.
std::string textOf(const Page& page, std::size_t width);

/// Writes a file, in a directory that is made with those above it. Throws std::runtime_error.
void writeFile(const std::string& path, const std::string& text);

/// Writes the page below this directory, as man1/zorvactl-show.1. Throws std::runtime_error.
void writePage(const std::string& directory, const Page& page, const std::string& version);

}  // namespace zorva::manual
