#include "agent/sources/HostSource.h"

#include <fcntl.h>
#include <linux/if.h>

#include <unordered_map>
#include <unordered_set>
#include <utility>

#include "agent/sources/DnsProperties.h"
#include "agent/tree/IpAddress.h"
#include "util/HostName.h"
#include "util/ReadFile.h"
#include "util/Text.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;

constexpr std::size_t kLargestFile = std::size_t{64} << 10;
constexpr const char* kComputer = "Computer";
constexpr const char* kResolvConf = "/etc/resolv.conf";

unsigned int enabledState(const Link& link) {
  if ((link.flags & IFF_UP) == 0) return kRawDown;
  // A driver that does not report its operational state, for example that of a tunnel, still reports whether the lower
  // layer is up.
  const bool carrier =
      link.operState == IF_OPER_UP || (link.operState == IF_OPER_UNKNOWN && (link.flags & IFF_LOWER_UP) != 0);
  return carrier ? kRawUpWithCarrier : kRawUpWithoutCarrier;
}

using AddressesOfLinks = std::unordered_map<int, AddressList>;

AddressesOfLinks addressesByLink(LinkTable& table) {
  AddressesOfLinks result;
  for (LinkAddress& address : table.addresses) result[address.index].push_back(std::move(address.address));
  return result;
}

}  // namespace

HostSource::HostSource(HostSourceOptions options)
    : options_(std::move(options)),
      resolvConf_(options_.root + kResolvConf),
      stubResolvConf_(options_.root + "/run/systemd/resolve/resolv.conf"),
      hosts_(options_.root + "/etc/hosts"),
      owners_(options_.root),
      watch_(options_.comparisons) {}

bool HostSource::changed() {
  if (!watching_) return true;
  const bool linksChanged = monitor_.changed();
  const bool ownersChanged = owners_.changed();
  if (watch_.changed()) filesMoved_ = true;
  return linksChanged || ownersChanged || filesMoved_ || unread_ || util::kernelHostName() != nodeName_;
}

void HostSource::reopen() {
  watching_ = false;
  watch_ = FileWatch(options_.comparisons);
  reader_.close();
  owners_.reopen();
}

void HostSource::addWakers(Wakers& wakers) {
  if (!nodeNameFile_) nodeNameFile_ = util::FileDescriptor(::open("/proc/sys/kernel/hostname", O_RDONLY | O_CLOEXEC));
  wakers.add(nodeNameFile_.get(), POLLPRI);
  wakers.addOrLook(monitor_.descriptor());
  wakers.addOrLook(unread_ ? -1 : watch_.descriptor());
  owners_.addWakers(wakers);
}

// Called before anything is read, so that changes during the reading are reported afterwards.
void HostSource::startWatching() {
  if (!watching_) monitor_.open();
  if (!watching_ || filesMoved_) watch_.watch({resolvConf_, stubResolvConf_, hosts_, owners_.busSocket()});
  watching_ = true;
  filesMoved_ = false;
}

std::shared_ptr<const TreeSnapshot> HostSource::read() {
  startWatching();
  unread_ = false;
  nodeName_ = util::kernelHostName();
  const Resolver resolver = readResolver();
  LinkTable table = reader_.read();
  owners_.look(table.links);
  const bool owned = owners_.speakForAny(table.links);
  const CommonLists common = owned ? CommonLists() : commonLists(resolver);
  // While interfaces have domains of their own, the search list of all of them together is nobody's domain.
  const HostNames names = findHostNames(nodeName_, resolver.hosts, owned ? ResolvConf() : resolver.conf);
  AddressesOfLinks addresses = addressesByLink(table);

  TreeBuilder builder(nodeName_);
  constexpr std::size_t kNodesOfLink = 2;
  builder.reserve(kNodesOfLink * table.links.size() + kNodesOfLink);
  const std::size_t system = builder.add(0, NodeType::System, "system", product());
  setSystem(builder, system, resolver);
  std::unordered_set<std::string_view> seen;
  for (const Link& link : table.links) {
    if ((link.flags & IFF_LOOPBACK) != 0 && !options_.includeLoopback) continue;
    // An interrupted dump may contain one name twice; the event of that change will follow.
    if (!seen.insert(link.name).second) continue;
    const std::size_t port = builder.add(system, NodeType::Port, link.name);
    const std::size_t node = builder.add(port, NodeType::NetworkIPConfig, "ip");
    builder.set(node, PROP_HOST_NAME, names.host);
    if (!names.domain.empty()) builder.set(node, PROP_DOMAIN_NAME, names.domain);
    setLink(builder, node, link, std::move(addresses[link.index]));
    setDns(builder, node, link, owned ? nullptr : &common);
  }
  return builder.finish();
}

void HostSource::setLink(TreeBuilder& builder, std::size_t node, const Link& link, AddressList addresses) {
  builder.set(node, PROP_NAME, link.name);
  builder.set(node, PROP_PROTOCOL_IF_TYPE, protocolTypeOf(addresses));
  builder.set(node, PROP_ENABLED_STATE, enabledState(link));
  builder.set(node, kAddresses, std::make_shared<const AddressList>(std::move(addresses)));
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
  result.known = !util::mayPass(file.error);
  // A file that is not there, or may not be read, is an empty one to the resolver.
  result.conf = parseResolvConf(file.text, nodeName_);
  result.servers = result.conf.servers;
  if (namesOnlyLocalStub(result.conf)) {
    const util::FileText behind = readLines(stubResolvConf_);
    const ResolvConf conf = parseResolvConf(behind.text, {});
    if (behind.error == 0 && conf.servers != StringList{"127.0.0.1"}) result.servers = conf.servers;
  }
  const bool hasDomain = nodeName_.find('.') != std::string::npos;
  if (!hasDomain) result.hosts = linesOf(hosts_);
  return result;
}

HostSource::CommonLists HostSource::commonLists(const Resolver& resolver) {
  if (!resolver.known) return {};
  return {share(resolver.servers), share(resolver.conf.search)};
}

void HostSource::setSystem(TreeBuilder& builder, std::size_t node, const Resolver& resolver) const {
  if (resolver.known) setResolverProperties(builder, node, resolver.conf);
  const DnsFacts* facts = owners_.hostFacts();
  if (facts == nullptr) return;
  builder.set(node, PROP_DNS_SERVER_ADDRESSES, share(facts->servers));
  builder.set(node, PROP_DNS_SUFFIXES, share(facts->suffixes));
  setDnsProperties(builder, node, *facts);
}

// common is null where owners speak for the interfaces.
void HostSource::setDns(TreeBuilder& builder, std::size_t node, const Link& link, const CommonLists* common) const {
  DnsFacts facts = owners_.factsOf(link);
  if (common == nullptr) {
    builder.set(node, PROP_DNS_SERVER_ADDRESSES, share(facts.servers));
    builder.set(node, PROP_DNS_SUFFIXES, share(facts.suffixes));
    if (!facts.domain.empty()) builder.set(node, PROP_DOMAIN_NAME, facts.domain);
  } else if (common->servers != nullptr) {
    builder.set(node, PROP_DNS_SERVER_ADDRESSES, common->servers);
    builder.set(node, PROP_DNS_SUFFIXES, common->search);
    facts.owner = kResolvConf;
    facts.profile.clear();
  }
  setDnsProperties(builder, node, facts);
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
