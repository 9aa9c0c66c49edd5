#include "bmc/Service.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <set>
#include <system_error>

#include "agent/sources/DnsFacts.h"
#include "bmc/Ethernet.h"
#include "bmc/Managers.h"
#include "util/Escape.h"
#include "util/FileError.h"
#include "util/ReadFile.h"
#include "util/ReplaceFile.h"
#include "util/Text.h"

namespace zorva::bmc {

namespace {

using Kind = JsonValue::Kind;
using std::chrono::milliseconds;

std::string directoryOf(const std::string& file) { return file.substr(0, file.rfind('/') + 1); }

std::uint64_t secondsNow() {
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::seconds>(now).count());
}

void say(const std::string& text) { std::fprintf(stderr, "zorva-bmc: %s\n", text.c_str()); }

agent::BmcState emptyState() {
  agent::BmcState state;
  state.tree = agent::TreeBuilder(std::string()).finish();
  return state;
}

/// The state from before a restart; an empty one if the file is not there or is wrong.
agent::BmcState formerState(const std::string& file) {
  try {
    return agent::readBmcState(file);
  } catch (const std::exception&) {
    return emptyState();
  }
}

/// Whether there is an interface of a service processor in it.
bool hasInterfaces(const agent::BmcState& state) {
  const auto isInterface = [](const agent::Node& node) { return node.type() == agent::NodeType::NetworkIPConfig; };
  return std::any_of(state.tree->nodes().begin(), state.tree->nodes().end(), isInterface);
}

JsonValue oneMember(const char* name, JsonValue value) {
  JsonValue object = JsonValue::object();
  object.add(name, std::move(value));
  return object;
}

/// Waits for a socket. False at the deadline.
bool isReady(int socket, short events, Clock::time_point deadline) {
  const auto left = std::chrono::ceil<milliseconds>(deadline - Clock::now()).count();
  pollfd entry{socket, events, 0};
  return left > 0 && ::poll(&entry, 1, static_cast<int>(std::min<long long>(left, 60000))) > 0;
}

/// What the other end sends until it has no more, 256 KiB at most; empty if that is not a whole request in time.
std::string readAll(int socket, Clock::time_point deadline) {
  constexpr std::size_t kLargest = std::size_t{256} << 10;
  std::string text;
  std::array<char, 4096> buffer{};
  while (text.size() <= kLargest && isReady(socket, POLLIN, deadline)) {
    const ssize_t got = ::recv(socket, buffer.data(), buffer.size(), MSG_DONTWAIT);
    if (got == 0) return text;
    if (got < 0 && errno != EAGAIN && errno != EINTR) return {};
    if (got > 0) text.append(buffer.data(), static_cast<std::size_t>(got));
  }
  return {};
}

void writeAll(int socket, std::string_view text, Clock::time_point deadline) {
  while (!text.empty() && isReady(socket, POLLOUT, deadline)) {
    const ssize_t sent = ::send(socket, text.data(), text.size(), MSG_DONTWAIT | MSG_NOSIGNAL);
    if (sent < 0 && errno != EAGAIN && errno != EINTR) return;
    if (sent > 0) text.remove_prefix(static_cast<std::size_t>(sent));
  }
}

bool mayAsk(int socket) {
  ucred peer{};
  socklen_t size = sizeof peer;
  if (::getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &peer, &size) != 0) return false;
  return peer.uid == 0 || peer.uid == ::geteuid();
}

WantedDns wantedIn(const JsonValue& request) {
  WantedDns wanted;
  if (const JsonValue* list = memberOf(request, "servers", Kind::List)) {
    wanted.servers.emplace();
    for (const JsonValue& item : list->items) wanted.servers->push_back(item.text);
  }
  if (const JsonValue* domain = memberOf(request, "domain", Kind::Text)) {
    if (!domain->text.empty() && !agent::isDomain(domain->text)) throw Failed("the domain is no DNS name");
    wanted.domain = domain->text;
  }
  return wanted;
}

}  // namespace

LoginSource loginFromFile(const std::string& user, const std::string& passwordFile) {
  return [user, passwordFile](const util::Secret*) {
    constexpr std::size_t kLongest = 4096;
    constexpr unsigned int kOthers = 077;
    util::FileText file = util::readFile(passwordFile, kLongest);
    std::string password = file.text.substr(0, file.text.find_first_of("\r\n"));
    util::Secret::wipe(file.text);
    auto secret = std::make_shared<const util::Secret>(password);
    if (file.error != 0) throw Failed(passwordFile + ": cannot be read: " + util::fileErrorText(file.error));
    if ((file.mode & kOthers) != 0) {
      throw Failed(passwordFile + ": others than its owner may use it; 'chmod 600' lets the owner only");
    }
    if (file.owner != 0 && file.owner != ::geteuid()) throw Failed(passwordFile + ": belongs to another user");
    if (secret->text().empty()) throw Failed(passwordFile + ": its first line, the password, is empty");
    return Login{user, std::move(secret)};
  };
}

Service::Service(const agent::BmcConfig& config, Target target, Patience patience)
    : config_(config),
      patience_(patience),
      https_(std::move(target.url), std::move(target.trust)),
      redfish_(https_, std::move(target.login)),
      state_(formerState(config.file)) {
  https_.setCancel(&isStopped_);
  state_.interval = static_cast<std::uint64_t>(config.interval);
}

/// Also after stop().
void Service::logOut() noexcept {
  https_.setCancel(nullptr);
  redfish_.logOut();
}

