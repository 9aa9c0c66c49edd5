#pragma once

// Changes of instances, with ModifyInstance, as a person needs them: one setting changes, the others stay, and the
// result is reported.

#include <string>
#include <vector>

#include "broker/objects/Value.h"
#include "cli/session/Session.h"

namespace zorva::cli {

struct ChangeOptions {
  bool only = false;    ///< send only the named properties
  bool dryRun = false;  ///< print the change, and send nothing
};

/// Reads the instance, puts `changes` into it and sends it back. An empty value that is not among the changes is left
/// out, because sending it would set it. Returns the instance after the change. On a dry run, returns the instance that
/// would be sent, with a warning on stderr for each change that would not be stored. Throws Failure, also for each
/// change that was not stored, with the reason and what to do.
broker::Instance changeInstance(Session& session, const broker::ObjectPath& path,
                                const std::vector<broker::Property>& changes, const ChangeOptions& options);

/// Brings the settings of a changed instance to the host, where the configuration says so. The lock is held. Throws
/// Failure if the host does not have them then.
void bringToHost(const broker::ObjectPath& path);

/// Prints on standard output what was changed, or would be.
void writeChanges(const Session& session, const broker::Instance& instance,
                  const std::vector<broker::Property>& changes, const ChangeOptions& options);

}  // namespace zorva::cli
