#include "cli/testing/TestAuthority.h"

#include <arpa/inet.h>
#include <gnutls/gnutls.h>
#include <gnutls/x509.h>

#include <array>
#include <ctime>
#include <memory>
#include <stdexcept>

namespace zorva::cli {

namespace {

void require(int code) {
  if (code < 0) throw std::runtime_error(gnutls_strerror(code));
}

using Key = std::unique_ptr<gnutls_x509_privkey_int, decltype(&gnutls_x509_privkey_deinit)>;
using Certificate = std::unique_ptr<gnutls_x509_crt_int, decltype(&gnutls_x509_crt_deinit)>;

Key newKey() {
  gnutls_x509_privkey_t key = nullptr;
  require(gnutls_x509_privkey_init(&key));
  return {key, gnutls_x509_privkey_deinit};
}

Certificate newCertificate() {
  gnutls_x509_crt_t certificate = nullptr;
  require(gnutls_x509_crt_init(&certificate));
  return {certificate, gnutls_x509_crt_deinit};
}

gnutls_datum_t datumOf(const std::string& text) {
  return {reinterpret_cast<unsigned char*>(const_cast<char*>(text.data())), static_cast<unsigned>(text.size())};
}

std::string textOf(gnutls_datum_t datum) {
  std::string text(reinterpret_cast<char*>(datum.data), datum.size);
  gnutls_free(datum.data);
  return text;
}

std::string fingerprintOf(gnutls_x509_crt_t certificate) {
  std::array<unsigned char, 32> digest{};
  std::size_t size = digest.size();
  require(gnutls_x509_crt_get_fingerprint(certificate, GNUTLS_DIG_SHA256, digest.data(), &size));
  std::string text;
  for (const unsigned char byte : digest) {
    text += "0123456789abcdef"[byte >> 4U];
    text += "0123456789abcdef"[byte & 15U];
  }
  return text;
}

void addName(gnutls_x509_crt_t certificate, const std::string& name) {
  std::array<unsigned char, 16> address{};
  const unsigned size = ::inet_pton(AF_INET, name.c_str(), address.data()) == 1    ? 4
                        : ::inet_pton(AF_INET6, name.c_str(), address.data()) == 1 ? 16
                                                                                   : 0;
  require(size > 0 ? gnutls_x509_crt_set_subject_alt_name(certificate, GNUTLS_SAN_IPADDRESS, address.data(), size,
                                                          GNUTLS_FSAN_APPEND)
                   : gnutls_x509_crt_set_subject_alt_name(certificate, GNUTLS_SAN_DNSNAME, name.data(),
                                                          static_cast<unsigned>(name.size()), GNUTLS_FSAN_APPEND));
}

TestCertificate make(const std::string& name, const std::vector<std::string>& names, bool isAuthority,
                     const TestCertificate* issuer, Validity validity) {
  constexpr std::time_t kDay = 24L * 60 * 60;
  const Key key = newKey();
  require(
      gnutls_x509_privkey_generate(key.get(), GNUTLS_PK_ECDSA, GNUTLS_CURVE_TO_BITS(GNUTLS_ECC_CURVE_SECP256R1), 0));
  const Certificate certificate = newCertificate();
  const std::time_t now = std::time(nullptr) - (validity == Validity::Past ? 100 * kDay : 0);
  static unsigned char serial = 1;
  require(gnutls_x509_crt_set_version(certificate.get(), 3));
  require(gnutls_x509_crt_set_serial(certificate.get(), &++serial, 1));
  require(gnutls_x509_crt_set_activation_time(certificate.get(), now - kDay));
  require(gnutls_x509_crt_set_expiration_time(certificate.get(), now + kDay));
  require(gnutls_x509_crt_set_dn_by_oid(certificate.get(), GNUTLS_OID_X520_COMMON_NAME, 0, name.data(),
                                        static_cast<unsigned>(name.size())));
  require(gnutls_x509_crt_set_key(certificate.get(), key.get()));
  require(gnutls_x509_crt_set_basic_constraints(certificate.get(), isAuthority ? 1 : 0, -1));
  require(gnutls_x509_crt_set_key_usage(certificate.get(),
                                        isAuthority ? GNUTLS_KEY_KEY_CERT_SIGN : GNUTLS_KEY_DIGITAL_SIGNATURE));
  for (const std::string& each : names) addName(certificate.get(), each);
  const Key signingKey = newKey();
  const Certificate signer = newCertificate();
  if (issuer != nullptr) {
    const gnutls_datum_t pem = datumOf(issuer->certificate);
    const gnutls_datum_t keyPem = datumOf(issuer->key);
    require(gnutls_x509_crt_import(signer.get(), &pem, GNUTLS_X509_FMT_PEM));
    require(gnutls_x509_privkey_import(signingKey.get(), &keyPem, GNUTLS_X509_FMT_PEM));
  }
  require(gnutls_x509_crt_sign2(certificate.get(), issuer == nullptr ? certificate.get() : signer.get(),
                                issuer == nullptr ? key.get() : signingKey.get(), GNUTLS_DIG_SHA256, 0));
  gnutls_datum_t pem{};
  gnutls_datum_t keyPem{};
  require(gnutls_x509_crt_export2(certificate.get(), GNUTLS_X509_FMT_PEM, &pem));
  require(gnutls_x509_privkey_export2(key.get(), GNUTLS_X509_FMT_PEM, &keyPem));
  return {textOf(pem), textOf(keyPem), fingerprintOf(certificate.get())};
}

}  // namespace

TestCertificate makeCertificate(const std::vector<std::string>& names, const TestCertificate* issuer,
                                Validity validity) {
  return make(names.front(), names, false, issuer, validity);
}

TestCertificate makeAuthority(const std::string& name) { return make(name, {}, true, nullptr, Validity::Now); }

}  // namespace zorva::cli
