#pragma once

// Owners of what GnuTLS allocates.

#include <gnutls/gnutls.h>
#include <gnutls/x509.h>

#include <memory>
#include <stdexcept>
#include <string>

namespace zorva::http {

struct GnutlsFree {
  void operator()(gnutls_certificate_credentials_st* credentials) const {
    gnutls_certificate_free_credentials(credentials);
  }
  void operator()(gnutls_x509_crt_int* certificate) const { gnutls_x509_crt_deinit(certificate); }
  void operator()(gnutls_x509_privkey_int* key) const { gnutls_x509_privkey_deinit(key); }
};
using TlsCredentials = std::unique_ptr<gnutls_certificate_credentials_st, GnutlsFree>;
using X509Certificate = std::unique_ptr<gnutls_x509_crt_int, GnutlsFree>;
using X509Key = std::unique_ptr<gnutls_x509_privkey_int, GnutlsFree>;

/// Throws std::runtime_error if a function of GnuTLS has failed.
inline void checkGnutls(int rc) {
  if (rc < 0) throw std::runtime_error(gnutls_strerror(rc));
}

/// Text that GnuTLS has allocated; frees it there.
inline std::string takeText(gnutls_datum_t& datum) {
  std::string text(reinterpret_cast<const char*>(datum.data), datum.size);
  gnutls_free(datum.data);
  return text;
}

inline X509Certificate newCertificate() {
  gnutls_x509_crt_t certificate = nullptr;
  checkGnutls(gnutls_x509_crt_init(&certificate));
  return X509Certificate(certificate);
}

/// A new key: ECDSA P-256.
inline X509Key newKey() {
  gnutls_x509_privkey_t key = nullptr;
  checkGnutls(gnutls_x509_privkey_init(&key));
  X509Key owner(key);
  checkGnutls(gnutls_x509_privkey_generate(key, GNUTLS_PK_ECDSA, GNUTLS_CURVE_TO_BITS(GNUTLS_ECC_CURVE_SECP256R1), 0));
  return owner;
}

inline std::string pemOf(const X509Certificate& certificate) {
  gnutls_datum_t text{};
  checkGnutls(gnutls_x509_crt_export2(certificate.get(), GNUTLS_X509_FMT_PEM, &text));
  return takeText(text);
}

inline std::string pemOf(const X509Key& key) {
  gnutls_datum_t text{};
  checkGnutls(gnutls_x509_privkey_export2_pkcs8(key.get(), GNUTLS_X509_FMT_PEM, nullptr, GNUTLS_PKCS_PLAIN, &text));
  return takeText(text);
}

}  // namespace zorva::http
