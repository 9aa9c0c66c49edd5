// What the tests of the eight association providers share: the objects at their ends, the words in which a request's
// story is told, and ways to make one call among many fail.
#pragma once

#include <gmock/gmock.h>

#include <algorithm>
#include <functional>
#include <initializer_list>
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

// The pairs of associations, in order, as `left > right`: of each end the key that tells it from its siblings, or its
// class where it has no keys.
inline std::string nameOfEnd(const Path& path) {
  if (path.keys.empty()) return path.className;
  return (path["InstanceID"].isNull() ? path["Name"] : path["InstanceID"]).text();
}
inline std::vector<std::string> pairsOf(const std::vector<Path>& paths, std::string_view left, std::string_view right) {
  std::vector<std::string> all;
  for (const Path& path : paths) all.push_back(nameOfEnd(path[left].path()) + " > " + nameOfEnd(path[right].path()));
  return all;
}
inline std::vector<std::string> pairsOf(const std::vector<Instance>& instances, std::string_view left,
                                        std::string_view right) {
  std::vector<std::string> all;
  for (const Instance& one : instances) {
    all.push_back(nameOfEnd(one[left].path()) + " > " + nameOfEnd(one[right].path()));
  }
  return all;
}

// --- A request's story: the provider's own log lines, and every call that makes, changes or hands out something.

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
  return tell({newHostPath(path, className),
               textKeys(path, {{"SystemCreationClassName", "ZORVA_ComputerSystem"},
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
// An endpoint or server with its keys alone; filter is the setPropertyFilter's list as a call shows it, empty for none.
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
inline Story referenceKeys(const std::string& path, const char* left, const std::string& first, const char* right,
                           const std::string& second) {
  return {path + ".addKey(\"" + left + "\", ref " + first + ")", path + ".addKey(\"" + right + "\", ref " + second + ")"};
}
inline Story references(const std::string& instance, const char* left, const std::string& first, const char* right,
                        const std::string& second) {
  return {instance + ".setProperty(\"" + left + "\", ref " + first + ")",
          instance + ".setProperty(\"" + right + "\", ref " + second + ")"};
}

// --- Failures that no slot can make on its own.

// Paths of one class lose their handles when a path of another class is made, as if the server took its memory back too
// early. One at a time; the provider is handed this broker by its create function.
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
  std::string stem;      // of its operations' names
  std::string builder;   // the function that gathers all instances
  std::string source;    // as its log lines tell it
  std::string category;  // of its log lines
  InstanceProvider::Create createInstanceMI;
  AssociationProvider::Create createAssociationMI;
  bool associationsAreDone;  // whether the four association operations call returnDone
};

// An association provider on a world that the test fills and installs. Whatever a request logs in the provider's
// category is checked to name the provider's own source and the operation, or the builder, as its place.
class AssociationTest : public ::testing::Test {
 protected:
  explicit AssociationTest(AssociationUnderTest provider)
      : provider_(std::move(provider)),
        instanceProvider_(provider_.createInstanceMI, broker),
        associationProvider_(provider_.createAssociationMI, broker) {}

  Path associationClass() const { return Path(provider_.className); }

  Outcome enumerateInstanceNames() {
    return checked("EnumInstanceNames", instanceProvider_.enumerateInstanceNames(associationClass()));
  }
  Outcome enumerateInstances(const PropertyList& properties = nullptr) {
    return checked("EnumInstances", instanceProvider_.enumerateInstances(associationClass(), properties));
  }
  Outcome getInstance(const Path& path, const PropertyList& properties = nullptr) {
    return checked("GetInstance", instanceProvider_.getInstance(path, properties));
  }
  // A query without an association class is asked for the provider's own.
  Outcome associators(const Path& path, AssociationQuery query = {}) {
    return checked("Associators", associationProvider_.associators(path, forOwnClass(query)));
  }
  Outcome associatorNames(const Path& path, AssociationQuery query = {}) {
    return checked("AssociatorNames", associationProvider_.associatorNames(path, forOwnClass(query)));
  }
  Outcome references(const Path& path, const AssociationQuery& query = {}) {
    return checked("References", associationProvider_.references(path, query));
  }
  Outcome referenceNames(const Path& path, const AssociationQuery& query = {}) {
    return checked("ReferenceNames", associationProvider_.referenceNames(path, query));
  }

  std::string operation(const std::string& name) const { return provider_.stem + "_" + name; }

  // The calls and the provider's own lines; those of what stands below it are left out.
  Story storyOf(const Outcome& outcome) const {
    Outcome own = outcome;
    own.lines = outcome.lines.ofCategory(provider_.category);
    return own.story();
  }
  // What the provider itself complains of.
  std::vector<std::string> complaintsOf(const Outcome& outcome) const {
    return outcome.lines.ofCategory(provider_.category).errors();
  }
  // How a request ended: its code, what is left open, and the provider's complaints.
  std::vector<std::string> endOf(const Outcome& outcome) const {
    std::vector<std::string> all = {nameOf(outcome.rc), closingOf(outcome)};
    for (const std::string& text : complaintsOf(outcome)) all.push_back(text);
    return all;
  }

  // Runs the operation with the n-th call whose line holds that text failing.
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
    provider_.createInstanceMI(thief.cmpi(), nullptr, nullptr);
    Outcome outcome = run();
    provider_.createInstanceMI(broker.cmpi(), nullptr, nullptr);
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

  // What holds of a request whatever failed beneath it.
  void expectRegularEnd(const std::string& name, const Outcome& outcome) {
    const std::string closing = closingOf(outcome);
    const bool isLookup = name == "EnumInstances" || name == "GetInstance";
    if (isLookup) {
      EXPECT_EQ("done, marked", closing);  // a failure below never shows
    } else if (name == "EnumInstanceNames" || provider_.associationsAreDone) {
      EXPECT_THAT(closing, ::testing::AnyOf("done, marked", "not done, not marked"));
    } else {
      EXPECT_THAT(closing, ::testing::AnyOf("not done, marked", "not done, not marked"));
    }
    if (name == "EnumInstances") {
      EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    }
    EXPECT_LE(outcome.result.doneCount, 1);
  }

  // Each call of each request fails in each way, exceptions included, which pass on to the server as they are.
  void expectToSurviveEveryFailure(const std::vector<Request>& requests) {
    for (const Request& request : requests) {
      SCOPED_TRACE(request.name);
      broker.startOver();
      request.run();
      const std::size_t calls = broker.callCount();
      const std::size_t tried = forEachFailure(broker, [&](std::size_t n, Mode mode) {
        SCOPED_TRACE(std::to_string(n) + ", " + nameOf(mode));
        logger.clear();
        const bool hidesRefusal = mode != Mode::SetRc;  // a refused returnDone was asked for all the same
        const Outcome outcome = request.run();
        if (hidesRefusal && outcome.calls.count("returnDone") == static_cast<std::size_t>(outcome.result.doneCount)) {
          expectRegularEnd(request.name, outcome);
        }
      });
      EXPECT_GE(tried, 4 * calls);
      const std::size_t thrown = forEachFailure(
          broker,
          [&](std::size_t, Mode) {
            try {
              request.run();
              EXPECT_FALSE(broker.hasFailed()) << "an exception of the broker was swallowed";
            } catch (const InjectedFailure&) {
            }
          },
          {Mode::Throw});
      EXPECT_EQ(thrown, calls);
      broker.startOver();
    }
  }

  // The tree fails at each of its calls. What is no std::exception may leave the provider.
  void expectToSurviveEveryTreeFailure(const std::vector<Request>& requests) {
    for (const Request& request : requests) {
      SCOPED_TRACE(request.name);
      const std::size_t tried = forEachTreeFailure([&](std::size_t, Thrown thrown) {
        try {
          expectRegularEnd(request.name, request.run());
        } catch (int) {
          EXPECT_EQ(Thrown::Int, thrown);
        }
      });
      EXPECT_GT(tried, 0U);
    }
  }

  RecordingLogger logger;
  World world;
  RecordingBroker broker;

 private:
  AssociationQuery forOwnClass(AssociationQuery query) const {
    if (query.assocClass == nullptr) query.assocClass = provider_.className.c_str();
    return query;
  }

  std::string closingOf(const Outcome& outcome) const {
    const std::string function = outcome.lines.size() < 2 ? std::string() : outcome.lines[1].subject();
    const bool isMarked = std::any_of(outcome.lines.begin(), outcome.lines.end(), [&](const LogLine& line) {
      return line.kind() == LineKind::Exiting && line.subject() == function;
    });
    return std::string(outcome.done() ? "done, " : "not done, ") + (isMarked ? "marked" : "not marked");
  }

  Outcome checked(const std::string& name, Outcome outcome) const {
    EXPECT_TRUE(outcome.markedEntry());
    for (const LogLine& line : outcome.lines.ofCategory(provider_.category)) {
      if (line.kind() == LineKind::Banner) continue;
      const bool isMark = line.function == "markProviderEntry" || line.function == "markProviderExit";
      const std::string function = isMark ? line.subject() : line.function;
      EXPECT_THAT(function, ::testing::AnyOf(operation(name), provider_.builder)) << line;
      EXPECT_EQ(provider_.source, line.toldFile()) << line;
      EXPECT_EQ(isMark ? "trace/Trace.h" : provider_.source, line.file) << line;
    }
    return outcome;
  }

  AssociationUnderTest provider_;
  InstanceProvider instanceProvider_;
  AssociationProvider associationProvider_;
};

}  // namespace ZV::Test
