#pragma once

// Queries that failed, grouped by reason.

#include <string>
#include <vector>

namespace zorva::cli {

/// Why some classes, or the associations of some objects, could not be queried.
struct Problem {
  std::vector<std::string> names;
  std::string what;
};

/// Adds a name to the names with that reason.
void addProblem(std::vector<Problem>& problems, const std::string& name, const std::string& what);

/// "ZORVA_A, ZORVA_B: CIM_ERR_FAILED (1): no library"; of many names the first ones and how many more.
std::string problemText(const Problem& problem);

}  // namespace zorva::cli
