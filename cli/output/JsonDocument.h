#pragma once

// What every JSON document of this program has in common. docs/json.md describes them.

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

namespace zorva::cli {

using Json = nlohmann::ordered_json;

/// The first member of each document. It grows when a field goes away or changes its meaning, not when one is added.
inline constexpr int kJsonVersion = 1;

/// A document as text, indented by two blanks, without a line feed at its end: the members of an object after the
/// version; a list as the member "results".
std::string documentText(const Json& content);

/// A list of texts, each as asUtf8() has it.
Json jsonOfTexts(const std::vector<std::string>& texts);

}  // namespace zorva::cli
