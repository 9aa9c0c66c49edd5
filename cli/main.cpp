#include <cstdio>
#include <exception>
#include <variant>

#include "agent/Agent.h"
#include "cli/commands/Arguments.h"
#include "cli/output/Failure.h"
#include "cli/session/Session.h"

namespace {

using namespace zorva::cli;

ExitCode run(int argc, const char* const* argv) {
  const auto read = readArguments(argc, argv);
  if (const auto* telling = std::get_if<Telling>(&read)) {
    if (telling->isError) throw Failure(ExitCode::WrongUsage, telling->text, telling->hint);
    write(telling->text);
  } else {
    const auto& invocation = std::get<Invocation>(read);
    invocation.command(invocation.arguments);
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
