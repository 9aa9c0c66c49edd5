#include "cli/commands/Commands.h"

#include <algorithm>
#include <initializer_list>
#include <iterator>

namespace zorva::cli {

namespace {

// A function that registers subcommands, with their names and short names.
struct Family {
  void (*add)(CommandLine&);
  std::initializer_list<std::string_view> names;
  bool describesOthers = false;

  bool has(std::string_view word) const { return std::find(names.begin(), names.end(), word) != names.end(); }
};

// In the order of help.
const Family kFamilies[] = {
    {addShowCommand, {"show"}},
    {addCheckCommand, {"check"}},
    {addWatchCommand, {"watch"}},
    {addTreeCommand, {"tree"}},
    {addClassesCommand, {"classes"}},
    {addGraphCommand, {"graph"}},
    {addReadCommands, {"enumerate", "ei", "names", "ein", "get", "gi"}},
    {addAssociationCommands,
     {"associators", "ai", "associator-names", "ain", "references", "ri", "reference-names", "rin"}},
    {addModifyCommand, {"modify", "mi"}},
    {addInvokeCommand, {"invoke", "cm"}},
    {addIfcfgCommands, {"ifcfg"}},
    {addDnsCommands, {"dns"}},
    {addDomainCommand, {"domain"}},
    {addSuffixesCommands, {"suffixes"}},
    {addOverlayCommands, {"overlay"}},
    {addApplyCommands, {"apply", "confirm", "revert", "guard-trial"}},
    {addUserCommands, {"user"}},
    {addRegisterCommands, {"register"}},
    {addCompletionCommands, {"completion", "complete"}, true},
    {addManualCommands, {"help", "manual"}, true},
};

}  // namespace

void addCommands(CommandLine& line) {
  for (const Family& family : kFamilies) family.add(line);
}

bool addNamedCommands(CommandLine& line, const std::vector<std::string_view>& words) {
  const auto isNamed = [&](const Family& family) {
    return std::any_of(words.begin(), words.end(), [&](std::string_view word) { return family.has(word); });
  };
  const auto* const end = std::end(kFamilies);
  const auto* const named = std::find_if(std::begin(kFamilies), end, isNamed);
  if (named == end || named->describesOthers || std::find_if(named + 1, end, isNamed) != end) return false;
  named->add(line);
  return true;
}

}  // namespace zorva::cli
