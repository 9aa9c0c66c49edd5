// Shared by the tests of the eight association providers: the objects at their ends, the texts of the recorded calls
// and log lines, and ways to make one call among many fail.
#pragma once

#include <gmock/gmock.h>

#include <algorithm>
#include <functional>
#include <initializer_list>
#include <set>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "ProviderCall.h"
#include "RecordingBroker.h"
#include "RecordingLogger.h"
#include "World.h"

namespace ZV::Test {

// --- The objects at the ends, as a client names them.

inline Path pathOnSystem(const std::string& className, const std::string& name, const std::string& systemName) {
  return Path(className)
      .key("SystemCreationClassName", "ZORVA_ComputerSystem")
      .key("CreationClassName", className.c_str())
      .key("SystemName", systemName.c_str())
      .key("Name", name.c_str());
}
inline Path endpointPath(const std::string& name, const std::string& systemName = "host1") {
  return pathOnSystem("ZORVA_DNSProtocolEndPoint", name, systemName);
}
inline Path serverPath(const std::string& address, const std::string& systemName = "host1") {
  return pathOnSystem("ZORVA_RemoteServiceAccessPoint", address, systemName);
}
inline Path ipEndpointPath(const std::string& name) { return pathOnSystem("ZORVA_IPProtocolEndpoint", name, "host1"); }
inline Path systemPath(const std::string& name) {
  return Path("ZORVA_ComputerSystem").key("CreationClassName", "ZORVA_ComputerSystem").key("Name", name.c_str());
}
inline Path pathOfSetting(const std::string& className, const std::string& instanceID) {
  return Path(className).key("InstanceID", instanceID.c_str());
}
inline Path generalSettingPath(const std::string& instanceID = "dnsgen1:host1") {
  return pathOfSetting("ZORVA_DNSGeneralSettingData", instanceID);
}
inline Path settingPath(const std::string& instanceID) { return pathOfSetting("ZORVA_DNSSettingData", instanceID); }
inline Path ipAssignmentPath(const std::string& instanceID) {
  return pathOfSetting("ZORVA_IPAssignmentSettingData", instanceID);
}

// The object of a path, with its keys as properties, as another provider serves it.
inline Instance objectOf(const Path& path) {
  Instance object(path.className);
  for (const auto& [name, value] : path.keys) object = object.with(name, value);
  return object;
}

// One text of each object, in order: a key of paths, a property of instances.
inline std::vector<std::string> textsOf(const std::vector<Path>& paths, std::string_view key) {
  std::vector<std::string> all;
  for (const Path& path : paths) all.push_back(path[key].text());
  return all;
}
inline std::vector<std::string> textsOf(const std::vector<Instance>& instances, std::string_view property) {
  std::vector<std::string> all;
  for (const Instance& instance : instances) all.push_back(instance[property].text());
  return all;
}

// The text that identifies an object: its Name or InstanceID, or its class if it has no keys.
inline std::string nameOfEnd(const Path& path) {
  if (path.keys.empty()) return path.className;
  return (path["InstanceID"].isNull() ? path["Name"] : path["InstanceID"]).text();
}

// --- The record of a request: the provider's own log lines, and every call that makes, changes or returns something.

using Story = std::vector<std::string>;

inline Story tell(std::initializer_list<Story> parts) {
  Story all;
  for (const Story& part : parts) all.insert(all.end(), part.begin(), part.end());
  return all;
}

inline Story entry(const std::string& function) { return {"log 4000 banner", "log 4000 ENTERING " + function}; }
inline Story exitMark(const std::string& function) { return {"log 4000 EXITING " + function, "log 4000 banner"}; }
inline std::string error(const std::string& text) { return "log 6000 MESSAGE " + text; }

inline Story placed(const std::string& path) {
  return {path + ".setNameSpace(\"root/cimv2\")", path + ".setHostname(\"host1\")"};
}
inline std::string newPath(const std::string& className) {
  return "newObjectPath(\"root/cimv2\", \"" + className + "\")";
}
inline Story newHostPath(const std::string& path, const std::string& className) {
  return tell({{newPath(className)}, placed(path)});
}
inline Story textKeys(const std::string& path, std::initializer_list<std::pair<const char*, std::string>> keys) {
  Story all;
  for (const auto& [name, text] : keys) all.push_back(path + ".addKey(\"" + name + "\", chars \"" + text + "\")");
  return all;
}
inline Story newPathOnSystem(const std::string& path, const std::string& className, const std::string& name) {
  return tell({newHostPath(path, className), textKeys(path, {{"SystemCreationClassName", "ZORVA_ComputerSystem"},
                                                             {"CreationClassName", className},
                                                             {"SystemName", "host1"},
                                                             {"Name", name}})});
}
inline Story newEndpointPath(const std::string& path, const std::string& name) {
  return newPathOnSystem(path, "ZORVA_DNSProtocolEndPoint", name);
}
inline Story newServerPath(const std::string& path, const std::string& address) {
  return newPathOnSystem(path, "ZORVA_RemoteServiceAccessPoint", address);
}
inline Story newGeneralSettingPath(const std::string& path) {
  return tell({newHostPath(path, "ZORVA_DNSGeneralSettingData"), textKeys(path, {{"InstanceID", "dnsgen1:host1"}})});
}
inline Story textProperties(const std::string& instance,
                            std::initializer_list<std::pair<const char*, std::string>> properties) {
  Story all;
  for (const auto& [name, text] : properties) {
    all.push_back(instance + ".setProperty(\"" + name + "\", chars \"" + text + "\")");
  }
  return all;
}
// An endpoint or server with its keys only; filter is the setPropertyFilter's list as a call shows it, empty for none.
inline Story newObjectOnSystem(const std::string& path, const std::string& instance, const std::string& className,
                               const std::string& name, const std::string& filter) {
  const std::string keys = R"({"SystemCreationClassName", "CreationClassName", "SystemName", "Name"})";
  return tell({newHostPath(path, className),
               {"newInstance(" + path + ")"},
               filter.empty() ? Story() : Story{instance + ".setPropertyFilter(" + filter + ", " + keys + ")"},
               textProperties(instance, {{"SystemCreationClassName", "ZORVA_ComputerSystem"},
                                         {"CreationClassName", className},
                                         {"SystemName", "host1"},
                                         {"Name", name}})});
}
inline Story newEndpoint(const std::string& path, const std::string& instance, const std::string& name,
                         const std::string& filter = {}) {
  return newObjectOnSystem(path, instance, "ZORVA_DNSProtocolEndPoint", name, filter);
}
inline Story newServer(const std::string& path, const std::string& instance, const std::string& address,
                       const std::string& filter = {}) {
  return newObjectOnSystem(path, instance, "ZORVA_RemoteServiceAccessPoint", address, filter);
}

// --- Failures that no slot can make on its own.

// Paths of one class lose their handles when a path of another class is made, as if the server freed them too early.
// One at a time; the provider gets this broker by its create function.
class HandleThief {
 public:
  HandleThief(const RecordingBroker& broker, std::string victims, std::string occasion)
      : broker_(*broker.cmpi()), table_(*broker_.eft), victims_(std::move(victims)), occasion_(std::move(occasion)) {
    make_ = table_.newObjectPath;
    table_.newObjectPath = newObjectPath;
    broker_.eft = &table_;
    active_ = this;
  }
  ~HandleThief() { active_ = nullptr; }
  HandleThief(const HandleThief&) = delete;
  HandleThief& operator=(const HandleThief&) = delete;

