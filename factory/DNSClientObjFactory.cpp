#include "factory/DNSClientObjFactory.h"

#include <Locale.h>
#include <PlatformUtilities.h>
#include <StringConversion.h>
#include <strings.h>

#include "factory/ClassNames.h"
#include "factory/CmpiSupport.h"
#include "factory/SettingProperties.h"
#include "trace/Trace.h"

namespace ZV {

const std::string loggerDNSObjFactory = "Zorvagent.DNSObjFactory";

namespace {

constexpr unsigned long kDNSResourceLibrary = 2;

// The host's own endpoints are on the system with the given name; those of the service processor are on a system with a
// fixed name.
std::string systemNameFor(const DNSClient& client) {
  return strcasecmp(client.getDNSSCCN().c_str(), computerSystemClass) == 0 ? getSystemName() : "BMC:-1";
}

constexpr const char* kSystemKeys[] = {"SystemCreationClassName", "CreationClassName", "SystemName", "Name", nullptr};

}  // namespace

const std::string& DNSClientObjFactory::localised(const wchar_t* key) {
  const auto [place, isNew] = texts.try_emplace(key);
  if (isNew) {
    place->second =
        make_string(ResourceString(Locale::getResourceLibrary(kDNSResourceLibrary, Locale::getLanguageId()), key));
  }
  return place->second;
}

// If reading the endpoints fails, the records read before are used.
DNSClientObjFactory::DNSClientObjFactory() {
  if (getDNSClientInstances(dnsClientMap) == 0) getDNSServerInstances(dnsServerMap);
}

unsigned short DNSClientObjFactory::getAllDNSClientCMPIObjPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                                std::vector<CMPIObjectPath*>& objectPaths,
                                                                CMPIStatus* status) {
  logEntry(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " objectPaths=", &objectPaths,
           " status=", status);
  if (dnsClientMap.empty()) {
    logError(loggerDNSObjFactory, ZV_HERE, "No ObjectPath Found");
    return 1;
  }
  const std::string nameSpace = nameSpaceOf(ref, status);
  for (const auto& [name, client] : dnsClientMap) {
    CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsProtocolEndPointClass, status);
    if (!isGood(path)) {
      logError(loggerDNSObjFactory, ZV_HERE, "Create CMPIObjectPath                     failed for DNSClientClass.");
      return 2;
    }
    addTextKey(path, "SystemCreationClassName", client.getDNSSCCN());
    addTextKey(path, "CreationClassName", dnsProtocolEndPointClass);
    addTextKey(path, "SystemName", systemNameFor(client));
    addTextKey(path, "Name", client.getDNSClientName());
    objectPaths.push_back(path);
  }
  return 0;
}

namespace {

// False if the broker makes no array.
bool setSuffixes(const CMPIBroker* broker, const CMPIInstance* instance, const std::vector<std::string>& suffixes,
                 const char* function, CMPIStatus* rc) {
  const unsigned short dnsSuffixesSize = count16(suffixes);
  CMPIArray* array =
      newPropertyArray(broker, "DNSSuffixesToAppend", dnsSuffixesSize, CMPI_string, ZV_HERE_IN(function), rc);
  if (array == nullptr) return false;
  logVariable(loggerDNSObjFactory, ZV_HERE_IN(function), "dnsSuffixesSize", dnsSuffixesSize);
  for (unsigned short i = 0; i < dnsSuffixesSize; ++i) {
    CMPIString* suffix = newString(broker, suffixes[i], rc);
    if (suffix != nullptr) *rc = setTextElement(array, i, suffix);
  }
  setArray(instance, "DNSSuffixesToAppend", array, CMPI_stringA);
  return true;
}

void setKeys(const CMPIInstance* instance, const DNSClient& dc) {
  setText(instance, "SystemCreationClassName", dc.getDNSSCCN());
  setText(instance, "CreationClassName", dnsProtocolEndPointClass);
  setText(instance, "SystemName", systemNameFor(dc));
  setText(instance, "Name", dc.getDNSClientName());
}

}  // namespace

