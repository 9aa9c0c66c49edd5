#include "agent/sources/HostSource.h"

#include <linux/if.h>

#include <algorithm>
#include <unordered_map>
#include <unordered_set>
#include <utility>

#include "util/HostName.h"
#include "util/ReadFile.h"
#include "util/Text.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;

constexpr std::size_t kLargestFile = std::size_t{64} << 10;
constexpr const char* kComputer = "Computer";

// Raw enabled states, as in PROP_ENABLED_STATE.
constexpr unsigned int kUpWithCarrier = 1;
constexpr unsigned int kUpWithoutCarrier = 12;
constexpr unsigned int kDown = 16;

// CIM's ProtocolIFType.
constexpr unsigned int kOther = 1;
constexpr unsigned int kIPv4 = 4096;
constexpr unsigned int kIPv6 = 4097;
constexpr unsigned int kBoth = 4098;

unsigned int enabledState(const Link& link) {
  if ((link.flags & IFF_UP) == 0) return kDown;
  // A driver that does not report its operational state, for example that of a tunnel, still reports whether the lower
  // layer is up.
  const bool carrier =
      link.operState == IF_OPER_UP || (link.operState == IF_OPER_UNKNOWN && (link.flags & IFF_LOWER_UP) != 0);
  return carrier ? kUpWithCarrier : kUpWithoutCarrier;
}

unsigned int protocolType(const AddressList& addresses) {
  const auto has = [&addresses](AddressFamily family) {
    return std::any_of(addresses.begin(), addresses.end(),
                       [family](const InterfaceAddress& address) { return address.family() == family; });
  };
  const bool ipv4 = has(AddressFamily::IPv4);
  const bool ipv6 = has(AddressFamily::IPv6);
  if (ipv4 && ipv6) return kBoth;
  if (!ipv4 && !ipv6) return kOther;
  return ipv4 ? kIPv4 : kIPv6;
}

SharedStrings share(StringList list) { return std::make_shared<const StringList>(std::move(list)); }

using AddressesOfLinks = std::unordered_map<int, AddressList>;

AddressesOfLinks addressesByLink(LinkTable& table) {
  AddressesOfLinks result;
  for (LinkAddress& address : table.addresses) result[address.index].push_back(std::move(address.address));
  return result;
}

}  // namespace

HostSource::HostSource(HostSourceOptions options)
    : options_(std::move(options)),
      resolvConf_(options_.root + "/etc/resolv.conf"),
      stubResolvConf_(options_.root + "/run/systemd/resolve/resolv.conf"),
      hosts_(options_.root + "/etc/hosts"),
      watch_(options_.comparisons) {}

bool HostSource::changed() {
  if (!watching_) return true;
  const bool linksChanged = monitor_.changed();
  if (watch_.changed()) filesMoved_ = true;
  return linksChanged || filesMoved_ || unread_ || util::kernelHostName() != nodeName_;
}

void HostSource::reopen() {
  watching_ = false;
  watch_ = FileWatch(options_.comparisons);
  reader_.close();
}

// Called before anything is read, so that changes during the reading are reported afterwards.
void HostSource::startWatching() {
  if (!watching_) monitor_.open();
  if (!watching_ || filesMoved_) watch_.watch({resolvConf_, stubResolvConf_, hosts_});
  watching_ = true;
  filesMoved_ = false;
}

std::shared_ptr<const TreeSnapshot> HostSource::read() {
  startWatching();
  unread_ = false;
  nodeName_ = util::kernelHostName();
  const Resolver resolver = readResolver();
  LinkTable table = reader_.read();
  AddressesOfLinks addresses = addressesByLink(table);

  TreeBuilder builder(nodeName_);
  constexpr std::size_t kNodesOfLink = 2;
  builder.reserve(kNodesOfLink * table.links.size() + kNodesOfLink);
  const std::size_t system = builder.add(0, NodeType::System, "system", product());
  std::unordered_set<std::string_view> seen;
  for (const Link& link : table.links) {
    if ((link.flags & IFF_LOOPBACK) != 0 && !options_.includeLoopback) continue;
    // An interrupted dump may contain one name twice; the event of that change will follow.
    if (!seen.insert(link.name).second) continue;
    const auto own = std::make_shared<const AddressList>(std::move(addresses[link.index]));
    const std::size_t port = builder.add(system, NodeType::Port, link.name);
    const std::size_t node = builder.add(port, NodeType::NetworkIPConfig, "ip");
    builder.set(node, PROP_NAME, link.name);
    builder.set(node, PROP_HOST_NAME, resolver.names.host);
    if (!resolver.names.domain.empty()) builder.set(node, PROP_DOMAIN_NAME, resolver.names.domain);
    if (resolver.search != nullptr) builder.set(node, PROP_DNS_SUFFIXES, resolver.search);
    if (resolver.servers != nullptr) builder.set(node, PROP_DNS_SERVER_ADDRESSES, resolver.servers);
    builder.set(node, PROP_PROTOCOL_IF_TYPE, protocolType(*own));
    builder.set(node, PROP_ENABLED_STATE, enabledState(link));
    builder.set(node, kAddresses, own);
  }
  return builder.finish();
}

// A line that the limit cuts is left out.
util::FileText HostSource::readLines(const std::string& path) {
  util::FileText file = util::readFile(path, kLargestFile);
  if (file.truncated) file.text.erase(file.text.rfind('\n') + 1);
  if (util::mayPass(file.error)) unread_ = true;
  return file;
}

// A file that cannot be read counts as empty.
std::string HostSource::linesOf(const std::string& path) { return readLines(path).text; }

HostSource::Resolver HostSource::readResolver() {
  Resolver result;
  const util::FileText file = readLines(resolvConf_);
  ResolvConf conf;
  if (file.error == 0) {
    conf = parseResolvConf(file.text);
    StringList servers = conf.servers;
    if (namesOnlyLocalStub(conf)) {
      const ResolvConf stub = parseResolvConf(linesOf(stubResolvConf_));
      if (!stub.servers.empty()) servers = stub.servers;
    }
    result.servers = share(std::move(servers));
    result.search = share(conf.search);
  }
  const bool hasDomain = nodeName_.find('.') != std::string::npos;
  result.names = findHostNames(nodeName_, hasDomain ? std::string() : linesOf(hosts_), conf);
  return result;
}

// The maker's name of the product, if the firmware reports it. It does not change while the machine runs.
std::string HostSource::product() {
  if (!product_.empty()) return product_;
  const util::FileText file = readLines(options_.root + "/sys/class/dmi/id/product_name");
  if (util::mayPass(file.error)) return kComputer;
  const std::string name(util::trimmedEnd(file.text, util::kWhiteSpace));
  // "BMC" would mark a service processor, and this is none.
  product_ = name.empty() || name == "BMC" ? kComputer : name;
  return product_;
}

}  // namespace zorva::agent
