#include "model/DNSServer.h"

#include <Instrumentation.h>

#include <exception>
#include <utility>
#include <vector>

#include "trace/Trace.h"

namespace ZV {

static const std::string loggerDNSClient = "Zorvagent.DNSClient";

unsigned short DNSServer::setOrderOfAccess(unsigned short order) {
  orderOfAccess = order;
  return 0;
}

unsigned short DNSServer::getAccessContext() {
  accessContext = 3;
  return accessContext;
}

unsigned short DNSServer::getInfoFormat() {
  infoFormat = accessInfo.find(':') != std::string::npos ? 4 : 3;
  return infoFormat;
}

std::string DNSServer::getNameFormat() {
  nameFormat = "DNSServer";
  return nameFormat;
}

std::string DNSServer::getElementName() {
  elementName = accessInfo;
  return elementName;
}

namespace {

void addServers(const std::vector<std::string>& addresses, const LogSite& site,
                std::map<std::string, DNSServer>& dnsServerMap) {
  unsigned short order = 1;
  for (const std::string& address : addresses) {
    logVariable(loggerDNSClient, site, "name", address);
    if (!address.empty() && !dnsServerMap.contains(address)) {  // the first node that names an address is kept
      DNSServer server;
      server.setAccessInfo(address);
      server.setOrderOfAccess(order);
      dnsServerMap[address] = std::move(server);
    }
    ++order;  // a skipped address counts too
  }
}

}  // namespace

unsigned short getDNSServerInstances(std::map<std::string, DNSServer>& dnsServerMap) {
  logEntry(loggerDNSClient, ZV_HERE, " dnsServerMap=", &dnsServerMap);
  try {
    Instrumentation cursor;
    cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
    for (; cursor; ++cursor) {
      std::vector<std::string> addresses;
      if (cursor.getProperty(NodeLexicon::PROP_DNS_SERVER_ADDRESSES, addresses)) {
        addServers(addresses, ZV_HERE, dnsServerMap);
      }
    }
  } catch (const std::exception&) {
    logError(loggerDNSClient, ZV_HERE, "Caught Exception");
    return 1;
  }
  logExit(loggerDNSClient, ZV_HERE, " dnsServerMap=", &dnsServerMap);
  return 0;
}

}  // namespace ZV
