#include "cli/commands/Commands.h"

namespace zorva::cli {

void addCommands(CommandLine& line) {
  // Help lists them in this order.
  for (const auto add :
       {addShowCommand,   addCheckCommand, addWatchCommand,        addTreeCommand,        addClassesCommand,
        addGraphCommand,  addReadCommands, addAssociationCommands, addModifyCommand,      addInvokeCommand,
        addIfcfgCommands, addDnsCommands,  addDomainCommand,       addSuffixesCommands,   addOverlayCommands,
        addApplyCommands, addUserCommands, addRegisterCommands,    addCompletionCommands, addManualCommands}) {
    add(line);
  }
}

}  // namespace zorva::cli
