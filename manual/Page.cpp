#include "manual/Page.h"

#include <algorithm>
#include <cctype>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include "manual/Markup.h"

namespace zorva::manual {

namespace {

using Kind = Block::Kind;

constexpr std::size_t kIndent = 4;
constexpr std::size_t kRoffWidth = 78;
constexpr std::string_view kLiteralIndent = "    ";

std::string upperCase(std::string text) {
  std::transform(text.begin(), text.end(), text.begin(),
                 [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
  return text;
}

/// The sections, line by line.
class Prose {
 public:
  void take(const std::string& line) {
    if (line.starts_with("## ")) {
      begin(line.substr(3));
    } else if (line.starts_with(kLiteralIndent)) {
      addTo(Kind::Literal, line.substr(kLiteralIndent.size()), "\n");
    } else if (line.empty()) {
      isOpen_ = false;
    } else if (line.starts_with("= ")) {
      add({Kind::Item, {}, line.substr(2)});
    } else if (line.starts_with("+ ")) {
      add({Kind::More, line.substr(2)});
    } else {
      addTo(Kind::Paragraph, line, " ");
    }
  }

  std::vector<Section> sections;

 private:
  void begin(std::string heading) {
    sections.push_back({std::move(heading), {}});
    isOpen_ = false;
  }

  void add(Block block) {
    if (sections.empty()) begin("DESCRIPTION");
    sections.back().blocks.push_back(std::move(block));
    isOpen_ = true;
  }

  /// Extends the open block. Literal lines begin a block of their own.
  void addTo(Kind kind, const std::string& text, const char* separator) {
    const bool isLiteral = kind == Kind::Literal;
    if (!isOpen_ || isLiteral != (sections.back().blocks.back().kind == Kind::Literal)) {
      add({kind, text});
      return;
    }
    std::string& into = sections.back().blocks.back().text;
    into += (into.empty() ? "" : separator) + text;
  }

  bool isOpen_ = false;  ///< whether the next line belongs to the last block
};

/// Text in lines of which none is taken for a request.
std::string roffText(const std::string& marked) {
  std::string text = filled(roff(marked), kRoffWidth, "");
  for (std::size_t at = text.find("\n."); at != std::string::npos; at = text.find("\n.", at + 1))
    text.insert(at + 1, "\\&");
  return text;
}

std::string roffLines(const std::string& text) {
  std::string out;
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) out += roffLiteral(line) + "\n";
  return out;
}

std::string roffOf(const Block& block, bool isFirst) {
  const std::string begin = isFirst ? "" : ".PP\n";
  switch (block.kind) {
    case Kind::Paragraph:
      return begin + roffText(block.text);
    case Kind::Item:
      return ".TP\n" + roff(block.term) + "\n" + roffText(block.text);
    case Kind::More:
      return ".IP\n" + roffText(block.text);
    case Kind::Literal:
      return begin + ".RS 4\n.nf\n" + roffLines(block.text) + ".fi\n.RE\n";
  }
  return {};
}

std::string indented(std::string_view text, std::string_view prefix) {
  std::string out;
  std::istringstream lines{std::string(text)};
  for (std::string line; std::getline(lines, line);) out.append(prefix).append(line).append("\n");
  return out;
}

std::string textOf(const Block& block, std::size_t width) {
  const std::string once(kIndent, ' ');
  const std::string twice(2 * kIndent, ' ');
  switch (block.kind) {
    case Kind::Paragraph:
      return filled(plain(block.text), width, once);
    case Kind::Item:
      return once + plain(block.term) + "\n" + filled(plain(block.text), width, twice);
    case Kind::More:
      return filled(plain(block.text), width, twice);
    case Kind::Literal:
      return indented(block.text, twice);
  }
  return {};
}

}  // namespace

Section& Page::at(const std::string& heading) {
  const auto found =
      std::find_if(sections.begin(), sections.end(), [&](const Section& each) { return each.heading == heading; });
  if (found != sections.end()) return *found;
  return sections.emplace_back(Section{heading, {}});
}

std::vector<Section> sectionsOf(std::string_view prose) {
  Prose read;
  std::istringstream lines{std::string(prose)};
  for (std::string line; std::getline(lines, line);) read.take(line);
  return std::move(read.sections);
}

std::string fileNameOf(const Page& page) { return page.name + "." + std::to_string(page.number); }

std::string roffOf(const Page& page, const std::string& version) {
  const std::string number = std::to_string(page.number);
  std::string out = ".TH " + roffLiteral(upperCase(page.name)) + " " + number + " \"\" \"Zorva " + version + "\" \"" +
                    page.group + "\"\n.SH NAME\n" + roffLiteral(page.name) + " \\- " + roff(page.summary) + "\n";
  for (const Section& section : page.sections) {
    if (section.blocks.empty()) continue;
    out += ".SH " + section.heading + "\n";
    for (const Block& block : section.blocks) out += roffOf(block, &block == &section.blocks.front());
  }
  return out;
}

std::string textOf(const Page& page, std::size_t width) {
  std::string out = filled(page.name + " - " + plain(page.summary), width, "");
  for (const Section& section : page.sections) {
    if (section.blocks.empty()) continue;
    out += "\n" + section.heading + "\n";
    for (const Block& block : section.blocks) {
      out += (&block == &section.blocks.front() ? "" : "\n") + textOf(block, width);
    }
  }
  return out;
}

void writeFile(const std::string& path, const std::string& text) {
  std::filesystem::create_directories(std::filesystem::path(path).parent_path());
  std::ofstream file(path, std::ios::binary | std::ios::trunc);
  if (!(file << text << std::flush)) throw std::runtime_error(path + ": cannot be written");
}

void writePage(const std::string& directory, const Page& page, const std::string& version) {
  writeFile(directory + "/man" + std::to_string(page.number) + "/" + fileNameOf(page), roffOf(page, version));
}

}  // namespace zorva::manual
