#include "cli/operations/HttpClient.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <exception>

#include "cli/operations/Curl.h"
#include "cli/operations/ServerCertificate.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "util/Names.h"
#include "util/Text.h"

namespace zorva::cli {

namespace {

constexpr long kConnectSeconds = 10;
constexpr long kSilentSeconds = 120;
constexpr std::size_t kLargestReply = std::size_t{256} << 20U;

std::size_t takeBody(char* data, std::size_t size, std::size_t count, void* reply) {
  std::string& body = static_cast<HttpReply*>(reply)->body;
  if (body.size() + size * count > kLargestReply) return 0;
  body.append(data, size * count);
  return size * count;
}

std::size_t takeField(char* data, std::size_t size, std::size_t count, void* reply) {
  auto& fields = static_cast<HttpReply*>(reply)->fields;
  const std::string_view line(data, size * count);
  // Another status line begins a new set of fields: "100 Continue" came before.
  if (line.starts_with("HTTP/")) fields.clear();
  const std::size_t colon = line.find(':');
  if (colon == std::string_view::npos || fields.size() >= 1000) return size * count;
  fields.emplace_back(util::trimmed(line.substr(0, colon), util::kWhiteSpace),
                      util::trimmed(line.substr(colon + 1), util::kWhiteSpace));
  return size * count;
}

using Clock = std::chrono::steady_clock;

std::optional<Clock::time_point> deadlineOf(const Server& server) {
  if (!server.patience) return std::nullopt;
  return Clock::now() + *server.patience;
}

/// What all transfers to a server have in common.
void placeAddress(Curl& curl, const ServerUrl& url) {
  curl.set(CURLOPT_URL, url.endpoint().c_str());
  if (url.isSocket()) curl.set(CURLOPT_UNIX_SOCKET_PATH, url.socket.c_str());
  curl.set(CURLOPT_PROXY, "");
  curl.set(CURLOPT_SSLVERSION, static_cast<long>(CURL_SSLVERSION_TLSv1_2));
  curl.set(CURLOPT_CONNECTTIMEOUT, kConnectSeconds);
}

/// The certificate is collected, and not checked by libcurl.
void collectCertificate(Curl& curl) {
  curl.set(CURLOPT_SSL_VERIFYPEER, 0L);
  curl.set(CURLOPT_SSL_VERIFYHOST, 0L);
  curl.set(CURLOPT_CERTINFO, 1L);
}

const char* nextStep(const ServerUrl& url) {
  if (url.isSocket()) return "is zorvacimd running? --url unix:/PATH names its socket";
  return "is a CIM server listening there? --url https://USER@HOST:PORT/NAMESPACE names it";
}

}  // namespace

/// The check of a pinned certificate.
struct HttpClient::Pin {
  const Curl& curl;
  const std::string fingerprint;
  std::string checked = {};  ///< the ends of the connection whose certificate was right
  std::optional<ServerCertificate> wrong = std::nullopt;

