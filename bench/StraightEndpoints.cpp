#include "bench/StraightEndpoints.h"

#include <cmpidt.h>
#include <cmpift.h>

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

#include "cmpi/support/ProviderFrame.h"

namespace {

constexpr const char* kClass = "ZORVA_DNSProtocolEndPoint";
constexpr const char* kHost = "host1";
constexpr const char* kKeys[] = {"SystemCreationClassName", "CreationClassName", "SystemName", "Name", nullptr};

const CMPIBroker* straightBroker = nullptr;
std::vector<std::string> names;

const CMPIValue* asValue(const char* text) { return reinterpret_cast<const CMPIValue*>(text); }

void setText(CMPIInstance* instance, const char* property, const char* text) {
  instance->ft->setProperty(instance, property, asValue(text), CMPI_chars);
}

void setNumber(CMPIInstance* instance, const char* property, CMPIUint16 number) {
  CMPIValue value{};
  value.uint16 = number;
  instance->ft->setProperty(instance, property, &value, CMPI_uint16);
}

void setSuffix(CMPIInstance* instance, CMPIStatus* status) {
  CMPIArray* array = straightBroker->eft->newArray(straightBroker, 1, CMPI_string, status);
  CMPIValue value{};
  value.string = straightBroker->eft->newString(straightBroker, "example.org", status);
  *status = array->ft->setElementAt(array, 0, &value, CMPI_string);
  value.array = array;
  instance->ft->setProperty(instance, "DNSSuffixesToAppend", &value, CMPI_stringA);
}

CMPIInstance* makeInstance(const CMPIObjectPath* ref, const char* name, const char** properties, CMPIStatus* status) {
  CMPIString* nameSpaceText = ref->ft->getNameSpace(ref, status);
  const char* nameSpace = nameSpaceText->ft->getCharPtr(nameSpaceText, status);
  CMPIObjectPath* path = straightBroker->eft->newObjectPath(straightBroker, nameSpace, kClass, nullptr);
  path->ft->setNameSpace(path, nameSpace);
  path->ft->setHostname(path, kHost);
  CMPIInstance* instance = straightBroker->eft->newInstance(straightBroker, path, nullptr);
  instance->ft->setPropertyFilter(instance, properties, const_cast<const char**>(kKeys));
  setText(instance, "SystemCreationClassName", "ZORVA_ComputerSystem");
  setText(instance, "CreationClassName", kClass);
  setText(instance, "SystemName", kHost);
  setText(instance, "Name", name);
  setText(instance, "Caption", "DNS Client");
  setText(instance, "Description", "DNS client of a network interface");
  setNumber(instance, "ProtocolIFType", 1);
  setText(instance, "ElementName", name);
  setText(instance, "Hostname", kHost);
  setText(instance, "NameFormat", "NICName");
  setText(instance, "OtherTypeDescription", "DNS");
  setText(instance, "DomainName", "example.org");
  setSuffix(instance, status);
  setNumber(instance, "EnabledState", 2);
  setNumber(instance, "RequestedState", 12);
  return instance;
}

CMPIStatus cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) { return {CMPI_RC_OK, nullptr}; }

CMPIStatus enumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* ref,
                         const char** properties) {
  CMPIStatus status{CMPI_RC_OK, nullptr};
  std::vector<CMPIInstance*> instances;
  instances.reserve(names.size());
  for (const std::string& name : names) instances.push_back(makeInstance(ref, name.c_str(), properties, &status));
  for (const CMPIInstance* instance : instances) result->ft->returnInstance(result, instance);
  result->ft->returnDone(result);
  return status;
}

CMPIInstanceMIFT table = zorva::cmpi::tableOf<CMPIInstanceMIFT>(
    zorva::cmpi::kTableVersion, zorva::cmpi::kTableVersion, "instanceStraightEndpoints", cleanup, nullptr,
    enumInstances, nullptr, nullptr, nullptr, nullptr, nullptr);

}  // namespace

ZORVA_CREATE_MI(Instance, StraightEndpoints, table, straightBroker)

zorva::broker::BrokerOptions straightEndpoints() {
  zorva::broker::BrokerOptions options;
  options.registry = zorva::broker::ProviderRegistry();
  options.registry.add({kClass, "StraightEndpoints", "", zorva::broker::InstanceMi});
  options.linked.push_back(
      {"StraightEndpoints_Create_InstanceMI", reinterpret_cast<void (*)()>(&StraightEndpoints_Create_InstanceMI)});
  return options;
}

void setStraightEndpoints(std::size_t count) {
  names.clear();
  for (std::size_t i = 0; i < count; ++i) names.push_back("eth" + std::to_string(i));
  std::sort(names.begin(), names.end());
}
