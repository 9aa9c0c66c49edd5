// An agent source in C++: the interfaces come from the command line, and the providers show them.
//
//   inventory_source eth0=192.0.2.1 eth1=192.0.2.2

#include <iostream>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/tree/TreeSource.h"
#include "broker/Broker.h"
#include "schema/Schema.h"

using namespace zorva;

/// The agent asks it from one thread at a time.
class InventorySource : public agent::TreeSource {
 public:
  explicit InventorySource(std::vector<std::string> words) : words_(std::move(words)) {}

  /// True as long as what read() returns may be new. Never blocks.
  bool changed() override { return std::exchange(isNew_, false); }

  std::shared_ptr<const agent::TreeSnapshot> read() override {
    agent::TreeBuilder tree("host1");
    const std::size_t system = tree.add(0, agent::NodeType::System, "system", "Computer");
    for (const std::string& word : words_) {
      const std::string name = word.substr(0, word.find('='));
      const std::size_t port = tree.add(system, agent::NodeType::Port, name);
      const std::size_t node = tree.add(port, agent::NodeType::NetworkIPConfig, "ip");
      tree.set(node, ZV::NodeLexicon::PROP_NAME, name);
      tree.set(node, ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES,
               std::make_shared<const agent::StringList>(agent::StringList{word.substr(name.size() + 1)}));
    }
    return tree.finish();
  }

 private:
  std::vector<std::string> words_;
  bool isNew_ = true;
};

int main(int argc, char** argv) {
  agent::setConfig({});
  agent::setTreeSource(std::make_shared<InventorySource>(std::vector<std::string>(argv + 1, argv + argc)));
  broker::BrokerOptions options;
  options.providerDirectory = broker::ProviderRegistry::builtInDirectory();
  broker::Broker broker(schema::loadBuiltInClasses(), options);
  const broker::Status status =
      broker.enumerateInstanceNames("", "ZORVA_RemoteServiceAccessPoint", [](const auto& path) {
        std::cout << std::get<std::string>(path.key("Name")->scalar) << "\n";
        return true;
      });
  return status.ok() ? 0 : 1;
}
