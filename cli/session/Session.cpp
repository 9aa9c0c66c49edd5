#include "cli/session/Session.h"

#include <cmpidt.h>
#include <unistd.h>

#include <algorithm>
#include <set>
#include <vector>

#include "agent/Agent.h"
#include "cli/operations/LocalOperations.h"
#include "cli/operations/RemoteOperations.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "cli/session/LocalServer.h"
#include "frontend/AddedProviders.h"
#include "schema/Schema.h"
#include "util/LogLevels.h"
#include "util/Names.h"
#include "util/Nearest.h"

namespace zorva::cli {

namespace {

std::string inSmallLetters(std::string_view text) {
  std::string small(text);
  std::transform(small.begin(), small.end(), small.begin(), util::lowerAscii);
  return small;
}

/// The name without the schema's: "DNSSettingData".
std::string_view withoutSchema(std::string_view name) {
  const std::size_t underscore = name.find('_');
  return underscore == std::string_view::npos ? name : name.substr(underscore + 1);
}

/// The shortest class of this project's that has the name in its own; empty if none has, or the name is very short.
std::string classWith(const std::vector<std::string>& names, std::string_view name) {
  const std::string wanted = inSmallLetters(withoutSchema(name));
  std::string found;
  for (const std::string& each : names) {
    const std::string known = inSmallLetters(each);
    const bool fits = wanted.size() >= 3 && known.starts_with("zorva_") && known.find(wanted) != std::string::npos;
    if (fits && (found.empty() || each.size() < found.size())) found = each;
  }
  return found;
}

/// What to do about a class that does not exist.
std::string similarName(const schema::ClassRepository& classes, std::string_view name) {
  std::vector<std::string> names;
  std::vector<std::string> own;
  for (const schema::Class* each : classes.classes()) {
    names.push_back(each->name());
    if (each->name().starts_with("ZORVA_")) own.push_back(each->name());
  }
  // A part of a name, or a name without its schema, is meant as one of this project's.
  const bool hasSchema = name.find('_') != std::string_view::npos;
  std::string near = hasSchema ? util::nearest(name, own) : util::nearest("ZORVA_" + std::string(name), own);
  if (near.empty()) near = classWith(names, name);
  if (near.empty()) near = util::nearest(name, names);
  return near.empty() ? "zorvactl classes lists them" : "did you mean " + near + "?";
}

/// Prints a line of the agent's own. That files of the data directory cannot be read is left out if this user may not
/// read any there: a warning has said so.
void tellOwn(const std::string& line) {
  if (!mayReadSettings() && line.find(zorva::agent::dataDirectory()) != std::string::npos) return;
  tellWarning(printable(line));
}

/// Drops the providers' lines, and prints the agent's own.
class QuietLog : public zorva::agent::LogSink {
 public:
  void record(const zorva::agent::LogCall& /*call*/) override {}
  void recordOwn(int level, const std::string& message) override {
    if (level >= util::kLevelWarning) tellOwn(message);
  }
};

QuietLog quietLog;

/// Keeps the agent's own lines until the result of the call is known.
class HeldBackLog : public zorva::agent::LogSink {
 public:
  explicit HeldBackLog(int level) : level_(level) {}
  void record(const zorva::agent::LogCall& call) override { recordOwn(call.level, call.message); }
  void recordOwn(int level, const std::string& message) override {
    if (level >= level_) lines_.push_back(message);
  }
  void tell() const {
    for (const std::string& line : lines_) tellOwn(line);
  }

 private:
  int level_;
  std::vector<std::string> lines_;
};

template <typename Work>
class Finally {
 public:
  explicit Finally(Work work) : work_(std::move(work)) {}
  ~Finally() { work_(); }
  Finally(const Finally&) = delete;
  Finally& operator=(const Finally&) = delete;

