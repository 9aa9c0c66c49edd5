#include "bmc/Bootstrap.h"

#include <algorithm>
#include <array>
#include <cstdio>

#include "util/Text.h"
#include "util/Utf8.h"

namespace zorva::bmc {

namespace {

// DSP0270 1.3, tables "Get Manager Certificate Fingerprint" and "Get Bootstrap Account Credentials". The group
// extension is the first byte of a request, and the second of an answer, after the completion code.
constexpr std::uint8_t kGroupExtension = 0x2C;
constexpr char kRedfishGroup = 0x52;
constexpr std::uint8_t kGetFingerprint = 0x01;
constexpr std::uint8_t kGetAccount = 0x02;
constexpr char kFirstCertificate = 1;
constexpr char kKeepEnabled = '\xA5';  ///< any other value ends bootstrapping until the host's next reset
constexpr char kSha256 = 1;

// Completion codes: IPMI 2.0, table 5-2; the first is one of DSP0270's own.
constexpr unsigned char kBootstrappingDisabled = 0x80;
constexpr unsigned char kInvalidCommand = 0xC1;
constexpr unsigned char kNotPresent = 0xCB;
constexpr unsigned char kTimeout = 0xC3;
constexpr unsigned char kDisabledByFirmware = 0xD6;

/// Throws if the command did not succeed.
void checkCompletion(unsigned char code, const std::string& what) {
  if (code == 0) return;
  if (code == kBootstrappingDisabled) {
    throw NotOffered("credential bootstrapping is disabled in the service processor, so it gives no " + what);
  }
  if (code == kInvalidCommand || code == kNotPresent || code == kDisabledByFirmware) {
    throw NotOffered("the service processor gives no " + what + " over IPMI");
  }
  if (code == kTimeout) throw Failed("the service processor gave no " + what + " over IPMI in time");
  std::array<char, 8> digits{};
  std::snprintf(digits.data(), digits.size(), "%02X", code);
  throw Failed("the service processor gave no " + what + " over IPMI: completion code " + digits.data() + "h");
}

/// The fields of an answer, which must have exactly that size.
std::unique_ptr<const util::Secret> askGroup(Ipmi& ipmi, std::uint8_t command, char argument, std::size_t size,
                                             const std::string& what) {
  constexpr std::size_t kHead = 2;
  std::string bytes = ipmi.ask({kGroupExtension, command, {kRedfishGroup, argument}});
  const util::Secret answer(bytes);
  const std::string& text = answer.text();
  if (text.empty()) throw Failed("the IPMI answer to the question for " + what + " is empty");
  checkCompletion(static_cast<unsigned char>(text.front()), what);
  if (text.size() < kHead || text[1] != kRedfishGroup) {
    throw Failed("the IPMI answer to the question for " + what + " is of another group than Redfish");
  }
  if (text.size() != kHead + size) {
    throw Failed("the IPMI answer to the question for " + what + " has " + std::to_string(text.size()) +
                 " bytes in place of " + std::to_string(kHead + size));
  }
  std::string fields = text.substr(kHead);
  return std::make_unique<const util::Secret>(fields);
}

/// A field that is padded with zeros. A text that fills it has none.
std::string unpadded(std::string_view field, const char* name) {
  const std::string_view text = field.substr(0, field.find('\0'));
  const auto isControl = [](char c) { return static_cast<unsigned char>(c) < 0x20 || c == '\x7F'; };
  const std::string where = std::string("the ") + name + " of the account that the service processor gives over IPMI ";
  if (text.empty()) throw Failed(where + "is empty");
  if (field.find_first_not_of('\0', text.size()) != std::string_view::npos)
    throw Failed(where + "goes on after its end");
  if (!util::isUtf8(text) || std::any_of(text.begin(), text.end(), isControl)) {
    throw Failed(where + "is no text in UTF-8");
  }
  return std::string(text);
}

}  // namespace

Login askForAccount(Ipmi& ipmi) {
  constexpr std::size_t kField = 16;
  const auto fields = askGroup(ipmi, kGetAccount, kKeepEnabled, 2 * kField, "account");
  const std::string_view both = fields->text();
  std::string user = unpadded(both.substr(0, kField), "user name");
  std::string password = unpadded(both.substr(kField), "password");
  return {std::move(user), std::make_shared<const util::Secret>(password)};
}

std::string askForFingerprint(Ipmi& ipmi) {
  constexpr std::size_t kSize = 32;
  const auto fields = askGroup(ipmi, kGetFingerprint, kFirstCertificate, 1 + kSize, "certificate fingerprint");
  if (fields->text().front() != kSha256) throw NotOffered("the certificate's fingerprint over IPMI is no SHA-256");
  return util::hexOf(std::string_view(fields->text()).substr(1));
}

void BootstrapAccount::prepare() {
  try {
    renew();
  } catch (const NotOffered&) {
    throw;
  } catch (const Failed& error) {
    problem_ = error.what();
  }
}

Login BootstrapAccount::login(const util::Secret* refused) {
  if (refused != nullptr && account_.password != nullptr && refused->text() == account_.password->text()) {
    problem_ = "the service refused the account that the service processor made for this host";
    account_ = {};
  }
  if (account_.password == nullptr) renew();
  return account_;
}

void BootstrapAccount::renew() {
  constexpr std::chrono::minutes kPause{10};
  const Clock::time_point now = now_();
  if (now < nextAttempt_) throw Failed(problem_ + "; it is asked again after ten minutes");
  nextAttempt_ = now + kPause;
  try {
    account_ = askForAccount(*ipmi_);
  } catch (const Failed& error) {
    problem_ = error.what();
    throw;
  }
}

}  // namespace zorva::bmc
