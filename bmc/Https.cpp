#include "bmc/Https.h"

#include <curl/curl.h>

#include <algorithm>
#include <mutex>

#include "http/TlsIdentity.h"
#include "util/Escape.h"
#include "util/Names.h"
#include "util/Text.h"

namespace zorva::bmc {

namespace {

constexpr long kConnectSeconds = 10;
constexpr long kSilentSeconds = 15;
constexpr std::chrono::seconds kLongestRequest{30};

using List = std::unique_ptr<curl_slist, decltype(&::curl_slist_free_all)>;

void append(List& list, const std::string& line) {
  curl_slist* const longer = ::curl_slist_append(list.get(), line.c_str());
  if (longer == nullptr) throw std::bad_alloc();
  (void)list.release();  // the longer list owns it now
  list.reset(longer);
}

std::string inOneLine(std::string_view text) {
  std::string line;
  util::appendEscaped(line, text);
  return line;
}

/// The fingerprint of the server's certificate in the handshake of this transfer; empty if it made none.
std::string fingerprintIn(CURL* easy) {
  curl_certinfo* chain = nullptr;
  if (::curl_easy_getinfo(easy, CURLINFO_CERTINFO, &chain) != CURLE_OK || chain == nullptr || chain->num_of_certs < 1) {
    return {};
  }
  // The server's own is the first.
  constexpr std::string_view kName = "Cert:";
  for (const curl_slist* field = chain->certinfo[0]; field != nullptr; field = field->next) {
    const std::string_view text = field->data;
    if (!text.starts_with(kName)) continue;
    const std::string pem(text.substr(kName.size()));
    const http::X509Certificate certificate = http::newCertificate();
    const gnutls_datum_t datum{reinterpret_cast<unsigned char*>(const_cast<char*>(pem.data())),
                               static_cast<unsigned int>(pem.size())};
    http::checkGnutls(gnutls_x509_crt_import(certificate.get(), &datum, GNUTLS_X509_FMT_PEM));
    return http::fingerprintOf(certificate);
  }
  return {};
}

}  // namespace

struct Https::Transfer : util::NotCopied {
  explicit Transfer(Https& of) : https(of) {}

  Https& https;
  Reply reply;
  List fields{nullptr, ::curl_slist_free_all};
  std::size_t headSize = 0;
  bool isTooLarge = false;
  std::string wrongFingerprint;
  std::string whyNotKnown;  ///< the right fingerprint
  char problem[CURL_ERROR_SIZE] = {};

  bool isCancelled() const { return https.isCancelled_ != nullptr && *https.isCancelled_; }

  static std::size_t takeBody(char* data, std::size_t size, std::size_t count, void* self) {
    auto& transfer = *static_cast<Transfer*>(self);
    transfer.isTooLarge = transfer.reply.body.size() + size * count > kLargestBody;
    if (transfer.isTooLarge) return 0;
    transfer.reply.body.append(data, size * count);
    return size * count;
  }

  static std::size_t takeField(char* data, std::size_t size, std::size_t count, void* self) {
    auto& transfer = *static_cast<Transfer*>(self);
    const std::string_view line(data, size * count);
    transfer.headSize += line.size();
    transfer.isTooLarge = transfer.headSize > kLargestHead;
    if (transfer.isTooLarge) return 0;
    // Another status line begins a new set of fields: "100 Continue" came before.
    if (line.starts_with("HTTP/")) transfer.reply.fields.clear();
    const std::size_t colon = line.find(':');
    if (colon == std::string_view::npos) return line.size();
    transfer.reply.fields.emplace_back(util::trimmed(line.substr(0, colon), util::kWhiteSpace),
                                       util::trimmed(line.substr(colon + 1), util::kWhiteSpace));
    return line.size();
  }

  static int onProgress(void* self, curl_off_t, curl_off_t, curl_off_t, curl_off_t) {
    return static_cast<Transfer*>(self)->isCancelled() ? 1 : 0;
  }

