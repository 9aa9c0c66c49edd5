#pragma once

// Questions to the person at the terminal.

#include <optional>
#include <string>

namespace zorva::cli {

enum class Echo { Shown, Hidden };

/// Writes the question to the terminal of this process, whatever its standard input and output are, and reads a line.
/// Nothing: there is no terminal, or it has ended. A signal that ends the process gives the terminal its echo back.
std::optional<std::string> askTerminal(const std::string& question, Echo echo);

}  // namespace zorva::cli
