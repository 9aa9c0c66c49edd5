// tree.

#include <string>
#include <vector>

#include "agent/Agent.h"
#include "cli/commands/Commands.h"
#include "cli/output/Console.h"
#include "cli/output/Text.h"
#include "cli/output/TreeText.h"
#include "cli/session/Session.h"

namespace zorva::cli {

namespace {

void showTree(const Globals& globals) {
  const Session session(globals);
  const std::shared_ptr<const zorva::agent::TreeSnapshot> tree = session.tree();
  write(globals.output == OutputFormat::Json ? zorva::agent::treeToJson(*tree) : treeText(*tree, session.layout()));
}

}  // namespace

void addTreeCommand(CommandLine& line) {
  line.add("tree", "The agent's instrumentation tree")
      .writesJson()
      .local()
      .examples(
          "  zorvactl tree\n"
          "  zorvactl tree --output json > tree.json       to be read back as [tree] source = \"file\"")
      .runs(showTree);
}

}  // namespace zorva::cli
