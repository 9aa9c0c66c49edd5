#pragma once

// One DNS client endpoint: the DNS view of one network interface.

#include <map>
#include <string>
#include <vector>

namespace ZV {

/// A value record; it is copied for every use. The bool of a setter says whether the value is usable; it is stored in
/// any case. Numbers that the host does not provide are 0.
class DNSClient {
 public:
  std::string getDNSClientName() const { return dnsClientName; }
  std::string getDNSSCCN() const { return dnsSCCN; }
  std::string getHostName() const { return hostName; }
  std::string getDomainName() const { return domainName; }
  std::string getElementName() const { return elementName; }
  unsigned short getprotocolIFType() const { return protocolIFType; }
  unsigned short getEnabledState() const { return enabledState; }
  unsigned short getRequestedState() const { return requestedState; }
  std::vector<std::string> getDNSSuffixesToAppend() const { return dnsSuffixesToAppend; }

  /// These store their value when it is first read, so they are not const.
  std::string getNameFormat();            ///< "NICName"
  std::string getOtherTypeDescription();  ///< "DNS"

  bool setDNSClientName(std::string name);
  bool setHostName(std::string name);
  bool setElementName(std::string name);
  bool setDomainName(std::string domain);  ///< blanks and tabs at its ends are stripped first
  bool setDNSSCCN(std::string className);

  /// The type is ignored: the endpoint's ProtocolIFType is always 1, Other.
  bool setprotocolIFType(unsigned int type);

  /// Takes the host's raw state and stores CIM's EnabledState: 1 gives 2 (Enabled), 12 gives 6 (Enabled but Offline),
  /// 16 gives 3 (Disabled), any other 5 (Not Applicable).
  bool setEnabledState(unsigned short rawState);

  /// The state is ignored: RequestedState is always 12, Not Applicable.
  bool setRequestedState(unsigned short rawState);

  bool setDNSSuffixesToAppend(std::vector<std::string> suffixes);

  /// The implementation of the extrinsic methods. They return 0 for done and 1 for failed, and change nothing on the
  /// host.
  int setDNSDomain(std::string domain);  ///< stores it only in this record, unstripped
  int setDNSSuffixSearchOrder(std::vector<std::string> suffixes);
  int setDNSServerSearchOrder(std::vector<std::string> addresses);

 private:
  std::string dnsClientName;
  std::string dnsSCCN;
  std::string nameFormat;
  unsigned short protocolIFType = 0;
  std::string hostName;
  std::string otherTypeDescription;
  std::string domainName;
  std::vector<std::string> dnsSuffixesToAppend;
  unsigned short enabledState = 0;
  unsigned short requestedState = 0;
  std::string elementName;
};

/// Adds a record for each network interface node to dnsClientMap, keyed by the interface's name; the map is not emptied
/// first. Of several nodes with one name the last one is kept. Returns 0 on success. Returns 1 if the tree has no such
/// node, or if it threw; the map then contains the records read before. An exception that is not a std::exception
/// leaves the function.
unsigned short getDNSClientInstances(std::map<std::string, DNSClient>& dnsClientMap);

}  // namespace ZV
