// The factory's functions for the endpoint's extrinsic methods. Each works on a copy of the endpoint's record and drops
// it: the host is changed only by modifying instances.

#include "factory/CmpiSupport.h"
#include "factory/DNSClientObjFactory.h"
#include "trace/Trace.h"

namespace ZV {

bool DNSClientObjFactory::copyOfNamedClient(const CMPIObjectPath* ref, DNSClient& client, CMPIStatus* rc) const {
  const CMPIString* name = stringOf(getKey(ref, "Name", rc));
  if (!isGood(name)) return true;  // a call without a name uses an empty record
  const auto found = dnsClientMap.find(textOf(name, rc));
  if (found == dnsClientMap.end()) return false;
  client = found->second;
  return true;
}

namespace {

// The texts of an array argument. A missing array counts as empty; an element without text is left out.
std::vector<std::string> textsOf(const CMPIData& data, CMPIStatus* rc) {
  std::vector<std::string> texts;
  const CMPIArray* array = arrayOf(data);
  if (!isGood(array)) return texts;
  // NOLINTNEXTLINE(bugprone-too-small-loop-variable): the index is 16 bits wide, and the walk ends with its range
  for (unsigned short i = 0; i < array->ft->getSize(array, rc); ++i) {
    const CMPIString* element = stringOf(array->ft->getElementAt(array, i, rc));
    if (isGood(element)) texts.push_back(textOf(element, rc));
    if (i == 0xffff) break;
  }
  return texts;
}

}  // namespace

unsigned int DNSClientObjFactory::setDNSDomainName(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                   const CMPIString* domainName, const CMPIContext* ctx,
                                                   CMPIStatus* rc) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " _broker=", broker, " ref=", ref, " domainName=", domainName,
                     " ctx=", ctx);
  DNSClient client;
  if (!copyOfNamedClient(ref, client, rc)) {
    logError(loggerDNSObjFactory, ZV_HERE, "DNS Client Map empty");
    return 1;
  }
  unsigned int value = 0;
  if (client.setDNSDomain(textOf(domainName, rc)) != 0) {
    logError(loggerDNSObjFactory, ZV_HERE, "SetDomainName function failed");
    value = 1;
  }
  flow.exit();
  return value;
}

unsigned int DNSClientObjFactory::setDNSSuffixesSearchOrder(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                            CMPIData suffixes, const CMPIContext* ctx, CMPIStatus* rc) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " _broker=", broker, " ref=", ref, " suffixes=", &suffixes,
                     " ctx=", ctx, " rc=", rc);
  DNSClient client;
  if (!copyOfNamedClient(ref, client, rc)) {
    logError(loggerDNSObjFactory, ZV_HERE, "DNS Client Map Empty");
    return 1;
  }
  unsigned int value = 0;
  if (client.setDNSSuffixSearchOrder(textsOf(suffixes, rc)) != 0) {
    logError(loggerDNSObjFactory, ZV_HERE, "setDNSSuffixSearchOrder function failed");
    value = 1;
  }
  flow.exit();
  return value;
}

unsigned int DNSClientObjFactory::setDNSServerSearchOrder(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                          CMPIData serverAddrs, const CMPIContext* ctx,
                                                          CMPIStatus* rc) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " _broker=", broker, " ref=", ref, " serverAddrs=", &serverAddrs,
                     " ctx=", ctx);
  DNSClient client;
  if (!copyOfNamedClient(ref, client, rc)) return 1;  // only here without a log line
  unsigned int value = 0;
  if (client.setDNSServerSearchOrder(textsOf(serverAddrs, rc)) != 0) {
    logError(loggerDNSObjFactory, ZV_HERE, "setDNSServerSearchOrder function failed");
    value = 1;
  }
  flow.exit();
  return value;
}

}  // namespace ZV
