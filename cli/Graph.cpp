#include "cli/Graph.h"

#include <algorithm>
#include <deque>
#include <set>
#include <unordered_map>

#include "cli/Failure.h"
#include "cli/Text.h"
#include "cli/ValueText.h"
#include "schema/Names.h"

namespace zorva::cli {

namespace {

/// A text that is the same for two paths of one object: host and namespace do not count, nor the order of the keys.
std::string identity(const broker::ObjectPath& path) {
  broker::ObjectPath plain = path;
  plain.host.clear();
  plain.nameSpace.clear();
  std::sort(plain.keys.begin(), plain.keys.end(), [](const broker::NamedValue& a, const broker::NamedValue& b) {
    return schema::NameLess()(a.name, b.name);
  });
  return shortPathText(plain);
}

class Walk {
 public:
  explicit Walk(Session& session) : session_(session) {}

  void visit(const broker::ObjectPath& root) {
    placeOf(root);
    while (!open_.empty()) {
      const std::size_t object = open_.front();
      open_.pop_front();
      follow(object);
    }
  }

  Graph take() { return std::move(graph_); }

 private:
  std::size_t placeOf(const broker::ObjectPath& path) {
    const auto [known, isNew] = places_.try_emplace(identity(path), graph_.objects.size());
    if (isNew) {
      graph_.objects.push_back({path, problemOf(path)});
      if (graph_.objects.back().problem.empty()) open_.push_back(known->second);
    }
    return known->second;
  }

  std::string problemOf(const broker::ObjectPath& path) {
    if (path.keys.empty()) return "the reference has no keys, so it names no object";
    broker::Instance instance;
    broker::Selection keysOnly;
    keysOnly.propertyList.emplace();
    const broker::Status status = session_.broker().getInstance(path, keysOnly, instance);
    return status.ok() ? std::string() : operationFailure("GetInstance", status).what();
  }

  void follow(std::size_t object) {
    const broker::ObjectPath path = graph_.objects[object].path;
    std::vector<broker::Instance> found;
    const broker::Status status = session_.broker().references(path, {}, {}, [&found](const broker::Instance& each) {
      found.push_back(each);
      return true;
    });
    // Results may have come before a failure; what is missing then is told.
    if (!status.ok()) tellWarning(operationFailure("references of " + shortPathText(path), status).what());
    for (const broker::Instance& association : found) add(association);
  }

  void add(const broker::Instance& association) {
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
  Graph graph_;
  std::unordered_map<std::string, std::size_t> places_;
  std::set<std::string> known_;
  std::deque<std::size_t> open_;
};

/// The lines of a tree: an object, under it its associations, each with its far end.
class TreeWriter {
 public:
  TreeWriter(const Graph& graph, const Layout& layout)
      : graph_(graph),
        layout_(layout),
        links_(graph.objects.size()),
        written_(graph.objects.size()),
        told_(graph.associations.size()) {
    for (std::size_t i = 0; i < graph.associations.size(); ++i) {
      links_[graph.associations[i].from.object].push_back(i);
      if (graph.associations[i].to.object != graph.associations[i].from.object) {
        links_[graph.associations[i].to.object].push_back(i);
      }
    }
  }

  std::string text() {
    for (std::size_t object = 0; object < graph_.objects.size(); ++object) {
      if (written_[object] || !graph_.objects[object].problem.empty()) continue;
      writeTree(object);
    }
    return std::move(out_);
  }

 private:
  struct Step {
    std::size_t object;
    std::size_t depth;
    std::size_t nextLink;
  };

  // A stack of its own: the tree may be as deep as the host has objects.
  void writeTree(std::size_t root) {
    writeObject(root, styled(printable(shortPathText(graph_.objects[root].path)), Style::Heading, layout_), 0);
    std::vector<Step> stack{{root, 0, 0}};
    while (!stack.empty()) {
      Step& step = stack.back();
      if (step.nextLink == links_[step.object].size()) {
        stack.pop_back();
        continue;
      }
      const std::size_t link = links_[step.object][step.nextLink++];
      if (told_[link]) continue;
      told_[link] = true;
      const GraphAssociation& association = graph_.associations[link];
      const GraphEnd& far = association.from.object == step.object ? association.to : association.from;
      const std::size_t depth = step.depth + 1;
      if (writeFarEnd(association, far, depth)) stack.push_back({far.object, depth, 0});
    }
  }

  /// True where the far end is written for the first time, so that its own associations follow.
  bool writeFarEnd(const GraphAssociation& association, const GraphEnd& far, std::size_t depth) {
    const GraphObject& object = graph_.objects[far.object];
    std::string line = association.className + " " + styled("-> " + far.role, Style::Faint, layout_) + "  ";
    if (!object.problem.empty()) {
      line += styled(objectLabel(object.path) + " (cannot be fetched)", Style::Bad, layout_);
    } else {
      line += styled(objectLabel(object.path), Style::Heading, layout_) + (written_[far.object] ? " (above)" : "");
    }
    const bool isFirst = object.problem.empty() && !written_[far.object];
    writeObject(far.object, line, depth);
    return isFirst;
  }

  void writeObject(std::size_t object, const std::string& line, std::size_t depth) {
    written_[object] = true;
    out_.append(2 * std::min<std::size_t>(depth, kDeepestIndent), ' ');
    out_ += line + "\n";
  }

  static constexpr std::size_t kDeepestIndent = 30;

  const Graph& graph_;
  Layout layout_;
  std::vector<std::vector<std::size_t>> links_;
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

Graph walkGraph(Session& session, const std::vector<broker::ObjectPath>& roots) {
  Walk walk(session);
  for (const broker::ObjectPath& root : roots) walk.visit(root);
  return walk.take();
}

std::vector<broker::ObjectPath> allObjects(Session& session) {
  const Session::Quiet quiet(session);
  std::vector<broker::ObjectPath> systems;
  std::vector<broker::ObjectPath> others;
  for (const broker::ProviderEntry& entry : session.broker().registry().entries()) {
    const schema::Class& declared = session.classNamed(entry.className);
    if (declared.isAssociation()) continue;
    std::vector<broker::ObjectPath>& paths = declared.isA("CIM_System") ? systems : others;
    const broker::Status status =
        session.broker().enumerateInstanceNames(entry.nameSpace, entry.className, [&](const broker::ObjectPath& path) {
          if (path.className == entry.className) paths.push_back(path);
          return true;
        });
    if (!status.ok()) tellWarning(operationFailure("enumerating the names of " + entry.className, status).what());
  }
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
  if (dangling.empty()) return out + "Every reference leads to an object.\n";
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