  /// Called by libcurl before anything is sent. Only a new connection has a certificate; one that is used again was
  /// checked when it was new.
  static int check(void* self, char* address, char* localAddress, int port, int localPort) noexcept {
    auto& pin = *static_cast<Pin*>(self);
    try {
      const std::string ends =
          std::string(address) + " " + std::to_string(port) + " " + localAddress + " " + std::to_string(localPort);
      std::optional<ServerCertificate> certificate = certificateOf(pin.curl);
      if (!certificate) return ends == pin.checked ? CURL_PREREQFUNC_OK : CURL_PREREQFUNC_ABORT;
      if (certificate->fingerprint == pin.fingerprint) {
        pin.checked = ends;
        return CURL_PREREQFUNC_OK;
      }
      pin.wrong = std::move(certificate);
    } catch (...) {
      // The request is not sent.
    }
    return CURL_PREREQFUNC_ABORT;
  }
};

HttpClient::HttpClient(const Server& server)
    : server_(server), deadline_(deadlineOf(server)), curl_(std::make_unique<Curl>()) {
  placeAddress(*curl_, server_.url);
  curl_->set(CURLOPT_POST, 1L);
  curl_->set(CURLOPT_HTTP_VERSION, static_cast<long>(CURL_HTTP_VERSION_1_1));
  curl_->set(CURLOPT_ACCEPT_ENCODING, "");
  curl_->set(CURLOPT_USERAGENT, "zorvactl/" ZORVA_VERSION);
  curl_->set(CURLOPT_LOW_SPEED_LIMIT, 1L);
  curl_->set(CURLOPT_LOW_SPEED_TIME, kSilentSeconds);
  curl_->set(CURLOPT_WRITEFUNCTION, &takeBody);
  curl_->set(CURLOPT_HEADERFUNCTION, &takeField);
  placeTrust();
  placeLogin();
}

HttpClient::~HttpClient() = default;

void HttpClient::placeTrust() {
  const Trust& trust = server_.trust;
  if (!trust.caFile.empty()) {
    if (::access(trust.caFile.c_str(), R_OK) != 0) {
      throw Failure(ExitCode::WrongUsage, "--ca " + printable(trust.caFile) + ": " + std::strerror(errno));
    }
    curl_->set(CURLOPT_CAINFO, trust.caFile.c_str());
    // Else those of the system are trusted as well.
    curl_->set(CURLOPT_CAPATH, static_cast<const char*>(nullptr));
  }
  if (trust.fingerprint.empty()) return;
  pin_ = std::make_unique<Pin>(Pin{*curl_, trust.fingerprint});
  collectCertificate(*curl_);
  // A resumed session would have no certificate to compare.
  curl_->set(CURLOPT_SSL_SESSIONID_CACHE, 0L);
  curl_->set(CURLOPT_PREREQFUNCTION, &Pin::check);
  curl_->set(CURLOPT_PREREQDATA, static_cast<void*>(pin_.get()));
}

void HttpClient::placeLogin() {
  if (server_.url.user.empty() || server_.password == nullptr) return;
  curl_->set(CURLOPT_HTTPAUTH, static_cast<long>(CURLAUTH_BASIC));
  curl_->set(CURLOPT_USERNAME, server_.url.user.c_str());
  curl_->set(CURLOPT_PASSWORD, server_.password->text().c_str());
}

void HttpClient::placeDeadline(Curl& curl) const {
  if (!deadline_) return;
  const auto left = std::chrono::ceil<std::chrono::milliseconds>(*deadline_ - Clock::now());
  if (left.count() <= 0) giveUp();
  curl.set(CURLOPT_TIMEOUT_MS, static_cast<long>(left.count()));
}

HttpReply HttpClient::post(const std::vector<std::string>& fields, const std::string& body) {
  HttpReply reply;
  const auto freeList = [this](curl_slist* list) { curl_->freeAll(list); };
  std::unique_ptr<curl_slist, decltype(freeList)> list(nullptr, freeList);
  for (const std::string& field : fields) {
    curl_slist* const longer = curl_->append(list.get(), field.c_str());
    if (longer == nullptr) throw std::bad_alloc();
    (void)list.release();  // the longer list owns it now
    list.reset(longer);
  }
  placeDeadline(*curl_);
  curl_->set(CURLOPT_HTTPHEADER, list.get());
  curl_->set(CURLOPT_POSTFIELDS, body.c_str());
  curl_->set(CURLOPT_POSTFIELDSIZE_LARGE, static_cast<curl_off_t>(body.size()));
  curl_->set(CURLOPT_WRITEDATA, static_cast<void*>(&reply));
  curl_->set(CURLOPT_HEADERDATA, static_cast<void*>(&reply));
  curl_->problem[0] = '\0';
  const CURLcode code = curl_->perform(curl_->easy);
  curl_->set(CURLOPT_HTTPHEADER, static_cast<curl_slist*>(nullptr));
  if (code != CURLE_OK) fail(code, reply);
  curl_->getinfo(curl_->easy, CURLINFO_RESPONSE_CODE, &reply.status);
  return reply;
}

namespace {

/// The lines of a response that goes on.
struct Lines {
  CURL* easy;
  decltype(&::curl_easy_getinfo) getinfo;
  const std::function<bool(std::string_view)>& take;
  HttpReply& reply;
  std::string unfinished = {};
  bool isOver = false;
  std::exception_ptr thrown = nullptr;

  void add(std::string_view text) {
    unfinished += text;
    for (std::size_t end = unfinished.find('\n'); end != std::string::npos && !isOver; end = unfinished.find('\n')) {
      isOver = !take(std::string_view(unfinished).substr(0, end));
      unfinished.erase(0, end + 1);
    }
    isOver = isOver || unfinished.size() > kLargestReply;
  }

