#include "access/LoginGate.h"

#include <unistd.h>

#include <utility>

namespace zorva::access {

namespace {

using std::chrono::milliseconds;
using Kind = Decision::Kind;

constexpr std::chrono::seconds kLocalUserKept{60};

Decision admit(std::string user, Proof proof, Grants grants) {
  return {Kind::Admitted, std::make_shared<const Client>(Client{std::move(user), proof, std::move(grants)})};
}

/// A time in seconds for people: "0.25 s", "8 s".
std::string secondsText(milliseconds time) {
  std::string text = std::to_string(time.count() / 1000);
  const std::string rest = std::to_string(1000 + time.count() % 1000).substr(1);
  const std::size_t digits = rest.find_last_not_of('0');
  if (digits != std::string::npos) text += "." + rest.substr(0, digits + 1);
  return text + " s";
}

std::string addressOf(const Origin& origin) { return origin.address.empty() ? clientGroup(origin) : origin.address; }

}  // namespace

LoginGate::LoginGate(LoginOptions options, LoginServices services)
    : services_(std::move(services)),
      state_(makeState(options, std::make_shared<WatchedUsers>(options.usersFile, services_.log))) {}

LoginGate::StatePtr LoginGate::makeState(const LoginOptions& options, std::shared_ptr<WatchedUsers> users) {
  ClientPtr anonymous;
  if (options.anonymous != Role::None) anonymous = admit({}, Proof::None, Grants(options.anonymous)).client;
  return std::make_shared<const State>(State{options, std::move(users), std::move(anonymous)});
}

LoginGate::StatePtr LoginGate::state() const {
  const std::lock_guard lock(mutex_);
  return state_;
}

void LoginGate::setOptions(const LoginOptions& options) {
  const auto old = state();
  const auto before = old->users->users();
  const bool isOtherFile = options.usersFile != old->options.usersFile;
  auto users = isOtherFile ? std::make_shared<WatchedUsers>(options.usersFile, services_.log) : old->users;
  {
    const std::lock_guard lock(mutex_);
    state_ = makeState(options, users);
    localUsers_.eraseIf([](const Member&) { return true; });
  }
  if (isOtherFile) forgetChanged(*before, *users->users());
  refresh();
}

void LoginGate::refresh() {
  const auto users = state()->users;
  if (const auto before = users->refresh()) forgetChanged(*before, *users->users());
}

void LoginGate::forgetChanged(const Users& before, const Users& after) {
  remembered_.forgetIf([&](const std::string& name) {
    const User* old = before.find(name);
    const User* now = after.find(name);
    return old == nullptr || now == nullptr || *old != *now;
  });
}

bool LoginGate::hasUsers() const { return !state()->users->users()->isEmpty(); }

Decision LoginGate::decide(const Origin& origin, const std::string* authorization) {
  if (origin.way == Origin::Way::UnixSocket) return decideLocal(origin, authorization != nullptr);
  if (authorization != nullptr) return decideLogin(origin, *authorization);
  if (origin.certificate) return decideCertificate(*origin.certificate, true);
  return decideAnonymous(origin);
}

Decision LoginGate::decideAnonymous(const Origin& origin) const {
  if (origin.way == Origin::Way::Loopback) {
    if (const ClientPtr client = state()->anonymous) return {Kind::Admitted, client};
  }
  return {Kind::NeedsLogin, nullptr,
          origin.isEncrypted ? "a login is needed" : "a login is needed, and a login needs https"};
}

// ---- A Unix socket ----

Decision LoginGate::decideLocal(const Origin& origin, bool hasLogin) {
  if (hasLogin) return {Kind::Refused, nullptr, "this socket takes no login: the kernel says who its clients are"};
  if (!origin.localUser) return {Kind::Refused, nullptr, "the kernel does not say who this client is"};
  if (*origin.localUser == 0) return admit("root", Proof::Kernel, Grants(Role::Operate));
  const std::lock_guard lock(mutex_);
  const Member* known = localUsers_.find(*origin.localUser);
  if (known == nullptr || services_.now() - known->lookedUp >= kLocalUserKept) return {Kind::MustVerify};
  return admitLocal(known->client);
}

Decision LoginGate::admitLocal(const ClientPtr& client) const {
  if (client->grants.everywhere() != Role::None) return {Kind::Admitted, client};
  return {Kind::Refused, nullptr, client->user + " is not a member of the group " + state_->options.group};
}

void LoginGate::lookUpLocal(uid_t user) {
  const auto now = state();
  const LocalUser found = services_.lookUp(user, now->options.group);
  // Whoever runs the server can change its files anyway.
  const bool operates = found.isMember || user == ::geteuid();
  const Decision decision =
      admit(found.name, Proof::Kernel, Grants(operates ? Role::Operate : now->options.otherLocal));
  const std::lock_guard lock(mutex_);
  if (now == state_) localUsers_.put(user, {decision.client, services_.now()});
}

// ---- A client certificate ----

/// The file of users may have changed since it was read. So a certificate of nobody is looked at again where that may
/// take time.
Decision LoginGate::decideCertificate(const Certificate& certificate, bool mayWait) const {
  const auto users = state()->users->users();
  const User* user = users->ofCertificate(certificate);
  if (user != nullptr) return admit(user->name, Proof::Certificate, user->grants);
  if (mayWait) return {Kind::MustVerify};
  return {Kind::Refused, nullptr, "the client certificate belongs to no user of this server"};
}

// ---- A password ----

Decision LoginGate::decideLogin(const Origin& origin, const std::string& authorization) {
  if (!origin.isEncrypted) return {Kind::NeedsLogin, nullptr, "a login needs https"};
  const auto login = readBasicLogin(authorization);
  if (!login) return {Kind::NeedsLogin, nullptr, "the login is not HTTP Basic with a name and a password"};
  const auto now = services_.now();
  const RememberedLogins::Found found = remembered_.find(remembered_.keyOf(*login), now);
  if (found.client != nullptr) return {Kind::Admitted, found.client};
  const milliseconds remaining = found.isKnown ? milliseconds(0) : failed_.remaining(clientGroup(origin), now);
  return remaining.count() > 0 ? tooEarly(remaining) : Decision{Kind::MustVerify};
}

Decision LoginGate::tooEarly(milliseconds remaining) const {
  return {Kind::TooEarly, nullptr,
          "logins from this address failed; the next one is taken in " + secondsText(remaining), remaining};
}

Decision LoginGate::verify(const Origin& origin, const std::string& authorization) {
  refresh();
  if (origin.way == Origin::Way::UnixSocket) {
    if (origin.localUser) lookUpLocal(*origin.localUser);
  } else if (!authorization.empty()) {
    const auto login = readBasicLogin(authorization);
    if (login && origin.isEncrypted) return verifyLogin(origin, *login);
  } else if (origin.certificate) {
    return decideCertificate(*origin.certificate, false);
  }
  return decide(origin, authorization.empty() ? nullptr : &authorization);
}

/// Others may have verified or failed since the login was queued, so it is decided again first.
Decision LoginGate::verifyLogin(const Origin& origin, const BasicLogin& login) {
  const auto key = remembered_.keyOf(login);
  const RememberedLogins::Found found = remembered_.find(key, services_.now());
  if (found.client != nullptr) return {Kind::Admitted, found.client};
  const milliseconds remaining =
      found.isKnown ? milliseconds(0) : failed_.remaining(clientGroup(origin), services_.now());
  if (remaining.count() > 0) return tooEarly(remaining);
  const auto source = state()->users;
  const auto users = source->users();
  const User* user = users->find(login.user);
  const bool fits = services_.passwords->verify(login.user, user, login.password);
  // The text of an unknown name may be a password in the wrong field.
  if (user == nullptr) return fail(origin, "unknown user");
  if (!fits) return fail(origin, "wrong password of the user " + user->name);
  Decision decision = admit(user->name, Proof::Password, user->grants);
  remembered_.put(key, decision.client, services_.now());
  // A change of the file meanwhile has already dropped what it had to drop.
  if (source != state()->users || users != source->users()) {
    remembered_.forgetIf([&](const std::string& name) { return name == user->name; });
  }
  return decision;
}

Decision LoginGate::fail(const Origin& origin, const std::string& why) {
  const FailedLogins::Failure failure = failed_.add(clientGroup(origin), services_.now());
  services_.log("a login from " + addressOf(origin) + " failed: " + why + "; " + std::to_string(failure.count) +
                (failure.count == 1 ? " failure" : " failures") + ", the next login is taken in " +
                secondsText(failure.delay));
  return {Kind::NeedsLogin, nullptr, "the user name or the password is wrong", failure.delay};
}

}  // namespace zorva::access
