// graph: the objects and their associations as text for Graphviz, or drawn by it.

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>

#include "cli/commands/Commands.h"
#include "cli/commands/Graph.h"
#include "cli/commands/ViewJson.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/session/Paths.h"
#include "cli/session/Session.h"
#include "util/FileDescriptor.h"

namespace zorva::cli {

namespace {

struct GraphOptions {
  std::string path;  ///< of the first object; empty: all
  bool all = false;  ///< whatever time it takes
};

/// Starts Graphviz's dot with its input at `input`; its output is that of this process.
pid_t startDot(int input) {
  const char* const words[] = {"dot", "-Tsvg", nullptr};
  posix_spawn_file_actions_t actions;
  ::posix_spawn_file_actions_init(&actions);
  ::posix_spawn_file_actions_adddup2(&actions, input, STDIN_FILENO);
  pid_t child = -1;
  const int error = ::posix_spawnp(&child, words[0], &actions, nullptr, const_cast<char* const*>(words), environ);
  ::posix_spawn_file_actions_destroy(&actions);
  if (error == 0) return child;
  throw Failure(ExitCode::Failed, std::string("cannot start Graphviz's dot: ") + std::strerror(error),
                "install it (apt-get install graphviz), or use --output dot");
}

/// Writes to a pipe whose reader may end early.
void feed(int pipe, std::string_view text) {
  while (!text.empty()) {
    const ssize_t written = ::write(pipe, text.data(), text.size());
    if (written < 0 && errno != EINTR) return;
    if (written > 0) text.remove_prefix(static_cast<std::size_t>(written));
  }
}

void writeSvg(const std::string& dot) {
  flushOutput();
  int ends[2];
  if (::pipe2(ends, O_CLOEXEC) != 0) {
    throw Failure(ExitCode::Failed, std::string("cannot make a pipe: ") + std::strerror(errno));
  }
  util::FileDescriptor output(ends[0]);
  util::FileDescriptor input(ends[1]);
  std::signal(SIGPIPE, SIG_IGN);
  const pid_t child = startDot(output.get());
  output.reset();
  feed(input.get(), dot);
  input.reset();
  int status = 0;
  while (::waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
    throw Failure(ExitCode::Failed, "Graphviz's dot did not draw the graph", "--output dot shows what it was given");
  }
}

Graph graphOf(Session& session, const GraphOptions& options) {
  Progress progress;
  const std::vector<broker::ObjectPath> roots =
      options.path.empty() ? allObjects(session, progress)
                           : std::vector<broker::ObjectPath>{resolvePath(session, options.path)};
  return walkGraph(session, progress, roots, options.all);
}

void showGraph(const Globals& globals, const GraphOptions& options) {
  Session session(globals);
  const Session::Quiet quiet(session);
  const Graph graph = graphOf(session, options);
  if (graph.notFollowed != 0) {
    tellNote(
        "of this many objects " + std::to_string(graph.notFollowed) +
        " were not asked for their associations; graph PATH begins at one of them, --all asks all, which takes long");
  }
  switch (globals.output) {
    case OutputFormat::Json:
      write(graphJson(graph) + "\n");
      return;
    case OutputFormat::Dot:
      write(graphDot(graph));
      return;
    case OutputFormat::Svg:
      writeSvg(graphDot(graph));
      return;
    default:
      write(graphText(graph, session.layout()));
  }
}

}  // namespace

void addGraphCommand(CommandLine& line) {
  const auto options = std::make_shared<GraphOptions>();
  line.add("graph", "The objects and how they are associated")
      .writes({OutputFormat::Table, OutputFormat::Json, OutputFormat::Dot, OutputFormat::Svg})
      .examples(
          "  zorvactl graph\n"
          "  zorvactl graph 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"'\n"
          "  zorvactl graph --output svg > dns.svg         needs Graphviz")
      .optionalWord("PATH", "Begin at this object; without it, all are shown", options->path)
      .flag("--all", "Follow all objects of a host with very many interfaces, too; takes long", options->all)
      .runs<GraphOptions>(showGraph, options);
}

}  // namespace zorva::cli
