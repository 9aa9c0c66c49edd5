#include "CaseRun.h"

#include <algorithm>
#include <cstddef>
#include <filesystem>
#include <map>
#include <optional>
#include <stdexcept>
#include <utility>
#include <vector>

#include "Furnishing.h"
#include "LineScanner.h"
#include "Request.h"

namespace ZV::Test {

namespace {

// Ends of a request that throws.
const std::string kOutOfRange = "std::out_of_range";
const std::string kException = "an exception: ";
const std::string kInt = "an int that was thrown";

// The result of a request, in the notation of a case.
struct Observed {
  std::vector<std::string> happens;
  std::vector<std::string> gives;
  std::vector<std::string> changes;
  std::string ends;
  Calls calls;  // all of them, reads included
  std::vector<zorva::agent::TreeCall> treeCalls;
};

// --- lines of the log

std::string withoutDataDir(std::string text, const std::string& dataDir) {
  for (std::size_t at = text.find(dataDir); at != std::string::npos; at = text.find(dataDir, at)) {
    text.replace(at, dataDir.size(), "DATADIR/");
  }
  return text;
}

std::string formOf(const LogLine& line, const std::string& dataDir) {
  switch (line.kind()) {
    case LineKind::Banner:
      return "banner";
    case LineKind::Entering:
      return "ENTERING " + line.subject();
    case LineKind::Exiting:
      return "EXITING " + line.subject();
    case LineKind::Method:
      return "METHOD " + line.subject();
    case LineKind::Message:
      return "MESSAGE " + inQuotes(line.subject());
    case LineKind::Variable:
      return "VARIABLE " + line.subject() + " = " + inQuotes(withoutDataDir(line.value(), dataDir));
    case LineKind::Other:
      return "OTHER " + inQuotes(line.text);
  }
  return {};
}

// log LEVEL CATEGORY FUNCTION: FORM [PARAMETERS]
std::string stepOf(const LogLine& line, const std::string& dataDir) {
  std::string step =
      "log " + std::to_string(line.level) + " " + line.category + " " + line.function + ": " + formOf(line, dataDir);
  const std::string parameters = line.parameters();
  if (!parameters.empty()) step += "," + parameters;
  // The place in the text is the place that the logger got. The exception are the marks of entry and exit: they are
  // logged from a shared header and name the provider's place in their text.
  const bool isMark = line.function == "markProviderEntry" || line.function == "markProviderExit";
  if (isMark ? line.file != "trace/Trace.h" : line.file != line.fileInText() || line.line != line.lineInText()) {
    step += " (at " + line.file + ":" + std::to_string(line.line) + ", though the text has " + line.fileInText() + ":" +
            std::to_string(line.lineInText()) + ")";
  }
  return step;
}

// --- a request

bool isShown(const RecordedCall& call, const std::vector<std::string>& reads) {
  return !Calls{call}.steps().empty() || std::find(reads.begin(), reads.end(), call.name) != reads.end();
}

std::vector<std::string> storyOf(const Calls& calls, const LogLines& lines, const std::vector<std::string>& reads,
                                 const std::string& dataDir) {
  std::vector<std::string> story;
  auto line = lines.begin();
  for (const RecordedCall& call : calls) {
    for (; line != lines.end() && line->place < call.place; ++line) story.push_back(stepOf(*line, dataDir));
    if (isShown(call, reads)) story.push_back(call.line);
  }
  for (; line != lines.end(); ++line) story.push_back(stepOf(*line, dataDir));
  return story;
}

std::vector<std::string> givenIn(const Results& results, const std::vector<NamedValue>& out) {
  std::vector<std::string> all;
  for (const Path& path : results.paths) all.push_back(describeWhole(path));
  for (const Instance& instance : results.instances) {
    all.push_back("instance " + instance.path.nameSpace + ":" + instance.path.className);
    for (const auto& [name, value] : instance.properties) all.push_back("." + name + " = " + describe(value));
  }
  for (const Value& value : results.data) all.push_back("value " + describe(value));
  for (const auto& [name, value] : out) all.push_back("out " + name + " = " + describe(value));
  return all;
}

// The operation's own mark is the one that its first entering line names.
bool isMarked(const LogLines& lines) {
  const LogLines entering = lines.ofKind(LineKind::Entering);
  if (entering.empty()) return false;
  const LogLines exiting = lines.ofKind(LineKind::Exiting).ofFunction("markProviderExit");
  return std::any_of(exiting.begin(), exiting.end(), [&entering](const LogLine& line) {
    return line.subject() == entering.front().subject() && line.category == entering.front().category;
  });
}

std::string closingOf(const Calls& calls, const LogLines& lines) {
  const bool isDone = calls.count("returnDone") != 0;
  const bool marked = isMarked(lines);
  if (!isDone && !marked) return "left open";
  return std::string(isDone ? "done" : "not done") + ", " + (marked ? "marked" : "not marked");
}

std::string statusText(const CMPIStatus& status) {
  std::string text = nameOf(status.rc);
  if (text == "another rc") text = "rc " + std::to_string(static_cast<int>(status.rc));
  if (status.msg != nullptr) text += " " + inQuotes(RecordingBroker::read(status.msg));
  return text;
}

// --- what changes on the host

std::string optionalText(const std::optional<std::string>& text) {
  return text.has_value() ? inQuotes(*text) : std::string("absent");
}

using State = std::map<std::string, std::string>;

void addNodes(State& state, const World& world, const std::vector<WrittenLine>& lines) {
  const auto isNic = [](const WrittenLine& line) { return line.text.compare(0, 4, "nic ") == 0; };
  const auto count = static_cast<std::size_t>(std::count_if(lines.begin(), lines.end(), isNic));
  for (std::size_t n = 0; n < count; ++n) {
    const std::string node = "node " + std::to_string(n + 1) + " ";
    state[node + "name"] = optionalText(world.text(n, NodeLexicon::PROP_NAME));
    state[node + "host"] = optionalText(world.text(n, NodeLexicon::PROP_HOST_NAME));
    state[node + "domain"] = optionalText(world.text(n, NodeLexicon::PROP_DOMAIN_NAME));
    for (const auto& [name, property] : {std::pair{"suffixes", NodeLexicon::PROP_DNS_SUFFIXES},
                                         std::pair{"servers", NodeLexicon::PROP_DNS_SERVER_ADDRESSES}}) {
      const auto list = world.list(n, property);
      state[node + name] = list.has_value() ? describe(texts(*list)).substr(std::string("string[] ").size()) : "absent";
    }
  }
}

State stateOf(const World& world, const std::vector<WrittenLine>& lines) {
  State state;
  const std::string prefix = "ifcfg-";
  for (const auto& entry : std::filesystem::directory_iterator(world.dataDir())) {
    const std::string fileName = entry.path().filename().string();
    if (fileName.compare(0, prefix.size(), prefix) != 0) continue;
    const std::string name = fileName.substr(prefix.size());
    state["file " + (name.empty() ? "\"\"" : name)] = optionalText(world.fileContent(name));
  }
  const auto isUnreadable = [](const WrittenLine& line) { return line.text == "unreadable"; };
  if (std::none_of(lines.begin(), lines.end(), isUnreadable)) addNodes(state, world, lines);
  return state;
}

std::vector<std::string> changesBetween(const State& before, const State& after) {
  std::vector<std::string> changes;
  for (const auto& [what, value] : after) {
    const auto was = before.find(what);
    if (was == before.end() || was->second != value) changes.push_back(what + " = " + value);
  }
  for (const auto& [what, value] : before) {
    if (!after.contains(what)) changes.push_back(what + " is gone");
  }
  return changes;
}

// --- one run

// All parts of a case that set it up, with their phrases replaced.
struct Setting {
  std::vector<WrittenLine> world;
  std::vector<WrittenLine> broker;
  Request request;
  std::vector<std::string> shows;
  const Provider* provider = nullptr;
  CMPIValueState lie = CMPI_goodValue;
};

std::vector<std::string> namesIn(const std::vector<SourceLine>& lines) {
  std::vector<std::string> names;
  for (const SourceLine& line : lines) {
    LineScanner scanner({line.text, line, {}});
    do {
      names.push_back(scanner.word("a call's name"));
    } while (scanner.take(","));
    scanner.expectEnd();
  }
  return names;
}

Setting settingOf(const CaseFile& file, const Case& one) {
  Setting setting;
  setting.world = file.phrases.writeOut(one.world);
  setting.broker = file.phrases.writeOut(one.broker);
  setting.request = readRequest(file.phrases.writeOut(one.request), file.association);
  setting.shows = namesIn(one.shows.empty() ? file.shows : one.shows);
  setting.provider = findProvider(file.provider);
  if (setting.provider == nullptr) throw CaseError(one.title, "no provider is called '" + file.provider + "'");
  if (!canAsk(*setting.provider, setting.request.operation)) {
    throw CaseError(one.request.front(), "the provider has no table for this operation");
  }
  return setting;
}

// The failure of a case that must happen at the call with a number, counted over all calls of the broker or of the
// tree.
struct DueFailure {
  const Failure* failure = nullptr;  // null if no call fails
  std::size_t place = 0;

