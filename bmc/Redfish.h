#pragma once

// The Redfish protocol (DSP0266): sessions, resources with their ETags, collections, changes and their tasks.

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "agent/tree/Json.h"
#include "bmc/Https.h"
#include "util/Secret.h"

namespace zorva::bmc {

using agent::JsonValue;

/// A login. The password is read when it is needed, so that a new one in its file counts.
struct Login {
  std::string user;
  std::shared_ptr<const util::Secret> password;
};
/// Gets the password that the service refused last, or null, and throws Failed if there is no login that may be tried.
using LoginSource = std::function<Login(const util::Secret* refused)>;

struct Resource {
  JsonValue body;
  std::string etag;  ///< as in If-Match; empty: the service gives none
};

/// The limits of one reading or one change.
inline constexpr int kMostRequests = 512;
inline constexpr int kMostRedirects = 4;
inline constexpr std::size_t kMostCached = 512;

/// The texts of @Message.ExtendedInfo, or of a task's Messages, as one line; empty if there are none.
std::string messagesIn(const JsonValue& body);

/// The member of that name if it is of that kind; else null.
const JsonValue* memberOf(const JsonValue& value, std::string_view name, JsonValue::Kind kind);

/// The text of that name, if it can be shown on a line; else the empty one.
std::string shownTextIn(const JsonValue& value, std::string_view name);

/// The last name of a path: "1" of "/redfish/v1/Managers/1/".
std::string lastNameOf(const std::string& path);

/// The @odata.id of a reference, or of a resource itself. Throws Failed if it is no path below /redfish/v1.
std::string idOf(const JsonValue& reference);

/// One service. Used by one thread. Functions throw Failed.
class Redfish : util::NotCopied {
 public:
  Redfish(Https& https, LoginSource login) : https_(https), login_(std::move(login)) {}

  /// Allows kMostRequests requests from now until the deadline.
  void begin(Clock::time_point deadline);
  Clock::time_point deadline() const { return deadline_; }

  /// The service root, which needs no login. Read once after each failure.
  const JsonValue& root();

  /// A resource; the former body if the service says that it has not changed.
  JsonValue get(const std::string& path);

  /// A resource as it is now.
  Resource fetch(const std::string& path);

  /// The members of a collection, at most that many of them, each once. `cut` becomes true if there are more.
  std::vector<JsonValue> members(const std::string& collection, std::size_t most, bool& cut);

  /// Changes a resource. Follows a task to its end. Empty: the resource is not as `etag` says any more (412).
  /// Otherwise the service's remarks, which may be none.
  std::optional<std::string> patch(const std::string& path, const JsonValue& change, const std::string& etag);

  /// Waits, but not beyond the deadline.
  void wait(std::chrono::milliseconds time);

  /// Ends the session. Never throws.
  void logOut() noexcept;

  /// Forgets what was learned before a failure.
  void forget();

 private:
  struct Cached {
    std::string etag;
    JsonValue body;
  };

  Reply send(Request request, bool needsLogin);
  Reply sendOnce(const Request& request, bool needsLogin);
  Reply getReply(std::string path, const std::string& ifNoneMatch);
  std::string finishTask(const Reply& accepted);
  bool isOver(const Reply& reply, std::string& remarks);
  void logIn();
  bool isRefused(const Login& login) const;
  long openSession(const Login& login);
  bool expands();
  std::string collectionPath(const std::string& collection);
  JsonValue bodyOf(const Reply& reply, const std::string& path) const;
  [[noreturn]] void fail(const Request& request, const Reply& reply) const;
  std::string pathIn(std::string_view location) const;

  Https& https_;
  LoginSource login_;
  Clock::time_point deadline_ = Clock::time_point::max();
  int requestsLeft_ = kMostRequests;
  std::optional<JsonValue> root_;
  std::string token_;
  std::string session_;                          ///< the path of the session
  std::shared_ptr<const util::Secret> refused_;  ///< the password that the service did not accept
  Clock::time_point refusedUntil_;
  std::map<std::string, Cached> cache_;  ///< by path
};

}  // namespace zorva::bmc