  const CMPIBroker* cmpi() const { return &broker_; }

 private:
  static CMPIObjectPath* newObjectPath(const CMPIBroker* face, const char* space, const char* name, CMPIStatus* rc) {
    HandleThief& self = *active_;
    CMPIObjectPath* path = self.make_(face, space, name, rc);
    if (name == self.occasion_) {
      for (CMPIObjectPath* victim : self.paths_) victim->hdl = nullptr;
    }
    if (name == self.victims_) self.paths_.push_back(path);
    return path;
  }

  inline static HandleThief* active_ = nullptr;
  CMPIBroker broker_;
  CMPIBrokerEncFT table_;
  CMPIObjectPath* (*make_)(const CMPIBroker*, const char*, const char*, CMPIStatus*);
  std::string victims_;
  std::string occasion_;
  std::vector<CMPIObjectPath*> paths_;
};

// --- The fixture.

struct AssociationUnderTest {
  std::string className;
  std::string left;  // its two references, in the order in which they are set
  std::string right;
  std::string stem;      // of its operations' names
  std::string builder;   // the function that gathers all instances
  std::string source;    // as its log lines name it
  std::string category;  // of its log lines
  InstanceProvider::Create createInstanceMI;
  AssociationProvider::Create createAssociationMI;
  bool associationsAreDone;  // whether the four association operations call returnDone
};

// An association provider on a world that the test fills and installs. All lines of a request in the provider's
// category are checked: their place must be the provider's own source and the operation, or the builder.
class AssociationTest : public ::testing::Test {
 protected:
  explicit AssociationTest(AssociationUnderTest provider)
      : under(std::move(provider)),
        instanceProvider(under.createInstanceMI, broker),
        associationProvider(under.createAssociationMI, broker) {}