CMPIInstance* DNSClientObjFactory::makeDNSClientInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                         DNSClient dc, const char** properties, bool isObjPath,
                                                         CMPIStatus* rc) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " dc=", &dc,
                     " properties=", properties, " isObjPath=", isObjPath, " rc=", rc);
  const WantedProperties wanted(properties, isObjPath);

  CMPIInstance* instance =
      newHostInstance(broker, nameSpaceOf(ref, rc), dnsProtocolEndPointClass, properties, isObjPath, kSystemKeys);
  if (!isGood(instance)) {
    flow.exit();
    return instance;
  }

  setKeys(instance, dc);
  if (wanted("Caption")) setText(instance, "Caption", localised(L"MSGID_DNS_CLIENT_CAPTION"));
  if (wanted("Description")) setText(instance, "Description", localised(L"MSGID_DNS_CLIENT_DESCRIPTION"));
  if (wanted("ProtocolIFType")) setUint16(instance, "ProtocolIFType", dc.getprotocolIFType());
  if (wanted("ElementName")) setText(instance, "ElementName", dc.getElementName());
  if (wanted("Hostname")) setText(instance, "Hostname", dc.getHostName());
  if (wanted("NameFormat")) setText(instance, "NameFormat", dc.getNameFormat());
  if (wanted("OtherTypeDescription")) setText(instance, "OtherTypeDescription", dc.getOtherTypeDescription());
  if (wanted("DomainName")) setText(instance, "DomainName", dc.getDomainName());
  if (wanted("DNSSuffixesToAppend") &&
      !setSuffixes(broker, instance, dc.getDNSSuffixesToAppend(), static_cast<const char*>(__func__), rc)) {
    return instance;
  }
  if (wanted("EnabledState")) setUint16(instance, "EnabledState", dc.getEnabledState());
  if (wanted("RequestedState")) setUint16(instance, "RequestedState", dc.getRequestedState());
  flow.exit();
  return instance;
}

unsigned short DNSClientObjFactory::getOneDNSClientCMPIInstance(const CMPIBroker* broker,
                                                                const CMPIObjectPath* objectPath, CMPIString* key,
                                                                const char** properties,
                                                                std::vector<CMPIInstance*>& instances,
                                                                CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " objectPath=", objectPath, " key=", key,
                     " properties=", properties, " instances=", &instances, " status=", status);
  const auto found = dnsClientMap.find(textOf(key, status));
  if (found == dnsClientMap.end()) {
    logError(loggerDNSObjFactory, ZV_HERE, "No DNSClient instance found in the Map");
    return 1;
  }
  instances.push_back(makeDNSClientInstance(broker, objectPath, found->second, properties, false, status));
  flow.exit();
  return 0;
}

unsigned short DNSClientObjFactory::getAllDNSClientCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                                 const char** properties, bool isObjPath,
                                                                 std::vector<CMPIInstance*>& instances,
                                                                 CMPIStatus* rc) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
                     " isObjPath=", isObjPath, " instances=", &instances, " rc=", rc);
  unsigned short failed = 0;
  if (dnsClientMap.empty()) {
    logError(loggerDNSObjFactory, ZV_HERE, "***No instance found***");
    failed = 1;
  }
  for (const auto& [name, client] : dnsClientMap) {
    instances.push_back(makeDNSClientInstance(broker, ref, client, properties, isObjPath, rc));
  }
  flow.exit();
  return failed;
}

unsigned short DNSClientObjFactory::getAllDNSServerCMPIObjPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                                std::vector<CMPIObjectPath*>& objectPaths,
                                                                CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " objectPaths=", &objectPaths,
                     " status=", status);
  if (dnsServerMap.empty()) {
    logError(loggerDNSObjFactory, ZV_HERE, "No ObjectPath found");
    return 1;
  }
  const std::string nameSpace = nameSpaceOf(ref, status);
  for (const auto& [address, server] : dnsServerMap) {
    CMPIObjectPath* path = newHostPath(broker, nameSpace, remoteServiceAccessPointClass, status);
    if (!isGood(path)) {
      logError(loggerDNSObjFactory, ZV_HERE, "Create CMPIObjectPath                     failed for DNSServerClass.");
      return 2;
    }
    addTextKey(path, "SystemCreationClassName", computerSystemClass);
    addTextKey(path, "CreationClassName", remoteServiceAccessPointClass);
    addTextKey(path, "SystemName", getSystemName());
    addTextKey(path, "Name", server.getAccessInfo());
    objectPaths.push_back(path);
  }
  flow.exit();
  return 0;
}

