#include "cli/session/Problems.h"

#include <algorithm>
#include <cstddef>

#include "cli/output/Text.h"

namespace zorva::cli {

void addProblem(std::vector<Problem>& problems, const std::string& name, const std::string& what) {
  auto same =
      std::find_if(problems.begin(), problems.end(), [&what](const Problem& each) { return each.what == what; });
  if (same == problems.end()) same = problems.insert(same, {{}, what});
  if (std::find(same->names.begin(), same->names.end(), name) == same->names.end()) same->names.push_back(name);
}

std::string problemText(const Problem& problem) {
  constexpr std::size_t kShownNames = 20;
  const std::size_t shown = std::min(problem.names.size(), kShownNames);
  std::string text = joined({problem.names.begin(), problem.names.begin() + static_cast<std::ptrdiff_t>(shown)}, ", ");
  if (shown < problem.names.size()) text += " and " + std::to_string(problem.names.size() - shown) + " more";
  return text + ": " + problem.what;
}

}  // namespace zorva::cli
