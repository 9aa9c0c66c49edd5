#include <algorithm>
#include <cstdio>
#include <exception>
#include <optional>

#include "agent/Agent.h"
#include "cli/commands/Commands.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"

namespace {

using namespace zorva::cli;

// Reads the words into a command line of the subcommand that they name, or of all for help and errors.
std::optional<Telling> read(std::optional<CommandLine>& line, int argc, const char* const* argv) {
  line.emplace();
  if (addNamedCommands(*line, {argv + std::min(argc, 1), argv + argc})) {
    if (!line->read(argc, argv)) return std::nullopt;
    line.emplace();
  }
  addCommands(*line);
  return line->read(argc, argv);
}

ExitCode run(int argc, const char* const* argv) {
  std::optional<CommandLine> line;
  if (const auto telling = read(line, argc, argv)) {
    if (telling->isError) throw Failure(ExitCode::WrongUsage, telling->text, telling->hint);
    write(telling->text);
  } else {
    line->run();
  }
  flushOutput();
  return ExitCode::Done;
}

}  // namespace

int main(int argc, char** argv) {
  zorva::agent::askForExceptions();
  try {
    return static_cast<int>(run(argc, argv));
  } catch (const Failure& failure) {
    tellError(failure.what(), failure.hint());
    return static_cast<int>(failure.exitCode());
  } catch (const std::exception& error) {
    tellError(error.what());
    return static_cast<int>(ExitCode::Failed);
  }
}