  Path associationClass() const { return Path(under.className, nameSpace); }
  Path pairOf(const Path& left, const Path& right) const {
    return associationClass().key(under.left, ref(left)).key(under.right, ref(right));
  }

  // The associations that a request returned, in order, as `left > right`.
  std::vector<std::string> pairsOf(const Outcome& outcome) const {
    std::vector<std::string> all;
    const auto add = [&](const Value& left, const Value& right) {
      all.push_back(nameOfEnd(left.path()) + " > " + nameOfEnd(right.path()));
    };
    for (const Path& path : outcome.paths()) add(path[under.left], path[under.right]);
    for (const Instance& instance : outcome.instances()) add(instance[under.left], instance[under.right]);
    return all;
  }

  // The calls that give an association its two references.
  Story keyEnds(const std::string& path, const std::string& left, const std::string& right) const {
    return {path + ".addKey(\"" + under.left + "\", ref " + left + ")",
            path + ".addKey(\"" + under.right + "\", ref " + right + ")"};
  }
  Story setEnds(const std::string& instance, const std::string& left, const std::string& right) const {
    return {instance + ".setProperty(\"" + under.left + "\", ref " + left + ")",
            instance + ".setProperty(\"" + under.right + "\", ref " + right + ")"};
  }

  Outcome enumerateInstanceNames() {
    return checked("EnumInstanceNames", instanceProvider.enumerateInstanceNames(associationClass()));
  }
  Outcome enumerateInstances(const PropertyList& properties = nullptr) {
    return checked("EnumInstances", instanceProvider.enumerateInstances(associationClass(), properties));
  }
  Outcome getInstance(const Path& path, const PropertyList& properties = nullptr) {
    return checked("GetInstance", instanceProvider.getInstance(path, properties));
  }
  // A query without an association class names the provider's own.
  Outcome associators(const Path& path, AssociationQuery query = {}) {
    return checked("Associators", associationProvider.associators(path, forOwnClass(query)));
  }
  Outcome associatorNames(const Path& path, AssociationQuery query = {}) {
    return checked("AssociatorNames", associationProvider.associatorNames(path, forOwnClass(query)));
  }
  Outcome references(const Path& path, const AssociationQuery& query = {}) {
    return checked("References", associationProvider.references(path, query));
  }
  Outcome referenceNames(const Path& path, const AssociationQuery& query = {}) {
    return checked("ReferenceNames", associationProvider.referenceNames(path, query));
  }

  std::string operation(const std::string& name) const { return under.stem + "_" + name; }

  // The calls and the provider's own lines, without those of the folders below it, and the code if there is one.
  Story storyOf(const Outcome& outcome) const {
    Outcome own = outcome;
    own.lines = outcome.lines.ofCategory(under.category);
    Story story = own.story();
    if (outcome.rc != CMPI_RC_OK) story.push_back(nameOf(outcome.rc));
    return story;
  }
  // The errors that the provider itself wrote.
  std::vector<std::string> complaintsOf(const Outcome& outcome) const {
    return outcome.lines.ofCategory(under.category).errors();
  }
  // How a request ended: its code, whether it was left open, and the provider's errors.
  std::vector<std::string> endOf(const Outcome& outcome) const {
    std::vector<std::string> all = {nameOf(outcome.rc), closingOf(outcome)};
    for (const std::string& text : complaintsOf(outcome)) all.push_back(text);
    return all;
  }

  // Runs the operation while the n-th call whose line contains that text fails.
  Outcome failing(const std::string& line, Mode mode, const std::function<Outcome()>& run, std::size_t n = 1) {
    broker.startOver();
    run();
    const Calls calls = broker.calls();
    const auto found = std::find_if(calls.begin(), calls.end(), [&](const RecordedCall& call) {
      return call.line.find(line) != std::string::npos && --n == 0;
    });
    EXPECT_NE(calls.end(), found) << "no such call: " << line;
    broker.startOver();
    broker.failAt(static_cast<std::size_t>(found - calls.begin()) + 1, mode);
    const Outcome outcome = run();
    EXPECT_TRUE(broker.hasFailed());
    broker.startOver();
    return outcome;
  }

