#include "factory/InstanceModification.h"

#include <Instrumentation.h>
#include <ProviderUtilities.h>

#include <exception>
#include <string>
#include <vector>

#include "factory/CmpiSupport.h"
#include "factory/DNSClientObjFactory.h"
#include "settings/DNSGeneralSettingData.h"
#include "settings/DNSSettingData.h"
#include "settings/InterfaceFile.h"
#include "trace/Trace.h"

namespace ZV {

namespace {

bool isArray(const CMPIData& data) { return (data.type & CMPI_ARRAY) != 0; }

// Whether the datum holds an object to read a text or a list from.
bool holdsText(const CMPIData& data) {
  return isPresent(data) && (isGood(stringOf(data)) || (data.type == CMPI_chars && data.value.chars != nullptr));
}
bool holdsList(const CMPIData& data) { return isPresent(data) && isArray(data) && isGood(data.value.array); }

// The texts of a list's elements; one whose reading leaves a failing code in the status, or that has no text, is left
// out.
std::vector<std::string> elementTexts(const CMPIArray* array, CMPIStatus* status) {
  std::vector<std::string> texts;
  const CMPICount count = array->ft->getSize(array, status);
  for (CMPICount i = 0; i < count; ++i) {
    const CMPIData element = array->ft->getElementAt(array, i, status);
    if (status->rc != CMPI_RC_OK || !holdsText(element)) continue;
    std::string text = textOf(element, status);
    if (status->rc == CMPI_RC_OK) texts.push_back(std::move(text));
  }
  return texts;
}

// The form of a list in an interface's file: one blank behind every element.
std::string listText(const std::vector<std::string>& elements) {
  std::string text;
  for (const std::string& element : elements) text += element + " ";
  return text;
}

bool isValid(const std::string& name) { return ProviderUtilities::ValidateInput(name, "") != 0; }

bool isMissing(const CMPIInstance* instance, const LogSite& site) {
  if (isGood(instance)) return false;
  logError(loggerDNSObjFactory, site, "Instance to be Modified is NULL");
  return true;
}

// A property of the instance as the modification of the setting data sees it: one that the broker fails to give does
// not count.
CMPIData givenProperty(const CMPIInstance* instance, const char* name, CMPIStatus* status) {
  CMPIData data = getProperty(instance, name, status);
  if (status->rc != CMPI_RC_OK) data.state = static_cast<CMPIValueState>(data.state | CMPI_notFound);
  return data;
}

// The interface's file of the setting data with that InstanceID; false where there is none.
bool findFile(const std::string& instanceID, std::string& fileName) {
  for (DNSSettingData data; data; ++data) {
    std::string candidate;
    data.getInstanceID(candidate);
    if (candidate != instanceID) continue;
    fileName = data.getFileName();
    return true;
  }
  return false;
}

}  // namespace

unsigned int modifyDNSSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                              const char** properties, const CMPIInstance* instance,
                                              CMPIStatus* status) {
  logEntry(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
           " instance=", instance, " status=", status);
  if (isMissing(instance, ZV_HERE)) return CMPI_RC_ERR_FAILED;

  std::string fileName;
  if (!findFile(keyText(ref, "InstanceID", status), fileName)) {
    logExit(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
            " instance=", instance, " status=", status);
    return CMPI_RC_ERR_FAILED;
  }
  const CMPIData hostname = givenProperty(instance, "RequestedHostname", status);
  if (holdsText(hostname)) {
    const std::string text = textOf(hostname, status);
    if (!isValid(text)) return CMPI_RC_ERR_INVALID_PARAMETER;
    modifyDNSValue(fileName, "HOSTNAME", text);
  }
  const CMPIData domainName = givenProperty(instance, "DomainName", status);
  if (holdsText(domainName)) {
    const std::string text = textOf(domainName, status);
    if (!isValid(text)) return CMPI_RC_ERR_INVALID_PARAMETER;  // the host name stays rewritten
    modifyDNSValue(fileName, "DOMAINNAME", text);
  }
  const CMPIData addresses = givenProperty(instance, "DNSServerAddresses", status);
  if (holdsList(addresses)) {
    const std::vector<std::string> texts = elementTexts(addresses.value.array, status);
    const std::string text = listText(texts);
    logVariable(loggerDNSObjFactory, ZV_HERE, "dns_sfx", text);
    logVariable(loggerDNSObjFactory, ZV_HERE, "dnsServers.size()", static_cast<unsigned int>(texts.size()));
    modifyDNSValue(fileName, "DNSSERVERS", text);
  }
  // Unlike the three above this key is emptied by an instance that lacks the property.
  const CMPIData configurationName = givenProperty(instance, "ConfigurationName", status);
  const std::string text = holdsText(configurationName) ? textOf(configurationName, status) : std::string();
  if (modifyDNSValue(fileName, "CONFIG_NAME", text)) return CMPI_RC_OK;
  logExit(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
          " instance=", instance, " status=", status);
  return CMPI_RC_ERR_FAILED;
}

