#include "settings/DNSGeneralSettingData.h"

#include "model/OwningSystem.h"
#include "settings/InterfaceFile.h"
#include "trace/Trace.h"

namespace ZV {

// The category of DNSSettingData: operators see the two setting classes as one.
static const std::string loggerDNSGeneralSettingData = "Zorvagent.DNSSettingDataProvider";

DNSGeneralSettingData::DNSGeneralSettingData() {
  try {
    selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
  } catch (...) {
    logError(loggerDNSGeneralSettingData, ZV_HERE, "Select Node for NetworkIPConfig failed");
  }
}

DNSGeneralSettingData::operator bool() {
  for (; Instrumentation::operator bool(); Instrumentation::operator++()) {
    const std::string nodeString = owningSystemDescription(*this);
    logVariable(loggerDNSGeneralSettingData, ZV_HERE, "nodeString", nodeString);
    if (nodeString != kServiceProcessorDescription) return true;
  }
  return false;
}

DNSGeneralSettingData& DNSGeneralSettingData::operator++() {
  Instrumentation::operator++();
  return *this;
}

bool DNSGeneralSettingData::getInstanceID(std::string& value) {
  if (getProperty(NodeLexicon::PROP_NAME, value)) return true;
  logError(loggerDNSGeneralSettingData, ZV_HERE, "Name Property is not available from Instrumentation");
  return false;
}

bool DNSGeneralSettingData::getElementName(std::string& value) {
  value = "DNSGeneralSettingData";
  return true;
}

bool DNSGeneralSettingData::getCaption(std::string& value) {
  value = "DNS General Configuration";
  return true;
}

bool DNSGeneralSettingData::getDescription(std::string& value) {
  value = "Represents DNS General Configuration for DNS Protocol EndPoint";
  return true;
}

bool DNSGeneralSettingData::getAddressOrigin(unsigned short& value) {
  value = 2;
  return true;
}

bool DNSGeneralSettingData::getAppendPrimarySuffixes(bool&) { return false; }

bool DNSGeneralSettingData::getAppendParentSuffixes(bool&) { return false; }

std::string DNSGeneralSettingData::getFileName() {
  std::string name;
  getInstanceID(name);
  return interfaceFileName(name);
}

bool DNSGeneralSettingData::getConfigurationName(std::string& value) {
  const std::string fileName = getFileName();
  if (!interfaceFileExists(fileName)) return false;
  value = readScalar(fileName, "CONFIG_NAME", loggerDNSGeneralSettingData, ZV_HERE, "configurationName");
  return true;
}

// Returns true even if the node has no suffixes.
bool DNSGeneralSettingData::getDNSSuffixesToAppend(std::vector<std::string>& values) {
  const std::string fileName = getFileName();
  if (interfaceFileExists(fileName)) {
    readList(fileName, "DNSSUFFIXES", values);
  } else {
    values.clear();
    getProperty(NodeLexicon::PROP_DNS_SUFFIXES, values);
  }
  return true;
}

bool DNSGeneralSettingData::setConfigurationName(const std::string& value) {
  const std::string l_strFileName = getFileName();
  logVariable(loggerDNSGeneralSettingData, ZV_HERE, "l_strFileName", l_strFileName);
  modifyValue(l_strFileName, "CONFIG_NAME", value);
  return true;
}

bool DNSGeneralSettingData::setDNSSuffixesToAppend(std::vector<std::string> values) {
  logEntry(loggerDNSGeneralSettingData, ZV_HERE, " dnsSuffixes=", &values);
  const bool stored = setProperty(NodeLexicon::PROP_DNS_SUFFIXES, std::vector<std::string>(values));
  logExit(loggerDNSGeneralSettingData, ZV_HERE, " dnsSuffixes=", &values);
  return stored;
}

}  // namespace ZV
