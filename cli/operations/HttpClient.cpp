#include "cli/operations/HttpClient.h"

#include <curl/curl.h>
#include <dlfcn.h>

#include <memory>

#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "util/Names.h"
#include "util/NotCopied.h"
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

}  // namespace

/// The used functions of libcurl, and a transfer.
struct HttpClient::Curl : private util::NotCopied {
  Curl();
  ~Curl();

  template <typename Function>
  void find(Function& function, const char* name) {
    function = reinterpret_cast<Function>(::dlsym(library, name));
    if (function != nullptr) return;
    throw Failure(ExitCode::Failed, std::string("libcurl has no function ") + name);
  }

  template <typename Value>
  void set(CURLoption option, Value value) {
    const CURLcode code = setopt(easy, option, value);
    if (code != CURLE_OK) throw Failure(ExitCode::Failed, std::string("libcurl refused an option: ") + strerror(code));
  }

  void* library = nullptr;
  decltype(&::curl_easy_init) init = nullptr;
  decltype(&::curl_easy_cleanup) cleanup = nullptr;
  CURLcode (*setopt)(CURL*, CURLoption, ...) = nullptr;
  CURLcode (*getinfo)(CURL*, CURLINFO, ...) = nullptr;
  decltype(&::curl_easy_perform) perform = nullptr;
  decltype(&::curl_easy_strerror) strerror = nullptr;
  decltype(&::curl_slist_append) append = nullptr;
  decltype(&::curl_slist_free_all) freeAll = nullptr;
  CURL* easy = nullptr;
  char problem[CURL_ERROR_SIZE] = {};  ///< of the last transfer, more detailed than its code
};

HttpClient::Curl::Curl() : library(::dlopen("libcurl.so.4", RTLD_NOW | RTLD_LOCAL)) {
  if (library == nullptr) library = ::dlopen("libcurl-gnutls.so.4", RTLD_NOW | RTLD_LOCAL);
  if (library == nullptr) {
    const char* why = ::dlerror();
    throw Failure(ExitCode::Failed,
                  "--url needs libcurl, and that cannot be loaded: " + printable(why == nullptr ? "" : why),
                  "install it (apt-get install libcurl4)");
  }
  find(init, "curl_easy_init");
  find(cleanup, "curl_easy_cleanup");
  find(setopt, "curl_easy_setopt");
  find(getinfo, "curl_easy_getinfo");
  find(perform, "curl_easy_perform");
  find(strerror, "curl_easy_strerror");
  find(append, "curl_slist_append");
  find(freeAll, "curl_slist_free_all");
  easy = init();
  if (easy == nullptr) throw Failure(ExitCode::Failed, "libcurl cannot be started");
}

HttpClient::Curl::~Curl() {
  if (easy != nullptr) cleanup(easy);
  // The library stays loaded: its dependencies may not support unloading.
}

HttpClient::HttpClient(const ServerUrl& server) : curl_(std::make_unique<Curl>()), server_(server) {
  curl_->set(CURLOPT_URL, server_.endpoint().c_str());
  curl_->set(CURLOPT_POST, 1L);
  curl_->set(CURLOPT_NOSIGNAL, 1L);
  curl_->set(CURLOPT_PROXY, "");
  curl_->set(CURLOPT_HTTP_VERSION, static_cast<long>(CURL_HTTP_VERSION_1_1));
  curl_->set(CURLOPT_ACCEPT_ENCODING, "");
  curl_->set(CURLOPT_USERAGENT, "zorvactl/" ZORVA_VERSION);
  curl_->set(CURLOPT_CONNECTTIMEOUT, kConnectSeconds);
  curl_->set(CURLOPT_LOW_SPEED_LIMIT, 1L);
  curl_->set(CURLOPT_LOW_SPEED_TIME, kSilentSeconds);
  curl_->set(CURLOPT_ERRORBUFFER, static_cast<char*>(curl_->problem));
  curl_->set(CURLOPT_WRITEFUNCTION, &takeBody);
  curl_->set(CURLOPT_HEADERFUNCTION, &takeField);
}

HttpClient::~HttpClient() = default;

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
  curl_->set(CURLOPT_HTTPHEADER, list.get());
  curl_->set(CURLOPT_POSTFIELDS, body.c_str());
  curl_->set(CURLOPT_POSTFIELDSIZE_LARGE, static_cast<curl_off_t>(body.size()));
  curl_->set(CURLOPT_WRITEDATA, static_cast<void*>(&reply));
  curl_->set(CURLOPT_HEADERDATA, static_cast<void*>(&reply));
  curl_->problem[0] = '\0';
  const CURLcode code = curl_->perform(curl_->easy);
  curl_->set(CURLOPT_HTTPHEADER, static_cast<curl_slist*>(nullptr));
  if (code == CURLE_WRITE_ERROR && reply.body.size() > kLargestReply / 2) {
    throw Failure(ExitCode::Failed, "the answer of " + server_.shown() + " is larger than 256 MiB",
                  "ask for less: a class further down, or single properties (--property)");
  }
  if (code != CURLE_OK) {
    throw Failure(ExitCode::Failed,
                  "no answer from " + server_.shown() + ": " +
                      printable(curl_->problem[0] == '\0' ? curl_->strerror(code) : curl_->problem),
                  "is a CIM server listening there? --url http://HOST:PORT/NAMESPACE names it");
  }
  curl_->getinfo(curl_->easy, CURLINFO_RESPONSE_CODE, &reply.status);
  return reply;
}

std::string_view HttpReply::field(std::string_view name) const noexcept {
  for (auto each = fields.rbegin(); each != fields.rend(); ++each) {
    if (util::sameName(each->first, name)) return each->second;
  }
  return {};
}

}  // namespace zorva::cli