  // No exception may pass through libcurl, which is C.
  static std::size_t write(char* data, std::size_t size, std::size_t count, void* self) noexcept {
    auto& lines = *static_cast<Lines*>(self);
    lines.getinfo(lines.easy, CURLINFO_RESPONSE_CODE, &lines.reply.status);
    try {
      if (lines.reply.status != 200) return takeBody(data, size, count, &lines.reply);
      lines.add({data, size * count});
    } catch (...) {
      lines.thrown = std::current_exception();
    }
    return lines.isOver || lines.thrown != nullptr ? 0 : size * count;
  }
};

}  // namespace

HttpReply HttpClient::follow(const std::string& path, const std::function<bool(std::string_view line)>& take) {
  HttpReply reply;
  Lines lines{curl_->easy, curl_->getinfo, take, reply};
  const std::string endpoint = server_.url.endpoint();
  curl_->set(CURLOPT_URL, (endpoint.substr(0, endpoint.rfind('/')) + path).c_str());
  curl_->set(CURLOPT_HTTPGET, 1L);
  curl_->set(CURLOPT_WRITEFUNCTION, &Lines::write);
  curl_->set(CURLOPT_WRITEDATA, static_cast<void*>(&lines));
  curl_->set(CURLOPT_HEADERDATA, static_cast<void*>(&reply));
  curl_->problem[0] = '\0';
  const CURLcode code = curl_->perform(curl_->easy);
  if (lines.thrown != nullptr) std::rethrow_exception(lines.thrown);
  if (code != CURLE_OK && !lines.isOver) fail(code, reply);
  curl_->getinfo(curl_->easy, CURLINFO_RESPONSE_CODE, &reply.status);
  return reply;
}

void HttpClient::fail(int code, const HttpReply& reply) const {
  if (code == CURLE_WRITE_ERROR && reply.body.size() > kLargestReply / 2) {
    throw Failure(ExitCode::Failed, "the answer of " + server_.url.shown() + " is larger than 256 MiB",
                  "ask for less: a class further down, or single properties (--property)");
  }
  if (code == CURLE_SSL_CACERT_BADFILE) {
    throw Failure(ExitCode::WrongUsage, "--ca " + printable(server_.trust.caFile) + " has no certificate in PEM form");
  }
  if (code == CURLE_PEER_FAILED_VERIFICATION || code == CURLE_ABORTED_BY_CALLBACK) refuseCertificate(code);
  if (code == CURLE_OPERATION_TIMEDOUT && deadline_ && Clock::now() >= *deadline_) giveUp();
  throw Failure(ExitCode::Failed,
                "no answer from " + server_.url.shown() + ": " + curl_->why(static_cast<CURLcode>(code)),
                nextStep(server_.url));
}

void HttpClient::giveUp() const {
  const double seconds = static_cast<double>(server_.patience->count()) / 1000;
  char text[32];
  std::snprintf(text, sizeof text, "%g", seconds);
  throw Failure(ExitCode::Failed, "no whole answer from " + server_.url.shown() + " within " + text + " s",
                "--timeout SECONDS waits longer");
}

void HttpClient::refuseCertificate(int code) const {
  const std::string who = "the certificate of " + server_.url.shown();
  if (pin_ != nullptr) {
    if (!pin_->wrong) throw Failure(ExitCode::Failed, who + " could not be compared; nothing was sent");
    throw Failure(ExitCode::Failed,
                  who + " is not the one with this fingerprint; nothing was sent" + describe(*pin_->wrong),
                  "if the server has a new one, compare its SHA-256 with what 'zorvacimd --make-certificate' printed "
                  "there; else another server has answered");
  }
  const std::string why = curl_->why(static_cast<CURLcode>(code));
  // libcurl does not hand out what it refuses. A second connection fetches it, for this message alone; nothing is sent.
  Curl again;
  placeAddress(again, server_.url);
  placeDeadline(again);
  collectCertificate(again);
  again.set(CURLOPT_CONNECT_ONLY, 1L);
  const auto certificate = again.perform(again.easy) == CURLE_OK ? certificateOf(again) : std::nullopt;
  throw Failure(ExitCode::Failed,
                who + " is not trusted, and nothing was sent: " + why + (certificate ? describe(*certificate) : ""),
                "name the authority that signed it: --ca FILE. Or compare its SHA-256 with what "
                "'zorvacimd --make-certificate' printed on the server, and if it is the same: --fingerprint " +
                    (certificate ? certificate->fingerprint : "SHA256"));
}

std::string_view HttpReply::field(std::string_view name) const noexcept {
  for (auto each = fields.rbegin(); each != fields.rend(); ++each) {
    if (util::sameName(each->first, name)) return each->second;
  }
  return {};
}

}  // namespace zorva::cli