  // Runs the operation while paths of one class lose their handles when one of another class is made.
  Outcome losingHandles(const std::string& victims, const std::string& occasion, const std::function<Outcome()>& run) {
    const HandleThief thief(broker, victims, occasion);
    under.createInstanceMI(thief.cmpi(), nullptr, nullptr);
    Outcome outcome = run();
    under.createInstanceMI(broker.cmpi(), nullptr, nullptr);
    return outcome;
  }

  struct Request {
    std::string name;
    std::function<Outcome()> run;
  };
  // The seven operations, the four association operations from each of two sources.
  std::vector<Request> allRequests(const Path& pair, const Path& left, const Path& right) {
    std::vector<Request> all = {{"EnumInstanceNames", [this] { return enumerateInstanceNames(); }},
                                {"EnumInstances", [this] { return enumerateInstances(); }},
                                {"GetInstance", [this, pair] { return getInstance(pair); }}};
    for (const Path& source : {left, right}) {
      all.push_back({"Associators", [this, source] { return associators(source); }});
      all.push_back({"AssociatorNames", [this, source] { return associatorNames(source); }});
      all.push_back({"References", [this, source] { return references(source); }});
      all.push_back({"ReferenceNames", [this, source] { return referenceNames(source); }});
    }
    return all;
  }

  // Both associator operations return `count` objects for each accepted result class. For any other class they end at
  // once, with no objects and no log line.
  void expectResultClasses(const Path& source, std::size_t count, std::initializer_list<const char*> passing,
                           std::initializer_list<const char*> refused) {
    for (const char* resultClass : passing) {
      SCOPED_TRACE(inQuotesOrNull(resultClass));
      EXPECT_EQ(count, associators(source, {.resultClass = resultClass}).instances().size());
      EXPECT_EQ(count, associatorNames(source, {.resultClass = resultClass}).paths().size());
    }
    for (const char* resultClass : refused) {
      SCOPED_TRACE(inQuotesOrNull(resultClass));
      for (const Outcome& outcome :
           {associators(source, {.resultClass = resultClass}), associatorNames(source, {.resultClass = resultClass})}) {
        EXPECT_THAT(endOf(outcome), ::testing::ElementsAre("CMPI_RC_OK", "not done, not marked"));
        EXPECT_EQ(0U, outcome.instances().size() + outcome.paths().size());
      }
    }
  }

  // A source of a class at neither end: the four operations log these texts, return nothing and leave the result open.
  void expectNoFarEnd(const Path& source, std::initializer_list<const char*> texts) {
    const Outcome outcomes[] = {associators(source), associatorNames(source), references(source),
                                referenceNames(source)};
    const char* const* text = texts.begin();
    for (const Outcome& outcome : outcomes) {
      EXPECT_THAT(endOf(outcome), ::testing::ElementsAre("CMPI_RC_OK", "not done, not marked", *text++));
      EXPECT_EQ(0U, outcome.instances().size() + outcome.paths().size());
    }
  }

  // The arguments that no association operation reads, and the host of the source, do not change any result.
  void expectUnreadArgumentsIgnored(const Path& source) {
    const Path elsewhere = source.on("elsewhere");
    EXPECT_EQ(storyOf(associators(source)), storyOf(associators(elsewhere)));
    EXPECT_EQ(storyOf(associatorNames(source)), storyOf(associatorNames(elsewhere)));
    EXPECT_EQ(storyOf(references(source)), storyOf(references(elsewhere)));
    EXPECT_EQ(storyOf(referenceNames(source)), storyOf(referenceNames(elsewhere)));
    const AssociationQuery roles = {.role = "NoSuchRole", .resultRole = "NoSuchRole"};
    const AssociationQuery all = {.resultClass = "CIM_NoSuchClass", .role = "NoSuchRole", .properties = {"NoSuch"}};
    EXPECT_EQ(storyOf(associators(source)), storyOf(associators(source, roles)));
    EXPECT_EQ(storyOf(associatorNames(source)), storyOf(associatorNames(source, roles)));
    EXPECT_EQ(storyOf(references(source)), storyOf(references(source, all)));
    EXPECT_EQ(storyOf(referenceNames(source)), storyOf(referenceNames(source, all)));
  }

