#include "cli/commands/Graph.h"

#include <algorithm>
#include <deque>
#include <set>
#include <unordered_map>
#include <unordered_set>

#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"
#include "cli/session/HostView.h"
#include "cli/session/Problems.h"
#include "util/Names.h"

namespace zorva::cli {

namespace {

/// A text that is equal for two paths of one object: host, namespace and the order of the keys do not count.
std::string identity(const broker::ObjectPath& path) {
  broker::ObjectPath plain = path;
  plain.host.clear();
  plain.nameSpace.clear();
  std::sort(plain.keys.begin(), plain.keys.end(),
            [](const broker::NamedValue& a, const broker::NamedValue& b) { return util::NameLess()(a.name, b.name); });
  return shortPathText(plain);
}

// A host with up to this many objects is searched completely.
constexpr std::size_t kManyObjects = 1000;
// On a larger one, the number of queried objects times the number of all objects is at most this; at least two are
// queried.
constexpr std::size_t kMostWork = 100'000;

class Walk {
 public:
  Walk(Session& session, Progress& progress, const std::vector<broker::ObjectPath>& roots, bool followsAll)
      : session_(session), progress_(progress), followsAll_(followsAll), atLeast_(roots.size()) {
    for (const broker::ObjectPath& root : roots) visit(root);
  }

  Graph take() {
    graph_.isWhole = problems_.empty() && graph_.notFollowed == 0;
    for (const Problem& problem : problems_) tellWarning("associations of " + problemText(problem));
    return std::move(graph_);
  }

 private:
  void visit(const broker::ObjectPath& root) {
    if (graph_.notFollowed != 0) {  // it was not searched completely
      graph_.notFollowed += places_.contains(identity(root)) ? 0 : 1;
      return;
    }
    placeOf(root);
    while (!open_.empty()) {
      if (!mayFollow()) {
        graph_.notFollowed = open_.size();
        return;
      }
      const std::size_t object = open_.front();
      open_.pop_front();
      follow(object);
    }
  }

  bool isLarge() const { return std::max(graph_.objects.size(), atLeast_) > kManyObjects; }

  bool mayFollow() const {
    const std::size_t all = std::max(graph_.objects.size(), atLeast_);
    return followsAll_ || !isLarge() || followed_ < 2 || followed_ * all < kMostWork;
  }

  std::size_t placeOf(const broker::ObjectPath& path) {
    const auto [known, isNew] = places_.try_emplace(identity(path), graph_.objects.size());
    if (isNew) {
      graph_.objects.push_back({path, problemOf(path, known->first)});
      if (graph_.objects.back().problem.empty()) open_.push_back(known->second);
    }
    return known->second;
  }

  std::string problemOf(const broker::ObjectPath& path, const std::string& name) {
    if (path.keys.empty()) return "its provider gives this end without keys, by design";
    if (isLarge() && isListed(path.className, name)) return {};
    broker::Selection keysOnly;
    keysOnly.propertyList.emplace();
    const auto instance = session_.cim().getInstance(path, keysOnly);
    return instance ? std::string() : operationFailure("GetInstance", instance.error()).what();
  }

  bool isListed(const std::string& className, const std::string& name) {
    const auto [names, isNew] = listed_.try_emplace(className);
    if (isNew) {
      session_.cim().enumerateInstanceNames({}, className, [&names = names->second](const broker::ObjectPath& each) {
        names.insert(identity(each));
        return true;
      });
    }
    return names->second.contains(name);
  }

  void follow(std::size_t object) {
    const broker::ObjectPath path = graph_.objects[object].path;
    progress_.step("following the associations of " + objectLabel(path));
    ++followed_;
    std::vector<broker::Instance> found;
    const broker::Status status = session_.cim().references(path, {}, {}, [&found](const broker::Instance& each) {
      found.push_back(each);
      return true;
    });
    // Results may have arrived before a failure; the warning says that some are missing.
    if (!status.ok()) addProblem(problems_, objectLabel(path), statusText(status));
    atLeast_ = std::max(atLeast_, found.size());
    for (const broker::Instance& association : found) add(association);
  }

  void add(const broker::Instance& association) {
    // A server's association says which profile an object conforms to. That is not part of the configuration.
    if (util::sameName(association.path.className, "CIM_ElementConformsToProfile")) return;
    std::vector<GraphEnd> ends;
    for (const broker::Property& property : association.properties) {
      const auto* path = std::get_if<broker::Boxed<broker::ObjectPath>>(&property.value.scalar);
      if (path != nullptr) ends.push_back({property.name, placeOf(**path)});
    }
    if (ends.size() != 2) return;
    const std::string key = association.path.className + " " + std::to_string(ends[0].object) + " " +
                            std::to_string(ends[1].object) + " " + ends[0].role;
    if (known_.insert(key).second) {
      graph_.associations.push_back({association.path.className, std::move(ends[0]), std::move(ends[1])});
    }
  }

