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

bool holdsText(const CMPIData& data) {
  return isGood(stringOf(data)) || (data.type == CMPI_chars && data.value.chars != nullptr);
}

// Whether a property of the instance has a value. Only here the state counts, because a client may send null.
bool isGiven(const CMPIData& data) { return (data.state & (CMPI_nullValue | CMPI_notFound)) == 0; }

// Clears the code of an earlier call: some brokers do not write one when a call succeeds.
void expectSuccess(CMPIStatus* status) { *status = kStatusOk; }

// False, with the code in the status, if the broker fails to return the text.
bool readText(const CMPIData& data, std::string& text, CMPIStatus* status) {
  if (data.type == CMPI_string) expectSuccess(status);
  std::string read = textOf(data, status);
  if (data.type == CMPI_string && status->rc != CMPI_RC_OK) return false;
  text = std::move(read);
  return true;
}

// The texts of a list's elements. An element without text, or one that leaves a failing code in the status, is left
// out.
std::vector<std::string> elementTexts(const CMPIArray* array, CMPIStatus* status) {
  std::vector<std::string> texts;
  const CMPICount count = array->ft->getSize(array, status);
  for (CMPICount i = 0; i < count; ++i) {
    expectSuccess(status);
    const CMPIData element = array->ft->getElementAt(array, i, status);
    std::string text;
    if (status->rc != CMPI_RC_OK || !holdsText(element)) continue;
    if (readText(element, text, status)) texts.push_back(std::move(text));
  }
  return texts;
}

// The text of a property; false, with text unchanged, if it is null or cannot be read.
bool takeText(const CMPIData& property, std::string& text, CMPIStatus* status) {
  return isGiven(property) && holdsText(property) && readText(property, text, status);
}

// The same for a list.
bool takeList(const CMPIData& property, std::vector<std::string>& texts, CMPIStatus* status) {
  const CMPIArray* array = arrayOf(property);
  if (!isGiven(property) || !isGood(array)) return false;
  texts = elementTexts(array, status);
  return true;
}

// The format of a list in an interface's file: one blank after every element.
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

// A property of the instance for the modification of the setting data. A property that the broker fails to return is
// ignored.
CMPIData givenProperty(const CMPIInstance* instance, const char* name, CMPIStatus* status) {
  expectSuccess(status);
  CMPIData data = getProperty(instance, name, status);
  if (status->rc != CMPI_RC_OK) data.state = static_cast<CMPIValueState>(data.state | CMPI_notFound);
  return data;
}

// The interface's file of the setting data with that InstanceID; false if there is none.
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

// An instance without a name empties the key; if the broker fails to return the name, the key is not changed.
bool modifyConfigurationName(const std::string& fileName, const CMPIInstance* instance, CMPIStatus* status) {
  const CMPIData property = givenProperty(instance, "ConfigurationName", status);
  std::string name;
  if (isGiven(property) && holdsText(property) && !readText(property, name, status)) return true;
  return modifyDNSValue(fileName, "CONFIG_NAME", name);
}

}  // namespace

unsigned int modifyDNSSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                              const char** properties, const CMPIInstance* instance,
                                              CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
                     " instance=", instance, " status=", status);
  if (isMissing(instance, ZV_HERE)) return CMPI_RC_ERR_FAILED;

  std::string fileName;
  if (!findFile(keyText(ref, "InstanceID", status), fileName)) {
    flow.exit();
    return CMPI_RC_ERR_FAILED;
  }
  std::string hostname;
  if (takeText(givenProperty(instance, "RequestedHostname", status), hostname, status)) {
    if (!isValid(hostname)) return CMPI_RC_ERR_INVALID_PARAMETER;
    modifyDNSValue(fileName, "HOSTNAME", hostname);
  }
  std::string domainName;
  if (takeText(givenProperty(instance, "DomainName", status), domainName, status)) {
    if (!isValid(domainName)) return CMPI_RC_ERR_INVALID_PARAMETER;  // the host name is written already
    modifyDNSValue(fileName, "DOMAINNAME", domainName);
  }
  std::vector<std::string> addresses;
  if (takeList(givenProperty(instance, "DNSServerAddresses", status), addresses, status)) {
    const std::string text = listText(addresses);
    logVariable(loggerDNSObjFactory, ZV_HERE, "dns_sfx", text);
    logVariable(loggerDNSObjFactory, ZV_HERE, "dnsServers.size()", static_cast<unsigned int>(addresses.size()));
    modifyDNSValue(fileName, "DNSSERVERS", text);
  }
  if (modifyConfigurationName(fileName, instance, status)) return CMPI_RC_OK;
  flow.exit();
  return CMPI_RC_ERR_FAILED;
}

unsigned int modifyDNSGeneralSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                     const char** properties, const CMPIInstance* instance,
                                                     CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
                     " instance=", instance, " status=", status);
  if (isMissing(instance, ZV_HERE)) return CMPI_RC_ERR_FAILED;

  keyText(ref, "InstanceID", status);  // read but not compared: there is only one instance
  DNSGeneralSettingData data;
  bool done = false;
  if (data) {
    std::vector<std::string> suffixes;
    if (takeList(getProperty(instance, "DNSSuffixesToAppend", status), suffixes, status)) {
      logVariable(loggerDNSObjFactory, ZV_HERE, "dnsSuffixes.size()", static_cast<unsigned int>(suffixes.size()));
      const std::string fileName = data.getFileName();
      logVariable(loggerDNSObjFactory, ZV_HERE, "fileName", fileName);
      done = modifyDNSValue(fileName, "DNSSUFFIXES", listText(suffixes));
    }
  }
  std::string configurationName;
  if (takeText(getProperty(instance, "ConfigurationName", status), configurationName, status)) {
    done = modifyDNSValue(data.getFileName(), "CONFIG_NAME", configurationName);
  } else {
    logError(loggerDNSObjFactory, ZV_HERE,
             "In modifyDNSGeneralSettingDataCMPIInstance function PROPERTY_CONFIGURATION_NAME does not found");
  }
  if (done) return CMPI_RC_OK;
  flow.exit();
  return CMPI_RC_ERR_FAILED;
}

namespace {

void modifyNode(Instrumentation& node, const CMPIInstance* instance, const LogSite& site, CMPIStatus* status) {
  std::vector<std::string> suffixes;
  if (takeList(getProperty(instance, "DNSSuffixesToAppend", status), suffixes, status)) {
    logVariable(loggerDNSObjFactory, site, "dnsSuffixes.size()", static_cast<unsigned int>(suffixes.size()));
    node.setProperty(NodeLexicon::PROP_DNS_SUFFIXES, std::vector<std::string>(suffixes));
  }
  std::string domainName;
  if (takeText(getProperty(instance, "DomainName", status), domainName, status)) {
    logVariable(loggerDNSObjFactory, site, "domainName", domainName);
    node.setProperty(NodeLexicon::PROP_DOMAIN_NAME, domainName);
  }
  std::string hostname;
  if (takeText(getProperty(instance, "Hostname", status), hostname, status)) {
    logVariable(loggerDNSObjFactory, site, "hostName", hostname);
    node.setProperty(NodeLexicon::PROP_HOST_NAME, hostname);
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
      if (name == nameKey) modifyNode(node, instance, ZV_HERE, status);  // all nodes with that name are changed
    }
  } catch (const std::exception&) {
    logError(loggerDNSObjFactory, ZV_HERE, "Caught Exception : ");
    return CMPI_RC_ERR_FAILED;
  }
  return CMPI_RC_OK;
}

}  // namespace ZV
