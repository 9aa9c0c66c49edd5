#include "tests/support/World.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <utility>

#include "agent/Agent.h"
#include "agent/testing/Trees.h"
#include "tests/support/RecordingLogger.h"

namespace agent = zorva::agent;

namespace ZV::Test {

namespace {

class UnreadableSource : public zorva::agent::TreeSource {
 public:
  explicit UnreadableSource(std::string reason) : reason_(std::move(reason)) {}
  bool changed() override { return true; }
  std::shared_ptr<const agent::TreeSnapshot> read() override { throw std::runtime_error(reason_); }

 private:
  std::string reason_;
};

std::string makeDirectory() {
  std::string path = (std::filesystem::temp_directory_path() / "zorva-world-XXXXXX").string();
  if (::mkdtemp(path.data()) == nullptr) throw std::runtime_error("no directory can be made as " + path);
  return path + "/";
}

// The node of the n-th interface. Interfaces may share a name and have any name, nodes may not.
std::string portName(const std::string& name, std::size_t n) {
  const bool isPlain = !name.empty() && name.find('/') == std::string::npos && name.find('\0') == std::string::npos;
  return (isPlain ? name : "port") + "-" + std::to_string(n);
}

void setText(agent::TreeBuilder& builder, std::size_t node, agent::PropertyNumber number,
             const std::optional<std::string>& text) {
  if (text.has_value()) builder.set(node, number, *text);
}

void setNumber(agent::TreeBuilder& builder, std::size_t node, agent::PropertyNumber number,
               std::optional<unsigned int> value) {
  if (value.has_value()) builder.set(node, number, *value);
}

void setList(agent::TreeBuilder& builder, std::size_t node, agent::PropertyNumber number, const OptionalTexts& texts) {
  if (texts.given()) builder.set(node, number, std::make_shared<const zorva::agent::StringList>(texts.texts()));
}

void setProperties(agent::TreeBuilder& builder, std::size_t node, const std::string& name, const NicProperties& nic) {
  if (!nic.isUnnamed) setText(builder, node, NodeLexicon::PROP_NAME, nic.name.value_or(name));
  setText(builder, node, NodeLexicon::PROP_HOST_NAME, nic.hostName);
  setText(builder, node, NodeLexicon::PROP_DOMAIN_NAME, nic.domain);
  setList(builder, node, NodeLexicon::PROP_DNS_SUFFIXES, nic.suffixes);
  setList(builder, node, NodeLexicon::PROP_DNS_SERVER_ADDRESSES, nic.servers);
  setNumber(builder, node, NodeLexicon::PROP_PROTOCOL_IF_TYPE, nic.ifType);
  setNumber(builder, node, NodeLexicon::PROP_ENABLED_STATE, nic.state);
  if (!nic.addresses.empty()) {
    builder.set(node, zorva::agent::kAddresses, std::make_shared<const zorva::agent::AddressList>(nic.addresses));
  }
}

// The agent as in a new process of a program that catches exceptions of a provider; an active logger goes on recording.
void forgetWorld() {
  zorva::agent::reset();
  zorva::agent::askForExceptions();
  if (RecordingLogger* logger = RecordingLogger::active()) logger->resume();
}

}  // namespace

NicProperties usualNic() {
  return {.hostName = "host1",
          .domain = "example.org",
          .suffixes = {"example.org"},
          .servers = {"192.0.2.53"},
          .ifType = 4097,
          .state = 1};
}

World::World() : dataDir_(makeDirectory()) {}

World::~World() {
  if (installed_) forgetWorld();
  std::error_code ignored;  // a test may have removed the directory itself
  std::filesystem::remove_all(dataDir_, ignored);
}

World& World::host(const std::string& name, const std::string& description) {
  systemName_ = name;
  return system("system", description);
}

World& World::bmc() { return system("bmc", "BMC"); }

World& World::system(const std::string& nodeName, const std::string& description) {
  systems_.push_back({nodeName, description});
  return *this;
}

World& World::nic(const std::string& name, const NicProperties& properties) {
  if (systems_.empty()) host(systemName_);
  nics_.push_back({systems_.size() - 1, name, properties});
  return *this;
}

void World::useConfig() const {
  zorva::agent::Config config;
  config.dataDir = dataDir_;
  config.logTarget = "off";
  zorva::agent::setConfig(config);
}

World& World::install() {
  forgetWorld();
  useConfig();
  zorva::agent::setTreeSource(std::make_shared<zorva::agent::testing::FixedSource>(tree()));
  installed_ = true;
  return *this;
}

World& World::installUnreadable(const std::string& reason) {
  forgetWorld();
  useConfig();
  zorva::agent::setTreeSource(std::make_shared<UnreadableSource>(reason));
  installed_ = true;
  return *this;
}

std::shared_ptr<const agent::TreeSnapshot> World::tree() const {
  agent::TreeBuilder builder(systemName_);
  for (std::size_t s = 0; s < systems_.size(); ++s) {
    const std::size_t system = builder.add(0, agent::NodeType::System, systems_[s].name, systems_[s].description);
    for (std::size_t n = 0; n < nics_.size(); ++n) {
      if (nics_[n].system != s) continue;
      const std::size_t port = builder.add(system, agent::NodeType::Port, portName(nics_[n].name, n));
      const std::size_t config = builder.add(port, agent::NodeType::NetworkIPConfig, "ip");
      setProperties(builder, config, nics_[n].name, nics_[n].properties);
    }
  }
  return builder.finish();
}

const zorva::agent::Node* World::nodeOf(const agent::TreeSnapshot& snapshot, std::size_t nic) const {
  const Nic& asked = nics_.at(nic);
  return snapshot.find("/" + systems_[asked.system].name + "/" + portName(asked.name, nic) + "/ip");
}

std::optional<std::string> World::text(std::size_t nic, agent::PropertyNumber property) const {
  const auto snapshot = zorva::agent::currentTree();
  const zorva::agent::Node* node = nodeOf(*snapshot, nic);
  const std::string* held = node == nullptr ? nullptr : node->text(property);
  return held == nullptr ? std::nullopt : std::optional(*held);
}

std::optional<std::vector<std::string>> World::list(std::size_t nic, agent::PropertyNumber property) const {
  const auto snapshot = zorva::agent::currentTree();
  const zorva::agent::Node* node = nodeOf(*snapshot, nic);
  const zorva::agent::StringList* held = node == nullptr ? nullptr : node->list(property);
  return held == nullptr ? std::nullopt : std::optional(*held);
}

World& World::file(const std::string& nic, const std::string& content) {
  std::ofstream out(filePath(nic), std::ios::binary | std::ios::trunc);
  out << content;
  if (!out.flush()) throw std::runtime_error("cannot write " + filePath(nic));
  return *this;
}

std::optional<std::string> World::fileContent(const std::string& nic) const {
  std::ifstream in(filePath(nic), std::ios::binary);
  if (!in) return std::nullopt;
  return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

FailingTree::FailingTree(std::size_t n, Thrown thrown) : n_(n), thrown_(thrown) { zorva::agent::setTreeCallHook(this); }

FailingTree::~FailingTree() { zorva::agent::setTreeCallHook(nullptr); }

std::vector<zorva::agent::TreeCall> FailingTree::calls() const {
  const std::lock_guard lock(mutex_);
  return calls_;
}

void FailingTree::before(zorva::agent::TreeCall call) {
  const std::lock_guard lock(mutex_);
  calls_.push_back(call);
  if (calls_.size() != n_) return;
  if (thrown_ == Thrown::Int) throw 42;
  throw std::runtime_error("the tree failed as it was asked to");
}

std::size_t forEachTreeFailure(const std::function<void(std::size_t n, Thrown thrown)>& operation) {
  std::size_t tried = 0;
  for (const Thrown thrown : {Thrown::StdException, Thrown::Int}) {
    for (std::size_t n = 1;; ++n) {
      const FailingTree failing(n, thrown);
      operation(n, thrown);
      if (!failing.hasThrown()) break;
      ++tried;
    }
  }
  return tried;
}

}  // namespace ZV::Test