  Session& session_;
  Progress& progress_;
  const bool followsAll_;
  std::size_t atLeast_;  // the number of known objects
  std::size_t followed_ = 0;
  Graph graph_;
  std::vector<Problem> problems_;
  std::unordered_map<std::string, std::size_t> places_;
  std::unordered_map<std::string, std::unordered_set<std::string>> listed_;  // by class
  std::set<std::string> known_;
  std::deque<std::size_t> open_;
};

/// The lines of a tree: an object, below it its associations, each with its far end. An object is below the one from
/// which the fewest steps lead to it.
class TreeWriter {
 public:
  TreeWriter(const Graph& graph, const Layout& layout)
      : graph_(graph),
        layout_(layout),
        links_(graph.objects.size()),
        wayTo_(graph.objects.size(), kNone),
        written_(graph.objects.size()),
        told_(graph.associations.size()) {
    for (std::size_t i = 0; i < graph.associations.size(); ++i) {
      const GraphAssociation& each = graph.associations[i];
      links_[each.from.object].push_back(i);
      if (each.to.object != each.from.object) links_[each.to.object].push_back(i);
    }
  }

  std::string text() {
    const std::vector<std::size_t> roots = findWays();
    for (const std::size_t root : roots) writeTree(root);
    return std::move(out_);
  }

 private:
  struct Step {
    std::size_t object;
    std::size_t nextLink;
  };
  static constexpr std::size_t kNone = static_cast<std::size_t>(-1);
  static constexpr std::size_t kDeepestIndent = 30;

  bool isThere(std::size_t object) const { return graph_.objects[object].problem.empty(); }

  const GraphEnd& farEnd(std::size_t link, std::size_t object) const {
    const GraphAssociation& association = graph_.associations[link];
    return association.from.object == object ? association.to : association.from;
  }

  /// For each object the link that leads to it first; returns the objects without such a link.
  std::vector<std::size_t> findWays() {
    std::vector<std::size_t> roots;
    std::vector<bool> reached(graph_.objects.size());
    for (std::size_t root = 0; root < graph_.objects.size(); ++root) {
      if (reached[root] || !isThere(root)) continue;
      reached[root] = true;
      roots.push_back(root);
      std::deque<std::size_t> open{root};
      for (; !open.empty(); open.pop_front()) {
        for (const std::size_t link : links_[open.front()]) {
          const std::size_t far = farEnd(link, open.front()).object;
          if (reached[far] || !isThere(far)) continue;
          reached[far] = true;
          wayTo_[far] = link;
          open.push_back(far);
        }
      }
    }
    return roots;
  }

  // Uses its own stack, because the tree may be as deep as the host has objects.
  void writeTree(std::size_t root) {
    written_[root] = true;
    out_ += styled(printable(shortPathText(graph_.objects[root].path)), Style::Heading, layout_) + "\n";
    std::vector<Step> stack{{root, 0}};
    while (!stack.empty()) {
      Step& step = stack.back();
      if (step.nextLink == links_[step.object].size()) {
        stack.pop_back();
        continue;
      }
      const std::size_t link = links_[step.object][step.nextLink++];
      if (told_[link]) continue;
      told_[link] = true;
      const GraphEnd& far = farEnd(link, step.object);
      writeFarEnd(link, far, stack.size());
      if (wayTo_[far.object] == link) stack.push_back({far.object, 0});
    }
  }

  void writeFarEnd(std::size_t link, const GraphEnd& far, std::size_t depth) {
    const std::string label = objectLabel(graph_.objects[far.object].path);
    out_.append(2 * std::min(depth, kDeepestIndent), ' ');
    out_ += graph_.associations[link].className + styled(" -> " + far.role + "  ", Style::Faint, layout_);
    if (!isThere(far.object)) {
      out_ += styled(label + " (cannot be fetched)", Style::Bad, layout_);
    } else if (wayTo_[far.object] == link) {
      out_ += styled(label, Style::Heading, layout_);
    } else {
      out_ += label + (written_[far.object] ? " (above)" : " (below)");
    }
    out_ += "\n";
    written_[far.object] = written_[far.object] || wayTo_[far.object] == link;
  }