 private:
  Work work_;
};

}  // namespace

Session::Session(const Globals& globals)
    : layout_(Layout::ofStandardOutput()),
      server_(globals.server),
      logLevel_(globals.logLevel.value_or(util::kLevelError)),
      wantsLog_(globals.logLevel.has_value()),
      providerDirectory_(globals.providerDirectory),
      addedProviders_(globals.addedProviders.empty() ? frontend::usualProviders() : globals.addedProviders) {
  layout_.rowsAlone = globals.isOneOfMany;
  if (isRemote()) return;
  asFailure([&] {
    zorva::agent::loadConfig(globals.config);
    if (globals.logLevel) zorva::agent::setLogLevel(zorva::agent::LogStream::Log, *globals.logLevel);
    if (!globals.logLevel) logLevel_ = zorva::agent::currentConfig().logLevel;
  });
}

Session::~Session() = default;

const std::shared_ptr<const schema::ClassRepository>& Session::classes() {
  if (classes_ != nullptr) return classes_;
  if (isRemote()) {
    // A server may also have the classes that describe it. Those of many servers are the same.
    static const auto shared = schema::loadBuiltInClasses(schema::ClassSet::Interop);
    classes_ = shared;
  } else {
    const auto classes = schema::loadBuiltInClasses(schema::ClassSet::Profile);
    asFailure([&] { frontend::addProviders(addedProviders_, registry_, *classes); });
    classes_ = classes;
  }
  return classes_;
}

const schema::Class& Session::classNamed(std::string_view name) {
  const schema::Class* found = isRemote() ? cim().classNamed(name) : classes()->find(name);
  if (found != nullptr) return *found;
  throw Failure(ExitCode::WrongUsage, "there is no class " + printable(name), similarName(*classes(), name));
}

std::shared_ptr<const zorva::agent::TreeSnapshot> Session::tree() const {
  // If the log is the terminal anyway, this program prints its own messages, and a final failure only once.
  const bool holdsBack = zorva::agent::currentConfig().logTarget == "stderr";
  HeldBackLog log(logLevel_);
  if (holdsBack) zorva::agent::setLogSink(&log);
  const Finally restore([this] { placeLogSink(); });
  auto tree = asFailure([] { return zorva::agent::currentTree(); });
  log.tell();
  return tree;
}

Operations& Session::cim() {
  if (cim_ != nullptr) return *cim_;
  if (isRemote()) {
    cim_ = std::make_unique<RemoteOperations>(*server_, classes());
    return *cim_;
  }
  tree();
  classes();  // and their providers
  broker::BrokerOptions options;
  options.registry = registry_;
  options.providerDirectory =
      providerDirectory_.empty() ? broker::ProviderRegistry::builtInDirectory() : providerDirectory_;
  options.claim = claims_.hook();
  options.log = [this](broker::LogLevel level, std::string_view text) { log(level, text); };
  cim_ = std::make_unique<LocalOperations>(classes(), std::move(options));
  return *cim_;
}

Session::Changing::Changing(Session& session, bool isDryRun) : quiet_(session) {
  if (session.isRemote() || isDryRun) return;
  try {
    hold_.emplace(session.claims_);
  } catch (const std::runtime_error& error) {
    const bool isMissing = ::access(zorva::agent::dataDirectory().c_str(), F_OK) != 0;
    throw Failure(ExitCode::Failed, "nothing was changed: " + printable(error.what()),
                  isMissing ? "make the data directory, or name another: data_dir in the agent's configuration"
                            : hintForUnprivileged());
  }
}

void Session::placeLogSink() const {
  if (isRemote()) return;
  // A sink takes the lines of all targets, so a log file must still get them.
  const zorva::agent::Config& config = zorva::agent::currentConfig();
  const bool isQuietLog = isQuiet() && config.logTarget == "stderr" && config.traceTarget == "off";
  zorva::agent::setLogSink(isQuietLog ? &quietLog : nullptr);
}

Session::Quiet::Quiet(Session& session) : session_(session) {
  ++session_.quiet_;
  session_.placeLogSink();
}

Session::Quiet::~Quiet() {
  --session_.quiet_;
  session_.placeLogSink();
}

void Session::log(broker::LogLevel level, std::string_view text) const {
  if (isQuiet() || static_cast<int>(level) < std::min(logLevel_, util::kLevelWarning)) return;
  tell(level == broker::LogLevel::Error     ? "error: "
       : level == broker::LogLevel::Warning ? "warning: "
                                            : "",
       printable(text));
}

bool Session::isThisHost(std::string_view name) const {
  return isRemote() || util::sameName(name, "localhost") || util::sameName(name, tree()->systemName()) ||
         util::sameName(name, zorva::agent::currentConfig().systemName);
}

std::string nextStepIfDenied(const Session& session, const broker::Status& status) {
  if (!session.isRemote() || status.rc != CMPI_RC_ERR_ACCESS_DENIED) return {};
  const ServerUrl& server = session.server();
  if (server.isSocket()) return "root and the members of the group zorva may change settings there";
  if (!server.user.empty()) return "'zorvactl user role', run on that host, gives the user the role operate";
  return "log in as a user with the role operate: --url https://USER@" + (server.isEncrypted() ? server.host : "HOST");
}

namespace {

/// The properties of a class and of those below it; without one, of all classes.
std::vector<std::string> propertiesOf(const std::vector<const schema::Class*>& classes, const schema::Class* top) {
  std::set<std::string> names;
  const auto add = [&names](const schema::Class& each) {
    for (const schema::ClassProperty* property : each.properties()) names.insert(property->name);
  };
  if (top != nullptr) add(*top);
  for (const schema::Class* each : classes) {
    if (top == nullptr || each->isA(*top)) add(*each);
  }
  return {names.begin(), names.end()};
}

}  // namespace

broker::Selection selectionOf(Session& session, const std::vector<std::string>& properties, const schema::Class* top) {
  broker::Selection selection;
  if (properties.empty()) return selection;
  const std::vector<const schema::Class*>& classes = session.classes()->classes();
  for (const std::string& property : properties) {
    const auto hasIt = [&](const schema::Class* each) {
      return (top == nullptr || each->isA(*top)) && each->findProperty(property) != nullptr;
    };
    if (std::any_of(classes.begin(), classes.end(), hasIt) || (top != nullptr && hasIt(top))) continue;
    throw Failure(
        ExitCode::WrongUsage,
        (top == nullptr ? "no class" : "neither " + top->name() + " nor a class below it") + " has a property " +
            printable(property),
        nearestOr(property, propertiesOf(classes, top), "the same command without --property shows what there is"));
  }
  selection.propertyList = properties;
  return selection;
}

}  // namespace zorva::cli
