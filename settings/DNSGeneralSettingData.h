#pragma once

// A cursor that reads and writes the DNS settings of the host as a whole.

#include <Instrumentation.h>

#include <string>
#include <vector>

namespace ZV {

/// The host's settings are those of its first interface that does not belong to the service processor; operator bool
/// finds it. A copy is on the same node. Belongs to one operation and one thread.
///
/// A getter returns false if the value must not be set on an instance; its output is then unchanged.
class DNSGeneralSettingData : public Instrumentation {
 public:
  /// A tree that cannot be read is reported in the log; the cursor is then on no node.
  DNSGeneralSettingData();

  /// Moves to the next interface that does not belong to the service processor, starting with the current one; false if
  /// there is none. A second call stays on the node.
  explicit operator bool();
  DNSGeneralSettingData& operator++();

  /// The interface's name. The file's name is made from it; it is no part of the CIM InstanceID.
  bool getInstanceID(std::string& value);
  bool getElementName(std::string& value);
  bool getCaption(std::string& value);
  bool getDescription(std::string& value);
  bool getAddressOrigin(unsigned short& value);
  bool getAppendPrimarySuffixes(bool& value);  ///< false
  bool getAppendParentSuffixes(bool& value);   ///< false

  /// From the file if it exists; a missing key gives the empty text.
  bool getConfigurationName(std::string& value);                  ///< else false
  bool getDNSSuffixesToAppend(std::vector<std::string>& values);  ///< else from the node, or empty; always true

  /// Writes to the file, adding the key if it is missing; always true.
  bool setConfigurationName(const std::string& value);
  /// Writes to the node; true if it is stored there.
  bool setDNSSuffixesToAppend(std::vector<std::string> values);

  /// The path of the interface's file; it ends in "ifcfg-" if the node has no name.
  std::string getFileName();
};

}  // namespace ZV
