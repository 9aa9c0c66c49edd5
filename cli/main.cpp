#include <cstdio>
#include <exception>

#include "agent/Agent.h"
#include "cli/commands/Commands.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"

namespace {

using namespace zorva::cli;

ExitCode run(int argc, const char* const* argv) {
  CommandLine line;
  addCommands(line);
  if (const auto telling = line.read(argc, argv)) {
    if (telling->isError) throw Failure(ExitCode::WrongUsage, telling->text, telling->hint);
    write(telling->text);
  } else {
    line.run();
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
