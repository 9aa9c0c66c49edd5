#pragma once

// The gate of zorvacimd. In this order it takes
//  - over a Unix socket: the user that the kernel reports;
//  - HTTP Basic over TLS, with a user of the file of users;
//  - a client certificate of such a user;
//  - on a loopback address: clients without a login, as configured.
//
// A password is never looked at if it came over plain HTTP.

#include <chrono>
#include <functional>
#include <memory>
#include <mutex>
#include <string>

#include "access/BasicLogin.h"
#include "access/FailedLogins.h"
#include "access/Gate.h"
#include "access/LocalUsers.h"
#include "access/PasswordVerifier.h"
#include "access/RememberedLogins.h"
#include "access/UsersFile.h"

namespace zorva::access {

struct LoginOptions {
  std::string usersFile = defaultUsersFile();
  Role anonymous = Role::Read;        ///< of clients without a login, on loopback addresses
  std::string group = kDefaultGroup;  ///< its members operate over the Unix socket
  Role otherLocal = Role::Read;       ///< of all other local users there

  bool operator==(const LoginOptions&) const = default;
};

/// What the gate needs of its surroundings.
struct LoginServices {
  /// Takes a line for the log. Clients can cause any number of them, but never choose their text.
  std::function<void(const std::string& line)> log = [](const std::string&) {};
  std::function<LocalUser(uid_t user, const std::string& group)> lookUp = lookUpUser;
  std::function<Clock::time_point()> now = Clock::now;
  std::shared_ptr<PasswordVerifier> passwords = std::make_shared<HashVerifier>();
};

class LoginGate final : public Gate {
 public:
  /// Reads the file of users. Throws UsersError if it is not valid.
  explicit LoginGate(LoginOptions options, LoginServices services = {});

  Decision decide(const Origin& origin, const std::string* authorization) override;
  Decision verify(const Origin& origin, const std::string& authorization) override;

  /// Takes other options. Throws UsersError if another file of users is not valid; then all stays as it was.
  void setOptions(const LoginOptions& options);

  /// Reads the file of users again if it has changed. Logins of users whose entry changed are no longer remembered.
  /// Cheap; call it now and then.
  void refresh();

  /// Whether there is any user at all.
  bool hasUsers() const;

 private:
  struct State {
    LoginOptions options;
    std::shared_ptr<WatchedUsers> users;
    ClientPtr anonymous;  ///< null: a login is needed
  };
  using StatePtr = std::shared_ptr<const State>;
  struct Member {
    ClientPtr client;
    Clock::time_point lookedUp;
  };

  static StatePtr makeState(const LoginOptions& options, std::shared_ptr<WatchedUsers> users);
  StatePtr state() const;
  Decision decideLocal(const Origin& origin, bool hasLogin);
  Decision admitLocal(const ClientPtr& client) const;
  void lookUpLocal(uid_t user);
  Decision decideLogin(const Origin& origin, const std::string& authorization);
  Decision decideCertificate(const Certificate& certificate, bool mayWait) const;
  Decision decideAnonymous(const Origin& origin) const;
  Decision verifyLogin(const Origin& origin, const BasicLogin& login);
  Decision fail(const Origin& origin, const std::string& why);
  Decision tooEarly(std::chrono::milliseconds remaining) const;
  void forgetChanged(const Users& before, const Users& after);

  const LoginServices services_;
  mutable std::mutex mutex_;
  StatePtr state_;                               ///< under the lock
  RecentTable<uid_t, Member> localUsers_{1024};  ///< under the lock
  RememberedLogins remembered_;
  FailedLogins failed_;
};

}  // namespace zorva::access
