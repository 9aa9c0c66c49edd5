#include "http/testing/TestCertificates.h"

#include <sys/stat.h>

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <stdexcept>

namespace zorva::http::testing {

namespace {

void check(int rc) {
  if (rc < 0) throw std::runtime_error(gnutls_strerror(rc));
}

std::string taken(gnutls_datum_t& datum) {
  std::string text(reinterpret_cast<const char*>(datum.data), datum.size);
  gnutls_free(datum.data);
  return text;
}

std::string pemOf(gnutls_x509_crt_t certificate) {
  gnutls_datum_t text{};
  check(gnutls_x509_crt_export2(certificate, GNUTLS_X509_FMT_PEM, &text));
  return taken(text);
}

}  // namespace

TestAuthority::Key TestAuthority::newKey() {
  gnutls_x509_privkey_t key = nullptr;
  check(gnutls_x509_privkey_init(&key));
  Key owner(key);
  check(gnutls_x509_privkey_generate(key, GNUTLS_PK_ECDSA, GNUTLS_CURVE_TO_BITS(GNUTLS_ECC_CURVE_SECP256R1), 0));
  return owner;
}

TestAuthority::Certificate TestAuthority::newCertificate(const Wanted& wanted, const Key& key, int serial) {
  gnutls_x509_crt_t certificate = nullptr;
  check(gnutls_x509_crt_init(&certificate));
  Certificate owner(certificate);
  const auto number = static_cast<unsigned char>(serial);
  const std::time_t now = std::time(nullptr);
  check(gnutls_x509_crt_set_version(certificate, 3));
  check(gnutls_x509_crt_set_serial(certificate, &number, 1));
  check(gnutls_x509_crt_set_activation_time(certificate, now + wanted.from));
  check(gnutls_x509_crt_set_expiration_time(certificate, now + wanted.until));
  check(gnutls_x509_crt_set_dn(certificate, ("CN=" + wanted.subject).c_str(), nullptr));
  check(gnutls_x509_crt_set_key(certificate, key.get()));
  return owner;
}

TestAuthority::TestAuthority(const agent::testing::TemporaryDirectory& directory, const std::string& name)
    : directory_(directory), key_(newKey()), certificate_(newCertificate({name, {}}, key_, 1)) {
  check(gnutls_x509_crt_set_basic_constraints(certificate_.get(), 1, -1));
  check(gnutls_x509_crt_set_key_usage(certificate_.get(), GNUTLS_KEY_KEY_CERT_SIGN));
  check(gnutls_x509_crt_sign2(certificate_.get(), certificate_.get(), key_.get(), GNUTLS_DIG_SHA256, 0));
  file_ = directory_.write(name + ".crt", pemOf(certificate_.get()));
}

IssuedFiles TestAuthority::issue(const std::string& name, const Wanted& wanted) const {
  constexpr mode_t kForGroup = 0640;
  const Key key = newKey();
  const Certificate certificate = newCertificate(wanted, key, 2);
  for (const std::string& each : wanted.names) {
    check(gnutls_x509_crt_set_subject_alt_name(certificate.get(), GNUTLS_SAN_DNSNAME, each.data(),
                                               static_cast<unsigned int>(each.size()), GNUTLS_FSAN_APPEND));
  }
  const char* purpose = wanted.forClient ? GNUTLS_KP_TLS_WWW_CLIENT : GNUTLS_KP_TLS_WWW_SERVER;
  check(gnutls_x509_crt_set_key_purpose_oid(certificate.get(), purpose, 0));
  check(gnutls_x509_crt_sign2(certificate.get(), certificate_.get(), key_.get(), GNUTLS_DIG_SHA256, 0));
  gnutls_datum_t keyText{};
  check(gnutls_x509_privkey_export2(key.get(), GNUTLS_X509_FMT_PEM, &keyText));
  const IssuedFiles files{directory_.write(name + ".crt", pemOf(certificate.get())),
                          directory_.write(name + ".key", taken(keyText))};
  ::chmod(files.key.c_str(), kForGroup);
  return files;
}

std::string outputOf(const std::string& command) {
  std::string text;
  std::FILE* pipe = ::popen((command + " 2>&1").c_str(), "r");
  if (pipe == nullptr) throw std::runtime_error("no shell");
  char buffer[4096];
  for (std::size_t got = 0; (got = std::fread(buffer, 1, sizeof buffer, pipe)) > 0;) text.append(buffer, got);
  ::pclose(pipe);
  return text;
}

std::string fingerprintByOpenssl(const std::string& file) {
  const std::string text = outputOf("openssl x509 -noout -fingerprint -sha256 -in " + file);
  std::string digits;
  for (const char c : text.substr(std::min(text.find('=') + 1, text.size()))) {
    if (std::isxdigit(static_cast<unsigned char>(c)) != 0) {
      digits += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    }
  }
  return digits;
}

}  // namespace zorva::http::testing
