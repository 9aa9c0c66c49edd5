#include "Load.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <string_view>

namespace broker = zorva::broker;

namespace ZV::Test {
namespace {

constexpr const char* kSpace = "root/cimv2";
constexpr const char* kClasses[] = {
    "ZORVA_DNSProtocolEndPoint",
    "ZORVA_RemoteServiceAccessPoint",
    "ZORVA_DNSSettingData",
    "ZORVA_DNSGeneralSettingData",
    "ZORVA_RemoteAccessAvailableToElement",
    "ZORVA_DNSSAPSAPDependency",
    "ZORVA_DNSHostedAccessPoint",
    "ZORVA_DNSGeneralElementSettingData",
    "ZORVA_DNSGenEndPointElementSettingData",
    "ZORVA_DNSEndPointElementSettingData",
    "ZORVA_DNSGenOrderedComponent",
    "ZORVA_DNSOrderedComponent",
};
constexpr std::size_t kPlainClasses = 4;  // the rest are associations

constexpr int kFailed = 1;
constexpr int kNotFound = 6;
constexpr std::size_t kMostKnown = 200;
constexpr std::size_t kMostComplaints = 10;

bool isPrintable(std::string_view text) {
  return std::all_of(text.begin(), text.end(), [](unsigned char c) { return c >= 0x20 && c != 0x7f; });
}

}  // namespace

Client::Client(Load& load, unsigned int seed) : load_(load), random_(seed) {}

template <typename Number>
Number Client::chance(Number count) {
  return static_cast<Number>(random_() % static_cast<unsigned long>(count));
}

std::string Client::writtenName() { return kWrittenNames[chance(std::size(kWrittenNames))]; }

broker::ObjectPath Client::anyObject() { return known_.empty() ? broker::ObjectPath() : known_[chance(known_.size())]; }

void Client::complain(const std::string& what) {
  if (load_.problems++ < kMostComplaints) ADD_FAILURE() << what;
}

// An association that pairs the first of the host's settings ends with an exception if there is none.
void Client::checkStatus(const broker::Status& status, const std::string& request, std::initializer_list<int> codes) {
  if (status.ok() || std::find(codes.begin(), codes.end(), status.rc) != codes.end()) return;
  const bool lacksSettings = status.rc == kFailed && request.find("GenOrderedComponent") != std::string::npos &&
                             status.message.find("_M_range_check") != std::string::npos;
  if (lacksSettings) return;
  complain(request + ": " + std::to_string(status.rc) + " " + status.message);
}

void Client::checkPath(const broker::ObjectPath& path) {
  ++load_.objects;
  if (path.className.empty() || path.nameSpace != kSpace || path.keys.empty()) complain("a path of " + path.className);
  for (const broker::NamedValue& key : path.keys) {
    if (key.value.isNull || !isPrintable(key.value.asText())) complain(path.className + ": key " + key.name);
  }
  if (known_.size() < kMostKnown) {
    known_.push_back(path);
  } else {
    known_[chance(kMostKnown)] = path;
  }
}

// The node's values are written as a whole. A file is not: a reader may find it empty or incomplete.
void Client::checkTexts(const broker::Instance& instance) {
  const bool isOfFile = instance.path.className == "ZORVA_DNSSettingData";
  for (const char* name : {"DomainName", "Hostname", "RequestedHostname"}) {
    const broker::Value* value = instance.property(name);
    if (value == nullptr || value->isNull) continue;
    const std::string text(value->asText());
    const auto isOne = [&](const std::string& written) {
      return isOfFile ? written.starts_with(text) : written == text;
    };
    const bool isKnown = std::any_of(std::begin(kWrittenNames), std::end(kWrittenNames), isOne) ||
                         std::any_of(load_.namesAtFirst.begin(), load_.namesAtFirst.end(), isOne);
    if (!isKnown) complain(instance.path.className + "." + name + ": " + text);
  }
}

zorva::broker::InstanceSink Client::instances() {
  return [this](const broker::Instance& instance) {
    if (instance.declaration == nullptr) complain("an instance without class");
    checkPath(instance.path);
    if (instance.path.className.starts_with("ZORVA_DNS")) checkTexts(instance);
    return true;
  };
}

zorva::broker::PathSink Client::paths() {
  return [this](const broker::ObjectPath& path) {
    checkPath(path);
    return true;
  };
}

std::vector<broker::ObjectPath> Client::names(const char* className) {
  std::vector<broker::ObjectPath> all;
  const broker::Status status =
      load_.broker.enumerateInstanceNames(kSpace, className, [&](const broker::ObjectPath& path) {
        all.push_back(path);
        return true;
      });
  checkStatus(status, className, {});
  return all;
}

void Client::read() {
  ++load_.reads;
  const char* const className = kClasses[chance(std::size(kClasses))];
  const broker::Status status =
      chance(2) == 0 ? load_.broker.enumerateInstances(kSpace, className, broker::Selection(), instances())
                     : load_.broker.enumerateInstanceNames(kSpace, className, paths());
  checkStatus(status, className, {});
}

void Client::readOne() {
  const broker::ObjectPath path = anyObject();
  if (path.className.empty()) return read();
  ++load_.reads;
  const auto instance = load_.broker.getInstance(path, broker::Selection());
  checkStatus(instance ? broker::Status() : instance.error(), "GetInstance of " + path.className, {kNotFound});
  if (instance) instances()(*instance);
}

void Client::traverse() {
  const broker::ObjectPath path = anyObject();
  if (path.className.empty()) return read();
  ++load_.traversals;
  const std::size_t associations = std::size(kClasses) - kPlainClasses;
  broker::AssociationFilter filter;
  if (chance(2) == 0) filter.associationClass = kClasses[kPlainClasses + chance(associations)];
  broker::Status status;
  switch (chance(4)) {
    case 0:
      status = load_.broker.associators(path, filter, broker::Selection(), instances());
      break;
    case 1:
      status = load_.broker.associatorNames(path, filter, paths());
      break;
    case 2:
      status = load_.broker.references(path, filter, broker::Selection(), instances());
      break;
    default:
      status = load_.broker.referenceNames(path, filter, paths());
  }
  checkStatus(status, "associations of " + path.className + " by " + filter.associationClass, {});
}

void Client::change() {
  const char* const className = std::array{kClasses[0], kClasses[2], kClasses[3]}[chance(3U)];
  const std::vector<broker::ObjectPath> all = names(className);
  if (all.empty()) return;
  ++load_.changes;
  broker::Instance instance;
  instance.path = all[chance(all.size())];
  const auto set = [&](const char* name, broker::Value value) {
    instance.properties.push_back({name, std::move(value)});
  };
  if (className == kClasses[0]) set("Hostname", broker::Value::text(writtenName()));
  if (className == kClasses[2]) set("RequestedHostname", broker::Value::text(writtenName()));
  if (className != kClasses[3]) set("DomainName", broker::Value::text(writtenName()));
  if (className == kClasses[2]) set("DNSServerAddresses", broker::Value::textArray({"192.0.2.1", "192.0.2.2"}));
  if (className != kClasses[2]) set("DNSSuffixesToAppend", broker::Value::textArray({writtenName(), writtenName()}));
  if (className != kClasses[0]) set("ConfigurationName", broker::Value::text("configuration"));
  const broker::Status status = load_.broker.modifyInstance(instance, std::nullopt);
  // The interface of a setting may be removed by now.
  checkStatus(status, std::string("ModifyInstance of ") + className, {kFailed, kNotFound});
}

void Client::invoke() {
  const std::vector<broker::ObjectPath> all = names(kClasses[0]);
  if (all.empty()) return;
  ++load_.methods;
  struct Method {
    const char* name;
    broker::NamedValue argument;
  };
  const Method methods[] = {
      {"SetDNSDomain", {"DNSDomain", broker::Value::text(writtenName())}},
      {"SetDNSServerSearchOrder", {"DNSServerSearchOrder", broker::Value::textArray({"192.0.2.1"})}},
      {"SetDNSSuffixSearchOrder", {"DNSDomainSuffixSearchOrder", broker::Value::textArray({writtenName()})}},
  };
  const Method& method = methods[chance(std::size(methods))];
  const auto result = load_.broker.invokeMethod(all[chance(all.size())], method.name, {method.argument});
  checkStatus(result ? broker::Status() : result.error(), method.name, {});
  if (!result) return;
  const auto* value = std::get_if<std::uint64_t>(&result->returnValue.scalar);
  if (value == nullptr || *value > 1) complain(std::string(method.name) + " gives neither 0 nor 1");
}

void Client::request() {
  const unsigned int kind = chance(10U);
  if (kind < 3) return read();
  if (kind < 5) return readOne();
  if (kind < 8) return traverse();
  if (kind < 9) return change();
  invoke();
}

}  // namespace ZV::Test
