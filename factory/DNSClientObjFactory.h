#pragma once

// One CIM operation's view of the host's DNS endpoints and servers; makes CMPI objects from them.

#include <cmpidt.h>

#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "factory/FactoryLog.h"
#include "model/DNSClient.h"
#include "model/DNSServer.h"

namespace ZV {

/// Lives on the stack of one operation; its constructor reads the host. The CMPI objects that it makes belong to the
/// broker.
///
/// Functions that return an unsigned short return 0 for success. Any other value is a failure that is only logged,
/// never a code in the status. status or rc is passed to the broker's calls and must not be null. ref gives the
/// namespace of every path that is made; this system's name is its host. An object that cannot be made is in the result
/// as the broker returned it.
class DNSClientObjFactory {
 public:
  DNSClientObjFactory();

  unsigned short getNumberOfDNSClientInstances() const { return static_cast<unsigned short>(dnsClientMap.size()); }
  unsigned short getNumberOfDNSServerInstances() const { return static_cast<unsigned short>(dnsServerMap.size()); }

  /// Endpoints, ZORVA_DNSProtocolEndPoint, in the order of their names. 1: there is none. 2: a path could not be made;
  /// the earlier ones are in objectPaths.
  unsigned short getAllDNSClientCMPIObjPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                             std::vector<CMPIObjectPath*>& objectPaths, CMPIStatus* status);
  /// 1: there is none.
  unsigned short getAllDNSClientCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                              const char** properties, bool isObjPath,
                                              std::vector<CMPIInstance*>& instances, CMPIStatus* rc);
  /// 1: no endpoint of that name.
  unsigned short getOneDNSClientCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* objectPath,
                                             CMPIString* key, const char** properties,
                                             std::vector<CMPIInstance*>& instances, CMPIStatus* status);
  /// An instance with its four keys and the properties on the list. Without a list: all of them, or none if isObjPath
  /// requests only the keys. Null, or an instance without a handle, if none could be made.
  CMPIInstance* makeDNSClientInstance(const CMPIBroker* broker, const CMPIObjectPath* ref, DNSClient dc,
                                      const char** properties, bool isObjPath, CMPIStatus* rc);

  /// Servers, ZORVA_RemoteServiceAccessPoint, in the order of their addresses; otherwise like the endpoints.
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
  /// The position in the search order of the server at that path; 1, as for the first server, if it is not known.
  unsigned short getOrderOfAccess(const CMPIBroker* _broker, CMPIObjectPath* dnsServer, CMPIStatus* rc);

  /// The extrinsic methods of the endpoint. They return 0 for done, and 1 if the endpoint is not known or its record
  /// refused the value. They change nothing on the host. ref names the endpoint by its key Name; without the key an
  /// empty record is used.
  unsigned int setDNSDomainName(const CMPIBroker* broker, const CMPIObjectPath* ref, const CMPIString* domainName,
                                const CMPIContext* ctx, CMPIStatus* rc);
  unsigned int setDNSServerSearchOrder(const CMPIBroker* broker, const CMPIObjectPath* ref, CMPIData serverAddrs,
                                       const CMPIContext* ctx, CMPIStatus* rc);
  unsigned int setDNSSuffixesSearchOrder(const CMPIBroker* broker, const CMPIObjectPath* ref, CMPIData suffixes,
                                         const CMPIContext* ctx, CMPIStatus* rc);

  /// The class at the far end of an association from the class of ref, by exact names; empty if there is none.
  /// _RefRightClass is only logged.
  const char* get_assoc_targetClass_Name(const CMPIBroker* _broker, const CMPIObjectPath* ref,
                                         const char* _RefLeftClass, const char* _RefRightClass, CMPIStatus* rc);
  /// A path of that class without keys; null if there is none.
  CMPIObjectPath* get_assoc_targetClass_ObjectPath(const CMPIBroker* _broker, const CMPIObjectPath* ref,
                                                   const char* _RefLeftClass, const char* _RefRightClass,
                                                   CMPIStatus* rc);
  /// Stores the endpoint of an interface in instance; it is not changed if no endpoint has that name. Always 0.
  unsigned short getDNSClientCMPIInstanceFromIPInterface(const CMPIBroker* _broker, const CMPIObjectPath* ref,
                                                         const std::string& interfaceName, CMPIInstance*& instance,
                                                         bool isObjPath, const char** properties, CMPIStatus* rc);

 private:
  /// False if the path names an endpoint that is not known.
  bool copyOfNamedClient(const CMPIObjectPath* ref, DNSClient& client, CMPIStatus* rc) const;

  /// The text of that key in the host's language: it is the same in all objects of an operation.
  const std::string& localised(const wchar_t* key);

  std::map<std::wstring_view, std::string> texts;
  std::map<std::string, DNSClient> dnsClientMap;
  std::map<std::string, DNSServer> dnsServerMap;
};

}  // namespace ZV
