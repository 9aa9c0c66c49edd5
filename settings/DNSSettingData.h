// A cursor over the host's network interfaces that answers for the DNS setting data of each.
#pragma once

#include <Instrumentation.h>

#include <string>
#include <vector>

namespace ZV {

// Stands on the first interface once built; a loop asks operator bool once for each interface and then goes on with
// operator++. A copy stands on the same node. Belongs to one operation and one thread. Exceptions of the
// instrumentation pass out.
//
// No member is const: the cursor's own members need not be.
//
// A getter returns false where the value is not to be set on an instance; its output is then untouched, or empty where
// the node was asked in the place of the file. The readers of the interface's file rely on operator bool having run for
// the node.
class DNSSettingData : public Instrumentation {
 public:
  DNSSettingData();

  // Whether the cursor stands on an interface, those of the service processor and those without a name included. Finds
  // the interface's file; a node without a name keeps the file of the one before.
  explicit operator bool();
  DNSSettingData& operator++();

  std::string getFileName() const { return fileName; }

  bool getInstanceID(std::string& value);  // "BMC%" or "Computer%", by the owning system, and the name
  bool getElementName(std::string& value);
  bool getCaption(std::string& value);
  bool getDescription(std::string& value);
  bool getAddressOrigin(unsigned short& value);

  // From the file while there is one, a missing key as empty text; else from the node, false and empty where that has
  // none. The boot protocol and the configuration's name stand in the file alone.
  bool getBootProtocol(std::string& value);
  bool getDomainName(std::string& value);
  bool getRequestedHostname(std::string& value);
  bool getConfigurationName(std::string& value);
  bool getDNSServerAddresses(std::vector<std::string>& values);

  bool getDHCPOptionsToUse(std::vector<unsigned short>& values);  // appended
  bool getUseSuffixWhenRegistering(bool& value);                  // true, and leaves value as it is
  bool getRegisterThisConnectionsAddress(bool& value);            // false

  // Write to the node; true when it is stored there.
  bool setRequestedHostname(std::string value);
  bool setDomainName(std::string value);
  bool setDNSServerAddresses(std::vector<std::string> values);
  // Writes to the file, adding the key where it is missing; always true.
  bool setConfigurationName(const std::string& value);

 private:
  std::string fileName;
};

}  // namespace ZV
