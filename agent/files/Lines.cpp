#include "agent/files/Lines.h"

namespace zorva::agent {

std::string_view takeLine(std::string_view& text) {
  const std::size_t end = text.find('\n');
  std::string_view line = text.substr(0, end);
  text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
  if (line.ends_with('\r')) line.remove_suffix(1);
  return line;
}

std::vector<std::string> wordsOf(std::string_view line) {
  constexpr std::string_view kBlanks = " \t";
  std::vector<std::string> words;
  for (std::size_t begin = line.find_first_not_of(kBlanks); begin != std::string_view::npos;) {
    if (line[begin] == '#' || line[begin] == ';') break;
    const std::size_t end = line.find_first_of(kBlanks, begin);
    words.emplace_back(line.substr(begin, end - begin));
    begin = line.find_first_not_of(kBlanks, end);
  }
  return words;
}

}  // namespace zorva::agent
