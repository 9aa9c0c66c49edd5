#include "bmc/Redfish.h"

#include <algorithm>
#include <charconv>
#include <thread>

#include "agent/config/Config.h"
#include "agent/sources/DnsFacts.h"
#include "util/Escape.h"

namespace zorva::bmc {

namespace {

using Kind = JsonValue::Kind;
using std::chrono::milliseconds;
using std::chrono::seconds;

constexpr const char* kRoot = "/redfish/v1/";
constexpr const char* kMembers = "Members";
constexpr std::size_t kLongestPath = 1024;
constexpr std::size_t kLongestToken = 4096;
constexpr std::size_t kMostValues = 100000;
constexpr int kMostPages = 64;

constexpr long kOk = 200;
constexpr long kAccepted = 202;
constexpr long kMultipleChoices = 300;
constexpr long kNotModified = 304;
constexpr long kBadRequest = 400;
constexpr long kUnauthorized = 401;
constexpr long kForbidden = 403;
constexpr long kPreconditionFailed = 412;
constexpr long kUnavailable = 503;

std::string shortLine(std::string_view text) {
  constexpr std::size_t kLongest = 300;
  std::string line;
  util::appendEscaped(line, text.substr(0, kLongest));
  return line;
}

std::string textIn(const JsonValue& value, std::string_view name) {
  const JsonValue* text = memberOf(value, name, Kind::Text);
  return text == nullptr ? std::string() : text->text;
}

void addMessages(const JsonValue* messages, std::string& line) {
  constexpr std::size_t kMostMessages = 5;
  if (messages == nullptr) return;
  for (std::size_t i = 0; i < std::min(messages->items.size(), kMostMessages); ++i) {
    const JsonValue& message = messages->items[i];
    std::string text = textIn(message, "Message");
    if (text.empty()) text = textIn(message, "MessageId");
    const std::string resolution = textIn(message, "Resolution");
    if (text.empty()) continue;
    line += (line.empty() ? "" : "; ") + shortLine(text);
    if (!resolution.empty() && resolution != "None" && resolution != "None.")
      line += " (" + shortLine(resolution) + ")";
  }
}

/// Only seconds, at least one; the form of a date is a clock's that may be wrong.
milliseconds retryAfter(const Reply& reply) {
  constexpr int kLongest = 10;
  const std::string_view text = reply.field("Retry-After");
  int value = 1;
  std::from_chars(text.data(), text.data() + text.size(), value);
  return seconds(std::clamp(value, 1, kLongest));
}

/// Printable ASCII without what ends or changes a path.
bool isPath(std::string_view path) {
  if (path != "/redfish/v1" && !path.starts_with(kRoot)) return false;
  if (path.size() > kLongestPath || path.find("..") != std::string_view::npos) return false;
  return std::all_of(path.begin(), path.end(),
                     [](char c) { return c > ' ' && c < '\x7F' && c != '\\' && c != '#' && c != '"'; });
}

}  // namespace

const JsonValue* memberOf(const JsonValue& value, std::string_view name, JsonValue::Kind kind) {
  const JsonValue* member = value.kind == Kind::Object ? value.find(name) : nullptr;
  return member != nullptr && member->kind == kind ? member : nullptr;
}

std::string messagesIn(const JsonValue& body) {
  std::string line;
  const JsonValue* error = memberOf(body, "error", Kind::Object);
  if (error != nullptr) addMessages(memberOf(*error, "@Message.ExtendedInfo", Kind::List), line);
  addMessages(memberOf(body, "@Message.ExtendedInfo", Kind::List), line);
  addMessages(memberOf(body, "Messages", Kind::List), line);
  if (line.empty() && error != nullptr) line = shortLine(textIn(*error, "message"));
  return line;
}

std::string shownTextIn(const JsonValue& value, std::string_view name) {
  const JsonValue* text = memberOf(value, name, Kind::Text);
  return text != nullptr && agent::isShownText(text->text) ? text->text : std::string();
}

std::string lastNameOf(const std::string& path) {
  const std::size_t end = path.find_last_not_of('/') + 1;
  const std::size_t begin = path.rfind('/', end - 1) + 1;
  return path.substr(begin, end - begin);
}

std::string idOf(const JsonValue& reference) {
  std::string id = textIn(reference, "@odata.id");
  if (!isPath(id)) throw Failed("the service processor names a resource that is none: '" + shortLine(id) + "'");
  return id;
}

void Redfish::begin(Clock::time_point deadline) {
  deadline_ = deadline;
  https_.setDeadline(deadline);
  requestsLeft_ = kMostRequests;
}

void Redfish::forget() {
  root_.reset();
  cache_.clear();
}

void Redfish::wait(milliseconds time) {
  if (Clock::now() + time >= deadline_) throw Failed("no answer from " + https_.url() + " in time");
  std::this_thread::sleep_for(time);
}

JsonValue Redfish::bodyOf(const Reply& reply, const std::string& path) const {
  try {
    JsonValue body = agent::parseJson(reply.body, https_.url() + path, kMostValues);
    if (body.kind == Kind::Object) return body;
  } catch (const agent::ConfigError& error) {
    throw Failed(std::string("the answer cannot be read: ") + error.what());
  }
  throw Failed("the answer of " + https_.url() + path + " is no JSON object");
}

void Redfish::fail(const Request& request, const Reply& reply) const {
  std::string messages;
  try {
    messages = messagesIn(agent::parseJson(reply.body, "answer", kMostValues));
  } catch (const agent::ConfigError&) {
    // The status has to do.
  }
  throw Failed(https_.url() + " answers " + std::to_string(reply.status) + " to " + request.method + " " +
               shortLine(request.path) + (messages.empty() ? "" : ": " + messages));
}

/// A header field may have a whole URL; it must be of this server.
std::string Redfish::pathIn(std::string_view location) const {
  if (location.starts_with(https_.url()) && location.substr(https_.url().size()).starts_with('/')) {
    location.remove_prefix(https_.url().size());
  }
  if (isPath(location)) return std::string(location);
  throw Failed(https_.url() + " sends elsewhere, which is not followed: '" + shortLine(location) + "'");
}

Reply Redfish::sendOnce(const Request& request, bool needsLogin) {
  if (needsLogin && token_.empty()) logIn();
  if (requestsLeft_-- <= 0) {
    throw Failed(https_.url() + " needs more than " + std::to_string(kMostRequests) + " requests");
  }
  if (!needsLogin) return https_.send(request);
  Request whole = request;
  whole.fields.push_back("X-Auth-Token: " + token_);
  Reply reply = https_.send(whole);
  util::Secret::wipe(whole.fields.back());
  return reply;
}

/// A session that expired is replaced once; a service that is busy is asked once more.
Reply Redfish::send(Request request, bool needsLogin) {
  Reply reply = sendOnce(request, needsLogin);
  if (reply.status == kUnauthorized && needsLogin) {
    token_.clear();
    session_.clear();
    reply = sendOnce(request, needsLogin);
  }
  if (reply.status == kUnavailable) {
    wait(retryAfter(reply));
    reply = sendOnce(request, needsLogin);
  }
  return reply;
}

Reply Redfish::getReply(std::string path, const std::string& ifNoneMatch) {
  for (int redirects = 0; redirects <= kMostRedirects; ++redirects) {
    Request request;
    request.path = path;
    if (!ifNoneMatch.empty()) request.fields.push_back("If-None-Match: " + ifNoneMatch);
    Reply reply = send(request, path != kRoot);
    const bool isElsewhere =
        reply.status >= kMultipleChoices && reply.status < kBadRequest && reply.status != kNotModified;
    if (!isElsewhere) {
      if (reply.status != kOk && reply.status != kNotModified) fail(request, reply);
      return reply;
    }
    path = pathIn(reply.field("Location"));
  }
  throw Failed(https_.url() + " redirects without end");
}

const JsonValue& Redfish::root() {
  if (!root_) root_ = bodyOf(getReply(kRoot, {}), kRoot);
  return *root_;
}

Resource Redfish::fetch(const std::string& path) {
  const Reply reply = getReply(path, {});
  Resource resource{bodyOf(reply, path), std::string(reply.field("ETag"))};
  if (resource.etag.empty()) resource.etag = textIn(resource.body, "@odata.etag");
  // It goes into a header field.
  if (resource.etag.find_first_of("\r\n") != std::string::npos) resource.etag.clear();
  return resource;
}

JsonValue Redfish::get(const std::string& path) {
  const auto cached = cache_.find(path);
  const Reply reply = getReply(path, cached == cache_.end() ? std::string() : cached->second.etag);
  if (reply.status == kNotModified && cached != cache_.end()) return cached->second.body;
  JsonValue body = bodyOf(reply, path);
  const std::string_view etag = reply.field("ETag");
  if (!etag.empty() && cache_.size() < kMostCached) cache_[path] = {std::string(etag), body};
  return body;
}

/// Whether "$expand=." is offered: the members with the collection. Their ETags are then not asked for: that of a
/// collection says nothing of its members.
bool Redfish::expands() {
  const JsonValue* features = memberOf(root(), "ProtocolFeaturesSupported", Kind::Object);
  const JsonValue* expand = features == nullptr ? nullptr : memberOf(*features, "ExpandQuery", Kind::Object);
  const JsonValue* noLinks = expand == nullptr ? nullptr : memberOf(*expand, "NoLinks", Kind::Boolean);
  return noLinks != nullptr && noLinks->boolean;
}

std::string Redfish::collectionPath(const std::string& collection) {
  return collection + (expands() ? "?$expand=." : "");
}

std::vector<JsonValue> Redfish::members(const std::string& collection, std::size_t most, bool& cut) {
  std::vector<JsonValue> found;
  std::set<std::string> pages{collection};
  std::set<std::string> seen;
  std::string page = collectionPath(collection);
  for (int pageNumber = 0; !page.empty(); ++pageNumber) {
    const JsonValue body = page == collection ? get(page) : fetch(page).body;
    const JsonValue* members = memberOf(body, kMembers, Kind::List);
    if (members == nullptr) throw Failed(https_.url() + collection + " has no members");
    for (const JsonValue& member : members->items) {
      const std::string id = idOf(member);
      if (!seen.insert(id).second) continue;
      if (found.size() == most) {
        cut = true;
        return found;
      }
      // A reference has its @odata.id alone.
      found.push_back(member.items.size() > 1 ? member : get(id));
    }
    const std::string next = textIn(body, "Members@odata.nextLink");
    if (next.empty()) break;
    page = pathIn(next);
    if (pageNumber == kMostPages || !pages.insert(page).second) {
      cut = true;
      break;
    }
  }
  return found;
}

std::optional<std::string> Redfish::patch(const std::string& path, const JsonValue& change, const std::string& etag) {
  Request request{"PATCH", path, {}, agent::formatJson(change)};
  if (!etag.empty()) request.fields.push_back("If-Match: " + etag);
  const Reply reply = send(request, true);
  cache_.clear();
  if (reply.status == kPreconditionFailed) return std::nullopt;
  if (reply.status == kAccepted) return finishTask(reply);
  if (reply.status < kOk || reply.status >= kMultipleChoices) fail(request, reply);
  return reply.body.empty() ? std::string() : messagesIn(bodyOf(reply, path));
}

/// Whether a task has ended, by what its monitor or the task itself says. Throws if it failed.
bool Redfish::isOver(const Reply& reply, std::string& remarks) {
  if (reply.status == kAccepted) return false;
  if (reply.status < kOk || reply.status >= kMultipleChoices) fail({"GET", "the task", {}, {}}, reply);
  if (reply.body.empty()) return true;
  const JsonValue body = bodyOf(reply, " (task)");
  remarks = messagesIn(body);
  const std::string state = textIn(body, "TaskState");
  if (state.empty() || state == "Completed") return true;
  const bool isEnd = state == "Exception" || state == "Killed" || state == "Cancelled";
  if (!isEnd) return false;
  throw Failed("the service processor gave up the change (" + state + ")" + (remarks.empty() ? "" : ": " + remarks));
}

/// The monitor is in Location, or the task in the body.
std::string Redfish::finishTask(const Reply& accepted) {
  const std::string_view location = accepted.field("Location");
  const std::string monitor = location.empty() ? idOf(bodyOf(accepted, " (task)")) : pathIn(location);
  milliseconds pause = accepted.field("Retry-After").empty() ? milliseconds(200) : retryAfter(accepted);
  for (;;) {
    wait(pause);
    Request request;
    request.path = monitor;
    const Reply reply = send(request, true);
    std::string remarks;
    if (isOver(reply, remarks)) return remarks;
    pause = reply.field("Retry-After").empty() ? std::min(pause * 2, milliseconds(2000)) : retryAfter(reply);
  }
}

/// A login that is refused may have been replaced by now: that one is tried at once.
void Redfish::logIn() {
  Login login = login_(refused_.get());
  // Another attempt with the same password could lock the account.
  if (isRefused(login) && Clock::now() < refusedUntil_) {
    throw Failed(https_.url() + " refused the login of " + shortLine(login.user) +
                 "; it is tried again after ten minutes, or with another password in its file");
  }
  long status = openSession(login);
  if (status == 0) return;
  login = login_(refused_.get());
  if (!isRefused(login)) status = openSession(login);
  if (status == 0) return;
  throw Failed(https_.url() + " refused the login of " + shortLine(login.user) + " (" + std::to_string(status) +
               "); see [bmc] user and password_file");
}

bool Redfish::isRefused(const Login& login) const {
  return refused_ != nullptr && refused_->text() == login.password->text();
}

/// The status with which the service refuses the login; 0: it does not.
long Redfish::openSession(const Login& login) {
  constexpr std::chrono::minutes kAfterRefusal{10};
  std::string path = "/redfish/v1/SessionService/Sessions";
  const JsonValue* links = memberOf(root(), "Links", Kind::Object);
  const JsonValue* sessions = links == nullptr ? nullptr : memberOf(*links, "Sessions", Kind::Object);
  if (sessions != nullptr) path = idOf(*sessions);
  JsonValue body = JsonValue::object();
  body.add("UserName", JsonValue::ofText(login.user));
  body.add("Password", JsonValue::ofText(login.password->text()));
  Request request{"POST", path, {}, agent::formatJson(body)};
  util::Secret::wipe(body.items.back().text);
  const Reply reply = sendOnce(request, false);
  util::Secret::wipe(request.body);
  if (reply.status == kUnauthorized || reply.status == kForbidden || reply.status == kBadRequest) {
    refused_ = login.password;
    refusedUntil_ = Clock::now() + kAfterRefusal;
    return reply.status;
  }
  if (reply.status < kOk || reply.status >= kMultipleChoices) fail(request, reply);
  refused_.reset();
  token_ = reply.field("X-Auth-Token");
  if (token_.empty() || token_.size() > kLongestToken) {
    token_.clear();
    throw Failed(https_.url() + " made a session without a token");
  }
  const std::string_view location = reply.field("Location");
  session_ = location.empty() ? std::string() : pathIn(location);
  return 0;
}

void Redfish::logOut() noexcept try {
  if (!token_.empty() && !session_.empty()) {
    constexpr seconds kLongest{5};
    begin(Clock::now() + kLongest);
    sendOnce({"DELETE", session_, {}, {}}, true);
  }
  util::Secret::wipe(token_);
} catch (const std::exception&) {
  // The service ends it by itself after a while.
  util::Secret::wipe(token_);
}

}  // namespace zorva::bmc