  /// Called by libcurl when the connection is there, and before anything is sent on it. A connection that is used again
  /// was checked when it was new, and has no certificate now.
  static int checkFingerprint(void* self, char* address, char* localAddress, int port, int localPort) noexcept {
    auto& transfer = *static_cast<Transfer*>(self);
    Https& https = transfer.https;
    try {
      const std::string ends =
          std::string(address) + " " + std::to_string(port) + " " + localAddress + " " + std::to_string(localPort);
      const std::string found = fingerprintIn(https.easy_);
      if (found.empty()) return ends == https.checked_ ? CURL_PREREQFUNC_OK : CURL_PREREQFUNC_ABORT;
      if (!https.isTrusted(transfer, found)) return CURL_PREREQFUNC_ABORT;
      https.checked_ = ends;
      return CURL_PREREQFUNC_OK;
    } catch (...) {
      // The request is not sent.
    }
    return CURL_PREREQFUNC_ABORT;
  }
};

Https::Https(std::string url, Trust trust) : url_(std::move(url)), trust_(std::move(trust)) {
  static std::once_flag isReady;
  std::call_once(isReady, [] { (void)::curl_global_init(CURL_GLOBAL_DEFAULT); });
  easy_ = ::curl_easy_init();
  if (easy_ == nullptr) throw Failed("libcurl cannot be started");
}

Https::~Https() { ::curl_easy_cleanup(easy_); }

bool Https::isTrusted(Transfer& transfer, const std::string& fingerprint) {
  try {
    const bool isAskedFor = fingerprint != trust_.fingerprint && trust_.currentFingerprint;
    if (isAskedFor) trust_.fingerprint = trust_.currentFingerprint();
  } catch (const Failed& error) {
    transfer.whyNotKnown = error.what();
  }
  if (fingerprint == trust_.fingerprint) return true;
  transfer.wrongFingerprint = fingerprint;
  return false;
}

void Https::placeTrust(Transfer& transfer) {
  if (trust_.fingerprint.empty() && !trust_.currentFingerprint) {
    if (trust_.caFile.empty()) return;
    ::curl_easy_setopt(easy_, CURLOPT_CAINFO, trust_.caFile.c_str());
    // Else those of the system are trusted as well.
    ::curl_easy_setopt(easy_, CURLOPT_CAPATH, static_cast<const char*>(nullptr));
    return;
  }
  ::curl_easy_setopt(easy_, CURLOPT_SSL_VERIFYPEER, 0L);
  ::curl_easy_setopt(easy_, CURLOPT_SSL_VERIFYHOST, 0L);
  ::curl_easy_setopt(easy_, CURLOPT_CERTINFO, 1L);
  // A resumed session would have no certificate to compare.
  ::curl_easy_setopt(easy_, CURLOPT_SSL_SESSIONID_CACHE, 0L);
  ::curl_easy_setopt(easy_, CURLOPT_PREREQFUNCTION, &Transfer::checkFingerprint);
  ::curl_easy_setopt(easy_, CURLOPT_PREREQDATA, static_cast<void*>(&transfer));
}

void Https::place(Transfer& transfer, const Request& request) {
  ::curl_easy_reset(easy_);  // the connection stays
  ::curl_easy_setopt(easy_, CURLOPT_URL, (url_ + request.path).c_str());
  ::curl_easy_setopt(easy_, CURLOPT_PATH_AS_IS, 1L);
  ::curl_easy_setopt(easy_, CURLOPT_PROTOCOLS_STR, "https");
  ::curl_easy_setopt(easy_, CURLOPT_PROXY, "");
  ::curl_easy_setopt(easy_, CURLOPT_NOSIGNAL, 1L);
  ::curl_easy_setopt(easy_, CURLOPT_SSLVERSION, static_cast<long>(CURL_SSLVERSION_TLSv1_2));
  ::curl_easy_setopt(easy_, CURLOPT_HTTP_VERSION, static_cast<long>(CURL_HTTP_VERSION_1_1));
  ::curl_easy_setopt(easy_, CURLOPT_CONNECTTIMEOUT, kConnectSeconds);
  ::curl_easy_setopt(easy_, CURLOPT_LOW_SPEED_LIMIT, 1L);
  ::curl_easy_setopt(easy_, CURLOPT_LOW_SPEED_TIME, kSilentSeconds);
  ::curl_easy_setopt(easy_, CURLOPT_ERRORBUFFER, static_cast<char*>(transfer.problem));
  ::curl_easy_setopt(easy_, CURLOPT_WRITEFUNCTION, &Transfer::takeBody);
  ::curl_easy_setopt(easy_, CURLOPT_WRITEDATA, static_cast<void*>(&transfer));
  ::curl_easy_setopt(easy_, CURLOPT_HEADERFUNCTION, &Transfer::takeField);
  ::curl_easy_setopt(easy_, CURLOPT_HEADERDATA, static_cast<void*>(&transfer));
  ::curl_easy_setopt(easy_, CURLOPT_NOPROGRESS, 0L);
  ::curl_easy_setopt(easy_, CURLOPT_XFERINFOFUNCTION, &Transfer::onProgress);
  ::curl_easy_setopt(easy_, CURLOPT_XFERINFODATA, static_cast<void*>(&transfer));
  placeTrust(transfer);
  append(transfer.fields, "Accept: application/json");
  append(transfer.fields, "OData-Version: 4.0");
  append(transfer.fields, "User-Agent: zorva-bmc/" ZORVA_VERSION);
  for (const std::string& field : request.fields) append(transfer.fields, field);
  if (std::string_view(request.method) != "GET") ::curl_easy_setopt(easy_, CURLOPT_CUSTOMREQUEST, request.method);
  if (!request.body.empty()) {
    append(transfer.fields, "Content-Type: application/json");
    append(transfer.fields, "Expect:");  // some service processors never send "100 Continue"
    ::curl_easy_setopt(easy_, CURLOPT_POSTFIELDS, request.body.c_str());
    ::curl_easy_setopt(easy_, CURLOPT_POSTFIELDSIZE_LARGE, static_cast<curl_off_t>(request.body.size()));
  }
  ::curl_easy_setopt(easy_, CURLOPT_HTTPHEADER, transfer.fields.get());
}

Reply Https::send(const Request& request) {
  const auto now = Clock::now();
  const auto end = std::min(deadline_, now + kLongestRequest);
  if (end <= now) throw Failed("no answer from " + url_ + " in time");
  Transfer transfer(*this);
  place(transfer, request);
  const auto left = std::chrono::ceil<std::chrono::milliseconds>(end - now);
  ::curl_easy_setopt(easy_, CURLOPT_TIMEOUT_MS, static_cast<long>(left.count()));
  const CURLcode code = ::curl_easy_perform(easy_);
  if (code != CURLE_OK) fail(transfer, code);
  ::curl_easy_getinfo(easy_, CURLINFO_RESPONSE_CODE, &transfer.reply.status);
  return std::move(transfer.reply);
}

void Https::fail(const Transfer& transfer, int code) const {
  if (transfer.isTooLarge) throw Failed("an answer of " + url_ + " is too large");
  if (!transfer.wrongFingerprint.empty()) {
    const char* const expected = trust_.currentFingerprint
                                     ? " is not known to be the one that the service processor names over IPMI"
                                     : " is not the one of [bmc] fingerprint";
    throw Failed("the certificate of " + url_ + expected + "; nothing was sent. Its SHA-256 is " +
                 transfer.wrongFingerprint + ": compare it with what the service processor itself shows" +
                 (transfer.whyNotKnown.empty() ? "" : " (" + transfer.whyNotKnown + ")"));
  }
  if (transfer.isCancelled()) throw Failed("interrupted");
  const auto curlCode = static_cast<CURLcode>(code);
  const std::string why = inOneLine(transfer.problem[0] == '\0' ? ::curl_easy_strerror(curlCode) : transfer.problem);
  if (curlCode == CURLE_PEER_FAILED_VERIFICATION || curlCode == CURLE_ABORTED_BY_CALLBACK) {
    throw Failed("the certificate of " + url_ + " is not trusted, and nothing was sent: " + why +
                 "; [bmc] ca_file or fingerprint says whom to trust");
  }
  throw Failed("no answer from " + url_ + ": " + why);
}

std::string_view Reply::field(std::string_view name) const noexcept {
  const auto found = std::find_if(fields.rbegin(), fields.rend(),
                                  [name](const auto& each) { return util::sameName(each.first, name); });
  return found == fields.rend() ? std::string_view() : found->second;
}

}  // namespace zorva::bmc
