// tree.
#include <string>
#include <vector>

#include "agent/Agent.h"
#include "cli/commands/Commands.h"
#include "cli/output/ResultWriter.h"
#include "cli/output/Text.h"
#include "cli/output/TreeText.h"
#include "cli/session/Session.h"

namespace zorva::cli {

void showTree(const Arguments& arguments) {
  requireFormat(arguments.output, {OutputFormat::Table, OutputFormat::Json}, "tree");
  requireLocal(arguments, "tree");
  const Session session(arguments);
  const std::shared_ptr<const zorva::agent::TreeSnapshot> tree = session.tree();
  write(arguments.output == OutputFormat::Json ? zorva::agent::treeToJson(*tree) : treeText(*tree, session.layout()));
}

}  // namespace zorva::cli