  const Graph& graph_;
  Layout layout_;
  std::vector<std::vector<std::size_t>> links_;  // of each object
  std::vector<std::size_t> wayTo_;               // kNone for roots and for objects that cannot be fetched
  std::vector<bool> written_;
  std::vector<bool> told_;
  std::string out_;
};

std::string dotQuoted(std::string_view text) {
  std::string out = "\"";
  for (const char c : printable(text)) {
    if (c == '"' || c == '\\') out += '\\';
    out += c;
  }
  return out + "\"";
}

std::string danglingLine(const GraphAssociation& association, const GraphEnd& end, const GraphObject& object) {
  return association.className + "." + end.role + " = " + printable(shortPathText(object.path)) + ": " + object.problem;
}

}  // namespace

Graph walkGraph(Session& session, Progress& progress, const std::vector<broker::ObjectPath>& roots, bool followsAll) {
  return Walk(session, progress, roots, followsAll).take();
}

std::vector<broker::ObjectPath> allObjects(Session& session, Progress& progress) {
  const Session::Quiet quiet(session);
  std::vector<broker::ObjectPath> systems;
  std::vector<broker::ObjectPath> others;
  std::vector<Problem> problems;
  bool couldAsk = false;
  for (const broker::ProviderEntry& entry : session.cim().served()) {
    const schema::Class& declared = session.classNamed(entry.className);
    if (declared.isAssociation()) continue;
    progress.step("reading the names of " + entry.className);
    std::vector<broker::ObjectPath>& paths = declared.isA("CIM_System") ? systems : others;
    const broker::Status status =
        session.cim().enumerateInstanceNames({}, entry.className, [&](const broker::ObjectPath& path) {
          if (path.className == entry.className) paths.push_back(path);
          return true;
        });
    couldAsk = couldAsk || status.ok();
    if (!status.ok()) addProblem(problems, entry.className, statusText(status));
  }
  if (!couldAsk && !problems.empty()) {
    throw Failure(ExitCode::Failed, "no class could be asked: " + problemText(problems.front()));
  }
  for (const Problem& problem : problems) tellWarning(problemText(problem));
  systems.insert(systems.end(), others.begin(), others.end());
  return systems;
}

std::vector<std::string> danglingReferences(const Graph& graph) {
  std::vector<std::string> lines;
  for (const GraphAssociation& association : graph.associations) {
    for (const GraphEnd* end : {&association.from, &association.to}) {
      const GraphObject& object = graph.objects[end->object];
      if (object.problem.empty()) continue;
      const GraphObject& other = graph.objects[(end == &association.from ? association.to : association.from).object];
      lines.push_back(danglingLine(association, *end, object) + " (beside " + printable(objectLabel(other.path)) + ")");
    }
  }
  return lines;
}

std::string objectLabel(const broker::ObjectPath& path) {
  for (const char* key : {"InstanceID", "Name"}) {
    const broker::Value* value = path.key(key);
    if (value != nullptr) return printable(path.className + " " + scalarText(value->scalar));
  }
  return printable(shortPathText(path));
}

std::string graphText(const Graph& graph, const Layout& layout) {
  std::string out = TreeWriter(graph, layout).text();
  out +=
      "\n" + counted(graph.objects.size(), "object") + ", " + counted(graph.associations.size(), "association") + "\n";
  const std::vector<std::string> dangling = danglingReferences(graph);
  if (dangling.empty()) {
    return out + (graph.isWhole ? "Every reference leads to an object.\n"
                                : "Every reference that could be asked for leads to an object.\n");
  }
  out += "\n" + styled("References whose far end cannot be fetched:", Style::Heading, layout) + "\n";
  for (const std::string& line : dangling) out += "  " + line + "\n";
  return out;
}

std::string graphDot(const Graph& graph) {
  std::string out =
      "digraph dns {\n  rankdir=LR;\n  node [shape=box, fontname=\"sans-serif\"];\n"
      "  edge [fontname=\"sans-serif\", fontsize=10];\n";
  for (std::size_t i = 0; i < graph.objects.size(); ++i) {
    const GraphObject& object = graph.objects[i];
    out += "  o" + std::to_string(i) + " [label=" + dotQuoted(objectLabel(object.path)) +
           (object.problem.empty() ? "" : ", style=dashed, tooltip=" + dotQuoted(object.problem)) + "];\n";
  }
  for (const GraphAssociation& each : graph.associations) {
    out += "  o" + std::to_string(each.from.object) + " -> o" + std::to_string(each.to.object) +
           " [label=" + dotQuoted(each.className) + ", taillabel=" + dotQuoted(each.from.role) +
           ", headlabel=" + dotQuoted(each.to.role) + "];\n";
  }
  return out + "}\n";
}

}  // namespace zorva::cli
