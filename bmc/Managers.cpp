#include "bmc/Managers.h"

namespace zorva::bmc {

namespace {

using Kind = JsonValue::Kind;

std::string idOfManager(const JsonValue& body) {
  std::string id = shownTextIn(body, "Id");
  if (!id.empty() && id.find('/') == std::string::npos) return id;
  return lastNameOf(idOf(body));
}

}  // namespace

std::vector<Manager> readManagers(Redfish& redfish, std::string& remark) {
  const JsonValue* collection = memberOf(redfish.root(), "Managers", Kind::Object);
  if (collection == nullptr) throw Failed("the service root has no Managers");
  std::vector<Manager> managers;
  bool cut = false;
  for (const JsonValue& body : redfish.members(idOf(*collection), kMostManagers, cut)) {
    const JsonValue* interfaces = memberOf(body, "EthernetInterfaces", Kind::Object);
    if (interfaces == nullptr) continue;
    Manager manager{idOfManager(body), {}};
    for (const JsonValue& each : redfish.members(idOf(*interfaces), kMostInterfaces, cut)) {
      manager.interfaces.push_back(readEthernet(each));
    }
    managers.push_back(std::move(manager));
  }
  if (cut) {
    remark = "the service has more than " + std::to_string(kMostManagers) + " managers, or one with more than " +
             std::to_string(kMostInterfaces) + " interfaces; the others are left out";
  }
  return managers;
}

}  // namespace zorva::bmc
