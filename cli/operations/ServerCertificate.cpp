#include "cli/operations/ServerCertificate.h"

#include <dlfcn.h>

#include <algorithm>
#include <array>
#include <string_view>

#include "cli/output/Text.h"
#include "util/Names.h"
#include "util/Text.h"

namespace zorva::cli {

namespace {

using Digest = std::array<unsigned char, 32>;

/// By the TLS library that libcurl itself uses; a symbol is also searched in the libraries that a library needs.
std::optional<Digest> sha256(const Curl& curl, const std::string& bytes) {
  using OfOpenSsl = unsigned char* (*)(const unsigned char* data, std::size_t size, unsigned char* digest);
  using OfGnuTls = int (*)(int algorithm, const void* data, std::size_t size, void* digest);
  constexpr int kGnuTlsSha256 = 6;  // GNUTLS_DIG_SHA256
  Digest digest{};
  if (const auto hash = reinterpret_cast<OfGnuTls>(::dlsym(curl.library, "gnutls_hash_fast"))) {
    if (hash(kGnuTlsSha256, bytes.data(), bytes.size(), digest.data()) == 0) return digest;
  }
  if (const auto hash = reinterpret_cast<OfOpenSsl>(::dlsym(curl.library, "SHA256"))) {
    if (hash(reinterpret_cast<const unsigned char*>(bytes.data()), bytes.size(), digest.data()) != nullptr)
      return digest;
  }
  return std::nullopt;
}

/// The bytes between the lines of a PEM text (RFC 7468); nothing if it is none.
std::optional<std::string> bytesOfPem(std::string_view pem) {
  constexpr std::string_view kBegin = "-----BEGIN CERTIFICATE-----";
  constexpr std::string_view kDigits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
  const std::size_t begin = pem.find(kBegin);
  const std::size_t end = begin == std::string_view::npos ? begin : pem.find("-----END", begin + kBegin.size());
  if (end == std::string_view::npos) return std::nullopt;
  std::string bytes;
  unsigned bits = 0;
  unsigned count = 0;
  for (const char c : pem.substr(begin + kBegin.size(), end - begin - kBegin.size())) {
    const std::size_t digit = kDigits.find(c);
    if (c == '=') break;
    if (util::kWhiteSpace.find(c) != std::string_view::npos) continue;
    if (digit == std::string_view::npos) return std::nullopt;
    bits = ((bits << 6U) | static_cast<unsigned>(digit)) & 0xFFFFU;
    count += 6;
    if (count < 8) continue;
    count -= 8;
    bytes += static_cast<char>((bits >> count) & 0xFFU);
  }
  return bytes;
}

/// "Start date:2026-01-01 ..." has the name "Start date", or with GnuTLS "Start Date".
std::string fieldOf(const curl_slist* fields, std::string_view name) {
  for (; fields != nullptr; fields = fields->next) {
    const std::string_view field = fields->data;
    if (util::sameName(field.substr(0, name.size()), name) &&
        field.substr(std::min(name.size(), field.size())).starts_with(':')) {
      return std::string(util::trimmed(field.substr(name.size() + 1), util::kWhiteSpace));
    }
  }
  return {};
}

}  // namespace

std::optional<ServerCertificate> certificateOf(const Curl& curl) {
  curl_certinfo* chain = nullptr;
  const CURLcode code = curl.getinfo(curl.easy, CURLINFO_CERTINFO, &chain);
  if (code != CURLE_OK || chain == nullptr || chain->num_of_certs < 1) return std::nullopt;
  // The server's own is the first.
  const curl_slist* own = chain->certinfo[0];
  const std::optional<std::string> bytes = bytesOfPem(fieldOf(own, "Cert"));
  const std::optional<Digest> digest = bytes ? sha256(curl, *bytes) : std::nullopt;
  if (!digest) {
    throw Failure(ExitCode::Failed, "the fingerprint of the server's certificate cannot be made with this libcurl",
                  "--ca FILE needs none");
  }
  return ServerCertificate{util::hexOf({reinterpret_cast<const char*>(digest->data()), digest->size()}),
                           fieldOf(own, "Subject"), fieldOf(own, "Start date"), fieldOf(own, "Expire date")};
}

std::string describe(const ServerCertificate& certificate) {
  return "\n  subject: " + printable(certificate.subject) + "\n  valid:   from " + printable(certificate.from) +
         " until " + printable(certificate.until) + "\n  SHA-256: " + certificate.fingerprint;
}

}  // namespace zorva::cli
