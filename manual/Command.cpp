#include "manual/Command.h"

#include <algorithm>
#include <cctype>
#include <sstream>
#include <stdexcept>
#include <utility>

#include "manual/Markup.h"

namespace zorva::manual {

namespace {

using Kind = Block::Kind;

std::string bold(std::string_view text) { return "`" + std::string(text) + "`"; }
std::string italic(std::string_view text) { return "<" + std::string(text) + ">"; }

/// "<INTERFACE> [<SERVER>...]"
std::string argumentsText(const Command& command) {
  std::string text;
  for (const DeclaredOption& each : command.arguments) {
    const std::string name = italic(each.name) + (each.isRepeatable ? "..." : "");
    text += " " + (each.isRequired ? name : "[" + name + "]");
  }
  return text;
}

/// "[`--dry-run`] [`--role` <ROLE>]"
std::string optionsText(const Command& command) {
  std::string text;
  for (const DeclaredOption& each : command.options) {
    if (each.name == "--help") continue;
    text += " [" + bold(each.name) + (each.value.empty() ? "" : " " + italic(each.value)) + "]" +
            (each.isRepeatable ? "..." : "");
  }
  return text;
}

std::string optionTerm(const DeclaredOption& option) {
  return (option.brief.empty() ? std::string() : bold(option.brief) + ", ") + bold(option.name) +
         (option.value.empty() ? std::string() : " " + italic(option.value));
}

/// Every option of a command and of those below it, each once.
void addOptions(const Command& command, std::vector<DeclaredOption>& options) {
  for (const DeclaredOption& each : command.options) {
    const bool isThere = std::find(options.begin(), options.end(), each) != options.end();
    if (!isThere && each.name != "--help") options.push_back(each);
  }
  for (const Command& each : command.commands) addOptions(each, options);
}

std::vector<Block> synopsisOf(const Command& command) {
  if (command.commands.empty() || !command.arguments.empty()) {
    return {{Kind::Paragraph, bold(command.call) + optionsText(command) + argumentsText(command)}};
  }
  std::vector<Block> blocks;
  for (const Command& each : command.commands) {
    blocks.push_back({Kind::Paragraph, bold(each.call) + optionsText(each) + argumentsText(each)});
  }
  return blocks;
}

std::vector<Block> argumentsOf(const Command& command) {
  std::vector<Block> blocks;
  for (const DeclaredOption& each : command.arguments) {
    blocks.push_back({Kind::Item, sentence(each.meaning), italic(each.name)});
  }
  return blocks;
}

std::vector<Block> optionsOf(const Command& command) {
  std::vector<DeclaredOption> options;
  addOptions(command, options);
  std::vector<Block> blocks;
  for (const DeclaredOption& each : options) blocks.push_back({Kind::Item, sentence(each.meaning), optionTerm(each)});
  return blocks;
}

std::vector<Block> commandsOf(const Command& command) {
  std::vector<Block> blocks;
  for (const Command& each : command.commands) {
    std::string term = bold(each.name());
    for (const std::string& alias : each.aliases) term += ", " + bold(alias);
    blocks.push_back({Kind::Item, sentence(each.summary), term + argumentsText(each)});
  }
  return blocks;
}

/// The command and its comment.
Block exampleOf(std::string_view line) {
  line.remove_prefix(std::min(line.find_first_not_of(' '), line.size()));
  const std::size_t gap = line.find("   ");
  if (gap == std::string_view::npos) return {Kind::Literal, std::string(line)};
  const std::string_view comment = line.substr(line.find_first_not_of(' ', gap));
  return {Kind::Literal, std::string(line.substr(0, gap)) + "   # " + std::string(comment)};
}

std::vector<Block> examplesOf(const Command& command) {
  std::vector<Block> blocks;
  const auto add = [&blocks](const std::string& examples) {
    std::istringstream lines(examples);
    for (std::string line; std::getline(lines, line);) {
      const Block example = exampleOf(line);
      if (blocks.empty()) {
        blocks.push_back(example);
      } else if (blocks.back().text.find(example.text) == std::string::npos) {
        blocks.back().text += "\n" + example.text;
      }
    }
  };
  add(command.examples);
  for (const Command& each : command.commands) add(each.examples);
  return blocks;
}

/// Whether the name is a word of the term: --output of "`-o`, `--output` <FORMAT>".
bool isTermOf(const std::string& term, const std::string& name) {
  const std::string text = " " + plain(term) + " ";
  return text.find(" " + name + " ") != std::string::npos || text.find(" " + name + ",") != std::string::npos;
}

/// Adds the prose's items to those that are there.
void addDetails(std::vector<Block>& items, const Section& prose, const std::string& call) {
  std::size_t after = items.size();  // where the next paragraph belongs
  for (const Block& each : prose.blocks) {
    if (each.kind == Kind::Item) {
      const auto found = std::find_if(items.begin(), items.end(), [&](const Block& item) {
        return item.kind == Kind::Item && isTermOf(item.term, plain(each.term));
      });
      if (found == items.end()) throw std::logic_error(call + " has no " + plain(each.term));
      found->text += " " + each.text;
      after = static_cast<std::size_t>(found - items.begin()) + 1;
    } else {
      items.insert(items.begin() + static_cast<std::ptrdiff_t>(after), each);
      ++after;
    }
  }
}

}  // namespace

Page commandPage(const Command& command, std::string_view prose) {
  std::string name = command.call;
  std::replace(name.begin(), name.end(), ' ', '-');
  std::string summary = command.summary;
  if (!summary.empty()) summary[0] = static_cast<char>(std::tolower(static_cast<unsigned char>(summary[0])));
  Page page{name, 1, "User commands", summary};
  page.at("SYNOPSIS").blocks = synopsisOf(command);
  page.at("DESCRIPTION");
  page.at("COMMANDS").blocks = commandsOf(command);
  page.at("ARGUMENTS").blocks = argumentsOf(command);
  page.at("OPTIONS").blocks = optionsOf(command);
  if (command.outputs.size() > 1) {
    std::string formats;
    for (const std::string& each : command.outputs) formats += (formats.empty() ? "" : ", ") + bold(each);
    page.at("OUTPUT").blocks = {{Kind::Paragraph, "`--output` <FORMAT> is one of " + formats + "."}};
  }
  for (const Section& section : sectionsOf(prose)) {
    std::vector<Block>& blocks = page.at(section.heading).blocks;
    if (section.heading == "COMMANDS" || section.heading == "ARGUMENTS" || section.heading == "OPTIONS") {
      addDetails(blocks, section, command.call);
    } else {
      blocks.insert(blocks.end(), section.blocks.begin(), section.blocks.end());
    }
  }
  std::vector<Block> examples = examplesOf(command);
  std::vector<Block>& blocks = page.at("EXAMPLES").blocks;
  blocks.insert(blocks.end(), examples.begin(), examples.end());
  std::stable_partition(page.sections.begin(), page.sections.end(),
                        [](const Section& each) { return each.heading != "SEE ALSO"; });
  return page;
}

}  // namespace zorva::manual