unsigned int modifyDNSGeneralSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                     const char** properties, const CMPIInstance* instance,
                                                     CMPIStatus* status) {
  logEntry(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
           " instance=", instance, " status=", status);
  if (isMissing(instance, ZV_HERE)) return CMPI_RC_ERR_FAILED;

  keyText(ref, "InstanceID", status);  // read and compared with nothing: there is but one instance
  DNSGeneralSettingData data;
  bool done = false;
  if (data) {
    const CMPIData suffixes = getProperty(instance, "DNSSuffixesToAppend", status);
    if (holdsList(suffixes)) {
      const std::vector<std::string> texts = elementTexts(suffixes.value.array, status);
      logVariable(loggerDNSObjFactory, ZV_HERE, "dnsSuffixes.size()", static_cast<unsigned int>(texts.size()));
      const std::string fileName = data.getFileName();
      logVariable(loggerDNSObjFactory, ZV_HERE, "fileName", fileName);
      done = modifyDNSValue(fileName, "DNSSUFFIXES", listText(texts));
    }
  }
  const CMPIData configurationName = getProperty(instance, "ConfigurationName", status);
  if (holdsText(configurationName)) {
    done = modifyDNSValue(data.getFileName(), "CONFIG_NAME", textOf(configurationName, status));
  } else {
    logError(loggerDNSObjFactory, ZV_HERE,
             "In modifyDNSGeneralSettingDataCMPIInstance function PROPERTY_CONFIGURATION_NAME does not found");
  }
  if (done) return CMPI_RC_OK;
  logExit(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
          " instance=", instance, " status=", status);
  return CMPI_RC_ERR_FAILED;
}

namespace {

void modifyNode(Instrumentation& node, const CMPIInstance* instance, const LogSite& site, CMPIStatus* status) {
  const CMPIData suffixes = getProperty(instance, "DNSSuffixesToAppend", status);
  if (holdsList(suffixes)) {
    const std::vector<std::string> texts = elementTexts(suffixes.value.array, status);
    logVariable(loggerDNSObjFactory, site, "dnsSuffixes.size()", static_cast<unsigned int>(texts.size()));
    node.setProperty(NodeLexicon::PROP_DNS_SUFFIXES, std::vector<std::string>(texts));
  }
  const CMPIData domainName = getProperty(instance, "DomainName", status);
  if (holdsText(domainName)) {
    std::string text = textOf(domainName, status);
    logVariable(loggerDNSObjFactory, site, "domainName", text);
    node.setProperty(NodeLexicon::PROP_DOMAIN_NAME, text);
  }
  const CMPIData hostname = getProperty(instance, "Hostname", status);
  if (holdsText(hostname)) {
    std::string text = textOf(hostname, status);
    logVariable(loggerDNSObjFactory, site, "hostName", text);
    node.setProperty(NodeLexicon::PROP_HOST_NAME, text);
  }
}

}  // namespace

unsigned int modifyDNSProtocolEndpointCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                   const char** properties, const CMPIInstance* instance,
                                                   CMPIStatus* status) {
  logEntry(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
           " instance=", instance, " status=", status);
  if (isMissing(instance, ZV_HERE)) return CMPI_RC_ERR_FAILED;
  try {
    const std::string nameKey = keyText(ref, "Name", status);
    logVariable(loggerDNSObjFactory, ZV_HERE, "nameKey", nameKey);
    Instrumentation node;
    node.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
    for (; node; ++node) {
      std::string name;
      if (!node.getProperty(NodeLexicon::PROP_NAME, name)) continue;
      logVariable(loggerDNSObjFactory, ZV_HERE, "name", name);
      if (name == nameKey) modifyNode(node, instance, ZV_HERE, status);  // of one name all nodes are changed
    }
  } catch (const std::exception&) {
    logError(loggerDNSObjFactory, ZV_HERE, "Caught Exception : ");
    return CMPI_RC_ERR_FAILED;
  }
  return CMPI_RC_OK;
}

}  // namespace ZV