bool Service::readOnce() {
  try {
    redfish_.begin(Clock::now() + patience_.reading);
    std::string remark;
    agent::BmcState fresh;
    fresh.tree = treeOf(readManagers(redfish_, remark));
    fresh.readAt = secondsNow();
    fresh.interval = state_.interval;
    // Some answer so while they start.
    if (!hasInterfaces(fresh) && hasInterfaces(state_)) throw Failed(https_.url() + " shows no Ethernet interfaces");
    state_ = std::move(fresh);
    report(remark);
    publish();
    return true;
  } catch (const std::exception& error) {
    if (isStopped_) return false;
    redfish_.forget();
    state_.problem = error.what();
    report(state_.problem);
    publish();
    return false;
  }
}

/// The same problem is reported once.
void Service::report(const std::string& problem) {
  if (problem == reported_) return;
  say(problem.empty() ? "the service processor answers" : problem);
  reported_ = problem;
}

void Service::publish() {
  const std::string text = formatBmcState(state_);
  if (text == published_) return;
  const std::string directory = directoryOf(config_.file);
  struct stat like {};
  if (::stat(directory.c_str(), &like) != 0) util::throwFileError(directory, "cannot be read");
  constexpr mode_t kRights = 0640;
  like.st_mode = kRights;
  const std::string unsynced = util::replaceFile(directory, config_.file.substr(directory.size()), text, &like);
  if (!unsynced.empty()) say(unsynced);
  published_ = text;
}

void Service::openSocket() {
  const std::string path = agent::bmcSocketBeside(config_.file);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.size() >= sizeof address.sun_path) throw Failed(path + ": is too long for a socket");
  std::memcpy(address.sun_path, path.c_str(), path.size() + 1);
  socket_ = util::FileDescriptor(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
  ::unlink(path.c_str());
  constexpr mode_t kOwnerOnly = 0177;
  constexpr int kBacklog = 16;
  const mode_t before = ::umask(kOwnerOnly);
  const bool bound = ::bind(socket_.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0;
  ::umask(before);
  if (!bound || ::listen(socket_.get(), kBacklog) != 0) util::throwFileError(path, "cannot be opened");
}

void Service::run() {
  openSocket();
  while (!isStopped_) {
    readOnce();
    waitUntil(Clock::now() + std::chrono::seconds(config_.interval));
  }
  ::unlink(agent::bmcSocketBeside(config_.file).c_str());
}

/// Serves the agent until then. A signal ends the wait at once.
void Service::waitUntil(Clock::time_point next) {
  while (!isStopped_ && Clock::now() < next) {
    if (isReady(socket_.get(), POLLIN, next)) serveOne();
  }
}

void Service::serveOne() {
  constexpr std::chrono::seconds kLongest{5};
  const util::FileDescriptor peer(::accept4(socket_.get(), nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK));
  if (!peer || !mayAsk(peer.get())) return;
  const std::string request = readAll(peer.get(), Clock::now() + kLongest);
  if (!request.empty()) writeAll(peer.get(), answer(request), Clock::now() + kLongest);
}

std::string Service::answer(const std::string& request) {
  try {
    return agent::formatJson(perform(agent::parseJson(request, "request")));
  } catch (const std::exception& error) {
    return agent::formatJson(oneMember("problem", JsonValue::ofText(error.what())));
  }
}

/// The agent changes interfaces that it was shown, and nothing else.
std::string Service::resourceIn(const JsonValue& request) const {
  const JsonValue* wanted = memberOf(request, "resource", Kind::Text);
  for (const agent::Node& node : state_.tree->nodes()) {
    const std::string* resource = node.text(agent::kDnsProfile);
    if (wanted != nullptr && resource != nullptr && *resource == wanted->text) return *resource;
  }
  throw Failed("the service processor has no such interface");
}

JsonValue Service::perform(const JsonValue& request) {
  const std::string resource = resourceIn(request);
  const JsonValue* action = memberOf(request, "action", Kind::Text);
  const std::string name = action == nullptr ? std::string() : action->text;
  redfish_.begin(Clock::now() + patience_.change);
  const WantedDns wanted = wantedIn(request);
  if (name == "read") {
    const Ethernet now = readEthernet(redfish_.fetch(resource).body);
    JsonValue answer = oneMember("properties", propertiesOf(now));
    propertiesFor(now, wanted);  // throws if there is no place for them
    answer.add("warning", JsonValue::ofText(warningBefore(now, wanted)));
    return answer;
  }
  if (name == "write") {
    const auto properties = [&](const Ethernet& now) { return propertiesFor(now, wanted); };
    return oneMember("note", JsonValue::ofText(makeChange(resource, properties)));
  }
  const JsonValue* saved = memberOf(request, "properties", Kind::Object);
  if (name != "restore" || saved == nullptr) throw Failed("the request is not understood");
  const auto properties = [saved](const Ethernet& now) { return differenceFrom(now, *saved); };
  return oneMember("note", JsonValue::ofText(makeChange(resource, properties)));
}

/// Whatever comes of the change, the file has what the service says after it.
std::string Service::makeChange(const std::string& resource, const PropertiesOn& propertiesOn) {
  std::string note;
  try {
    note = change(redfish_, resource, propertiesOn);
    awaitEffect(resource, propertiesOn);
  } catch (...) {
    readOnce();
    throw;
  }
  readOnce();
  return note;
}

/// A service may need some time until what it took is in use. Some start their network anew and do not answer
/// meanwhile.
void Service::awaitEffect(const std::string& resource, const PropertiesOn& propertiesOn) {
  constexpr milliseconds kPause{500};
  const auto end = std::min(Clock::now() + patience_.effect, redfish_.deadline());
  for (;;) {
    try {
      if (propertiesOn(readEthernet(redfish_.fetch(resource).body)).items.empty()) return;
    } catch (const Failed&) {
      // The reading that follows reports it, if it lasts.
    }
    if (isStopped_ || Clock::now() + kPause >= end) return;
    redfish_.wait(kPause);
  }
}

}  // namespace zorva::bmc
