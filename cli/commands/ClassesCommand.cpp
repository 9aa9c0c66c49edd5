// classes.

#include "cli/commands/Commands.h"
#include "cli/commands/ViewJson.h"
#include "cli/output/Console.h"
#include "cli/session/ClassRows.h"
#include "cli/session/Session.h"

namespace zorva::cli {

namespace {

struct CountOptions {
  bool all = false;  ///< whatever time it takes
};

Table classTable(const std::vector<ClassRow>& rows) {
  const bool hasProviders = !rows.empty() && !rows.front().provider.empty();
  std::vector<std::string> headings{"CLASS", "INSTANCES"};
  if (hasProviders) headings.insert(headings.end(), {"PROVIDER", "LIBRARY"});
  Table table(headings, 2);
  for (const ClassRow& row : rows) {
    std::vector<Cell> cells{row.name, row.count ? Cell(std::to_string(*row.count)) : Cell("-", Style::Faint)};
    if (hasProviders) cells.insert(cells.end(), {row.provider, row.library});
    table.add(std::move(cells));
  }
  return table;
}

void tellUncounted(const std::vector<ClassRow>& rows) {
  if (!isUncounted(rows)) return;
  tellNote("the associations of so many objects are not counted; --all counts them, which takes long");
}

std::vector<ClassRow> classesOf(Session& session, bool countsAll) {
  Progress progress;
  return readClassRows(session, progress, countsAll);
}

void listClasses(const Globals& globals, const CountOptions& options) {
  Session session(globals);
  const std::vector<ClassRow> rows = classesOf(session, options.all);
  tellUncounted(rows);
  if (globals.output == OutputFormat::Json) {
    write(classRowsJson(rows) + "\n");
    return;
  }
  writeTable(classTable(rows), session.layout());
  for (const Problem& problem : problemsOf(rows)) tellWarning(problemText(problem));
}

}  // namespace

void addClassesCommand(CommandLine& line) {
  const auto options = std::make_shared<CountOptions>();
  line.add("classes", "The classes with their providers and instance counts")
      .writesJson()
      .gathers()
      .examples("  zorvactl classes")
      .flag("--all", "Count the associations of a host with very many interfaces, too; takes long", options->all)
      .runs<CountOptions>(listClasses, options);
}

}  // namespace zorva::cli