  // A request that asks the broker for objects of a class that another provider serves.
  struct UpCall {
    std::function<Outcome()> run;
    const char* text;  // logged when that fails
    bool showsCode;    // whether the request then ends at once with the broker's code; else it completes without it
  };

  // The other provider is missing, fails, returns nothing, returns objects without handles, stops half way, or throws.
  void expectToEndAsTheOtherProviderHasIt(const std::string& otherClass, const std::vector<Instance>& objects,
                                          const std::vector<UpCall>& upCalls) {
    for (const UpCall& upCall : upCalls) {
      SCOPED_TRACE(&upCall - upCalls.data());
      const auto expectFailure = [&](const char* code, const Outcome& outcome) {
        EXPECT_THAT(endOf(outcome),
                    ::testing::ElementsAre(upCall.showsCode ? code : "CMPI_RC_OK",
                                           upCall.showsCode ? "not done, not marked" : "done, marked", upCall.text));
        EXPECT_EQ(0U, outcome.instances().size() + outcome.paths().size());
      };
      broker.serve(otherClass).rc = CMPI_RC_ERR_INVALID_CLASS;  // as if no provider served it
      expectFailure("CMPI_RC_ERR_INVALID_CLASS", upCall.run());
      broker.serve(otherClass, objects).rc = CMPI_RC_ERR_NOT_SUPPORTED;  // and objects in addition to the code
      expectFailure("CMPI_RC_ERR_NOT_SUPPORTED", upCall.run());

      broker.serve(otherClass).nullEnumeration = true;
      const Outcome nothing = upCall.run();
      EXPECT_THAT(complaintsOf(nothing), ::testing::IsEmpty());
      EXPECT_EQ(CMPI_RC_OK, nothing.rc);
      EXPECT_EQ(0U, nothing.instances().size() + nothing.paths().size());

      broker.serve(otherClass, objects);
      for (const Mode mode : kAllStatusModes) failing("getNext", mode, upCall.run);
      const Outcome cutShort = failing("hasNext", Mode::RcAndNull, upCall.run);
      EXPECT_THAT(complaintsOf(cutShort), ::testing::IsEmpty());
      EXPECT_EQ(upCall.showsCode ? CMPI_RC_ERR_FAILED : CMPI_RC_OK, cutShort.rc);

      broker.serve(otherClass, objects).throws = true;
      EXPECT_THROW(upCall.run(), InjectedFailure);
      broker.serve(otherClass, objects);
    }
  }

  // All objects that are made have the request's namespace.
  void expectTheRequestsNamespaceEverywhere(const Path& left, const Path& right) {
    const std::vector<Request> usual = allRequests(pairOf(left, right), left, right);
    std::vector<Story> stories;
    for (const Request& request : usual) stories.push_back(storyOf(request.run()));

    nameSpace = "root/lab";
    const Path otherLeft = left.in(nameSpace);
    const Path otherRight = right.in(nameSpace);
    const std::vector<Request> others = allRequests(pairOf(otherLeft, otherRight), otherLeft, otherRight);
    for (std::size_t i = 0; i < others.size(); ++i) {
      for (std::string& step : stories[i]) {
        const std::size_t at = step.find("root/cimv2");
        if (at != std::string::npos) step.replace(at, std::string("root/cimv2").size(), nameSpace);
      }
      EXPECT_EQ(stories[i], storyOf(others[i].run())) << others[i].name;
    }
  }

  // An up-call gets the operation's context; the record shows the context only if it is another one.
  void expectUpCallsInTheOperationsContext(const std::vector<Request>& requests, std::size_t count) {
    for (const Request& request : requests) {
      const Outcome outcome = request.run();
      for (const std::string& line : outcome.calls.only({"enumerateInstances", "enumerateInstanceNames"})) {
        EXPECT_THAT(line, ::testing::Not(::testing::HasSubstr("context"))) << request.name;
        --count;
      }
    }
    EXPECT_EQ(0U, count) << "up-calls fewer than awaited, or more";
  }

