#pragma once

#include <string>
#include <vector>

#include "broker/objects/Value.h"
#include "cli/session/Session.h"

// Changes of instances, by ModifyInstance, as a person needs them: one setting changes and the others stay, and what
// came of it is told.

namespace zorva::cli {

struct ChangeOptions {
  bool only = false;    ///< send what is named alone
  bool dryRun = false;  ///< tell what would be sent, and send nothing
};

/// Reads the instance, puts `changes` into it and sends it back; an empty value that is not among the changes is left
/// out, since sending it would set it. Gives the instance as it is afterwards (or, on a dry run, as it would be sent,
/// with a warning on stderr of each change that would come to nothing). Throws Failure, also for each change that was
/// not stored, with the reason and what to do.
broker::Instance changeInstance(Session& session, const broker::ObjectPath& path,
                                const std::vector<broker::Property>& changes, const ChangeOptions& options);

/// Tells on standard output what was changed, or would be.
void writeChanges(const Session& session, const broker::Instance& instance,
                  const std::vector<broker::Property>& changes, const ChangeOptions& options);

}  // namespace zorva::cli
