#include "server/ServerChecks.h"

#include <algorithm>
#include <chrono>
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "agent/Agent.h"
#include "cmpi/support/CmpiSupport.h"
#include "dns/ServerCheck.h"
#include "frontend/SettingsClaims.h"
#include "host/HostProvider.h"

namespace zorva::server {

namespace {

using agent::Node;
using agent::StringList;
using agent::TreeSnapshot;
using host::HostObject;

constexpr const char* kServerClass = "ZORVA_DNSServerCheck";
constexpr const char* kSuffixClass = "ZORVA_DNSSuffixCheck";
constexpr const char* kPrefix = "ServerCheck";
constexpr const char* kHost = "host";
constexpr std::size_t kNamedUsers = 100;

/// What is asked in one reading.
struct Questions {
  std::vector<dns::Asker> askers;
  StringList hostServers;

  bool operator==(const Questions&) const = default;
};

/// What the latest reading brought. Readers of the same wait for one another: the servers are asked once.
class LatestCheck {
 public:
  std::shared_ptr<const dns::CheckResult> of(Questions questions) {
    constexpr std::chrono::seconds kGoodFor{5};
    const std::lock_guard lock(mutex_);
    const bool isNew = result_ == nullptr || Clock::now() - at_ >= kGoodFor || questions != questions_;
    if (!isNew) return result_;
    result_ = std::make_shared<const dns::CheckResult>(
        dns::checkServers(questions.askers, questions.hostServers, dns::Question{}));
    at_ = Clock::now();
    questions_ = std::move(questions);
    return result_;
  }

 private:
  using Clock = std::chrono::steady_clock;
  std::mutex mutex_;
  Questions questions_;
  std::shared_ptr<const dns::CheckResult> result_;
  Clock::time_point at_;
};

/// Leaves out what is beyond the limits. A text that was seen before does not count again.
class Limits {
 public:
  dns::Asker cut(dns::Asker asker) {
    for (StringList* list : {&asker.servers, &asker.notAsked}) cut(*list, servers_, kMostServersAsked);
    cut(asker.suffixes, suffixes_, kMostSuffixesAsked);
    return asker;
  }

 private:
  static void cut(StringList& texts, std::set<std::string>& seen, std::size_t most) {
    std::erase_if(texts, [&](const std::string& text) {
      if (seen.contains(text)) return false;
      if (seen.size() >= most) return true;
      seen.insert(text);
      return false;
    });
  }