CMPIInstance* DNSClientObjFactory::makeDNSServerInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                         DNSServer ds, const char** properties, bool isObjPath,
                                                         CMPIStatus* rc) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " ds=", &ds,
                     " properties=", properties, " isObjPath=", isObjPath, " rc=", rc);
  const WantedProperties wanted(properties, isObjPath);

  CMPIInstance* instance =
      newHostInstance(broker, nameSpaceOf(ref, rc), remoteServiceAccessPointClass, properties, isObjPath, kSystemKeys);
  if (!isGood(instance)) return instance;

  setText(instance, "SystemCreationClassName", computerSystemClass);
  setText(instance, "CreationClassName", remoteServiceAccessPointClass);
  setText(instance, "SystemName", getSystemName());
  setText(instance, "Name", ds.getAccessInfo());
  if (wanted("Caption")) setText(instance, "Caption", localised(L"MSGID_DNS_SERVER_CAPTION"));
  if (wanted("Description")) setText(instance, "Description", localised(L"MSGID_DNS_SERVER_DESCRIPTION"));
  if (wanted("NameFormat")) setText(instance, "NameFormat", ds.getNameFormat());
  if (wanted("AccessContext")) setUint16(instance, "AccessContext", ds.getAccessContext());
  if (wanted("AccessInfo")) setText(instance, "AccessInfo", ds.getAccessInfo());
  if (wanted("InfoFormat")) setUint16(instance, "InfoFormat", ds.getInfoFormat());
  if (wanted("OrderOfAccess")) setUint16(instance, "OrderOfAccess", ds.getOrderOfAccess());
  if (wanted("ElementName")) setText(instance, "ElementName", ds.getElementName());
  flow.exit();
  return instance;
}

unsigned short DNSClientObjFactory::getOneDNSServerCMPIInstance(const CMPIBroker* broker,
                                                                const CMPIObjectPath* objectPath, CMPIString* key,
                                                                const char** properties,
                                                                std::vector<CMPIInstance*>& instances,
                                                                CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " objectPath=", objectPath, " key=", key,
                     " properties=", properties, " instances=", &instances, " status=", status);
  const auto found = dnsServerMap.find(textOf(key, status));
  if (found == dnsServerMap.end()) {
    logError(loggerDNSObjFactory, ZV_HERE, "No DNS Server instance found in the map");
    return 1;
  }
  instances.push_back(makeDNSServerInstance(broker, objectPath, found->second, properties, false, status));
  flow.exit();
  return 0;
}

unsigned short DNSClientObjFactory::getAllDNSServerCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                                 const char** properties, bool isObjPath,
                                                                 std::vector<CMPIInstance*>& instances,
                                                                 CMPIStatus* rc) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
                     " isObjPath=", isObjPath, " instances=", &instances, " rc=", rc);
  if (dnsServerMap.empty()) {
    logError(loggerDNSObjFactory, ZV_HERE, "***No instance found***");
    return 1;
  }
  for (const auto& [address, server] : dnsServerMap) {
    instances.push_back(makeDNSServerInstance(broker, ref, server, properties, isObjPath, rc));
  }
  flow.exit();
  return 0;
}

unsigned short DNSClientObjFactory::getOrderOfAccess(const CMPIBroker* _broker, CMPIObjectPath* dnsServer,
                                                     CMPIStatus* rc) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " _broker=", _broker, " dnsServer=", dnsServer, " rc=", rc);
  const std::string serverName = keyText(dnsServer, "Name", rc);
  logVariable(loggerDNSObjFactory, ZV_HERE, "serverName", serverName);
  const auto found = dnsServerMap.find(serverName);
  if (found != dnsServerMap.end()) return found->second.getOrderOfAccess();
  flow.exit();
  return 1;  // same as for the first server: the caller cannot see that it was not found
}

}  // namespace ZV
