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

  bool getInstanceID(std::string& value) const;  // "BMC%" or "Computer%", by the owning system, and the name
  bool getElementName(std::string& value) const;
  bool getCaption(std::string& value) const;
  bool getDescription(std::string& value) const;
  bool getAddressOrigin(unsigned short& value) const;

  // From the file while there is one, a missing key as empty text; else from the node, false and empty where that has
  // none. The boot protocol and the configuration's name stand in the file alone.
  bool getBootProtocol(std::string& value) const;
  bool getDomainName(std::string& value) const;
  bool getRequestedHostname(std::string& value) const;
  bool getConfigurationName(std::string& value) const;
  bool getDNSServerAddresses(std::vector<std::string>& values) const;

  bool getDHCPOptionsToUse(std::vector<unsigned short>& values) const;  // appended
  bool getUseSuffixWhenRegistering(bool& value) const;                  // true, and leaves value as it is
  bool getRegisterThisConnectionsAddress(bool& value) const;            // false

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
