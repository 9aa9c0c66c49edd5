#include "cli/session/ClassRows.h"

#include <algorithm>

#include "cli/output/Failure.h"

namespace zorva::cli {

namespace {

// Above this number of instances of one class the associations are only counted on request.
constexpr std::uint64_t kManyInstances = 500;

ClassRow emptyRow(const Session& session, const broker::ProviderEntry& entry) {
  ClassRow row{entry.className, {}, {}, std::nullopt, {}};
  if (!session.isRemote()) {
    row.provider = entry.prefix;
    row.library = entry.library;
  }
  return row;
}

void count(Session& session, ClassRow& row) {
  std::uint64_t count = 0;
  // Instances of subclasses are counted for their own class.
  const broker::Status status = session.cim().enumerateInstanceNames({}, row.name, [&](const broker::ObjectPath& path) {
    count += path.className == row.name ? 1 : 0;
    return true;
  });
  if (status.ok()) {
    row.count = count;
  } else {
    row.problem = statusText(status);
  }
}

}  // namespace

std::vector<ClassRow> readClassRows(Session& session, Progress& progress, bool countsAll) {
  const Session::Quiet quiet(session);
  std::vector<ClassRow> rows;
  for (const broker::ProviderEntry& entry : session.cim().served()) rows.push_back(emptyRow(session, entry));
  std::uint64_t most = 0;
  for (const bool associations : {false, true}) {
    if (associations && most > kManyInstances && !countsAll) break;
    for (ClassRow& row : rows) {
      if (session.classNamed(row.name).isAssociation() != associations) continue;
      progress.step("counting " + row.name);
      count(session, row);
      most = std::max(most, row.count.value_or(0));
    }
  }
  return rows;
}

bool isUncounted(const std::vector<ClassRow>& rows) {
  return std::any_of(rows.begin(), rows.end(), [](const ClassRow& row) { return !row.count && row.problem.empty(); });
}

std::vector<Problem> problemsOf(const std::vector<ClassRow>& rows) {
  std::vector<Problem> problems;
  for (const ClassRow& row : rows) {
    if (!row.problem.empty()) addProblem(problems, row.name, row.problem);
  }
  return problems;
}

}  // namespace zorva::cli
