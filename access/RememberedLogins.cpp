#include "access/RememberedLogins.h"

#include <gnutls/crypto.h>
#include <gnutls/gnutls.h>

#include <stdexcept>
#include <utility>

namespace zorva::access {

RememberedLogins::RememberedLogins() {
  if (::gnutls_rnd(GNUTLS_RND_KEY, secret_.data(), secret_.size()) != GNUTLS_E_SUCCESS) {
    throw std::runtime_error("the system gives no random bytes for the logins");
  }
}

RememberedLogins::Key RememberedLogins::keyOf(const BasicLogin& login) const {
  constexpr std::size_t kLength = 32;
  // Neither part contains NUL, so no other login has the same text.
  std::string text = login.user + '\0' + login.password;
  Key key(kLength, '\0');
  const int error =
      ::gnutls_hmac_fast(GNUTLS_MAC_SHA256, secret_.data(), secret_.size(), text.data(), text.size(), key.data());
  ::gnutls_memset(text.data(), 0, text.size());
  if (error != GNUTLS_E_SUCCESS) throw std::runtime_error("HMAC with SHA-256 does not work");
  return key;
}

RememberedLogins::Found RememberedLogins::find(const Key& key, Clock::time_point now) {
  const std::lock_guard lock(mutex_);
  const Entry* entry = entries_.find(key);
  if (entry == nullptr || now - entry->verified >= kKnown) return {};
  return {now - entry->verified < kFresh ? entry->client : nullptr, true};
}

void RememberedLogins::put(const Key& key, ClientPtr client, Clock::time_point now) {
  const std::lock_guard lock(mutex_);
  entries_.put(key, {std::move(client), now});
}

void RememberedLogins::forgetIf(const std::function<bool(const std::string& user)>& isMeant) {
  const std::lock_guard lock(mutex_);
  entries_.eraseIf([&](const Entry& entry) { return isMeant(entry.client->user); });
}

}  // namespace zorva::access
