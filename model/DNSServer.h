// One configured DNS server address.
#pragma once

#include <map>
#include <string>

namespace ZV {

// A value record; a copy is made for every use. The numbers that the host does not tell are 0 until first read.
class DNSServer {
 public:
  std::string getAccessInfo() const { return accessInfo; }
  void setAccessInfo(std::string address) { accessInfo = std::move(address); }

  // The 1-based place of the address in the list that named it first.
  unsigned short getOrderOfAccess() const { return orderOfAccess; }
  unsigned short setOrderOfAccess(unsigned short order);  // always 0

  // These write their field on read, which is why they are not const.
  unsigned short getAccessContext();  // 3: DNS Server
  unsigned short getInfoFormat();     // 4: IPv6 Address, where the address holds a ":"; else 3: IPv4 Address
  std::string getNameFormat();        // "DNSServer"
  std::string getElementName();       // the address

 private:
  std::string serverName;  // nothing sets it: a record is known by its address
  std::string nameFormat;
  std::string accessInfo;
  unsigned short accessContext = 0;
  unsigned short infoFormat = 0;
  unsigned short orderOfAccess = 1;
  std::string elementName;
};

// Adds a record for each server address of the host to dnsServerMap, keyed by the address; the map is not emptied
// first. A repeated address keeps its first record. 0 on success, 1 where the tree threw; the map then holds what was
// reached.
unsigned short getDNSServerInstances(std::map<std::string, DNSServer>& dnsServerMap);

}  // namespace ZV
