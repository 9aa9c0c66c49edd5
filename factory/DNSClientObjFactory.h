// One CIM operation's view of the host's DNS endpoints and servers, and its maker of CMPI objects from them.
#pragma once

#include <cmpidt.h>

#include <map>
#include <string>
#include <vector>

#include "factory/FactoryLog.h"
#include "model/DNSClient.h"
#include "model/DNSServer.h"

namespace ZV {

// Built on the stack of one operation, which it belongs to; building it reads the host. The CMPI objects that it makes
// belong to the broker.
//
// Functions that return an unsigned short give 0 for success; what else they give is a failure that is only logged,
// never a code in the status. status or rc is handed to the broker's calls and must not be null; ref gives the
// namespace of every path that is made, this system's name is its host. What cannot be made stands in the result as the
// broker gave it.
class DNSClientObjFactory {
 public:
  DNSClientObjFactory();

  unsigned short getNumberOfDNSClientInstances() const { return static_cast<unsigned short>(dnsClientMap.size()); }
  unsigned short getNumberOfDNSServerInstances() const { return static_cast<unsigned short>(dnsServerMap.size()); }

  // Endpoints, ZORVA_DNSProtocolEndPoint, in the order of their names.
  // 1: there is none. 2: a path could not be made; those before it are in objectPaths.
  unsigned short getAllDNSClientCMPIObjPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                             std::vector<CMPIObjectPath*>& objectPaths, CMPIStatus* status);
  // 1: there is none.
  unsigned short getAllDNSClientCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                              const char** properties, bool isObjPath,
                                              std::vector<CMPIInstance*>& instances, CMPIStatus* rc);
  // 1: no endpoint of that name.
  unsigned short getOneDNSClientCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* objectPath,
                                             CMPIString* key, const char** properties,
                                             std::vector<CMPIInstance*>& instances, CMPIStatus* status);
  // An instance with its four keys and the properties that the list names: without a list all of them, or none where
  // isObjPath asks for the keys alone. Null, or an instance without a handle, where none could be made.
  CMPIInstance* makeDNSClientInstance(const CMPIBroker* broker, const CMPIObjectPath* ref, DNSClient dc,
                                      const char** properties, bool isObjPath, CMPIStatus* rc);

  // Servers, ZORVA_RemoteServiceAccessPoint, in the order of their addresses; as the endpoints.
  unsigned short getAllDNSServerCMPIObjPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                             std::vector<CMPIObjectPath*>& objectPaths, CMPIStatus* status);
  unsigned short getAllDNSServerCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                              const char** properties, bool isObjPath,
                                              std::vector<CMPIInstance*>& instances, CMPIStatus* rc);
  unsigned short getOneDNSServerCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* objectPath,
                                             CMPIString* key, const char** properties,
                                             std::vector<CMPIInstance*>& instances, CMPIStatus* status);
  CMPIInstance* makeDNSServerInstance(const CMPIBroker* broker, const CMPIObjectPath* ref, DNSServer ds,
                                      const char** properties, bool isObjPath, CMPIStatus* rc);
  // The place in the search order of the server at that path; 1, as the first server's, where it is not known.
  unsigned short getOrderOfAccess(const CMPIBroker* _broker, CMPIObjectPath* dnsServer, CMPIStatus* rc);

  // The extrinsic methods of the endpoint. They answer 0 for done, 1 where the endpoint is not known or its record
  // refused, and change nothing on the host. ref names the endpoint by its key Name; one without it is an empty record.
  unsigned int setDNSDomainName(const CMPIBroker* broker, const CMPIObjectPath* ref, const CMPIString* domainName,
                                const CMPIContext* ctx, CMPIStatus* rc);
  unsigned int setDNSServerSearchOrder(const CMPIBroker* broker, const CMPIObjectPath* ref, CMPIData serverAddrs,
                                       const CMPIContext* ctx, CMPIStatus* rc);
  unsigned int setDNSSuffixesSearchOrder(const CMPIBroker* broker, const CMPIObjectPath* ref, CMPIData suffixes,
                                         const CMPIContext* ctx, CMPIStatus* rc);

  // The class at the far end of an association from the class of ref, by exact names; empty where there is none.
  // _RefRightClass is told in the log and decides nothing.
  const char* get_assoc_targetClass_Name(const CMPIBroker* _broker, const CMPIObjectPath* ref,
                                         const char* _RefLeftClass, const char* _RefRightClass, CMPIStatus* rc);
  // A path of that class without keys; null where there is none.
  CMPIObjectPath* get_assoc_targetClass_ObjectPath(const CMPIBroker* _broker, const CMPIObjectPath* ref,
                                                   const char* _RefLeftClass, const char* _RefRightClass,
                                                   CMPIStatus* rc);
  // The endpoint of an interface goes to instance, which stays as it is where no endpoint has that name. Always 0.
  unsigned short getDNSClientCMPIInstanceFromIPInterface(const CMPIBroker* _broker, const CMPIObjectPath* ref,
                                                         const std::string& interfaceName, CMPIInstance*& instance,
                                                         bool isObjPath, const char** properties, CMPIStatus* rc);

 private:
  // False where the path names an endpoint that is not known.
  bool copyOfNamedClient(const CMPIObjectPath* ref, DNSClient& client, CMPIStatus* rc) const;

  std::map<std::string, DNSClient> dnsClientMap;
  std::map<std::string, DNSServer> dnsServerMap;
};

}  // namespace ZV
