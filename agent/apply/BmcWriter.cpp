// The writer of a service processor's settings. zorva-bmc carries the change out: it has the session, the password and
// the right to use the network. A request and its answer are JSON objects over a Unix socket; each ends where its
// sender stops writing.

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <chrono>
#include <utility>

#include "agent/apply/Writers.h"
#include "agent/sources/SystemBus.h"
#include "agent/tree/BmcJson.h"
#include "agent/tree/Json.h"
#include "util/Escape.h"
#include "util/FileDescriptor.h"

namespace zorva::agent {
namespace {

using Clock = std::chrono::steady_clock;
using Kind = JsonValue::Kind;

constexpr const char* kOnlyRoot = "only root may ask zorva-bmc, or have it change the service processor";
constexpr const char* kNotThere =
    "zorva-bmc does not answer, so the service processor cannot be changed; 'systemctl status zorva-bmc' says why";

bool sendAll(int socket, std::string_view text) {
  while (!text.empty()) {
    const ssize_t sent = ::send(socket, text.data(), text.size(), MSG_NOSIGNAL);
    if (sent < 0 && errno != EINTR) return false;
    if (sent > 0) text.remove_prefix(static_cast<std::size_t>(sent));
  }
  return ::shutdown(socket, SHUT_WR) == 0;
}

// zorva-bmc allows a change 60 s. An answer that takes longer, because a slow reading came before it, counts as none.
std::string receiveAll(int socket) {
  constexpr std::chrono::seconds kLongest{75};
  constexpr std::size_t kLargest = std::size_t{1} << 20U;
  const auto end = Clock::now() + kLongest;
  std::string text;
  std::array<char, 4096> buffer{};
  while (text.size() <= kLargest) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(end - Clock::now()).count();
    pollfd entry{socket, POLLIN, 0};
    if (left <= 0) return {};
    const int ready = ::poll(&entry, 1, static_cast<int>(left));
    if (ready < 0 && errno == EINTR) continue;
    if (ready <= 0) return {};
    const ssize_t got = ::recv(socket, buffer.data(), buffer.size(), 0);
    if (got == 0) return text;
    if (got < 0 && errno != EINTR && errno != EAGAIN) return {};
    if (got > 0) text.append(buffer.data(), static_cast<std::size_t>(got));
  }
  return {};
}

class BmcWriter : public DnsWriter {
 public:
  explicit BmcWriter(const std::string& bmcFile) : socket_(bmcSocketBeside(bmcFile)) {}

  // It appends its domain and nothing else.
  DnsSettings asHeld(const DnsSettings& settings) const override {
    DnsSettings held = settings;
    if (held.suffixes.size() > 1) held.suffixes.resize(1);
    return held;
  }

  // Others than root see what would change in the tree, and must not fail for what only zorva-bmc knows.
  Expected<std::string, Refusal> warningBefore(const DnsTarget& target, const DnsSettings& settings) override {
    if (!mayAsk()) return std::string(kOnlyRoot) + ": what it would no longer use of DHCP's is not shown";
    JsonValue request = requestFor("read", target);
    addSettings(request, settings);
    return textOf(ask(request), "warning");
  }

  Expected<std::string, Refusal> save(const DnsTarget& target) override {
    if (!mayAsk()) return std::string();
    const auto answer = ask(requestFor("read", target));
    if (!answer) return unexpected(answer.error());
    const JsonValue* properties = answer->find("properties");
    if (properties == nullptr) return unexpected(std::string(kNotThere));
    return formatJson(*properties);
  }

  Expected<void, Refusal> write(const DnsTarget& target, const DnsSettings& settings) override {
    JsonValue request = requestFor("write", target);
    addSettings(request, settings);
    return change(request);
  }

  Expected<void, Refusal> restore(const DnsTarget& target, const std::string& saved) override {
    JsonValue request = requestFor("restore", target);
    try {
      request.add("properties", parseJson(saved, "the saved settings of the service processor"));
    } catch (const ConfigError& error) {
      return unexpected(std::string(error.what()));
    }
    return change(request);
  }

  std::string note() const override { return note_; }

 private:
  bool mayAsk() const { return ::access(socket_.c_str(), W_OK) == 0 || errno != EACCES; }

  static JsonValue requestFor(const char* action, const DnsTarget& target) {
    JsonValue request = JsonValue::object();
    request.add("action", JsonValue::ofText(action));
    request.add("resource", JsonValue::ofText(target.profile));
    return request;
  }

  static void addSettings(JsonValue& request, const DnsSettings& settings) {
    request.add("servers", JsonValue::ofTexts(settings.servers));
    request.add("domain", JsonValue::ofText(settings.suffixes.empty() ? std::string() : settings.suffixes.front()));
  }

  static Expected<std::string, Refusal> textOf(const Expected<JsonValue, Refusal>& answer, const char* key) {
    if (!answer) return unexpected(answer.error());
    const JsonValue* text = answer->find(key);
    std::string line;
    if (text != nullptr && text->kind == Kind::Text) util::appendEscaped(line, text->text);
    return line;
  }

  Expected<JsonValue, Refusal> ask(const JsonValue& request) const {
    if (!mayAsk()) return unexpected(std::string(kOnlyRoot));
    const util::FileDescriptor socket = connectToSocket(socket_);
    if (!socket || !sendAll(socket.get(), formatJson(request))) return unexpected(std::string(kNotThere));
    try {
      JsonValue answer = parseJson(receiveAll(socket.get()), "the answer of zorva-bmc");
      if (answer.kind != Kind::Object) return unexpected(std::string(kNotThere));
      const auto problem = textOf(answer, "problem");
      if (!problem->empty()) return unexpected("the service processor was not changed: " + *problem);
      return answer;
    } catch (const ConfigError&) {
      return unexpected(std::string(kNotThere));
    }
  }

  Expected<void, Refusal> change(const JsonValue& request) {
    auto note = textOf(ask(request), "note");
    if (!note) return unexpected(note.error());
    note_ = std::move(*note);
    return {};
  }

  const std::string socket_;
  std::string note_;
};

}  // namespace

std::unique_ptr<DnsWriter> makeBmcWriter(const std::string& bmcFile) { return std::make_unique<BmcWriter>(bmcFile); }

}  // namespace zorva::agent