  // True of a request, whatever failed below it.
  void expectRegularEnd(const std::string& name, const Outcome& outcome) {
    const std::string closing = closingOf(outcome);
    if (name == "EnumInstances" || name == "GetInstance") {
      EXPECT_EQ("done, marked", closing);  // a failure below is never shown
    } else if (name == "EnumInstanceNames" || under.associationsAreDone) {
      EXPECT_THAT(closing, ::testing::AnyOf("done, marked", "not done, not marked"));
    } else {
      EXPECT_THAT(closing, ::testing::AnyOf("not done, marked", "not done, not marked"));
    }
    if (name == "EnumInstances") {
      EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    }
    EXPECT_LE(outcome.calls.count("returnDone"), 1U);
  }

  // Each call of each request fails in each way, exceptions included, which the server gets unchanged.
  void expectToSurviveEveryFailure(const std::vector<Request>& requests) {
    for (const Request& request : requests) {
      SCOPED_TRACE(request.name);
      broker.startOver();
      request.run();
      const std::size_t calls = broker.callCount();
      const std::size_t tried = forEachFailure(broker, [&](std::size_t n, Mode mode) {
        SCOPED_TRACE(std::to_string(n) + ", " + nameOf(mode));
        logger.clear();
        expectRegularEnd(request.name, request.run());
      });
      EXPECT_GE(tried, 4 * calls);
      const std::size_t thrown = forEachFailure(broker,
                                                [&](std::size_t, Mode) {
                                                  try {
                                                    request.run();
                                                    EXPECT_FALSE(broker.hasFailed())
                                                        << "an exception of the broker was swallowed";
                                                  } catch (const InjectedFailure&) {
                                                  }
                                                },
                                                {Mode::Throw});
      EXPECT_EQ(thrown, calls);
      broker.startOver();
    }
  }

  // The tree fails at each of its calls. The request may end with the exception if it is no std::exception, or if it
  // came from one of the calls that are named here.
  void expectToSurviveEveryTreeFailure(const std::vector<Request>& requests,
                                       const std::set<zorva::agent::TreeCall>& unguarded) {
    for (const Request& request : requests) {
      SCOPED_TRACE(request.name);
      const std::vector<zorva::agent::TreeCall> calls = treeCallsOf(request);
      const std::size_t tried = forEachTreeFailure([&](std::size_t n, Thrown thrown) {
        SCOPED_TRACE(n);
        try {
          expectRegularEnd(request.name, request.run());
        } catch (const std::runtime_error&) {
          EXPECT_TRUE(unguarded.contains(calls.at(n - 1)));
        } catch (int) {
          EXPECT_EQ(Thrown::Int, thrown);
        }
      });
      EXPECT_GE(tried, 2U);
    }
  }

 private:
  static std::vector<zorva::agent::TreeCall> treeCallsOf(const Request& request) {
    const FailingTree counting;
    request.run();
    return counting.calls();
  }

  AssociationQuery forOwnClass(AssociationQuery query) const {
    if (query.assocClass == nullptr) query.assocClass = under.className.c_str();
    return query;
  }

  std::string closingOf(const Outcome& outcome) const {
    const std::string function = outcome.lines.size() < 2 ? std::string() : outcome.lines[1].subject();
    const bool isMarked = std::any_of(outcome.lines.begin(), outcome.lines.end(), [&](const LogLine& line) {
      return line.kind() == LineKind::Exiting && line.subject() == function;
    });
    const bool isDone = outcome.calls.count("returnDone") != 0;
    return std::string(isDone ? "done, " : "not done, ") + (isMarked ? "marked" : "not marked");
  }

  Outcome checked(const std::string& name, Outcome outcome) const {
    EXPECT_TRUE(outcome.markedEntry());
    for (const LogLine& line : outcome.lines.ofCategory(under.category)) {
      if (line.kind() == LineKind::Banner) continue;
      const bool isMark = line.function == "markProviderEntry" || line.function == "markProviderExit";
      const std::string function = isMark ? line.subject() : line.function;
      EXPECT_THAT(function, ::testing::AnyOf(operation(name), under.builder)) << line;
      EXPECT_EQ(under.source, line.fileInText()) << line;
      EXPECT_EQ(isMark ? "trace/Trace.h" : under.source, line.file) << line;
    }
    return outcome;
  }

 protected:
  RecordingLogger logger;
  World world;
  RecordingBroker broker;
  std::string nameSpace = "root/cimv2";  // of the enumerations
  const AssociationUnderTest under;
  InstanceProvider instanceProvider;
  AssociationProvider associationProvider;
};

}  // namespace ZV::Test
