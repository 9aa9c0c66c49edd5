#include "cli/commands/CheckText.h"

#include <algorithm>
#include <vector>

#include "cli/output/Text.h"

namespace zorva::cli {

namespace {

constexpr std::size_t kNamedAskers = 5;

std::string askersText(const std::vector<std::string>& askers) {
  std::vector<std::string> named;
  for (std::size_t i = 0; i < std::min(askers.size(), kNamedAskers); ++i) named.push_back(printable(askers[i]));
  const std::size_t left = askers.size() - named.size();
  return joined(named, ", ") + (left > 0 ? " and " + std::to_string(left) + " more" : "");
}

}  // namespace

std::string checkProblemText(const dns::CheckProblem& problem) {
  using Kind = dns::CheckProblem::Kind;
  const std::string subject = printable(problem.subject);
  const std::string askers = askersText(problem.askers);
  switch (problem.kind) {
    case Kind::Twice:
      return askers + " has " + subject + " twice; it is never asked a second time in its turn";
    case Kind::NeverAsked:
      return subject + " is never asked: /etc/resolv.conf has it after the first three servers";
    case Kind::NoGoodAnswer:
      return subject + " (" + askers + "): " + printable(problem.text);
    case Kind::DoesNotResolve:
      break;
  }
  return "the suffix " + subject + " (" + askers + ") does not resolve";
}

}  // namespace zorva::cli
