// A CMPI provider on the agent: EXAMPLE_Interface, an instance for each network interface of the host.

#include <Instrumentation.h>
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <string>

using namespace ZV::NodeLexicon;

static const CMPIBroker* broker = nullptr;

static CMPIStatus returnPath(const CMPIResult* result, CMPIObjectPath* path, const ZV::Instrumentation&) {
  return CMReturnObjectPath(result, path);
}

static CMPIStatus returnInstance(const CMPIResult* result, CMPIObjectPath* path, const ZV::Instrumentation& node) {
  CMPIStatus status = {CMPI_RC_OK, nullptr};
  CMPIInstance* instance = CMNewInstance(broker, path, &status);
  if (instance == nullptr) return status;
  unsigned int state = 0;
  const CMPIBoolean isUp = node.getProperty(PROP_ENABLED_STATE, state) && state == 1;
  CMSetProperty(instance, "IsUp", &isUp, CMPI_boolean);  // the keys are in the instance already
  return CMReturnInstance(result, instance);
}

// Returns the interface of that name, or all without a name. With no such interface nothing is returned: not found.
template <typename Return>
static CMPIStatus forInterfaces(const CMPIResult* result, const CMPIObjectPath* ref, const char* wanted, Return give) {
  const CMPIString* nameSpace = CMGetNameSpace(ref, nullptr);
  ZV::Instrumentation node;
  for (node.selectNode(NODE_NETWORK_IP_CONFIG); node; ++node) {
    std::string name;
    if (!node.getProperty(PROP_NAME, name) || (wanted != nullptr && name != wanted)) continue;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIObjectPath* path = CMNewObjectPath(broker, CMGetCharsPtr(nameSpace, nullptr), "EXAMPLE_Interface", &status);
    if (path == nullptr) return status;
    CMAddKey(path, "Name", name.c_str(), CMPI_chars);
    status = give(result, path, node);
    if (status.rc != CMPI_RC_OK) return status;
  }
  return CMReturnDone(result);
}

static CMPIStatus enumerateNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                 const CMPIObjectPath* ref) {
  return forInterfaces(result, ref, nullptr, returnPath);
}

static CMPIStatus enumerate(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* ref,
                            const char**) {
  return forInterfaces(result, ref, nullptr, returnInstance);
}

static CMPIStatus get(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* ref,
                      const char**) {
  const CMPIData key = CMGetKey(ref, "Name", nullptr);
  if (key.type != CMPI_string) CMReturn(CMPI_RC_ERR_INVALID_PARAMETER);
  return forInterfaces(result, ref, CMGetCharsPtr(key.value.string, nullptr), returnInstance);
}

static CMPIStatus cleanUp(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) { CMReturn(CMPI_RC_OK); }

// It only reads.
template <typename... Arguments>
static CMPIStatus refuse(Arguments...) {
  CMReturn(CMPI_RC_ERR_NOT_SUPPORTED);
}

static CMPIInstanceMIFT table = {CMPICurrentVersion,
                                 CMPICurrentVersion,
                                 "instanceExampleInterface",
                                 cleanUp,
                                 enumerateNames,
                                 enumerate,
                                 get,
                                 refuse,
                                 refuse,
                                 refuse,
                                 refuse};

extern "C" CMPIInstanceMI* ExampleInterfaceProvider_Create_InstanceMI(const CMPIBroker* server, const CMPIContext*,
                                                                      CMPIStatus*) {
  static CMPIInstanceMI provider = {nullptr, &table};
  broker = server;
  return &provider;
}
