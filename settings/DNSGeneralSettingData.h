// A cursor that answers for the DNS settings of the host as a whole.
#pragma once

#include <Instrumentation.h>

#include <string>
#include <vector>

namespace ZV {

// The host's settings are those of its first interface that does not belong to the service processor; operator bool
// finds it. A copy stands on the same node. Belongs to one operation and one thread.
//
// A getter returns false where the value is not to be set on an instance; its output is then untouched.
class DNSGeneralSettingData : public Instrumentation {
 public:
  // A tree that cannot be read is told in the log; the cursor then stands on no node.
  DNSGeneralSettingData();

  // Moves to the next interface, the current one included, that does not belong to the service processor; false where
  // there is none. Asking again stays on the node.
  explicit operator bool();
  DNSGeneralSettingData& operator++();

  // The interface's name: what the file's name is made with, and no part of the CIM InstanceID.
  bool getInstanceID(std::string& value);
  bool getElementName(std::string& value);
  bool getCaption(std::string& value);
  bool getDescription(std::string& value);
  bool getAddressOrigin(unsigned short& value);
  bool getAppendPrimarySuffixes(bool& value);  // false
  bool getAppendParentSuffixes(bool& value);   // false

  // From the file while there is one, a missing key as empty text.
  bool getConfigurationName(std::string& value);                  // else false
  bool getDNSSuffixesToAppend(std::vector<std::string>& values);  // else from the node, or empty; always true

  // Writes to the file, adding the key where it is missing; always true.
  bool setConfigurationName(const std::string& value);
  // Writes to the node; true when it is stored there.
  bool setDNSSuffixesToAppend(std::vector<std::string> values);

  // The path of the interface's file; it ends in "ifcfg-" where the node has no name.
  std::string getFileName();
};

}  // namespace ZV
