#include "manual/ConfigPage.h"

#include <algorithm>
#include <iterator>

#include "manual/Markup.h"

namespace zorva::manual {

namespace {

using util::TomlKey;
using util::TomlType;

constexpr std::size_t kSampleWidth = 100;

std::string_view typeText(TomlType type) {
  switch (type) {
    case TomlType::Text:
      return "text";
    case TomlType::Path:
      return "path";
    case TomlType::Number:
      return "number";
    case TomlType::Switch:
      return "true or false";
    case TomlType::Texts:
      return "list of texts";
  }
  return {};
}

std::string bold(std::string_view text) { return "`" + std::string(text) + "`"; }

/// The values that it may have: `read`, `operate` or `none`; a number from 1 to 64; a path.
std::string valuesOf(const TomlKey& key) {
  if (!key.words.empty()) {
    std::string text = bold(key.words);
    for (std::size_t at = text.find('|'); at != std::string::npos; at = text.find('|', at)) {
      text.replace(at, 1, text.find('|', at + 1) == std::string::npos ? "` or `" : "`, `");
    }
    return text;
  }
  std::string text(typeText(key.type));
  const bool isRange = key.least != TomlKey().least || key.most != TomlKey().most;
  return isRange ? text + " from " + std::to_string(key.least) + " to " + std::to_string(key.most) : text;
}

Block itemOf(const TomlKey& key) {
  std::string text =
      std::string(key.meaning) + " Default: " + (key.standard.empty() ? "none" : bold(key.standard)) + ".";
  if (!key.installed.empty()) text += " The file that is installed has " + bold(key.installed) + ".";
  if (!key.example.empty()) text += " Example: `" + std::string(key.name) + " = " + std::string(key.example) + "`.";
  return {Block::Kind::Item, std::move(text), bold(key.name) + " (" + valuesOf(key) + ")"};
}

void addComment(std::string& out, std::string_view marked) { out += filled(plain(marked), kSampleWidth, "# "); }

}  // namespace

Page configPage(const ConfigFile& file) {
  Page page{std::string(file.name), 5, "File formats", std::string(file.summary)};
  page.sections = sectionsOf(file.prose);
  std::vector<Section> keys;
  for (const util::TomlSection& section : file.sections) {
    Section of{"[" + std::string(section.name) + "]", {{Block::Kind::Paragraph, std::string(section.meaning)}}};
    for (const TomlKey& key : section.keys) of.blocks.push_back(itemOf(key));
    keys.push_back(std::move(of));
  }
  // After the description.
  const auto at = page.sections.empty() ? page.sections.end() : std::next(page.sections.begin());
  page.sections.insert(at, std::make_move_iterator(keys.begin()), std::make_move_iterator(keys.end()));
  return page;
}

std::string sampleOf(const ConfigFile& file) {
  std::string out;
  addComment(out, file.opening);
  for (const util::TomlSection& section : file.sections) {
    out += "\n[" + std::string(section.name) + "]\n";
    addComment(out, section.meaning);
    for (const TomlKey& key : section.keys) {
      const std::string name(key.name);
      out += "\n";
      addComment(out, std::string(key.meaning) + " (" + valuesOf(key) + ")");
      out += "#" + name + " = " + std::string(key.standard.empty() ? key.example : key.standard) + "\n";
      if (!key.installed.empty()) out += name + " = " + std::string(key.installed) + "\n";
    }
  }
  return out;
}

}  // namespace zorva::manual
