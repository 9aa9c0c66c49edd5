#include "http/testing/TestCertificates.h"

#include <arpa/inet.h>
#include <sys/stat.h>

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <stdexcept>

namespace zorva::http::testing {

namespace {

X509Certificate certificateFor(const Wanted& wanted, const X509Key& key, unsigned char serial) {
  X509Certificate owner = newCertificate();
  gnutls_x509_crt_int* certificate = owner.get();
  const std::time_t now = std::time(nullptr);
  checkGnutls(gnutls_x509_crt_set_version(certificate, 3));
  checkGnutls(gnutls_x509_crt_set_serial(certificate, &serial, 1));
  checkGnutls(gnutls_x509_crt_set_activation_time(certificate, now + wanted.from));
  checkGnutls(gnutls_x509_crt_set_expiration_time(certificate, now + wanted.until));
  checkGnutls(gnutls_x509_crt_set_dn(certificate, ("CN=" + wanted.subject).c_str(), nullptr));
  checkGnutls(gnutls_x509_crt_set_key(certificate, key.get()));
  return owner;
}

}  // namespace

TestAuthority::TestAuthority(const agent::testing::TemporaryDirectory& directory, const std::string& name)
    : directory_(directory), key_(newKey()), certificate_(certificateFor({name, {}}, key_, 1)) {
  checkGnutls(gnutls_x509_crt_set_basic_constraints(certificate_.get(), 1, -1));
  checkGnutls(gnutls_x509_crt_set_key_usage(certificate_.get(), GNUTLS_KEY_KEY_CERT_SIGN));
  checkGnutls(gnutls_x509_crt_sign2(certificate_.get(), certificate_.get(), key_.get(), GNUTLS_DIG_SHA256, 0));
  file_ = directory_.write(name + ".crt", pemOf(certificate_));
}

IssuedFiles TestAuthority::issue(const std::string& name, const Wanted& wanted) const {
  constexpr mode_t kForGroup = 0640;
  const X509Key key = newKey();
  const X509Certificate certificate = certificateFor(wanted, key, 2);
  for (const std::string& each : wanted.names) {
    in_addr address{};
    const bool isAddress = ::inet_pton(AF_INET, each.c_str(), &address) == 1;
    const void* bytes = isAddress ? static_cast<const void*>(&address) : each.data();
    const std::size_t size = isAddress ? sizeof address : each.size();
    checkGnutls(gnutls_x509_crt_set_subject_alt_name(certificate.get(),
                                                     isAddress ? GNUTLS_SAN_IPADDRESS : GNUTLS_SAN_DNSNAME, bytes,
                                                     static_cast<unsigned int>(size), GNUTLS_FSAN_APPEND));
  }
  const char* purpose = wanted.forClient ? GNUTLS_KP_TLS_WWW_CLIENT : GNUTLS_KP_TLS_WWW_SERVER;
  checkGnutls(gnutls_x509_crt_set_key_purpose_oid(certificate.get(), purpose, 0));
  checkGnutls(gnutls_x509_crt_sign2(certificate.get(), certificate_.get(), key_.get(), GNUTLS_DIG_SHA256, 0));
  const IssuedFiles files{directory_.write(name + ".crt", pemOf(certificate)),
                          directory_.write(name + ".key", pemOf(key))};
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
