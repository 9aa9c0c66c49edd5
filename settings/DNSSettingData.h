#pragma once

// A cursor over the host's network interfaces that reads and writes the DNS setting data of each.

#include <Instrumentation.h>

#include <string>
#include <vector>

namespace ZV {

/// After construction it is on the first interface. A loop calls operator bool once for each interface and then
/// operator++. A copy is on the same node. Belongs to one operation and one thread. Exceptions of the instrumentation
/// leave its functions.
///
/// No member is const, because the cursor's own members need not be const.
///
/// A getter returns false if the value must not be set on an instance. Its output is then unchanged, or empty if the
/// value was read from the node instead of the file. The getters that read the interface's file require that operator
/// bool was called for the node.
class DNSSettingData : public Instrumentation {
 public:
  DNSSettingData();

  /// Whether the cursor is on an interface; interfaces of the service processor and those without a name count. Finds
  /// the interface's file; a node without a name keeps the file of the previous one.
  explicit operator bool();
  DNSSettingData& operator++();

  std::string getFileName() const { return fileName; }

  bool getInstanceID(std::string& value);  ///< "BMC%" or "Computer%", by the owning system, and the name
  bool getElementName(std::string& value);
  bool getCaption(std::string& value);
  bool getDescription(std::string& value);
  bool getAddressOrigin(unsigned short& value);

  /// From the file if it exists; a missing key gives the empty text. Else from the node; false and empty if it has no
  /// value. The boot protocol and the configuration's name are only in the file.
  bool getBootProtocol(std::string& value);
  bool getDomainName(std::string& value);
  bool getRequestedHostname(std::string& value);
  bool getConfigurationName(std::string& value);
  bool getDNSServerAddresses(std::vector<std::string>& values);

  bool getDHCPOptionsToUse(std::vector<unsigned short>& values);  ///< appended
  bool getUseSuffixWhenRegistering(bool& value);                  ///< true, and value is unchanged
  bool getRegisterThisConnectionsAddress(bool& value);            ///< false

  /// Write to the node; true if it is stored there.
  bool setRequestedHostname(std::string value);
  bool setDomainName(std::string value);
  bool setDNSServerAddresses(std::vector<std::string> values);
  /// Writes to the file, adding the key if it is missing; always true.
  bool setConfigurationName(const std::string& value);

 private:
  std::string fileName;
};

}  // namespace ZV
