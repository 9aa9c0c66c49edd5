#include "model/DNSClient.h"

#include <Instrumentation.h>
#include <StringConversion.h>

#include <exception>
#include <utility>

#include "model/DNSServer.h"
#include "model/OwningSystem.h"
#include "trace/Trace.h"

namespace ZV {

static const std::string loggerDNSClient = "Zorvagent.DNSClient";
static const char* const spcomputerSystemClass = "ZORVA_SPComputerSystem";
static const char* const computerSystemClass = "ZORVA_ComputerSystem";

std::string DNSClient::getNameFormat() {
  nameFormat = "NICName";
  return nameFormat;
}

std::string DNSClient::getOtherTypeDescription() {
  otherTypeDescription = "DNS";
  return otherTypeDescription;
}

bool DNSClient::setDNSClientName(std::string name) {
  dnsClientName = std::move(name);
  return !dnsClientName.empty();
}

bool DNSClient::setHostName(std::string name) {
  hostName = std::move(name);
  return !hostName.empty();
}

bool DNSClient::setElementName(std::string name) {
  elementName = std::move(name);
  return !elementName.empty();
}

bool DNSClient::setDomainName(std::string domain) {
  domainName = stripSpaces(domain);
  return !domainName.empty();
}

bool DNSClient::setDNSSCCN(std::string className) {
  dnsSCCN = std::move(className);
  return true;
}

bool DNSClient::setprotocolIFType(unsigned int) {
  protocolIFType = 1;
  return true;
}

bool DNSClient::setEnabledState(unsigned short rawState) {
  switch (rawState) {
    case 12:
      enabledState = 6;
      break;
    case 16:
      enabledState = 3;
      break;
    case 1:
      enabledState = 2;
      break;
    default:
      enabledState = 5;
  }
  return true;
}

bool DNSClient::setRequestedState(unsigned short) {
  requestedState = 12;
  return true;
}

bool DNSClient::setDNSSuffixesToAppend(std::vector<std::string> suffixes) {
  dnsSuffixesToAppend = std::move(suffixes);
  return true;
}

int DNSClient::setDNSDomain(std::string domain) {
  domainName = std::move(domain);
  return 0;
}

int DNSClient::setDNSSuffixSearchOrder(std::vector<std::string>) { return 0; }

// The new order goes into copies that are dropped: this record must not change the order of the host's servers.
int DNSClient::setDNSServerSearchOrder(std::vector<std::string> addresses) {
  std::map<std::string, DNSServer> dnsServerMap;
  if (getDNSServerInstances(dnsServerMap) != 0) return 1;
  for (std::size_t i = 0; i < addresses.size(); ++i) {
    for (const auto& [key, record] : dnsServerMap) {
      DNSServer server = record;
      if (server.getAccessInfo() != addresses[i]) continue;
      if (server.setOrderOfAccess(static_cast<unsigned short>(i + 1)) != 0) return 1;
      break;
    }
  }
  return 0;
}

namespace {

// The walk survives every failure in here: the record continues with its next field and is stored.
void warnUnless(bool usable, const LogSite& site, const char* text) {
  if (!usable) logMessage(loggerDNSClient, site, LOG_LEVEL_DETAIL, text);
}

const char* systemClassOf(Instrumentation& cursor, const LogSite& site) {
  const std::string nodeString = owningSystemDescription(cursor);
  logVariable(loggerDNSClient, site, "nodeString", nodeString);
  return nodeString == kServiceProcessorDescription ? spcomputerSystemClass : computerSystemClass;
}

void addClient(Instrumentation& cursor, const LogSite& site, std::map<std::string, DNSClient>& dnsClientMap) {
  std::string key;
  std::string string;
  std::vector<std::string> suffixes;
  unsigned int number = 0;
  DNSClient client;

  if (cursor.getProperty(NodeLexicon::PROP_NAME, key)) {
    warnUnless(client.setDNSClientName(key), site, "Failed while setting Name");
  }
  if (cursor.getProperty(NodeLexicon::PROP_HOST_NAME, string)) {
    warnUnless(client.setHostName(std::move(string)), site, "Failed while setting IP Host Name.");
  }
  if (cursor.getProperty(NodeLexicon::PROP_PROTOCOL_IF_TYPE, number)) {
    warnUnless(client.setprotocolIFType(number), site, "Failed while setting protocolIFType.");
  }
  if (cursor.getProperty(NodeLexicon::PROP_ENABLED_STATE, number)) {
    const auto rawState = static_cast<unsigned short>(number);
    warnUnless(client.setEnabledState(rawState), site, "Failed while setting Enabled State.");
    warnUnless(client.setRequestedState(rawState), site, "Failed while setting Requested State.");
  }
  string.clear();
  if (cursor.getProperty(NodeLexicon::PROP_NAME, string)) {
    warnUnless(client.setElementName(std::move(string)), site, "Failed while setting Element Name");
  }
  string.clear();
  if (cursor.getProperty(NodeLexicon::PROP_DOMAIN_NAME, string)) {
    logVariable(loggerDNSClient, site, "string", string);
    warnUnless(client.setDomainName(string), site, "Failed while setting Domain Name.");
  }
  if (cursor.getProperty(NodeLexicon::PROP_DNS_SUFFIXES, suffixes)) {
    warnUnless(client.setDNSSuffixesToAppend(std::move(suffixes)), site, "Failed while setting DNSSuffixesToAppend");
  }
  warnUnless(client.setDNSSCCN(systemClassOf(cursor, site)), site, "Failed while setting System Creation Class Name");
  dnsClientMap[std::move(key)] = std::move(client);  // of several nodes with one name the last is kept
}

}  // namespace

unsigned short getDNSClientInstances(std::map<std::string, DNSClient>& dnsClientMap) {
  logEntry(loggerDNSClient, ZV_HERE, " dnsClientMap=", &dnsClientMap);
  Instrumentation cursor;  // outside the try block: its exceptions leave this function
  try {
    cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
    if (!cursor) {
      logExit(loggerDNSClient, ZV_HERE, " dnsClientMap=", &dnsClientMap);
      return 1;
    }
    for (; cursor; ++cursor) addClient(cursor, ZV_HERE, dnsClientMap);
  } catch (const std::exception&) {
    logError(loggerDNSClient, ZV_HERE, "Caught Exception");
    return 1;
  }
  logExit(loggerDNSClient, ZV_HERE, " dnsClientMap=", &dnsClientMap);
  return 0;
}

}  // namespace ZV
