#include "settings/DNSSettingData.h"

#include "model/OwningSystem.h"
#include "settings/InterfaceFile.h"
#include "trace/Trace.h"

namespace ZV {

const std::string loggerDNSSettingData = "Zorvagent.DNSSettingDataProvider";

DNSSettingData::DNSSettingData() { selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG); }

DNSSettingData::operator bool() {
  if (!Instrumentation::operator bool()) return false;
  std::string name;
  if (getProperty(NodeLexicon::PROP_NAME, name)) fileName = interfaceFileName(name);
  logVariable(loggerDNSSettingData, ZV_HERE, "fileName", fileName);
  return true;
}

DNSSettingData& DNSSettingData::operator++() {
  Instrumentation::operator++();
  return *this;
}

bool DNSSettingData::getInstanceID(std::string& value) {
  std::string name;
  if (!getProperty(NodeLexicon::PROP_NAME, name)) return false;
  value = (owningSystemDescription(*this) == kServiceProcessorDescription ? "BMC%" : "Computer%") + name;
  return true;
}

bool DNSSettingData::getElementName(std::string& value) {
  std::string name;
  if (!getProperty(NodeLexicon::PROP_NAME, name)) return false;
  value = "DNSSettingData." + name;
  return true;
}

bool DNSSettingData::getCaption(std::string& value) {
  value = "DNS Setting Configuration";
  return true;
}

bool DNSSettingData::getDescription(std::string& value) {
  value = "Represents DNS Setting Configuration for DNS Protocol EndPoint";
  return true;
}

// Not derived from the boot protocol.
bool DNSSettingData::getAddressOrigin(unsigned short& value) {
  value = 2;
  return true;
}

namespace {

// Empty if the node has no such property.
template <typename Value>
bool readProperty(Instrumentation& node, NodeLexicon::Properties property, Value& value) {
  value.clear();
  return node.getProperty(property, value);
}

}  // namespace

bool DNSSettingData::getBootProtocol(std::string& value) {
  if (!interfaceFileExists(fileName)) return false;
  value = readScalar(fileName, "BOOTPROTO", loggerDNSSettingData, ZV_HERE, "bootProtocol");
  return true;
}

bool DNSSettingData::getDomainName(std::string& value) {
  if (!interfaceFileExists(fileName)) return readProperty(*this, NodeLexicon::PROP_DOMAIN_NAME, value);
  value = readScalar(fileName, "DOMAINNAME", loggerDNSSettingData, ZV_HERE, "domainName");
  return true;
}

bool DNSSettingData::getRequestedHostname(std::string& value) {
  if (!interfaceFileExists(fileName)) return readProperty(*this, NodeLexicon::PROP_HOST_NAME, value);
  value = readScalar(fileName, "HOSTNAME", loggerDNSSettingData, ZV_HERE, "requestedHostname");
  return true;
}

bool DNSSettingData::getConfigurationName(std::string& value) {
  if (!interfaceFileExists(fileName)) return false;
  value = readScalar(fileName, "CONFIG_NAME", loggerDNSSettingData, ZV_HERE, "configurationName");
  return true;
}

bool DNSSettingData::getDNSServerAddresses(std::vector<std::string>& values) {
  if (!interfaceFileExists(fileName)) return readProperty(*this, NodeLexicon::PROP_DNS_SERVER_ADDRESSES, values);
  readList(fileName, "DNSSERVERS", values);
  return true;
}

bool DNSSettingData::getDHCPOptionsToUse(std::vector<unsigned short>& values) {
  values.insert(values.end(), {8, 14, 17});  // Domain Name Servers, Host Name and Domain Name
  return true;
}

bool DNSSettingData::getUseSuffixWhenRegistering(bool&) { return true; }

bool DNSSettingData::getRegisterThisConnectionsAddress(bool&) { return false; }

bool DNSSettingData::setRequestedHostname(std::string value) { return setProperty(NodeLexicon::PROP_HOST_NAME, value); }

bool DNSSettingData::setDomainName(std::string value) { return setProperty(NodeLexicon::PROP_DOMAIN_NAME, value); }

bool DNSSettingData::setDNSServerAddresses(std::vector<std::string> values) {
  return setProperty(NodeLexicon::PROP_DNS_SERVER_ADDRESSES, std::vector<std::string>(values));
}

bool DNSSettingData::setConfigurationName(const std::string& value) {
  logVariable(loggerDNSSettingData, ZV_HERE, "fileName", fileName);
  modifyValue(fileName, "CONFIG_NAME", value);
  return true;
}

}  // namespace ZV