  bool isOfTree() const { return failure != nullptr && failure->isOfTree(); }
};

void arm(RecordingBroker& broker, const std::vector<Failure>& failures, const DueFailure& due) {
  for (const Failure& failure : failures) {
    if (!failure.isOfTree() && failure.n == 0) broker.failEach(failure.call, failure.mode);
  }
  if (due.failure != nullptr && !due.isOfTree()) broker.failAt(due.place, due.failure->mode);
}

// Runs the request and returns how it ended, without what is missing at the end.
std::string endOf(const Setting& setting, RecordingBroker& broker, const RequestObjects& objects) {
  Request request = setting.request;
  try {
    return statusText(ask(*setting.provider, broker, request, objects));
  } catch (const std::out_of_range&) {
    return kOutOfRange;
  } catch (const std::exception& exception) {
    return kException + std::string(exception.what());
  } catch (int) {
    return kInt;
  }
}

bool isThrown(const std::string& end) {
  return end == kOutOfRange || end == kInt || end.compare(0, kException.size(), kException) == 0;
}

Observed observe(const Setting& setting, const DueFailure& due) {
  RecordingLogger logger;
  World world;
  furnish(world, setting.world);
  RecordingBroker broker;
  const std::vector<Failure> failures = furnish(broker, setting.broker);
  if (setting.lie != CMPI_goodValue) broker.addToAllStates(setting.lie);
  const RequestObjects objects(broker, setting.request);
  const State before = stateOf(world, setting.world);
  logger.clear();
  broker.beginRequest();
  arm(broker, failures, due);

  Observed observed;
  {
    const FailingTree tree(due.isOfTree() ? due.place : 0, due.isOfTree() ? due.failure->thrown : Thrown::Int);
    observed.ends = endOf(setting, broker, objects);
    observed.treeCalls = tree.calls();
  }
  broker.failNever();
  observed.calls = broker.calls();
  const LogLines lines = logger.pairs();
  if (!isThrown(observed.ends)) observed.ends += ", " + closingOf(observed.calls, lines);
  observed.happens = storyOf(observed.calls, lines, setting.shows, world.dataDir());
  observed.gives = givenIn(RecordingBroker::read(objects.result), RecordingBroker::read(objects.out));
  observed.changes = changesBetween(before, stateOf(world, setting.world));
  return observed;
}

// The number among all calls of the n-th call of a kind.
template <typename Calls, typename IsOfKind>
std::size_t placeOfCall(const Calls& calls, const Failure& failure, const IsOfKind& isOfKind) {
  std::size_t found = 0;
  for (std::size_t i = 0; i < calls.size(); ++i) {
    if (isOfKind(calls[i]) && ++found == failure.n) return i + 1;
  }
  throw errorAt(failure.line, "the request makes only " + std::to_string(found) + " such calls");
}

std::size_t placeOf(const Failure& failure, const Observed& observed) {
  if (failure.isOfTree()) {
    return placeOfCall(observed.treeCalls, failure,
                       [&failure](zorva::agent::TreeCall call) { return call == failure.treeCall; });
  }
  return placeOfCall(observed.calls, failure,
                     [&failure](const RecordedCall& call) { return call.name == failure.call; });
}

// To find the call number of the n-th call of a kind, the request first runs without the failure.
Observed observe(const Setting& setting) {
  RecordingBroker unused;
  const std::vector<Failure> failures = furnish(unused, setting.broker);
  DueFailure due;
  for (const Failure& failure : failures) {
    if (failure.n == 0) continue;
    if (due.failure != nullptr) throw errorAt(failure.line, "only one call can fail by its number");
    due = {&failure, placeOf(failure, observe(setting, {}))};
  }
  Observed observed = observe(setting, due);
  for (const Failure& failure : failures) {
    if (failure.n == 0 && observed.calls.count(failure.call) == 0) {
      throw errorAt(failure.line, "the request makes no such call");
    }
  }
  return observed;
}

// --- comparison

constexpr std::size_t kContext = 3;

std::string stepAt(const std::vector<std::string>& steps, std::size_t at) {
  return at < steps.size() ? steps[at] : std::string("nothing more");
}

// The first difference with the steps before and after it.
std::string difference(const std::vector<WrittenLine>& expected, const std::vector<std::string>& actual,
                       const std::string& part, const SourceLine& title) {
  std::size_t at = 0;
  while (at < expected.size() && at < actual.size() && expected[at].text == actual[at]) ++at;
  if (at == expected.size() && at == actual.size()) return {};
  std::string report = at < expected.size() ? placeOf(expected[at])
                       : expected.empty()   ? placeOf(title)
                                            : placeOf(expected.back()) + ", after this line";
  report += ": " + part + "\n";
  for (std::size_t i = at - std::min(at, kContext); i < at; ++i) report += "             " + actual[i] + "\n";
  report += "  expected:  " + (at < expected.size() ? expected[at].text : std::string("nothing more")) + "\n";
  report += "  actual:    " + stepAt(actual, at) + "\n";
  for (std::size_t i = at + 1; i < std::min(actual.size(), at + 1 + kContext); ++i) {
    report += "             " + actual[i] + "\n";
  }
  return report;
}

std::string linesOf(const std::vector<std::string>& lines) {
  std::string all;
  for (const std::string& line : lines) all += "  " + line + "\n";
  return all;
}

// The steps of a case; the word nothing means none.
std::vector<WrittenLine> stepsOf(const CaseFile& file, const Case& one) {
  if (one.happens.size() == 1 && one.happens.front().text == "nothing") return {};
  std::vector<WrittenLine> steps = file.phrases.writeOut(one.happens);
  for (const WrittenLine& line : steps) {
    if (!isPlainStep(line.text)) throw errorAt(line, "neither a phrase nor a call nor a line of the log: " + line.text);
  }
  return steps;
}

}  // namespace

std::string differenceOf(const CaseFile& file, const Case& one, CMPIValueState lie) {
  Setting setting = settingOf(file, one);
  setting.lie = lie;
  const std::vector<WrittenLine> happens = stepsOf(file, one);
  const Observed observed = observe(setting);
  std::string report = difference(happens, observed.happens, "what happens", one.title);
  report += difference({{one.ends.front().text, one.ends.front(), {}}}, {observed.ends}, "how it ends", one.title);
  report += difference(file.phrases.writeOut(one.changes), observed.changes, "what changes", one.title);
  if (!one.gives.empty()) {
    report += difference(file.phrases.writeOut(one.gives), observed.gives, "what the client gets", one.title);
  }
  return report;
}

std::string recordOf(const CaseFile& file, const Case& one) {
  const Observed observed = observe(settingOf(file, one));
  std::string record = "happens:\n" + linesOf(observed.happens);
  if (!observed.gives.empty()) record += "gives:\n" + linesOf(observed.gives);
  if (!observed.changes.empty()) record += "changes:\n" + linesOf(observed.changes);
  return record + "ends: " + observed.ends + "\n";
}

}  // namespace ZV::Test