  std::set<std::string> servers_;
  std::set<std::string> suffixes_;
};

/// By InstanceID, the servers of each interface as its settings have them.
std::map<std::string, StringList> serversOfSettings(const CMPIBroker* broker, const CMPIContext* context,
                                                    const std::string& nameSpace) {
  CMPIStatus status{CMPI_RC_OK, nullptr};
  CMPIObjectPath* path = cmpi::newPath(broker, nameSpace, frontend::kSettingClass, &status);
  CMPIEnumeration* settings = cmpi::enumerateInstances(broker, context, path, &status);
  if (settings == nullptr) throw std::runtime_error(std::string(frontend::kSettingClass) + " cannot be read");
  std::map<std::string, StringList> servers;
  while (cmpi::hasNext(settings, nullptr)) {
    const CMPIInstance* setting = cmpi::nextInstance(settings, nullptr);
    const CMPIData list = cmpi::getProperty(setting, "DNSServerAddresses", nullptr);
    if ((list.state & (CMPI_nullValue | CMPI_notFound | CMPI_badValue)) != 0 || list.type != CMPI_stringA) continue;
    StringList& texts = servers[cmpi::propertyText(setting, "InstanceID", nullptr)];
    const CMPIArray* array = list.value.array;
    const CMPICount count = array->ft->getSize(array, nullptr);
    for (CMPICount i = 0; i < count; ++i) {
      texts.push_back(cmpi::textOf(array->ft->getElementAt(array, i, nullptr), nullptr));
    }
  }
  return servers;
}

Questions questionsFor(const TreeSnapshot& tree, const std::map<std::string, StringList>& serversById) {
  Questions questions;
  Limits limits;
  for (const Node& node : tree.nodes()) {
    const std::string* name = node.text(ZV::NodeLexicon::PROP_NAME);
    if (node.type() != agent::NodeType::NetworkIPConfig || name == nullptr) continue;
    const auto found = serversById.find(frontend::settingIdOf(*name, tree.systemOf(node).isServiceProcessor()));
    const StringList servers = found == serversById.end() ? StringList() : found->second;
    questions.askers.push_back(limits.cut({*name,
                                           dns::withPorts(servers, node.listOrEmpty(agent::kDnsServersInFull)),
                                           {},
                                           node.listOrEmpty(ZV::NodeLexicon::PROP_DNS_SUFFIXES)}));
  }
  const Node* host = tree.ownSystem();
  if (host == nullptr) return questions;
  questions.hostServers = host->listOrEmpty(agent::kResolverServers);
  questions.askers.push_back(limits.cut({kHost, questions.hostServers, host->listOrEmpty(agent::kResolverNotAsked),
                                         host->listOrEmpty(agent::kResolverSearch)}));
  const StringList& own = host->listOrEmpty(ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES);
  if (own.empty()) return questions;
  questions.askers.push_back(limits.cut({host->textOrEmpty(agent::kDnsOwner),
                                         dns::withPorts(own, host->listOrEmpty(agent::kDnsServersInFull)),
                                         {},
                                         host->listOrEmpty(ZV::NodeLexicon::PROP_DNS_SUFFIXES)}));
  return questions;
}

void addUsers(HostObject& object, const StringList& users) {
  const auto named = static_cast<std::ptrdiff_t>(std::min(users.size(), kNamedUsers));
  object.properties.push_back({"UsedBy", StringList(users.begin(), users.begin() + named)});
  object.properties.push_back({"UserCount", std::uint64_t{users.size()}});
}

HostObject objectOf(const dns::CheckedServer& server) {
  HostObject object{kServerClass, {{"Server", server.server}}, {}};
  object.properties.push_back({"Answer", server.answerText()});
  object.properties.push_back({"IsGood", server.isGood()});
  if (server.answer.kind == dns::Answer::Kind::Response) {
    object.properties.push_back({"ResponseTime", static_cast<std::uint64_t>(server.answer.time.count())});
  }
  addUsers(object, server.usedBy);
  return object;
}

HostObject objectOf(const dns::CheckedSuffix& suffix) {
  HostObject object{kSuffixClass, {{"Suffix", suffix.suffix}}, {}};
  if (suffix.resolves) object.properties.push_back({"Resolves", *suffix.resolves});
  addUsers(object, suffix.usedBy);
  return object;
}

std::vector<HostObject> objectsOf(const dns::CheckResult& result) {
  std::vector<HostObject> objects;
  for (const dns::CheckedServer& server : result.servers) objects.push_back(objectOf(server));
  for (const dns::CheckedSuffix& suffix : result.suffixes) objects.push_back(objectOf(suffix));
  return objects;
}

/// The provider. It needs the context of each request to ask the broker for the settings, so it has reading functions
/// of its own.
struct Checks : host::Provider<nullptr> {
  static host::Publish publisher(const CMPIContext* context, const CMPIObjectPath* ref) {
    return [context, nameSpace = cmpi::nameSpaceOf(ref, nullptr)](const TreeSnapshot& tree) {
      static LatestCheck latest;
      return objectsOf(*latest.of(questionsFor(tree, serversOfSettings(broker, context, nameSpace))));
    };
  }
  static CMPIStatus enumNames(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                              const CMPIObjectPath* ref) {
    return host::enumerateInstanceNames(broker, publisher(context, ref), result, ref);
  }
  static CMPIStatus enumInstances(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                  const CMPIObjectPath* ref, const char** properties) {
    return host::enumerateInstances(broker, publisher(context, ref), result, ref, properties);
  }
  static CMPIStatus get(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                        const CMPIObjectPath* ref, const char** properties) {
    return host::getInstance(broker, publisher(context, ref), result, ref, properties);
  }
};

CMPIInstanceMI* create(const CMPIBroker* broker, const CMPIContext*, CMPIStatus*) {
  static CMPIInstanceMIFT table = cmpi::tableOf<CMPIInstanceMIFT>(
      cmpi::kTableVersion, cmpi::kTableVersion, "instanceServerCheck", Checks::cleanup, Checks::enumNames,
      Checks::enumInstances, Checks::get, Checks::create, Checks::modify, Checks::remove, Checks::query);
  static CMPIInstanceMI mi = {nullptr, &table};
  Checks::broker = broker;
  return &mi;
}

}  // namespace

void serveServerChecks(broker::BrokerOptions& options) {
  for (const char* name : {kServerClass, kSuffixClass}) options.registry.add({name, kPrefix, "", broker::InstanceMi});
  options.linked.push_back({std::string(kPrefix) + "_Create_InstanceMI", reinterpret_cast<void (*)()>(create)});
}

}  // namespace zorva::server
