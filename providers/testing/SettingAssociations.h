// The four associations of DNS settings for their shared tests.
#pragma once

#include <functional>
#include <vector>

#include "providers/testing/AssociationTestSupport.h"

extern "C" {
CMPIInstanceMI* DNSGenEndPointElementSettingDataProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                           CMPIStatus*);
CMPIAssociationMI* DNSGenEndPointElementSettingDataProvider_Create_AssociationMI(const CMPIBroker*, const CMPIContext*,
                                                                                 CMPIStatus*);
CMPIInstanceMI* DNSEndPointElementSettingDataProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                        CMPIStatus*);
CMPIAssociationMI* DNSEndPointElementSettingDataProvider_Create_AssociationMI(const CMPIBroker*, const CMPIContext*,
                                                                              CMPIStatus*);
CMPIInstanceMI* DNSGeneralOrderedComponentProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                     CMPIStatus*);
CMPIAssociationMI* DNSGeneralOrderedComponentProvider_Create_AssociationMI(const CMPIBroker*, const CMPIContext*,
                                                                           CMPIStatus*);
CMPIInstanceMI* DNSOrderedComponentProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
CMPIAssociationMI* DNSOrderedComponentProvider_Create_AssociationMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
}

namespace ZV::Test {

inline AssociationUnderTest genEndpointElementSettingData() {
  return {.className = "ZORVA_DNSGenEndPointElementSettingData",
          .left = "ManagedElement",
          .right = "SettingData",
          .stem = "DNSGenEndpointElementSettingData",
          .builder = "DNSGenEndpointElementSettingDataCMPIInstances",
          .source = "providers/DNSGenEndpointElementSettingDataProvider.cpp",
          .category = "Zorvagent.DNSGenEndpointElementSettingDataProvider",
          .createInstanceMI = DNSGenEndPointElementSettingDataProvider_Create_InstanceMI,
          .createAssociationMI = DNSGenEndPointElementSettingDataProvider_Create_AssociationMI,
          .associationsAreDone = true};
}

inline AssociationUnderTest endpointElementSettingData() {
  return {.className = "ZORVA_DNSEndPointElementSettingData",
          .left = "ManagedElement",
          .right = "SettingData",
          .stem = "DNSEndpointElementSettingData",
          .builder = "DNSEndpointElementSettingDataCMPIInstances",
          .source = "providers/DNSEndpointElementSettingDataProvider.cpp",
          .category = "Zorvagent.DNSEndpointElementSettingDataProvider",
          .createInstanceMI = DNSEndPointElementSettingDataProvider_Create_InstanceMI,
          .createAssociationMI = DNSEndPointElementSettingDataProvider_Create_AssociationMI,
          .associationsAreDone = true};
}

inline AssociationUnderTest generalOrderedComponent() {
  return {.className = "ZORVA_DNSGenOrderedComponent",
          .left = "GroupComponent",
          .right = "PartComponent",
          .stem = "DNSGeneralOrderedComponent",
          .builder = "DNSGeneralOrderedComponentCMPIInstances",
          .source = "providers/DNSGenOrderedComponentProvider.cpp",
          .category = "Zorvagent.DNSGeneralOrderedComponentProvider",
          .createInstanceMI = DNSGeneralOrderedComponentProvider_Create_InstanceMI,
          .createAssociationMI = DNSGeneralOrderedComponentProvider_Create_AssociationMI,
          .associationsAreDone = true};
}

inline AssociationUnderTest orderedComponent() {
  return {.className = "ZORVA_DNSOrderedComponent",
          .left = "GroupComponent",
          .right = "PartComponent",
          .stem = "DNSOrderedComponent",
          .builder = "DNSOrderedComponentCMPIInstances",
          .source = "providers/DNSOrderedComponentProvider.cpp",
          .category = "Zorvagent.DNSOrderedComponentProvider",
          .createInstanceMI = DNSOrderedComponentProvider_Create_InstanceMI,
          .createAssociationMI = DNSOrderedComponentProvider_Create_AssociationMI,
          .associationsAreDone = true};
}

inline const char* const kGeneralSettingClass = "ZORVA_DNSGeneralSettingData";
inline const char* const kSettingClass = "ZORVA_DNSSettingData";
inline const char* const kEndpointClass = "ZORVA_DNSProtocolEndPoint";
inline const char* const kIpAssignmentClass = "ZORVA_IPAssignmentSettingData";

// --- Parts of a record.

inline std::string inRootCimv2(const std::string& path) { return path + ".setNameSpace(\"root/cimv2\")"; }

inline Story newSettingPath(const std::string& path, const std::string& instanceID) {
  return tell({newHostPath(path, kSettingClass), textKeys(path, {{"InstanceID", instanceID}})});
}

// A setting with its key only, requested by that name.
inline Story newSetting(const std::string& path, const std::string& instance, const std::string& className,
                        const std::string& instanceID) {
  return tell({newHostPath(path, className),
               {"newInstance(" + path + ")", instance + R"(.setPropertyFilter({"InstanceID"}, {"InstanceID"}))"},
               textProperties(instance, {{"InstanceID", instanceID}})});
}

inline Story flags(const std::string& instance, int value) {
  const std::string number = ", uint16 " + std::to_string(value) + ")";
  return {instance + R"(.setProperty("IsCurrent")" + number, instance + R"(.setProperty("IsDefault")" + number};
}

inline Story sequence(const std::string& instance, int value) {
  return {instance + R"(.setProperty("AssignedSequence", uint64 )" + std::to_string(value) + ")"};
}

// The name of a reference is returned with the namespace of the source.
inline Story returnedPath(const std::string& instance, const std::string& path) {
  return {instance + ".getObjectPath()", inRootCimv2(path), "returnObjectPath(" + path + ")"};
}

inline Story done(const std::string& operation) { return tell({{"returnDone()"}, exitMark(operation)}); }

// --- The fixture.

class SettingAssociationTest : public AssociationTest {
 protected:
  using AssociationTest::AssociationTest;
  using Operation = std::function<Outcome()>;

  std::vector<Operation> enumerations() {
    return {[this] { return enumerateInstanceNames(); }, [this] { return enumerateInstances(); }};
  }
  std::vector<Operation> instanceOperations(const Path& pair) {
    std::vector<Operation> all = enumerations();
    all.push_back([this, pair] { return getInstance(pair); });
    return all;
  }
  // The four association operations.
  std::vector<Operation> allFrom(const Path& source) {
    return {[this, source] { return associators(source); }, [this, source] { return associatorNames(source); },
            [this, source] { return references(source); }, [this, source] { return referenceNames(source); }};
  }
  // The operations that fetch only paths from the factory, no instances.
  std::vector<Operation> pathsFrom(const Path& source) {
    std::vector<Operation> all = allFrom(source);
    all.erase(all.begin());
    return all;
  }

  void serveAssignments(const std::vector<std::string>& instanceIDs) {
    std::vector<Instance> all;
    for (const std::string& instanceID : instanceIDs) all.push_back(objectOf(ipAssignmentPath(instanceID)));
    broker.serve(kIpAssignmentClass, all);
  }

  // How many objects were returned, null ones included.
  static std::size_t handedOut(const Outcome& outcome) {
    return outcome.calls.count("returnInstance") + outcome.calls.count("returnObjectPath");
  }
};

}  // namespace ZV::Test
