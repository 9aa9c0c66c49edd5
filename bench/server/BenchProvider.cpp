// A provider that does almost no work itself, so that the cost of the server and its broker is measured: each instance
// has fifteen properties, four of them keys, of the types that a protocol endpoint has.

#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <charconv>
#include <cstring>

namespace {

const CMPIBroker* broker = nullptr;

constexpr CMPIStatus kOk{CMPI_RC_OK, nullptr};

int countOf(const char* className) {
  if (std::strcmp(className, "Bench_Few") == 0) return 4;
  return std::strcmp(className, "Bench_Many") == 0 ? 1000 : 10000;
}

const char* nameOf(const CMPIObjectPath* path) {
  return path->ft->getClassName(path, nullptr)->ft->getCharPtr(path->ft->getClassName(path, nullptr), nullptr);
}

const char* nameSpaceOf(const CMPIObjectPath* path) {
  return path->ft->getNameSpace(path, nullptr)->ft->getCharPtr(path->ft->getNameSpace(path, nullptr), nullptr);
}

struct Text {
  const char* name;
  const char* value;
};

constexpr Text kKeys[] = {{"SystemCreationClassName", "Bench_ComputerSystem"},
                          {"SystemName", "host1.example.org"},
                          {"CreationClassName", "Bench_Endpoint"}};
constexpr Text kTexts[] = {{"ElementName", "An endpoint of the benchmark"},
                           {"Description", "Says nothing that one would want to know"},
                           {"Hostname", "host1"},
                           {"DomainName", "example.org"},
                           {"OtherTypeDescription", "DNS"}};

CMPIObjectPath* pathOf(const CMPIObjectPath* like, const char* name) {
  CMPIObjectPath* path = broker->eft->newObjectPath(broker, nameSpaceOf(like), nameOf(like), nullptr);
  for (const Text& each : kKeys) {
    path->ft->addKey(path, each.name, reinterpret_cast<const CMPIValue*>(each.value), CMPI_chars);
  }
  path->ft->addKey(path, "Name", reinterpret_cast<const CMPIValue*>(name), CMPI_chars);
  return path;
}

void setNumbers(CMPIInstance* instance, int number) {
  const auto small = static_cast<CMPIUint16>(number % 7);
  const auto* value = reinterpret_cast<const CMPIValue*>(&small);
  instance->ft->setProperty(instance, "EnabledState", value, CMPI_uint16);
  instance->ft->setProperty(instance, "RequestedState", value, CMPI_uint16);
  instance->ft->setProperty(instance, "ProtocolIFType", value, CMPI_uint16);
  const auto large = static_cast<CMPIUint64>(number) * 1000;
  instance->ft->setProperty(instance, "Speed", reinterpret_cast<const CMPIValue*>(&large), CMPI_uint64);
  const CMPIBoolean yes = 1;
  instance->ft->setProperty(instance, "AppendSuffixes", reinterpret_cast<const CMPIValue*>(&yes), CMPI_boolean);
}

CMPIInstance* instanceOf(const CMPIObjectPath* like, int number) {
  char name[32] = "eth";
  std::to_chars(name + 3, name + sizeof name - 1, number);
  // The path contains the keys.
  CMPIInstance* instance = broker->eft->newInstance(broker, pathOf(like, name), nullptr);
  for (const Text& each : kTexts) {
    instance->ft->setProperty(instance, each.name, reinterpret_cast<const CMPIValue*>(each.value), CMPI_chars);
  }
  setNumbers(instance, number);
  CMPIArray* suffixes = broker->eft->newArray(broker, 2, CMPI_chars, nullptr);
  suffixes->ft->setElementAt(suffixes, 0, reinterpret_cast<const CMPIValue*>("example.org"), CMPI_chars);
  suffixes->ft->setElementAt(suffixes, 1, reinterpret_cast<const CMPIValue*>("example.net"), CMPI_chars);
  CMPIValue value;
  value.array = suffixes;
  instance->ft->setProperty(instance, "Suffixes", &value, CMPI_charsA);
  return instance;
}

CMPIStatus cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) { return kOk; }

CMPIStatus names(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path) {
  const int count = countOf(nameOf(path));
  for (int i = 0; i < count; ++i) {
    char name[32] = "eth";
    std::to_chars(name + 3, name + sizeof name - 1, i);
    result->ft->returnObjectPath(result, pathOf(path, name));
  }
  result->ft->returnDone(result);
  return kOk;
}

CMPIStatus instances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                     const char**) {
  const int count = countOf(nameOf(path));
  for (int i = 0; i < count; ++i) result->ft->returnInstance(result, instanceOf(path, i));
  result->ft->returnDone(result);
  return kOk;
}

CMPIInstanceMIFT table = {CMPICurrentVersion,
                          CMPICurrentVersion,
                          "instanceBench",
                          cleanup,
                          names,
                          instances,
                          nullptr,
                          nullptr,
                          nullptr,
                          nullptr,
                          nullptr};

}  // namespace

CMPI_EXTERN_C __attribute__((visibility("default"))) CMPIInstanceMI* Bench_Create_InstanceMI(const CMPIBroker* mb,
                                                                                             const CMPIContext*,
                                                                                             CMPIStatus*) {
  static CMPIInstanceMI mi = {nullptr, &table};
  broker = mb;
  return &mi;
}
