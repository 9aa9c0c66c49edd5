#include "http/TlsIdentity.h"

#include <gnutls/abstract.h>

#include <cstdio>
#include <stdexcept>
#include <string_view>
#include <utility>

#include "util/ReadFile.h"
#include "util/Text.h"

namespace zorva::http {

namespace {

constexpr std::size_t kLargestFile = std::size_t{4} << 20;
constexpr unsigned int kReadableByOthers = 04;

[[noreturn]] void fail(const std::string& file, const std::string& problem) {
  throw std::runtime_error(file + ": " + problem);
}

util::FileText readPem(const std::string& file) {
  util::FileText text = util::readFile(file, kLargestFile);
  if (text.error != 0) fail(file, "cannot be read: " + util::fileErrorText(text.error));
  if (text.truncated) fail(file, "is larger than 4 MiB");
  return text;
}

gnutls_datum_t datumOf(const std::string& text) {
  return {reinterpret_cast<unsigned char*>(const_cast<char*>(text.data())), static_cast<unsigned int>(text.size())};
}

/// "The certificate chain uses expired certificate"
std::string problemsOf(unsigned int status) {
  gnutls_datum_t text{};
  if (gnutls_certificate_verification_status_print(status, GNUTLS_CRT_X509, &text, 0) != 0) return "it is not trusted";
  std::string sentence = takeText(text);
  while (!sentence.empty() && (sentence.back() == ' ' || sentence.back() == '\n' || sentence.back() == '.')) {
    sentence.pop_back();
  }
  constexpr std::string_view kFirst = "The certificate is NOT trusted. ";
  return sentence.starts_with(kFirst) ? sentence.substr(kFirst.size()) : sentence;
}

std::string subjectOf(const X509Certificate& certificate) {
  gnutls_datum_t text{};
  return gnutls_x509_crt_get_dn3(certificate.get(), &text, 0) == 0 ? takeText(text) : std::string();
}

/// What is wrong with the chain of a client's certificate; empty if it is good.
std::string whyNotTrusted(gnutls_session_t session) {
  gnutls_typed_vdata_st purpose{};
  purpose.type = GNUTLS_DT_KEY_PURPOSE_OID;
  purpose.data = reinterpret_cast<unsigned char*>(const_cast<char*>(GNUTLS_KP_TLS_WWW_CLIENT));
  unsigned int status = 0;
  const int rc = gnutls_certificate_verify_peers(session, &purpose, 1, &status);
  if (rc != 0) return gnutls_strerror(rc);
  return status == 0 ? std::string() : problemsOf(status);
}

}  // namespace

std::string fingerprintOf(const X509Certificate& certificate) {
  constexpr std::size_t kBytes = 32;
  unsigned char hash[kBytes];
  std::size_t size = sizeof hash;
  if (gnutls_x509_crt_get_fingerprint(certificate.get(), GNUTLS_DIG_SHA256, hash, &size) != 0) return {};
  return util::hexOf({reinterpret_cast<const char*>(hash), size});
}

std::shared_ptr<const TlsIdentity> TlsIdentity::load(const TlsFiles& files) {
  std::shared_ptr<TlsIdentity> identity(new TlsIdentity());
  gnutls_certificate_credentials_t credentials = nullptr;
  checkGnutls(gnutls_certificate_allocate_credentials(&credentials));
  identity->credentials_.reset(credentials);
  identity->readCertificate(files.certificate);
  identity->readKey(files);
  if (!files.clientCa.empty()) identity->readAuthorities(files.clientCa);
  return identity;
}

void TlsIdentity::readCertificate(const std::string& file) {
  chain_ = readPem(file).text;
  own_ = newCertificate();
  const gnutls_datum_t pem = datumOf(chain_);
  const int rc = gnutls_x509_crt_import(own_.get(), &pem, GNUTLS_X509_FMT_PEM);
  if (rc != 0) fail(file, std::string("has no certificate in PEM: ") + gnutls_strerror(rc));
  fingerprint_ = fingerprintOf(own_);
  validFrom_ = gnutls_x509_crt_get_activation_time(own_.get());
  validUntil_ = gnutls_x509_crt_get_expiration_time(own_.get());
}

void TlsIdentity::readKey(const TlsFiles& files) {
  const util::FileText text = readPem(files.key);
  if ((text.mode & kReadableByOthers) != 0) {
    char mode[8];
    std::snprintf(mode, sizeof mode, "%04o", text.mode & 07777U);
    fail(files.key, std::string("all users may read this private key (mode ") + mode +
                        "): chmod 0640 lets its owner and group only");
  }
  const gnutls_datum_t certificate = datumOf(chain_);
  const gnutls_datum_t key = datumOf(text.text);
  const int rc =
      gnutls_certificate_set_x509_key_mem2(credentials_.get(), &certificate, &key, GNUTLS_X509_FMT_PEM, nullptr, 0);
  if (rc == GNUTLS_E_CERTIFICATE_KEY_MISMATCH)
    fail(files.key, "is not the key of the certificate " + files.certificate);
  if (rc < 0) fail(files.key, std::string("has no private key in PEM that fits: ") + gnutls_strerror(rc));
}

void TlsIdentity::readAuthorities(const std::string& file) {
  const std::string text = readPem(file).text;
  const gnutls_datum_t pem = datumOf(text);
  const int count = gnutls_certificate_set_x509_trust_mem(credentials_.get(), &pem, GNUTLS_X509_FMT_PEM);
  if (count < 0) fail(file, std::string("has no certificates in PEM: ") + gnutls_strerror(count));
  if (count == 0) fail(file, "has no certificate in PEM");
  asksForCertificate_ = true;
}

bool TlsIdentity::attach(gnutls_session_t session) const {
  gnutls_certificate_server_set_request(session, asksForCertificate_ ? GNUTLS_CERT_REQUEST : GNUTLS_CERT_IGNORE);
  return gnutls_credentials_set(session, GNUTLS_CRD_CERTIFICATE, credentials_.get()) == 0;
}

PeerCertificate TlsIdentity::checkPeer(gnutls_session_t session) const {
  unsigned int count = 0;
  const gnutls_datum_t* chain = asksForCertificate_ ? gnutls_certificate_get_peers(session, &count) : nullptr;
  if (chain == nullptr || count == 0) return {};
  const std::string why = whyNotTrusted(session);
  if (!why.empty()) return {std::nullopt, "the client certificate is refused: " + why};
  const X509Certificate certificate = newCertificate();
  if (gnutls_x509_crt_import(certificate.get(), &chain[0], GNUTLS_X509_FMT_DER) != 0) {
    return {std::nullopt, "the client certificate is refused: it cannot be read"};
  }
  return {access::Certificate{subjectOf(certificate), fingerprintOf(certificate)}, {}};
}

bool TlsIdentity::covers(const std::string& host) const {
  return gnutls_x509_crt_check_hostname(own_.get(), host.c_str()) != 0;
}

}  // namespace zorva::http
