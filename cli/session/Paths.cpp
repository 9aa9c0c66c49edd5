#include "cli/session/Paths.h"

#include <algorithm>

#include "broker/objects/PathText.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "util/Names.h"

namespace zorva::cli {

namespace {

constexpr std::size_t kShownBefore = 60;
constexpr std::size_t kShownBehind = 20;
constexpr std::size_t kListedCandidates = 20;

bool continuesCharacter(char c) noexcept { return (static_cast<unsigned char>(c) & 0xC0U) == 0x80; }

/// The text around a place, and a line with a mark below that place.
std::string markedPlace(std::string_view text, std::size_t position) {
  position = std::min(position, text.size());
  std::size_t from = position > kShownBefore ? position - kShownBefore : 0;
  std::size_t to = std::min(text.size(), position + kShownBehind);
  while (from > 0 && continuesCharacter(text[from])) --from;
  while (to < text.size() && continuesCharacter(text[to])) ++to;
  const std::string before = (from > 0 ? "..." : "") + printable(text.substr(from, position - from));
  const std::string after = printable(text.substr(position, to - position)) + (to < text.size() ? "..." : "");
  return "  " + before + after + "\n  " + std::string(displayWidth(before), ' ') + "^";
}

bool valuesMatch(const broker::Value& given, const broker::Value& found);

bool isReference(const broker::Value& value) noexcept {
  return std::holds_alternative<broker::Boxed<broker::ObjectPath>>(value.scalar);
}

bool valuesMatch(const broker::Value& given, const broker::Value& found) {
  if (!isReference(given) || !isReference(found)) return given == found;
  const broker::ObjectPath& wanted = *std::get<broker::Boxed<broker::ObjectPath>>(given.scalar);
  const broker::ObjectPath& there = *std::get<broker::Boxed<broker::ObjectPath>>(found.scalar);
  return util::sameName(wanted.className, there.className) && keysMatch(wanted, there);
}

std::string listed(const std::vector<broker::ObjectPath>& paths) {
  std::string text;
  for (std::size_t i = 0; i < std::min(paths.size(), kListedCandidates); ++i) {
    text += "\n  " + printable(broker::pathText(paths[i]));
  }
  if (paths.size() > kListedCandidates) text += "\n  and " + std::to_string(paths.size() - kListedCandidates) + " more";
  return text;
}

/// Without the parts that all paths of this host have in common, as a person would type it.
broker::ObjectPath shortened(broker::ObjectPath path) {
  path.host.clear();
  path.nameSpace.clear();
  return path;
}

/// Another host has its own CIM server; here its objects would be mistaken for those of this host.
void requireThisHost(const Session& session, const broker::ObjectPath& path, std::string_view text) {
  if (path.host.empty() || session.isThisHost(path.host)) return;
  const std::size_t place = text.find("//") + 2;
  throw Failure(ExitCode::WrongUsage,
                "the path names the host " + printable(path.host) + " at byte " + std::to_string(place + 1) +
                    ", and this is " + printable(session.tree()->systemName()) + "\n" + markedPlace(text, place),
                "leave the host out, or give --url with the CIM server of that host");
}

/// A key may contain a path as plain text, so only its class tells a path from a typing error.
void requireClassesOfReferences(Session& session, const broker::ObjectPath& given) {
  for (const broker::NamedValue& key : given.keys) {
    if (!isReference(key.value)) continue;
    const broker::ObjectPath& far = *std::get<broker::Boxed<broker::ObjectPath>>(key.value.scalar);
    if (session.classes()->find(far.className) == nullptr && !session.isRemote()) {
      throw Failure(ExitCode::WrongUsage,
                    given.className + "." + key.name + "=" + printable(broker::quotedText(broker::pathText(far))) +
                        ": there is no class " + printable(far.className),
                    "a reference is the path of an instance, in quotes with a backslash before each quote in it: " +
                        key.name + R"(="ZORVA_DNSProtocolEndPoint.Name=\"eth0\"")");
    }
    requireClassesOfReferences(session, far);
  }
}

bool isServed(Session& session, const broker::ObjectPath& path) {
  const std::vector<broker::ProviderEntry>& served = session.cim().served();
  return std::any_of(served.begin(), served.end(), [&path](const broker::ProviderEntry& entry) {
    return util::sameName(entry.className, path.className);
  });
}

/// Whether the path, and every reference in it, has all the keys of its class.
bool isComplete(Session& session, const broker::ObjectPath& path, const schema::Class& declared) {
  if (path.keys.size() != declared.keys().size()) return false;
  return std::all_of(path.keys.begin(), path.keys.end(), [&session](const broker::NamedValue& key) {
    if (!isReference(key.value)) return true;
    const broker::ObjectPath& far = *std::get<broker::Boxed<broker::ObjectPath>>(key.value.scalar);
    const schema::Class* farClass = session.classes()->find(far.className);
    return farClass == nullptr || isComplete(session, far, *farClass);
  });
}

/// What to do about the first key that the class lacks; empty if none is near.
std::string nearestKey(const broker::ObjectPath& typed, const schema::Class& declared) {
  std::vector<std::string> known;
  for (const schema::ClassProperty* key : declared.keys()) known.push_back(key->name);
  const auto isKnown = [&known](const std::string& name) {
    return std::any_of(known.begin(), known.end(), [&](const std::string& each) { return util::sameName(each, name); });
  };
  for (const broker::NamedValue& key : typed.keys) {
    if (!isKnown(key.name)) return nearestOr(key.name, known, {});
  }
  return {};
}

std::vector<broker::ObjectPath> matchingInstances(Session& session, const broker::ObjectPath& given,
                                                  std::vector<broker::ObjectPath>& all) {
  std::vector<broker::ObjectPath> matching;
  const broker::Status status =
      session.cim().enumerateInstanceNames(given.nameSpace, given.className, [&](const broker::ObjectPath& path) {
        if (keysMatch(given, path)) matching.push_back(path);
        all.push_back(shortened(path));
        return true;
      });
  requireDone("looking for the instances of " + given.className, status);
  return matching;
}

}  // namespace

broker::ObjectPath readPath(std::string_view text) {
  auto path = broker::parsePathText(text);
  if (path) return std::move(*path);
  const broker::PathTextError& error = path.error();
  throw Failure(ExitCode::WrongUsage,
                "the path is wrong at byte " + std::to_string(error.position + 1) + ": " + printable(error.message) +
                    "\n" + markedPlace(text, error.position),
                R"(a path looks like ZORVA_DNSProtocolEndPoint.Name="eth0"; quote it for the shell: '...')");
}

broker::ObjectPath readClassName(std::string_view text) {
  broker::ObjectPath path = readPath(text);
  if (path.keys.empty()) return path;
  throw Failure(ExitCode::WrongUsage, "a class is wanted here, and this names an instance: " + printable(text),
                "zorvactl get shows an instance");
}

broker::ObjectPath resolveClass(Session& session, std::string_view text) {
  broker::ObjectPath path = readClassName(text);
  requireThisHost(session, path, text);
  path.className = session.classNamed(path.className).name();
  return path;
}

bool keysMatch(const broker::ObjectPath& given, const broker::ObjectPath& found) {
  return std::all_of(given.keys.begin(), given.keys.end(), [&found](const broker::NamedValue& key) {
    const broker::Value* value = found.key(key.name);
    return value != nullptr && valuesMatch(key.value, *value);
  });
}

broker::ObjectPath resolvePath(Session& session, std::string_view text) {
  const broker::ObjectPath typed = readPath(text);
  requireThisHost(session, typed, text);
  const schema::Class& declared = session.classNamed(typed.className);
  const auto canonical = session.cim().canonicalPath(typed);
  if (!canonical) {
    throw Failure(ExitCode::WrongUsage, printable(text) + ": " + printable(canonical.error().message),
                  nearestKey(typed, declared));
  }
  const broker::ObjectPath& given = *canonical;
  requireClassesOfReferences(session, given);
  if (isServed(session, given) && isComplete(session, given, declared)) return given;

  std::vector<broker::ObjectPath> all;
  const std::vector<broker::ObjectPath> matching = matchingInstances(session, given, all);
  if (matching.size() == 1) return matching.front();
  if (matching.empty()) {
    throw Failure(
        ExitCode::Failed, "there is no instance " + printable(broker::pathText(shortened(given))),
        all.empty() ? "the class " + given.className + " has no instances on this host" : "there are:" + listed(all));
  }
  std::vector<broker::ObjectPath> candidates;
  candidates.reserve(matching.size());
  for (const broker::ObjectPath& path : matching) candidates.push_back(shortened(path));
  throw Failure(ExitCode::WrongUsage,
                counted(matching.size(), "instance") + " fit " + printable(broker::pathText(shortened(given))),
                "give more of the keys of one of them:" + listed(candidates));
}

}  // namespace zorva::cli
