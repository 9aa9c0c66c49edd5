#pragma once

// One configured DNS server address.

#include <map>
#include <string>

namespace ZV {

/// A value record; it is copied for every use. Numbers that the host does not provide are 0 until first read.
class DNSServer {
 public:
  std::string getAccessInfo() const { return accessInfo; }
  void setAccessInfo(std::string address) { accessInfo = std::move(address); }

  /// The position of the address, from 1, in the list that named it first.
  unsigned short getOrderOfAccess() const { return orderOfAccess; }
  unsigned short setOrderOfAccess(unsigned short order);  ///< always 0

  /// These store their value when it is first read, so they are not const.
  unsigned short getAccessContext();  ///< 3: DNS Server
  unsigned short getInfoFormat();     ///< 4: IPv6 Address, if the address contains a ":"; else 3: IPv4 Address
  std::string getNameFormat();        ///< "DNSServer"
  std::string getElementName();       ///< the address

 private:
  std::string serverName;  ///< never set: a record is known by its address
  std::string nameFormat;
  std::string accessInfo;
  unsigned short accessContext = 0;
  unsigned short infoFormat = 0;
  unsigned short orderOfAccess = 1;
  std::string elementName;
};

/// Adds a record for each server address of the host to dnsServerMap, keyed by the address; the map is not emptied
/// first. A repeated address keeps its first record. Returns 0 on success. Returns 1 if the tree threw; the map then
/// contains the records read before.
unsigned short getDNSServerInstances(std::map<std::string, DNSServer>& dnsServerMap);

}  // namespace ZV
