#pragma once

// The classes, with their providers and the numbers of their instances.

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "cli/output/Progress.h"
#include "cli/session/Problems.h"
#include "cli/session/Session.h"

namespace zorva::cli {

struct ClassRow {
  std::string name;
  std::string provider;  ///< the prefix of its create functions; empty: not known, for example with a server
  std::string library;
  std::optional<std::uint64_t> count;  ///< absent: the provider cannot be queried, or that would take too long
  std::string problem;                 ///< why it cannot be queried
};

/// The classes of the registry, with their instances counted. Counting an association may take the square of the time
/// of its ends; if those are very many, that is done only if `countsAll`.
std::vector<ClassRow> readClassRows(Session& session, Progress& progress, bool countsAll);

/// Whether some class was not counted because that would take too long.
bool isUncounted(const std::vector<ClassRow>& rows);

/// The classes that could not be queried, grouped by reason.
std::vector<Problem> problemsOf(const std::vector<ClassRow>& rows);

}  // namespace zorva::cli
